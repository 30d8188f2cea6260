#include "db/BackgroundFetch.h"

#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"

#include <QMetaObject>

#include <algorithm>
#include <chrono>

namespace orvanta {
namespace {

std::atomic<int> g_batchDelayMs{0};

} // namespace

void BackgroundFetch::setBatchDelayForTests(int milliseconds)
{
    g_batchDelayMs.store(milliseconds);
}

BackgroundFetch::BackgroundFetch(Request request, QObject* parent)
    : QObject(parent)
    , m_request(std::move(request))
{
}

BackgroundFetch::~BackgroundFetch()
{
    stop();
}

void BackgroundFetch::start()
{
    if (m_thread.joinable())
        return;
    m_stop.store(false);
    m_running.store(true);
    m_thread = std::thread([this] { run(); });
}

void BackgroundFetch::stop()
{
    {
        std::lock_guard lock(m_mutex);
        m_stop.store(true);
    }
    m_wake.notify_all();
    if (m_thread.joinable())
        m_thread.join();
    m_running.store(false);
}

std::deque<RecordStore> BackgroundFetch::takeBatches()
{
    std::lock_guard lock(m_mutex);
    m_signalPending = false;
    return std::exchange(m_batches, {});
}

void BackgroundFetch::handOver(RecordStore&& batch)
{
    bool signal = false;
    {
        std::lock_guard lock(m_mutex);
        m_batches.push_back(std::move(batch));
        signal = !m_signalPending;
        m_signalPending = true;
    }
    // One notice for any number of batches: the owner takes them all when it gets to it.
    if (signal)
        QMetaObject::invokeMethod(this, &BackgroundFetch::batchesReady, Qt::QueuedConnection);
}

bool BackgroundFetch::pause()
{
    const int delay = g_batchDelayMs.load();
    if (delay <= 0)
        return !m_stop.load();
    std::unique_lock lock(m_mutex);
    m_wake.wait_for(lock, std::chrono::milliseconds(delay), [this] { return m_stop.load(); });
    return !m_stop.load();
}

bool BackgroundFetch::fetchAll(FbStatement& statement)
{
    int batchSize = m_request.firstBatch;
    qint64 rows = 0;
    RecordStore batch;
    batch.reset(statement);
    const auto handBatch = [&] {
        rows += batch.rowCount();
        m_rows.fetch_add(batch.rowCount());
        handOver(std::move(batch));
        batch = RecordStore();
        batch.reset(statement);
    };
    while (!m_stop.load() && statement.next()) {
        batch.appendRow(statement);
        if (batch.rowCount() >= batchSize) {
            handBatch();
            batchSize = std::min(batchSize * 2, m_request.largestBatch);
            if (!pause())
                return false;
        }
    }
    if (m_stop.load())
        return false;
    // An empty result still hands its columns over.
    if (batch.rowCount() > 0 || rows == 0)
        handBatch();
    return true;
}

void BackgroundFetch::run()
{
    bool ok = true;
    try {
        FbAttachment attachment(m_request.databaseName, m_request.connectionParams);
        attachment.connect();
        // One snapshot for the whole read, never writing, never waiting for a writer.
        FbTransaction transaction(attachment,
                                  {QStringLiteral("read"), QStringLiteral("concurrency"), QStringLiteral("nowait")},
                                  FbTransaction::EndAction::Commit, QStringLiteral("fetch"));
        transaction.start();
        {
            const QString sql = m_request.order.isEmpty()
                                    ? m_request.sql
                                    : m_request.sql + QStringLiteral(" ORDER BY ") + m_request.order;
            FbStatement statement(attachment, &transaction, sql);
            for (const QString& n : statement.paramNames())
                statement.setParam(n, m_request.params.value(n.toUpper()));
            statement.execute();
            fetchAll(statement);
        }
        transaction.commit();
        attachment.disconnect();
    } catch (const std::exception&) {
        ok = false;
        m_error = std::current_exception();
    }
    m_running.store(false);
    if (!m_stop.load())
        QMetaObject::invokeMethod(this, [this, ok] { Q_EMIT finished(ok); }, Qt::QueuedConnection);
}

} // namespace orvanta
