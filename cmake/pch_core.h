// Precompiled for the layers below the widgets (platform, db, phone): Qt Core only, so a widget
// header cannot slip in through the precompiled header.
#pragma once
#ifdef __cplusplus
#include <QtCore>
#include <algorithm>
#include <memory>
#include <vector>
#endif
