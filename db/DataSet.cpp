#include "db/DataSet.h"

#include "db/DatabaseError.h"
#include "db/FbStatement.h"
#include "db/SqlParams.h"

namespace orvanta {

QVariant DataSetField::value() const
{
    if (isNull())
        return {};
    switch (m_store->field(m_column).type) {
    case FbType::SmallInt:
    case FbType::Integer:
        return QVariant(asInteger());
    case FbType::BigInt:
        return QVariant(asInt64());
    case FbType::Numeric:
    case FbType::Float:
    case FbType::Double:
        return QVariant(asFloat());
    case FbType::Date:
        return QVariant(asDate());
    case FbType::Time:
        return QVariant(asTime());
    case FbType::Timestamp:
        return QVariant(asDateTime());
    case FbType::Boolean:
        return QVariant(asInt64() != 0);
    case FbType::Blob:
        return QVariant(m_store->bytes(m_row, m_column).toByteArray());
    default:
        return QVariant(asString());
    }
}

DataSet::DataSet(FbAttachment& attachment, FbTransaction* transaction, const QString& name,
                 const QString& commandText, QObject* parent)
    : QObject(parent)
    , m_attachment(&attachment)
    , m_transaction(transaction)
    , m_commandText(commandText)
{
    setObjectName(name);
}

DataSet::~DataSet()
{
    // No hooks from a destructor: the owner ends the transactions itself.
    m_store.clear();
}

void DataSet::setTransaction(FbTransaction* transaction)
{
    if (m_active)
        close();
    m_transaction = transaction;
}

void DataSet::setCommandText(const QString& text)
{
    if (m_active)
        close();
    m_commandText = text;
}

QStringList DataSet::paramNames() const
{
    QStringList names;
    for (const QString& n : parseNamedParameters(m_commandText).names)
        if (!n.isEmpty() && !names.contains(n))
            names.append(n);
    return names;
}

void DataSet::setParam(const QString& name, const QVariant& value)
{
    m_params.insert(name.toUpper(), value);
}

QVariant DataSet::param(const QString& name) const
{
    return m_params.value(name.toUpper());
}

void DataSet::open()
{
    if (m_active)
        return;
    if (m_beforeOpen)
        m_beforeOpen(*this);
    FbStatement statement(*m_attachment, m_transaction, m_commandText);
    for (const QString& n : statement.paramNames())
        statement.setParam(n, m_params.value(n));
    RecordStore store;
    try {
        statement.execute();
        store.reset(statement);
        while (statement.next())
            store.appendRow(statement);
        store.squeeze();
    } catch (const std::bad_alloc&) {
        throw DatabaseError(QStringLiteral("Out of memory reading \"%1\"").arg(objectName()), {}, 0, m_commandText);
    }
    m_store = std::move(store);
    m_active = true;
    m_row = m_store.rowCount() > 0 ? 0 : -1;
    Q_EMIT opened();
}

void DataSet::close()
{
    if (m_active)
        (void)takeRowsAndClose();
}

RecordStore DataSet::takeRowsAndClose()
{
    Q_EMIT aboutToClose();
    RecordStore rows = std::move(m_store);
    m_store.clear();
    m_active = false;
    m_row = -1;
    Q_EMIT closed();
    if (m_afterClose)
        m_afterClose(*this);
    return rows;
}

bool DataSet::openWithRowsOf(DataSet& other)
{
    if (m_active || !other.m_active || &other == this || !paramNames().isEmpty())
        return false;
    if (m_beforeOpen)
        m_beforeOpen(*this);
    FbStatement statement(*m_attachment, m_transaction, m_commandText);
    statement.prepare();
    const QList<FbColumn>& theirs = other.m_store.fields();
    if (statement.columnCount() != theirs.size())
        return false;
    for (int i = 0; i < statement.columnCount(); ++i) {
        const FbColumn& a = statement.column(i);
        const FbColumn& b = theirs[i];
        if (a.name != b.name || a.type != b.type || a.width != b.width || a.scale != b.scale)
            return false;
    }
    m_store = other.takeRowsAndClose();
    m_active = true;
    m_row = m_store.rowCount() > 0 ? 0 : -1;
    Q_EMIT opened();
    return true;
}

void DataSet::refresh()
{
    close();
    open();
}

qint64 DataSet::execSQL()
{
    FbStatement statement(*m_attachment, m_transaction, m_commandText);
    for (const QString& n : statement.paramNames())
        statement.setParam(n, m_params.value(n));
    statement.execute();
    return statement.rowsAffected();
}

void DataSet::post()
{
    if (m_afterPost)
        m_afterPost(*this);
}

void DataSet::setRecNo(int row)
{
    if (m_store.rowCount() == 0)
        m_row = -1;
    else
        m_row = qBound(0, row, m_store.rowCount());
}

bool DataSet::locate(QStringView field, const QVariant& value)
{
    const int column = m_store.fieldIndex(field);
    if (column < 0)
        throw DatabaseError(QStringLiteral("Field \"%1\" not found").arg(field));
    for (int r = 0; r < m_store.rowCount(); ++r) {
        if (DataSetField(m_store, r, column).value() == value) {
            m_row = r;
            return true;
        }
    }
    return false;
}

DataSetField DataSet::fieldByName(QStringView name) const
{
    const int column = m_store.fieldIndex(name);
    if (column < 0)
        throw DatabaseError(QStringLiteral("Field \"%1\" not found").arg(name));
    return DataSetField(m_store, eof() ? -1 : m_row, column);
}

} // namespace orvanta
