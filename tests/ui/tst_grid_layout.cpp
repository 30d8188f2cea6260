#include "platform/IniFile.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridLayoutStore.h"
#include "ui/grid/MemoryGridSource.h"

#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

namespace {

MemoryGridSource& source()
{
    static MemoryGridSource src({{QStringLiteral("TSDATE"), GridFieldType::Date},
                                 {QStringLiteral("TSTIME"), GridFieldType::Time},
                                 {QStringLiteral("FROMBEZ"), GridFieldType::Text},
                                 {QStringLiteral("BEMERK"), GridFieldType::Text}});
    if (src.rowCount() == 0) {
        for (int i = 0; i < 4; ++i) {
            const quint32 r = src.appendRow();
            src.setDate(r, 0, QDate(2024, 3, 1 + i % 2));
            src.setTime(r, 1, QTime(10, i));
            src.setText(r, 2, QStringLiteral("Anrufer %1").arg(i % 3));
        }
    }
    return src;
}

// The columns of a fresh frame, before any layout is restored.
void define(GridController& g)
{
    g.addColumn(GridColumn(QStringLiteral("cDATE"), QStringLiteral("TSDATE"), QStringLiteral("Datum"), 1, 70));
    g.addColumn(GridColumn(QStringLiteral("cTIME"), QStringLiteral("TSTIME"), QStringLiteral("Zeit"), 2, 51));
    g.addColumn(GridColumn(QStringLiteral("cFROM"), QStringLiteral("FROMBEZ"), QStringLiteral("Anrufer"), 3, 153));
    g.addColumn(GridColumn(QStringLiteral("cBEM"), QStringLiteral("BEMERK"), QStringLiteral("Bemerkung"), 7, 95));
    g.setSource(&source());
}

QString snapshot(const GridController& g)
{
    QStringList parts;
    for (const int c : g.columnOrder()) {
        const GridColumn& col = g.column(c);
        parts << QStringLiteral("%1:%2:%3:s%4%5:g%6")
                     .arg(col.name)
                     .arg(col.visible)
                     .arg(col.width)
                     .arg(g.sortIndex(c))
                     .arg(int(g.sortOrder(c)))
                     .arg(g.groupIndex(c));
    }
    parts << QStringLiteral("tag%1 box%2 filter%3 %4").arg(g.tag()).arg(g.isGroupByBoxVisible()).arg(g.filter().active).arg(g.filterText());
    return parts.join(QLatin1Char(' '));
}

} // namespace

class TestGridLayout final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void roundTripRestoresEverything()
    {
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("VStoreL"));
        GridController a;
        define(a);
        a.setTodayProvider([] { return QDate(2024, 3, 1); });
        a.beginUpdate();
        a.moveColumn(3, 0);
        a.setColumnWidth(2, 200);
        a.setColumnVisible(1, false);
        a.setSortOrder(0, GridSortOrder::Descending);
        a.setSortOrder(3, GridSortOrder::Ascending);
        a.groupBy(2);
        a.setGroupSortOrder(2, GridSortOrder::Descending);
        a.setGroupByBoxVisible(true);
        a.addFilterItem(GridFilterItem::condition(QStringLiteral("cDATE"), GridFilterOperator::ThisWeek, {}, QStringLiteral("diese Woche")));
        a.addFilterItem(GridFilterItem::list(GridFilterBoolOperator::Or,
                                             {GridFilterItem::condition(QStringLiteral("cFROM"), GridFilterOperator::Like, QStringLiteral("A%")),
                                              GridFilterItem::condition(QStringLiteral("cFROM"), GridFilterOperator::Like, QStringLiteral("ä%"))}));
        a.setFilterActive(true);
        a.setTag(2);
        a.endUpdate();
        QVERIFY(GridLayoutStore::storeToFile(a, path, QStringLiteral("2")));

        GridController b;
        define(b);
        QVERIFY(GridLayoutStore::restoreFromFile(b, path, QStringLiteral("2")));
        QCOMPARE(snapshot(b), snapshot(a));
        QCOMPARE(b.filter(), a.filter());
        // The file is INI text in CR LF lines.
        QFile f(path);
        QVERIFY(f.open(QIODevice::ReadOnly));
        const QByteArray bytes = f.readAll();
        QVERIFY(bytes.startsWith("[2]\r\n"));
        QVERIFY(bytes.contains("Operator=is this week\r\n"));
    }

    void missingFileOrViewChangesNothing()
    {
        QTemporaryDir dir;
        GridController g;
        define(g);
        g.setSortOrder(0, GridSortOrder::Descending);
        const QString before = snapshot(g);
        QVERIFY(!GridLayoutStore::restoreFromFile(g, dir.filePath(QStringLiteral("none")), QStringLiteral("2")));
        IniFile other;
        other.writeInteger(QStringLiteral("1"), QStringLiteral("Tag"), 5);
        QVERIFY(!GridLayoutStore::restore(g, other, QStringLiteral("2")));
        QCOMPARE(snapshot(g), before);
    }

    void toleratesUnknownColumnsTruncationAndJunk_data()
    {
        QTest::addColumn<QByteArray>("file");
        QTest::addColumn<QString>("expected");
        const QString fresh = QStringLiteral(
            "cDATE:1:70:s02:g-1 cTIME:1:51:s12:g-1 cFROM:1:153:s-10:g-1 cBEM:1:95:s-10:g-1 tag0 box0 filter0 ");
        QTest::newRow("unknown column and filter item are skipped")
            << QByteArray("[2]\r\nTag=1\r\nFilterActive=1\r\n[2.Column.cGONE]\r\nPosition=0\r\nVisible=1\r\n"
                          "[2.Column.cFROM]\r\nPosition=1\r\nVisible=0\r\nWidth=99\r\n"
                          "[2.Filter]\r\nCount=2\r\nItem0.Parent=-1\r\nItem0.Kind=Condition\r\nItem0.Column=cGONE\r\n"
                          "Item0.Operator=is today\r\nItem1.Parent=-1\r\nItem1.Kind=Condition\r\nItem1.Column=cDATE\r\nItem1.Operator=is today\r\n")
            << QStringLiteral("cFROM:0:99:s-10:g-1 cDATE:1:70:s-10:g-1 cTIME:1:51:s-10:g-1 cBEM:1:95:s-10:g-1 tag1 box0 filter1 TSDATE is today");
        QTest::newRow("truncated mid-section keeps the rest")
            << QByteArray("[2]\r\nTag=3\r\n[2.Column.cBEM]\r\nPosition=0\r\nVisible=0\r\nWid")
            << QStringLiteral("cBEM:0:95:s-10:g-1 cDATE:1:70:s-10:g-1 cTIME:1:51:s-10:g-1 cFROM:1:153:s-10:g-1 tag3 box0 filter0 ");
        QTest::newRow("junk values are ignored")
            << QByteArray("[2]\r\nTag=zwei\r\nGroupByBox=ja\r\n[2.Column.cTIME]\r\nPosition=-7\r\nVisible=vielleicht\r\nWidth=-5\r\n"
                          "SortOrder=9\r\nSortIndex=x\r\nGroupIndex=0x\r\n[2.Filter]\r\nCount=99999999\r\nItem0.Parent=5\r\n"
                          "Item1.Parent=-1\r\nItem1.Kind=List\r\nItem2.Parent=1\r\nItem2.Kind=Condition\r\nItem2.Column=cDATE\r\n"
                          "Item2.Operator=is sometimes\r\n")
            << QStringLiteral("cTIME:1:51:s-10:g-1 cDATE:1:70:s-10:g-1 cFROM:1:153:s-10:g-1 cBEM:1:95:s-10:g-1 tag0 box0 filter0 ");
        QTest::newRow("binary garbage") << QByteArray("\x00\xff[2\x00]\r\n\x01=\x02\r\n[[[\r\n=\r\n", 20) << fresh;
        QTest::newRow("grouping by a stored group index, sorting kept in key order")
            << QByteArray("[2]\r\n[2.Column.cFROM]\r\nGroupIndex=0\r\nSortOrder=2\r\nVisible=0\r\n"
                          "[2.Column.cTIME]\r\nSortIndex=1\r\nSortOrder=1\r\n[2.Column.cDATE]\r\nSortIndex=0\r\nSortOrder=2\r\n")
            << QStringLiteral("cDATE:1:70:s02:g-1 cTIME:1:51:s11:g-1 cFROM:0:153:s-12:g0 cBEM:1:95:s-10:g-1 tag0 box0 filter0 ");
    }

    void toleratesUnknownColumnsTruncationAndJunk()
    {
        QFETCH(QByteArray, file);
        QFETCH(QString, expected);
        GridController g;
        define(g);
        // The frame's default sort, which a layout with columns replaces.
        g.setSortOrder(0, GridSortOrder::Descending);
        g.setSortOrder(1, GridSortOrder::Descending);
        IniFile ini;
        ini.parse(file);
        GridLayoutStore::restore(g, ini, QStringLiteral("2"));
        QCOMPARE(snapshot(g), expected);
        if (!g.filter().active)
            QCOMPARE(g.rowCount(), g.isGrouped() ? 3 : 4); // still usable
    }
};

ORVANTA_TEST(TestGridLayout)
#include "tst_grid_layout.moc"
