#pragma once
// Exporting a list of the main window: the export wizard over the list's grid.

namespace orvanta {

class TLogform;

void registerExportFeature(TLogform& mainWindow);

} // namespace orvanta
