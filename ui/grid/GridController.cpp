#include "ui/grid/GridController.h"

#include "ui/grid/GridCollation.h"

#include <algorithm>
#include <cmath>

namespace orvanta {

GridController::GridController(QObject* parent)
    : QObject(parent)
    , m_grouping(m_order, [this](quint32 record, int c) { return cellText(record, c); })
{
}

GridController::~GridController() = default;

// --- columns -------------------------------------------------------------------------------

int GridController::addColumn(GridColumn column)
{
    GridColumnState s;
    s.def = std::move(column);
    if (s.def.width <= 0)
        s.def.width = 64;
    m_columns.push_back(std::move(s));
    const int c = columnCount() - 1;
    m_visual.push_back(c);
    m_sorter.addColumn();
    resolveFields();
    m_pendingColumns = true;
    invalidate(DirtyDisplay);
    return c;
}

int GridController::columnByName(QStringView name) const
{
    return gridColumnByName(m_columns, name);
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
        GridColumnState& s = m_columns[c];
        s.field = (m_source && !s.def.fieldName.isEmpty()) ? m_source->fieldIndex(s.def.fieldName) : -1;
        s.textKey = static_cast<bool>(s.def.sortText)
                    || (s.field >= 0 && m_source->fieldType(s.field) == GridFieldType::Text);
    }
    m_sorter.invalidateRanks();
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
    m_sorter.invalidateRanks();
    m_focusKey.record = record;
    if (record < 0)
        m_focusKey.groupLevel = -1;
    invalidate(DirtyFilter | DirtySort | DirtyGroups | DirtyDisplay);
}

int GridController::compareRecords(int c, quint32 a, quint32 b) const
{
    const GridColumnState& s = m_columns[static_cast<size_t>(c)];
    if (s.textKey)
        return gridcollation::compare(s.keyText(*m_source, a), s.keyText(*m_source, b));
    if (s.field < 0)
        return 0;
    const bool nullA = m_source->isNull(a, s.field);
    const bool nullB = m_source->isNull(b, s.field);
    if (nullA || nullB)
        return int(nullB) - int(nullA); // null first, as its rank is the lowest
    if (m_source->fieldType(s.field) == GridFieldType::Double) {
        const double x = m_source->doubleValue(a, s.field);
        const double y = m_source->doubleValue(b, s.field);
        return x < y ? -1 : (y < x ? 1 : 0);
    }
    const qint64 x = m_source->intValue(a, s.field);
    const qint64 y = m_source->intValue(b, s.field);
    return x < y ? -1 : (y < x ? 1 : 0);
}

void GridController::sourceAppended()
{
    if (!m_source)
        return;
    ensureApplied();
    const quint32 from = m_appliedRows;
    if (m_source->rowCount() <= from)
        return;
    // Ranks are per source content: the new rows make them stale for any later full sort.
    m_sorter.invalidateRanks();
    if (isGrouped()) {
        invalidate(DirtyFilter | DirtySort | DirtyGroups | DirtyDisplay);
        return;
    }
    const size_t before = m_filtered.size();
    m_rowFilter.apply(*m_source, m_columns, m_filtered, from);
    m_appliedRows = m_source->rowCount();
    if (m_filtered.size() == before)
        return;
    std::vector<quint32> added(m_filtered.begin() + static_cast<std::ptrdiff_t>(before), m_filtered.end());
    const std::vector<int>& keys = m_sorter.sortedColumns();
    const auto less = [this, &keys](quint32 a, quint32 b) {
        for (const int c : keys) {
            const int cmp = compareRecords(c, a, b);
            if (cmp != 0)
                return m_columns[static_cast<size_t>(c)].sortOrder == GridSortOrder::Descending ? cmp > 0 : cmp < 0;
        }
        return false;
    };
    // The new records are the highest indexes: after every equal one already shown, as the
    // stable full sort would place them. Each finds its place by a binary search, so a batch
    // costs its own size times the log of the rows shown, plus one copy.
    std::vector<quint32> merged;
    if (keys.empty()) {
        merged = m_order;
        merged.insert(merged.end(), added.begin(), added.end());
    } else {
        // Batches mostly come in the order shown or in its reverse: then no sort is needed.
        const auto strictlyReversed = [&] {
            for (size_t i = 1; i < added.size(); ++i) {
                if (!less(added[i], added[i - 1]))
                    return false;
            }
            return true;
        };
        if (!std::is_sorted(added.begin(), added.end(), less)) {
            if (strictlyReversed())
                std::reverse(added.begin(), added.end());
            else
                std::stable_sort(added.begin(), added.end(), less);
        }
        merged.reserve(m_order.size() + added.size());
        // A batch large against the rows shown is merged in one pass; a small one searches.
        const bool linear = double(added.size()) * std::log2(double(m_order.size()) + 2.0) > double(m_order.size());
        auto from = m_order.begin();
        for (const quint32 record : added) {
            // Where the previous one went is the likeliest place: one comparison then.
            auto at = from;
            if (linear) {
                while (at != m_order.end() && !less(record, *at))
                    ++at;
            } else if (at != m_order.end() && !less(record, *at)) {
                at = std::upper_bound(from, m_order.end(), record, less);
            }
            merged.insert(merged.end(), from, at);
            merged.push_back(record);
            from = at;
        }
        merged.insert(merged.end(), from, m_order.end());
    }
    m_order.swap(merged);
    const FocusKey key = m_focusKey;
    m_grouping.build([this](int c) -> const std::vector<quint32>& {
        return m_sorter.ranksOf(c, *m_source, m_columns).rank;
    });
    m_grouping.buildDisplay();
    restoreFocus(key, false);
    m_pendingLayout = true;
    if (m_lock == 0) {
        m_announcingArrival = true;
        announce();
        m_announcingArrival = false;
    }
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
    GridColumnState& s = m_columns[static_cast<size_t>(c)];
    const bool isKey = m_sorter.sortIndex(c) >= 0;
    if (order == GridSortOrder::None) {
        if (!isKey && s.sortOrder == GridSortOrder::None)
            return;
        m_sorter.removeKey(c);
    } else {
        if (!s.def.sortable)
            return;
        if (isKey && s.sortOrder == order)
            return;
        m_sorter.addKey(c);
    }
    s.sortOrder = order;
    m_pendingColumns = true;
    m_pendingFocusFirst = m_focusFirstAfterSort;
    invalidate(DirtySort);
}

void GridController::clearSorting()
{
    bool changed = !m_sorter.sortedColumns().empty();
    m_sorter.clearKeys();
    for (size_t c = 0; c < m_columns.size(); ++c) {
        GridColumnState& s = m_columns[c];
        // A grouped column keeps its direction for the group order.
        if (s.sortOrder != GridSortOrder::None && groupIndex(static_cast<int>(c)) < 0) {
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
        const std::vector<int> others = m_sorter.sortedColumns();
        for (const int o : others) {
            if (o != c)
                setSortOrder(o, GridSortOrder::None);
        }
        setSortOrder(c, toggled);
    }
    endUpdate();
}

// --- grouping ------------------------------------------------------------------------------

void GridController::groupBy(int c, int level)
{
    if (c < 0 || c >= columnCount() || !column(c).groupable)
        return;
    beginUpdate();
    m_grouping.insert(c, level);
    setColumnVisible(c, false);
    m_pendingColumns = true;
    invalidate(DirtySort | DirtyGroups);
    endUpdate();
}

void GridController::ungroup(int c)
{
    if (groupIndex(c) < 0)
        return;
    beginUpdate();
    m_grouping.remove(c);
    if (sortIndex(c) < 0)
        m_columns[static_cast<size_t>(c)].sortOrder = GridSortOrder::None;
    setColumnVisible(c, true);
    m_pendingColumns = true;
    invalidate(DirtySort | DirtyGroups);
    endUpdate();
}

void GridController::clearGrouping()
{
    if (!isGrouped())
        return;
    beginUpdate();
    while (isGrouped())
        ungroup(groupedColumns().back());
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
    if (m_grouping.setGroupByBoxVisible(visible))
        announceColumns();
}

void GridController::expandAll(bool expand)
{
    ensureApplied();
    const FocusKey key = m_focusKey;
    m_grouping.expandAll(expand);
    restoreFocus(key, false);
    m_pendingLayout = true;
    if (m_lock == 0)
        announce();
}

void GridController::setGroupExpanded(int row, bool expanded)
{
    ensureApplied();
    const int g = groupIdAt(row);
    if (g < 0)
        return;
    const FocusKey key = m_focusKey;
    if (!m_grouping.setExpanded(static_cast<quint32>(g), expanded))
        return;
    restoreFocus(key, false);
    m_pendingLayout = true;
    if (m_lock == 0)
        announce();
}

bool GridController::isGroupExpanded(int row) const
{
    const int g = groupIdAt(row);
    return g >= 0 && m_grouping.node(static_cast<quint32>(g)).expanded;
}

// --- filter --------------------------------------------------------------------------------

void GridController::setFilter(const GridFilter& filter)
{
    m_rowFilter.setFilter(filter);
    invalidate(DirtyFilter);
}

void GridController::setFilterActive(bool active)
{
    if (m_rowFilter.setActive(active))
        invalidate(DirtyFilter);
}

void GridController::addFilterItem(GridFilterItem item)
{
    m_rowFilter.addItem(std::move(item));
    invalidate(DirtyFilter);
}

void GridController::clearFilterItems()
{
    if (m_rowFilter.clearItems())
        invalidate(DirtyFilter);
}

void GridController::setTodayProvider(std::function<QDate()> today)
{
    m_rowFilter.setTodayProvider(std::move(today));
    invalidate(DirtyFilter);
}

void GridController::setSearch(const GridSearch& search)
{
    if (m_rowFilter.setSearch(search))
        invalidate(DirtyFilter);
}

QString GridController::filterText() const
{
    return m_rowFilter.text(m_columns);
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

GridController::FieldRanks GridController::takeFieldRanks()
{
    FieldRanks out;
    for (int c = 0; c < columnCount(); ++c) {
        const GridColumnState& s = m_columns[static_cast<size_t>(c)];
        if (s.field < 0 || s.def.sortText)
            continue;
        GridRanks r = m_sorter.takeRanks(c);
        if (r.valid)
            out.emplace_back(s.def.fieldName, std::move(r));
    }
    return out;
}

void GridController::adoptFieldRanks(FieldRanks ranks)
{
    if (!m_source)
        return;
    for (auto& [field, r] : ranks) {
        if (r.rank.size() != m_source->rowCount())
            continue;
        for (int c = 0; c < columnCount(); ++c) {
            const GridColumnState& s = m_columns[static_cast<size_t>(c)];
            if (s.field >= 0 && !s.def.sortText && s.def.fieldName.compare(field, Qt::CaseInsensitive) == 0) {
                m_sorter.adoptRanks(c, r);
                break;
            }
        }
    }
}

void GridController::reapply()
{
    m_sorter.invalidateRanks();
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
        m_appliedRows = 0;
        m_filtered.clear();
        m_order.clear();
        m_grouping.clear();
        m_focusRow = -1;
        m_focusKey = {};
        return;
    }
    if (dirty & DirtyFilter) {
        m_rowFilter.apply(*m_source, m_columns, m_filtered);
        m_appliedRows = m_source->rowCount();
    }
    if (dirty & (DirtyFilter | DirtySort)) {
        m_order = m_filtered;
        m_sorter.sort(m_order, m_sorter.keysAfter(groupedColumns()), *m_source, m_columns);
    }
    if (dirty & (DirtyFilter | DirtySort | DirtyGroups)) {
        m_grouping.build([this](int c) -> const std::vector<quint32>& {
            return m_sorter.ranksOf(c, *m_source, m_columns).rank;
        });
    }
    m_grouping.buildDisplay();
    restoreFocus(key, m_pendingFocusFirst);
    m_pendingFocusFirst = false;
}

// --- rows ----------------------------------------------------------------------------------

int GridController::rowCount() const
{
    ensureApplied();
    return static_cast<int>(isGrouped() ? m_grouping.displayRowCount() : m_order.size());
}

int GridController::recordCount() const
{
    ensureApplied();
    return static_cast<int>(m_order.size());
}

int GridController::groupIdAt(int row) const
{
    ensureApplied();
    return m_grouping.groupIdAt(row);
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
    if (!isGrouped())
        return static_cast<size_t>(row) < m_order.size() ? static_cast<int>(m_order[static_cast<size_t>(row)]) : -1;
    const int pos = m_grouping.positionAt(row);
    return pos < 0 ? -1 : static_cast<int>(m_order[static_cast<size_t>(pos)]);
}

int GridController::groupLevel(int row) const
{
    const int g = groupIdAt(row);
    return g < 0 ? -1 : m_grouping.node(static_cast<quint32>(g)).level;
}

int GridController::groupColumn(int row) const
{
    const int g = groupIdAt(row);
    return g < 0 ? -1 : groupedColumns()[m_grouping.node(static_cast<quint32>(g)).level];
}

int GridController::groupRecordCount(int row) const
{
    const int g = groupIdAt(row);
    return g < 0 ? 0 : static_cast<int>(m_grouping.node(static_cast<quint32>(g)).count);
}

QString GridController::groupValueText(int row) const
{
    const int g = groupIdAt(row);
    if (g < 0)
        return {};
    const GridGrouping::Node& node = m_grouping.node(static_cast<quint32>(g));
    return cellText(m_order[node.first], groupedColumns()[node.level]);
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
    return m_columns[static_cast<size_t>(c)].cellText(*m_source, record);
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
    return isGrouped() ? m_grouping.rowOfPosition(pos) : static_cast<int>(pos);
}

// --- focus ---------------------------------------------------------------------------------

GridController::FocusKey GridController::focusKey() const
{
    FocusKey key;
    if (m_focusRow < 0)
        return key;
    const int g = groupIdAt(m_focusRow);
    if (g >= 0) {
        const GridGrouping::Node& node = m_grouping.node(static_cast<quint32>(g));
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
            row = isGrouped() ? m_grouping.rowShowing(pos, key.groupLevel) : static_cast<int>(pos);
        }
    }
    const int rows = static_cast<int>(isGrouped() ? m_grouping.displayRowCount() : m_order.size());
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
    if (isGrouped() && m_grouping.expandAround(static_cast<quint32>(it - m_order.begin())))
        m_pendingLayout = true;
    changeFocus(rowOfRecord(record));
    return true;
}

} // namespace orvanta
