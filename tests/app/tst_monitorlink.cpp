#include "app/MainWindowFeatures.h"
#include "db/SharedEngine.h"
#include "platform/MonitorLink.h"
#include "tests/support/MessageReceiver.h"
#include "app/TLogform.h"
#include "tests/TestPaths.h"
#include "tests/app/AppTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/calendar/PlannerCalendar.h"
#include "ui/statusbar/PanelStatusBar.h"

#include <QAction>
#include <QLocalSocket>
#include <QProcess>
#include <QTest>

using namespace orvanta;
using orvanta::test::AppTestEnv;

namespace {

using Receiver = orvanta::test::MessageReceiver;

QString rufwarteProgram()
{
    return QStringLiteral(ORVANTA_BIN_DIR "/rufwarte");
}

} // namespace

class TestMonitorLink final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        // The stand-in monitor and this process share the database file.
        qputenv("XDG_RUNTIME_DIR", m_engineRoot.path().toLocal8Bit());
        QVERIFY(!useSharedEmbeddedEngine().isEmpty());
    }

    void monitorMessagesBecomeTheProgramsOwn()
    {
        Receiver r;
        r.delivering = true;
        QVERIFY(MonitorLink::filterMessage(&r, 1729, 42, 9));
        r.delivering = false;
        QCOMPARE(r.got.size(), 1);
        QCOMPARE(r.got[0].message, WMLOGINFOCHANGE);
        QCOMPARE(r.got[0].wParam, qintptr(42));
        QVERIFY(!r.got[0].posted); // sent: handled before filterMessage returned

        QVERIFY(MonitorLink::filterMessage(&r, 1733, 43, 0));
        QVERIFY(MonitorLink::filterMessage(&r, 1736, 1, 1));
        QVERIFY(MonitorLink::filterMessage(&r, 1744, 17, 0));
        QVERIFY(!MonitorLink::filterMessage(&r, 1735, 0, 0));
        QVERIFY(!MonitorLink::filterMessage(&r, WMLOGINFOCHANGE, 0, 0));
        QCOMPARE(r.got.size(), 1);
        QCoreApplication::sendPostedEvents(&r);
        QCOMPARE(r.got.size(), 3);
        QCOMPARE(r.got[1].message, WMLOGINFOCHANGE);
        QCOMPARE(r.got[1].wParam, qintptr(43));
        QVERIFY(r.got[1].posted);
        QCOMPARE(r.got[2].message, WMCONTACTDATAFROMSCREEN);
        QCOMPARE(r.got[2].wParam, qintptr(17));
    }

    void onlyWellFormedLinesAreMessages()
    {
        int m = 0;
        qint64 w = 0;
        qint64 l = 0;
        QVERIFY(MonitorLink::parseLine("1744 -17 0\n", m, w, l));
        QCOMPARE(m, 1744);
        QCOMPARE(w, -17);
        for (const char* bad : {"", "1729", "1729 1", "1729 1 2 3", "a b c", "1729 99999999999999999999 0",
                                "99999999999 0 0", "1729 0x10 0", "\x01\x02"}) {
            QVERIFY2(!MonitorLink::parseLine(bad, m, w, l), bad);
        }
    }

    void theProgramListensOnItsSocket()
    {
        QTemporaryDir runtime;
        qputenv("XDG_RUNTIME_DIR", runtime.path().toLocal8Bit());
        Receiver r;
        MonitorLink link;
        QVERIFY(link.startListening(&r));
        QVERIFY(!MonitorLink::sendLine(MonitorLink::monitorSocketPath(), 1735, 0, 0)); // no monitor there
        QVERIFY(!link.monitorWindowExists());
        {
            // Junk, an endless line and odd numbers do no harm; the good line after them arrives.
            QLocalSocket s;
            s.connectToServer(MonitorLink::programSocketPath());
            QVERIFY(s.waitForConnected(1000));
            s.write("junk\n1744 x 0\n1744 5\n");
            s.write("1733 8 0\n");
            QVERIFY(s.waitForBytesWritten(1000));
            QTRY_COMPARE(r.got.size(), 1);
            QCOMPARE(r.got[0].message, WMLOGINFOCHANGE);
            QCOMPARE(r.got[0].wParam, qintptr(8));
        }
        QVERIFY(MonitorLink::sendLine(MonitorLink::programSocketPath(), 1744, 31, 0));
        QTRY_COMPARE(r.got.size(), 2);
        QCOMPARE(r.got[1].message, WMCONTACTDATAFROMSCREEN);
        QCOMPARE(r.got[1].wParam, qintptr(31));
        qputenv("XDG_RUNTIME_DIR", m_engineRoot.path().toLocal8Bit());
    }

    void aRunningStandInMonitorTalksToTheMainWindow()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        AppTestEnv env;
        env.addCall(1, QStringLiteral("2024-05-14"), QStringLiteral("0301111"));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back([](TLogform& mainWindow) {
            mainWindow.factories().contactEditWindow = [](QWidget*, int, int) -> QWidget* { return new QWidget; };
        });
        TLogform& w = env.window({}, f);
        w.show();
        QTRY_COMPARE(w.statusPanels()->panelText(2), QStringLiteral("Protokolleinträge: 1"));
        w.refreshMonitorState();
        QVERIFY(w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTART"))->isEnabled());
        QVERIFY(!w.findChild<QAction*>(QStringLiteral("_LogFo_CloseApp"))->isEnabled());

        QProcessEnvironment penv = QProcessEnvironment::systemEnvironment();
        QProcess monitor;
        monitor.setProcessEnvironment(penv);
        monitor.setProcessChannelMode(QProcess::MergedChannels);
        monitor.start(rufwarteProgram(), {QStringLiteral("run")});
        QVERIFY(monitor.waitForStarted());
        QTRY_VERIFY_WITH_TIMEOUT(w.monitorLink().monitorWindowExists(), 10000);
        w.refreshMonitorState();
        QVERIFY(!w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTART"))->isEnabled());
        QVERIFY(w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTOP"))->isEnabled());

        // A call: the monitor logs it and sends 1729; the list and the calendar follow.
        const auto call = [&](const QString& number) {
            QProcess c;
            c.start(rufwarteProgram(), {QStringLiteral("call"), number});
            if (!c.waitForFinished(20000))
                return QByteArray("timeout");
            return c.readAllStandardOutput().trimmed();
        };
        const QByteArray lid = call(QStringLiteral("0891234567"));
        if (lid.toInt() <= 1)
            monitor.waitForReadyRead(2000);
        QVERIFY2(lid.toInt() > 1, (lid + " " + monitor.readAll()).constData());
        QTRY_COMPARE(w.statusPanels()->panelText(2), QStringLiteral("Protokolleinträge: 2"));
        QVERIFY(w.calendar()->hasEvent(QDate::currentDate()));

        // 1744: a new contact from that call.
        QProcess contact;
        contact.start(rufwarteProgram(), {QStringLiteral("contact"), QString::fromLatin1(lid)});
        QVERIFY(contact.waitForFinished(10000));
        QTRY_VERIFY(!w.editWindows().allFree());
        QCOMPARE(w.editWindows().at(0)->property("callerNumber").toString(), QStringLiteral("0891234567"));

        // Pause: the monitor logs nothing until resumed.
        w.refreshMonitorState();
        QVERIFY(w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTOP"))->isEnabled());
        w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTOP"))->trigger();
        QByteArray said;
        const auto monitorSaid = [&](const char* text) {
            said += monitor.readAll();
            return said.contains(text);
        };
        QTRY_VERIFY(monitorSaid("angehalten"));
        QTRY_COMPARE(w.statusPanels()->panelText(1), QStringLiteral("Rufwarte angehalten"));
        QCOMPARE(call(QStringLiteral("0301111")), QByteArray("0"));
        // Paused, the monitor still runs: it can be resumed or ended, not started again.
        QVERIFY(w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTOP"))->isEnabled());
        QVERIFY(w.findChild<QAction*>(QStringLiteral("_LogFo_CloseApp"))->isEnabled());
        QVERIFY(!w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTART"))->isEnabled());
        w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTOP"))->trigger();
        QTRY_VERIFY(monitorSaid("fortgesetzt"));
        QTRY_COMPARE(w.statusPanels()->panelText(1), QString());
        QVERIFY(call(QStringLiteral("0301111")).toInt() > 0);
        QTRY_COMPARE(w.statusPanels()->panelText(2), QStringLiteral("Protokolleinträge: 3"));

        // Quit.
        w.findChild<QAction*>(QStringLiteral("_LogFo_CloseApp"))->trigger();
        QVERIFY(monitor.waitForFinished(10000));
        QCOMPARE(monitor.exitCode(), 0);
        QTRY_VERIFY(w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTART"))->isEnabled());
        QVERIFY(!w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTOP"))->isEnabled());
    }

    void oneMonitorAtATime()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        AppTestEnv env; // a private runtime folder and the database in the registry stand-in
        const QString link = MonitorLink::monitorSocketPath();
        const auto startMonitor = [](QProcess& p) {
            p.setProcessChannelMode(QProcess::MergedChannels);
            p.start(rufwarteProgram(), {QStringLiteral("run")});
            return p.waitForStarted();
        };
        const auto answers = [] { return MonitorLink::sendLine(MonitorLink::monitorSocketPath(), 0, 0, 0, 500); };

        QProcess first;
        QVERIFY(startMonitor(first));
        QTRY_VERIFY_WITH_TIMEOUT(answers(), 10000);

        // A second one says so and ends; the first one's link stays and still answers.
        QProcess second;
        QVERIFY(startMonitor(second));
        QVERIFY(second.waitForFinished(10000));
        QCOMPARE(second.exitCode(), 1);
        QVERIFY2(second.readAll().contains("Die Rufwarte läuft bereits."), "no word of the running monitor");
        QVERIFY(QFileInfo::exists(link));
        QVERIFY(answers());
        QCOMPARE(first.state(), QProcess::Running);

        // A monitor that died leaves its link file behind; the next start replaces it.
        first.kill();
        QVERIFY(first.waitForFinished(5000));
        QVERIFY(QFileInfo::exists(link));
        QVERIFY(!answers());
        QProcess third;
        QVERIFY(startMonitor(third));
        QTRY_VERIFY_WITH_TIMEOUT(answers(), 10000);
        QCOMPARE(third.state(), QProcess::Running);

        // "rufwarte quit" ends it and returns once it has ended.
        QProcess quit;
        quit.start(rufwarteProgram(), {QStringLiteral("quit")});
        QVERIFY(quit.waitForFinished(15000));
        QCOMPARE(quit.exitCode(), 0);
        QVERIFY(third.waitForFinished(1000));
        QCOMPARE(third.exitCode(), 0);
        QVERIFY(!QFileInfo::exists(link));
        QProcess again;
        again.start(rufwarteProgram(), {QStringLiteral("quit")});
        QVERIFY(again.waitForFinished(10000));
        QCOMPARE(again.exitCode(), 1);
        QVERIFY(again.readAllStandardError().contains("Die Rufwarte läuft nicht."));
    }

    void theMonitorFindsTheRegistryBesideItself()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        AppTestEnv env;
        // An installed copy whose registry stand-in lies beside it, and no VARNIK_HKLM.
        QTemporaryDir installed;
        const QString program = installed.filePath(QStringLiteral("rufwarte"));
        QVERIFY(QFile::copy(rufwarteProgram(), program));
        QVERIFY(QFile::copy(qEnvironmentVariable("VARNIK_HKLM"), installed.filePath(QStringLiteral("registry.ini"))));
        QProcessEnvironment penv = QProcessEnvironment::systemEnvironment();
        penv.remove(QStringLiteral("VARNIK_HKLM"));
        QProcess call;
        call.setProcessEnvironment(penv);
        call.start(program, {QStringLiteral("call"), QStringLiteral("0891234567")});
        QVERIFY(call.waitForFinished(20000));
        QVERIFY2(call.exitCode() == 0, call.readAllStandardError().constData());
        QVERIFY(call.readAllStandardOutput().trimmed().toInt() > 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG WHERE FROMPHONE = '0891234567'")).toInt(), 1);
    }

private:
    QTemporaryDir m_engineRoot;
};

ORVANTA_TEST(TestMonitorLink)
#include "tst_monitorlink.moc"
