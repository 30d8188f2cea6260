#include "ui/grid/GridSnapshot.h"

#include "ui/grid/GridController.h"

namespace orvanta {

GridSnapshot::GridSnapshot(const GridController& grid, const QStringList& excludedNames)
    : m_grid(grid)
    , m_groupColumns(grid.groupedColumns())
    , m_records(grid.recordsInOrder())
{
    for (const int c : grid.visibleColumns()) {
        const GridColumn& def = grid.column(c);
        if (excludedNames.contains(def.name, Qt::CaseInsensitive))
            continue;
        m_columns.push_back({c, def.name, def.caption});
    }
}

void GridSnapshot::rewind()
{
    m_pos = 0;
    m_started = false;
    m_pendingLevel = -1;
    m_emitLevel = 0;
}

QString GridSnapshot::keyText(size_t pos, int level) const
{
    return m_grid.cellText(m_records[pos], m_groupColumns[static_cast<size_t>(level)]);
}

qint64 GridSnapshot::groupSize(size_t pos, int level) const
{
    size_t end = pos + 1;
    while (end < m_records.size()) {
        bool same = true;
        for (int l = 0; l <= level && same; ++l)
            same = keyText(end, l) == keyText(pos, l);
        if (!same)
            break;
        ++end;
    }
    return static_cast<qint64>(end - pos);
}

bool GridSnapshot::next()
{
    // Inside a run of group rows: the next level, and after the last one the record itself.
    if (m_pendingLevel >= 0 && m_emitLevel < groupLevels()) {
        ++m_emitLevel;
        return true;
    }
    if (m_started)
        ++m_pos;
    m_started = true;
    m_pendingLevel = -1;
    if (m_pos >= m_records.size())
        return false;
    if (groupLevels() == 0)
        return true;
    // First level whose value differs from the previous record opens new groups.
    int first = 0;
    if (m_pos > 0) {
        first = groupLevels();
        for (int l = 0; l < groupLevels(); ++l) {
            if (keyText(m_pos, l) != keyText(m_pos - 1, l)) {
                first = l;
                break;
            }
        }
    }
    if (first == groupLevels())
        return true;
    m_pendingLevel = first;
    m_emitLevel = first;
    return true;
}

QString GridSnapshot::groupText() const
{
    if (!isGroupRow())
        return {};
    const int c = m_groupColumns[static_cast<size_t>(m_emitLevel)];
    const QString value = keyText(m_pos, m_emitLevel);
    const QString count = QStringLiteral(" (%1)").arg(groupSize(m_pos, m_emitLevel));
    const QString& caption = m_grid.column(c).caption;
    return caption.isEmpty() ? value + count : caption + QStringLiteral(": ") + value + count;
}

QString GridSnapshot::cellText(int i) const
{
    if (isGroupRow() || m_pos >= m_records.size())
        return {};
    return m_grid.cellText(m_records[m_pos], m_columns[static_cast<size_t>(i)].column);
}

GridSnapshotCell GridSnapshot::cell(int i) const
{
    GridSnapshotCell cell;
    cell.text = cellText(i);
    if (cell.text.isEmpty() || isGroupRow())
        return cell;
    const GridSource* source = m_grid.source();
    const int field = m_grid.columnField(m_columns[static_cast<size_t>(i)].column);
    if (!source || field < 0)
        return cell;
    const quint32 record = m_records[m_pos];
    if (source->isNull(record, field))
        return cell;
    switch (source->fieldType(field)) {
    case GridFieldType::Integer: {
        const qint64 v = source->intValue(record, field);
        if (cell.text == QString::number(v) && v > -(qint64(1) << 53) && v < (qint64(1) << 53)) {
            cell.kind = GridCellKind::Number;
            cell.number = static_cast<double>(v);
        }
        break;
    }
    case GridFieldType::Date: {
        const QDate d = gridvalue::toDate(source->intValue(record, field));
        if (d.isValid() && cell.text == d.toString(QStringLiteral("dd.MM.yyyy"))) {
            cell.kind = GridCellKind::Date;
            cell.date = d;
        }
        break;
    }
    default:
        break;
    }
    return cell;
}

} // namespace orvanta
