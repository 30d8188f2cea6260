#include "dbgrid/RecordStoreGridSource.h"

namespace orvanta {
namespace {
// Julian day of 1 January 1970: the store counts timestamps from there, the grid from day 0.
constexpr qint64 kEpochJulianDay = 2'440'588;
} // namespace

GridFieldType RecordStoreGridSource::fieldType(int field) const
{
    switch (m_store->storage(field)) {
    case RecordStore::Storage::Int16:
    case RecordStore::Storage::Int32:
    case RecordStore::Storage::Int64: {
        const int scale = m_store->field(field).scale;
        if (scale == 0)
            return GridFieldType::Integer;
        return scale == 2 ? GridFieldType::Money : GridFieldType::Double;
    }
    case RecordStore::Storage::Bool:
        return GridFieldType::Integer;
    case RecordStore::Storage::Float64:
        return GridFieldType::Double;
    case RecordStore::Storage::Date:
        return GridFieldType::Date;
    case RecordStore::Storage::Time:
        return GridFieldType::Time;
    case RecordStore::Storage::Timestamp:
        return GridFieldType::DateTime;
    case RecordStore::Storage::Text:
        return GridFieldType::Text;
    }
    return GridFieldType::Text;
}

qint64 RecordStoreGridSource::intValue(quint32 row, int field) const
{
    const int r = static_cast<int>(row);
    switch (m_store->storage(field)) {
    case RecordStore::Storage::Int16:
    case RecordStore::Storage::Int32:
    case RecordStore::Storage::Int64: {
        const int scale = m_store->field(field).scale;
        return m_store->scaled(r, field, scale == 2 ? 2 : 0);
    }
    case RecordStore::Storage::Timestamp:
        // Milliseconds since 1970 (local wall time) to the grid's day * ms-per-day + ms.
        return m_store->isNull(r, field) ? 0 : m_store->scaled(r, field, 0) + kEpochJulianDay * gridvalue::msPerDay;
    case RecordStore::Storage::Text:
        return 0;
    default:
        return m_store->scaled(r, field, 0);
    }
}

bool RecordStoreGridSource::integerOf(quint32 row, int field, qint64& value) const
{
    value = 0;
    if (field < 0 || field >= m_store->columnCount() || row >= rowCount() || isNull(row, field))
        return false;
    const int r = static_cast<int>(row);
    switch (m_store->storage(field)) {
    case RecordStore::Storage::Text: {
        bool ok = false;
        value = m_store->bytes(r, field).toByteArray().trimmed().toLongLong(&ok);
        return ok;
    }
    case RecordStore::Storage::Float64:
        value = static_cast<qint64>(m_store->number(r, field));
        return true;
    default:
        value = m_store->integer(r, field);
        return true;
    }
}

} // namespace orvanta
