// The monitor on a router's call-monitor line: a fake router on 127.0.0.1 replays a recorded
// session to a running "rufwarte run --router", drops the line mid-call and comes back; the log
// then holds every finished call once, with the texts the program shows, and the program was told
// of each.

#include "db/FbTransaction.h"
#include "db/SharedEngine.h"
#include "platform/MonitorLink.h"
#include "platform/RufwarteIni.h"
#include "tests/TestPaths.h"
#include "tests/support/MessageReceiver.h"
#include "tests/support/ProgramTestEnv.h"
#include "tests/support/TestRegistry.h"

#include <QDir>
#include <QElapsedTimer>
#include <QProcess>
#include <QScopeGuard>
#include <QTcpServer>
#include <QTcpSocket>
#include <QTemporaryDir>
#include <QThread>
#include <QTest>

using namespace orvanta;
using orvanta::test::ProgramTestEnv;

namespace {

QString rufwarteProgram()
{
    return QStringLiteral(ORVANTA_BIN_DIR "/rufwarte");
}

// One LOG row as text, the columns the log list and the detail window show.
QStringList logRows(test::TempDatabase& db)
{
    QStringList rows;
    const int n = db.scalar(QStringLiteral("SELECT COUNT(*) FROM LOG")).toInt();
    for (int i = 0; i < n; ++i) {
        const QString cols = QStringLiteral(
            "COALESCE(FROMPHONE,'') || '|' || COALESCE(FROMBEZ,'') || '|' || COALESCE(ONMSN,'') || '|' || "
            "COALESCE(ONBEZ,'') || '|' || COALESCE(STATUS,'') || '|' || CTYPE || '|' || "
            "SUBSTRING(CAST(CTIME AS VARCHAR(13)) FROM 1 FOR 8) || '|' || "
            "COALESCE(REGION,'') || '|' || CID || '|' || COALESCE(FROMANSCHLUSS,'') || '|' || TSDATE || ' ' || "
            "SUBSTRING(CAST(TSTIME AS VARCHAR(13)) FROM 1 FOR 8)");
        rows << db.scalar(QStringLiteral("SELECT %1 FROM LOG ORDER BY TS, LID ROWS %2 TO %2").arg(cols).arg(i + 1))
                    .toString();
    }
    return rows;
}

} // namespace

class TestRouterMonitor final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        // The monitor process and this one share the database file and the message sockets.
        qputenv("XDG_RUNTIME_DIR", m_runtime.path().toLocal8Bit());
        QVERIFY(!useSharedEmbeddedEngine().isEmpty());
    }

    void aRecordedSessionBecomesTheLog()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        ProgramTestEnv env(QDateTime(QDate(2026, 12, 7), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        for (const char* table : {"AreaCodes_DE", "AreaCodes_A", "AreaCodes_CH"})
            QVERIFY(QFile::copy(QStringLiteral(ORVANTA_SOURCE_DIR "/data/") + QLatin1String(table),
                                env.file(QLatin1String(table))));
        QVERIFY(writeMsnFile(env.file(QStringLiteral("msns")),
                             {{QStringLiteral("3012345670"), QString::fromUtf8("Büro")},
                              {QStringLiteral("3012345671"), QStringLiteral("Privat")}}));
        env.db().exec(QString::fromUtf8(
            "INSERT INTO CONTACT (LID, CONTBEZ) VALUES (7, 'Erika Mustermann');\n"
            "INSERT INTO COM (LID, CID, KOMMBEZ, VORW, NUMBER, VORWNUMBER, NUMBEROF) "
            "VALUES (70, 7, 'Mobil', '170', '1234567', '1701234567', '1701234567');"));

        // The program's side: it counts the log-changed messages.
        test::MessageReceiver program;
        MonitorLink link;
        QVERIFY(link.startListening(&program));

        QTcpServer router;
        QVERIFY(router.listen(QHostAddress::LocalHost));
        QProcess monitor;
        monitor.setProcessChannelMode(QProcess::MergedChannels);
        QByteArray output;
        connect(&monitor, &QProcess::readyRead, this, [&] { output += monitor.readAll(); });
        monitor.start(rufwarteProgram(), {QStringLiteral("run"), QStringLiteral("--program-folder"), env.folder(),
                                          QStringLiteral("--router"),
                                          QStringLiteral("127.0.0.1:%1").arg(router.serverPort()),
                                          QStringLiteral("--retry-ms"), QStringLiteral("100")});
        QVERIFY(monitor.waitForStarted());
        const auto cleanup = qScopeGuard([&monitor] {
            monitor.terminate();
            if (!monitor.waitForFinished(10000))
                monitor.kill();
            monitor.disconnect();
        });

        QVERIFY2(router.waitForNewConnection(15000), output.constData());
        QTcpSocket* line = router.nextPendingConnection();
        // Junk, a DISCONNECT nobody rang for and a half line around the real calls.
        line->write("07.12.26 09:00:00;RING;0;01701234567;3012345670;SIP0;\r\n"
                    "07.12.26 09:00:04;CONNECT;0;1;01701234567;\r\n"
                    "welcome to the router\r\n"
                    "07.12.26 09:03:04;DISCONNECT;0;180;\r\n"
                    "07.12.26 09:10:00;RING;1;0891234567;3012345671;SIP1;\r\n"
                    "07.12.26 09:10:30;DISCONNECT;1;0;\r\n"
                    "07.12.26 09:11:00;DISCONNECT;9;55;\r\n"
                    "07.12.26 09:20:00;CALL;2;1;3012345670;030987654;SIP0;\r\n"
                    "07.12.26 09:20:");
        QVERIFY(line->waitForBytesWritten(5000));
        line->write("08;CONNECT;2;1;030987654;\r\n"
                    "07.12.26 09:21:08;DISCONNECT;2;60;\r\n"
                    "07.12.26 09:30:00;RING;3;;3012345670;SIP0;\r\n"
                    + QByteArray(1 << 20, 'x') + "\r\n"
                    "07.12.26 09:30:15;DISCONNECT;3;0;\r\n"
                    // A call in progress when the line drops.
                    "07.12.26 09:40:00;RING;4;01701234567;3012345670;SIP0;\r\n"
                    "07.12.26 09:40:02;CONNECT;4;2;01701234567;\r\n");
        QVERIFY(line->waitForBytesWritten(5000));
        line->disconnectFromHost();
        QTRY_COMPARE_WITH_TIMEOUT(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG")).toInt(), 4, 15000);

        // The router comes back: the call that was running ends, another one follows.
        QVERIFY2(router.waitForNewConnection(15000), output.constData());
        line = router.nextPendingConnection();
        line->write("07.12.26 09:45:02;DISCONNECT;4;300;\r\n"
                    "07.12.26 09:50:00;CALL;0;1;3012345671;+43151234;SIP1;\r\n"
                    "07.12.26 09:50:20;DISCONNECT;0;0;\r\n");
        QVERIFY(line->waitForBytesWritten(5000));
        QTRY_COMPARE_WITH_TIMEOUT(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG")).toInt(), 6, 15000);

        const QString withheld = QString::fromUtf8("Nummer unterdrückt");
        const QStringList expected{
            QString::fromUtf8("01701234567|Erika Mustermann|3012345670|Büro|Verbunden|0|00:03:00||7|Mobil|"
                              "2026-12-07 09:00:00"),
            QString::fromUtf8("0891234567|0891234567|3012345671|Privat|Nicht angenommen|0|00:00:00|München|0||"
                              "2026-12-07 09:10:00"),
            QString::fromUtf8("030987654|030987654|3012345670|Büro|Verbunden|1|00:01:00|Berlin|0||"
                              "2026-12-07 09:20:00"),
            withheld + QString::fromUtf8("|") + withheld
                + QString::fromUtf8("|3012345670|Büro|Nicht angenommen|0|00:00:00||0||2026-12-07 09:30:00"),
            QString::fromUtf8("01701234567|Erika Mustermann|3012345670|Büro|Verbunden|0|00:05:00||7|Mobil|"
                              "2026-12-07 09:40:00"),
            QString::fromUtf8("+43151234|+43151234|3012345671|Privat|Keine Antwort|1|00:00:00|Wien|0||"
                              "2026-12-07 09:50:00"),
        };
        const QStringList rows = logRows(env.db());
        QCOMPARE(rows.join(u'\n'), expected.join(u'\n'));

        // The program heard of the newest row last; messages that piled up while it was busy
        // may have become one, each naming a row that is there.
        const int newest = env.db().scalar(QStringLiteral("SELECT MAX(LID) FROM LOG")).toInt();
        QTRY_VERIFY(!program.got.isEmpty() && program.got.constLast().wParam == newest);
        QVERIFY(program.got.size() <= 6);
        for (const auto& got : std::as_const(program.got)) {
            QCOMPARE(got.message, WMLOGINFOCHANGE);
            const QString sql = QStringLiteral("SELECT COUNT(*) FROM LOG WHERE LID = %1").arg(got.wParam);
            QCOMPARE(env.db().scalar(sql).toInt(), 1);
        }

        // What it passed over, it said.
        output += monitor.readAll();
        const QString out = QString::fromLocal8Bit(output);
        QVERIFY2(out.contains(QStringLiteral("welcome to the router")), qPrintable(out));
        QVERIFY2(out.contains(QStringLiteral("DISCONNECT ohne RING")), qPrintable(out));
        QVERIFY2(out.contains(QStringLiteral("Überlange Zeile")), qPrintable(out));
    }

    void callsWaitForTheDatabaseAndOutliveTheMonitor()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        ProgramTestEnv env(QDateTime(QDate(2026, 12, 7), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        // The database is out of reach while the calls come in.
        const QString away = env.file(QStringLiteral("away.fdb"));
        QVERIFY(QFile::rename(env.db().path(), away));
        const QString queueFile = env.file(QStringLiteral("CallQueue"));

        QTcpServer router;
        QVERIFY(router.listen(QHostAddress::LocalHost));
        const QStringList args{QStringLiteral("run"), QStringLiteral("--program-folder"), env.folder(),
                               QStringLiteral("--router"), QStringLiteral("127.0.0.1:%1").arg(router.serverPort()),
                               QStringLiteral("--retry-ms"), QStringLiteral("100")};
        QProcess monitor;
        monitor.setProcessChannelMode(QProcess::MergedChannels);
        QByteArray output;
        connect(&monitor, &QProcess::readyRead, this, [&] { output += monitor.readAll(); });
        const auto cleanup = qScopeGuard([&monitor] {
            monitor.kill();
            monitor.waitForFinished(10000);
            monitor.disconnect();
        });
        monitor.start(rufwarteProgram(), args);
        QVERIFY2(router.waitForNewConnection(15000), output.constData());
        QTcpSocket* line = router.nextPendingConnection();
        line->write("07.12.26 09:10:00;RING;1;0891234567;3012345671;SIP1;\n"
                    "07.12.26 09:10:30;DISCONNECT;1;0;\n"
                    "07.12.26 09:20:00;CALL;2;1;3012345670;030987654;SIP0;\n"
                    "07.12.26 09:20:08;CONNECT;2;1;030987654;\n"
                    "07.12.26 09:21:08;DISCONNECT;2;60;\n");
        QVERIFY(line->waitForBytesWritten(5000));
        const auto queued = [&queueFile] {
            QFile f(queueFile);
            return f.open(QIODevice::ReadOnly) ? f.readAll().count('\n') : qsizetype(-1);
        };
        QTRY_COMPARE_WITH_TIMEOUT(queued(), qsizetype(2), 15000);
        QVERIFY2(output.contains("Keine Verbindung zur Datenbank"), output.constData());

        // The monitor dies without a word. Say it had written the first call and marked it done,
        // and had written the second without getting as far as the mark; a third call was queued.
        monitor.kill();
        QVERIFY(monitor.waitForFinished(10000));
        QVERIFY(QFile::rename(away, env.db().path()));
        env.db().exec(QStringLiteral(
            "INSERT INTO LOG (LID, FROMPHONE, ONMSN, CTYPE, CTIME, TS, TSDATE, TSTIME) VALUES "
            "(1, '030987654', '3012345670', 1, '00:01:00', '2026-12-07 09:20:00', '2026-12-07', '09:20:00')"));
        QFile more(queueFile);
        QVERIFY(more.open(QIODevice::Append));
        more.write("-\nnot a call\n2026-12-07T09:00:00\t7\t0\t0\t030\t301\n"
                   "2026-12-07T09:30:00\t0\t1\t42\t0301111\t3012345670\n");
        more.close();

        // The next start writes what still waited, once, and says what it passed over.
        output.clear();
        monitor.start(rufwarteProgram(), args);
        QTRY_VERIFY_WITH_TIMEOUT(!QFileInfo::exists(queueFile), 15000);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG")).toInt(), 2);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG WHERE FROMPHONE = '0891234567'")).toInt(), 0);
        QCOMPARE(env.db()
                     .scalar(QStringLiteral("SELECT STATUS || '|' || FROMBEZ || '|' || CTYPE || '|' || TSTIME FROM LOG "
                                            "WHERE FROMPHONE = '0301111' AND CTIME = '00:00:42'"))
                     .toString(),
                 QStringLiteral("Verbunden|0301111|0|09:30:00.0000"));
        QTRY_VERIFY2(output.contains("2 unlesbare Zeilen"), output.constData());
    }

    void aKeyHeldByAnotherWriterIsTriedAgain()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        ProgramTestEnv env(QDateTime(QDate(2026, 12, 7), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        // Another writer has taken the next key and not committed yet.
        env.db().exec(QStringLiteral("ALTER SEQUENCE GEN_LOG_ID RESTART WITH 99"));
        const std::unique_ptr<FbAttachment> other = env.db().newAttachment();
        FbTransaction held(*other);
        held.start();
        other->executeImmediate(QStringLiteral("INSERT INTO LOG (LID, CTYPE) VALUES (100, 0)"), held);

        QTcpServer router;
        QVERIFY(router.listen(QHostAddress::LocalHost));
        QProcess monitor;
        monitor.setProcessChannelMode(QProcess::MergedChannels);
        QByteArray output;
        connect(&monitor, &QProcess::readyRead, this, [&] { output += monitor.readAll(); });
        const auto cleanup = qScopeGuard([&monitor] {
            monitor.terminate();
            if (!monitor.waitForFinished(10000))
                monitor.kill();
            monitor.disconnect();
        });
        monitor.start(rufwarteProgram(), {QStringLiteral("run"), QStringLiteral("--program-folder"), env.folder(),
                                          QStringLiteral("--router"),
                                          QStringLiteral("127.0.0.1:%1").arg(router.serverPort()),
                                          QStringLiteral("--retry-ms"), QStringLiteral("100")});
        QVERIFY2(router.waitForNewConnection(15000), output.constData());
        QTcpSocket* line = router.nextPendingConnection();
        line->write("07.12.26 09:10:00;RING;1;0891234567;3012345671;SIP1;\n07.12.26 09:10:30;DISCONNECT;1;0;\n");
        QVERIFY(line->waitForBytesWritten(5000));
        QTRY_COMPARE_WITH_TIMEOUT(
            env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG WHERE LID = 101 AND FROMPHONE = '0891234567'")).toInt(),
            1, 15000);
        // A conflict is no failure: the attachment was kept and nothing was reported.
        QVERIFY2(!output.contains("nicht protokolliert"), output.constData());
        held.rollback();
    }

    void aBusyProgramDoesNotHoldUpTheLog()
    {
        ProgramTestEnv env(QDateTime(QDate(2026, 12, 7), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        test::MessageReceiver program;
        MonitorLink link;
        QVERIFY(link.startListening(&program));
        QTcpServer router;
        QVERIFY(router.listen(QHostAddress::LocalHost));
        QProcess monitor;
        monitor.setProcessChannelMode(QProcess::MergedChannels);
        const auto cleanup = qScopeGuard([&monitor] {
            monitor.kill();
            monitor.waitForFinished(10000);
        });
        monitor.start(rufwarteProgram(), {QStringLiteral("run"), QStringLiteral("--program-folder"), env.folder(),
                                          QStringLiteral("--router"),
                                          QStringLiteral("127.0.0.1:%1").arg(router.serverPort())});
        QVERIFY(router.waitForNewConnection(15000));
        QTcpSocket* line = router.nextPendingConnection();
        // More calls than the program's socket keeps waiting connections for.
        constexpr int calls = 150;
        QByteArray session;
        for (int i = 0; i < calls; ++i)
            session += QStringLiteral("07.12.26 10:%1:00;RING;%2;0891234%3;3012345670;SIP0;\n"
                                      "07.12.26 10:%1:05;DISCONNECT;%2;0;\n")
                           .arg(i % 60, 2, 10, QLatin1Char('0'))
                           .arg(i % 30)
                           .arg(i, 3, 10, QLatin1Char('0'))
                           .toLatin1();
        line->write(session);
        QVERIFY(line->waitForBytesWritten(5000));

        // The program is busy: nothing here runs its event loop, so it accepts no message. The
        // calls still reach the log at the monitor's own pace.
        const auto logged = [&env] { return env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG")).toInt(); };
        QElapsedTimer busy;
        busy.start();
        while (logged() < calls && busy.elapsed() < 20000)
            QThread::msleep(100);
        QCOMPARE(logged(), calls);

        // Once it is free again it hears of the newest call.
        const int newest = env.db().scalar(QStringLiteral("SELECT MAX(LID) FROM LOG")).toInt();
        QTRY_VERIFY_WITH_TIMEOUT(!program.got.isEmpty() && program.got.constLast().wParam == newest, 15000);
    }

    void aBadRouterAddressIsRefused()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        QTemporaryDir folder;
        for (const char* address : {"router:99999", "router:", "[::1", "two words"}) {
            QProcess p;
            p.start(rufwarteProgram(), {QStringLiteral("run"), QStringLiteral("--program-folder"), folder.path(),
                                        QStringLiteral("--router"), QLatin1String(address)});
            QVERIFY(p.waitForFinished(10000));
            QCOMPARE(p.exitCode(), 2);
            QVERIFY(QString::fromLocal8Bit(p.readAllStandardError()).contains(QStringLiteral("Adresse des Routers")));
        }
        // Without the option the monitor's settings name the router.
        QFile settings(QDir(folder.path()).filePath(QStringLiteral("ISDNStore")));
        QVERIFY(settings.open(QIODevice::WriteOnly));
        settings.write("[MoniOptions]\r\nAC=1\r\nROUTER=fritz.box:0\r\n");
        settings.close();
        QProcess p;
        p.start(rufwarteProgram(), {QStringLiteral("run"), QStringLiteral("--program-folder"), folder.path()});
        QVERIFY(p.waitForFinished(10000));
        QCOMPARE(p.exitCode(), 2);
        QVERIFY(QString::fromLocal8Bit(p.readAllStandardError()).contains(QStringLiteral("fritz.box:0")));
    }

private:
    QTemporaryDir m_runtime;
};

ORVANTA_TEST(TestRouterMonitor)
#include "tst_routermonitor.moc"
