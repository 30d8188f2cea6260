#pragma once
// A grid source held in memory, column by column: integers in one vector per field, text in one
// byte arena per field. Small lists, generated data and the tests fill one row at a time.

#include "ui/grid/GridSource.h"

#include <vector>

namespace orvanta {

class MemoryGridSource final : public GridSource {
public:
    struct Field {
        QString name;
        GridFieldType type = GridFieldType::Integer;
    };

    explicit MemoryGridSource(std::vector<Field> fields);

    [[nodiscard]] quint32 rowCount() const override { return m_rows; }
    [[nodiscard]] int fieldCount() const override { return static_cast<int>(m_fields.size()); }
    [[nodiscard]] QString fieldName(int field) const override { return m_fields.at(field).name; }
    [[nodiscard]] GridFieldType fieldType(int field) const override { return m_fields.at(field).type; }
    [[nodiscard]] bool isNull(quint32 row, int field) const override;
    [[nodiscard]] qint64 intValue(quint32 row, int field) const override;
    [[nodiscard]] double doubleValue(quint32 row, int field) const override;
    [[nodiscard]] QByteArrayView textValue(quint32 row, int field) const override;

    void reserve(quint32 rows, qsizetype textBytesPerRow = 0);
    // Appends a row of nulls and returns its index; the setters below fill it.
    quint32 appendRow();
    void setNull(quint32 row, int field);
    void setInt(quint32 row, int field, qint64 value);
    void setDouble(quint32 row, int field, double value);
    // Text is stored as ISO 8859-1; characters outside it become '?'.
    void setText(quint32 row, int field, QStringView text);
    void setLatin1(quint32 row, int field, QByteArrayView bytes);
    void setDate(quint32 row, int field, QDate date);
    void setTime(quint32 row, int field, QTime time);
    void clear();

private:
    struct Column {
        std::vector<qint64> ints;       // value, or bit pattern of the double
        std::vector<quint32> textStart; // offset into arena; text end is the next start
        std::vector<quint32> textLen;
        std::vector<bool> null;
        QByteArray arena;
    };

    std::vector<Field> m_fields;
    std::vector<Column> m_columns;
    quint32 m_rows = 0;
};

} // namespace orvanta
