#pragma once
// The grid's view of a fetched result: answers every cell straight from the data set's record
// store, so a list frame never copies a row. The store object must outlive the source; its
// content may change (a re-read), after which the grid is told through sourceChanged().

#include "db/RecordStore.h"
#include "ui/grid/GridSource.h"

namespace orvanta {

class RecordStoreGridSource final : public GridSource {
public:
    explicit RecordStoreGridSource(const RecordStore& store)
        : m_store(&store)
    {
    }

    [[nodiscard]] const RecordStore& store() const { return *m_store; }

    [[nodiscard]] quint32 rowCount() const override { return static_cast<quint32>(m_store->rowCount()); }
    [[nodiscard]] int fieldCount() const override { return m_store->columnCount(); }
    [[nodiscard]] QString fieldName(int field) const override { return m_store->field(field).name; }
    [[nodiscard]] GridFieldType fieldType(int field) const override;

    [[nodiscard]] bool isNull(quint32 row, int field) const override
    {
        return m_store->isNull(static_cast<int>(row), field);
    }
    [[nodiscard]] qint64 intValue(quint32 row, int field) const override;
    [[nodiscard]] double doubleValue(quint32 row, int field) const override
    {
        return m_store->number(static_cast<int>(row), field);
    }
    [[nodiscard]] QByteArrayView textValue(quint32 row, int field) const override
    {
        return m_store->bytes(static_cast<int>(row), field);
    }

    // A field as a whole number whatever its type: text is parsed (false when it is not a
    // number), null gives false.
    [[nodiscard]] bool integerOf(quint32 row, int field, qint64& value) const;

private:
    const RecordStore* m_store;
};

} // namespace orvanta
