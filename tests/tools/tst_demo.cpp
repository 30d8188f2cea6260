// The demo content: a database filled by it is readable through the views and the log the way
// the program reads them, and the bulk generator gives varied, reproducible calls.

#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "tests/TestPaths.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"
#include "tools/demo/CallFactory.h"
#include "tools/demo/DemoContacts.h"
#include "tools/demo/DemoData.h"
#include "tools/demo/NoteRtf.h"

#include <QProcess>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;
using orvanta::test::TempDatabase;

namespace {

int count(TempDatabase& db, const QString& sql) { return db.scalar(sql).toInt(); }

// Rows of a query as tab-joined text, for comparing whole results.
QStringList rows(FbAttachment& a, const QString& sql)
{
    FbTransaction tx(a);
    tx.start();
    FbStatement st(a, &tx, sql);
    st.execute();
    QStringList out;
    while (st.next()) {
        QStringList cells;
        for (int i = 0; i < st.columnCount(); ++i)
            cells << st.value(i).toString();
        out << cells.join(u'\t');
    }
    tx.commit();
    return out;
}

} // namespace

class TstDemo final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void fillDemoIsReadableThroughTheViews();
    void fillDemoLinksCallsToContacts();
    void generateCallsIsVariedAndReproducible();
    void noteRtfEscapes();
    void createdbTool();
};

void TstDemo::fillDemoIsReadableThroughTheViews()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const QDate today(2024, 5, 15);
    const demo::DemoStats s = demo::fillDemo(a, today);

    QCOMPARE(s.contacts, int(demo::demoContacts().size()));
    QCOMPARE(s.categories, int(demo::demoCategories().size()));
    QVERIFY(s.calls >= 200);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG"), s.calls);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM COM"), s.numbers);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM E_MAIL"), s.mails);

    // The contact list, the card view, the category manager and the detail read them.
    QCOMPARE(rows(a, "select * from V_SELECT_LIST ORDER BY CONTBEZ ASC").size(), s.contacts);
    QCOMPARE(rows(a, "SELECT * FROM V_SELECT_CARD ORDER BY CONTBEZ ASC").size(), s.contacts);
    QVERIFY(count(db, "SELECT COUNT(*) FROM V_SELECT_LIST WHERE KATBEZ IS NOT NULL") > s.contacts / 2);
    QVERIFY(count(db, "SELECT COUNT(*) FROM V_SELECT_LIST WHERE KATBEZ IS NULL") >= 1);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM V_SELECT_CONKAT"),
             count(db, "SELECT COUNT(*) FROM V_SELECT_LIST WHERE KATBEZ IS NOT NULL"));
    QVERIFY(count(db, "SELECT COUNT(*) FROM V_SELECT_DETAIL WHERE STR <> '' AND ORT <> ''") > s.contacts / 2);
    // Notes are RTF; contacts without a note have none at all.
    QVERIFY(count(db, "SELECT COUNT(*) FROM V_SELECT_NOTIZ WHERE NOTIZ STARTING WITH '{\\rtf1'") >= 5);
    QVERIFY(count(db, "SELECT COUNT(*) FROM V_SELECT_NOTIZ WHERE NOTIZ IS NULL") >= 1);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM V_SELECT_NOTIZ WHERE NOTIZ IS NOT NULL AND NOT NOTIZ STARTING WITH "
                       "'{\\rtf1'"),
             0);
    // Latin-1 text survives the round trip.
    QVERIFY(count(db, QString::fromUtf8("SELECT COUNT(*) FROM CONTACT WHERE CONTBEZ = 'Müller, Thomas'")) == 1);

    // Calls over the last months up to the given day, both directions, every outcome kind.
    QCOMPARE(db.scalar("SELECT MAX(TSDATE) FROM LOG").toDate(), today);
    QVERIFY(db.scalar("SELECT MIN(TSDATE) FROM LOG").toDate() >= today.addDays(-180));
    QVERIFY(db.scalar("SELECT MIN(TSDATE) FROM LOG").toDate() <= today.addDays(-60));
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE TSDATE = '2024-05-15'") >= 6);
    QVERIFY(count(db, "SELECT COUNT(DISTINCT TSDATE) FROM LOG") > 60);
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE TS <> CAST(TSDATE || ' ' || TSTIME AS TIMESTAMP)") == 0);
    for (int ctype : {0, 1, 2})
        QVERIFY(count(db, QString("SELECT COUNT(*) FROM LOG WHERE CTYPE = %1").arg(ctype)) > 0);
    QVERIFY(count(db, "SELECT COUNT(DISTINCT SERVICE) FROM LOG") >= 8);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG WHERE SERVICE NOT BETWEEN 0 AND 22"), 0);
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE ABID > 0") > 0);
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE BEMERK <> ''") > 0);
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE COALESCE(FROMPHONE, '') = ''") > 0);
    QVERIFY(count(db, QString::fromUtf8("SELECT COUNT(*) FROM LOG WHERE FROMPHONE = 'Nummer unterdrückt'")) > 0);
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE FROMPHONE STARTING WITH '0043'") > 0);
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE FROMPHONE STARTING WITH '0041'") > 0);
    QVERIFY(count(db, "SELECT COUNT(*) FROM LOG WHERE CCHARGE > 0 AND CTYPE = 1") > 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG WHERE CCHARGE > 0 AND CTYPE <> 1"), 0);
}

void TstDemo::fillDemoLinksCallsToContacts()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const demo::DemoStats s = demo::fillDemo(a, QDate(2024, 5, 15));
    QVERIFY(s.linkedCalls > 20);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG WHERE CID > 0"), s.linkedCalls);
    // A linked call carries its contact's display name and the label of the number.
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG L JOIN CONTACT C ON C.LID = L.CID WHERE L.FROMBEZ = C.CONTBEZ "
                       "AND L.FROMANSCHLUSS <> ''"),
             s.linkedCalls);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG WHERE CID = 0 AND FROMANSCHLUSS IS NOT NULL"), 0);

    // One contact's calls are left for the user to link: the number is known, the log not linked.
    const demo::DemoContact* unlinked = nullptr;
    for (const demo::DemoContact& c : demo::demoContacts())
        if (!c.linked)
            unlinked = &c;
    QVERIFY(unlinked);
    const QString number = demo::dialledForm(unlinked->numbers.front());
    FbTransaction tx(a);
    tx.start();
    FbStatement st(a, &tx, "EXECUTE PROCEDURE P_SELECT_LOG_CONTACT (:PHONENR)");
    st.setParam(u"PHONENR", number);
    st.execute();
    QCOMPARE(st.asString(2), unlinked->contbez);
    QVERIFY(st.asInt(3) > 0);
    FbStatement cnt(a, &tx, "EXECUTE PROCEDURE P_GET_COUNT_OF_NUMBER (:PN)");
    cnt.setParam(u"PN", number);
    cnt.execute();
    QVERIFY(cnt.asInt(0) > 0);
    tx.commit();
    QCOMPARE(count(db, QString("SELECT COUNT(*) FROM LOG WHERE CID > 0 AND FROMPHONE = '%1'").arg(number)), 0);
}

void TstDemo::generateCallsIsVariedAndReproducible()
{
    const QDate last(2024, 12, 31);
    TempDatabase one;
    TempDatabase two;
    QCOMPARE(demo::generateCalls(one.attachment(), 3000, 7, last), qint64(3000));
    QCOMPARE(demo::generateCalls(two.attachment(), 3000, 7, last), qint64(3000));
    QCOMPARE(demo::generateCalls(two.attachment(), 0, 7, last), qint64(0));

    const QString all = "SELECT TSDATE, TSTIME, FROMPHONE, CTYPE, SERVICE, STATUS, CTIME, CCHARGE, REGION FROM LOG "
                        "ORDER BY LID";
    const QStringList a = rows(one.attachment(), all);
    QCOMPARE(a.size(), 3000);
    QCOMPARE(rows(two.attachment(), all), a);

    QCOMPARE(one.scalar("SELECT MAX(TSDATE) FROM LOG").toDate(), last);
    QCOMPARE(one.scalar("SELECT MIN(TSDATE) FROM LOG").toDate(), last.addDays(-364));
    // Written oldest first, as the monitor does.
    QCOMPARE(count(one, "SELECT COUNT(*) FROM LOG A JOIN LOG B ON B.LID = A.LID + 1 WHERE B.TSDATE < A.TSDATE"), 0);
    QVERIFY(count(one, "SELECT COUNT(DISTINCT FROMPHONE) FROM LOG") > 500);
    QVERIFY(count(one, "SELECT COUNT(DISTINCT REGION) FROM LOG") > 15);
    QVERIFY(count(one, "SELECT COUNT(DISTINCT SERVICE) FROM LOG") > 15);
    QCOMPARE(count(one, "SELECT COUNT(*) FROM LOG WHERE CID <> 0"), 0);

    // Another seed, other calls; more calls append.
    TempDatabase three;
    demo::generateCalls(three.attachment(), 3000, 8, last);
    QVERIFY(rows(three.attachment(), all) != a);
    demo::generateCalls(three.attachment(), 500, 9, last);
    QCOMPARE(count(three, "SELECT COUNT(*) FROM LOG"), 3500);
}

void TstDemo::noteRtfEscapes()
{
    const QString rtf = demo::noteRtf({QString::fromUtf8("Käse {süß} \\ 5 €"), "zweite Zeile"});
    QVERIFY(rtf.startsWith("{\\rtf1\\ansi\\ansicpg1252"));
    QVERIFY(rtf.contains("K\\'e4se \\{s\\'fc\\'df\\} \\\\ 5 \\'80\\par\r\nzweite Zeile\\par"));
    QVERIFY(rtf.trimmed().endsWith(u'}'));
    for (const QChar c : rtf)
        QVERIFY(c.unicode() < 0x80);
    QCOMPARE(rtf.count(u'{') - rtf.count("\\{"), rtf.count(u'}') - rtf.count("\\}"));
}

void TstDemo::createdbTool()
{
    const QString tool = QStringLiteral(ORVANTA_BIN_DIR "/orvanta-createdb");
    QVERIFY2(QFile::exists(tool), "orvanta-createdb is missing from the build");
    // A database on tmpfs: creating one syncs every DDL step, which is slow on disk.
    QTemporaryDir dir(QDir("/dev/shm").exists() ? QStringLiteral("/dev/shm/orvanta-createdb-XXXXXX") : QString());
    QVERIFY(dir.isValid());
    const QString path = dir.filePath("neu.fdb");

    QProcess p;
    p.start(tool, {path, "--demo"});
    QVERIFY(p.waitForFinished(120000));
    QCOMPARE(p.exitCode(), 0);
    QVERIFY(QString::fromLocal8Bit(p.readAllStandardOutput()).contains("wurde angelegt"));
    {
        FbAttachment a;
        a.attach(path, TempDatabase::User, TempDatabase::Password);
        QCOMPARE(rows(a, "SELECT * FROM V_SELECT_LIST").size(), int(demo::demoContacts().size()));
        QVERIFY(rows(a, "SELECT LID FROM LOG").size() >= 200);
        a.disconnect();
    }

    // An existing file is left alone; a folder that does not exist is reported.
    p.start(tool, {path});
    QVERIFY(p.waitForFinished(60000));
    QVERIFY(p.exitCode() != 0);
    QVERIFY(QString::fromLocal8Bit(p.readAllStandardError()).contains("existiert bereits"));
    p.start(tool, {dir.filePath("fehlt/neu.fdb")});
    QVERIFY(p.waitForFinished(60000));
    QVERIFY(p.exitCode() != 0);
    QVERIFY(QString::fromLocal8Bit(p.readAllStandardError()).contains("konnte nicht angelegt werden"));
    QVERIFY(!QFile::exists(dir.filePath("fehlt/neu.fdb")));
    p.start(tool, QStringList{});
    QVERIFY(p.waitForFinished(60000));
    QVERIFY(p.exitCode() != 0);
}

ORVANTA_TEST(TstDemo)
#include "tst_demo.moc"
