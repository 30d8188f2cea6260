#include "ui/grid/MemoryGridSource.h"

#include "platform/AppException.h"

#include <bit>

namespace orvanta {

MemoryGridSource::MemoryGridSource(std::vector<Field> fields)
    : m_fields(std::move(fields))
    , m_columns(m_fields.size())
{
}

bool MemoryGridSource::isNull(quint32 row, int field) const
{
    return m_columns[static_cast<size_t>(field)].null[row];
}

qint64 MemoryGridSource::intValue(quint32 row, int field) const
{
    return m_columns[static_cast<size_t>(field)].ints[row];
}

double MemoryGridSource::doubleValue(quint32 row, int field) const
{
    const qint64 raw = m_columns[static_cast<size_t>(field)].ints[row];
    if (m_fields[static_cast<size_t>(field)].type == GridFieldType::Double)
        return std::bit_cast<double>(raw);
    return static_cast<double>(raw);
}

QByteArrayView MemoryGridSource::textValue(quint32 row, int field) const
{
    const Column& c = m_columns[static_cast<size_t>(field)];
    if (c.textLen.empty())
        return {};
    return QByteArrayView(c.arena.constData() + c.textStart[row], c.textLen[row]);
}

void MemoryGridSource::reserve(quint32 rows, qsizetype textBytesPerRow)
{
    for (size_t f = 0; f < m_columns.size(); ++f) {
        Column& c = m_columns[f];
        c.null.reserve(rows);
        if (m_fields[f].type == GridFieldType::Text) {
            c.textStart.reserve(rows);
            c.textLen.reserve(rows);
            c.arena.reserve(static_cast<qsizetype>(rows) * textBytesPerRow);
        } else {
            c.ints.reserve(rows);
        }
    }
}

quint32 MemoryGridSource::appendRow()
{
    for (size_t f = 0; f < m_columns.size(); ++f) {
        Column& c = m_columns[f];
        c.null.push_back(true);
        if (m_fields[f].type == GridFieldType::Text) {
            c.textStart.push_back(static_cast<quint32>(c.arena.size()));
            c.textLen.push_back(0);
        } else {
            c.ints.push_back(0);
        }
    }
    return m_rows++;
}

void MemoryGridSource::setNull(quint32 row, int field)
{
    Column& c = m_columns.at(static_cast<size_t>(field));
    c.null[row] = true;
    if (!c.ints.empty())
        c.ints[row] = 0;
    if (!c.textLen.empty())
        c.textLen[row] = 0;
}

void MemoryGridSource::setInt(quint32 row, int field, qint64 value)
{
    Column& c = m_columns.at(static_cast<size_t>(field));
    c.ints.at(row) = value;
    c.null[row] = false;
}

void MemoryGridSource::setDouble(quint32 row, int field, double value)
{
    setInt(row, field, std::bit_cast<qint64>(value));
}

void MemoryGridSource::setText(quint32 row, int field, QStringView text)
{
    setLatin1(row, field, text.toLatin1());
}

void MemoryGridSource::setLatin1(quint32 row, int field, QByteArrayView bytes)
{
    Column& c = m_columns.at(static_cast<size_t>(field));
    if (static_cast<quint64>(c.arena.size()) + static_cast<quint64>(bytes.size()) > 0xFFFF'FFFFull)
        throw AppException(QStringLiteral("Zu viel Text für die Tabelle."));
    // Rewriting a cell appends: the old bytes stay in the arena until clear().
    c.textStart.at(row) = static_cast<quint32>(c.arena.size());
    c.textLen[row] = static_cast<quint32>(bytes.size());
    c.arena.append(bytes);
    c.null[row] = false;
}

void MemoryGridSource::setDate(quint32 row, int field, QDate date)
{
    if (date.isValid())
        setInt(row, field, gridvalue::fromDate(date));
    else
        setNull(row, field);
}

void MemoryGridSource::setTime(quint32 row, int field, QTime time)
{
    if (time.isValid())
        setInt(row, field, gridvalue::fromTime(time));
    else
        setNull(row, field);
}

void MemoryGridSource::clear()
{
    for (Column& c : m_columns)
        c = Column();
    m_rows = 0;
}

} // namespace orvanta
