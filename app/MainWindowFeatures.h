#pragma once
// The features the program's main window is built with; app/ is the one place that knows them.

#include "app/TLogform.h"

#include <vector>

namespace orvanta {

[[nodiscard]] std::vector<MainWindowFeature> defaultMainWindowFeatures();

} // namespace orvanta
