#include "calllog/LogStatements.h"
#include "db/CredentialCipher.h"
#include "db/DatabaseError.h"
#include "db/TDM2.h"
#include "db/TDM2Statements.h"
#include "platform/ErrorLog.h"
#include "platform/Registry.h"
#include "tests/support/ScriptedDialogService.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;
using orvanta::test::ScopedScriptedDialogs;
using orvanta::test::TempDatabase;

namespace {

const QString kNoConnection = QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!");

// A registry file of the test with the monitor's key, and an installed error log.
class Environment final {
public:
    Environment()
    {
        qputenv("VARNIK_HKLM", m_dir.filePath(QStringLiteral("hklm.ini")).toLocal8Bit());
        m_log = std::make_unique<TvkErrorLog>(m_dir.path(), 20, QStringLiteral("OXError.log"));
        setErrorLog(m_log.get());
    }
    ~Environment()
    {
        setErrorLog(nullptr);
        qunsetenv("VARNIK_HKLM");
    }
    void write(const QString& database, const QString& user, const QString& password)
    {
        Registry r(RegistryRoot::LocalMachine);
        QVERIFY(r.openKey(QStringLiteral("Software\\Varnik\\Rufwarte"), true));
        QVERIFY(r.writeString(QStringLiteral("Database"), database));
        QVERIFY(r.writeString(QStringLiteral("Username"), user));
        QVERIFY(r.writeString(QStringLiteral("Password"), password));
    }
    void writeGood(const QString& database)
    {
        write(database, CredentialCipher::encrypt(QStringLiteral("SYSDBA")),
              CredentialCipher::encrypt(QStringLiteral("masterkey")));
    }

private:
    QTemporaryDir m_dir;
    std::unique_ptr<TvkErrorLog> m_log;
};

} // namespace

class TstDm2 final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void connectsFromRegistry();
    void unconnectedStarts_data();
    void unconnectedStarts();
    void listReopenRollsBackAndRestarts();
    void logListSnapshotAndCommit();
    void olderDatabaseGetsTheLogObjects();
};

void TstDm2::connectsFromRegistry()
{
    ScopedScriptedDialogs dialogs;
    Environment env;
    TempDatabase db;
    env.writeGood(db.path());
    {
        TDM2 dm;
        QVERIFY(dm.IBDatabase1.isConnected());
        QCOMPARE(dm.IBDatabase1.databaseName(), db.path());
        QCOMPARE(dm.IBDatabase1.params(), (QStringList{QStringLiteral("user_name=SYSDBA"), QStringLiteral("password=masterkey"),
                                                       QStringLiteral("lc_ctype=ISO8859_1")}));
        QVERIFY(dm.DBConnect());
        QCOMPARE(dm.CurLogLID, -1);
        QCOMPARE(dm.CurLogCID, -1);
        QCOMPARE(dm.CurLogABID, -1);
        QCOMPARE(dm.CurLogCType, -1);
        QVERIFY(dm.CurLogFromPhone.isEmpty());
        QCOMPARE(dm.SelectedLID, -1);
        QCOMPARE(dm.SummaryDelay, 10);
        QCOMPARE(dm.ibta2.params(), (QStringList{"concurrency", "nowait"}));
        QCOMPARE(dm.logts.params(), (QStringList{"concurrency", "nowait"}));
        QVERIFY(dm.IBTransaction1.params().isEmpty());
        QCOMPARE(dm.LogDetailTS.endAction(), FbTransaction::EndAction::None);
        QCOMPARE(dm.dataSet(QStringLiteral("IBCDS_LOG")), &dm.ibcds_log);
        QCOMPARE(dm.ibcds_numbers.commandText(), QString::fromLatin1(dmsql::kSelectContactNumbers));
        QCOMPARE(dm.GetFromNr.commandText(), QString::fromLatin1(dmsql::kSelectFromPhone));

        // Every list opens against the schema and closes with its transaction ended.
        for (DataSet* ds : {&dm.ibcds_list, &dm.ibcds_card, &dm.kat_list, &dm.katdetail, &dm.ibcds_log, &dm.ibcds_numbers}) {
            ds->open();
            QVERIFY2(ds->transaction()->isActive(), qPrintable(ds->name()));
            ds->close();
            QVERIFY2(!ds->transaction()->isActive(), qPrintable(ds->name()));
        }
        dm.ibcds_log.open(); // left open: destruction closes it and disconnects
    }
    QCOMPARE(dialogs->count(), 0);
}

void TstDm2::unconnectedStarts_data()
{
    QTest::addColumn<int>("kind");
    QTest::addColumn<QString>("report");
    QTest::addColumn<QString>("detail");
    QTest::newRow("no registry file") << 0 << "# DM2 - DataModuleCreate" << "EIBInterBaseError / ";
    QTest::newRow("undecodable password") << 1 << "# DM2 - GetDBData" << "EConvertError / BASE64-Daten unvollständig.";
    QTest::newRow("missing database") << 2 << "# DM2 - DataModuleCreate" << "EIBInterBaseError / ";
    QTest::newRow("wrong password text") << 3 << "# DM2 - DataModuleCreate" << "EIBInterBaseError / ";
}

void TstDm2::unconnectedStarts()
{
    QFETCH(int, kind);
    QFETCH(QString, report);
    QFETCH(QString, detail);
    ScopedScriptedDialogs dialogs;
    Environment env;
    QTemporaryDir dir;
    const QString missing = dir.filePath(QStringLiteral("nowhere.fdb"));
    if (kind == 1)
        env.write(missing, CredentialCipher::encrypt(QStringLiteral("SYSDBA")), QStringLiteral("QU JD\r\nR"));
    else if (kind == 2)
        env.writeGood(missing);
    else if (kind == 3)
        env.write(QStringLiteral("/nonexistent-dir/x.fdb"), QStringLiteral("c2VjcmV0"), QStringLiteral("c2VjcmV0"));

    TDM2 dm;
    QVERIFY(!dm.IBDatabase1.isConnected());
    QCOMPARE(dialogs->count(), 1);
    QVERIFY2(dialogs->last().text.startsWith(report + QStringLiteral("\r\n") + detail), qPrintable(dialogs->last().text));
    QCOMPARE(dm.SummaryDelay, 10);

    // Each later attempt reports that there is no connection, and nothing tries to reconnect.
    QVERIFY(!dm.DBConnect());
    QVERIFY(!dm.DBConnect());
    QCOMPARE(dialogs->count(), 3);
    QCOMPARE(dialogs->last().text, kNoConnection);
    QCOMPARE(dialogs->last().kind, DialogKind::Error);
    QVERIFY_THROWS_EXCEPTION(DatabaseError, dm.ibcds_log.open());
    QVERIFY(!dm.IBDatabase1.isConnected());
}

void TstDm2::listReopenRollsBackAndRestarts()
{
    ScopedScriptedDialogs dialogs;
    Environment env;
    TempDatabase db;
    env.writeGood(db.path());
    TDM2 dm;
    QVERIFY(dm.DBConnect());
    db.exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Familie');"));

    // The detail query has no after-close hook: its snapshot transaction stays active after closing.
    dm.GetDetailQuery.setCommandText(QStringLiteral("SELECT * FROM KAT"));
    dm.GetDetailQuery.open();
    QCOMPARE(dm.GetDetailQuery.rowCount(), 1);
    dm.GetDetailQuery.close();
    QVERIFY(dm.DetailTS.isActive());
    db.exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (2, 'Büro');"));
    // Without the rollback and restart this reopening would still see the old snapshot.
    dm.GetDetailQuery.open();
    QCOMPARE(dm.GetDetailQuery.rowCount(), 2);

    // An uncommitted change left in the transaction is rolled back by the next opening.
    FbStatement stray(dm.IBDatabase1, &dm.DetailTS, QStringLiteral("DELETE FROM KAT"));
    stray.execute();
    dm.GetDetailQuery.close();
    dm.GetDetailQuery.open();
    QCOMPARE(dm.GetDetailQuery.rowCount(), 2);
    dm.GetDetailQuery.post(); // after posting: commit
    QVERIFY(!dm.DetailTS.isActive());

    // A list commits on closing, so a change made in its transaction meanwhile is kept.
    dm.kat_list.open();
    FbStatement rename(dm.IBDatabase1, &dm.katlist_ts, QStringLiteral("UPDATE KAT SET KATBEZ = 'Sport' WHERE LID = 2"));
    rename.execute();
    dm.kat_list.refresh();
    QCOMPARE(dm.kat_list.rowCount(), 2);
    QVERIFY(dm.kat_list.locate(u"KATBEZ", QStringLiteral("Sport")));
    dm.kat_list.close();
    QVERIFY(!dm.katlist_ts.isActive());
    QCOMPARE(dialogs->count(), 0);
}

void TstDm2::logListSnapshotAndCommit()
{
    ScopedScriptedDialogs dialogs;
    Environment env;
    TempDatabase db;
    env.writeGood(db.path());
    TDM2 dm;
    db.exec(QStringLiteral("INSERT INTO LOG (LID, FROMPHONE, FROMBEZ, TSDATE, TSTIME, CID, CTYPE, CTIME, CCHARGE, ABID)"
                           " VALUES (1, '0301234', 'Jörg', '2024-05-01', '10:00:00', 0, 1, '00:01:30', 0.12, 0);"));
    dm.ibcds_log.setCommandText(QString::fromLatin1(logsql::kSelectLogOfDay));
    dm.ibcds_log.setParam(QStringLiteral("TSD"), QDate(2024, 5, 1));
    dm.ibcds_log.open();
    QCOMPARE(dm.ibcds_log.rowCount(), 1);
    const RecordStore& s = dm.ibcds_log.store();
    QCOMPARE(s.text(0, s.fieldIndex(u"FROMBEZ")), QStringLiteral("Jörg"));
    QCOMPARE(s.scaled(0, s.fieldIndex(u"CCHARGE"), 2), 12);
    QCOMPARE(s.time(0, s.fieldIndex(u"CTIME")), QTime(0, 1, 30));

    // The monitor's uncommitted write blocks a change through the list's transaction at once.
    auto monitor = db.newAttachment();
    FbTransaction mt(*monitor);
    mt.start();
    FbStatement mu(*monitor, &mt, QStringLiteral("UPDATE LOG SET STATUS = 'x' WHERE LID = 1"));
    mu.execute();
    FbStatement mine(dm.IBDatabase1, &dm.logts, QStringLiteral("UPDATE LOG SET BEMERK = 'y' WHERE LID = 1"));
    try {
        mine.execute();
        QFAIL("no conflict");
    } catch (const DatabaseError& e) {
        QVERIFY(e.isLockConflict());
    }
    mt.commit();
    dm.ibcds_log.close();
    QVERIFY(!dm.logts.isActive());
}

// A database made before the log's indexes and change counters existed gets them on connect;
// while another attachment holds LOG in use, the program still connects and logs what it could
// not add, and the next connect adds it.
void TstDm2::olderDatabaseGetsTheLogObjects()
{
    ScopedScriptedDialogs dialogs;
    Environment env;
    TempDatabase db;
    env.writeGood(db.path());
    const auto count = [&db](const char* catalogue) { return db.scalar(QString::fromLatin1(catalogue)).toInt(); };
    const char* objects = "SELECT (SELECT COUNT(*) FROM RDB$INDICES WHERE RDB$INDEX_NAME STARTING 'IX_LOG_TSDATE_TSTIME') "
                          "+ (SELECT COUNT(*) FROM RDB$GENERATORS WHERE RDB$GENERATOR_NAME IN ('GEN_LOG_INSERTS', "
                          "'GEN_LOG_CHANGES')) + (SELECT COUNT(*) FROM RDB$TRIGGERS WHERE RDB$TRIGGER_NAME IN "
                          "('LOG_AI', 'LOG_AUD')) FROM RDB$DATABASE";
    const auto dropAll = [&db] {
        for (const char* ddl : {"DROP TRIGGER LOG_AI", "DROP TRIGGER LOG_AUD", "DROP GENERATOR GEN_LOG_INSERTS",
                                "DROP GENERATOR GEN_LOG_CHANGES", "DROP INDEX IX_LOG_TSDATE_TSTIME",
                                "DROP INDEX IX_LOG_TSDATE_TSTIME_DESC"})
            db.exec(QString::fromLatin1(ddl) + u';');
    };
    QCOMPARE(count(objects), 6);
    dropAll();
    QCOMPARE(count(objects), 0);
    {
        TDM2 dm;
        QVERIFY(dm.IBDatabase1.isConnected());
    }
    QCOMPARE(count(objects), 6);
    // The triggers count into the generators again.
    db.exec(QStringLiteral("INSERT INTO LOG (LID, FROMPHONE, TSDATE, TSTIME) VALUES (1, '030', '2024-05-01', '10:00:00');"
                           "UPDATE LOG SET BEMERK = 'x';"));
    QCOMPARE(count("SELECT GEN_ID(GEN_LOG_INSERTS, 0) FROM RDB$DATABASE"), 1);
    QCOMPARE(count("SELECT GEN_ID(GEN_LOG_CHANGES, 0) FROM RDB$DATABASE"), 1);

    // The creation of the trigger fails while another attachment has LOG in use: the program
    // works without it.
    dropAll();
    auto other = db.newAttachment();
    FbTransaction ot(*other);
    ot.start();
    FbStatement busy(*other, &ot, QStringLiteral("UPDATE LOG SET BEMERK = 'y'"));
    busy.execute();
    {
        TDM2 dm;
        QVERIFY(dm.IBDatabase1.isConnected());
        QVERIFY(dm.DBConnect());
    }
    QVERIFY(count(objects) < 6); // the triggers were refused
    ot.commit();
    QCOMPARE(dialogs->count(), 0);
    {
        TDM2 dm;
    }
    QCOMPARE(count(objects), 6);
}

ORVANTA_TEST(TstDm2)
#include "tst_dm2.moc"
