// The database schema as the program relies on it: the compiled-in script, the columns and widths
// of the tables and views, the parameter lists of the procedures, every statement the program
// sends, and the rows the call monitor writes.

#include "calllog/LogStatements.h"
#include "db/DatabaseError.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/Schema.h"
#include "db/TDM2Statements.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"

#include <QFile>
#include <QTest>

using namespace orvanta;
using orvanta::test::TempDatabase;

namespace {

struct Col {
    const char* name;
    FbType type;
    int width; // characters for text; 0: not checked
};

// The columns of "SELECT * FROM <relation>".
QList<FbColumn> columnsOf(FbAttachment& db, const QString& relation)
{
    FbTransaction tx(db);
    tx.start();
    FbStatement st(db, &tx, QStringLiteral("SELECT * FROM %1 WHERE 1 = 0").arg(relation));
    st.execute();
    QList<FbColumn> cols;
    for (int i = 0; i < st.columnCount(); ++i)
        cols << st.column(i);
    st.close();
    tx.commit();
    return cols;
}

void checkColumns(FbAttachment& db, const QString& relation, const QList<Col>& expected)
{
    const QList<FbColumn> cols = columnsOf(db, relation);
    QStringList names;
    for (const FbColumn& c : cols)
        names << c.name;
    QStringList wanted;
    for (const Col& c : expected)
        wanted << QString::fromLatin1(c.name);
    QCOMPARE(names, wanted);
    for (int i = 0; i < cols.size(); ++i) {
        const QByteArray what = (relation + u'.' + cols[i].name).toUtf8();
        QVERIFY2(cols[i].type == expected[i].type, what.constData());
        if (expected[i].width > 0)
            QVERIFY2(cols[i].width == expected[i].width, what.constData());
    }
}

QStringList procedureInputs(TempDatabase& db, const QString& procedure)
{
    FbTransaction tx(db.attachment());
    tx.start();
    FbStatement st(db.attachment(), &tx,
                   "SELECT TRIM(RDB$PARAMETER_NAME) FROM RDB$PROCEDURE_PARAMETERS "
                   "WHERE RDB$PROCEDURE_NAME = :P AND RDB$PARAMETER_TYPE = 0 ORDER BY RDB$PARAMETER_NUMBER");
    st.setParam(u"P", procedure);
    st.execute();
    QStringList names;
    while (st.next())
        names << st.asString(0);
    tx.commit();
    return names;
}

int procedureOutputCount(TempDatabase& db, const QString& procedure)
{
    return db
        .scalar(QStringLiteral("SELECT COUNT(*) FROM RDB$PROCEDURE_PARAMETERS WHERE RDB$PROCEDURE_NAME = '%1' "
                               "AND RDB$PARAMETER_TYPE = 1")
                    .arg(procedure))
        .toInt();
}

} // namespace

class TstSchema final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void compiledScriptIsTheSourceFile();
    void tablesHaveTheColumnsTheProgramReads();
    void viewsHaveExactlyTheColumnsRead();
    void proceduresTakeTheirInputsInOrder();
    void everyStatementOfTheProgramPrepares();
    void monitorRowsAreAccepted();
    void textIsIso8859_1();
};

void TstSchema::compiledScriptIsTheSourceFile()
{
    QFile f(TempDatabase::schemaPath());
    QVERIFY(f.open(QIODevice::ReadOnly));
    const QByteArray source = f.readAll();
    // Plain ASCII, so the literal means the same in every encoding the script passes through.
    for (const char c : source)
        QVERIFY2(uchar(c) < 0x80, "schema.sql must stay 7-bit ASCII");
    QCOMPARE(schemaScript(), QString::fromLatin1(source));
}

void TstSchema::tablesHaveTheColumnsTheProgramReads()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    using T = FbType;
    checkColumns(a, "LOG",
                 {{"LID", T::Integer, 0},     {"SERVICE", T::Integer, 0},     {"FROMPHONE", T::Varchar, 25},
                  {"FROMBEZ", T::Varchar, 80}, {"FROMSUBB", T::Varchar, 25},  {"ONMSN", T::Varchar, 25},
                  {"ONBEZ", T::Varchar, 30},  {"STATUS", T::Varchar, 40},     {"TSDATE", T::Date, 0},
                  {"TSTIME", T::Time, 0},     {"TS", T::Timestamp, 0},        {"CID", T::Integer, 0},
                  {"BEMERK", T::Varchar, 50}, {"CTYPE", T::SmallInt, 0},      {"CTIME", T::Time, 0},
                  {"CCHARGE", T::Numeric, 0}, {"ABID", T::Integer, 0},        {"REGION", T::Varchar, 35},
                  {"FROM2", T::Varchar, 25},  {"FROMANSCHLUSS", T::Varchar, 30}, {"NTYPE", T::SmallInt, 0},
                  {"NPLAN", T::SmallInt, 0},  {"PRESENT", T::SmallInt, 0},    {"B1", T::SmallInt, 0},
                  {"B2", T::SmallInt, 0},     {"B3", T::SmallInt, 0}});
    QCOMPARE(columnsOf(a, "LOG").at(15).scale, 2);
    checkColumns(a, "COM",
                 {{"LID", T::Integer, 0},
                  {"CID", T::Integer, 0},
                  {"KOMMBEZ", T::Varchar, 20},
                  {"LC", T::Varchar, 5},
                  {"VORW", T::Varchar, 10},
                  {"NUMBER", T::Varchar, 15},
                  {"VORWNUMBER", T::Varchar, 25},
                  {"LCVORWNUMBER", T::Varchar, 30},
                  {"BEMERKUNG", T::Varchar, 40},
                  {"AUTOREJECT", T::SmallInt, 0},
                  {"NUMBEROF", T::Varchar, 15}});
    checkColumns(a, "KAT", {{"LID", T::Integer, 0}, {"KATBEZ", T::Varchar, 30}, {"BEMERKUNG", T::Varchar, 40}});
    checkColumns(a, "E_MAIL",
                 {{"LID", T::Integer, 0}, {"CID", T::Integer, 0}, {"MAILADDR", T::Varchar, 40}, {"BEMERK", T::Varchar, 40}});
    checkColumns(a, "CONKAT", {{"LID", T::Integer, 0}, {"CID", T::Integer, 0}, {"KID", T::Integer, 0}});
}

void TstSchema::viewsHaveExactlyTheColumnsRead()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    using T = FbType;
    const QList<Col> list{{"LID", T::Integer, 0},     {"CONTBEZ", T::Varchar, 80},   {"KATBEZ", T::Varchar, 30},
                          {"STR", T::Varchar, 40},    {"PLZ", T::Varchar, 10},       {"ORT", T::Varchar, 35},
                          {"ANREDE", T::Varchar, 30}, {"TITEL", T::Varchar, 25},     {"NAME", T::Varchar, 30},
                          {"VNAME", T::Varchar, 30},  {"FIRMA", T::Varchar, 50},     {"ZUSATZ", T::Varchar, 30},
                          {"LAND", T::Varchar, 30},   {"BUNDESLAND", T::Varchar, 30}};
    checkColumns(a, "V_SELECT_LIST", list);
    checkColumns(a, "V_SELECT_CARD", list);
    checkColumns(a, "V_SELECT_CONKAT",
                 {{"LID", T::Integer, 0},
                  {"CID", T::Integer, 0},
                  {"KID", T::Integer, 0},
                  {"CONTBEZ", T::Varchar, 80},
                  {"STR", T::Varchar, 40},
                  {"PLZ", T::Varchar, 10},
                  {"ORT", T::Varchar, 35}});
    checkColumns(a, "V_SELECT_DETAIL",
                 {{"LID", T::Integer, 0},      {"NOTIZ", T::TextBlob, 0},    {"ANREDE", T::Varchar, 30},
                  {"VNAME", T::Varchar, 30},   {"NAME", T::Varchar, 30},     {"FIRMA", T::Varchar, 50},
                  {"TITEL", T::Varchar, 25},   {"CONTBEZ", T::Varchar, 80},  {"WEBSITE", T::Varchar, 50},
                  {"ABTEILUNG", T::Varchar, 35}, {"STR", T::Varchar, 40},    {"PLZ", T::Varchar, 10},
                  {"ORT", T::Varchar, 35},     {"ZUSATZ", T::Varchar, 30},   {"LAND", T::Varchar, 30},
                  {"BUNDESLAND", T::Varchar, 30}, {"KATBEZ", T::Varchar, 30}});
    checkColumns(a, "V_SELECT_NOTIZ", {{"LID", T::Integer, 0}, {"NOTIZ", T::TextBlob, 0}, {"CONTBEZ", T::Varchar, 80}});
}

void TstSchema::proceduresTakeTheirInputsInOrder()
{
    TempDatabase db;
    const QStringList contact{"ANR", "VNA", "NA", "FA", "TIT", "CONTB", "WEB", "ABT", "KATB",
                              "ST",  "PL",  "OT", "ZUSA", "L", "BUND", "TEXT"};
    QCOMPARE(procedureInputs(db, "P_CONT_INSERT"), contact);
    QCOMPARE(procedureInputs(db, "P_CONT_EDIT"), QStringList{"E_LID"} + contact);
    QCOMPARE(procedureInputs(db, "P_CONT_DELETE"), QStringList{"D_LID"});
    QCOMPARE(procedureInputs(db, "P_COM_SYNCHRONIZE"),
             (QStringList{"L", "C", "KB", "LC", "V", "N", "VN", "LCVN", "BEM", "AURE", "NOF", "STAT"}));
    QCOMPARE(procedureInputs(db, "P_MAIL_SYNCHRONIZE"), (QStringList{"LID", "CID", "MAILADDR", "BEMERK", "STATUS"}));
    QCOMPARE(procedureInputs(db, "P_SELECT_LOG_CONTACT"), QStringList{"PHONENR"});
    QCOMPARE(procedureInputs(db, "P_GET_COUNT_OF_NUMBER"), QStringList{"PN"});
    QCOMPARE(procedureInputs(db, "P_KAT_INSERT"), (QStringList{"KID", "KA", "BEM"}));
    QCOMPARE(procedureInputs(db, "P_KAT_DELETE"), QStringList{"KID"});
    QCOMPARE(procedureInputs(db, "P_CHANGE_CONKAT"), (QStringList{"CK_ID", "KID"}));

    // Outputs are read by position: as many as the callers read.
    QCOMPARE(procedureOutputCount(db, "P_CONT_INSERT"), 1);
    QCOMPARE(procedureOutputCount(db, "P_CONT_EDIT"), 1);
    QCOMPARE(procedureOutputCount(db, "P_COM_SYNCHRONIZE"), 1);
    QCOMPARE(procedureOutputCount(db, "P_MAIL_SYNCHRONIZE"), 1);
    QCOMPARE(procedureOutputCount(db, "P_SELECT_LOG_CONTACT"), 4);
    QCOMPARE(procedureOutputCount(db, "P_GET_COUNT_OF_NUMBER"), 1);
    QCOMPARE(procedureOutputCount(db, "P_KAT_INSERT"), 1);
}

void TstSchema::everyStatementOfTheProgramPrepares()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    QStringList statements{
        logsql::kSelectLogDays,
        logsql::kDeleteLogRecord,
        logsql::kDeleteLogDay,
        logsql::kRelinkLog,
        logsql::kSelectLogOfDay,
        logsql::kSelectLogRecord,
        logsql::kUpdateRemark,
        logsql::kSelectLogContact,
        logsql::kCountOfNumber,
        dmsql::kSelectFromPhone,
        dmsql::kSelectContactList,
        dmsql::kSelectContactCards,
        dmsql::kSelectCategories,
        dmsql::kSelectCategoryContacts,
        dmsql::kSelectLog,
        dmsql::kSelectContactNumbers,
        "select C.CONTBEZ,K.KATBEZ,A.STR,A.PLZ,A.ORT from CONTACT C left outer join CONKAT V on C.LID = V.CID left "
        "outer join KAT K ON V.KID = K.LID left outer join ADDR A ON C.LID = A.CID",
        "SELECT * FROM V_SELECT_LIST ORDER BY CONTBEZ",
        "SELECT * FROM V_SELECT_CARD ORDER BY CONTBEZ",
        "SELECT * FROM V_SELECT_DETAIL\r\nWHERE LID = :id",
        "SELECT * FROM COM\r\nWHERE CID = :id",
        "SELECT * FROM E_MAIL\r\nWHERE CID = :id",
        "SELECT * FROM V_SELECT_NOTIZ\r\nWHERE LID = :ID",
        "DELETE FROM CONKAT WHERE LID = :ID",
        "EXECUTE PROCEDURE P_CONT_INSERT (:ANR,:VNA,:NA,:FA,:TIT,:CONTB,:WEB,:ABT,:KATB,:ST,:PL,:OT,:ZUSA,:L,:BUND,:TEXT)",
        "EXECUTE PROCEDURE P_CONT_EDIT (:E_LID,:ANR,:VNA,:NA,:FA,:TIT,:CONTB,:WEB,:ABT,:KATB,:ST,:PL,:OT,:ZUSA,:L,:BUND,"
        ":TEXT)",
        "EXECUTE PROCEDURE P_CONT_DELETE (:D_LID)",
        "EXECUTE PROCEDURE P_COM_SYNCHRONIZE (:L,:C,:KB,:LC,:V,:N,:VN,:LCVN,:BEM,:AURE,:NOF,:STAT)",
        "EXECUTE PROCEDURE P_MAIL_SYNCHRONIZE (:LID,:CID,:MAILADDR,:BEMERK,:STATUS)",
        "EXECUTE PROCEDURE P_KAT_INSERT (:KID,:KA,:BEM)",
        "EXECUTE PROCEDURE P_KAT_DELETE (:KID)",
        "EXECUTE PROCEDURE P_CHANGE_CONKAT (:CK_ID,:KID)",
    };
    // The report queries: two column lists, two periods, four orders.
    for (const QString& head :
         {QString("select TSDate, TSTime, CTYPE, FROMBEZ, STATUS, ONBEZ from LOG "),
          QString("select TSDate, TSTime, CTYPE, FROMBEZ, STATUS, ONBEZ, CTIME, CCHARGE, BEMERK, ABID, REGION from LOG ")})
        for (const QString& where : {QString("where (TSDATE >= :Day) and (TSDATE <= :Day + 1) "),
                                     QString("where (TSDATE >= :StartDay) and (TSDATE <= :EndDay) ")})
            for (const QString& order : {QString("order by TSDATE, TSTIME"), QString("order by CTYPE, TSDATE, TSTIME"),
                                         QString("order by FROMBEZ, REGION, TSDATE, TSTIME"),
                                         QString("order by ONBEZ, TSDATE, TSTIME")})
                statements << head + where + order;

    FbTransaction tx(a);
    tx.start();
    for (const QString& sql : statements) {
        FbStatement st(a, &tx, sql);
        try {
            st.prepare();
        } catch (const AppException& e) {
            QFAIL(qPrintable(sql + QStringLiteral("\n") + e.message()));
        }
    }
    tx.rollback();
}

void TstSchema::monitorRowsAreAccepted()
{
    TempDatabase db;
    // The monitor leaves out the key and the columns it has no value for, or sends them as null.
    db.exec("INSERT INTO LOG (FROMPHONE, TSDATE, TSTIME) VALUES ('030123', '2024-05-01', '10:00:00');\n"
            "INSERT INTO LOG (LID, FROMPHONE, CID, CTYPE, CTIME, CCHARGE, ABID) "
            "VALUES (NULL, '040', NULL, NULL, NULL, NULL, NULL);\n"
            "INSERT INTO LOG (LID, FROMPHONE, CTYPE, CTIME, CCHARGE, ABID) "
            "VALUES (0, '089', 1, '00:01:30', 0.12, 3);\n");
    QCOMPARE(db.scalar("SELECT COUNT(DISTINCT LID) FROM LOG WHERE LID > 0").toInt(), 3);
    QCOMPARE(db.scalar("SELECT COUNT(*) FROM LOG WHERE CID = 0").toInt(), 3);
    QCOMPARE(db.scalar("SELECT COUNT(*) FROM LOG WHERE CTYPE = 0 AND CTIME = '00:00:00' AND CCHARGE = 0 AND "
                       "ABID = 0")
                 .toInt(),
             2);
    QCOMPARE(db.scalar("SELECT CCHARGE FROM LOG WHERE FROMPHONE = '089'").toDouble(), 0.12);
    // Keys grow in the order of arrival.
    QCOMPARE(db.scalar("SELECT FROMPHONE FROM LOG ORDER BY LID DESC ROWS 1").toString(), QString("089"));
    // A key given by the writer is kept.
    db.exec("INSERT INTO LOG (LID, FROMPHONE) VALUES (1000, '0221')");
    QCOMPARE(db.scalar("SELECT FROMPHONE FROM LOG WHERE LID = 1000").toString(), QString("0221"));
}

void TstSchema::textIsIso8859_1()
{
    TempDatabase db;
    QCOMPARE(db.scalar("SELECT TRIM(RDB$CHARACTER_SET_NAME) FROM RDB$DATABASE").toString(), QString("ISO8859_1"));
    FbAttachment& a = db.attachment();
    const QString name = QString::fromUtf8("Jörg Weiß, Café «Zürich»");
    const QString full(80, QChar(0xE4)); // one byte per character: 80 umlauts fill the column
    FbTransaction tx(a);
    tx.start();
    FbStatement ins(a, &tx, "INSERT INTO LOG (FROMBEZ, BEMERK) VALUES (:FB, :BEM)");
    ins.setParam(u"FB", full);
    ins.setParam(u"BEM", name);
    ins.execute();
    tx.commit();
    QCOMPARE(db.scalar("SELECT FROMBEZ FROM LOG").toString(), full);
    QCOMPARE(db.scalar("SELECT BEMERK FROM LOG").toString(), name);
    QCOMPARE(db.scalar("SELECT OCTET_LENGTH(BEMERK) FROM LOG").toInt(), name.size());
}

ORVANTA_TEST(TstSchema)
#include "tst_schema.moc"
