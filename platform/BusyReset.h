#pragma once
// A failure report ends any "busy" display, so the user never faces an error under an
// hourglass. The hourglass itself is a widget-layer thing (ui/dialogs/BusyCursor); it registers
// here how to end it, and the error log below the widgets calls resetBusyIndicator().

namespace orvanta {

using BusyResetHandler = void (*)();

// Replaces the handler; nullptr: nothing to reset.
void setBusyResetHandler(BusyResetHandler handler);
void resetBusyIndicator();

} // namespace orvanta
