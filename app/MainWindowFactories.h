#pragma once
// Where the main window gets the list frames and windows that other folders provide.

#include "app/TLogform.h"

namespace orvanta {

[[nodiscard]] MainWindowFactories defaultMainWindowFactories();

} // namespace orvanta
