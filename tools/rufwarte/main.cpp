// rufwarte — the call-monitor stand-in, installed beside the program.
//
//   rufwarte setup [--program-folder DIR] [--database PATH] [--no-demo] [--force]
//       creates the call database (demo content unless --no-demo), the monitor's registry key
//       ($VARNIK_HKLM) and the settings files of the program folder
//   rufwarte [run] [--auto-calls SECONDS] [--router HOST[:PORT]] [--retry-ms MS]
//       runs the monitor: answers quit and pause/resume, logs calls on request; with a router
//       (the option, else the key "ROUTER" of "ISDNStore", section "MoniOptions") it logs every
//       call the router's call monitor reports (port 1012 unless given); MS is the first pause
//       before a new attempt at the router or the database (default 1000, doubling up to 30 times)
//   rufwarte call NUMBER [--msn MSN] [--post]
//       logs an incoming call now and tells the program (through the running monitor if any)
//   rufwarte contact LOGID      asks the program to make a contact of that call's caller
//   rufwarte quit | pause       sends the monitor quit (and waits for it to end) or pause/resume
//
// The registry stand-in is $VARNIK_HKLM; when that is unset, "registry.ini" in the program folder
// (the folder of this program, or --program-folder), where "setup" writes it.

#include "platform/MonitorLink.h"
#include "db/SharedEngine.h"
#include "db/FbAttachment.h"
#include "phone/AreaCodes.h"
#include "platform/AppException.h"
#include "platform/IniFile.h"
#include "platform/RufwarteIni.h"
#include "platform/NamedMutex.h"
#include "platform/ProgramFolder.h"
#include "tools/rufwarte/Monitor.h"
#include "tools/rufwarte/MonitorSetup.h"
#include "tools/rufwarte/RouterSource.h"

#include <QCommandLineParser>
#include <QCoreApplication>
#include <QDeadlineTimer>
#include <QFile>
#include <QDir>
#include <QFileInfo>
#include <QLocalSocket>
#include <QThread>

#include <algorithm>
#include <csignal>
#include <cstdio>

using namespace orvanta;

namespace {

void print(FILE* to, const QString& text)
{
    std::fputs((text + QLatin1Char('\n')).toLocal8Bit().constData(), to);
    std::fflush(to);
}

// Sends a command line to the running monitor and returns its one-line answer.
bool askMonitor(const QByteArray& command, QByteArray& answer)
{
    QLocalSocket socket;
    socket.connectToServer(MonitorLink::monitorSocketPath());
    if (!socket.waitForConnected(500))
        return false;
    socket.write(command + '\n');
    socket.waitForBytesWritten(1000);
    while (!socket.canReadLine())
        if (!socket.waitForReadyRead(10000))
            return false;
    answer = socket.readLine().trimmed();
    return true;
}

// The router named on the command line, else in the monitor's settings; empty: none.
QString routerAddress(const QString& option)
{
    if (!option.isEmpty())
        return option;
    const IniFile ini(programFolder() + QString::fromLatin1(TRufwarteIni::kSettingsFile));
    return ini.readString(QString::fromLatin1(TRufwarteIni::kSection), QStringLiteral("ROUTER")).trimmed();
}

int runMonitor(int autoCalls, const QString& router, int retryMs)
{
    QString host;
    quint16 port = 0;
    if (!router.isEmpty() && !rufwarte::RouterSource::parseAddress(router, host, port)) {
        print(stderr, QStringLiteral("Ungültige Adresse des Routers: \"%1\" (erwartet: Name oder Adresse, "
                                     "optional mit \":Port\").").arg(router));
        return 2;
    }
    LoadGermanAereaCodes();
    LoadAustriaAereaCodes();
    LoadSwissAereaCodes();
    rufwarte::Monitor monitor;
    QString error;
    if (!monitor.start(error, host.isEmpty() ? rufwarte::Monitor::DatabaseAtStart::Required
                                             : rufwarte::Monitor::DatabaseAtStart::MayFollow)) {
        print(stderr, error);
        return 1;
    }
    monitor.setAutoCallInterval(autoCalls);
    if (!host.isEmpty()) {
        rufwarte::RouterSource::Timing timing;
        if (retryMs > 0) {
            timing.firstRetryMs = retryMs;
            timing.maxRetryMs = 30 * retryMs;
            timing.lockRetryMs = std::max(retryMs / 5, 1);
        }
        monitor.watchRouter(new rufwarte::RouterSource(host, port, &rufwarte::connectFromRegistry,
                                                       rufwarte::programFolderMsns(), timing,
                                                       programFolder() + QString::fromLatin1(
                                                           rufwarte::RouterSource::QueueFileName)));
    }
    QObject::connect(&monitor, &rufwarte::Monitor::quitRequested, qApp, &QCoreApplication::quit, Qt::QueuedConnection);
    std::signal(SIGTERM, [](int) { QCoreApplication::quit(); });
    std::signal(SIGINT, [](int) { QCoreApplication::quit(); });
    return QCoreApplication::exec();
}

} // namespace

int main(int argc, char* argv[])
{
    useSharedEmbeddedEngine();
    QCoreApplication app(argc, argv);
    QCoreApplication::setApplicationName(QStringLiteral("rufwarte"));
    QCoreApplication::setApplicationVersion(QStringLiteral(ORVANTA_VERSION));

    QCommandLineParser parser;
    parser.setApplicationDescription(QStringLiteral("Rufwarte (Stellvertreter): protokolliert Anrufe für Orvanta."));
    parser.addHelpOption();
    parser.addPositionalArgument(QStringLiteral("command"), QStringLiteral("setup | run | call | contact | quit | pause"));
    const QCommandLineOption folderOpt(QStringLiteral("program-folder"), QStringLiteral("Programmverzeichnis"),
                                       QStringLiteral("dir"));
    const QCommandLineOption dbOpt(QStringLiteral("database"), QStringLiteral("Datenbank (Pfad oder Server:Pfad)"),
                                   QStringLiteral("path"));
    const QCommandLineOption noDemoOpt(QStringLiteral("no-demo"), QStringLiteral("ohne Beispieldaten"));
    const QCommandLineOption forceOpt(QStringLiteral("force"), QStringLiteral("vorhandene Datenbank ersetzen"));
    const QCommandLineOption autoOpt(QStringLiteral("auto-calls"), QStringLiteral("alle N Sekunden ein Anruf"),
                                     QStringLiteral("seconds"), QStringLiteral("0"));
    const QCommandLineOption msnOpt(QStringLiteral("msn"), QStringLiteral("angerufene Nummer"), QStringLiteral("msn"),
                                    QStringLiteral("3012345670"));
    const QCommandLineOption postOpt(QStringLiteral("post"), QStringLiteral("Nachricht einreihen statt senden"));
    const QCommandLineOption routerOpt(QStringLiteral("router"),
                                       QStringLiteral("Anrufmonitor des Routers (Host[:Port], Port 1012 ohne Angabe)"),
                                       QStringLiteral("host"));
    const QCommandLineOption retryOpt(QStringLiteral("retry-ms"),
                                      QStringLiteral("erste Pause vor einem neuen Verbindungsversuch in ms"),
                                      QStringLiteral("ms"), QStringLiteral("0"));
    for (const auto* o : {&folderOpt, &dbOpt, &noDemoOpt, &forceOpt, &autoOpt, &msnOpt, &postOpt, &routerOpt, &retryOpt})
        parser.addOption(*o);
    parser.process(app);

    const QStringList args = parser.positionalArguments();
    const QString command = args.value(0, QStringLiteral("run"));
    const QString folder = parser.isSet(folderOpt) ? QDir(parser.value(folderOpt)).absolutePath() + QLatin1Char('/')
                                                   : programFolder();
    setProgramFolder(folder);
    // An installation is one folder: the monitor finds its registry key beside itself.
    const QString besideProgram = folder + QStringLiteral("registry.ini");
    if (qEnvironmentVariableIsEmpty("VARNIK_HKLM")
        && (command == QLatin1String("setup") || QFileInfo::exists(besideProgram)))
        qputenv("VARNIK_HKLM", QFile::encodeName(besideProgram));

    if (command == QLatin1String("setup")) {
        rufwarte::SetupOptions o;
        o.programFolder = folder;
        o.database = parser.isSet(dbOpt) ? parser.value(dbOpt) : folder + QStringLiteral("orvanta.fdb");
        if (!o.database.contains(QLatin1Char(':')) && !o.database.startsWith(QLatin1Char('/')))
            o.database = QDir(o.database).absolutePath();
        o.demo = !parser.isSet(noDemoOpt);
        o.overwrite = parser.isSet(forceOpt);
        const QString error = rufwarte::setUp(o);
        if (!error.isEmpty()) {
            print(stderr, error);
            return 1;
        }
        print(stdout, QStringLiteral("Datenbank \"%1\" und Einstellungen in \"%2\" angelegt.").arg(o.database, folder));
        return 0;
    }
    if (command == QLatin1String("run"))
        return runMonitor(parser.value(autoOpt).toInt(), routerAddress(parser.value(routerOpt)),
                          parser.value(retryOpt).toInt());
    if (command == QLatin1String("call") && args.size() == 2) {
        QByteArray answer;
        const QByteArray line = "CALL " + args[1].toUtf8() + ' ' + parser.value(msnOpt).toUtf8()
            + (parser.isSet(postOpt) ? " post" : "");
        if (askMonitor(line, answer)) {
            print(stdout, QString::fromUtf8(answer));
            return answer.toInt() > 0 ? 0 : 1;
        }
        // No monitor running: log the call in this process.
        LoadGermanAereaCodes();
        LoadAustriaAereaCodes();
        LoadSwissAereaCodes();
        try {
            auto db = rufwarte::connectFromRegistry();
            const int lid = rufwarte::insertCall(*db, args[1], parser.value(msnOpt));
            rufwarte::Monitor::tellProgram(parser.isSet(postOpt) ? MonitorLink::MonitorLogChangedPost
                                                                 : MonitorLink::MonitorLogChangedSend,
                                           lid);
            print(stdout, QString::number(lid));
            return 0;
        } catch (const AppException& e) {
            print(stderr, e.message());
            return 1;
        }
    }
    if (command == QLatin1String("contact") && args.size() == 2) {
        bool ok = false;
        const qint64 lid = args[1].toLongLong(&ok);
        if (!ok || !rufwarte::Monitor::tellProgram(MonitorLink::MonitorContactFromCall, lid)) {
            print(stderr, QStringLiteral("Orvanta läuft nicht oder die Nummer ist ungültig."));
            return 1;
        }
        return 0;
    }
    if (command == QLatin1String("quit") || command == QLatin1String("pause")) {
        const bool quit = command == QLatin1String("quit");
        const int message = quit ? MonitorLink::MonitorQuit : MonitorLink::MonitorPauseResume;
        if (!MonitorLink::sendLine(MonitorLink::monitorSocketPath(), message, 0, 0)) {
            print(stderr, rufwarte::Monitor::isRunning() ? QStringLiteral("Die Rufwarte antwortet nicht.")
                                                         : QStringLiteral("Die Rufwarte läuft nicht."));
            return 1;
        }
        if (quit) {
            // Done when the monitor has ended, so that a start right after this one succeeds.
            const QDeadlineTimer deadline(10000);
            while (rufwarte::Monitor::isRunning()) {
                if (deadline.hasExpired()) {
                    print(stderr, QStringLiteral("Die Rufwarte hat sich nicht beendet."));
                    return 1;
                }
                QThread::msleep(50);
            }
        }
        return 0;
    }
    print(stderr, parser.helpText());
    return 2;
}
