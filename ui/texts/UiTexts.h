#pragma once
// The built-in texts of the presentation library (grids, editors, tool bars, colour pickers),
// replaceable at start-up. Widgets look a text up by its key when they show it.

#include <QString>

namespace orvanta {

enum class UiText {
    GridNoData,            // empty grid
    GridGroupByBox,        // hint in the empty group-by box
    NoSelection,           // empty choice in a combo box
    EditUndo,
    EditRedo,
    EditCut,
    EditCopy,
    EditPaste,
    EditDelete,
    EditSelectAll,
    CalendarToday,
    ToolBarAddRemoveButtons,
    ToolBarMoreButtons,
    ToolBarReset,
    ToolBarResetQuestion,  // contains "%s" for the bar's name
    ColorAuto,
    ColorCustom,
    Count
};

[[nodiscard]] QString uiText(UiText key);
void setUiText(UiText key, const QString& text);

// The sixteen standard colours' names, in the order black, maroon, green, olive, navy, purple,
// teal, grey, silver, red, lime, yellow, blue, fuchsia, aqua, white.
[[nodiscard]] QString uiColorName(int index);
void setUiColorName(int index, const QString& name);

} // namespace orvanta
