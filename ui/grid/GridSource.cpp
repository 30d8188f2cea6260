#include "ui/grid/GridSource.h"

namespace orvanta {

int GridSource::fieldIndex(QStringView name) const
{
    const int n = fieldCount();
    for (int f = 0; f < n; ++f) {
        if (name.compare(fieldName(f), Qt::CaseInsensitive) == 0)
            return f;
    }
    return -1;
}

QVariant GridSource::value(quint32 row, int field) const
{
    if (row >= rowCount() || field < 0 || field >= fieldCount() || isNull(row, field))
        return {};
    const qint64 v = intValue(row, field);
    switch (fieldType(field)) {
    case GridFieldType::Integer:
    case GridFieldType::Money:
        return QVariant::fromValue(v);
    case GridFieldType::Date:
        return gridvalue::toDate(v);
    case GridFieldType::Time:
        return gridvalue::toTime(v);
    case GridFieldType::DateTime:
        return gridvalue::toDateTime(v);
    case GridFieldType::Double:
        return doubleValue(row, field);
    case GridFieldType::Text:
        return text(row, field);
    }
    return {};
}

namespace gridvalue {
QDateTime toDateTime(qint64 value)
{
    qint64 day = value / msPerDay;
    qint64 ms = value % msPerDay;
    if (ms < 0) {
        ms += msPerDay;
        --day;
    }
    return QDateTime(toDate(day), toTime(ms));
}
} // namespace gridvalue

} // namespace orvanta
