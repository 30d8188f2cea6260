#pragma once
// The filter of a grid: a root list of conditions (AND) whose items are conditions or
// sub-lists combined with AND or OR. Conditions name their column by its unique name, so a
// stored filter survives column moves.

#include <QString>
#include <vector>

namespace orvanta {

enum class GridFilterOperator : quint8 {
    Equal,    // same text (case-insensitive, grid text order) or same number
    NotEqual,
    Like,     // SQL LIKE on the column's text, case-sensitive
    NotLike,
    Today,    // date columns: the date is today
    ThisWeek, // the date lies in the week (Monday to Sunday) containing today
    ThisMonth,
};

enum class GridFilterBoolOperator : quint8 { And, Or };

struct GridFilterItem {
    bool isList = false;
    // A condition:
    QString column; // GridColumn::name
    GridFilterOperator op = GridFilterOperator::Equal;
    QString value;
    QString displayText;
    // A sub-list:
    GridFilterBoolOperator boolOp = GridFilterBoolOperator::And;
    std::vector<GridFilterItem> items;

    [[nodiscard]] static GridFilterItem condition(QString column, GridFilterOperator op, QString value = {},
                                                  QString displayText = {});
    [[nodiscard]] static GridFilterItem list(GridFilterBoolOperator boolOp, std::vector<GridFilterItem> items = {});
    bool operator==(const GridFilterItem&) const = default;
};

// The text an operator is known by in filter texts ("is this week", "LIKE" ...).
[[nodiscard]] QString gridFilterOperatorName(GridFilterOperator op);
// Reverse of the above; false for an unknown name.
[[nodiscard]] bool gridFilterOperatorFromName(QStringView name, GridFilterOperator& op);
[[nodiscard]] inline bool isPeriodOperator(GridFilterOperator op)
{
    return op == GridFilterOperator::Today || op == GridFilterOperator::ThisWeek || op == GridFilterOperator::ThisMonth;
}

struct GridFilter {
    bool active = false;
    GridFilterItem root = GridFilterItem::list(GridFilterBoolOperator::And);

    [[nodiscard]] bool isEmpty() const { return root.items.empty(); }
    bool operator==(const GridFilter&) const = default;
};

} // namespace orvanta
