#pragma once
// A column as the grid's parts see it: the frame's definition, the source field it is bound
// to, and its sort direction. The controller owns them; filter, sorter and grouping read them.

#include "ui/grid/GridColumn.h"

#include <vector>

namespace orvanta {

struct GridColumnState {
    GridColumn def;
    int field = -1;
    GridSortOrder sortOrder = GridSortOrder::None;
    bool textKey = false; // sorts, groups and filters by text

    // The text the column sorts and compares by (its sortText, else the field's bytes).
    [[nodiscard]] QByteArrayView keyText(const GridSource& source, quint32 record) const;
    // The display text of a cell of an existing record.
    [[nodiscard]] QString cellText(const GridSource& source, quint32 record) const;
};

using GridColumnStates = std::vector<GridColumnState>;

// Column by its unique name, case-insensitive; -1 when none.
[[nodiscard]] int gridColumnByName(const GridColumnStates& columns, QStringView name);

} // namespace orvanta
