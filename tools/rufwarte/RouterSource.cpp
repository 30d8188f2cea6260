#include "tools/rufwarte/RouterSource.h"

#include "db/FbAttachment.h"
#include "platform/AppException.h"
#include "platform/MonitorLink.h"

#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QSaveFile>
#include <QSignalBlocker>

#include <algorithm>

#ifdef Q_OS_LINUX
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#endif

namespace orvanta::rufwarte {

namespace {

// A queue file is a few lines; one that is not is no queue file of ours.
constexpr qint64 QueueFileLimit = 16 * 1024 * 1024;

LoggedCall loggedCall(const RouterCall& call)
{
    LoggedCall c;
    c.direction = call.direction == RouterCall::Direction::Outgoing ? LoggedCall::Outgoing : LoggedCall::Incoming;
    c.number = call.remoteNumber;
    c.ownNumber = call.ownNumber;
    c.answered = call.answered;
    c.start = call.start;
    c.durationSeconds = call.durationSeconds;
    return c;
}

// A line from outside as one printable line of output.
QString printable(const QByteArray& line)
{
    QString out;
    for (const char c : line.left(80))
        out += c >= 0x20 && c < 0x7f ? QLatin1Char(c) : QLatin1Char('?');
    return out;
}

// The router says nothing between calls, so a router switched off would leave the connection
// open for good: keep-alive probes after a minute of silence find out within two.
void keepAlive(QTcpSocket& socket)
{
    socket.setSocketOption(QAbstractSocket::KeepAliveOption, 1);
#ifdef Q_OS_LINUX
    const int fd = static_cast<int>(socket.socketDescriptor());
    const int idle = 60;
    const int interval = 10;
    const int count = 6;
    ::setsockopt(fd, IPPROTO_TCP, TCP_KEEPIDLE, &idle, sizeof idle);
    ::setsockopt(fd, IPPROTO_TCP, TCP_KEEPINTVL, &interval, sizeof interval);
    ::setsockopt(fd, IPPROTO_TCP, TCP_KEEPCNT, &count, sizeof count);
#endif
}

// The usual failures in the monitor's language; the rest as the system words them.
QString socketErrorText(QAbstractSocket::SocketError error, const QString& systemText)
{
    switch (error) {
    case QAbstractSocket::ConnectionRefusedError:
        return QStringLiteral("Verbindung abgelehnt; ist der Anrufmonitor des Routers eingeschaltet?");
    case QAbstractSocket::HostNotFoundError:
        return QStringLiteral("Router nicht gefunden");
    case QAbstractSocket::RemoteHostClosedError:
        return QStringLiteral("Verbindung beendet");
    case QAbstractSocket::NetworkError:
        return QStringLiteral("Netzwerkfehler");
    default:
        return systemText;
    }
}

QString seconds(int ms)
{
    return QString::number(ms / 1000.0, 'f', ms % 1000 == 0 ? 0 : 1);
}

} // namespace

RouterSource::RouterSource(QString host, quint16 port, Connector connector, QList<MsnRecord> msns, Timing timing,
                           QString queueFile, QObject* parent)
    : QObject(parent)
    , m_host(std::move(host))
    , m_port(port)
    , m_connector(std::move(connector))
    , m_msns(std::move(msns))
    , m_timing(timing)
    , m_routerDelay(timing.firstRetryMs)
    , m_queueFile(std::move(queueFile))
    , m_dbDelay(timing.firstRetryMs)
{
    QFile file(m_queueFile);
    if (!m_queueFile.isEmpty() && file.open(QIODevice::ReadOnly)) {
        int skipped = 0;
        m_queue = decodeQueue(file.read(QueueFileLimit), &skipped);
        file.close();
        if (!m_queue.isEmpty())
            say(QStringLiteral("%1 Anrufe aus \"%2\" warten auf die Datenbank.").arg(m_queue.size()).arg(m_queueFile));
        if (skipped > 0)
            say(QStringLiteral("%1 unlesbare Zeilen in \"%2\" übergangen.").arg(skipped).arg(m_queueFile));
        // Written anew, so that what is appended from now on follows whole lines.
        rewriteQueueFile();
    }
    m_reconnect.setSingleShot(true);
    connect(&m_reconnect, &QTimer::timeout, this, &RouterSource::connectToRouter);
    m_connectTimeout.setSingleShot(true);
    connect(&m_connectTimeout, &QTimer::timeout, this, [this] {
        if (m_socket.state() != QAbstractSocket::ConnectedState)
            m_socket.abort();
        lineDropped(QStringLiteral("keine Antwort"));
    });
    m_writeTimer.setSingleShot(true);
    connect(&m_writeTimer, &QTimer::timeout, this, &RouterSource::writeQueued);

    // Reading happens on every readyRead; a bounded buffer keeps a flooding router in the kernel.
    m_socket.setReadBufferSize(64 * 1024);
    connect(&m_socket, &QTcpSocket::connected, this, [this] {
        m_connectTimeout.stop();
        keepAlive(m_socket);
        say(QStringLiteral("Verbunden mit dem Anrufmonitor des Routers %1:%2.").arg(m_host).arg(m_port));
    });
    connect(&m_socket, &QTcpSocket::readyRead, this, &RouterSource::readLines);
    connect(&m_socket, &QTcpSocket::disconnected, this, [this] {
        // What arrived before the end still counts.
        if (m_socket.bytesAvailable() > 0)
            readLines();
        lineDropped(QStringLiteral("Verbindung beendet"));
    });
    connect(&m_socket, &QTcpSocket::errorOccurred, this, [this](QAbstractSocket::SocketError error) {
        // A closed connection also reports RemoteHostClosedError; "disconnected" handles it.
        if (error != QAbstractSocket::RemoteHostClosedError || m_socket.state() == QAbstractSocket::UnconnectedState)
            lineDropped(socketErrorText(error, m_socket.errorString()));
    });
}

RouterSource::~RouterSource()
{
    if (!m_queue.isEmpty() && m_queueSaved && !m_queueFile.isEmpty())
        say(QStringLiteral("%1 Anrufe warten in \"%2\" auf den nächsten Start.").arg(m_queue.size()).arg(m_queueFile));
    else
        // Without the file, quitting is the one way to lose them: say which they are.
        for (const LoggedCall& c : std::as_const(m_queue))
            say(QStringLiteral("Nicht protokolliert: Anruf %1 vom %2.")
                    .arg(c.number.isEmpty() ? QStringLiteral("ohne Nummer") : c.number,
                         c.start.toString(QStringLiteral("dd.MM.yyyy hh:mm:ss"))));
    m_socket.disconnect(this);
    m_socket.abort();
}

bool RouterSource::parseAddress(const QString& text, QString& host, quint16& port)
{
    const QString t = text.trimmed();
    QString portText;
    bool hasPort = false;
    if (t.startsWith(QLatin1Char('['))) {
        const qsizetype close = t.indexOf(QLatin1Char(']'));
        if (close < 0)
            return false;
        host = t.mid(1, close - 1);
        const QString rest = t.mid(close + 1);
        if (!rest.isEmpty()) {
            if (!rest.startsWith(QLatin1Char(':')))
                return false;
            portText = rest.mid(1);
            hasPort = true;
        }
    } else if (t.count(QLatin1Char(':')) == 1) {
        host = t.section(QLatin1Char(':'), 0, 0);
        portText = t.section(QLatin1Char(':'), 1);
        hasPort = true;
    } else {
        host = t; // a bare IPv6 address has no port
    }
    if (host.isEmpty() || host.contains(QLatin1Char(' ')))
        return false;
    port = DefaultPort;
    if (hasPort) {
        bool ok = false;
        const uint p = portText.toUInt(&ok);
        if (!ok || p == 0 || p > 65535)
            return false;
        port = static_cast<quint16>(p);
    }
    return true;
}

void RouterSource::start()
{
    connectToRouter();
    writeQueued();
}

QByteArray RouterSource::encodeQueue(const QList<LoggedCall>& calls)
{
    QByteArray out;
    for (const LoggedCall& c : calls) {
        out += c.start.toString(Qt::ISODate).toLatin1() + '\t' + QByteArray::number(c.direction) + '\t'
            + (c.answered ? "1" : "0") + '\t' + QByteArray::number(c.durationSeconds) + '\t' + c.number.toLatin1()
            + '\t' + c.ownNumber.toLatin1() + '\n';
    }
    return out;
}

QList<LoggedCall> RouterSource::decodeQueue(QByteArrayView text, int* skipped)
{
    QList<LoggedCall> calls;
    int bad = 0;
    for (const QByteArray& line : text.toByteArray().split('\n')) {
        if (line.trimmed().isEmpty())
            continue;
        if (line == "-") {
            // The oldest call was written.
            if (calls.isEmpty())
                ++bad;
            else
                calls.removeFirst();
            continue;
        }
        const QList<QByteArray> f = line.split('\t');
        LoggedCall c;
        bool directionOk = false;
        bool secondsOk = false;
        if (f.size() == 6) {
            c.start = QDateTime::fromString(QString::fromLatin1(f[0]), Qt::ISODate);
            c.direction = f[1].toInt(&directionOk);
            c.answered = f[2] == "1";
            c.durationSeconds = f[3].toInt(&secondsOk);
            c.number = QString::fromLatin1(f[4]);
            c.ownNumber = QString::fromLatin1(f[5]);
        }
        const bool direction = directionOk && (c.direction == LoggedCall::Incoming || c.direction == LoggedCall::Outgoing);
        if (f.size() != 6 || !c.start.isValid() || !direction || !secondsOk || c.durationSeconds < 0
            || c.number.size() > kRouterMaxNumberLength || c.ownNumber.size() > kRouterMaxNumberLength) {
            ++bad;
            continue;
        }
        c.mayBeLogged = true;
        calls.append(c);
    }
    if (skipped)
        *skipped = bad;
    return calls;
}

void RouterSource::rewriteQueueFile()
{
    m_journal.close();
    bool saved = false;
    if (m_queue.isEmpty()) {
        saved = !QFileInfo::exists(m_queueFile) || QFile::remove(m_queueFile);
    } else {
        QSaveFile file(m_queueFile);
        saved = file.open(QIODevice::WriteOnly) && file.write(encodeQueue(m_queue)) >= 0 && file.commit();
    }
    queueFileWritten(saved);
}

void RouterSource::appendToQueueFile(const QByteArray& lines)
{
    if (m_queueFile.isEmpty())
        return;
    // Appended and handed to the system without a sync: that outlives the monitor's end, and
    // costs far less than the database's own commit.
    if (!m_journal.isOpen()) {
        m_journal.setFileName(m_queueFile);
        if (!m_journal.open(QIODevice::WriteOnly | QIODevice::Append)) {
            queueFileWritten(false);
            return;
        }
    }
    queueFileWritten(m_journal.write(lines) == lines.size() && m_journal.flush());
}

void RouterSource::queueFileWritten(bool saved)
{
    if (!saved && m_queueSaved)
        say(QStringLiteral("\"%1\" kann nicht geschrieben werden; die Anrufe warten nur im Speicher.")
                .arg(m_queueFile));
    m_queueSaved = saved;
}

void RouterSource::connectToRouter()
{
    m_splitter.clear();
    if (m_socket.state() != QAbstractSocket::UnconnectedState) {
        const QSignalBlocker quiet(m_socket);
        m_socket.abort();
    }
    m_connectTimeout.start(m_timing.connectTimeoutMs);
    m_socket.connectToHost(m_host, m_port);
}

void RouterSource::lineDropped(const QString& why)
{
    m_connectTimeout.stop();
    if (m_reconnect.isActive())
        return; // one failure reports several signals; one new attempt is enough
    // Calls still open stay open: a DISCONNECT after the reconnection ends them, a reused id
    // ends them without a length.
    m_splitter.clear();
    say(QStringLiteral("Keine Verbindung zum Router %1:%2 (%3); neuer Versuch in %4 s.")
                .arg(m_host)
                .arg(m_port)
                .arg(why, seconds(m_routerDelay)));
    m_reconnect.start(m_routerDelay);
    m_routerDelay = std::min(m_routerDelay * 2, m_timing.maxRetryMs);
}

void RouterSource::readLines()
{
    const QByteArray bytes = m_socket.readAll();
    const int droppedBefore = m_splitter.droppedLines();
    const QList<QByteArray> lines = m_splitter.feed(bytes);
    if (m_splitter.droppedLines() > droppedBefore)
        say(QStringLiteral("Überlange Zeile vom Router übergangen (mehr als %1 Zeichen).")
                .arg(RouterLineSplitter::DefaultMaxLineLength));
    for (const QByteArray& line : lines) {
        // The router talks, so the next failure starts again with a short pause.
        m_routerDelay = m_timing.firstRetryMs;
        if (line.trimmed().isEmpty())
            continue;
        QString reason;
        const std::optional<RouterEvent> event = parseRouterLine(line, &reason);
        if (!event) {
            say(QStringLiteral("Zeile vom Router übergangen (%1): %2")
                    .arg(reason, printable(line)));
            continue;
        }
        QStringList notes;
        const QList<RouterCall> ended = m_tracker.handle(*event, &notes);
        for (const QString& n : std::as_const(notes))
            say(n);
        for (const RouterCall& call : ended)
            enqueue(call);
    }
    writeQueued();
}

void RouterSource::enqueue(const RouterCall& call)
{
    if (m_paused) {
        say(QStringLiteral("Angehalten: Anruf von %1 nicht protokolliert.").arg(call.remoteNumber));
        return;
    }
    m_queue.append(loggedCall(call));
    appendToQueueFile(encodeQueue({m_queue.constLast()}));
}

void RouterSource::writeQueued()
{
    // A retry is pending: its timer writes the queue, in order.
    if (m_writeTimer.isActive())
        return;
    QElapsedTimer busy;
    busy.start();
    while (!m_queue.isEmpty()) {
        // A long queue is written in slices, so that the router's lines and the messages to the
        // monitor (quit, pause) are not kept waiting.
        if (busy.hasExpired(100)) {
            m_writeTimer.start(0);
            return;
        }
        if (!m_db) {
            try {
                m_db = m_connector();
            } catch (const AppException& e) {
                say(QStringLiteral("Keine Verbindung zur Datenbank: %1").arg(e.message()));
                retryDatabaseLater();
                return;
            }
        }
        int lid = 0;
        QString error;
        switch (writeCall(*m_db, m_queue.constFirst(), m_msns, lid, error)) {
        case WriteResult::Written: {
            const LoggedCall call = m_queue.takeFirst();
            if (m_queue.isEmpty())
                rewriteQueueFile(); // i.e. removed
            else
                appendToQueueFile(QByteArrayLiteral("-\n"));
            m_dbDelay = m_timing.firstRetryMs;
            say(QStringLiteral("Anruf %1 protokolliert (LID %2).")
                    .arg(call.number.isEmpty() ? QStringLiteral("ohne Nummer") : call.number)
                    .arg(lid));
            m_notifier.logChanged(lid);
            Q_EMIT callLogged(lid);
            break;
        }
        case WriteResult::LockConflict:
            m_writeTimer.start(m_timing.lockRetryMs);
            return;
        case WriteResult::Failed:
            say(QStringLiteral("Anruf konnte nicht protokolliert werden (%1 in der Warteschlange): %2")
                    .arg(m_queue.size())
                    .arg(error));
            // A server that went away leaves a dead attachment: the next attempt opens a new one.
            m_db.reset();
            // The commit may have gone through with only its answer lost.
            m_queue.first().mayBeLogged = true;
            retryDatabaseLater();
            return;
        }
    }
}

void RouterSource::retryDatabaseLater()
{
    m_writeTimer.start(m_dbDelay);
    m_dbDelay = std::min(m_dbDelay * 2, m_timing.maxRetryMs);
}

} // namespace orvanta::rufwarte
