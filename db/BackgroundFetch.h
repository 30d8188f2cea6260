#pragma once
// Reads one query on a thread of its own, over an attachment and a read-only snapshot
// transaction of its own, and hands the rows over in batches: the first small (one screen),
// the later ones growing, so the first rows are shown at once and the whole result costs few
// hand-overs. Batches wait in a queue until the owner's thread takes them; the owner hears of
// them by batchesReady(), queued to its thread. Destroying the object or stop() ends the
// thread at once: the flag is looked at after every row.

#include "db/RecordStore.h"

#include <QHash>
#include <QObject>
#include <QString>
#include <QStringList>
#include <QVariant>

#include <atomic>
#include <condition_variable>
#include <deque>
#include <exception>
#include <functional>
#include <mutex>
#include <thread>

namespace orvanta {

class FbStatement;

class BackgroundFetch final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(BackgroundFetch)

public:
    // The rows come in the order given ("TSDATE DESC, TSTIME DESC"): with an index that serves
    // it the engine walks the index, so the first batch is there at once and every batch
    // continues where the last ended.
    struct Request {
        QString databaseName;
        QStringList connectionParams; // as FbAttachment takes them
        QString sql;
        QHash<QString, QVariant> params; // by upper-case name
        QString order;
        int firstBatch = 200;
        int largestBatch = 32768;
    };

    explicit BackgroundFetch(Request request, QObject* parent = nullptr);
    ~BackgroundFetch() override;

    void start();
    // Ends the thread and waits for it; batches already queued stay.
    void stop();
    [[nodiscard]] bool isRunning() const { return m_running.load(); }

    // The batches that arrived since the last call, in order.
    [[nodiscard]] std::deque<RecordStore> takeBatches();
    [[nodiscard]] qint64 rowsFetched() const { return m_rows.load(); }
    // The failure of a fetch that finished not ok, to rethrow on the owner's thread.
    [[nodiscard]] std::exception_ptr error() const { return m_error; }

    // Test seam: a pause after every batch handed over (the thread still stops at once).
    static void setBatchDelayForTests(int milliseconds);

Q_SIGNALS:
    void batchesReady();
    // The query ran out of rows (ok) or failed (error() holds why); not sent after stop().
    void finished(bool ok);

private:
    void run();
    // Reads the statement's rows in growing batches; false when stopped.
    bool fetchAll(FbStatement& statement);
    void handOver(RecordStore&& batch);
    bool pause();

    Request m_request;
    std::thread m_thread;
    std::atomic<bool> m_stop{false};
    std::atomic<bool> m_running{false};
    std::atomic<qint64> m_rows{0};
    std::mutex m_mutex;
    std::condition_variable m_wake;
    std::deque<RecordStore> m_batches;
    bool m_signalPending = false;
    std::exception_ptr m_error; // written by the thread before finished() is queued
};

} // namespace orvanta
