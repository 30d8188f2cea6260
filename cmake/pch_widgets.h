// Precompiled for the presentation layer and everything above it.
#pragma once
#ifdef __cplusplus
#include <QtCore>
#include <QtGui>
#include <QtWidgets>
#include <algorithm>
#include <memory>
#include <vector>
#endif
