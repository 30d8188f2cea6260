#include "ui/grid/GridLayoutStore.h"

#include "platform/IniFile.h"
#include "ui/grid/GridController.h"

#include <QFileInfo>
#include <algorithm>
#include <functional>

namespace orvanta {
namespace {

constexpr int kVersion = 1;
constexpr int kMaxFilterItems = 10'000;

QString columnSection(const QString& view, const QString& name)
{
    return view + QStringLiteral(".Column.") + name;
}

QString filterSection(const QString& view)
{
    return view + QStringLiteral(".Filter");
}

int sortOrderToInt(GridSortOrder o)
{
    return o == GridSortOrder::Ascending ? 1 : (o == GridSortOrder::Descending ? 2 : 0);
}

GridSortOrder sortOrderFromInt(int v)
{
    return v == 1 ? GridSortOrder::Ascending : (v == 2 ? GridSortOrder::Descending : GridSortOrder::None);
}

void writeFilter(const GridController& grid, IniFile& ini, const QString& section)
{
    int n = 0;
    const std::function<void(const GridFilterItem&, int)> write = [&](const GridFilterItem& item, int parent) {
        const int self = n++;
        const QString p = QStringLiteral("Item%1.").arg(self);
        ini.writeInteger(section, p + QStringLiteral("Parent"), parent);
        if (item.isList) {
            ini.writeString(section, p + QStringLiteral("Kind"), QStringLiteral("List"));
            ini.writeString(section, p + QStringLiteral("Bool"),
                            item.boolOp == GridFilterBoolOperator::Or ? QStringLiteral("OR") : QStringLiteral("AND"));
            for (const GridFilterItem& sub : item.items)
                write(sub, self);
        } else {
            ini.writeString(section, p + QStringLiteral("Kind"), QStringLiteral("Condition"));
            ini.writeString(section, p + QStringLiteral("Column"), item.column);
            ini.writeString(section, p + QStringLiteral("Operator"), gridFilterOperatorName(item.op));
            ini.writeString(section, p + QStringLiteral("Value"), item.value);
            ini.writeString(section, p + QStringLiteral("Text"), item.displayText);
        }
    };
    for (const GridFilterItem& item : grid.filter().root.items)
        write(item, -1);
    ini.writeInteger(section, QStringLiteral("Count"), n);
}

// Rebuilds the item tree; an item whose parent is missing or no list, whose column the grid
// does not have, or whose operator is unknown is dropped with everything below it.
GridFilterItem readFilter(const GridController& grid, const IniFile& ini, const QString& section)
{
    GridFilterItem root = GridFilterItem::list(GridFilterBoolOperator::And);
    const int count = std::clamp(ini.readInteger(section, QStringLiteral("Count"), 0), 0, kMaxFilterItems);
    // Path from the root to each accepted item, by child indexes.
    std::vector<std::vector<size_t>> paths(static_cast<size_t>(count));
    std::vector<bool> isList(static_cast<size_t>(count), false);
    std::vector<bool> accepted(static_cast<size_t>(count), false);
    const auto itemAt = [&root](const std::vector<size_t>& path) {
        GridFilterItem* item = &root;
        for (const size_t i : path)
            item = &item->items[i];
        return item;
    };
    for (int k = 0; k < count; ++k) {
        const QString p = QStringLiteral("Item%1.").arg(k);
        const int parent = ini.readInteger(section, p + QStringLiteral("Parent"), -2);
        if (parent < -1 || parent >= k || (parent >= 0 && (!accepted[static_cast<size_t>(parent)] || !isList[static_cast<size_t>(parent)])))
            continue;
        GridFilterItem item;
        const QString kind = ini.readString(section, p + QStringLiteral("Kind"));
        if (kind.compare(QStringLiteral("List"), Qt::CaseInsensitive) == 0) {
            const QString b = ini.readString(section, p + QStringLiteral("Bool"));
            item = GridFilterItem::list(b.compare(QStringLiteral("OR"), Qt::CaseInsensitive) == 0 ? GridFilterBoolOperator::Or
                                                                                                   : GridFilterBoolOperator::And);
        } else if (kind.compare(QStringLiteral("Condition"), Qt::CaseInsensitive) == 0) {
            const QString column = ini.readString(section, p + QStringLiteral("Column"));
            GridFilterOperator op{};
            if (grid.columnByName(column) < 0
                || !gridFilterOperatorFromName(ini.readString(section, p + QStringLiteral("Operator")), op))
                continue;
            item = GridFilterItem::condition(grid.column(grid.columnByName(column)).name, op,
                                             ini.readString(section, p + QStringLiteral("Value")),
                                             ini.readString(section, p + QStringLiteral("Text")));
        } else {
            continue;
        }
        std::vector<size_t> path = parent >= 0 ? paths[static_cast<size_t>(parent)] : std::vector<size_t>{};
        GridFilterItem* owner = itemAt(path);
        path.push_back(owner->items.size());
        isList[static_cast<size_t>(k)] = item.isList;
        owner->items.push_back(std::move(item));
        paths[static_cast<size_t>(k)] = std::move(path);
        accepted[static_cast<size_t>(k)] = true;
    }
    return root;
}

} // namespace

void GridLayoutStore::store(const GridController& grid, IniFile& ini, const QString& viewName)
{
    const QString prefix = viewName + QLatin1Char('.');
    for (const QString& section : ini.sections()) {
        if (section.compare(viewName, Qt::CaseInsensitive) == 0 || section.startsWith(prefix, Qt::CaseInsensitive))
            ini.eraseSection(section);
    }
    ini.writeInteger(viewName, QStringLiteral("Version"), kVersion);
    ini.writeInteger(viewName, QStringLiteral("Tag"), grid.tag());
    ini.writeBool(viewName, QStringLiteral("GroupByBox"), grid.isGroupByBoxVisible());
    ini.writeBool(viewName, QStringLiteral("FilterActive"), grid.filter().active);
    ini.writeInteger(viewName, QStringLiteral("ColumnCount"), grid.columnCount());
    for (int c = 0; c < grid.columnCount(); ++c) {
        const GridColumn& col = grid.column(c);
        if (col.name.isEmpty())
            continue;
        const QString s = columnSection(viewName, col.name);
        ini.writeInteger(s, QStringLiteral("Position"), grid.visualIndex(c));
        ini.writeBool(s, QStringLiteral("Visible"), col.visible);
        ini.writeInteger(s, QStringLiteral("Width"), col.width);
        ini.writeInteger(s, QStringLiteral("SortOrder"), sortOrderToInt(grid.sortOrder(c)));
        ini.writeInteger(s, QStringLiteral("SortIndex"), grid.sortIndex(c));
        ini.writeInteger(s, QStringLiteral("GroupIndex"), grid.groupIndex(c));
    }
    writeFilter(grid, ini, filterSection(viewName));
}

bool GridLayoutStore::storeToFile(const GridController& grid, const QString& path, const QString& viewName)
{
    IniFile ini;
    store(grid, ini, viewName);
    return ini.saveAs(path);
}

bool GridLayoutStore::restore(GridController& grid, const IniFile& ini, const QString& viewName)
{
    if (!ini.sectionExists(viewName))
        return false;
    struct Entry {
        int column = -1;
        int position = 0;
        int sortIndex = -1;
        GridSortOrder sortOrder = GridSortOrder::None;
        int groupIndex = -1;
        int fileOrder = 0;
    };
    std::vector<Entry> entries;
    const QString prefix = columnSection(viewName, QString());
    std::vector<bool> seen(static_cast<size_t>(grid.columnCount()), false);
    for (const QString& section : ini.sections()) {
        if (!section.startsWith(prefix, Qt::CaseInsensitive))
            continue;
        const int c = grid.columnByName(QStringView(section).mid(prefix.size()));
        if (c < 0 || seen[static_cast<size_t>(c)])
            continue;
        seen[static_cast<size_t>(c)] = true;
        Entry e;
        e.column = c;
        e.fileOrder = static_cast<int>(entries.size());
        e.position = ini.readInteger(section, QStringLiteral("Position"), grid.visualIndex(c));
        e.sortOrder = sortOrderFromInt(ini.readInteger(section, QStringLiteral("SortOrder"), 0));
        e.sortIndex = ini.readInteger(section, QStringLiteral("SortIndex"), -1);
        e.groupIndex = ini.readInteger(section, QStringLiteral("GroupIndex"), -1);
        entries.push_back(e);
    }

    grid.beginUpdate();
    grid.setTag(ini.readInteger(viewName, QStringLiteral("Tag"), grid.tag()));
    grid.setGroupByBoxVisible(ini.readBool(viewName, QStringLiteral("GroupByBox"), grid.isGroupByBoxVisible()));
    if (!entries.empty()) {
        grid.clearGrouping();
        grid.clearSorting();
        for (const Entry& e : entries) {
            const QString s = columnSection(viewName, grid.column(e.column).name);
            grid.setColumnVisible(e.column, ini.readBool(s, QStringLiteral("Visible"), grid.isColumnVisible(e.column)));
            const int width = ini.readInteger(s, QStringLiteral("Width"), -1);
            if (width > 0)
                grid.setColumnWidth(e.column, width);
        }
        // Stored columns by their position, the others after them in their current order.
        std::vector<Entry> byPosition = entries;
        std::stable_sort(byPosition.begin(), byPosition.end(),
                         [](const Entry& a, const Entry& b) { return a.position < b.position; });
        std::vector<int> order;
        for (const Entry& e : byPosition)
            order.push_back(e.column);
        for (const int c : grid.columnOrder()) {
            if (!seen[static_cast<size_t>(c)])
                order.push_back(c);
        }
        grid.setColumnOrder(order);

        std::vector<Entry> sorted;
        std::vector<Entry> grouped;
        for (const Entry& e : entries) {
            if (e.groupIndex >= 0)
                grouped.push_back(e);
            else if (e.sortIndex >= 0 && e.sortOrder != GridSortOrder::None)
                sorted.push_back(e);
        }
        std::stable_sort(grouped.begin(), grouped.end(),
                         [](const Entry& a, const Entry& b) { return a.groupIndex < b.groupIndex; });
        std::stable_sort(sorted.begin(), sorted.end(),
                         [](const Entry& a, const Entry& b) { return a.sortIndex < b.sortIndex; });
        for (const Entry& e : grouped) {
            grid.groupBy(e.column);
            if (e.sortOrder != GridSortOrder::None)
                grid.setGroupSortOrder(e.column, e.sortOrder);
        }
        for (const Entry& e : sorted)
            grid.setSortOrder(e.column, e.sortOrder);
    }
    GridFilter filter;
    filter.root = readFilter(grid, ini, filterSection(viewName));
    filter.active = ini.readBool(viewName, QStringLiteral("FilterActive"), false) && !filter.root.items.empty();
    grid.setFilter(filter);
    grid.endUpdate();
    return true;
}

bool GridLayoutStore::restoreFromFile(GridController& grid, const QString& path, const QString& viewName)
{
    if (!QFileInfo::exists(path))
        return false;
    IniFile ini;
    if (!ini.load(path))
        return false;
    return restore(grid, ini, viewName);
}

} // namespace orvanta
