#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/MemoryGridSource.h"

#include <QSignalSpy>
#include <QTest>

using namespace orvanta;

namespace {

// One call per day from 2024-02-20 to 2024-03-20, and one without date; record i on day i.
std::unique_ptr<MemoryGridSource> makeDays()
{
    auto src = std::make_unique<MemoryGridSource>(std::vector<MemoryGridSource::Field>{
        {QStringLiteral("TSDATE"), GridFieldType::Date},
        {QStringLiteral("TS"), GridFieldType::DateTime},
        {QStringLiteral("CONTBEZ"), GridFieldType::Text},
    });
    for (QDate d(2024, 2, 20); d <= QDate(2024, 3, 20); d = d.addDays(1)) {
        const quint32 r = src->appendRow();
        src->setDate(r, 0, d);
        src->setInt(r, 1, gridvalue::fromDateTime(QDateTime(d, QTime(23, 59, 59))));
        src->setText(r, 2, r % 2 ? QStringLiteral("Äpfel %1").arg(r) : QStringLiteral("apfel %1").arg(r));
    }
    src->appendRow();
    return src;
}

QStringList dates(const GridController& g, int c)
{
    QStringList out;
    for (int r = 0; r < g.rowCount(); ++r)
        out << g.displayText(r, c);
    return out;
}

} // namespace

class TestGridFilter final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void periodConditionsFollowTheClock_data()
    {
        QTest::addColumn<int>("op");
        QTest::addColumn<QDate>("today");
        QTest::addColumn<QString>("first");
        QTest::addColumn<QString>("last");
        QTest::addColumn<int>("count");
        // 2024-03-06 is a Wednesday; its week runs from Monday 4th to Sunday 10th.
        QTest::newRow("today") << int(GridFilterOperator::Today) << QDate(2024, 3, 6) << "06.03.2024" << "06.03.2024" << 1;
        QTest::newRow("week") << int(GridFilterOperator::ThisWeek) << QDate(2024, 3, 6) << "04.03.2024" << "10.03.2024" << 7;
        QTest::newRow("week on sunday") << int(GridFilterOperator::ThisWeek) << QDate(2024, 3, 10) << "04.03.2024" << "10.03.2024" << 7;
        QTest::newRow("week across months") << int(GridFilterOperator::ThisWeek) << QDate(2024, 2, 29) << "26.02.2024" << "03.03.2024" << 7;
        QTest::newRow("leap february") << int(GridFilterOperator::ThisMonth) << QDate(2024, 2, 1) << "20.02.2024" << "29.02.2024" << 10;
        QTest::newRow("march so far") << int(GridFilterOperator::ThisMonth) << QDate(2024, 3, 31) << "01.03.2024" << "20.03.2024" << 20;
        QTest::newRow("nothing today") << int(GridFilterOperator::Today) << QDate(2025, 1, 1) << "" << "" << 0;
    }

    void periodConditionsFollowTheClock()
    {
        QFETCH(int, op);
        QFETCH(QDate, today);
        QFETCH(QString, first);
        QFETCH(QString, last);
        QFETCH(int, count);
        auto src = makeDays();
        for (const QString& field : {QStringLiteral("TSDATE"), QStringLiteral("TS")}) {
            GridController g;
            const int c = g.addColumn(GridColumn(QStringLiteral("col"), field, QStringLiteral("Datum")));
            const int day = g.addColumn(GridColumn(QStringLiteral("day"), QStringLiteral("TSDATE")));
            g.setTodayProvider([today] { return today; });
            g.setSource(src.get());
            g.setSortOrder(c, GridSortOrder::Ascending);
            g.addFilterItem(GridFilterItem::condition(QStringLiteral("col"), GridFilterOperator(op)));
            g.setFilterActive(true);
            QCOMPARE(g.recordCount(), count);
            if (count > 0) {
                QCOMPARE(g.displayText(0, day), first);
                QCOMPARE(g.displayText(g.rowCount() - 1, day), last);
            }
        }
    }

    void clockIsReadWhenTheFilterIsApplied()
    {
        auto src = makeDays();
        GridController g;
        const int c = g.addColumn(GridColumn(QStringLiteral("col"), QStringLiteral("TSDATE")));
        QDate today(2024, 3, 1);
        g.setTodayProvider([&today] { return today; });
        g.setSource(src.get());
        g.setFilter({true, GridFilterItem::list(GridFilterBoolOperator::And,
                                               {GridFilterItem::condition(QStringLiteral("col"), GridFilterOperator::Today,
                                                                          {}, QStringLiteral("Heute"))})});
        QCOMPARE(dates(g, c), QStringList{QStringLiteral("01.03.2024")});
        today = QDate(2024, 3, 2); // midnight passed: a re-apply sees the new day
        g.reapply();
        QCOMPARE(dates(g, c), QStringList{QStringLiteral("02.03.2024")});
        QCOMPARE(g.filterText(), QStringLiteral("TSDATE is today"));
    }

    void textConditionsAndFilterText()
    {
        auto src = makeDays();
        GridController g;
        const int c = g.addColumn(GridColumn(QStringLiteral("cont"), QStringLiteral("CONTBEZ"), QStringLiteral("Kontakt")));
        g.setSource(src.get());
        std::vector<GridFilterItem> letters;
        for (const QString& p : {QStringLiteral("A%"), QStringLiteral("Ä%")})
            letters.push_back(GridFilterItem::condition(QStringLiteral("cont"), GridFilterOperator::Like, p, p));
        g.addFilterItem(GridFilterItem::list(GridFilterBoolOperator::Or, letters));
        QCOMPARE(g.recordCount(), 31); // filter not switched on yet
        g.setFilterActive(true);
        QCOMPARE(g.recordCount(), 15); // LIKE is case-sensitive: "apfel" does not match
        QVERIFY(g.displayText(0, c).startsWith(QStringLiteral("Äpfel")));
        QCOMPARE(g.filterText(), QStringLiteral("(CONTBEZ LIKE 'A%' OR CONTBEZ LIKE 'Ä%')"));
        g.addFilterItem(GridFilterItem::condition(QStringLiteral("cont"), GridFilterOperator::Equal, QStringLiteral("äPFEL 3")));
        QCOMPARE(g.recordCount(), 1);
        QCOMPARE(g.filterText(), QStringLiteral("(CONTBEZ LIKE 'A%' OR CONTBEZ LIKE 'Ä%') AND CONTBEZ = 'äPFEL 3'"));
        // A condition on a column the grid does not have restricts nothing.
        g.setFilter({true, GridFilterItem::list(GridFilterBoolOperator::And,
                                               {GridFilterItem::condition(QStringLiteral("gone"), GridFilterOperator::Today)})});
        QCOMPARE(g.recordCount(), 31);
    }

    void clearingItemsShowsAllAgain()
    {
        auto src = makeDays();
        GridController g;
        g.addColumn(GridColumn(QStringLiteral("col"), QStringLiteral("TSDATE")));
        g.setTodayProvider([] { return QDate(2024, 3, 6); });
        g.setSource(src.get());
        QSignalSpy layout(&g, &GridController::layoutChanged);
        g.beginUpdate();
        g.setFilterActive(false);
        g.clearFilterItems();
        g.addFilterItem(GridFilterItem::condition(QStringLiteral("col"), GridFilterOperator::ThisWeek, {}, QStringLiteral("diese Woche")));
        g.setTag(2);
        g.setFilterActive(true);
        g.endUpdate();
        QCOMPARE(layout.count(), 1);
        QCOMPARE(g.rowCount(), 7);
        g.clearFilterItems();
        QVERIFY(g.filter().active);
        QVERIFY(g.filter().isEmpty());
        QCOMPARE(g.rowCount(), 31);
        QCOMPARE(g.filterText(), QString());
        g.clearFilterItems(); // nothing to clear: no new layout
        QCOMPARE(layout.count(), 2);
    }
};

ORVANTA_TEST(TestGridFilter)
#include "tst_grid_filter.moc"
