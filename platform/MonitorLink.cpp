#include "platform/MonitorLink.h"

#include "platform/ContactSwitch.h"
#include "platform/RuntimeFolder.h"
#include "platform/WindowMessages.h"

#include <QDir>
#include <QFileInfo>
#include <QLocalServer>
#include <QLocalSocket>

namespace orvanta {

namespace {

// A peer that never ends its line does not get to fill the memory.
constexpr qint64 kMaxLine = 256;

} // namespace

MonitorLink::MonitorLink(QObject* parent)
    : QObject(parent)
{
}

MonitorLink::~MonitorLink()
{
    stopListening();
}

QString MonitorLink::runtimeFolder()
{
    return userRuntimeFolder();
}

QString MonitorLink::programSocketPath()
{
    return runtimeFolder() + QStringLiteral("/Varnik Orvanta.msg");
}

QString MonitorLink::monitorSocketPath()
{
    return runtimeFolder() + QStringLiteral("/Varnik Rufwarte.msg");
}

bool MonitorLink::startListening(QObject* target)
{
    stopListening();
    m_target = target;
    m_server = new QLocalServer(this);
    m_server->setSocketOptions(QLocalServer::UserAccessOption);
    const QString path = programSocketPath();
    // The single-instance rule makes a socket file left here a stale one from a crashed run.
    QLocalServer::removeServer(path);
    if (!m_server->listen(path)) {
        delete m_server;
        m_server = nullptr;
        return false;
    }
    connect(m_server, &QLocalServer::newConnection, this, [this] {
        while (QLocalSocket* socket = m_server->nextPendingConnection()) {
            connect(socket, &QLocalSocket::readyRead, this, [this, socket] { readClient(socket); });
            connect(socket, &QLocalSocket::disconnected, socket, &QObject::deleteLater);
            readClient(socket);
        }
    });
    return true;
}

void MonitorLink::stopListening()
{
    if (m_server) {
        m_server->close();
        delete m_server;
        m_server = nullptr;
    }
}

bool MonitorLink::isListening() const
{
    return m_server && m_server->isListening();
}

void MonitorLink::readClient(QLocalSocket* socket)
{
    while (socket->canReadLine()) {
        const QByteArray line = socket->readLine(kMaxLine);
        int message = 0;
        qint64 wParam = 0;
        qint64 lParam = 0;
        if (parseLine(line, message, wParam, lParam) && m_target)
            filterMessage(m_target, message, wParam, lParam);
    }
    if (socket->bytesAvailable() > kMaxLine)
        socket->abort();
}

bool MonitorLink::parseLine(QByteArrayView line, int& message, qint64& wParam, qint64& lParam)
{
    const QList<QByteArray> parts = line.toByteArray().simplified().split(' ');
    if (parts.size() != 3)
        return false;
    bool ok1 = false;
    bool ok2 = false;
    bool ok3 = false;
    const int m = parts[0].toInt(&ok1);
    const qint64 w = parts[1].toLongLong(&ok2);
    const qint64 l = parts[2].toLongLong(&ok3);
    if (!ok1 || !ok2 || !ok3)
        return false;
    message = m;
    wParam = w;
    lParam = l;
    return true;
}

bool MonitorLink::filterMessage(QObject* target, int message, qint64 wParam, qint64 lParam)
{
    Q_UNUSED(lParam);
    switch (message) {
    case MonitorLogChangedSend:
        sendMessage(target, WMLOGINFOCHANGE, wParam, 0);
        return true;
    case MonitorLogChangedPost:
        postMessage(target, WMLOGINFOCHANGE, wParam, 0);
        return true;
    case MonitorIgnored:
        return true;
    case MonitorContactFromCall:
        postMessage(target, WMCONTACTDATAFROMSCREEN, wParam, 0);
        return true;
    case WMBRINGTOFRONT:
        postMessage(target, WMBRINGTOFRONT, 0, 0);
        return true;
    default:
        return false;
    }
}

bool MonitorLink::handToRunningProgram(const QStringList& parameters, int timeoutMs)
{
    QByteArray lines = QByteArray::number(WMBRINGTOFRONT) + " 0 0\n";
    // A bad value is the first instance's to report at its own start, not a second one's.
    if (const ContactSwitch co = readContactSwitch(parameters); co.valid && co.logId > 0)
        lines += QByteArray::number(MonitorContactFromCall) + ' ' + QByteArray::number(co.logId) + " 0\n";
    return writeLines(programSocketPath(), lines, timeoutMs);
}

bool MonitorLink::sendLine(const QString& socketPath, int message, qint64 wParam, qint64 lParam, int timeoutMs)
{
    const QByteArray line =
        QByteArray::number(message) + ' ' + QByteArray::number(wParam) + ' ' + QByteArray::number(lParam) + '\n';
    return writeLines(socketPath, line, timeoutMs);
}

bool MonitorLink::writeLines(const QString& socketPath, const QByteArray& lines, int timeoutMs)
{
    if (!QFileInfo::exists(socketPath))
        return false;
    QLocalSocket socket;
    socket.connectToServer(socketPath);
    if (!socket.waitForConnected(timeoutMs))
        return false;
    socket.write(lines);
    const bool written = socket.waitForBytesWritten(timeoutMs) || socket.bytesToWrite() == 0;
    socket.disconnectFromServer();
    if (socket.state() != QLocalSocket::UnconnectedState)
        socket.waitForDisconnected(timeoutMs);
    return written;
}

bool MonitorLink::monitorWindowExists() const
{
    const QString path = monitorSocketPath();
    if (!QFileInfo::exists(path))
        return false;
    QLocalSocket socket;
    socket.connectToServer(path);
    const bool ok = socket.waitForConnected(200);
    if (ok)
        socket.disconnectFromServer();
    return ok;
}

MonitorState MonitorLink::monitorState() const
{
    const QString path = monitorSocketPath();
    if (!QFileInfo::exists(path))
        return MonitorState::Absent;
    QLocalSocket socket;
    socket.connectToServer(path);
    if (!socket.waitForConnected(200))
        return MonitorState::Absent;
    socket.write(QByteArray(StateQuestion) + '\n');
    socket.waitForBytesWritten(200);
    while (!socket.canReadLine()) {
        if (!socket.waitForReadyRead(300))
            break;
    }
    const QByteArray answer = socket.canReadLine() ? socket.readLine(kMaxLine).trimmed() : QByteArray();
    socket.disconnectFromServer();
    // A monitor that accepts but does not say otherwise is taken as running.
    return answer == StatePaused ? MonitorState::Paused : MonitorState::Running;
}

bool MonitorLink::postToMonitor(int message) const
{
    return sendLine(monitorSocketPath(), message, 0, 0);
}

} // namespace orvanta
