#include "db/DatabaseError.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/SqlParams.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"

#include <QElapsedTimer>
#include <QTest>

using namespace orvanta;
using orvanta::test::TempDatabase;

namespace {

const char* const kTypesTable = R"(
CREATE TABLE T (
  ID INTEGER NOT NULL PRIMARY KEY,
  S SMALLINT,
  B BIGINT,
  V VARCHAR(40),
  C CHAR(10),
  D DATE,
  TM TIME,
  TS TIMESTAMP,
  N NUMERIC(15,2),
  N9 NUMERIC(9,2),
  DB DOUBLE PRECISION,
  TX BLOB SUB_TYPE TEXT,
  BN BLOB SUB_TYPE 0
);
)";

} // namespace

class TstFbLayer final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void namedParameterParsing_data();
    void namedParameterParsing();
    void typedRoundTripWithNulls();
    void parametersByName();
    void procedureOutputs();
    void blobs();
    void errorsCarryCode();
    void transactionStates();
    void nowaitWriteFailsAtOnce();
    void attachAndCreate();
};

void TstFbLayer::namedParameterParsing_data()
{
    QTest::addColumn<QString>("sql");
    QTest::addColumn<QString>("expected");
    QTest::addColumn<QStringList>("names");

    QTest::newRow("twice") << "UPDATE LOG SET A = :fb WHERE (B = :Fp) or (C = :FB)"
                           << "UPDATE LOG SET A = ? WHERE (B = ?) or (C = ?)" << QStringList{"FB", "FP", "FB"};
    QTest::newRow("literal") << "SELECT ':X' || :Y FROM R WHERE Z = 'it''s :not'"
                             << "SELECT ':X' || ? FROM R WHERE Z = 'it''s :not'" << QStringList{"Y"};
    QTest::newRow("comments") << "SELECT 1 -- :A\nFROM R /* :B */ WHERE C = :C"
                              << "SELECT 1 -- :A\nFROM R /* :B */ WHERE C = ?" << QStringList{"C"};
    QTest::newRow("quoted name") << "SELECT \"a:b\" FROM R WHERE X=:x1_$"
                                 << "SELECT \"a:b\" FROM R WHERE X=?" << QStringList{"X1_$"};
    QTest::newRow("unterminated") << "SELECT ':A" << "SELECT ':A" << QStringList{};
    QTest::newRow("day plus one") << "where (TSDATE >= :Day) and (TSDATE <= :Day + 1)"
                                  << "where (TSDATE >= ?) and (TSDATE <= ? + 1)" << QStringList{"DAY", "DAY"};
}

void TstFbLayer::namedParameterParsing()
{
    QFETCH(QString, sql);
    QFETCH(QString, expected);
    QFETCH(QStringList, names);
    const ParsedSql p = parseNamedParameters(sql);
    QCOMPARE(p.sql, expected);
    QCOMPARE(p.names, names);
}

void TstFbLayer::typedRoundTripWithNulls()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QString::fromLatin1(kTypesTable));
    FbAttachment& a = db.attachment();
    FbTransaction tx(a);
    tx.start();
    FbStatement ins(a, &tx,
                    QStringLiteral("INSERT INTO T (ID, S, B, V, C, D, TM, TS, N, N9, DB, TX) "
                                   "VALUES (:ID, :S, :B, :V, :C, :D, :TM, :TS, :N, :N9, :DB, :TX)"));
    const QString umlauts = QStringLiteral("Müller-Lüdenscheidt ÄÖÜß €");
    ins.setParam(u"id", 1);
    ins.setParam(u"S", -12);
    ins.setParam(u"B", Q_INT64_C(9000000000));
    ins.setParam(u"V", umlauts);
    ins.setParam(u"C", QStringLiteral("Grün"));
    ins.setParam(u"D", QDate(2024, 2, 29));
    ins.setParam(u"TM", QTime(23, 59, 58, 120));
    ins.setParam(u"TS", QDateTime(QDate(1999, 12, 31), QTime(8, 5, 3)));
    ins.setParam(u"N", 12.345); // rounds to places
    ins.setParamScaled(u"N9", -705, 2);
    ins.setParam(u"DB", 0.25);
    ins.setParam(u"TX", QStringLiteral("Notiz mit Ümlaut"));
    ins.execute();
    QCOMPARE(ins.rowsAffected(), 1);
    ins.clearParams();
    ins.setParam(u"ID", 2); // everything else NULL
    ins.execute();
    tx.commit();

    tx.start();
    FbStatement sel(a, &tx, QStringLiteral("SELECT * FROM T ORDER BY ID"));
    sel.execute();
    QVERIFY(sel.next());
    QCOMPARE(sel.columnCount(), 13);
    QCOMPARE(sel.column(sel.columnIndex(u"v")).type, FbType::Varchar);
    QCOMPARE(sel.column(sel.columnIndex(u"v")).width, 40);
    QCOMPARE(sel.column(sel.columnIndex(u"C")).type, FbType::Char);
    QCOMPARE(sel.column(sel.columnIndex(u"N")).type, FbType::Numeric);
    QCOMPARE(sel.column(sel.columnIndex(u"N")).scale, 2);
    QCOMPARE(sel.column(sel.columnIndex(u"TX")).type, FbType::TextBlob);
    QCOMPARE(sel.column(sel.columnIndex(u"S")).type, FbType::SmallInt);
    QCOMPARE(sel.asInt(u"ID"), 1);
    QCOMPARE(sel.asInt(u"S"), -12);
    QCOMPARE(sel.asInt64(u"B"), Q_INT64_C(9000000000));
    QCOMPARE(sel.asString(u"V"), umlauts);
    QCOMPARE(sel.asString(u"C"), QStringLiteral("Grün")); // padding removed
    QCOMPARE(sel.asDate(u"D"), QDate(2024, 2, 29));
    QCOMPARE(sel.asTime(u"TM"), QTime(23, 59, 58, 120));
    QCOMPARE(sel.asDateTime(u"TS"), QDateTime(QDate(1999, 12, 31), QTime(8, 5, 3)));
    QCOMPARE(sel.asScaled(sel.columnIndex(u"N"), 2), 1235);
    QCOMPARE(sel.asString(u"N"), QStringLiteral("12.35"));
    QCOMPARE(sel.asScaled(sel.columnIndex(u"N9"), 2), -705);
    QCOMPARE(sel.asString(u"N9"), QStringLiteral("-7.05"));
    QCOMPARE(sel.asDouble(u"N9"), -7.05);
    QCOMPARE(sel.asDouble(u"DB"), 0.25);
    QCOMPARE(sel.asString(u"TX"), QStringLiteral("Notiz mit Ümlaut"));
    QVERIFY(sel.isNull(u"BN"));
    // The bytes stored are ISO 8859-1 (one byte per umlaut).
    QCOMPARE(sel.asBytes(sel.columnIndex(u"C")), QByteArray("Gr\xFCn"));

    QVERIFY(sel.next());
    for (int i = 1; i < sel.columnCount(); ++i) {
        QVERIFY2(sel.isNull(i), qPrintable(sel.column(i).name));
        QVERIFY(!sel.value(i).isValid());
        QCOMPARE(sel.asString(i), QString());
        QCOMPARE(sel.asInt64(i), 0);
    }
    QVERIFY(!sel.next());
    QVERIFY(!sel.isOpen());
    QVERIFY_THROWS_EXCEPTION(DatabaseError, (void)sel.asString(u"NOPE"));
    tx.commit();
}

void TstFbLayer::parametersByName()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE L (LID INTEGER, FROMPHONE VARCHAR(25), FROMSUBB VARCHAR(25), FROMBEZ VARCHAR(80));"
                           "INSERT INTO L VALUES (1, '0301', 'x', 'a');"
                           "INSERT INTO L VALUES (2, 'y', '0301', 'b');"
                           "INSERT INTO L VALUES (3, 'z', 'z', ':FP literal');"));
    FbAttachment& a = db.attachment();
    FbTransaction tx(a);
    tx.start();
    FbStatement up(a, &tx,
                   QStringLiteral("UPDATE L SET FROMBEZ = :FB WHERE (FROMPHONE = :FP) or (FROMSUBB = :fp) "
                                  "or (FROMBEZ = ':FP literal' and 1 = 0)"));
    QCOMPARE(up.paramNames(), (QStringList{"FB", "FP"}));
    up.setParam(u"fb", QStringLiteral("Schäfer"));
    up.setParam(u"Fp", QStringLiteral("0301"));
    up.execute();
    QCOMPARE(up.rowsAffected(), 2);
    QVERIFY_THROWS_EXCEPTION(DatabaseError, up.setParam(u"FS", 1));
    // A text longer than the column is refused, not cut.
    up.setParam(u"FP", QString(30, QLatin1Char('9')));
    QVERIFY_THROWS_EXCEPTION(DatabaseError, up.execute());
    tx.commit();
    QCOMPARE(db.scalar(QStringLiteral("SELECT COUNT(*) FROM L WHERE FROMBEZ = 'Schäfer'")).toInt(), 2);
    QCOMPARE(db.scalar(QStringLiteral("SELECT FROMBEZ FROM L WHERE LID = 3")).toString(), QStringLiteral(":FP literal"));

    // Integers bound as text and text bound as integers are converted by the server.
    tx.start();
    FbStatement sel(a, &tx, QStringLiteral("SELECT LID FROM L WHERE LID = :ID OR FROMPHONE = :P ORDER BY LID"));
    sel.setParam(u"ID", QStringLiteral("2"));
    sel.setParam(u"P", QStringLiteral("z"));
    sel.execute();
    QVERIFY(sel.next());
    QCOMPARE(sel.asInt(0), 2);
    QVERIFY(sel.next());
    QCOMPARE(sel.asInt(0), 3);
    QVERIFY(!sel.next());
    // Re-executing with other values reuses the prepared statement.
    sel.setParam(u"ID", 1);
    sel.setNull(u"P");
    sel.execute();
    QVERIFY(sel.next());
    QCOMPARE(sel.asInt(0), 1);
    QVERIFY(!sel.next());
    tx.commit();
}

void TstFbLayer::procedureOutputs()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("SET TERM ^ ;\n"
                           "CREATE PROCEDURE P_TWO (A INTEGER, B VARCHAR(20)) RETURNS (R1 INTEGER, R2 VARCHAR(30), R3 NUMERIC(15,2))\n"
                           "AS BEGIN R1 = :A * 2; R2 = 'x' || :B; R3 = 1.5; SUSPEND; END^\n"
                           "SET TERM ; ^\n"));
    FbAttachment& a = db.attachment();
    FbTransaction tx(a);
    tx.start();
    FbStatement call(a, &tx, QStringLiteral("EXECUTE PROCEDURE P_TWO(:A, :B)"));
    call.setParam(u"A", 21);
    call.setParam(u"B", QStringLiteral("Köln"));
    call.execute();
    QVERIFY(call.hasRow());
    QCOMPARE(call.asInt(0), 42);
    QCOMPARE(call.asString(1), QStringLiteral("xKöln"));
    QCOMPARE(call.asScaled(2, 2), 150);
    tx.commit();
}

void TstFbLayer::blobs()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE BL (ID INTEGER, TX BLOB SUB_TYPE TEXT, BN BLOB SUB_TYPE 0);"));
    FbAttachment& a = db.attachment();
    QByteArray binary(200000, Qt::Uninitialized);
    for (int i = 0; i < binary.size(); ++i)
        binary[i] = char(i * 7);
    QString text;
    for (int i = 0; i < 5000; ++i)
        text += QStringLiteral("Zeile %1 äöü\r\n").arg(i);
    FbTransaction tx(a);
    tx.start();
    FbStatement ins(a, &tx, QStringLiteral("INSERT INTO BL VALUES (:ID, :TX, :BN)"));
    ins.setParam(u"ID", 1);
    ins.setParam(u"TX", text);
    ins.setParam(u"BN", binary);
    ins.execute();
    ins.setParam(u"ID", 2);
    ins.setParam(u"TX", QString());
    ins.setNull(u"BN");
    ins.execute();
    tx.commit();

    tx.start();
    FbStatement sel(a, &tx, QStringLiteral("SELECT TX, BN FROM BL ORDER BY ID"));
    sel.execute();
    QVERIFY(sel.next());
    QCOMPARE(sel.asString(0), text);
    QCOMPARE(sel.asBytes(1), binary);
    QVERIFY(sel.next());
    QVERIFY(!sel.isNull(0)); // an empty text is a value; only an empty QVariant binds NULL
    QCOMPARE(sel.asString(0), QString());
    QVERIFY(sel.isNull(1));
    tx.commit();
}

void TstFbLayer::errorsCarryCode()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE U (ID INTEGER NOT NULL PRIMARY KEY);"));
    FbAttachment& a = db.attachment();
    FbTransaction tx(a);
    tx.start();
    try {
        FbStatement st(a, &tx, QStringLiteral("SELECT * FROM NO_SUCH_TABLE"));
        st.execute();
        QFAIL("no error");
    } catch (const DatabaseError& e) {
        QCOMPARE(e.className(), QStringLiteral("EIBInterBaseError"));
        QVERIFY(e.hasCode(DatabaseError::TableUnknown));
        QCOMPARE(e.sqlCode(), -204);
        QVERIFY2(e.message().contains(QLatin1String("NO_SUCH_TABLE")), qPrintable(e.message()));
        QCOMPARE(e.statement(), QStringLiteral("SELECT * FROM NO_SUCH_TABLE"));
    }
    FbStatement ins(a, &tx, QStringLiteral("INSERT INTO U VALUES (:ID)"));
    ins.setParam(u"ID", 1);
    ins.execute();
    try {
        ins.execute();
        QFAIL("no error");
    } catch (const DatabaseError& e) {
        QVERIFY(e.hasCode(DatabaseError::PrimaryOrUniqueViolation));
        QCOMPARE(e.sqlCode(), -803);
    }
    // The transaction survives a failed statement.
    QVERIFY(tx.isActive());
    tx.rollback();
    QVERIFY_THROWS_EXCEPTION(DatabaseError, tx.commit());
}

void TstFbLayer::transactionStates()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE R (ID INTEGER);"));
    FbAttachment& a = db.attachment();
    FbTransaction writer(a);
    FbTransaction snapshot(a, {QStringLiteral("concurrency"), QStringLiteral("nowait")});
    FbTransaction committed(a, {QStringLiteral("read_committed"), QStringLiteral("rec_version"), QStringLiteral("read")});
    QVERIFY(!writer.isActive());
    snapshot.start();
    committed.start();
    writer.start();
    FbStatement ins(a, &writer, QStringLiteral("INSERT INTO R VALUES (1)"));
    ins.execute();
    writer.commit();
    QVERIFY(!writer.isActive());

    FbStatement count(a, &snapshot, QStringLiteral("SELECT COUNT(*) FROM R"));
    count.execute();
    QVERIFY(count.next());
    QCOMPARE(count.asInt(0), 0); // the snapshot predates the insert
    count.setTransaction(&committed);
    count.execute();
    QVERIFY(count.next());
    QCOMPARE(count.asInt(0), 1);
    // A read-only transaction refuses writes.
    FbStatement ro(a, &committed, QStringLiteral("INSERT INTO R VALUES (2)"));
    QVERIFY_THROWS_EXCEPTION(DatabaseError, ro.execute());

    // Committing closes the cursors running in the transaction.
    count.execute();
    QVERIFY(count.isOpen());
    committed.commit();
    QVERIFY(!count.isOpen());
    QVERIFY(!count.next());

    FbTransaction bad(a, {QStringLiteral("sometimes")});
    QVERIFY_THROWS_EXCEPTION(DatabaseError, bad.start());

    // Disconnecting ends what is still active by its end action.
    snapshot.rollback();
    FbTransaction keep(a, {}, FbTransaction::EndAction::Commit);
    keep.start();
    FbStatement ins3(a, &keep, QStringLiteral("INSERT INTO R VALUES (3)"));
    ins3.execute();
    a.disconnect();
    QVERIFY(!keep.isActive());
    a.connect();
    QCOMPARE(db.scalar(QStringLiteral("SELECT COUNT(*) FROM R")).toInt(), 2);
}

void TstFbLayer::nowaitWriteFailsAtOnce()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE LK (ID INTEGER, V VARCHAR(10)); INSERT INTO LK VALUES (1, 'a');"));
    // The other writer (the monitor) changes the row and keeps its transaction open.
    auto other = db.newAttachment();
    FbTransaction otherTx(*other);
    otherTx.start();
    FbStatement otherUp(*other, &otherTx, QStringLiteral("UPDATE LK SET V = 'b' WHERE ID = 1"));
    otherUp.execute();

    FbAttachment& a = db.attachment();
    FbTransaction tx(a, {QStringLiteral("concurrency"), QStringLiteral("nowait")});
    tx.start();
    FbStatement up(a, &tx, QStringLiteral("UPDATE LK SET V = 'c' WHERE ID = :ID"));
    up.setParam(u"ID", 1);
    QElapsedTimer timer;
    timer.start();
    try {
        up.execute();
        QFAIL("no lock conflict");
    } catch (const DatabaseError& e) {
        QVERIFY2(e.isLockConflict(), qPrintable(e.message()));
    }
    QVERIFY(timer.elapsed() < 2000);
    tx.rollback();
    otherTx.rollback();
}

void TstFbLayer::attachAndCreate()
{
    QTemporaryDir dir;
    FbAttachment a;
    try {
        a.attach(dir.filePath(QStringLiteral("missing.fdb")), QStringLiteral("SYSDBA"), QStringLiteral("masterkey"));
        QFAIL("attached to nothing");
    } catch (const DatabaseError& e) {
        QVERIFY(e.hasCode(DatabaseError::IoError));
        QVERIFY(!e.message().isEmpty());
    }
    QVERIFY(!a.isConnected());
    FbAttachment empty;
    QVERIFY_THROWS_EXCEPTION(DatabaseError, empty.connect());
    FbAttachment wrongParam(dir.filePath(QStringLiteral("x.fdb")), {QStringLiteral("colour=blue")});
    QVERIFY_THROWS_EXCEPTION(DatabaseError, wrongParam.connect());

    // Umlauts in the file name and in the credentials pass whatever the process locale.
    const QString path = dir.filePath(QStringLiteral("Büro-Ä.fdb"));
    FbAttachment::createDatabase(path, QStringLiteral("SYSDBA"), QStringLiteral("Schlüssel"), 4096, false);
    QVERIFY(QFile::exists(path));
    FbAttachment created;
    created.attach(path, QStringLiteral("SYSDBA"), QStringLiteral("Schlüssel"));
    QVERIFY(created.isConnected());
    QVERIFY_THROWS_EXCEPTION(DatabaseError,
                             FbAttachment::createDatabase(path, QStringLiteral("SYSDBA"), QStringLiteral("x")));
    created.dropDatabase();
    QVERIFY(!QFile::exists(path));
}

ORVANTA_TEST(TstFbLayer)
#include "tst_fblayer.moc"
