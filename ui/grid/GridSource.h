#pragma once
// What a grid reads: a read-only table of typed fields. The grid never copies rows; it keeps
// index vectors over the source and asks for single cells, so a column store (fixed-width
// integer columns, text in one arena) can answer every call without allocating.
//
// Value encodings, chosen so a store can hand out its raw integers:
//   Integer   any integer (SMALLINT, INTEGER, BIGINT)
//   Date      Julian day number (QDate::toJulianDay)
//   Time      milliseconds since midnight
//   DateTime  Julian day * 86 400 000 + milliseconds since midnight (local time, no zone)
//   Money     hundredths (NUMERIC(15,2) as stored)
//   Double    doubleValue()
//   Text      ISO 8859-1 bytes from textValue()

#include <QByteArrayView>
#include <QDateTime>
#include <QString>
#include <QVariant>

namespace orvanta {

enum class GridFieldType : quint8 { Integer, Date, Time, DateTime, Money, Double, Text };

class GridSource {
public:
    GridSource() = default;
    virtual ~GridSource() = default;
    GridSource(const GridSource&) = delete;
    GridSource& operator=(const GridSource&) = delete;

    [[nodiscard]] virtual quint32 rowCount() const = 0;
    [[nodiscard]] virtual int fieldCount() const = 0;
    // The field's database name (upper case, e.g. "TSDATE"); columns bind to it.
    [[nodiscard]] virtual QString fieldName(int field) const = 0;
    [[nodiscard]] virtual GridFieldType fieldType(int field) const = 0;

    [[nodiscard]] virtual bool isNull(quint32 row, int field) const = 0;
    // Non-text fields in the encodings above; 0 for null.
    [[nodiscard]] virtual qint64 intValue(quint32 row, int field) const = 0;
    [[nodiscard]] virtual double doubleValue(quint32 row, int field) const
    {
        return static_cast<double>(intValue(row, field));
    }
    // Text fields: the bytes stay valid until the source's content changes. Empty for null.
    [[nodiscard]] virtual QByteArrayView textValue(quint32 row, int field) const = 0;

    // Field by name, case-insensitive; -1 when there is none.
    [[nodiscard]] int fieldIndex(QStringView name) const;
    // Typed value for models and exports: qint64, QDate, QTime, QDateTime, double or QString;
    // an invalid QVariant for null.
    [[nodiscard]] QVariant value(quint32 row, int field) const;
    // The text of a text field as a QString (ISO 8859-1 decoded).
    [[nodiscard]] QString text(quint32 row, int field) const
    {
        return QString::fromLatin1(textValue(row, field));
    }
};

// Encoding helpers shared by sources and formatters.
namespace gridvalue {
constexpr qint64 msPerDay = 86'400'000;
[[nodiscard]] inline QDate toDate(qint64 julianDay) { return QDate::fromJulianDay(julianDay); }
[[nodiscard]] inline QTime toTime(qint64 ms) { return QTime::fromMSecsSinceStartOfDay(static_cast<int>(ms)); }
[[nodiscard]] inline qint64 fromDate(QDate d) { return d.toJulianDay(); }
[[nodiscard]] inline qint64 fromTime(QTime t) { return t.msecsSinceStartOfDay(); }
[[nodiscard]] inline qint64 fromDateTime(const QDateTime& dt)
{
    return fromDate(dt.date()) * msPerDay + fromTime(dt.time());
}
[[nodiscard]] QDateTime toDateTime(qint64 value);
} // namespace gridvalue

} // namespace orvanta
