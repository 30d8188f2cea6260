#include "db/DataSet.h"
#include "db/DatabaseError.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/RecordStore.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"

#include <QSignalSpy>
#include <QTest>

using namespace orvanta;
using orvanta::test::TempDatabase;

class TstDataSets final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void storeHoldsEveryTypeCompactly();
    void nullBitmapBeyondFirstWord();
    void openCloseHooksAndParams();
    void commandTextAndFieldByName();
    void failedOpenStaysClosed();
    void openWithRowsOfAnother();
};

void TstDataSets::storeHoldsEveryTypeCompactly()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral(
        "CREATE TABLE T (ID INTEGER, S SMALLINT, B BIGINT, V VARCHAR(30), C CHAR(6), D DATE, TM TIME, TS TIMESTAMP,"
        " N NUMERIC(15,2), DB DOUBLE PRECISION, TX BLOB SUB_TYPE TEXT);"
        "INSERT INTO T VALUES (1, 2, 3, 'Jürgen', 'ab', '2024-03-31', '13:14:15.250', '1970-01-01 00:00:00', 1.05, 2.5, 'Blöb');"
        "INSERT INTO T VALUES (2, -2, -3, '', 'x', '1899-12-30', '00:00:00', '1969-12-31 23:59:59', -0.01, -1e10, '');"
        "INSERT INTO T (ID) VALUES (3);"));
    FbAttachment& a = db.attachment();
    FbTransaction tx(a);
    DataSet ds(a, &tx, QStringLiteral("ds"), QStringLiteral("SELECT * FROM T ORDER BY ID"));
    ds.setBeforeOpen([](DataSet& d) { d.transaction()->start(); });
    ds.setAfterClose([](DataSet& d) { d.transaction()->commit(); });
    ds.open();
    const RecordStore& s = ds.store();
    QCOMPARE(s.rowCount(), 3);
    const int v = s.fieldIndex(u"v");
    const int c = s.fieldIndex(u"C");
    const int n = s.fieldIndex(u"n");
    const int d = s.fieldIndex(u"D");
    const int ts = s.fieldIndex(u"TS");
    QCOMPARE(s.field(v).width, 30);
    QCOMPARE(s.field(n).scale, 2);
    QCOMPARE(s.storage(v), RecordStore::Storage::Text);
    QCOMPARE(s.storage(s.fieldIndex(u"S")), RecordStore::Storage::Int16);

    QCOMPARE(s.integer(0, 0), 1);
    QCOMPARE(s.integer(0, s.fieldIndex(u"B")), 3);
    QCOMPARE(s.text(0, v), QStringLiteral("Jürgen"));
    QCOMPARE(s.bytes(0, v), QByteArrayView("J\xFCrgen"));
    QCOMPARE(s.text(0, c), QStringLiteral("ab"));
    QCOMPARE(s.date(0, d), QDate(2024, 3, 31));
    QCOMPARE(s.dayNumber(1, d), QDate(1899, 12, 30).toJulianDay());
    QCOMPARE(s.time(0, s.fieldIndex(u"TM")), QTime(13, 14, 15, 250));
    QCOMPARE(s.timestamp(0, ts), QDateTime(QDate(1970, 1, 1), QTime(0, 0)));
    QCOMPARE(s.timestamp(1, ts), QDateTime(QDate(1969, 12, 31), QTime(23, 59, 59)));
    QCOMPARE(s.scaled(0, n, 2), 105);
    QCOMPARE(s.scaled(1, n, 2), -1);
    QCOMPARE(s.text(1, n), QStringLiteral("-0.01"));
    QCOMPARE(s.number(0, n), 1.05);
    QCOMPARE(s.number(1, s.fieldIndex(u"DB")), -1e10);
    QCOMPARE(s.text(0, s.fieldIndex(u"TX")), QStringLiteral("Blöb"));

    // Empty text is a value, not a null; the third row is null everywhere but its key.
    QVERIFY(!s.isNull(1, v));
    QCOMPARE(s.text(1, v), QString());
    for (int col = 1; col < s.columnCount(); ++col) {
        QVERIFY(s.isNull(2, col));
        QCOMPARE(s.text(2, col), QString());
        QCOMPARE(s.integer(2, col), 0);
    }
    QVERIFY(!s.date(2, d).isValid());

    // Whole-column access.
    const auto ids = s.values<qint32>(0);
    QCOMPARE(ids.size(), size_t(3));
    QCOMPARE(ids[2], 3);
    const auto ends = s.textEnds(v);
    QCOMPARE(ends[0], quint32(6));
    QCOMPARE(ends[2], quint32(6));
    QCOMPARE(QByteArrayView(s.textArena(v), ends[0]), QByteArrayView("J\xFCrgen"));

    ds.close();
    QVERIFY(!tx.isActive());
    QCOMPARE(ds.rowCount(), 0);
}

void TstDataSets::nullBitmapBeyondFirstWord()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    QString script = QStringLiteral("CREATE TABLE T (ID INTEGER, V VARCHAR(10));\n");
    for (int i = 0; i < 200; ++i)
        script += i % 67 == 3 ? QStringLiteral("INSERT INTO T VALUES (%1, NULL);\n").arg(i)
                              : QStringLiteral("INSERT INTO T VALUES (%1, 'v%1');\n").arg(i);
    db.exec(script);
    FbTransaction tx(db.attachment());
    tx.start();
    DataSet ds(db.attachment(), &tx, QStringLiteral("ds"), QStringLiteral("SELECT V FROM T ORDER BY ID"));
    ds.open();
    const RecordStore& s = ds.store();
    QCOMPARE(s.rowCount(), 200);
    for (int r = 0; r < 200; ++r) {
        QCOMPARE(s.isNull(r, 0), r % 67 == 3);
        if (r % 67 != 3)
            QCOMPARE(s.text(r, 0), QStringLiteral("v%1").arg(r));
    }
    // Held memory stays near the values: offsets and a few bitmap words on top.
    QVERIFY(s.byteSize() <= s.valueBytes() + 200 * 4 + 64);
}

void TstDataSets::openCloseHooksAndParams()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE T (ID INTEGER, D DATE); INSERT INTO T VALUES (1, '2024-01-01');"
                           "INSERT INTO T VALUES (2, '2024-01-02'); INSERT INTO T VALUES (3, '2024-01-02');"));
    FbTransaction tx(db.attachment());
    DataSet ds(db.attachment(), &tx, QStringLiteral("days"), QStringLiteral("SELECT ID FROM T WHERE D = :TSD OR ID = :tsd_id"));
    QStringList calls;
    ds.setBeforeOpen([&](DataSet& d) {
        calls << QStringLiteral("before");
        d.transaction()->start();
    });
    ds.setAfterClose([&](DataSet& d) {
        calls << QStringLiteral("after");
        d.transaction()->commit();
    });
    ds.setAfterPost([&](DataSet&) { calls << QStringLiteral("post"); });
    QSignalSpy opened(&ds, &DataSet::opened);
    QSignalSpy closed(&ds, &DataSet::closed);
    QCOMPARE(ds.paramNames(), (QStringList{"TSD", "TSD_ID"}));
    ds.setParam(QStringLiteral("tsd"), QDate(2024, 1, 2));
    ds.open();
    QCOMPARE(ds.rowCount(), 2); // the unbound parameter is NULL
    ds.open();                  // already open: nothing happens
    ds.post();
    ds.refresh();
    ds.setParam(QStringLiteral("TSD_ID"), 1);
    ds.refresh();
    QCOMPARE(ds.rowCount(), 3);
    ds.close();
    ds.close();
    QCOMPARE(calls, (QStringList{"before", "post", "after", "before", "after", "before", "after"}));
    QCOMPARE(opened.count(), 3);
    QCOMPARE(closed.count(), 3);
}

void TstDataSets::commandTextAndFieldByName()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE T (LID INTEGER, NAME VARCHAR(20)); INSERT INTO T VALUES (7, 'Zoë');"
                           "INSERT INTO T VALUES (8, 'Änne');"));
    FbTransaction tx(db.attachment());
    tx.start();
    DataSet ds(db.attachment(), &tx, QStringLiteral("q"), QStringLiteral("SELECT * FROM T ORDER BY LID"));
    ds.open();
    QCOMPARE(ds.recNo(), 0);
    QCOMPARE(ds.fieldByName(u"lid").asInteger(), 7);
    QCOMPARE(ds.fieldByName(u"Name").asString(), QStringLiteral("Zoë"));
    ds.next();
    QCOMPARE(ds.fieldByName(u"NAME").value(), QVariant(QStringLiteral("Änne")));
    ds.next();
    QVERIFY(ds.eof());
    QVERIFY(ds.fieldByName(u"LID").isNull());
    QVERIFY(ds.locate(u"LID", 7));
    QCOMPARE(ds.recNo(), 0);
    QVERIFY(!ds.locate(u"LID", 9));
    QVERIFY_THROWS_EXCEPTION(DatabaseError, (void)ds.fieldByName(u"NOPE"));

    // Replacing the text closes; the next opening runs the new text. A data set runs statements too.
    ds.setCommandText(QStringLiteral("DELETE FROM T WHERE LID = :ID"));
    QVERIFY(!ds.isActive());
    ds.setParam(QStringLiteral("ID"), 8);
    QCOMPARE(ds.execSQL(), 1);
    ds.setCommandText(QStringLiteral("SELECT COUNT(*) AS N FROM T"));
    ds.open();
    QCOMPARE(ds.fieldByName(u"N").asInteger(), 1);
}

void TstDataSets::failedOpenStaysClosed()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    FbTransaction tx(db.attachment());
    tx.start();
    DataSet ds(db.attachment(), &tx, QStringLiteral("q"), QStringLiteral("SELECT * FROM MISSING"));
    QVERIFY_THROWS_EXCEPTION(DatabaseError, ds.open());
    QVERIFY(!ds.isActive());
    QCOMPARE(ds.rowCount(), 0);
    QVERIFY(ds.eof());
    QVERIFY(tx.isActive()); // the caller's handler decides about the transaction
}

// Two names of one view: the second takes the first's rows over without reading; anything that
// could make the rows differ in shape reads instead.
void TstDataSets::openWithRowsOfAnother()
{
    TempDatabase db(TempDatabase::Schema::Empty);
    db.exec(QStringLiteral("CREATE TABLE T (ID INTEGER, V VARCHAR(10));"
                           "CREATE VIEW V1 (ID, V) AS SELECT ID, V FROM T;"
                           "CREATE VIEW V2 (ID, V) AS SELECT ID, V FROM T;"
                           "CREATE VIEW V3 (ID, V) AS SELECT ID, CAST(V AS VARCHAR(20)) FROM T;"
                           "INSERT INTO T VALUES (1, 'eins');"
                           "INSERT INTO T VALUES (2, 'zwei');"));
    FbAttachment& a = db.attachment();
    FbTransaction t1(a);
    FbTransaction t2(a);
    QStringList hooks;
    const auto hook = [&hooks](const char* what) {
        return [&hooks, what](DataSet& d) {
            hooks << d.name() + QLatin1Char(' ') + QLatin1String(what);
            if (qstrcmp(what, "open") == 0) {
                if (d.transaction()->isActive())
                    d.transaction()->rollback();
                d.transaction()->start();
            } else if (d.transaction()->isActive()) {
                d.transaction()->commit();
            }
        };
    };
    DataSet list(a, &t1, QStringLiteral("list"), QStringLiteral("SELECT * FROM V1 ORDER BY ID"));
    DataSet cards(a, &t2, QStringLiteral("cards"), QStringLiteral("SELECT * FROM V2 ORDER BY ID"));
    for (DataSet* d : {&list, &cards}) {
        d->setBeforeOpen(hook("open"));
        d->setAfterClose(hook("close"));
    }
    QVERIFY(!cards.openWithRowsOf(list)); // nothing open to take from
    QVERIFY(!cards.isActive());
    list.open();
    // A row the first did not read: taking over keeps what was read.
    db.exec(QStringLiteral("INSERT INTO T VALUES (3, 'drei');"));
    hooks.clear();
    QSignalSpy closing(&list, &DataSet::aboutToClose);
    QVERIFY(cards.openWithRowsOf(list));
    QVERIFY(cards.isActive());
    QVERIFY(!list.isActive());
    QCOMPARE(closing.count(), 1);
    QCOMPARE(list.rowCount(), 0);
    QCOMPARE(cards.rowCount(), 2);
    QCOMPARE(cards.store().text(1, cards.fieldIndex(u"V")), QStringLiteral("zwei"));
    QCOMPARE(cards.recNo(), 0);
    QCOMPARE(hooks, (QStringList{"cards open", "list close"}));
    QVERIFY(t2.isActive());
    QVERIFY(!t1.isActive());
    QVERIFY(list.openWithRowsOf(cards));
    QCOMPARE(list.rowCount(), 2);
    QVERIFY(list.isActive());
    QVERIFY(!cards.isActive());
    // A refresh reads afresh.
    list.refresh();
    QCOMPARE(list.rowCount(), 3);

    // Other widths, or parameters, mean other rows: nothing is moved.
    DataSet wide(a, &t2, QStringLiteral("wide"), QStringLiteral("SELECT * FROM V3 ORDER BY ID"));
    wide.setBeforeOpen(hook("open"));
    QVERIFY(!wide.openWithRowsOf(list));
    QVERIFY(list.isActive());
    QCOMPARE(list.rowCount(), 3);
    DataSet param(a, &t2, QStringLiteral("param"), QStringLiteral("SELECT * FROM V2 WHERE ID > :ID"));
    QVERIFY(!param.openWithRowsOf(list));
    QVERIFY(list.isActive());
    list.close();
    if (t2.isActive())
        t2.rollback();
}

ORVANTA_TEST(TstDataSets)
#include "tst_datasets.moc"
