#include "tools/rufwarte/Monitor.h"

#include "platform/MonitorLink.h"
#include "db/CredentialCipher.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/DatabaseError.h"
#include "db/FbTransaction.h"
#include "db/TransactionWork.h"
#include "phone/AreaCodes.h"
#include "platform/AppException.h"
#include "platform/NamedMutex.h"
#include "platform/Registry.h"
#include "tools/demo/CallFactory.h"
#include "tools/rufwarte/RouterSource.h"

#include <QDateTime>
#include <QFileInfo>
#include <QLocalServer>
#include <QLocalSocket>
#include <QThread>

#include <cstdio>

namespace orvanta::rufwarte {

namespace {

QString regionOf(const QString& number)
{
    QString prefix;
    QString rest;
    QString region;
    QString n = number;
    if (n.startsWith(QLatin1Char('+')))
        n = QLatin1String("00") + n.mid(1);
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

} // namespace

void say(const QString& text)
{
    std::fputs((text + QLatin1Char('\n')).toLocal8Bit().constData(), stdout);
    std::fflush(stdout);
}

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

namespace {

// Rows written by others (tests, imports) may have taken keys past the generator.
int nextLogKey(FbAttachment& db, FbTransaction& tx)
{
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
    return lid;
}

// Routers often report the own number with the area code in front of the MSN, or the MSN alone.
QString msnName(const QList<MsnRecord>& msns, const QString& ownNumber)
{
    if (ownNumber.isEmpty())
        return {};
    for (const MsnRecord& r : msns)
        if (r.MSN == ownNumber)
            return r.Bezeichnung;
    for (const MsnRecord& r : msns) {
        if (r.MSN.size() >= 3 && (ownNumber.endsWith(r.MSN) || r.MSN.endsWith(ownNumber)))
            return r.Bezeichnung;
    }
    return {};
}

QString statusText(const LoggedCall& call)
{
    if (call.answered)
        return QStringLiteral("Verbunden");
    return call.direction == LoggedCall::Outgoing ? QStringLiteral("Keine Antwort")
                                                  : QStringLiteral("Anruf in Abwesenheit");
}

} // namespace

QList<MsnRecord> programFolderMsns()
{
    TRufwarteIni ini;
    ini.SetProgramFolderFiles();
    return ini.MSNs();
}

WriteResult writeCall(FbAttachment& db, const LoggedCall& call, const QList<MsnRecord>& msns, int& lid, QString& error)
{
    // "nowait": a conflicting writer is reported at once and the caller tries again, instead of
    // the monitor hanging behind a user's open transaction.
    FbTransaction tx(db, {QStringLiteral("read_committed"), QStringLiteral("rec_version"), QStringLiteral("nowait"),
                          QStringLiteral("write")},
                     FbTransaction::EndAction::Rollback);
    bool lockConflict = false;
    error.clear();
    const bool written = runInTransaction(
        tx, u"# Rufwarte - Anruf protokollieren",
        [&] {
            try {
                const bool withheld = call.number.isEmpty();
                const QString number = withheld ? QString::fromUtf8("Nummer unterdrückt") : call.number;
                const QDateTime start = call.start.isValid() ? call.start : QDateTime::currentDateTime();
                const QTime time(start.time().hour(), start.time().minute(), start.time().second());
                const QTime talkTime = QTime(0, 0).addSecs(qBound(0, call.durationSeconds, 86399));
                if (call.mayBeLogged) {
                    FbStatement same(db, &tx,
                                     QStringLiteral("SELECT FIRST 1 LID FROM LOG WHERE TS = :TS AND CTYPE = :CTYPE "
                                                    "AND CTIME = :CTIME AND FROMPHONE = :FP AND ONMSN = :MSN"));
                    same.setParam(u"TS", QDateTime(start.date(), time));
                    same.setParam(u"CTYPE", call.direction);
                    same.setParam(u"CTIME", talkTime);
                    same.setParam(u"FP", number.left(25));
                    same.setParam(u"MSN", call.ownNumber.left(25));
                    same.execute();
                    if (same.next()) {
                        lid = same.asInt(0);
                        return;
                    }
                    same.close();
                }
                QString callerText = number;
                QString numberLabel;
                int contact = 0;
                if (!withheld) {
                    FbStatement who(db, &tx, QStringLiteral("EXECUTE PROCEDURE P_SELECT_LOG_CONTACT(:PHONENR)"));
                    who.setParam(u"PHONENR", call.number);
                    who.execute();
                    contact = who.asInt(3);
                    if (contact > 0) {
                        numberLabel = who.asString(1);
                        callerText = who.asString(2);
                    }
                    who.close();
                }
                lid = nextLogKey(db, tx);
                FbStatement insert(
                    db, &tx,
                    QStringLiteral("INSERT INTO LOG (LID, SERVICE, FROMPHONE, FROMBEZ, ONMSN, ONBEZ, STATUS, TSDATE, "
                                   "TSTIME, TS, CID, CTYPE, CTIME, REGION, FROMANSCHLUSS, NTYPE, NPLAN, PRESENT) "
                                   "VALUES (:LID, 1, :FP, :FB, :MSN, :ONBEZ, :STATUS, :D, :T, :TS, :CID, :CTYPE, "
                                   ":CTIME, :REGION, :FA, :NTYPE, 1, :PRESENT)"));
                insert.setParam(u"LID", lid);
                insert.setParam(u"FP", number.left(25));
                insert.setParam(u"FB", callerText.left(80));
                insert.setParam(u"MSN", call.ownNumber.left(25));
                const QString onBez = msnName(msns, call.ownNumber);
                insert.setParam(u"ONBEZ", onBez.isEmpty() ? QVariant() : QVariant(onBez.left(30)));
                insert.setParam(u"STATUS", statusText(call));
                insert.setParam(u"D", start.date());
                insert.setParam(u"T", time);
                insert.setParam(u"TS", QDateTime(start.date(), time));
                insert.setParam(u"CID", contact > 0 ? contact : 0);
                insert.setParam(u"CTYPE", call.direction);
                // The column holds a time of day: a call of a day or more shows as 23:59:59.
                insert.setParam(u"CTIME", talkTime);
                const QString region = withheld ? QString() : regionOf(call.number);
                insert.setParam(u"REGION", region.isEmpty() ? QVariant() : QVariant(region.left(35)));
                insert.setParam(u"FA", numberLabel.isEmpty() ? QVariant() : QVariant(numberLabel.left(30)));
                insert.setParam(u"NTYPE", withheld ? 0 : 2);
                insert.setParam(u"PRESENT", withheld ? 1 : 0);
                insert.execute();
            } catch (const AppException& e) {
                const auto* dbError = dynamic_cast<const DatabaseError*>(&e);
                // A key taken by a writer that has not committed yet shows as a key violation:
                // the next attempt draws a new key.
                lockConflict = dbError
                    && (dbError->isLockConflict() || dbError->hasCode(DatabaseError::PrimaryOrUniqueViolation)
                        || dbError->hasCode(DatabaseError::UniqueKeyViolation));
                error = e.message();
                throw;
            }
        },
        ErrorReport::Log);
    if (written)
        return WriteResult::Written;
    if (error.isEmpty())
        error = QStringLiteral("Die Datenbank hat den Anruf nicht angenommen.");
    return lockConflict ? WriteResult::LockConflict : WriteResult::Failed;
}

int insertCall(FbAttachment& db, const QString& fromPhone, const QString& onMsn)
{
    LoggedCall call;
    call.number = fromPhone;
    call.ownNumber = onMsn;
    call.start = QDateTime::currentDateTime();
    const QList<MsnRecord> msns = programFolderMsns();
    int lid = 0;
    QString error;
    // A conflict with another writer passes; a few quick attempts ride it out.
    for (int attempt = 0; attempt < 5; ++attempt) {
        const WriteResult result = writeCall(db, call, msns, lid, error);
        if (result == WriteResult::Written)
            return lid;
        if (result == WriteResult::Failed)
            break;
        QThread::msleep(50);
    }
    throw AppException(error);
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

bool Monitor::start(QString& error, DatabaseAtStart database)
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
        if (database == DatabaseAtStart::Required)
            return false;
        // Calls from a router wait for the database; the next call tries again.
        say(error);
        error.clear();
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

void Monitor::watchRouter(RouterSource* source)
{
    m_router = source;
    source->setParent(this);
    source->setPaused(m_paused);
    source->start();
}

int Monitor::logCall(const QString& fromPhone, const QString& onMsn, bool postMessage)
{
    if (m_paused) {
        say(QStringLiteral("Angehalten: Anruf von %1 nicht protokolliert.").arg(fromPhone));
        return 0;
    }
    try {
        if (!m_db)
            m_db = connectFromRegistry();
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
        if (m_router)
            m_router->setPaused(m_paused);
        say(m_paused ? QStringLiteral("Rufwarte angehalten.") : QStringLiteral("Rufwarte fortgesetzt."));
    }
}

} // namespace orvanta::rufwarte
