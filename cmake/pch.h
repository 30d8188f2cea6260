// Precompiled for every target: the Qt headers nearly every file pulls in.
#pragma once
#ifdef __cplusplus
#include <QtCore>
#include <QtGui>
#include <QtWidgets>
#include <algorithm>
#include <memory>
#include <vector>
#endif
