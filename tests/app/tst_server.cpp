// The program and the monitor on a real Firebird server reached over TCP, as on several desks
// that share one call database: credentials from the registry stand-in, refusals, two writers at
// once, a server that goes away in the middle of a unit of work, and one that never answers.

#include "calllog/LogStatements.h"
#include "db/DatabaseError.h"
#include "db/FbStatement.h"
#include "db/StoredConnection.h"
#include "db/TDM2.h"
#include "db/TransactionWork.h"
#include "platform/ErrorLog.h"
#include "platform/MonitorLink.h"
#include "tests/TestPaths.h"
#include "tests/support/FirebirdServer.h"
#include "tests/support/ScriptedDialogService.h"
#include "tests/support/TestRegistry.h"

#include <QElapsedTimer>
#include <QFile>
#include <QProcess>
#include <QTest>

using namespace orvanta;
using orvanta::test::FirebirdServer;
using orvanta::test::ScopedScriptedDialogs;

namespace {

const QString kNoConnection = QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!");

QString rufwarteProgram()
{
    return QStringLiteral(ORVANTA_BIN_DIR "/rufwarte");
}

// A desk: registry stand-in, error log and message sockets in a folder of its own.
class Desk final {
public:
    Desk()
    {
        qputenv("VARNIK_HKLM", registryFile().toLocal8Bit());
        qputenv("XDG_RUNTIME_DIR", m_dir.path().toLocal8Bit());
        m_log = std::make_unique<TvkErrorLog>(m_dir.path(), 20, QStringLiteral("OXError.log"));
        setErrorLog(m_log.get());
    }
    ~Desk()
    {
        setErrorLog(nullptr);
        qunsetenv("VARNIK_HKLM");
    }
    Desk(const Desk&) = delete;
    Desk& operator=(const Desk&) = delete;

    [[nodiscard]] QString registryFile() const { return m_dir.filePath(QStringLiteral("hklm.ini")); }
    [[nodiscard]] bool store(const QString& database, const QString& user, const QString& password) const
    {
        return StoredConnection{database, user, password}.write();
    }
    test::ScriptedDialogService& dialogs() { return m_dialogs.service(); }

private:
    QTemporaryDir m_dir;
    ScopedScriptedDialogs m_dialogs;
    std::unique_ptr<TvkErrorLog> m_log;
};

QVariant scalar(FbAttachment& db, const QString& sql)
{
    FbTransaction tx(db);
    tx.start();
    FbStatement st(db, &tx, sql);
    st.execute();
    QVariant v = st.next() ? st.value(0) : QVariant();
    st.close();
    tx.commit();
    return v;
}

bool insertCall(TDM2& dm, int lid, const QString& number)
{
    return runInTransaction(dm.IBSQLTS, QStringLiteral("# Test - Anruf"), [&] {
        FbStatement st(dm.IBDatabase1, &dm.IBSQLTS,
                       QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, FROMPHONE, CTYPE, SERVICE, STATUS) "
                                      "VALUES (:LID, CURRENT_DATE, CURRENT_TIME, :FP, 0, 1, 'angenommen')"));
        st.setParam(u"LID", lid);
        st.setParam(u"FP", number);
        st.execute();
    });
}

QStringList numbersInLog(TDM2& dm)
{
    QStringList numbers;
    dm.ibcds_log.open();
    for (dm.ibcds_log.first(); !dm.ibcds_log.eof(); dm.ibcds_log.next())
        numbers << dm.ibcds_log.fieldByName(u"FROMPHONE").asString();
    dm.ibcds_log.close();
    numbers.sort();
    return numbers;
}

} // namespace

class TstServer final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        if (const QString why = FirebirdServer::unavailableReason(); !why.isEmpty())
            QSKIP(qPrintable(why));
    }

    void storedCredentialsAreAcceptedByTheServer()
    {
        FirebirdServer server;
        QVERIFY2(server.start(), qPrintable(server.error()));
        Desk desk;
        const QString name = server.databaseName(server.newDatabase(QStringLiteral("calls.fdb")));
        QVERIFY(desk.store(name, QString::fromLatin1(FirebirdServer::User), server.password()));
        // The registry holds neither credential as written.
        QFile ini(desk.registryFile());
        QVERIFY(ini.open(QIODevice::ReadOnly));
        const QByteArray stored = ini.readAll();
        QVERIFY(stored.contains(name.toUtf8()));
        QVERIFY(!stored.contains("SYSDBA"));
        QVERIFY(!stored.contains(server.password().toUtf8()));

        TDM2 dm;
        QVERIFY2(dm.DBConnect(), qPrintable(desk.dialogs().texts().join(u'\n')));
        QCOMPARE(dm.IBDatabase1.databaseName(), name);
        // Through the network layer with the server's own authentication, not in-process.
        QCOMPARE(scalar(dm.IBDatabase1, QStringLiteral("SELECT TRIM(MON$REMOTE_PROTOCOL) || '/' || TRIM(MON$AUTH_METHOD) "
                                                       "FROM MON$ATTACHMENTS WHERE MON$ATTACHMENT_ID = CURRENT_CONNECTION"))
                     .toString(),
                 QStringLiteral("TCPv4/Srp"));
        QVERIFY(insertCall(dm, 1, QStringLiteral("0301234567")));
        QCOMPARE(numbersInLog(dm), QStringList{QStringLiteral("0301234567")});
        QCOMPARE(desk.dialogs().count(), 0);
    }

    void refusedConnectionsMeanNoConnection()
    {
        FirebirdServer server;
        QVERIFY2(server.start(), qPrintable(server.error()));
        Desk desk;
        const QString name = server.databaseName(server.newDatabase(QStringLiteral("calls.fdb")));

        // A wrong password: the module starts unconnected and every later use says so.
        QVERIFY(desk.store(name, QString::fromLatin1(FirebirdServer::User), server.password() + u'x'));
        {
            TDM2 dm;
            QVERIFY(!dm.IBDatabase1.isConnected());
            QCOMPARE(desk.dialogs().count(), 1);
            QVERIFY2(desk.dialogs().last().text.startsWith(
                         QStringLiteral("# DM2 - DataModuleCreate\r\nEIBInterBaseError / Your user name and password "
                                        "are not defined")),
                     qPrintable(desk.dialogs().last().text));
            QVERIFY(!dm.DBConnect());
            QCOMPARE(desk.dialogs().last().text, kNoConnection);
            QCOMPARE(desk.dialogs().last().kind, DialogKind::Error);
        }

        // A server that is not there refuses at once; the same for the program.
        server.stop();
        QVERIFY(desk.store(name, QString::fromLatin1(FirebirdServer::User), server.password()));
        QElapsedTimer timer;
        timer.start();
        TDM2 dm;
        QVERIFY(!dm.IBDatabase1.isConnected());
        QVERIFY(timer.elapsed() < 5000);
        QVERIFY(!dm.DBConnect());
        QCOMPARE(desk.dialogs().last().text, kNoConnection);
    }

    void programAndMonitorWriteTheSameDatabase()
    {
        QVERIFY2(QFileInfo::exists(rufwarteProgram()), "the rufwarte program is missing from the build");
        FirebirdServer server;
        QVERIFY2(server.start(), qPrintable(server.error()));
        Desk desk;
        const QString name = server.databaseName(server.newDatabase(QStringLiteral("calls.fdb")));
        QVERIFY(desk.store(name, QString::fromLatin1(FirebirdServer::User), server.password()));

        TDM2 dm;
        QVERIFY(dm.DBConnect());
        QProcess monitor;
        monitor.setProcessChannelMode(QProcess::MergedChannels);
        monitor.start(rufwarteProgram(), {QStringLiteral("run")});
        QVERIFY(monitor.waitForStarted());
        QTRY_VERIFY_WITH_TIMEOUT(MonitorLink::sendLine(MonitorLink::monitorSocketPath(), 0, 0, 0, 300), 15000);
        const auto call = [](const QString& number) {
            QProcess c;
            c.start(rufwarteProgram(), {QStringLiteral("call"), number});
            return c.waitForFinished(20000) ? c.readAllStandardOutput().trimmed().toInt() : -1;
        };

        // Both attached at once, from two processes.
        QCOMPARE(scalar(dm.IBDatabase1, QStringLiteral("SELECT COUNT(DISTINCT MON$REMOTE_PID) FROM MON$ATTACHMENTS "
                                                       "WHERE MON$REMOTE_PROTOCOL IS NOT NULL"))
                     .toInt(),
                 2);
        // The program writes a call, the monitor numbers its own past it: it sees the program's row.
        QVERIFY(insertCall(dm, 40, QStringLiteral("0401111")));
        QCOMPARE(call(QStringLiteral("0891234567")), 41);
        // ... and the program sees the monitor's, while both stay attached.
        QCOMPARE(numbersInLog(dm), (QStringList{QStringLiteral("0401111"), QStringLiteral("0891234567")}));
        QVERIFY(insertCall(dm, 42, QStringLiteral("0402222")));
        QCOMPARE(call(QStringLiteral("0301111")), 43);
        QCOMPARE(numbersInLog(dm).size(), 4);
        QCOMPARE(desk.dialogs().count(), 0);

        QProcess quit;
        quit.start(rufwarteProgram(), {QStringLiteral("quit")});
        QVERIFY(quit.waitForFinished(15000));
        QVERIFY(monitor.waitForFinished(15000));
    }

    void serverGoneMidTransaction()
    {
        FirebirdServer server;
        QVERIFY2(server.start(), qPrintable(server.error()));
        Desk desk;
        const QString name = server.databaseName(server.newDatabase(QStringLiteral("calls.fdb")));
        QVERIFY(desk.store(name, QString::fromLatin1(FirebirdServer::User), server.password()));
        {
            TDM2 dm;
            QVERIFY(insertCall(dm, 1, QStringLiteral("0301")));
            dm.ibcds_log.open(); // a list holding its snapshot when the server goes

            // The unit's first row is written, then the server dies before the second.
            const QString label = QStringLiteral("# Test - Anrufe");
            const bool saved = runInTransaction(dm.IBSQLTS, label, [&] {
                FbStatement st(dm.IBDatabase1, &dm.IBSQLTS,
                               QStringLiteral("INSERT INTO LOG (LID, FROMPHONE) VALUES (:LID, '0302')"));
                st.setParam(u"LID", 2);
                st.execute();
                server.kill();
                st.setParam(u"LID", 3);
                st.execute();
            });
            QVERIFY(!saved);
            QVERIFY(!dm.IBSQLTS.isActive());
            QCOMPARE(desk.dialogs().count(), 1);
            QVERIFY2(desk.dialogs().last().text.startsWith(label + QStringLiteral("\r\nEIBInterBaseError / ")),
                     qPrintable(desk.dialogs().last().text));

            // The program goes on: it says it has no connection, and the lists fail without harm.
            QVERIFY(!dm.DBConnect());
            QCOMPARE(desk.dialogs().last().text, kNoConnection);
            QVERIFY(!dm.IBDatabase1.isConnected());
            QVERIFY(!dm.DBConnect());
            QVERIFY_THROWS_EXCEPTION(DatabaseError, dm.ibcds_log.open());

            // The server back: the next start connects and has the committed row only.
            QVERIFY2(server.start(), qPrintable(server.error()));
        }
        desk.dialogs().clear();
        TDM2 again;
        QVERIFY(again.DBConnect());
        QCOMPARE(numbersInLog(again), QStringList{QStringLiteral("0301")});
        QVERIFY(insertCall(again, 2, QStringLiteral("0302")));
        QCOMPARE(desk.dialogs().count(), 0);
    }

    void silentServerTimesOut()
    {
        const test::SilentListener silent;
        QVERIFY(silent.port() != 0);
        const QString name = QStringLiteral("127.0.0.1/%1:/srv/calls.fdb").arg(silent.port());
        // The time-out is a connection parameter; the program leaves it at its default of 15 s.
        FbAttachment db(name, {QStringLiteral("user_name=SYSDBA"), QStringLiteral("password=x"),
                               QStringLiteral("connect_timeout=2")});
        QElapsedTimer timer;
        timer.start();
        QVERIFY_THROWS_EXCEPTION(DatabaseError, db.connect());
        QVERIFY2(timer.elapsed() >= 1500 && timer.elapsed() < 8000, qPrintable(QString::number(timer.elapsed())));
        QVERIFY(!db.isConnected());
        QVERIFY(!db.ping());
    }
};

ORVANTA_TEST(TstServer)
#include "tst_server.moc"
