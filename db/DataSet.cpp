#include "db/DataSet.h"

#include "db/BackgroundFetch.h"
#include "db/DatabaseError.h"
#include "db/FbStatement.h"
#include "db/FbAttachment.h"
#include "db/FbTransaction.h"
#include "db/SqlParams.h"

#include <atomic>

namespace orvanta {

namespace {
std::atomic<qint64> g_rowsRead{0};
} // namespace

qint64 DataSet::rowsRead()
{
    return g_rowsRead.load();
}

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
    stopFetch();
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
    g_rowsRead.fetch_add(store.rowCount());
    m_store = std::move(store);
    m_active = true;
    m_row = m_store.rowCount() > 0 ? 0 : -1;
    Q_EMIT opened();
}

void DataSet::openInBackground(const QString& order)
{
    if (m_active)
        return;
    if (m_beforeOpen)
        m_beforeOpen(*this);
    FbStatement statement(*m_attachment, m_transaction, m_commandText);
    statement.prepare();
    RecordStore store;
    store.reset(statement);
    m_store = std::move(store);
    m_loadError = nullptr;
    m_active = true;
    m_row = -1;
    startFetch(order, false);
    Q_EMIT opened();
}

void DataSet::reloadInBackground(const QString& order)
{
    if (!m_active)
        return;
    stopFetch();
    m_loadError = nullptr;
    startFetch(order, true);
}

void DataSet::startFetch(const QString& order, bool replacing)
{
    BackgroundFetch::Request request;
    request.databaseName = m_attachment->databaseName();
    request.connectionParams = m_attachment->params();
    request.sql = m_commandText;
    request.order = order;
    request.params = m_params;
    m_replacing = replacing;
    m_pending.clear();
    m_fetch = std::make_unique<BackgroundFetch>(std::move(request));
    connect(m_fetch.get(), &BackgroundFetch::batchesReady, this, &DataSet::takeBatches);
    connect(m_fetch.get(), &BackgroundFetch::finished, this, &DataSet::fetchFinished);
    m_fetch->start();
}

void DataSet::takeBatches()
{
    if (!m_fetch)
        return;
    std::deque<RecordStore> batches = m_fetch->takeBatches();
    if (batches.empty())
        return;
    RecordStore& into = m_replacing ? m_pending : m_store;
    const int first = into.rowCount();
    for (RecordStore& batch : batches) {
        g_rowsRead.fetch_add(batch.rowCount());
        if (into.columnCount() == 0)
            into = std::move(batch);
        else
            into.appendRows(batch);
    }
    if (!m_replacing) {
        if (m_row < 0 && m_store.rowCount() > 0)
            m_row = 0;
        Q_EMIT rowsArrived(first);
    }
}

void DataSet::fetchFinished(bool ok)
{
    takeBatches();
    std::unique_ptr<BackgroundFetch> fetch = std::move(m_fetch);
    fetch->stop();
    if (!ok)
        m_loadError = fetch->error();
    // This runs inside the fetch object's own signal: it goes once that has returned (or with
    // this data set, whichever comes first).
    fetch->setParent(this);
    fetch.release()->deleteLater();
    const bool replaced = m_replacing && ok;
    m_replacing = false;
    // The buffers grew by half at a time while the rows arrived; the spare goes back now.
    m_store.squeeze();
    if (replaced) {
        m_pending.squeeze();
        m_store = std::move(m_pending);
        m_row = m_store.rowCount() > 0 ? 0 : -1;
        Q_EMIT rowsReplaced();
    }
    m_pending.clear();
    Q_EMIT loadFinished(ok);
}

void DataSet::stopFetch() noexcept
{
    if (m_fetch) {
        m_fetch->stop();
        m_fetch.reset();
    }
    m_replacing = false;
    m_pending.clear();
}

int DataSet::appendQuery(const QString& sql, const QHash<QString, QVariant>& params)
{
    if (!m_active)
        return 0;
    if (m_transaction) {
        if (m_transaction->isActive())
            m_transaction->commit();
        m_transaction->start();
    }
    FbStatement statement(*m_attachment, m_transaction, sql);
    for (const QString& n : statement.paramNames())
        statement.setParam(n, params.value(n.toUpper()));
    statement.execute();
    RecordStore rows;
    rows.reset(statement);
    while (statement.next())
        rows.appendRow(statement);
    g_rowsRead.fetch_add(rows.rowCount());
    if (rows.rowCount() == 0)
        return 0;
    const int first = m_store.rowCount();
    m_store.appendRows(rows);
    if (m_row < 0)
        m_row = 0;
    Q_EMIT rowsArrived(first);
    return rows.rowCount();
}

void DataSet::close()
{
    if (m_active)
        (void)takeRowsAndClose();
}

RecordStore DataSet::takeRowsAndClose()
{
    stopFetch();
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
