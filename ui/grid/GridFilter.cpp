#include "ui/grid/GridFilter.h"

#include <array>
#include <utility>

namespace orvanta {
namespace {
constexpr std::array<std::pair<GridFilterOperator, const char*>, 7> kNames{{
    {GridFilterOperator::Equal, "="},
    {GridFilterOperator::NotEqual, "<>"},
    {GridFilterOperator::Like, "LIKE"},
    {GridFilterOperator::NotLike, "NOT LIKE"},
    {GridFilterOperator::Today, "is today"},
    {GridFilterOperator::ThisWeek, "is this week"},
    {GridFilterOperator::ThisMonth, "is this month"},
}};
} // namespace

GridFilterItem GridFilterItem::condition(QString column, GridFilterOperator op, QString value, QString displayText)
{
    GridFilterItem item;
    item.column = std::move(column);
    item.op = op;
    item.value = std::move(value);
    item.displayText = std::move(displayText);
    return item;
}

GridFilterItem GridFilterItem::list(GridFilterBoolOperator boolOp, std::vector<GridFilterItem> items)
{
    GridFilterItem item;
    item.isList = true;
    item.boolOp = boolOp;
    item.items = std::move(items);
    return item;
}

QString gridFilterOperatorName(GridFilterOperator op)
{
    for (const auto& [o, name] : kNames) {
        if (o == op)
            return QString::fromLatin1(name);
    }
    return {};
}

bool gridFilterOperatorFromName(QStringView name, GridFilterOperator& op)
{
    for (const auto& [o, n] : kNames) {
        if (name.compare(QLatin1StringView(n), Qt::CaseInsensitive) == 0) {
            op = o;
            return true;
        }
    }
    return false;
}

} // namespace orvanta
