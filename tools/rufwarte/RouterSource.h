#pragma once
// The calls of a router's call monitor (TCP, port 1012 by default) as LOG rows. The connection is
// re-made with a growing pause when the router goes away; finished calls wait in a queue until
// the database has taken them, so neither a dropped line nor a lost database costs a call that
// had ended.

#include "phone/RouterCallMonitor.h"
#include "tools/rufwarte/Monitor.h"
#include "tools/rufwarte/ProgramNotifier.h"

#include <QFile>
#include <QObject>
#include <QTcpSocket>
#include <QTimer>

#include <functional>
#include <memory>

namespace orvanta {
class FbAttachment;
}

namespace orvanta::rufwarte {

class RouterSource final : public QObject {
    Q_OBJECT

public:
    static constexpr quint16 DefaultPort = 1012;

    struct Timing {
        int firstRetryMs = 1000;  // pause before the first new attempt, doubled after each failure
        int maxRetryMs = 30000;   // the pause grows no further
        int lockRetryMs = 200;    // after a lock conflict
        int connectTimeoutMs = 15000;
    };
    // Opens the database; throws AppException when it cannot.
    using Connector = std::function<std::unique_ptr<FbAttachment>()>;

    // queueFile: where finished calls wait until the database has them, so that they outlive the
    // monitor; read back at construction. Empty: they wait in memory only.
    RouterSource(QString host, quint16 port, Connector connector, QList<MsnRecord> msns, Timing timing,
                 QString queueFile = {}, QObject* parent = nullptr);
    ~RouterSource() override;

    // The bare name of the queue file in the program folder.
    static constexpr const char* QueueFileName = "CallQueue";

    // The queue file's text: one line per call, and a line "-" each time the oldest call was
    // written. Lines that are neither are passed over and counted in `skipped`.
    [[nodiscard]] static QByteArray encodeQueue(const QList<LoggedCall>& calls);
    [[nodiscard]] static QList<LoggedCall> decodeQueue(QByteArrayView text, int* skipped = nullptr);

    // "HOST", "HOST:PORT" or "[IPv6]:PORT"; false for anything else.
    [[nodiscard]] static bool parseAddress(const QString& text, QString& host, quint16& port);

    void start();
    // Paused, ended calls are reported and not logged, as with every call of a paused monitor.
    void setPaused(bool paused) { m_paused = paused; }

    [[nodiscard]] int queuedCalls() const { return static_cast<int>(m_queue.size()); }

Q_SIGNALS:
    void callLogged(int lid);

private:
    void connectToRouter();
    void lineDropped(const QString& why);
    void readLines();
    void enqueue(const RouterCall& call);
    void writeQueued();
    void retryDatabaseLater();
    void rewriteQueueFile();
    void appendToQueueFile(const QByteArray& lines);
    void queueFileWritten(bool saved);

    QString m_host;
    quint16 m_port;
    Connector m_connector;
    QList<MsnRecord> m_msns;
    Timing m_timing;
    bool m_paused = false;

    QTcpSocket m_socket;
    QTimer m_reconnect;
    QTimer m_connectTimeout;
    int m_routerDelay;
    RouterLineSplitter m_splitter;
    RouterCallTracker m_tracker;

    std::unique_ptr<FbAttachment> m_db;
    QList<LoggedCall> m_queue;
    ProgramNotifier m_notifier;
    QString m_queueFile;
    QFile m_journal; // the queue file while calls are appended to it
    bool m_queueSaved = true;
    QTimer m_writeTimer;
    int m_dbDelay;
};

} // namespace orvanta::rufwarte
