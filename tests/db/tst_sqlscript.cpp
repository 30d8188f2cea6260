#include "db/DatabaseError.h"
#include "db/SqlScript.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;
using orvanta::test::TempDatabase;

class TstSqlScript final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void splitsAtTheCurrentTerminator();
    void runsAndNamesTheFailingStatement();
};

void TstSqlScript::splitsAtTheCurrentTerminator()
{
    const QString script = QStringLiteral(
        "/* header; with ; inside */\n"
        "SET SQL DIALECT 3;\n"
        "CREATE TABLE A (X VARCHAR(10) DEFAULT ';'); -- trailing; comment\n"
        ";;\n"
        "SET TERM ^ ;\n"
        "CREATE PROCEDURE P AS BEGIN\n  INSERT INTO A VALUES ('^;'); -- ^ in a comment\nEND^\n"
        "SET TERM ; ^\n"
        "INSERT INTO A VALUES ('it''s; fine');\n"
        "COMMIT;\n"
        "-- only a comment at the end;");
    const auto statements = SqlScript::split(script);
    QCOMPARE(statements.size(), 5);
    QCOMPARE(statements[0].text, QStringLiteral("SET SQL DIALECT 3"));
    QCOMPARE(statements[1].text, QStringLiteral("CREATE TABLE A (X VARCHAR(10) DEFAULT ';')"));
    QCOMPARE(statements[1].line, 3);
    QVERIFY(statements[2].text.startsWith(QLatin1String("CREATE PROCEDURE P")));
    QVERIFY(statements[2].text.endsWith(QLatin1String("END")));
    QCOMPARE(statements[2].line, 6);
    QCOMPARE(statements[3].text, QStringLiteral("INSERT INTO A VALUES ('it''s; fine')"));
    QCOMPARE(statements[4].text, QStringLiteral("COMMIT"));
}

void TstSqlScript::runsAndNamesTheFailingStatement()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    SqlScript::run(db.attachment(), QStringLiteral("SET SQL DIALECT 3;\n"
                                                   "CREATE TABLE A (X INTEGER);\n"
                                                   "INSERT INTO A VALUES (1);\n"
                                                   "SET TERM ^ ;\n"
                                                   "CREATE PROCEDURE P RETURNS (N INTEGER) AS BEGIN\n"
                                                   "  SELECT COUNT(*) FROM A INTO :N; SUSPEND;\nEND^\n"
                                                   "SET TERM ; ^\n"
                                                   "COMMIT;\n"
                                                   "INSERT INTO A VALUES (2);\n"));
    QCOMPARE(db.scalar(QStringLiteral("SELECT N FROM P")).toInt(), 2);
    try {
        SqlScript::run(db.attachment(), QStringLiteral("INSERT INTO A VALUES (3);\nCOMMIT;\n\nINSERT INTO A VALUES (4);\n"
                                                       "INSERT INTO NOWHERE VALUES (5);\n"));
        QFAIL("no error");
    } catch (const DatabaseError& e) {
        QVERIFY2(e.message().startsWith(QLatin1String("Statement 4 (line 5) failed: INSERT INTO NOWHERE")),
                 qPrintable(e.message()));
        QVERIFY(e.hasCode(DatabaseError::TableUnknown));
    }
    // Committed work before the failure stays; the failing transaction is rolled back.
    QCOMPARE(db.scalar(QStringLiteral("SELECT N FROM P")).toInt(), 3);
}

ORVANTA_TEST(TstSqlScript)
#include "tst_sqlscript.moc"
