// Load and faults on a real Firebird server (not a timed benchmark): the monitor `rufwarte`
// takes calls from a fake router at a steady rate and writes them through the server while the program, offscreen in this process,
// refreshes its log list on every log-changed message, deletes a day, relinks a number and saves
// remarks, and a second desk changes the same rows from its own attachment. Then the monitor and
// the server are killed in the middle of writing and the server restarted: the database must
// validate clean and, once the monitor runs again, every call the router finished must be there.
//
//   soak_server [--seconds N] [--rate CALLS_PER_SECOND] [--quiet N] [--no-link] [--dir FOLDER]
//
// Defaults: 60 s at 100 calls per second, then 10 s without calls before memory is read again.
// --no-link: the program does not listen for the monitor's messages (it re-reads the list every
// second instead), which shows what the monitor writes when nothing waits for the program.

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
#include <QHostAddress>
#include <QTcpServer>
#include <QTcpSocket>
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
    bool link = true;
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
        else if (a == QLatin1String("--no-link")) {
            o.link = false;
            ok = true;
        } else
            ok = false;
        if (!ok || o.seconds < 1 || o.rate < 1 || o.quiet < 0) {
            std::fprintf(stderr, "usage: soak_server [--seconds N] [--rate CALLS_PER_SECOND] [--quiet N] [--no-link] [--dir FOLDER]\n");
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

// The router's call monitor: a TCP port on 127.0.0.1 that `rufwarte run --router` connects to,
// sending each call as RING, CONNECT and DISCONNECT at the rate. A call is finished once its
// DISCONNECT is written; each has a talk time of its own, so no two rows are alike.
class FakeRouter final {
public:
    explicit FakeRouter(int rate)
        : m_rate(rate)
    {
        QObject::connect(&m_server, &QTcpServer::newConnection, [this] {
            while (QTcpSocket* s = m_server.nextPendingConnection()) {
                delete m_client;
                m_client = s;
            }
        });
        QObject::connect(&m_tick, &QTimer::timeout, [this] { send(); });
        m_server.listen(QHostAddress::LocalHost);
    }
    ~FakeRouter() { delete m_client; }
    [[nodiscard]] quint16 port() const { return m_server.serverPort(); }
    [[nodiscard]] bool connected() const
    {
        return m_client && m_client->state() == QAbstractSocket::ConnectedState;
    }
    void start()
    {
        m_clock.start();
        m_base = finished;
        m_tick.start(5);
    }
    void stop() { m_tick.stop(); }

    qint64 finished = 0;
    qint64 recurring = 0; // calls from the number the user relinks

    static QString number(qint64 n) { return n % 5 == 0 ? QStringLiteral("0301234567") : QStringLiteral("089%1").arg(2000000 + n); }
    // Every call talks one second longer than the one before, so number and length name a call
    // even where the number recurs.
    static qint64 seconds(qint64 n) { return 1 + n; }
    static QString key(qint64 n) { return callKey(number(n), seconds(n)); }
    static QString callKey(const QString& number, qint64 seconds) { return number + u'|' + QString::number(seconds); }

private:
    void send()
    {
        if (!connected())
            return;
        const qint64 due = m_base + m_clock.elapsed() * m_rate / 1000;
        const QByteArray stamp = QDateTime::currentDateTime().toString(QStringLiteral("dd.MM.yy HH:mm:ss")).toLatin1();
        QByteArray lines;
        for (; finished < due; ++finished) {
            const QByteArray id = QByteArray::number(finished % 40);
            const QByteArray from = number(finished).toLatin1();
            recurring += finished % 5 == 0 ? 1 : 0;
            lines += stamp + ";RING;" + id + ';' + from + ";3012345670;SIP0;\r\n";
            lines += stamp + ";CONNECT;" + id + ";1;" + from + ";\r\n";
            lines += stamp + ";DISCONNECT;" + id + ';' + QByteArray::number(seconds(finished)) + ";\r\n";
        }
        if (!lines.isEmpty())
            m_client->write(lines);
    }

    int m_rate;
    QTcpServer m_server;
    QTcpSocket* m_client = nullptr;
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

// Today's calls in LOG by number and length, each as often as it is there.
QHash<QString, int> callsOfToday(const QString& database, const QString& password)
{
    FbAttachment db;
    db.attach(database, QStringLiteral("SYSDBA"), password);
    FbTransaction tx(db);
    tx.start();
    FbStatement st(db, &tx, QStringLiteral("SELECT FROMPHONE, CTIME FROM LOG WHERE TSDATE = CURRENT_DATE"));
    st.execute();
    QHash<QString, int> numbers;
    while (st.next())
        ++numbers[FakeRouter::callKey(st.asString(0), QTime(0, 0).secsTo(st.asTime(1)))];
    tx.commit();
    return numbers;
}

// The first `finished` calls of the router that are not in LOG.
qint64 missingCalls(qint64 finished, const QHash<QString, int>& stored)
{
    qint64 missing = 0;
    for (qint64 n = 0; n < finished; ++n)
        missing += stored.contains(FakeRouter::key(n)) ? 0 : 1;
    return missing;
}

qint64 rows(const QHash<QString, int>& stored)
{
    qint64 n = 0;
    for (int c : stored)
        n += c;
    return n;
}

std::unique_ptr<QProcess> startMonitor(const FakeRouter& router, const QString& folder)
{
    auto monitor = std::make_unique<QProcess>();
    monitor->setProcessChannelMode(QProcess::MergedChannels);
    monitor->setStandardOutputFile(folder + QStringLiteral("/rufwarte.out"), QIODevice::Append);
    monitor->start(QCoreApplication::applicationDirPath() + QStringLiteral("/rufwarte"),
                   {QStringLiteral("run"), QStringLiteral("--router"), QStringLiteral("127.0.0.1:%1").arg(router.port()),
                    QStringLiteral("--retry-ms"), QStringLiteral("200"), QStringLiteral("--program-folder"), folder});
    if (!monitor->waitForStarted(5000))
        return nullptr;
    QElapsedTimer t;
    t.start();
    while (!router.connected()) {
        if (t.elapsed() > 20000 || monitor->state() != QProcess::Running)
            return nullptr;
        QCoreApplication::processEvents(QEventLoop::AllEvents, 50);
    }
    return monitor;
}

// Until LOG holds `expected` calls of today or nothing changed for `quietMs`.
qint64 waitForRows(const QString& database, const QString& password, qint64 expected, int quietMs)
{
    qint64 last = -1;
    QElapsedTimer unchanged;
    unchanged.start();
    for (;;) {
        const qint64 now = rows(callsOfToday(database, password));
        if (now >= expected)
            return now;
        if (now != last) {
            last = now;
            unchanged.restart();
        } else if (unchanged.elapsed() > quietMs) {
            return now;
        }
        runEventsFor(200);
    }
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
    QTimer polling;
    QObject::connect(&polling, &QTimer::timeout, [&] { host.refresh(0); });
    if (!options->link)
        polling.start(1000);
    else if (!link.startListening(&host)) {
        std::fprintf(stderr, "the program cannot listen for the monitor\n");
        return 1;
    }
    LogMaintenance maintenance(dm.get());

    FakeRouter router(options->rate);
    std::unique_ptr<QProcess> monitor = startMonitor(router, temp->path());
    if (!monitor) {
        std::fprintf(stderr, "rufwarte does not start or does not reach the router\n");
        return 1;
    }
    SecondDesk desk(database, server.password());
    desk.start();

    // The user's work, a step every quarter second in turn: a remark on the newest call, the
    // recurring number relinked, an earlier day deleted.
    int remarks = 0;
    int relinks = 0;
    int deletions = 0;
    int failedSteps = 0;
    int step = 0;
    QTimer user;
    QObject::connect(&user, &QTimer::timeout, [&] {
        switch (step++ % 3) {
        case 0: {
            const int lid = dm->CurLogLID;
            if (lid <= 0)
                return;
            desk.target = lid;
            TLogDetailForm form(dm.get(), lid);
            form.setHostWindow(&host);
            form.findChild<QLineEdit*>(QStringLiteral("RzE1"))->setText(QStringLiteral("Rückruf %1").arg(step));
            form.SetBemerkung() ? ++remarks : ++failedSteps;
            break;
        }
        case 1:
            maintenance.LogbuchAnpassen(FakeRouter::number(0), QStringLiteral("Büro"), 7, QStringLiteral("Muster GmbH"))
                ? ++relinks
                : ++failedSteps;
            break;
        default:
            maintenance.DeleteLogDay(today.addDays(-1 - deletions), &host) ? ++deletions : ++failedSteps;
            break;
        }
    });

    const qint64 rssStart = residentKiB();
    router.start();
    user.start(250);
    QElapsedTimer clock;
    clock.start();
    runEventsFor(options->seconds * 1000);
    router.stop();
    const double sendSeconds = double(clock.elapsed()) / 1000.0;
    // The monitor's last rows.
    const qint64 inLog = waitForRows(database, server.password(), router.finished, 30000);
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
    polling.stop();
    const qint64 rssQuiet = residentKiB();

    const QHash<QString, int> stored = callsOfToday(database, server.password());
    const qint64 missing = missingCalls(router.finished, stored);
    const int dialogErrors = dialogs->count();
    say(QStringLiteral("router: %1 calls finished in %2 s (%3 calls/s asked); LOG stopped growing after %4 s")
            .arg(router.finished)
            .arg(sendSeconds, 0, 'f', 1)
            .arg(options->rate)
            .arg(writeSeconds, 0, 'f', 1));
    say(QStringLiteral("calls written %1, calls in LOG %2, missing %3, more than finished %4")
            .arg(router.finished)
            .arg(inLog)
            .arg(missing)
            .arg(std::max<qint64>(0, rows(stored) - router.finished)));
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
    say(QStringLiteral("errors: dialogs %1, error log entries %2; program writes run again after a lock conflict: %3")
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

    // Faults: calls keep coming, and the monitor and the server are killed while it writes them.
    router.start();
    runEventsFor(3000);
    router.stop();
    const qint64 beforeKill = rows(callsOfToday(database, server.password()));
    ::kill(static_cast<pid_t>(monitor->processId()), SIGKILL);
    server.kill();
    monitor->waitForFinished(5000);
    runEventsFor(200);
    const int dialogsBefore = dialogs->count();
    const bool programConnected = dm->DBConnect();
    say(QStringLiteral("killed rufwarte and the server with %1 of %2 finished calls in LOG; the program still runs, "
                       "connected: %3, says: %4")
            .arg(beforeKill)
            .arg(router.finished)
            .arg(programConnected ? QStringLiteral("yes") : QStringLiteral("no"))
            .arg(dialogs->count() > dialogsBefore
                     ? QString(dialogs->last().text).replace(QStringLiteral("\r\n"), QStringLiteral(" | "))
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
    say(QStringLiteral("gfix -v -full: exit %1, %2")
            .arg(gfix)
            .arg(validation.trimmed().isEmpty() ? QStringLiteral("no findings")
                                                : QString::fromLocal8Bit(validation.trimmed())));
    // What rufwarte had taken in when it was killed: its rows in LOG and the calls waiting in its
    // queue file. Calls still unread in its socket were never its to lose.
    QHash<QString, int> known = callsOfToday(database, server.password());
    const qint64 committed = rows(known);
    qint64 queued = 0;
    {
        QFile queue(temp->filePath(QStringLiteral("CallQueue")));
        if (queue.open(QIODevice::ReadOnly)) {
            for (const QByteArray& line : queue.readAll().split('\n')) {
                const QList<QByteArray> fields = line.split('\t');
                if (fields.size() != 6)
                    continue;
                ++queued;
                // Lines of calls already written stay in the file until it is emptied.
                const QString key = FakeRouter::callKey(QString::fromLatin1(fields[4]), fields[3].toLongLong());
                if (!known.contains(key))
                    known[key] = 1;
            }
        }
    }
    monitor = startMonitor(router, temp->path());
    const qint64 afterRestart = monitor ? waitForRows(database, server.password(), rows(known), 10000)
                                        : rows(callsOfToday(database, server.password()));
    const QHash<QString, int> final = callsOfToday(database, server.password());
    qint64 lost = 0;
    for (auto it = known.cbegin(); it != known.cend(); ++it)
        lost += std::max(0, it.value() - final.value(it.key()));
    say(QStringLiteral("at the kill: %1 calls committed, %2 in rufwarte's queue file, %3 finished at the router but "
                       "still unread in rufwarte's socket")
            .arg(committed)
            .arg(queued)
            .arg(std::max<qint64>(0, router.finished - rows(known))));
    say(QStringLiteral("after restarting both: %1 calls in LOG; of the %2 rufwarte had taken in, lost %3")
            .arg(afterRestart)
            .arg(rows(known))
            .arg(lost));
    if (monitor) {
        monitor->terminate();
        monitor->waitForFinished(10000);
    }

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
