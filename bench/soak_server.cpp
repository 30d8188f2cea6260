// Load and faults on a real Firebird server (not a timed benchmark): the monitor `rufwarte`
// writes calls at a steady rate through the server while the program, offscreen in this process,
// refreshes its log list on every log-changed message, deletes a day, relinks a number and saves
// remarks, and a second desk changes the same rows from its own attachment. Then the monitor and
// the server are killed in the middle of writing and the server restarted: the database must
// validate clean and every call the monitor reported written must be there.
//
//   soak_server [--seconds N] [--rate CALLS_PER_SECOND] [--quiet N] [--dir FOLDER]
//
// Defaults: 60 s at 100 calls per second, then 10 s without calls before memory is read again.

#include "bench/BenchSupport.h"
#include "calllog/LogMaintenance.h"
#include "calllog/TLogDetailForm.h"
#include "calllog/Tlogframe.h"
#include "db/DatabaseError.h"
#include "db/StoredConnection.h"
#include "db/TransactionWork.h"
#include "platform/ErrorLog.h"
#include "platform/MonitorLink.h"
#include "platform/WindowMessages.h"
#include "tests/support/FirebirdServer.h"
#include "tests/support/ScriptedDialogService.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QLineEdit>
#include <QLocalSocket>
#include <QProcess>
#include <QSet>
#include <QThread>
#include <QTimer>

#include <algorithm>
#include <atomic>
#include <csignal>
#include <cstdio>
#include <thread>

using namespace orvanta;
using namespace orvanta::bench;
using orvanta::test::FirebirdServer;

namespace {

struct Options {
    int seconds = 60;
    int rate = 100;
    int quiet = 10;
    QString folder;
};

std::optional<Options> parse(const QStringList& args)
{
    Options o;
    for (qsizetype i = 1; i < args.size(); ++i) {
        bool ok = i + 1 < args.size();
        const QString& a = args[i];
        if (ok && a == QLatin1String("--seconds"))
            o.seconds = args[++i].toInt(&ok);
        else if (ok && a == QLatin1String("--rate"))
            o.rate = args[++i].toInt(&ok);
        else if (ok && a == QLatin1String("--quiet"))
            o.quiet = args[++i].toInt(&ok);
        else if (ok && a == QLatin1String("--dir"))
            o.folder = args[++i];
        else
            ok = false;
        if (!ok || o.seconds < 1 || o.rate < 1 || o.quiet < 0) {
            std::fprintf(stderr, "usage: soak_server [--seconds N] [--rate CALLS_PER_SECOND] [--quiet N] [--dir FOLDER]\n");
            return std::nullopt;
        }
    }
    return o;
}

void say(const QString& text)
{
    std::printf("%s\n", text.toLocal8Bit().constData());
    std::fflush(stdout);
}

// The numbers the calls come from: a few recur, so relinking one touches many rows.
QString callerNumber(qint64 n)
{
    return n % 5 == 0 ? QStringLiteral("0301234567") : QStringLiteral("089%1").arg(1000000 + n % 997);
}

// The main window's part: a log-changed message re-reads the list. Messages that are already
// queued behind it are taken in by the same re-read (the last one's call focused): one re-read
// per message could not keep up with a hundred calls a second on a growing log.
class Host final : public QObject {
public:
    explicit Host(Tlogframe& frame)
        : m_frame(frame)
    {
    }
    int messages = 0;
    int refreshes = 0;
    qint64 longestNs = 0;
    qint64 totalNs = 0;

    void refresh(int lid)
    {
        QElapsedTimer t;
        t.start();
        m_frame.Refresh_View(lid);
        const qint64 ns = t.nsecsElapsed();
        ++refreshes;
        totalNs += ns;
        longestNs = std::max(longestNs, ns);
    }

protected:
    void customEvent(QEvent* event) override
    {
        WindowMessageEvent* m = asWindowMessage(event);
        if (!m || (m->message() != WMLOGINFOCHANGE && m->message() != WMUPDATEVOICEBOXGRID))
            return;
        ++messages;
        m_lid = static_cast<int>(m->wParam());
        if (m_scheduled)
            return;
        m_scheduled = true;
        QMetaObject::invokeMethod(
            this,
            [this] {
                m_scheduled = false;
                refresh(m_lid);
            },
            Qt::QueuedConnection);
    }

private:
    Tlogframe& m_frame;
    bool m_scheduled = false;
    int m_lid = 0;
};

// Sends "CALL number msn" lines to the running monitor at the rate and collects the log ids it
// answers with: an id is a call the monitor has committed.
class CallWriter final {
public:
    explicit CallWriter(int rate)
        : m_rate(rate)
    {
        QObject::connect(&m_socket, &QLocalSocket::readyRead, [this] {
            while (m_socket.canReadLine()) {
                const int lid = m_socket.readLine().trimmed().toInt();
                if (lid > 0)
                    written.insert(lid);
                else
                    ++refused;
            }
        });
        QObject::connect(&m_tick, &QTimer::timeout, [this] { send(); });
    }
    bool start()
    {
        m_socket.connectToServer(MonitorLink::monitorSocketPath());
        if (!m_socket.waitForConnected(5000))
            return false;
        m_clock.start();
        m_base = sent;
        m_tick.start(5);
        return true;
    }
    void stop() { m_tick.stop(); }
    [[nodiscard]] qint64 outstanding() const { return sent - written.size() - refused; }

    QSet<int> written;
    qint64 sent = 0;
    qint64 refused = 0;

private:
    void send()
    {
        const qint64 due = m_base + m_clock.elapsed() * m_rate / 1000;
        QByteArray lines;
        for (; sent < due; ++sent)
            lines += "CALL " + callerNumber(sent).toLatin1() + " 3012345670 post\n";
        if (!lines.isEmpty())
            m_socket.write(lines);
    }

    int m_rate;
    QLocalSocket m_socket;
    QTimer m_tick;
    QElapsedTimer m_clock;
    qint64 m_base = 0;
};

// Another desk on its own attachment: changes the rows the program relinks and remarks and
// holds them a moment before committing, so the program's writes meet its locks.
class SecondDesk final {
public:
    SecondDesk(QString database, QString password)
        : m_database(std::move(database))
        , m_password(std::move(password))
    {
    }
    ~SecondDesk() { stop(); }
    void start()
    {
        m_thread = std::thread([this] { run(); });
    }
    void stop()
    {
        m_stop = true;
        if (m_thread.joinable())
            m_thread.join();
    }
    std::atomic<int> target{0}; // the log id the program remarks next
    std::atomic<int> commits{0};
    std::atomic<int> conflicts{0};
    std::atomic<int> failures{0};

private:
    void run()
    {
        try {
            FbAttachment db;
            db.attach(m_database, QStringLiteral("SYSDBA"), m_password);
            int round = 0;
            while (!m_stop) {
                FbTransaction tx(db);
                try {
                    tx.start();
                    FbStatement st(db, &tx,
                                   round++ % 2 ? QStringLiteral("UPDATE LOG SET BEMERK = 'Platz 2' WHERE LID = :ID")
                                               : QStringLiteral("UPDATE LOG SET B1 = 1 WHERE FROMPHONE = '0301234567'"));
                    if (round % 2 == 0)
                        st.setParam(u"ID", target.load());
                    st.execute();
                    std::this_thread::sleep_for(std::chrono::milliseconds(40));
                    tx.commit();
                    ++commits;
                } catch (const DatabaseError& e) {
                    tx.rollbackQuietly();
                    ++(e.isLockConflict() ? conflicts : failures);
                }
                std::this_thread::sleep_for(std::chrono::milliseconds(60));
            }
        } catch (const std::exception&) {
            ++failures;
        }
    }

    QString m_database;
    QString m_password;
    std::atomic<bool> m_stop{false};
    std::thread m_thread;
};

void runEventsFor(int ms)
{
    QElapsedTimer t;
    t.start();
    while (t.elapsed() < ms)
        QCoreApplication::processEvents(QEventLoop::AllEvents, 20);
}

QStringList errorLogEntries(const QString& path)
{
    QFile f(path);
    if (!f.open(QIODevice::ReadOnly))
        return {};
    QStringList entries;
    for (const QByteArray& entry : f.readAll().split('\n'))
        if (entry.startsWith('#'))
            entries << QString::fromLatin1(entry.trimmed());
    return entries;
}

QSet<int> logIds(const QString& database, const QString& password)
{
    FbAttachment db;
    db.attach(database, QStringLiteral("SYSDBA"), password);
    FbTransaction tx(db);
    tx.start();
    FbStatement st(db, &tx, QStringLiteral("SELECT LID FROM LOG"));
    st.execute();
    QSet<int> ids;
    while (st.next())
        ids.insert(st.asInt(0));
    tx.commit();
    return ids;
}

qint64 missingFrom(const QSet<int>& written, const QSet<int>& stored)
{
    qint64 missing = 0;
    for (int lid : written)
        missing += stored.contains(lid) ? 0 : 1;
    return missing;
}

std::unique_ptr<QProcess> startMonitor()
{
    auto monitor = std::make_unique<QProcess>();
    monitor->setProcessChannelMode(QProcess::ForwardedErrorChannel);
    monitor->setStandardOutputFile(QProcess::nullDevice());
    monitor->start(QCoreApplication::applicationDirPath() + QStringLiteral("/rufwarte"), {QStringLiteral("run")});
    if (!monitor->waitForStarted(5000))
        return nullptr;
    QElapsedTimer t;
    t.start();
    while (!MonitorLink::sendLine(MonitorLink::monitorSocketPath(), 0, 0, 0, 300)) {
        if (t.elapsed() > 20000 || monitor->state() != QProcess::Running)
            return nullptr;
        QThread::msleep(50);
    }
    return monitor;
}

} // namespace

int main(int argc, char* argv[])
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    const std::optional<Options> options = parse(app.arguments());
    if (!options)
        return 2;
    if (const QString why = FirebirdServer::unavailableReason(); !why.isEmpty()) {
        std::fprintf(stderr, "%s\n", qPrintable(why));
        return 1;
    }
    const std::unique_ptr<QTemporaryDir> temp = benchProgramFolder(options->folder, "soak_server");
    if (!temp)
        return 1;
    qputenv("XDG_RUNTIME_DIR", temp->path().toLocal8Bit());
    TvkErrorLog errorLog(temp->path(), 20, QStringLiteral("OXError.log"));
    setErrorLog(&errorLog);
    test::ScopedScriptedDialogs dialogs;

    FirebirdServer server;
    if (!server.start()) {
        std::fprintf(stderr, "%s\n", qPrintable(server.error()));
        return 1;
    }
    const QString file = server.newDatabase(QStringLiteral("soak.fdb"));
    const QString database = server.databaseName(file);
    say(QStringLiteral("server: Firebird on 127.0.0.1:%1, database %2").arg(server.port()).arg(database));

    // Earlier days of calls, for the deletions.
    constexpr int kSeedDays = 120;
    const QDate today = QDate::currentDate();
    {
        FbAttachment db;
        db.attach(database, QStringLiteral("SYSDBA"), server.password());
        FbTransaction tx(db);
        tx.start();
        FbStatement st(db, &tx,
                       QStringLiteral("INSERT INTO LOG (LID, FROMPHONE, TSDATE, TSTIME, CTYPE, SERVICE, STATUS) VALUES "
                                      "(:LID, :FP, :D, '10:00:00', 0, 1, 'angenommen')"));
        for (int i = 0; i < kSeedDays * 20; ++i) {
            st.setParam(u"LID", 1000000 + i);
            st.setParam(u"FP", callerNumber(i));
            st.setParam(u"D", today.addDays(-1 - i / 20));
            st.execute();
        }
        tx.commit();
    }
    if (!StoredConnection{database, QStringLiteral("SYSDBA"), server.password()}.write()) {
        std::fprintf(stderr, "cannot write the registry stand-in\n");
        return 1;
    }

    auto dm = std::make_unique<TDM2>();
    if (!dm->DBConnect()) {
        std::fprintf(stderr, "the program cannot connect\n");
        return 1;
    }
    auto frame = std::make_unique<Tlogframe>(dm.get());
    frame->resize(1000, 700);
    frame->show();
    Host host(*frame);
    frame->Firstep(&host);
    MonitorLink link;
    if (!link.startListening(&host)) {
        std::fprintf(stderr, "the program cannot listen for the monitor\n");
        return 1;
    }
    LogMaintenance maintenance(dm.get());

    std::unique_ptr<QProcess> monitor = startMonitor();
    if (!monitor) {
        std::fprintf(stderr, "rufwarte does not start\n");
        return 1;
    }
    SecondDesk desk(database, server.password());
    desk.start();

    // The user's work, a step every quarter second in turn: a remark, a relinking, a day deleted.
    int remarks = 0;
    int relinks = 0;
    int deletions = 0;
    int failedSteps = 0;
    int step = 0;
    CallWriter writer(options->rate);
    QTimer user;
    QObject::connect(&user, &QTimer::timeout, [&] {
        switch (step++ % 3) {
        case 0: {
            if (writer.written.isEmpty())
                return;
            const int lid = *std::max_element(writer.written.cbegin(), writer.written.cend());
            desk.target = lid;
            TLogDetailForm form(dm.get(), lid);
            form.setHostWindow(&host);
            form.findChild<QLineEdit*>(QStringLiteral("RzE1"))->setText(QStringLiteral("Rückruf %1").arg(step));
            form.SetBemerkung() ? ++remarks : ++failedSteps;
            break;
        }
        case 1:
            maintenance.LogbuchAnpassen(QStringLiteral("0301234567"), QStringLiteral("Büro"), 7,
                                        QStringLiteral("Muster GmbH"))
                ? ++relinks
                : ++failedSteps;
            break;
        default:
            maintenance.DeleteLogDay(today.addDays(-1 - deletions), &host) ? ++deletions : ++failedSteps;
            break;
        }
    });

    const qint64 rssStart = residentKiB();
    if (!writer.start()) {
        std::fprintf(stderr, "cannot reach the monitor\n");
        return 1;
    }
    user.start(250);
    QElapsedTimer clock;
    clock.start();
    runEventsFor(options->seconds * 1000);
    writer.stop();
    // The monitor's last answers.
    QElapsedTimer drain;
    drain.start();
    while (writer.outstanding() > 0 && drain.elapsed() < 30000)
        runEventsFor(50);
    const double writeSeconds = double(clock.elapsed()) / 1000.0;
    runEventsFor(500);
    const qint64 rssEndOfWriting = residentKiB();
    const int refreshesWhileWriting = host.refreshes;
    // Quiet: no calls; the user goes on and the list is re-read every second.
    QTimer quietRefresh;
    QObject::connect(&quietRefresh, &QTimer::timeout, [&] { host.refresh(0); });
    quietRefresh.start(1000);
    runEventsFor(options->quiet * 1000);
    quietRefresh.stop();
    user.stop();
    desk.stop();
    const qint64 rssQuiet = residentKiB();

    const QSet<int> stored = logIds(database, server.password());
    const qint64 missing = missingFrom(writer.written, stored);
    const int dialogErrors = dialogs->count();
    say(QStringLiteral("writing: %1 s at %2 calls/s").arg(writeSeconds, 0, 'f', 1).arg(options->rate));
    say(QStringLiteral("calls sent %1, written (acknowledged by rufwarte) %2, refused %3, unanswered %4")
            .arg(writer.sent)
            .arg(writer.written.size())
            .arg(writer.refused)
            .arg(writer.outstanding()));
    say(QStringLiteral("calls in LOG %1 of %2 written, missing %3")
            .arg(writer.written.size() - missing)
            .arg(writer.written.size())
            .arg(missing));
    say(QStringLiteral("log-changed messages %1, refreshes %2 (%3 while writing), longest refresh %4 ms, mean %5 ms")
            .arg(host.messages)
            .arg(host.refreshes)
            .arg(refreshesWhileWriting)
            .arg(double(host.longestNs) / 1e6, 0, 'f', 1)
            .arg(host.refreshes ? double(host.totalNs) / 1e6 / host.refreshes : 0.0, 0, 'f', 1));
    say(QStringLiteral("user steps: remarks %1, relinks %2, days deleted %3, failed %4")
            .arg(remarks)
            .arg(relinks)
            .arg(deletions)
            .arg(failedSteps));
    say(QStringLiteral("second desk: commits %1, its own lock conflicts %2, other failures %3")
            .arg(desk.commits.load())
            .arg(desk.conflicts.load())
            .arg(desk.failures.load()));
    const QStringList logged = errorLogEntries(errorLog.filePath());
    say(QStringLiteral("errors: dialogs %1, error log entries %2; writes run again after a lock conflict: %3")
            .arg(dialogErrors)
            .arg(logged.size())
            .arg(detail::lockConflictRetries()));
    for (const QString& entry : logged)
        say(QStringLiteral("  logged: ") + entry);
    for (const QString& text : dialogs->texts())
        say(QStringLiteral("  dialog: ") + QString(text).replace(QStringLiteral("\r\n"), QStringLiteral(" | ")));
    say(QStringLiteral("memory (RSS): %1 MiB at start, %2 MiB at the end of writing, %3 MiB after %4 s quiet")
            .arg(double(rssStart) / 1024.0, 0, 'f', 1)
            .arg(double(rssEndOfWriting) / 1024.0, 0, 'f', 1)
            .arg(double(rssQuiet) / 1024.0, 0, 'f', 1)
            .arg(options->quiet));

    // Faults: the monitor and the server killed while calls are being written.
    CallWriter burst(options->rate);
    if (!burst.start()) {
        std::fprintf(stderr, "cannot reach the monitor\n");
        return 1;
    }
    runEventsFor(3000);
    ::kill(static_cast<pid_t>(monitor->processId()), SIGKILL);
    server.kill();
    burst.stop();
    monitor->waitForFinished(5000);
    runEventsFor(200);
    const int dialogsBefore = dialogs->count();
    const bool programConnected = dm->DBConnect();
    say(QStringLiteral("killed rufwarte and the server after %1 acknowledged calls (%2 unanswered); the program "
                       "still runs, connected: %3, says: %4")
            .arg(burst.written.size())
            .arg(burst.outstanding())
            .arg(programConnected ? QStringLiteral("yes") : QStringLiteral("no"))
            .arg(dialogs->count() > dialogsBefore ? QString(dialogs->last().text).replace(QStringLiteral("\r\n"), QStringLiteral(" | "))
                                                  : QStringLiteral("nothing")));
    host.refresh(0); // a refresh on the dead connection: logged, no crash
    if (!server.start()) {
        std::fprintf(stderr, "the server does not start again: %s\n", qPrintable(server.error()));
        return 1;
    }
    QByteArray validation;
    const int gfix = server.runTool(QStringLiteral("gfix"),
                                    {QStringLiteral("-v"), QStringLiteral("-full"), QStringLiteral("-user"),
                                     QStringLiteral("SYSDBA"), QStringLiteral("-password"), server.password(), database},
                                    &validation);
    say(QStringLiteral("gfix -v -full: exit %1, %2").arg(gfix).arg(validation.trimmed().isEmpty()
                                                                     ? QStringLiteral("no findings")
                                                                     : QString::fromLocal8Bit(validation.trimmed())));
    QSet<int> all = writer.written;
    all.unite(burst.written);
    const QSet<int> after = logIds(database, server.password());
    const qint64 lost = missingFrom(all, after);
    say(QStringLiteral("after restart: %1 of %2 acknowledged calls in LOG, lost %3").arg(all.size() - lost).arg(all.size()).arg(lost));

    // A server that never answers: the connect gives up after its time-out.
    {
        test::SilentListener silent;
        if (!StoredConnection{QStringLiteral("127.0.0.1/%1:%2").arg(silent.port()).arg(file), QStringLiteral("SYSDBA"),
                              server.password()}
                 .write())
            return 1;
        QElapsedTimer t;
        t.start();
        TDM2 hanging;
        say(QStringLiteral("silent server: connected %1, gave up after %2 s")
                .arg(hanging.IBDatabase1.isConnected() ? QStringLiteral("yes") : QStringLiteral("no"))
                .arg(double(t.elapsed()) / 1000.0, 0, 'f', 1));
    }

    link.stopListening();
    frame.reset();
    dm.reset();
    setErrorLog(nullptr);
    const bool ok = missing == 0 && lost == 0 && gfix == 0 && validation.trimmed().isEmpty() && dialogErrors == 0;
    say(ok ? QStringLiteral("result: pass") : QStringLiteral("result: FAIL"));
    return ok ? 0 : 1;
}
