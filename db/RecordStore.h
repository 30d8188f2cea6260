#pragma once
// A fetched result held compactly, column by column: fixed-width values packed in one buffer per
// column at their database width, text as ISO 8859-1 bytes in one arena per column with 32-bit end
// offsets, and a null bitmap per column (only once a null occurs). Nothing is a QVariant; text
// becomes a QString only when asked for. Readers that scan a whole column (sorting, grouping,
// filtering) take its raw span.

#include "db/FbColumn.h"

#include <QByteArrayView>
#include <QDate>
#include <QDateTime>
#include <QHash>
#include <QList>
#include <QString>
#include <QTime>

#include <cstdint>
#include <span>
#include <vector>

namespace orvanta {

class FbStatement;

class RecordStore final {
public:
    // How a column lies in memory.
    enum class Storage : quint8 {
        Int16,     // smallint, numeric of small precision (scaled)
        Int32,     // integer, numeric (scaled)
        Int64,     // bigint, numeric (scaled)
        Float64,   // float and double precision
        Date,      // int32 Julian day number
        Time,      // int32 milliseconds since midnight
        Timestamp, // int64 milliseconds since 1 Jan 1970 local wall time (no time zone)
        Text,      // arena bytes with end offsets (char, varchar, blobs)
        Bool,      // uint8
    };

    using Field = FbColumn;

    RecordStore();
    ~RecordStore();
    RecordStore(RecordStore&&) noexcept;
    RecordStore& operator=(RecordStore&&) noexcept;
    RecordStore(const RecordStore&) = delete;
    RecordStore& operator=(const RecordStore&) = delete;

    // Takes the columns of a prepared statement; drops all rows.
    void reset(const FbStatement& statement);
    void clear(); // no columns, no rows
    // Copies the statement's current row (blobs are read whole).
    void appendRow(const FbStatement& statement);
    // Appends every row of a store of the same columns (a batch fetched elsewhere); throws
    // std::invalid_argument when the columns differ.
    void appendRows(const RecordStore& other);
    // Whether the other store has the same columns (name, type, width, scale).
    [[nodiscard]] bool sameColumns(const RecordStore& other) const;
    // Gives back the spare capacity of the growing buffers.
    void squeeze();

    [[nodiscard]] int rowCount() const { return m_rows; }
    [[nodiscard]] int columnCount() const { return int(m_columns.size()); }
    [[nodiscard]] const Field& field(int column) const { return m_fields.at(column); }
    [[nodiscard]] const QList<Field>& fields() const { return m_fields; }
    [[nodiscard]] int fieldIndex(QStringView name) const; // case-insensitive, -1 when absent
    [[nodiscard]] Storage storage(int column) const { return m_columns[size_t(column)].storage; }

    [[nodiscard]] bool isNull(int row, int column) const
    {
        const Column& c = m_columns[size_t(column)];
        const size_t word = size_t(row) >> 6;
        return word < c.nulls.size() && (c.nulls[word] >> (row & 63) & 1u);
    }
    // Integer value: exact for integer columns; numerics rounded to whole numbers; 0 for null.
    [[nodiscard]] qint64 integer(int row, int column) const;
    // Fixed point with the given places (cents for 2): numerics and integers exact, doubles rounded.
    [[nodiscard]] qint64 scaled(int row, int column, int scale) const;
    [[nodiscard]] double number(int row, int column) const;
    // Text of any column as the user sees it; for text columns the stored string.
    [[nodiscard]] QString text(int row, int column) const;
    // The stored ISO 8859-1 bytes of a text column (no copy); empty for other columns.
    [[nodiscard]] QByteArrayView bytes(int row, int column) const
    {
        const Column& c = m_columns[size_t(column)];
        if (c.storage != Storage::Text)
            return {};
        const quint32 begin = row == 0 ? 0 : c.offsets()[row - 1];
        return {c.arena.data + begin, qsizetype(c.offsets()[row] - begin)};
    }
    [[nodiscard]] QDate date(int row, int column) const;
    [[nodiscard]] qint64 dayNumber(int row, int column) const; // Julian day, 0 for null
    [[nodiscard]] QTime time(int row, int column) const;
    [[nodiscard]] QDateTime timestamp(int row, int column) const;
    [[nodiscard]] bool boolean(int row, int column) const { return integer(row, column) != 0; }

    // Whole columns. The span's type must match storage(column).
    template <typename T>
    [[nodiscard]] std::span<const T> values(int column) const
    {
        const Column& c = m_columns[size_t(column)];
        Q_ASSERT(sizeof(T) == c.width);
        return {reinterpret_cast<const T*>(c.data.data), size_t(m_rows)};
    }
    // Text column: end offsets (row r spans [r ? ends[r-1] : 0, ends[r]) of arena).
    [[nodiscard]] std::span<const quint32> textEnds(int column) const
    {
        return {m_columns[size_t(column)].offsets(), size_t(m_rows)};
    }
    [[nodiscard]] const char* textArena(int column) const { return m_columns[size_t(column)].arena.data; }

    // Bytes held (capacity of every buffer), and the bytes of the values themselves.
    [[nodiscard]] qint64 byteSize() const;
    [[nodiscard]] qint64 valueBytes() const { return m_valueBytes; }

private:
    // A growable raw buffer; realloc lets large buffers grow without copying.
    struct Buffer {
        char* data = nullptr;
        size_t size = 0;
        size_t capacity = 0;
        Buffer() = default;
        Buffer(Buffer&& o) noexcept;
        Buffer& operator=(Buffer&& o) noexcept;
        ~Buffer();
        char* grow(size_t bytes);
        void squeeze();
        void clear();
    };
    struct Column {
        Storage storage = Storage::Int32;
        quint8 width = 4;   // bytes per value in data
        quint8 source = 0;  // FbSlot::Storage of the statement
        bool trimPadding = false;
        int scale = 0;
        Buffer data;        // fixed values or text end offsets
        Buffer arena;       // text bytes
        std::vector<quint64> nulls;
        [[nodiscard]] const quint32* offsets() const { return reinterpret_cast<const quint32*>(data.data); }
    };

    void setNull(Column& c, int row);

    QList<Field> m_fields;
    std::vector<Column> m_columns;
    QHash<QString, int> m_byName;
    int m_rows = 0;
    qint64 m_valueBytes = 0;
};

} // namespace orvanta
