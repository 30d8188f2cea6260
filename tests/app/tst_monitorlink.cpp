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
        QCOMPARE(call(QStringLiteral("0301111")), QByteArray("0"));
        w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTOP"))->trigger();
        QTRY_VERIFY(monitorSaid("fortgesetzt"));
        QVERIFY(call(QStringLiteral("0301111")).toInt() > 0);
        QTRY_COMPARE(w.statusPanels()->panelText(2), QStringLiteral("Protokolleinträge: 3"));

        // Quit.
        w.findChild<QAction*>(QStringLiteral("_LogFo_CloseApp"))->trigger();
        QVERIFY(monitor.waitForFinished(10000));
        QCOMPARE(monitor.exitCode(), 0);
        w.refreshMonitorState();
        QVERIFY(w.findChild<QAction*>(QStringLiteral("_LogFo_MoniSTART"))->isEnabled());
    }

private:
    QTemporaryDir m_engineRoot;
};

ORVANTA_TEST(TestMonitorLink)
#include "tst_monitorlink.moc"
