#include "db/RecordStore.h"

#include "db/FbApi_p.h"
#include "db/FbStatement.h"
#include "db/FixedPoint.h"

#include <bit>
#include <cmath>
#include <stdexcept>
#include <cstdlib>
#include <cstring>
#include <new>

namespace orvanta {

namespace {

constexpr qint64 kMsPerDay = 86400000;
constexpr qint64 kEpochJulianDay = 2440588; // 1 Jan 1970

using fixedpoint::pow10;
using fixedpoint::rescale;

template <typename T>
T load(const void* p)
{
    T v;
    std::memcpy(&v, p, sizeof v);
    return v;
}

QString fixedPoint(qint64 v, int scale)
{
    const qint64 div = pow10(scale);
    const qint64 a = v < 0 ? -v : v;
    return QStringLiteral("%1%2.%3")
        .arg(v < 0 ? QStringLiteral("-") : QString())
        .arg(a / div)
        .arg(a % div, scale, 10, QLatin1Char('0'));
}

} // namespace

// ---- Buffer

RecordStore::Buffer::Buffer(Buffer&& o) noexcept
    : data(o.data)
    , size(o.size)
    , capacity(o.capacity)
{
    o.data = nullptr;
    o.size = o.capacity = 0;
}

RecordStore::Buffer& RecordStore::Buffer::operator=(Buffer&& o) noexcept
{
    if (this != &o) {
        std::free(data);
        data = o.data;
        size = o.size;
        capacity = o.capacity;
        o.data = nullptr;
        o.size = o.capacity = 0;
    }
    return *this;
}

RecordStore::Buffer::~Buffer()
{
    std::free(data);
}

char* RecordStore::Buffer::grow(size_t bytes)
{
    if (size + bytes > capacity) {
        size_t cap = capacity < 4096 ? 4096 : capacity + capacity / 2;
        if (cap < size + bytes)
            cap = size + bytes;
        void* p = std::realloc(data, cap);
        if (!p)
            throw std::bad_alloc();
        data = static_cast<char*>(p);
        capacity = cap;
    }
    char* at = data + size;
    size += bytes;
    return at;
}

void RecordStore::Buffer::squeeze()
{
    if (capacity == size)
        return;
    if (size == 0) {
        clear();
        return;
    }
    if (void* p = std::realloc(data, size)) {
        data = static_cast<char*>(p);
        capacity = size;
    }
}

void RecordStore::Buffer::clear()
{
    std::free(data);
    data = nullptr;
    size = capacity = 0;
}

// ---- RecordStore

RecordStore::RecordStore() = default;
RecordStore::~RecordStore() = default;
RecordStore::RecordStore(RecordStore&&) noexcept = default;
RecordStore& RecordStore::operator=(RecordStore&&) noexcept = default;

void RecordStore::clear()
{
    m_fields.clear();
    m_columns.clear();
    m_byName.clear();
    m_rows = 0;
    m_valueBytes = 0;
}

void RecordStore::reset(const FbStatement& statement)
{
    clear();
    const int n = statement.columnCount();
    m_columns.resize(size_t(n));
    for (int i = 0; i < n; ++i) {
        const FbColumn& f = statement.column(i);
        const FbSlot& s = statement.slot(i);
        Column& c = m_columns[size_t(i)];
        c.source = quint8(s.storage);
        c.scale = s.scale;
        switch (s.storage) {
        case FbSlot::Storage::I16:
            c.storage = Storage::Int16;
            c.width = 2;
            break;
        case FbSlot::Storage::I32:
            c.storage = Storage::Int32;
            c.width = 4;
            break;
        case FbSlot::Storage::I64:
            c.storage = Storage::Int64;
            c.width = 8;
            break;
        case FbSlot::Storage::F32:
        case FbSlot::Storage::F64:
            c.storage = Storage::Float64;
            c.width = 8;
            break;
        case FbSlot::Storage::Date:
            c.storage = Storage::Date;
            c.width = 4;
            break;
        case FbSlot::Storage::Time:
            c.storage = Storage::Time;
            c.width = 4;
            break;
        case FbSlot::Storage::Timestamp:
            c.storage = Storage::Timestamp;
            c.width = 8;
            break;
        case FbSlot::Storage::Text:
            c.trimPadding = true;
            c.storage = Storage::Text;
            c.width = 4;
            break;
        case FbSlot::Storage::VarText:
        case FbSlot::Storage::BlobId:
            c.storage = Storage::Text;
            c.width = 4;
            break;
        case FbSlot::Storage::Bool:
            c.storage = Storage::Bool;
            c.width = 1;
            break;
        }
        m_fields.append(f);
        const QString key = f.name.toUpper();
        if (!m_byName.contains(key))
            m_byName.insert(key, i);
    }
}

int RecordStore::fieldIndex(QStringView name) const
{
    return m_byName.value(name.toString().toUpper(), -1);
}

void RecordStore::setNull(Column& c, int row)
{
    const size_t word = size_t(row) >> 6;
    if (c.nulls.size() <= word)
        c.nulls.resize(word + 1 + word / 2, 0);
    c.nulls[word] |= quint64(1) << (row & 63);
}

void RecordStore::appendRow(const FbStatement& statement)
{
    const unsigned char* row = statement.rowData();
    const int r = m_rows;
    const size_t n = m_columns.size();
    for (size_t i = 0; i < n; ++i) {
        Column& c = m_columns[i];
        const FbSlot& s = statement.slot(int(i));
        const bool null = load<short>(row + s.nullOffset) != 0;
        const unsigned char* v = row + s.offset;
        if (c.storage == Storage::Text) {
            quint32 end = r == 0 ? 0 : c.offsets()[r - 1];
            if (null) {
                setNull(c, r);
            } else if (s.storage == FbSlot::Storage::VarText) {
                const quint16 len = load<quint16>(v);
                if (len > 0) // an empty arena has no buffer to copy nothing into
                    std::memcpy(c.arena.grow(len), v + 2, len);
                end += len;
                m_valueBytes += len;
            } else if (s.storage == FbSlot::Storage::Text) {
                int len = s.length;
                while (len > 0 && v[len - 1] == ' ')
                    --len;
                if (len > 0)
                    std::memcpy(c.arena.grow(size_t(len)), v, size_t(len));
                end += quint32(len);
                m_valueBytes += len;
            } else {
                const QByteArray blob = statement.readBlob(int(i));
                if (c.arena.size + size_t(blob.size()) > 0xFFFFFFFFu)
                    throw std::bad_alloc();
                if (!blob.isEmpty())
                    std::memcpy(c.arena.grow(size_t(blob.size())), blob.constData(), size_t(blob.size()));
                end += quint32(blob.size());
                m_valueBytes += blob.size();
            }
            if (c.arena.size > 0xFFFFFFFFu)
                throw std::bad_alloc();
            std::memcpy(c.data.grow(4), &end, 4);
            continue;
        }
        char* out = c.data.grow(c.width);
        if (null) {
            std::memset(out, 0, c.width);
            setNull(c, r);
            continue;
        }
        m_valueBytes += c.width;
        switch (s.storage) {
        case FbSlot::Storage::I16:
        case FbSlot::Storage::I32:
        case FbSlot::Storage::I64:
        case FbSlot::Storage::F64:
        case FbSlot::Storage::Bool:
            std::memcpy(out, v, c.width);
            break;
        case FbSlot::Storage::F32: {
            const double d = double(load<float>(v));
            std::memcpy(out, &d, 8);
            break;
        }
        case FbSlot::Storage::Date: {
            const qint32 jd = qint32(fbapi::julianDayFromIsc(load<ISC_DATE>(v)));
            std::memcpy(out, &jd, 4);
            break;
        }
        case FbSlot::Storage::Time: {
            const qint32 ms = qint32(load<ISC_TIME>(v) / 10);
            std::memcpy(out, &ms, 4);
            break;
        }
        case FbSlot::Storage::Timestamp: {
            const ISC_TIMESTAMP ts = load<ISC_TIMESTAMP>(v);
            const qint64 ms = (fbapi::julianDayFromIsc(ts.timestamp_date) - kEpochJulianDay) * kMsPerDay
                + qint64(ts.timestamp_time / 10);
            std::memcpy(out, &ms, 8);
            break;
        }
        default:
            break;
        }
    }
    ++m_rows;
}

bool RecordStore::sameColumns(const RecordStore& other) const
{
    if (m_columns.size() != other.m_columns.size())
        return false;
    for (size_t i = 0; i < m_columns.size(); ++i) {
        const Field& a = m_fields[qsizetype(i)];
        const Field& b = other.m_fields[qsizetype(i)];
        if (a.name != b.name || a.type != b.type || a.width != b.width || a.scale != b.scale
            || m_columns[i].storage != other.m_columns[i].storage)
            return false;
    }
    return true;
}

void RecordStore::appendRows(const RecordStore& other)
{
    if (other.m_rows == 0)
        return;
    if (!sameColumns(other))
        throw std::invalid_argument("RecordStore::appendRows: the columns differ");
    const int base = m_rows;
    for (size_t i = 0; i < m_columns.size(); ++i) {
        Column& c = m_columns[i];
        const Column& o = other.m_columns[i];
        if (c.storage == Storage::Text) {
            const quint32 shift = base == 0 ? 0 : c.offsets()[base - 1];
            if (c.arena.size + o.arena.size > 0xFFFFFFFFu)
                throw std::bad_alloc();
            if (o.arena.size > 0)
                std::memcpy(c.arena.grow(o.arena.size), o.arena.data, o.arena.size);
            auto* ends = reinterpret_cast<quint32*>(c.data.grow(size_t(other.m_rows) * 4));
            const quint32* theirs = o.offsets();
            for (int r = 0; r < other.m_rows; ++r)
                ends[r] = theirs[r] + shift;
        } else {
            const size_t bytes = size_t(other.m_rows) * c.width;
            std::memcpy(c.data.grow(bytes), o.data.data, bytes);
        }
        for (size_t w = 0; w < o.nulls.size(); ++w) {
            for (quint64 bits = o.nulls[w]; bits != 0; bits &= bits - 1) {
                const int r = int(w * 64) + std::countr_zero(bits);
                if (r < other.m_rows)
                    setNull(c, base + r);
            }
        }
    }
    m_rows += other.m_rows;
    m_valueBytes += other.m_valueBytes;
}

void RecordStore::squeeze()
{
    for (Column& c : m_columns) {
        c.data.squeeze();
        c.arena.squeeze();
        const size_t words = (size_t(m_rows) + 63) >> 6;
        if (!c.nulls.empty()) {
            c.nulls.resize(words, 0);
            c.nulls.shrink_to_fit();
        }
    }
}

qint64 RecordStore::byteSize() const
{
    qint64 total = 0;
    for (const Column& c : m_columns)
        total += qint64(c.data.capacity + c.arena.capacity + c.nulls.capacity() * sizeof(quint64));
    return total;
}

qint64 RecordStore::scaled(int row, int column, int scale) const
{
    if (isNull(row, column))
        return 0;
    const Column& c = m_columns[size_t(column)];
    const char* p = c.data.data + size_t(row) * c.width;
    switch (c.storage) {
    case Storage::Int16:
        return rescale(load<qint16>(p), c.scale, scale);
    case Storage::Int32:
        return rescale(load<qint32>(p), c.scale, scale);
    case Storage::Int64:
        return rescale(load<qint64>(p), c.scale, scale);
    case Storage::Bool:
        return rescale(*p ? 1 : 0, 0, scale);
    case Storage::Float64:
        return qint64(std::llround(load<double>(p) * double(pow10(scale))));
    case Storage::Text:
        return qint64(std::llround(text(row, column).trimmed().toDouble() * double(pow10(scale))));
    case Storage::Date:
        return rescale(load<qint32>(p), 0, scale);
    case Storage::Time:
        return rescale(load<qint32>(p), 0, scale);
    case Storage::Timestamp:
        return rescale(load<qint64>(p), 0, scale);
    }
    return 0;
}

qint64 RecordStore::integer(int row, int column) const
{
    if (m_columns[size_t(column)].storage == Storage::Text)
        return isNull(row, column) ? 0 : text(row, column).trimmed().toLongLong();
    return scaled(row, column, 0);
}

double RecordStore::number(int row, int column) const
{
    if (isNull(row, column))
        return 0.0;
    const Column& c = m_columns[size_t(column)];
    const char* p = c.data.data + size_t(row) * c.width;
    switch (c.storage) {
    case Storage::Float64:
        return load<double>(p);
    case Storage::Text:
        return text(row, column).trimmed().toDouble();
    default:
        return double(scaled(row, column, c.scale)) / double(pow10(c.scale));
    }
}

QDate RecordStore::date(int row, int column) const
{
    if (isNull(row, column))
        return {};
    const Column& c = m_columns[size_t(column)];
    const char* p = c.data.data + size_t(row) * c.width;
    if (c.storage == Storage::Date)
        return QDate::fromJulianDay(load<qint32>(p));
    if (c.storage == Storage::Timestamp)
        return timestamp(row, column).date();
    return {};
}

qint64 RecordStore::dayNumber(int row, int column) const
{
    const QDate d = date(row, column);
    return d.isValid() ? d.toJulianDay() : 0;
}

QTime RecordStore::time(int row, int column) const
{
    if (isNull(row, column))
        return {};
    const Column& c = m_columns[size_t(column)];
    const char* p = c.data.data + size_t(row) * c.width;
    if (c.storage == Storage::Time)
        return QTime::fromMSecsSinceStartOfDay(load<qint32>(p));
    if (c.storage == Storage::Timestamp)
        return timestamp(row, column).time();
    return {};
}

QDateTime RecordStore::timestamp(int row, int column) const
{
    if (isNull(row, column))
        return {};
    const Column& c = m_columns[size_t(column)];
    const char* p = c.data.data + size_t(row) * c.width;
    switch (c.storage) {
    case Storage::Timestamp: {
        const qint64 ms = load<qint64>(p);
        qint64 days = ms / kMsPerDay;
        qint64 rest = ms % kMsPerDay;
        if (rest < 0) {
            rest += kMsPerDay;
            --days;
        }
        return QDateTime(QDate::fromJulianDay(days + kEpochJulianDay), QTime::fromMSecsSinceStartOfDay(int(rest)));
    }
    case Storage::Date:
        return QDateTime(date(row, column), QTime(0, 0));
    case Storage::Time:
        return QDateTime(QDate(1899, 12, 30), time(row, column));
    default:
        return {};
    }
}

QString RecordStore::text(int row, int column) const
{
    if (isNull(row, column))
        return {};
    const Column& c = m_columns[size_t(column)];
    switch (c.storage) {
    case Storage::Text: {
        const QByteArrayView b = bytes(row, column);
        return fbapi::decodeText(b.data(), b.size());
    }
    case Storage::Float64:
        return QString::number(number(row, column), 'g', 15);
    case Storage::Date:
        return date(row, column).toString(QStringLiteral("dd.MM.yyyy"));
    case Storage::Time:
        return time(row, column).toString(QStringLiteral("hh:mm:ss"));
    case Storage::Timestamp:
        return timestamp(row, column).toString(QStringLiteral("dd.MM.yyyy hh:mm:ss"));
    default:
        if (c.scale > 0)
            return fixedPoint(scaled(row, column, c.scale), c.scale);
        return QString::number(integer(row, column));
    }
}

} // namespace orvanta
