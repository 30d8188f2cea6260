#pragma once
// Where the main window gets the list frames and windows that other folders provide.

#include "app/TLogform.h"

namespace orvanta {

// dm: handed to every frame and window the factories make.
[[nodiscard]] MainWindowFactories defaultMainWindowFactories(TDM2* dm);

} // namespace orvanta
