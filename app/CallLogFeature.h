#pragma once
// The call log in the main window: the log list frame, the detail window of a call, and the
// behaviour of the log's actions (print, delete a call or a day, open a call's details).

namespace orvanta {

class TLogform;

void registerCallLogFeature(TLogform& mainWindow);

} // namespace orvanta
