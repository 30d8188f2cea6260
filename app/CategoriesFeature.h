#pragma once
// The category manager in the main window: "Kategorieverwaltung" shows the one manager, the
// contact edit window's category button opens it in pick mode, and what the manager changes
// reaches the open edit windows and the contact list.

namespace orvanta {

class TLogform;

void registerCategoriesFeature(TLogform& mainWindow);

} // namespace orvanta
