#pragma once
// Saves and restores what the user changed in a grid: for every column its visibility,
// position, width, sort order and grouping, the group-by box, the filter with its active
// switch, and the view's Tag. The layout is INI text under a view name:
//
//   [2]                         Version, Tag, GroupByBox, FilterActive
//   [2.Column.<column name>]    Position, Visible, Width, SortOrder (0 none, 1 asc, 2 desc),
//                               SortIndex, GroupIndex
//   [2.Filter]                  Count, then Item<n>.Parent/Kind/Bool/Column/Operator/Value/Text
//
// Restoring tolerates what files get exposed to: columns the grid does not have are skipped,
// missing keys keep the grid's current value, and values that do not parse are ignored.

#include <QString>

namespace orvanta {

class GridController;
class IniFile;

class GridLayoutStore final {
public:
    static void store(const GridController& grid, IniFile& ini, const QString& viewName);
    // Rewrites the file with this one view. False when it could not be written.
    [[nodiscard]] static bool storeToFile(const GridController& grid, const QString& path, const QString& viewName);

    // False (and the grid unchanged) when the view is not in the INI.
    static bool restore(GridController& grid, const IniFile& ini, const QString& viewName);
    // False when the file does not exist or holds no such view.
    static bool restoreFromFile(GridController& grid, const QString& path, const QString& viewName);
};

} // namespace orvanta
