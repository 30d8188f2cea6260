#include "db/FbStatement.h"

#include "db/FbPrivate_p.h"
#include "db/FixedPoint.h"
#include "db/SqlParams.h"

#include <QHash>

#include <algorithm>
#include <cmath>
#include <cstring>

namespace orvanta {

using namespace Firebird;

namespace {

constexpr unsigned kCharsetIso8859_1 = 21;
constexpr int kBlobSegment = 32768;

enum class Kind : quint8 { Null, Int, Double, Text, Bytes, Date, Time, Timestamp, Scaled, Bool };

struct Param {
    Kind kind = Kind::Null;
    qint64 i = 0;
    double d = 0.0;
    int scale = 0; // decimal places of Scaled
    QByteArray bytes; // encoded text or raw bytes
    QDate date;
    QTime time;
};

// What the input message declares for one position; equal signatures reuse the built metadata.
struct InSig {
    unsigned type = 0;
    unsigned length = 0;
    int scale = 0;
    int subType = 0;
    unsigned charSet = 0;
    bool operator==(const InSig&) const = default;
};

using fixedpoint::pow10;
using fixedpoint::rescale;

bool isIntegerSqlType(unsigned t)
{
    return t == SQL_SHORT || t == SQL_LONG || t == SQL_INT64;
}

} // namespace

struct FbStatement::Private {
    FbAttachment* attachment = nullptr;
    FbTransaction* transaction = nullptr;
    QString sql;
    ParsedSql parsed;
    QStringList names;          // distinct parameter names, upper case, first appearance order
    std::vector<int> paramOf;   // position -> index into params (-1 for a plain "?")
    std::vector<Param> params;  // per distinct name, then plain "?" positions after them
    IStatement* stmt = nullptr;
    ITransaction* preparedIn = nullptr;
    unsigned stmtType = 0;
    IMessageMetadata* inMeta = nullptr;
    IMessageMetadata* outMeta = nullptr;
    IMessageMetadata* builtIn = nullptr;
    std::vector<InSig> builtSig;
    std::vector<unsigned char> inBuf;
    IResultSet* cursor = nullptr;
    std::vector<FbColumn> columns;
    std::vector<FbSlot> slots;
    QHash<QString, int> columnByName;
    std::vector<unsigned char> outBuf;
    bool hasRow = false;
    qint64 affected = 0;

    ITransaction* requireTransaction() const
    {
        if (!transaction || !transaction->d_func()->handle)
            throw DatabaseError(QStringLiteral("Transaction is not active"), {}, 0, sql);
        return transaction->d_func()->handle;
    }

    void releaseCursor() noexcept
    {
        if (!cursor)
            return;
        fbapi::Status st;
        try {
            cursor->close(&st); // releases on success
        } catch (const FbException&) {
            cursor->release();
        }
        cursor = nullptr;
        hasRow = false;
    }

    void releaseAll() noexcept
    {
        releaseCursor();
        if (builtIn) {
            builtIn->release();
            builtIn = nullptr;
        }
        builtSig.clear();
        if (inMeta) {
            inMeta->release();
            inMeta = nullptr;
        }
        if (outMeta) {
            outMeta->release();
            outMeta = nullptr;
        }
        if (stmt) {
            fbapi::Status st;
            try {
                stmt->free(&st);
            } catch (const FbException&) {
                stmt->release();
            }
            stmt = nullptr;
        }
        hasRow = false;
    }

    void describeOutput(ThrowStatusWrapper* st);
    IMessageMetadata* buildInput(ThrowStatusWrapper* st, ITransaction* tra);
    void writeBlob(ThrowStatusWrapper* st, ITransaction* tra, const QByteArray& data, ISC_QUAD* id);
    const Param& paramAt(unsigned pos) const;
};

void FbStatement::Private::describeOutput(ThrowStatusWrapper* st)
{
    columns.clear();
    slots.clear();
    columnByName.clear();
    const unsigned count = outMeta->getCount(st);
    columns.reserve(count);
    slots.reserve(count);
    for (unsigned i = 0; i < count; ++i) {
        FbColumn c;
        c.name = fbapi::decodeText(outMeta->getAlias(st, i), qstrlen(outMeta->getAlias(st, i)));
        c.field = fbapi::decodeText(outMeta->getField(st, i), qstrlen(outMeta->getField(st, i)));
        c.relation = fbapi::decodeText(outMeta->getRelation(st, i), qstrlen(outMeta->getRelation(st, i)));
        c.nullable = outMeta->isNullable(st, i);
        const unsigned t = outMeta->getType(st, i) & ~1u;
        const int scale = outMeta->getScale(st, i);
        const unsigned len = outMeta->getLength(st, i);
        const unsigned cs = outMeta->getCharSet(st, i) & 0xFF;
        const unsigned bytesPerChar = cs == 4 ? 4 : cs == 3 ? 3 : 1;
        FbSlot s;
        s.offset = int(outMeta->getOffset(st, i));
        s.nullOffset = int(outMeta->getNullOffset(st, i));
        s.length = int(len);
        c.width = int(len);
        switch (t) {
        case SQL_SHORT:
        case SQL_LONG:
        case SQL_INT64:
            s.storage = t == SQL_SHORT ? FbSlot::Storage::I16 : t == SQL_LONG ? FbSlot::Storage::I32 : FbSlot::Storage::I64;
            if (scale < 0) {
                c.type = FbType::Numeric;
                c.scale = -scale;
            } else {
                c.type = t == SQL_SHORT ? FbType::SmallInt : t == SQL_LONG ? FbType::Integer : FbType::BigInt;
            }
            break;
        case SQL_FLOAT:
            s.storage = FbSlot::Storage::F32;
            c.type = FbType::Float;
            break;
        case SQL_DOUBLE:
        case SQL_D_FLOAT:
            s.storage = FbSlot::Storage::F64;
            c.type = FbType::Double;
            break;
        case SQL_TEXT:
            s.storage = FbSlot::Storage::Text;
            c.type = FbType::Char;
            c.width = int(len / bytesPerChar);
            break;
        case SQL_VARYING:
            s.storage = FbSlot::Storage::VarText;
            c.type = FbType::Varchar;
            c.width = int(len / bytesPerChar);
            break;
        case SQL_TYPE_DATE:
            s.storage = FbSlot::Storage::Date;
            c.type = FbType::Date;
            break;
        case SQL_TYPE_TIME:
            s.storage = FbSlot::Storage::Time;
            c.type = FbType::Time;
            break;
        case SQL_TIMESTAMP:
            s.storage = FbSlot::Storage::Timestamp;
            c.type = FbType::Timestamp;
            break;
        case SQL_BLOB:
        case SQL_QUAD:
            s.storage = FbSlot::Storage::BlobId;
            c.type = outMeta->getSubType(st, i) == 1 ? FbType::TextBlob : FbType::Blob;
            c.width = 0;
            break;
        case SQL_BOOLEAN:
            s.storage = FbSlot::Storage::Bool;
            c.type = FbType::Boolean;
            break;
        default:
            throw DatabaseError(QStringLiteral("Column \"%1\" has an unsupported type (%2)").arg(c.name).arg(t), {}, 0,
                                sql);
        }
        s.type = c.type;
        s.scale = c.scale;
        const QString key = c.name.toUpper();
        if (!columnByName.contains(key))
            columnByName.insert(key, int(i));
        columns.push_back(std::move(c));
        slots.push_back(s);
    }
    outBuf.assign(outMeta->getMessageLength(st), 0);
}

const Param& FbStatement::Private::paramAt(unsigned pos) const
{
    return params[size_t(paramOf[pos])];
}

void FbStatement::Private::writeBlob(ThrowStatusWrapper* st, ITransaction* tra, const QByteArray& data, ISC_QUAD* id)
{
    IBlob* blob = attachment->d_func()->require()->createBlob(st, tra, id, 0, nullptr);
    try {
        for (qsizetype at = 0; at < data.size(); at += kBlobSegment) {
            const qsizetype n = std::min<qsizetype>(kBlobSegment, data.size() - at);
            blob->putSegment(st, unsigned(n), data.constData() + at);
        }
        blob->close(st);
    } catch (...) {
        blob->release();
        throw;
    }
}

IMessageMetadata* FbStatement::Private::buildInput(ThrowStatusWrapper* st, ITransaction* tra)
{
    const unsigned count = inMeta->getCount(st);
    std::vector<InSig> sig(count);
    for (unsigned i = 0; i < count; ++i) {
        const Param& p = paramAt(i);
        InSig& s = sig[i];
        const unsigned orig = inMeta->getType(st, i) & ~1u;
        const int origScale = inMeta->getScale(st, i);
        s.type = orig;
        s.length = inMeta->getLength(st, i);
        s.scale = origScale;
        s.subType = inMeta->getSubType(st, i);
        s.charSet = inMeta->getCharSet(st, i);
        auto set = [&s](unsigned type, unsigned length, int scale = 0) {
            s.type = type;
            s.length = length;
            s.scale = scale;
            s.subType = 0;
            s.charSet = 0;
        };
        switch (p.kind) {
        case Kind::Null:
            break;
        case Kind::Text:
        case Kind::Bytes:
            if (orig == SQL_BLOB)
                break;
            set(SQL_VARYING, std::max<unsigned>({1u, unsigned(p.bytes.size()),
                                                  orig == SQL_VARYING || orig == SQL_TEXT ? s.length : 0u}));
            s.charSet = kCharsetIso8859_1;
            break;
        case Kind::Int:
        case Kind::Double:
        case Kind::Scaled:
            if (orig == SQL_BOOLEAN && p.kind == Kind::Int)
                break;
            if (p.kind == Kind::Double && !(isIntegerSqlType(orig) && origScale < 0))
                set(SQL_DOUBLE, sizeof(double));
            else
                set(SQL_INT64, sizeof(qint64),
                    p.kind == Kind::Scaled ? -p.scale : (isIntegerSqlType(orig) && origScale < 0 ? origScale : 0));
            break;
        case Kind::Bool:
            if (orig != SQL_BOOLEAN)
                set(SQL_INT64, sizeof(qint64));
            break;
        case Kind::Date:
            set(SQL_TYPE_DATE, sizeof(ISC_DATE));
            break;
        case Kind::Time:
            set(SQL_TYPE_TIME, sizeof(ISC_TIME));
            break;
        case Kind::Timestamp:
            set(SQL_TIMESTAMP, sizeof(ISC_TIMESTAMP));
            break;
        }
    }

    if (!builtIn || sig != builtSig) {
        IMetadataBuilder* b = inMeta->getBuilder(st);
        try {
            for (unsigned i = 0; i < count; ++i) {
                b->setType(st, i, sig[i].type | 1u);
                b->setSubType(st, i, sig[i].subType);
                b->setLength(st, i, sig[i].length);
                b->setScale(st, i, sig[i].scale);
                b->setCharSet(st, i, sig[i].charSet);
            }
            IMessageMetadata* m = b->getMetadata(st);
            b->release();
            if (builtIn)
                builtIn->release();
            builtIn = m;
            builtSig = sig;
        } catch (...) {
            b->release();
            throw;
        }
        inBuf.assign(builtIn->getMessageLength(st), 0);
    }

    unsigned char* buf = inBuf.data();
    for (unsigned i = 0; i < count; ++i) {
        const Param& p = paramAt(i);
        const InSig& s = sig[i];
        unsigned char* v = buf + builtIn->getOffset(st, i);
        auto* nullFlag = reinterpret_cast<short*>(buf + builtIn->getNullOffset(st, i));
        *nullFlag = p.kind == Kind::Null ? -1 : 0;
        if (p.kind == Kind::Null)
            continue;
        switch (s.type) {
        case SQL_VARYING: {
            const auto n = quint16(p.bytes.size());
            std::memcpy(v, &n, sizeof n);
            std::memcpy(v + 2, p.bytes.constData(), n);
            break;
        }
        case SQL_BLOB:
            writeBlob(st, tra, p.bytes, reinterpret_cast<ISC_QUAD*>(v));
            break;
        case SQL_INT64: {
            qint64 x = 0;
            if (p.kind == Kind::Double)
                x = qint64(std::llround(p.d * double(pow10(-s.scale))));
            else if (p.kind == Kind::Scaled)
                x = p.i;
            else
                x = p.kind == Kind::Bool ? (p.i != 0 ? 1 : 0) : p.i * pow10(-s.scale);
            std::memcpy(v, &x, sizeof x);
            break;
        }
        case SQL_DOUBLE:
            std::memcpy(v, &p.d, sizeof p.d);
            break;
        case SQL_BOOLEAN: {
            const unsigned char x = p.i != 0 ? 1 : 0;
            *v = x;
            break;
        }
        case SQL_TYPE_DATE: {
            const ISC_DATE x = fbapi::iscFromJulianDay(p.date.toJulianDay());
            std::memcpy(v, &x, sizeof x);
            break;
        }
        case SQL_TYPE_TIME: {
            const ISC_TIME x = ISC_TIME(p.time.msecsSinceStartOfDay()) * 10;
            std::memcpy(v, &x, sizeof x);
            break;
        }
        case SQL_TIMESTAMP: {
            ISC_TIMESTAMP x;
            x.timestamp_date = fbapi::iscFromJulianDay(p.date.toJulianDay());
            x.timestamp_time = ISC_TIME(p.time.msecsSinceStartOfDay()) * 10;
            std::memcpy(v, &x, sizeof x);
            break;
        }
        default:
            break;
        }
    }
    return builtIn;
}

void releaseStatementHandle(FbStatement& statement) noexcept
{
    statement.d_func()->releaseAll();
}

void detachStatement(FbStatement& statement) noexcept
{
    statement.d_func()->attachment = nullptr;
}

FbStatement::FbStatement(FbAttachment& attachment, FbTransaction* transaction, QString sql)
    : d(std::make_unique<Private>())
{
    d->attachment = &attachment;
    d->transaction = transaction;
    attachment.d_func()->statements.push_back(this);
    if (!sql.isEmpty())
        setSql(sql);
}

FbStatement::~FbStatement()
{
    d->releaseAll();
    if (d->attachment) {
        auto& list = d->attachment->d_func()->statements;
        list.erase(std::remove(list.begin(), list.end(), this), list.end());
    }
}

FbTransaction* FbStatement::transaction() const { return d->transaction; }

void FbStatement::setTransaction(FbTransaction* transaction)
{
    if (transaction == d->transaction)
        return;
    d->releaseCursor();
    d->transaction = transaction;
}

FbAttachment& FbStatement::attachment() const { return *d->attachment; }
const QString& FbStatement::sql() const { return d->sql; }
bool FbStatement::isPrepared() const { return d->stmt != nullptr; }

void FbStatement::setSql(const QString& sql)
{
    d->releaseAll();
    d->columns.clear();
    d->slots.clear();
    d->columnByName.clear();
    d->sql = sql;
    d->parsed = parseNamedParameters(sql);
    d->names.clear();
    d->paramOf.clear();
    d->params.clear();
    int plain = 0;
    for (const QString& n : d->parsed.names) {
        if (n.isEmpty()) {
            ++plain;
            continue;
        }
        if (!d->names.contains(n))
            d->names.append(n);
    }
    d->params.resize(size_t(d->names.size() + plain));
    int nextPlain = int(d->names.size());
    for (const QString& n : d->parsed.names)
        d->paramOf.push_back(n.isEmpty() ? nextPlain++ : int(d->names.indexOf(n)));
}

void FbStatement::prepare()
{
    if (d->stmt)
        return;
    if (!d->attachment)
        throw DatabaseError(QStringLiteral("Database not connected"), {}, 0, d->sql);
    IAttachment* att = d->attachment->d_func()->require();
    ITransaction* tra = d->requireTransaction();
    const QByteArray text = fbapi::encodeText(d->parsed.sql);
    fbapi::Status st;
    fbapi::guard(
        [&] {
            d->stmt = att->prepare(&st, tra, 0, text.constData(), SQL_DIALECT_V6,
                                   IStatement::PREPARE_PREFETCH_METADATA);
            d->stmtType = d->stmt->getType(&st);
            d->inMeta = d->stmt->getInputMetadata(&st);
            d->outMeta = d->stmt->getOutputMetadata(&st);
            if (d->inMeta->getCount(&st) != d->paramOf.size())
                throw DatabaseError(QStringLiteral("Parameter count mismatch"), {}, 0, d->sql);
            d->describeOutput(&st);
        },
        d->sql, [this] { d->releaseAll(); });
}

QStringList FbStatement::paramNames() const { return d->names; }

bool FbStatement::hasParam(QStringView name) const
{
    return d->names.contains(name.toString().toUpper());
}

void FbStatement::setParam(QStringView name, const QVariant& value)
{
    const qsizetype index = d->names.indexOf(name.toString().toUpper());
    if (index < 0)
        throw DatabaseError(QStringLiteral("Parameter \"%1\" not found").arg(name), {}, 0, d->sql);
    Param p;
    if (!value.isNull()) {
        switch (value.typeId()) {
        case QMetaType::QString:
            p.kind = Kind::Text;
            p.bytes = fbapi::encodeText(value.toString());
            break;
        case QMetaType::QChar:
            p.kind = Kind::Text;
            p.bytes = fbapi::encodeText(QString(value.toChar()));
            break;
        case QMetaType::QByteArray:
            p.kind = Kind::Bytes;
            p.bytes = value.toByteArray();
            break;
        case QMetaType::Bool:
            p.kind = Kind::Bool;
            p.i = value.toBool() ? 1 : 0;
            break;
        case QMetaType::Int:
        case QMetaType::UInt:
        case QMetaType::Long:
        case QMetaType::ULong:
        case QMetaType::LongLong:
        case QMetaType::ULongLong:
        case QMetaType::Short:
        case QMetaType::UShort:
        case QMetaType::Char:
        case QMetaType::SChar:
        case QMetaType::UChar:
            p.kind = Kind::Int;
            p.i = value.toLongLong();
            break;
        case QMetaType::Double:
        case QMetaType::Float:
            p.kind = Kind::Double;
            p.d = value.toDouble();
            break;
        case QMetaType::QDate:
            p.kind = Kind::Date;
            p.date = value.toDate();
            break;
        case QMetaType::QTime:
            p.kind = Kind::Time;
            p.time = value.toTime();
            break;
        case QMetaType::QDateTime: {
            const QDateTime dt = value.toDateTime();
            p.kind = Kind::Timestamp;
            p.date = dt.date();
            p.time = dt.time();
            break;
        }
        default:
            p.kind = Kind::Text;
            p.bytes = fbapi::encodeText(value.toString());
            break;
        }
        if ((p.kind == Kind::Date || p.kind == Kind::Timestamp) && !p.date.isValid())
            p.kind = Kind::Null;
        if (p.kind == Kind::Time && !p.time.isValid())
            p.kind = Kind::Null;
        if (p.kind == Kind::Timestamp && !p.time.isValid())
            p.time = QTime(0, 0);
    }
    d->params[size_t(index)] = std::move(p);
}

void FbStatement::setParamScaled(QStringView name, qint64 scaled, int scale)
{
    const qsizetype index = d->names.indexOf(name.toString().toUpper());
    if (index < 0)
        throw DatabaseError(QStringLiteral("Parameter \"%1\" not found").arg(name), {}, 0, d->sql);
    Param p;
    p.kind = Kind::Scaled;
    p.i = scaled;
    p.scale = scale;
    d->params[size_t(index)] = std::move(p);
}

void FbStatement::clearParams()
{
    for (Param& p : d->params)
        p = Param{};
}

void FbStatement::execute()
{
    prepare();
    d->releaseCursor();
    ITransaction* tra = d->requireTransaction();
    fbapi::Status st;
    fbapi::guard(
        [&] {
            IMessageMetadata* in = d->paramOf.empty() ? nullptr : d->buildInput(&st, tra);
            void* inBuf = in ? d->inBuf.data() : nullptr;
            d->affected = 0;
            if (d->stmtType == isc_info_sql_stmt_select || d->stmtType == isc_info_sql_stmt_select_for_upd) {
                d->cursor = d->stmt->openCursor(&st, tra, in, inBuf, d->outMeta, 0);
            } else {
                const bool outputs = !d->columns.empty();
                d->stmt->execute(&st, tra, in, inBuf, outputs ? d->outMeta : nullptr,
                                 outputs ? d->outBuf.data() : nullptr);
                d->hasRow = outputs;
                d->affected = qint64(d->stmt->getAffectedRecords(&st));
            }
        },
        d->sql, [this] { d->releaseCursor(); });
}

bool FbStatement::next()
{
    if (!d->cursor) {
        d->hasRow = false;
        return false;
    }
    fbapi::Status st;
    const bool fetched = fbapi::guard(
        [&] { return d->cursor->fetchNext(&st, d->outBuf.data()) == IStatus::RESULT_OK; }, d->sql,
        [this] { d->releaseCursor(); });
    if (fetched) {
        d->hasRow = true;
        return true;
    }
    d->releaseCursor();
    return false;
}

void FbStatement::close() { d->releaseCursor(); }
bool FbStatement::isOpen() const { return d->cursor != nullptr; }
bool FbStatement::hasRow() const { return d->hasRow; }
qint64 FbStatement::rowsAffected() const { return d->affected; }

bool FbStatement::isSelect() const
{
    return d->stmt
        && (d->stmtType == isc_info_sql_stmt_select || d->stmtType == isc_info_sql_stmt_select_for_upd);
}

int FbStatement::columnCount() const { return int(d->columns.size()); }
const FbColumn& FbStatement::column(int index) const { return d->columns.at(size_t(index)); }
const FbSlot& FbStatement::slot(int index) const { return d->slots.at(size_t(index)); }
const unsigned char* FbStatement::rowData() const { return d->outBuf.data(); }

int FbStatement::columnIndex(QStringView name) const
{
    return d->columnByName.value(name.toString().toUpper(), -1);
}

int FbStatement::requireColumn(QStringView name) const
{
    const int i = columnIndex(name);
    if (i < 0)
        throw DatabaseError(QStringLiteral("Field \"%1\" not found").arg(name), {}, 0, d->sql);
    return i;
}

namespace {

template <typename T>
T load(const unsigned char* p)
{
    T v;
    std::memcpy(&v, p, sizeof v);
    return v;
}

} // namespace

bool FbStatement::isNull(int index) const
{
    if (!d->hasRow)
        return true;
    const FbSlot& s = slot(index);
    return load<short>(d->outBuf.data() + s.nullOffset) != 0;
}

// The integer as stored (numerics unscaled); 0 for non-integer storage.
static qint64 rawInteger(const FbSlot& s, const unsigned char* p)
{
    switch (s.storage) {
    case FbSlot::Storage::I16:
        return load<qint16>(p);
    case FbSlot::Storage::I32:
        return load<qint32>(p);
    case FbSlot::Storage::I64:
        return load<qint64>(p);
    case FbSlot::Storage::Bool:
        return *p ? 1 : 0;
    default:
        return 0;
    }
}

qint64 FbStatement::asScaled(int index, int scale) const
{
    if (isNull(index))
        return 0;
    const FbSlot& s = slot(index);
    const unsigned char* p = d->outBuf.data() + s.offset;
    switch (s.storage) {
    case FbSlot::Storage::I16:
    case FbSlot::Storage::I32:
    case FbSlot::Storage::I64:
    case FbSlot::Storage::Bool:
        return rescale(rawInteger(s, p), s.scale, scale);
    case FbSlot::Storage::F32:
    case FbSlot::Storage::F64:
    case FbSlot::Storage::Text:
    case FbSlot::Storage::VarText:
        return qint64(std::llround(asDouble(index) * double(pow10(scale))));
    default:
        return 0;
    }
}

qint64 FbStatement::asInt64(int index) const
{
    if (isNull(index))
        return 0;
    const FbSlot& s = slot(index);
    switch (s.storage) {
    case FbSlot::Storage::Text:
    case FbSlot::Storage::VarText:
        return asString(index).trimmed().toLongLong();
    case FbSlot::Storage::Date:
    case FbSlot::Storage::Timestamp:
        return asDate(index).toJulianDay();
    default:
        return asScaled(index, 0);
    }
}

double FbStatement::asDouble(int index) const
{
    if (isNull(index))
        return 0.0;
    const FbSlot& s = slot(index);
    const unsigned char* p = d->outBuf.data() + s.offset;
    switch (s.storage) {
    case FbSlot::Storage::F32:
        return double(load<float>(p));
    case FbSlot::Storage::F64:
        return load<double>(p);
    case FbSlot::Storage::Text:
    case FbSlot::Storage::VarText:
        return asString(index).trimmed().toDouble();
    case FbSlot::Storage::I16:
    case FbSlot::Storage::I32:
    case FbSlot::Storage::I64:
    case FbSlot::Storage::Bool:
        return double(rawInteger(s, p)) / double(pow10(s.scale));
    default:
        return 0.0;
    }
}

QByteArray FbStatement::asBytes(int index) const
{
    if (isNull(index))
        return {};
    const FbSlot& s = slot(index);
    const unsigned char* p = d->outBuf.data() + s.offset;
    switch (s.storage) {
    case FbSlot::Storage::Text: {
        int n = s.length;
        while (n > 0 && p[n - 1] == ' ')
            --n;
        return QByteArray(reinterpret_cast<const char*>(p), n);
    }
    case FbSlot::Storage::VarText:
        return QByteArray(reinterpret_cast<const char*>(p + 2), load<quint16>(p));
    case FbSlot::Storage::BlobId:
        return readBlob(index);
    default:
        return asString(index).toLatin1();
    }
}

QString FbStatement::asString(int index) const
{
    if (isNull(index))
        return {};
    const FbSlot& s = slot(index);
    switch (s.storage) {
    case FbSlot::Storage::Text:
    case FbSlot::Storage::VarText:
    case FbSlot::Storage::BlobId: {
        const QByteArray b = asBytes(index);
        return fbapi::decodeText(b.constData(), b.size());
    }
    case FbSlot::Storage::F32:
    case FbSlot::Storage::F64:
        return QString::number(asDouble(index), 'g', 15);
    case FbSlot::Storage::Date:
        return asDate(index).toString(QStringLiteral("dd.MM.yyyy"));
    case FbSlot::Storage::Time:
        return asTime(index).toString(QStringLiteral("hh:mm:ss"));
    case FbSlot::Storage::Timestamp:
        return asDateTime(index).toString(QStringLiteral("dd.MM.yyyy hh:mm:ss"));
    default: {
        if (s.scale == 0)
            return QString::number(asInt64(index));
        const qint64 v = asScaled(index, s.scale);
        const qint64 div = pow10(s.scale);
        const qint64 whole = (v < 0 ? -v : v) / div;
        const qint64 frac = (v < 0 ? -v : v) % div;
        return QStringLiteral("%1%2.%3")
            .arg(v < 0 ? QStringLiteral("-") : QString())
            .arg(whole)
            .arg(frac, s.scale, 10, QLatin1Char('0'));
    }
    }
}

QDate FbStatement::asDate(int index) const
{
    if (isNull(index))
        return {};
    const FbSlot& s = slot(index);
    const unsigned char* p = d->outBuf.data() + s.offset;
    if (s.storage == FbSlot::Storage::Date || s.storage == FbSlot::Storage::Timestamp)
        return QDate::fromJulianDay(fbapi::julianDayFromIsc(load<ISC_DATE>(p)));
    if (s.storage == FbSlot::Storage::Text || s.storage == FbSlot::Storage::VarText)
        return QDate::fromString(asString(index).trimmed(), QStringLiteral("dd.MM.yyyy"));
    return {};
}

QTime FbStatement::asTime(int index) const
{
    if (isNull(index))
        return {};
    const FbSlot& s = slot(index);
    const unsigned char* p = d->outBuf.data() + s.offset;
    if (s.storage == FbSlot::Storage::Time)
        return QTime::fromMSecsSinceStartOfDay(int(load<ISC_TIME>(p) / 10));
    if (s.storage == FbSlot::Storage::Timestamp)
        return QTime::fromMSecsSinceStartOfDay(int(load<ISC_TIMESTAMP>(p).timestamp_time / 10));
    return {};
}

QDateTime FbStatement::asDateTime(int index) const
{
    if (isNull(index))
        return {};
    const FbSlot& s = slot(index);
    if (s.storage == FbSlot::Storage::Timestamp)
        return QDateTime(asDate(index), asTime(index));
    if (s.storage == FbSlot::Storage::Date)
        return QDateTime(asDate(index), QTime(0, 0));
    if (s.storage == FbSlot::Storage::Time)
        return QDateTime(QDate(1899, 12, 30), asTime(index));
    return {};
}

QVariant FbStatement::value(int index) const
{
    if (isNull(index))
        return {};
    switch (column(index).type) {
    case FbType::SmallInt:
    case FbType::Integer:
        return QVariant(asInt(index));
    case FbType::BigInt:
        return QVariant(asInt64(index));
    case FbType::Numeric:
    case FbType::Float:
    case FbType::Double:
        return QVariant(asDouble(index));
    case FbType::Char:
    case FbType::Varchar:
    case FbType::TextBlob:
        return QVariant(asString(index));
    case FbType::Blob:
        return QVariant(asBytes(index));
    case FbType::Date:
        return QVariant(asDate(index));
    case FbType::Time:
        return QVariant(asTime(index));
    case FbType::Timestamp:
        return QVariant(asDateTime(index));
    case FbType::Boolean:
        return QVariant(asInt64(index) != 0);
    }
    return {};
}

QByteArray FbStatement::readBlob(int index) const
{
    if (isNull(index))
        return {};
    const FbSlot& s = slot(index);
    if (s.storage != FbSlot::Storage::BlobId)
        return asBytes(index);
    ITransaction* tra = d->requireTransaction();
    IAttachment* att = d->attachment->d_func()->require();
    ISC_QUAD id = load<ISC_QUAD>(d->outBuf.data() + s.offset);
    QByteArray out;
    fbapi::Status st;
    IBlob* blob = nullptr;
    fbapi::guard(
        [&] {
            blob = att->openBlob(&st, tra, &id, 0, nullptr);
            char buffer[kBlobSegment];
            for (;;) {
                unsigned got = 0;
                const int r = blob->getSegment(&st, sizeof buffer, buffer, &got);
                if (r == IStatus::RESULT_NO_DATA)
                    break;
                out.append(buffer, qsizetype(got));
            }
            blob->close(&st); // releases the blob on success
            blob = nullptr;
        },
        d->sql, [&blob] {
            if (blob)
                blob->release();
        });
    return out;
}

} // namespace orvanta
