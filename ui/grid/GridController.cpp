#include "ui/grid/GridController.h"

#include "platform/Clock.h"
#include "ui/grid/GridCollation.h"
#include "ui/grid/GridFormat.h"

#include <QHash>
#include <algorithm>
#include <bit>
#include <numeric>
#include <string_view>

namespace orvanta {
namespace {

constexpr quint32 kGroupBit = 0x8000'0000u;

// Stable counting sort of `order` by the key of each row; the keys are dense ranks.
void countingSortPass(std::vector<quint32>& order, const std::vector<quint32>& rank, quint32 maxRank, bool descending,
                      std::vector<quint32>& tmp)
{
    std::vector<quint32> counts(static_cast<size_t>(maxRank) + 2, 0);
    const auto key = [&](quint32 row) { return descending ? maxRank - rank[row] : rank[row]; };
    for (const quint32 row : order)
        ++counts[key(row) + 1];
    for (size_t i = 1; i < counts.size(); ++i)
        counts[i] += counts[i - 1];
    tmp.resize(order.size());
    for (const quint32 row : order)
        tmp[counts[key(row)]++] = row;
    order.swap(tmp);
}

qint64 floorDiv(qint64 a, qint64 b)
{
    qint64 q = a / b;
    if ((a % b != 0) && ((a < 0) != (b < 0)))
        --q;
    return q;
}

// Open-addressing table from text to a dense id: the distinct texts of a column are few
// compared to its rows, so collation runs on the distinct ones only.
class TextInterner {
public:
    explicit TextInterner(size_t expected)
    {
        size_t cap = 1024;
        while (cap < expected / 4)
            cap <<= 1;
        m_slots.assign(cap, 0);
    }
    static size_t hashOf(QByteArrayView text)
    {
        // FNV-1a: the texts are short, and a cheap hash is what matters at a million rows.
        quint64 h = 14695981039346656037ull;
        for (const char c : text)
            h = (h ^ static_cast<unsigned char>(c)) * 1099511628211ull;
        return static_cast<size_t>(h ^ (h >> 29));
    }
    quint32 intern(QByteArrayView text)
    {
        const size_t h = hashOf(text);
        size_t mask = m_slots.size() - 1;
        size_t i = h & mask;
        for (;;) {
            const quint32 s = m_slots[i];
            if (s == 0)
                break;
            if (m_hashes[s - 1] == h && m_texts[s - 1] == text)
                return s - 1;
            i = (i + 1) & mask;
        }
        const auto id = static_cast<quint32>(m_texts.size());
        m_texts.push_back(text);
        m_hashes.push_back(h);
        m_slots[i] = id + 1;
        if (m_texts.size() * 2 > m_slots.size())
            grow();
        return id;
    }
    [[nodiscard]] const std::vector<QByteArrayView>& texts() const { return m_texts; }

private:
    void grow()
    {
        m_slots.assign(m_slots.size() * 2, 0);
        const size_t mask = m_slots.size() - 1;
        for (quint32 id = 0; id < m_texts.size(); ++id) {
            size_t i = m_hashes[id] & mask;
            while (m_slots[i] != 0)
                i = (i + 1) & mask;
            m_slots[i] = id + 1;
        }
    }
    std::vector<quint32> m_slots;
    std::vector<QByteArrayView> m_texts;
    std::vector<size_t> m_hashes;
};

struct CompiledFilter {
    bool isList = false;
    bool isOr = false;
    std::vector<CompiledFilter> items;
    int column = -1;
    int field = -1;
    GridFilterOperator op = GridFilterOperator::Equal;
    QByteArray latin1;
    QString value;
    qint64 lo = 0;
    qint64 hi = -1;
};

} // namespace

GridController::GridController(QObject* parent)
    : QObject(parent)
    , m_today([] { return Clock::today(); })
{
}

GridController::~GridController() = default;

// --- columns -------------------------------------------------------------------------------

int GridController::addColumn(GridColumn column)
{
    ColumnState s;
    s.def = std::move(column);
    if (s.def.width <= 0)
        s.def.width = 64;
    m_columns.push_back(std::move(s));
    const int c = columnCount() - 1;
    m_visual.push_back(c);
    m_ranks.emplace_back();
    resolveFields();
    m_pendingColumns = true;
    invalidate(DirtyDisplay);
    return c;
}

int GridController::columnByName(QStringView name) const
{
    for (int c = 0; c < columnCount(); ++c) {
        if (name.compare(column(c).name, Qt::CaseInsensitive) == 0)
            return c;
    }
    return -1;
}

int GridController::columnByField(QStringView field) const
{
    for (int c = 0; c < columnCount(); ++c) {
        if (!column(c).fieldName.isEmpty() && field.compare(column(c).fieldName, Qt::CaseInsensitive) == 0)
            return c;
    }
    return -1;
}

int GridController::columnByCaption(QStringView caption) const
{
    for (int c = 0; c < columnCount(); ++c) {
        if (column(c).caption == caption)
            return c;
    }
    return -1;
}

int GridController::columnByTag(int tag) const
{
    for (int c = 0; c < columnCount(); ++c) {
        if (column(c).tag == tag)
            return c;
    }
    return -1;
}

void GridController::setColumnVisible(int c, bool visible)
{
    if (c < 0 || c >= columnCount() || column(c).visible == visible)
        return;
    m_columns[static_cast<size_t>(c)].def.visible = visible;
    m_pendingColumns = true;
    Q_EMIT columnVisibilityChanged(c, visible);
    if (m_lock == 0)
        announce();
}

void GridController::setColumnWidth(int c, int width)
{
    if (c < 0 || c >= columnCount())
        return;
    width = std::clamp(width, 8, 4000);
    if (column(c).width == width)
        return;
    m_columns[static_cast<size_t>(c)].def.width = width;
    announceColumns();
}

void GridController::setColumnCaption(int c, const QString& caption)
{
    if (c < 0 || c >= columnCount())
        return;
    m_columns[static_cast<size_t>(c)].def.caption = caption;
    announceColumns();
}

int GridController::visualIndex(int c) const
{
    const auto it = std::find(m_visual.begin(), m_visual.end(), c);
    return it == m_visual.end() ? -1 : static_cast<int>(it - m_visual.begin());
}

void GridController::moveColumn(int c, int toVisual)
{
    const int from = visualIndex(c);
    if (from < 0)
        return;
    toVisual = std::clamp(toVisual, 0, columnCount() - 1);
    if (from == toVisual)
        return;
    m_visual.erase(m_visual.begin() + from);
    m_visual.insert(m_visual.begin() + toVisual, c);
    announceColumns();
}

void GridController::setColumnOrder(const std::vector<int>& order)
{
    if (order.size() != m_columns.size())
        return;
    std::vector<bool> seen(order.size(), false);
    for (const int c : order) {
        if (c < 0 || c >= columnCount() || seen[static_cast<size_t>(c)])
            return;
        seen[static_cast<size_t>(c)] = true;
    }
    if (order == m_visual)
        return;
    m_visual = order;
    announceColumns();
}

std::vector<int> GridController::visibleColumns() const
{
    std::vector<int> out;
    for (const int c : m_visual) {
        if (column(c).visible)
            out.push_back(c);
    }
    return out;
}

// --- source --------------------------------------------------------------------------------

void GridController::resolveFields()
{
    for (size_t c = 0; c < m_columns.size(); ++c) {
        ColumnState& s = m_columns[c];
        s.field = (m_source && !s.def.fieldName.isEmpty()) ? m_source->fieldIndex(s.def.fieldName) : -1;
        s.textKey = static_cast<bool>(s.def.sortText)
                    || (s.field >= 0 && m_source->fieldType(s.field) == GridFieldType::Text);
        m_ranks[c] = Ranks();
    }
}

void GridController::setSource(const GridSource* source)
{
    m_source = source;
    resolveFields();
    m_focusKey = {};
    m_focusRow = -1;
    invalidate(DirtyFilter | DirtySort | DirtyGroups | DirtyDisplay);
}

void GridController::sourceChanged()
{
    if (!m_source)
        return;
    int record = m_focusKey.record;
    const int keyField = m_keyFieldName.isEmpty() ? -1 : m_source->fieldIndex(m_keyFieldName);
    if (keyField >= 0 && record >= 0) {
        // The old record index means nothing after a re-read; the key does. Read it from the
        // remembered value, taken before the source changed.
        record = m_focusedKeyValid ? locate(keyField, m_focusedKeyValue) : -1;
    } else if (record >= 0 && static_cast<quint32>(record) >= m_source->rowCount()) {
        record = -1;
    }
    for (Ranks& r : m_ranks)
        r = Ranks();
    m_focusKey.record = record;
    if (record < 0)
        m_focusKey.groupLevel = -1;
    invalidate(DirtyFilter | DirtySort | DirtyGroups | DirtyDisplay);
}

int GridController::locate(qint64 key) const
{
    if (!m_source || m_keyFieldName.isEmpty())
        return -1;
    return locate(m_source->fieldIndex(m_keyFieldName), key);
}

int GridController::locate(int field, qint64 key) const
{
    if (!m_source || field < 0 || field >= m_source->fieldCount())
        return -1;
    const quint32 n = m_source->rowCount();
    for (quint32 r = 0; r < n; ++r) {
        if (!m_source->isNull(r, field) && m_source->intValue(r, field) == key)
            return static_cast<int>(r);
    }
    return -1;
}

// --- sorting -------------------------------------------------------------------------------

void GridController::setSortOrder(int c, GridSortOrder order)
{
    if (c < 0 || c >= columnCount())
        return;
    ColumnState& s = m_columns[static_cast<size_t>(c)];
    const auto it = std::find(m_sort.begin(), m_sort.end(), c);
    if (order == GridSortOrder::None) {
        if (it == m_sort.end() && s.sortOrder == GridSortOrder::None)
            return;
        if (it != m_sort.end())
            m_sort.erase(it);
    } else {
        if (!s.def.sortable)
            return;
        if (it != m_sort.end() && s.sortOrder == order)
            return;
        if (it == m_sort.end())
            m_sort.push_back(c);
    }
    s.sortOrder = order;
    m_pendingColumns = true;
    m_pendingFocusFirst = m_focusFirstAfterSort;
    invalidate(DirtySort);
}

int GridController::sortIndex(int c) const
{
    const auto it = std::find(m_sort.begin(), m_sort.end(), c);
    return it == m_sort.end() ? -1 : static_cast<int>(it - m_sort.begin());
}

void GridController::clearSorting()
{
    bool changed = !m_sort.empty();
    m_sort.clear();
    for (ColumnState& s : m_columns) {
        // A grouped column keeps its direction for the group order.
        if (s.sortOrder != GridSortOrder::None && groupIndex(static_cast<int>(&s - m_columns.data())) < 0) {
            s.sortOrder = GridSortOrder::None;
            changed = true;
        }
    }
    if (!changed)
        return;
    m_pendingColumns = true;
    m_pendingFocusFirst = m_focusFirstAfterSort;
    invalidate(DirtySort);
}

void GridController::headerClicked(int c, Qt::KeyboardModifiers modifiers)
{
    if (c < 0 || c >= columnCount() || !column(c).sortable)
        return;
    const GridSortOrder current = sortIndex(c) >= 0 ? sortOrder(c) : GridSortOrder::None;
    const GridSortOrder toggled = current == GridSortOrder::Ascending ? GridSortOrder::Descending : GridSortOrder::Ascending;
    beginUpdate();
    if (modifiers & Qt::ControlModifier) {
        setSortOrder(c, GridSortOrder::None);
    } else if (modifiers & Qt::ShiftModifier) {
        setSortOrder(c, toggled);
    } else {
        const std::vector<int> others = m_sort;
        for (const int o : others) {
            if (o != c)
                setSortOrder(o, GridSortOrder::None);
        }
        setSortOrder(c, toggled);
    }
    endUpdate();
}

// --- grouping ------------------------------------------------------------------------------

int GridController::groupIndex(int c) const
{
    const auto it = std::find(m_groups.begin(), m_groups.end(), c);
    return it == m_groups.end() ? -1 : static_cast<int>(it - m_groups.begin());
}

void GridController::groupBy(int c, int level)
{
    if (c < 0 || c >= columnCount() || !column(c).groupable)
        return;
    beginUpdate();
    const auto it = std::find(m_groups.begin(), m_groups.end(), c);
    if (it != m_groups.end())
        m_groups.erase(it);
    if (level < 0 || level > static_cast<int>(m_groups.size()))
        level = static_cast<int>(m_groups.size());
    m_groups.insert(m_groups.begin() + level, c);
    setColumnVisible(c, false);
    m_pendingColumns = true;
    invalidate(DirtySort | DirtyGroups);
    endUpdate();
}

void GridController::ungroup(int c)
{
    const auto it = std::find(m_groups.begin(), m_groups.end(), c);
    if (it == m_groups.end())
        return;
    beginUpdate();
    m_groups.erase(it);
    if (sortIndex(c) < 0)
        m_columns[static_cast<size_t>(c)].sortOrder = GridSortOrder::None;
    setColumnVisible(c, true);
    m_pendingColumns = true;
    invalidate(DirtySort | DirtyGroups);
    endUpdate();
}

void GridController::clearGrouping()
{
    if (m_groups.empty())
        return;
    beginUpdate();
    while (!m_groups.empty())
        ungroup(m_groups.back());
    endUpdate();
}

void GridController::setGroupSortOrder(int c, GridSortOrder order)
{
    if (groupIndex(c) < 0 || sortOrder(c) == order)
        return;
    m_columns[static_cast<size_t>(c)].sortOrder = order;
    m_pendingColumns = true;
    invalidate(DirtySort | DirtyGroups);
}

void GridController::setGroupByBoxVisible(bool visible)
{
    if (m_groupByBox == visible)
        return;
    m_groupByBox = visible;
    announceColumns();
}

void GridController::expandAll(bool expand)
{
    ensureApplied();
    const FocusKey key = m_focusKey;
    m_expandDefault = expand;
    m_expandExceptions.clear();
    for (GroupNode& g : m_groupNodes)
        g.expanded = expand;
    buildDisplay();
    restoreFocus(key, false);
    m_pendingLayout = true;
    if (m_lock == 0)
        announce();
}

void GridController::setGroupExpanded(int row, bool expanded)
{
    ensureApplied();
    const int g = groupIdAt(row);
    if (g < 0 || m_groupNodes[static_cast<size_t>(g)].expanded == expanded)
        return;
    const FocusKey key = m_focusKey;
    m_groupNodes[static_cast<size_t>(g)].expanded = expanded;
    const QString k = groupKey(static_cast<quint32>(g));
    if (expanded != m_expandDefault)
        m_expandExceptions.insert(k);
    else
        m_expandExceptions.remove(k);
    buildDisplay();
    restoreFocus(key, false);
    m_pendingLayout = true;
    if (m_lock == 0)
        announce();
}

bool GridController::isGroupExpanded(int row) const
{
    const int g = groupIdAt(row);
    return g >= 0 && m_groupNodes[static_cast<size_t>(g)].expanded;
}

// --- filter --------------------------------------------------------------------------------

void GridController::setFilter(const GridFilter& filter)
{
    m_filter = filter;
    m_filter.root.isList = true;
    invalidate(DirtyFilter);
}

void GridController::setFilterActive(bool active)
{
    if (m_filter.active == active)
        return;
    m_filter.active = active;
    invalidate(DirtyFilter);
}

void GridController::addFilterItem(GridFilterItem item)
{
    m_filter.root.items.push_back(std::move(item));
    invalidate(DirtyFilter);
}

void GridController::clearFilterItems()
{
    if (m_filter.root.items.empty())
        return;
    m_filter.root.items.clear();
    invalidate(DirtyFilter);
}

void GridController::setTodayProvider(std::function<QDate()> today)
{
    m_today = today ? std::move(today) : std::function<QDate()>([] { return Clock::today(); });
    invalidate(DirtyFilter);
}

QDate GridController::today() const
{
    return m_today();
}

QString GridController::conditionText(const GridFilterItem& item) const
{
    const int c = columnByName(item.column);
    QString name = item.column;
    if (c >= 0 && !column(c).fieldName.isEmpty())
        name = column(c).fieldName;
    QString text = name + QLatin1Char(' ') + gridFilterOperatorName(item.op);
    if (!isPeriodOperator(item.op))
        text += QStringLiteral(" '") + (item.displayText.isEmpty() ? item.value : item.displayText) + QLatin1Char('\'');
    return text;
}

QString GridController::itemText(const GridFilterItem& item, bool top) const
{
    if (!item.isList)
        return conditionText(item);
    QStringList parts;
    for (const GridFilterItem& sub : item.items) {
        const QString t = itemText(sub, false);
        if (!t.isEmpty())
            parts << t;
    }
    if (parts.isEmpty())
        return {};
    const QString joined = parts.join(item.boolOp == GridFilterBoolOperator::Or ? QStringLiteral(" OR ") : QStringLiteral(" AND "));
    return (top || parts.size() == 1) ? joined : QLatin1Char('(') + joined + QLatin1Char(')');
}

QString GridController::filterText() const
{
    return itemText(m_filter.root, true);
}

// --- update lock ---------------------------------------------------------------------------

void GridController::beginUpdate()
{
    ++m_lock;
}

void GridController::endUpdate()
{
    if (m_lock == 0)
        return;
    if (--m_lock == 0) {
        apply();
        announce();
    }
}

void GridController::reapply()
{
    for (Ranks& r : m_ranks)
        r = Ranks();
    invalidate(DirtyFilter | DirtySort | DirtyGroups | DirtyDisplay);
}

void GridController::invalidate(unsigned dirty)
{
    m_dirty |= dirty;
    m_pendingLayout = true;
    if (m_lock == 0) {
        apply();
        announce();
    }
}

void GridController::ensureApplied() const
{
    if (m_dirty)
        const_cast<GridController*>(this)->apply();
}

void GridController::announceColumns()
{
    m_pendingColumns = true;
    if (m_lock == 0)
        announce();
}

void GridController::announce()
{
    if (m_dirty)
        apply();
    if (m_pendingColumns) {
        m_pendingColumns = false;
        Q_EMIT columnsChanged();
    }
    if (m_pendingLayout) {
        m_pendingLayout = false;
        Q_EMIT layoutChanged();
    }
    if (m_focusRow != m_announcedRow) {
        const int previous = m_announcedRow;
        m_announcedRow = m_focusRow;
        Q_EMIT focusChanged(previous, m_focusRow);
    }
    if (!(m_focusKey == m_announcedKey)) {
        m_announcedKey = m_focusKey;
        Q_EMIT focusedRecordChanged();
    }
}

// --- computing -----------------------------------------------------------------------------

void GridController::apply()
{
    const unsigned dirty = m_dirty;
    m_dirty = 0;
    if (!dirty)
        return;
    const FocusKey key = m_focusKey;
    if (!m_source) {
        m_filtered.clear();
        m_order.clear();
        m_groupNodes.clear();
        m_topGroups = 0;
        m_display.clear();
        m_focusRow = -1;
        m_focusKey = {};
        return;
    }
    if (dirty & DirtyFilter)
        applyFilter();
    if (dirty & (DirtyFilter | DirtySort))
        applySort();
    if (dirty & (DirtyFilter | DirtySort | DirtyGroups))
        buildGroups();
    buildDisplay();
    restoreFocus(key, m_pendingFocusFirst);
    m_pendingFocusFirst = false;
}

QByteArrayView GridController::keyText(int c, quint32 record) const
{
    const ColumnState& s = m_columns[static_cast<size_t>(c)];
    if (s.def.sortText)
        return s.def.sortText(*m_source, record);
    if (s.field >= 0)
        return m_source->textValue(record, s.field);
    return {};
}

void GridController::applyFilter()
{
    const quint32 n = m_source->rowCount();
    m_filtered.clear();
    if (!m_filter.active || m_filter.root.items.empty()) {
        m_filtered.resize(n);
        std::iota(m_filtered.begin(), m_filtered.end(), 0u);
        return;
    }
    const QDate today = m_today();
    const std::function<CompiledFilter(const GridFilterItem&)> compile = [&](const GridFilterItem& item) {
        CompiledFilter f;
        f.isList = item.isList;
        f.isOr = item.boolOp == GridFilterBoolOperator::Or;
        if (item.isList) {
            for (const GridFilterItem& sub : item.items)
                f.items.push_back(compile(sub));
            return f;
        }
        f.column = columnByName(item.column);
        f.field = f.column >= 0 ? columnField(f.column) : -1;
        f.op = item.op;
        f.value = item.value;
        f.latin1 = item.value.toLatin1();
        const qint64 t = today.toJulianDay();
        switch (item.op) {
        case GridFilterOperator::Today:
            f.lo = f.hi = t;
            break;
        case GridFilterOperator::ThisWeek:
            f.lo = t - (today.dayOfWeek() - 1);
            f.hi = f.lo + 6;
            break;
        case GridFilterOperator::ThisMonth: {
            const QDate first(today.year(), today.month(), 1);
            f.lo = first.toJulianDay();
            f.hi = first.addMonths(1).toJulianDay() - 1;
            break;
        }
        default:
            break;
        }
        return f;
    };
    const CompiledFilter root = compile(m_filter.root);

    const std::function<bool(const CompiledFilter&, quint32)> eval = [&](const CompiledFilter& f, quint32 r) -> bool {
        if (f.isList) {
            if (f.items.empty())
                return true;
            for (const CompiledFilter& sub : f.items) {
                const bool hit = eval(sub, r);
                if (f.isOr && hit)
                    return true;
                if (!f.isOr && !hit)
                    return false;
            }
            return !f.isOr;
        }
        if (f.column < 0)
            return true; // a condition on a column this grid does not have restricts nothing
        const ColumnState& s = m_columns[static_cast<size_t>(f.column)];
        if (isPeriodOperator(f.op)) {
            if (s.field < 0 || m_source->isNull(r, s.field))
                return false;
            const GridFieldType type = m_source->fieldType(s.field);
            qint64 day = 0;
            if (type == GridFieldType::Date)
                day = m_source->intValue(r, s.field);
            else if (type == GridFieldType::DateTime)
                day = floorDiv(m_source->intValue(r, s.field), gridvalue::msPerDay);
            else
                return false;
            return day >= f.lo && day <= f.hi;
        }
        switch (f.op) {
        case GridFilterOperator::Like:
        case GridFilterOperator::NotLike: {
            const bool hit = s.textKey ? gridcollation::like(keyText(f.column, r), f.latin1)
                                       : gridcollation::like(cellText(r, f.column).toLatin1(), f.latin1);
            return (f.op == GridFilterOperator::Like) == hit;
        }
        case GridFilterOperator::Equal:
        case GridFilterOperator::NotEqual: {
            const bool hit = s.textKey ? gridcollation::compare(keyText(f.column, r), f.latin1) == 0
                                       : cellText(r, f.column).compare(f.value, Qt::CaseInsensitive) == 0;
            return (f.op == GridFilterOperator::Equal) == hit;
        }
        default:
            return false;
        }
    };

    // The common case, one period condition, runs without the recursive evaluator.
    const CompiledFilter* single = &root;
    while (single->isList && single->items.size() == 1)
        single = &single->items.front();
    if (!single->isList && isPeriodOperator(single->op) && single->column >= 0 && single->field >= 0
        && m_source->fieldType(single->field) == GridFieldType::Date) {
        const int field = single->field;
        for (quint32 r = 0; r < n; ++r) {
            if (m_source->isNull(r, field))
                continue;
            const qint64 day = m_source->intValue(r, field);
            if (day >= single->lo && day <= single->hi)
                m_filtered.push_back(r);
        }
        return;
    }
    for (quint32 r = 0; r < n; ++r) {
        if (eval(root, r))
            m_filtered.push_back(r);
    }
}

GridSortOrder GridController::effectiveOrder(int c) const
{
    const GridSortOrder o = sortOrder(c);
    return o == GridSortOrder::None ? GridSortOrder::Ascending : o;
}

std::vector<int> GridController::sortKeys() const
{
    std::vector<int> keys = m_groups;
    for (const int c : m_sort) {
        if (std::find(keys.begin(), keys.end(), c) == keys.end())
            keys.push_back(c);
    }
    return keys;
}

void GridController::applySort()
{
    m_order = m_filtered;
    const std::vector<int> keys = sortKeys();
    if (keys.empty() || m_order.size() < 2)
        return;
    std::vector<quint32> tmp;
    // Least significant key first: each pass is stable, so earlier keys decide last.
    for (auto it = keys.rbegin(); it != keys.rend(); ++it) {
        const Ranks& r = ranksOf(*it);
        if (r.max == 0)
            continue;
        countingSortPass(m_order, r.rank, r.max, effectiveOrder(*it) == GridSortOrder::Descending, tmp);
    }
}

const GridController::Ranks& GridController::ranksOf(int c) const
{
    Ranks& r = m_ranks[static_cast<size_t>(c)];
    if (!r.valid) {
        if (m_columns[static_cast<size_t>(c)].textKey)
            computeTextRanks(c, r);
        else
            computeNumericRanks(c, r);
        r.valid = true;
    }
    return r;
}

void GridController::computeTextRanks(int c, Ranks& out) const
{
    const quint32 n = m_source->rowCount();
    out.rank.resize(n);
    TextInterner interner(n);
    for (quint32 row = 0; row < n; ++row)
        out.rank[row] = interner.intern(keyText(c, row));
    // Collation keys of the distinct texts in one buffer, then a byte-wise sort of them.
    const std::vector<QByteArrayView>& texts = interner.texts();
    QByteArray keys;
    std::vector<quint32> keyStart(texts.size() + 1);
    for (size_t i = 0; i < texts.size(); ++i) {
        keyStart[i] = static_cast<quint32>(keys.size());
        gridcollation::appendSortKey(texts[i], keys);
    }
    keyStart[texts.size()] = static_cast<quint32>(keys.size());
    const auto key = [&](quint32 id) {
        return std::string_view(keys.constData() + keyStart[id], keyStart[id + 1] - keyStart[id]);
    };
    std::vector<quint32> byText(texts.size());
    std::iota(byText.begin(), byText.end(), 0u);
    std::sort(byText.begin(), byText.end(), [&](quint32 a, quint32 b) { return key(a) < key(b); });
    std::vector<quint32> rankOfId(texts.size());
    quint32 rank = 0;
    for (size_t i = 0; i < byText.size(); ++i) {
        if (i > 0 && key(byText[i - 1]) != key(byText[i]))
            ++rank;
        rankOfId[byText[i]] = rank;
    }
    for (quint32& v : out.rank)
        v = rankOfId[v];
    out.max = rank;
}

void GridController::computeNumericRanks(int c, Ranks& out) const
{
    const quint32 n = m_source->rowCount();
    const int field = m_columns[static_cast<size_t>(c)].field;
    out.rank.assign(n, 0);
    out.max = 0;
    if (field < 0 || n == 0)
        return;
    const bool isDouble = m_source->fieldType(field) == GridFieldType::Double;
    // Values as order-preserving integers; doubles through their bit pattern.
    std::vector<qint64> values(n);
    std::vector<quint8> nulls(n, 0);
    qint64 lo = std::numeric_limits<qint64>::max();
    qint64 hi = std::numeric_limits<qint64>::min();
    bool any = false;
    for (quint32 r = 0; r < n; ++r) {
        if (m_source->isNull(r, field)) {
            nulls[r] = 1;
            continue;
        }
        qint64 v = 0;
        if (isDouble) {
            const auto bits = std::bit_cast<quint64>(m_source->doubleValue(r, field));
            const quint64 ordered = (bits & 0x8000'0000'0000'0000ull) ? ~bits : (bits | 0x8000'0000'0000'0000ull);
            v = static_cast<qint64>(ordered ^ 0x8000'0000'0000'0000ull);
        } else {
            v = m_source->intValue(r, field);
        }
        values[r] = v;
        lo = std::min(lo, v);
        hi = std::max(hi, v);
        any = true;
    }
    if (!any)
        return;
    const auto span = static_cast<quint64>(hi) - static_cast<quint64>(lo);
    // Times are stored in milliseconds but mostly whole seconds: scale them down when exact.
    quint64 step = 1;
    if (span >= (1u << 22)) {
        step = 1000;
        for (quint32 r = 0; r < n && step > 1; ++r) {
            if (!nulls[r] && (static_cast<quint64>(values[r]) - static_cast<quint64>(lo)) % step != 0)
                step = 1;
        }
    }
    const quint64 scaled = span / step;
    if (scaled < (1u << 22) || scaled < static_cast<quint64>(n) * 2) {
        for (quint32 r = 0; r < n; ++r) {
            if (!nulls[r])
                out.rank[r] = static_cast<quint32>((static_cast<quint64>(values[r]) - static_cast<quint64>(lo)) / step) + 1;
        }
        out.max = static_cast<quint32>(scaled) + 1;
        return;
    }
    std::vector<std::pair<qint64, quint32>> pairs;
    pairs.reserve(n);
    for (quint32 r = 0; r < n; ++r) {
        if (!nulls[r])
            pairs.emplace_back(values[r], r);
    }
    std::sort(pairs.begin(), pairs.end());
    quint32 rank = 0;
    for (size_t i = 0; i < pairs.size(); ++i) {
        if (i == 0 || pairs[i].first != pairs[i - 1].first)
            ++rank;
        out.rank[pairs[i].second] = rank;
    }
    out.max = rank;
}

void GridController::buildGroups()
{
    m_groupNodes.clear();
    m_topGroups = 0;
    if (m_groups.empty() || m_order.empty())
        return;
    // Level by level, so the subgroups of one group lie next to each other.
    size_t levelBegin = 0;
    size_t levelEnd = 0;
    for (size_t level = 0; level < m_groups.size(); ++level) {
        const std::vector<quint32>& rank = ranksOf(m_groups[level]).rank;
        const auto split = [&](quint32 first, quint32 count, qint32 parent) {
            quint32 start = first;
            for (quint32 p = first + 1; p <= first + count; ++p) {
                if (p == first + count || rank[m_order[p]] != rank[m_order[start]]) {
                    GroupNode g;
                    g.first = start;
                    g.count = p - start;
                    g.parent = parent;
                    g.level = static_cast<quint16>(level);
                    m_groupNodes.push_back(g);
                    start = p;
                }
            }
        };
        if (level == 0) {
            split(0, static_cast<quint32>(m_order.size()), -1);
            m_topGroups = static_cast<quint32>(m_groupNodes.size());
            levelBegin = 0;
            levelEnd = m_groupNodes.size();
            continue;
        }
        for (size_t p = levelBegin; p < levelEnd; ++p) {
            const auto childBegin = static_cast<quint32>(m_groupNodes.size());
            split(m_groupNodes[p].first, m_groupNodes[p].count, static_cast<qint32>(p));
            m_groupNodes[p].childBegin = childBegin;
            m_groupNodes[p].childEnd = static_cast<quint32>(m_groupNodes.size());
        }
        levelBegin = levelEnd;
        levelEnd = m_groupNodes.size();
    }
    for (size_t g = 0; g < m_groupNodes.size(); ++g) {
        bool expanded = m_expandDefault;
        if (!m_expandExceptions.isEmpty() && m_expandExceptions.contains(groupKey(static_cast<quint32>(g))))
            expanded = !expanded;
        m_groupNodes[g].expanded = expanded;
    }
}

QString GridController::groupKey(quint32 group) const
{
    QString key;
    for (qint32 g = static_cast<qint32>(group); g >= 0; g = m_groupNodes[static_cast<size_t>(g)].parent) {
        const GroupNode& node = m_groupNodes[static_cast<size_t>(g)];
        key.prepend(cellText(m_order[node.first], m_groups[node.level]) + QChar(0x1F));
    }
    return key;
}

void GridController::buildDisplay()
{
    m_display.clear();
    if (m_groups.empty())
        return;
    const std::function<void(quint32)> emitGroup = [&](quint32 g) {
        const GroupNode& node = m_groupNodes[g];
        m_display.push_back(g | kGroupBit);
        if (!node.expanded)
            return;
        if (node.childBegin < node.childEnd) {
            for (quint32 c = node.childBegin; c < node.childEnd; ++c)
                emitGroup(c);
        } else {
            for (quint32 p = node.first; p < node.first + node.count; ++p)
                m_display.push_back(p);
        }
    };
    for (quint32 g = 0; g < m_topGroups; ++g)
        emitGroup(g);
}

// --- rows ----------------------------------------------------------------------------------

int GridController::rowCount() const
{
    ensureApplied();
    return static_cast<int>(m_groups.empty() ? m_order.size() : m_display.size());
}

int GridController::recordCount() const
{
    ensureApplied();
    return static_cast<int>(m_order.size());
}

int GridController::groupIdAt(int row) const
{
    ensureApplied();
    if (m_groups.empty() || row < 0 || static_cast<size_t>(row) >= m_display.size())
        return -1;
    const quint32 e = m_display[static_cast<size_t>(row)];
    return (e & kGroupBit) ? static_cast<int>(e & ~kGroupBit) : -1;
}

bool GridController::isGroupRow(int row) const
{
    return groupIdAt(row) >= 0;
}

int GridController::recordAt(int row) const
{
    ensureApplied();
    if (row < 0)
        return -1;
    if (m_groups.empty())
        return static_cast<size_t>(row) < m_order.size() ? static_cast<int>(m_order[static_cast<size_t>(row)]) : -1;
    if (static_cast<size_t>(row) >= m_display.size())
        return -1;
    const quint32 e = m_display[static_cast<size_t>(row)];
    return (e & kGroupBit) ? -1 : static_cast<int>(m_order[e]);
}

int GridController::groupLevel(int row) const
{
    const int g = groupIdAt(row);
    return g < 0 ? -1 : m_groupNodes[static_cast<size_t>(g)].level;
}

int GridController::groupColumn(int row) const
{
    const int g = groupIdAt(row);
    return g < 0 ? -1 : m_groups[m_groupNodes[static_cast<size_t>(g)].level];
}

int GridController::groupRecordCount(int row) const
{
    const int g = groupIdAt(row);
    return g < 0 ? 0 : static_cast<int>(m_groupNodes[static_cast<size_t>(g)].count);
}

QString GridController::groupValueText(int row) const
{
    const int g = groupIdAt(row);
    if (g < 0)
        return {};
    const GroupNode& node = m_groupNodes[static_cast<size_t>(g)];
    return cellText(m_order[node.first], m_groups[node.level]);
}

QString GridController::groupRowText(int row) const
{
    const int c = groupColumn(row);
    if (c < 0)
        return {};
    const QString value = groupValueText(row);
    const QString count = QStringLiteral(" (%1)").arg(groupRecordCount(row));
    const QString& caption = column(c).caption;
    return caption.isEmpty() ? value + count : caption + QStringLiteral(": ") + value + count;
}

QString GridController::displayText(int row, int c) const
{
    const int record = recordAt(row);
    return record < 0 ? QString() : cellText(static_cast<quint32>(record), c);
}

QString GridController::cellText(quint32 record, int c) const
{
    if (!m_source || c < 0 || c >= columnCount() || record >= m_source->rowCount())
        return {};
    const ColumnState& s = m_columns[static_cast<size_t>(c)];
    if (s.def.displayText)
        return s.def.displayText(*m_source, record);
    if (s.def.sortText)
        return QString::fromLatin1(s.def.sortText(*m_source, record));
    if (s.field < 0 || m_source->isNull(record, s.field))
        return {};
    return gridformat::formatValue(*m_source, record, s.field, s.def.numberFormat);
}

QVariant GridController::cellValue(quint32 record, int c) const
{
    if (!m_source || c < 0 || c >= columnCount())
        return {};
    const int field = columnField(c);
    return field < 0 ? QVariant() : m_source->value(record, field);
}

int GridController::rowOfRecord(quint32 record) const
{
    ensureApplied();
    const auto it = std::find(m_order.begin(), m_order.end(), record);
    if (it == m_order.end())
        return -1;
    const auto pos = static_cast<quint32>(it - m_order.begin());
    if (m_groups.empty())
        return static_cast<int>(pos);
    const auto at = std::find(m_display.begin(), m_display.end(), pos);
    return at == m_display.end() ? -1 : static_cast<int>(at - m_display.begin());
}

int GridController::rowOfGroup(quint32 group) const
{
    const auto at = std::find(m_display.begin(), m_display.end(), group | kGroupBit);
    return at == m_display.end() ? -1 : static_cast<int>(at - m_display.begin());
}

// --- focus ---------------------------------------------------------------------------------

GridController::FocusKey GridController::focusKey() const
{
    FocusKey key;
    if (m_focusRow < 0)
        return key;
    const int g = groupIdAt(m_focusRow);
    if (g >= 0) {
        const GroupNode& node = m_groupNodes[static_cast<size_t>(g)];
        key.record = static_cast<int>(m_order[node.first]);
        key.groupLevel = node.level;
    } else {
        key.record = recordAt(m_focusRow);
    }
    return key;
}

void GridController::restoreFocus(const FocusKey& key, bool focusFirst)
{
    int row = -1;
    if (!focusFirst && key.record >= 0) {
        const auto it = std::find(m_order.begin(), m_order.end(), static_cast<quint32>(key.record));
        if (it != m_order.end()) {
            const auto pos = static_cast<quint32>(it - m_order.begin());
            if (m_groups.empty()) {
                row = static_cast<int>(pos);
            } else {
                // The group at the remembered level holding the record, or the deepest visible
                // one when the record's row is inside a collapsed group.
                const auto contains = [&](quint32 g) {
                    return pos >= m_groupNodes[g].first && pos < m_groupNodes[g].first + m_groupNodes[g].count;
                };
                quint32 begin = 0;
                quint32 end = m_topGroups;
                while (begin < end) {
                    quint32 g = begin;
                    while (g < end && !contains(g))
                        ++g;
                    if (g == end)
                        break;
                    const GroupNode& node = m_groupNodes[g];
                    row = rowOfGroup(g);
                    if (node.level == key.groupLevel || !node.expanded)
                        break;
                    if (node.childBegin < node.childEnd) {
                        begin = node.childBegin;
                        end = node.childEnd;
                    } else {
                        if (key.groupLevel < 0) {
                            const auto at = std::find(m_display.begin(), m_display.end(), pos);
                            if (at != m_display.end())
                                row = static_cast<int>(at - m_display.begin());
                        }
                        break;
                    }
                }
            }
        }
    }
    const int rows = static_cast<int>(m_groups.empty() ? m_order.size() : m_display.size());
    if (row < 0 && rows > 0)
        row = 0;
    m_focusRow = row;
    updateFocusKey();
}

void GridController::updateFocusKey()
{
    m_focusKey = focusKey();
    const int keyField = (m_source && !m_keyFieldName.isEmpty()) ? m_source->fieldIndex(m_keyFieldName) : -1;
    const int record = m_focusKey.record;
    m_focusedKeyValid = keyField >= 0 && record >= 0 && !m_source->isNull(static_cast<quint32>(record), keyField);
    m_focusedKeyValue = m_focusedKeyValid ? m_source->intValue(static_cast<quint32>(record), keyField) : 0;
}

void GridController::changeFocus(int row)
{
    m_focusRow = row;
    updateFocusKey();
    if (m_lock == 0)
        announce();
}

void GridController::setFocusedRow(int row)
{
    ensureApplied();
    const int rows = rowCount();
    if (rows == 0)
        row = -1;
    else
        row = std::clamp(row, 0, rows - 1);
    changeFocus(row);
}

int GridController::focusedRecord() const
{
    ensureApplied();
    return recordAt(m_focusRow);
}

bool GridController::focusRecord(quint32 record)
{
    ensureApplied();
    const auto it = std::find(m_order.begin(), m_order.end(), record);
    if (it == m_order.end())
        return false;
    if (!m_groups.empty()) {
        const auto pos = static_cast<quint32>(it - m_order.begin());
        bool changed = false;
        for (quint32 g = 0; g < m_groupNodes.size(); ++g) {
            GroupNode& node = m_groupNodes[g];
            if (pos >= node.first && pos < node.first + node.count && !node.expanded) {
                node.expanded = true;
                const QString k = groupKey(g);
                if (m_expandDefault)
                    m_expandExceptions.remove(k);
                else
                    m_expandExceptions.insert(k);
                changed = true;
            }
        }
        if (changed) {
            buildDisplay();
            m_pendingLayout = true;
        }
    }
    changeFocus(rowOfRecord(record));
    return true;
}

} // namespace orvanta
