#include "tools/rufwarte/Monitor.h"

#include "platform/MonitorLink.h"
#include "db/CredentialCipher.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "phone/AreaCodes.h"
#include "platform/AppException.h"
#include "platform/NamedMutex.h"
#include "platform/Registry.h"
#include "tools/demo/CallFactory.h"

#include <QDateTime>
#include <QFileInfo>
#include <QLocalServer>
#include <QLocalSocket>

#include <cstdio>

namespace orvanta::rufwarte {

namespace {

QString regionOf(const QString& number)
{
    QString prefix;
    QString rest;
    QString region;
    QString n = number;
    if (n.startsWith(QLatin1String("0043")) && GetAustriaAereaCodes(QStringView(n).mid(4), prefix, rest, region))
        return region;
    if (n.startsWith(QLatin1String("0041")) && GetSwissAereaCodes(QStringView(n).mid(4), prefix, rest, region))
        return region;
    if (n.startsWith(QLatin1String("0049")))
        n = QLatin1Char('0') + n.mid(4);
    if (n.startsWith(QLatin1Char('0')) && !n.startsWith(QLatin1String("00"))
        && GetGermanAereaCodes(QStringView(n).mid(1), prefix, rest, region))
        return region;
    return {};
}

void say(const QString& text)
{
    std::fputs((text + QLatin1Char('\n')).toLocal8Bit().constData(), stdout);
    std::fflush(stdout);
}

} // namespace

std::unique_ptr<FbAttachment> connectFromRegistry()
{
    Registry reg(RegistryRoot::LocalMachine);
    if (!reg.openKeyReadOnly(QStringLiteral("software\\Varnik\\rufwarte")))
        throw AppException(QStringLiteral("Der Registrierungsschlüssel der Rufwarte fehlt (%1).")
                               .arg(Registry::filePath(RegistryRoot::LocalMachine)));
    auto db = std::make_unique<FbAttachment>();
    db->attach(reg.readString(QStringLiteral("Database")), CredentialCipher::decrypt(reg.readString(QStringLiteral("Username"))),
               CredentialCipher::decrypt(reg.readString(QStringLiteral("Password"))));
    return db;
}

int insertCall(FbAttachment& db, const QString& fromPhone, const QString& onMsn)
{
    FbTransaction tx(db);
    tx.start();
    try {
        // Rows written by others (tests, imports) may have taken keys past the generator.
        FbStatement key(db, &tx,
                        QStringLiteral("SELECT GEN_ID(GEN_LOG_ID, 1), (SELECT COALESCE(MAX(LID), 0) FROM LOG) "
                                       "FROM RDB$DATABASE"));
        key.execute();
        key.next();
        int lid = key.asInt(0);
        const int highest = key.asInt(1);
        key.close();
        if (lid <= highest) {
            FbStatement skip(db, &tx, QStringLiteral("SELECT GEN_ID(GEN_LOG_ID, CAST(:STEP AS INTEGER)) FROM RDB$DATABASE"));
            skip.setParam(u"STEP", highest - lid + 1);
            skip.execute();
            skip.next();
            lid = skip.asInt(0);
            skip.close();
        }
        const QDateTime now = QDateTime::currentDateTime();
        const QTime time(now.time().hour(), now.time().minute(), now.time().second());
        FbStatement insert(db, &tx,
                           QStringLiteral("INSERT INTO LOG (LID, SERVICE, FROMPHONE, FROMBEZ, ONMSN, ONBEZ, STATUS, "
                                          "TSDATE, TSTIME, TS, CTYPE, REGION, NTYPE, NPLAN, PRESENT) VALUES (:LID, 1, "
                                          ":FP, '', :MSN, :ONBEZ, :STATUS, :D, :T, :TS, 0, :REGION, 2, 1, 0)"));
        insert.setParam(u"LID", lid);
        insert.setParam(u"FP", fromPhone);
        insert.setParam(u"MSN", onMsn);
        insert.setParam(u"ONBEZ", onMsn.isEmpty() ? QString() : QStringLiteral("Büro"));
        insert.setParam(u"STATUS", QStringLiteral("Anruf in Abwesenheit"));
        insert.setParam(u"D", now.date());
        insert.setParam(u"T", time);
        insert.setParam(u"TS", QDateTime(now.date(), time));
        const QString region = regionOf(fromPhone);
        insert.setParam(u"REGION", region.isEmpty() ? QVariant() : QVariant(region.left(35)));
        insert.execute();
        tx.commit();
        return lid;
    } catch (...) {
        tx.rollbackQuietly();
        throw;
    }
}

Monitor::Monitor()
{
    connect(&m_autoCall, &QTimer::timeout, this, [this] {
        static demo::CallFactory factory(static_cast<quint32>(QDateTime::currentSecsSinceEpoch()));
        logCall(factory.randomCaller().number, QStringLiteral("3012345670"), false);
    });
    m_socketWatch.setInterval(2000);
    connect(&m_socketWatch, &QTimer::timeout, this, &Monitor::keepSocket);
}

Monitor::~Monitor()
{
    // Only the monitor that owns the socket removes it: a refused second one leaves it alone.
    if (m_server && m_server->isListening()) {
        m_server->close();
        QLocalServer::removeServer(MonitorLink::monitorSocketPath());
    }
}

bool Monitor::isRunning()
{
    return NamedMutex::isHeld(QString::fromLatin1(MutexName))
        || MonitorLink::sendLine(MonitorLink::monitorSocketPath(), 0, 0, 0, 300);
}

bool Monitor::start(QString& error)
{
    auto instance = std::make_unique<NamedMutex>(QString::fromLatin1(MutexName));
    // The mutex dies with its holder; a socket that still answers belongs to a monitor that
    // runs without it.
    if (instance->alreadyExists() || MonitorLink::sendLine(MonitorLink::monitorSocketPath(), 0, 0, 0, 300)) {
        error = QStringLiteral("Die Rufwarte läuft bereits.");
        return false;
    }
    m_instance = std::move(instance);
    try {
        m_db = connectFromRegistry();
    } catch (const AppException& e) {
        error = QStringLiteral("Keine Verbindung zur Datenbank: ") + e.message();
        return false;
    }
    if (!listen(error))
        return false;
    m_socketWatch.start();
    say(QStringLiteral("Rufwarte läuft (%1).").arg(MonitorLink::monitorSocketPath()));
    return true;
}

bool Monitor::listen(QString& error)
{
    delete m_server;
    m_server = new QLocalServer(this);
    m_server->setSocketOptions(QLocalServer::UserAccessOption);
    const QString path = MonitorLink::monitorSocketPath();
    // Holding the mutex, any socket file here is a dead monitor's.
    QLocalServer::removeServer(path);
    if (!m_server->listen(path)) {
        error = QStringLiteral("Der Nachrichtenkanal \"%1\" kann nicht geöffnet werden.").arg(path);
        return false;
    }
    connect(m_server, &QLocalServer::newConnection, this, [this] {
        while (QLocalSocket* socket = m_server->nextPendingConnection()) {
            connect(socket, &QLocalSocket::disconnected, socket, &QObject::deleteLater);
            const auto read = [this, socket] {
                while (socket->canReadLine())
                    handleLine(socket->readLine(512).trimmed(), socket);
                if (socket->bytesAvailable() > 512)
                    socket->abort();
            };
            connect(socket, &QLocalSocket::readyRead, this, read);
            read();
        }
    });
    return true;
}

void Monitor::keepSocket()
{
    if (QFileInfo::exists(MonitorLink::monitorSocketPath()))
        return;
    QString error;
    if (!listen(error))
        say(error);
}

void Monitor::setAutoCallInterval(int seconds)
{
    if (seconds > 0)
        m_autoCall.start(seconds * 1000);
    else
        m_autoCall.stop();
}

bool Monitor::tellProgram(int message, qint64 wParam)
{
    return MonitorLink::sendLine(MonitorLink::programSocketPath(), message, wParam, 0);
}

int Monitor::logCall(const QString& fromPhone, const QString& onMsn, bool postMessage)
{
    if (m_paused) {
        say(QStringLiteral("Angehalten: Anruf von %1 nicht protokolliert.").arg(fromPhone));
        return 0;
    }
    try {
        const int lid = insertCall(*m_db, fromPhone, onMsn);
        say(QStringLiteral("Anruf von %1 protokolliert (LID %2).").arg(fromPhone).arg(lid));
        tellProgram(postMessage ? MonitorLink::MonitorLogChangedPost : MonitorLink::MonitorLogChangedSend, lid);
        return lid;
    } catch (const AppException& e) {
        say(QStringLiteral("Anruf konnte nicht protokolliert werden: ") + e.message());
        return 0;
    }
}

void Monitor::handleLine(const QByteArray& line, QLocalSocket* socket)
{
    const QList<QByteArray> parts = line.simplified().split(' ');
    if (parts.isEmpty())
        return;
    const QByteArray command = parts.first().toUpper();
    if (command == "CALL" && parts.size() >= 2) {
        const bool post = parts.size() >= 4 && parts[3] == "post";
        const int lid = logCall(QString::fromUtf8(parts[1]), parts.size() >= 3 ? QString::fromUtf8(parts[2]) : QString(), post);
        socket->write(QByteArray::number(lid) + '\n');
        return;
    }
    if (command == MonitorLink::StateQuestion) {
        socket->write(QByteArray(m_paused ? MonitorLink::StatePaused : MonitorLink::StateRunning) + '\n');
        return;
    }
    if (command == "CONTACT" && parts.size() == 2) {
        bool ok = false;
        const qint64 lid = parts[1].toLongLong(&ok);
        if (ok)
            tellProgram(MonitorLink::MonitorContactFromCall, lid);
        return;
    }
    int message = 0;
    qint64 wParam = 0;
    qint64 lParam = 0;
    if (!MonitorLink::parseLine(line, message, wParam, lParam))
        return;
    if (message == MonitorLink::MonitorQuit) {
        say(QStringLiteral("Rufwarte wird beendet."));
        Q_EMIT quitRequested();
    } else if (message == MonitorLink::MonitorPauseResume) {
        m_paused = !m_paused;
        say(m_paused ? QStringLiteral("Rufwarte angehalten.") : QStringLiteral("Rufwarte fortgesetzt."));
    }
}

} // namespace orvanta::rufwarte
