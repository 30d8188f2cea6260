#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridView.h"
#include "ui/grid/MemoryGridSource.h"

#include <QRandomGenerator>
#include <QSignalSpy>
#include <QTest>

using namespace orvanta;

namespace {

const QStringList kNames = {QStringLiteral("Meier"), QStringLiteral("meier"), QStringLiteral("Ärger"),
                            QStringLiteral("Apfel"), QStringLiteral("Zander"), QString(), QStringLiteral("Müller"),
                            QStringLiteral("Arzt")};

// Rows of (name, number, day, amount) drawn from a fixed seed: few distinct values, many ties,
// some nulls, so that merging has to keep equal rows in the order a full sort gives them.
void appendRows(MemoryGridSource& src, int count, QRandomGenerator& rnd)
{
    for (int i = 0; i < count; ++i) {
        const quint32 r = src.appendRow();
        const QString& name = kNames[int(rnd.bounded(kNames.size()))];
        if (!name.isNull())
            src.setText(r, 0, name);
        if (rnd.bounded(7) != 0)
            src.setInt(r, 1, rnd.bounded(20));
        src.setDate(r, 2, QDate(2024, 5, 1).addDays(rnd.bounded(30)));
        src.setDouble(r, 3, double(rnd.bounded(9)) / 4.0 - 1.0);
    }
}

std::unique_ptr<MemoryGridSource> makeSource()
{
    return std::make_unique<MemoryGridSource>(std::vector<MemoryGridSource::Field>{
        {QStringLiteral("NAME"), GridFieldType::Text},
        {QStringLiteral("NUM"), GridFieldType::Integer},
        {QStringLiteral("DAY"), GridFieldType::Date},
        {QStringLiteral("AMOUNT"), GridFieldType::Double},
    });
}

void addColumns(GridController& g)
{
    g.addColumn(GridColumn(QStringLiteral("colName"), QStringLiteral("NAME"), QStringLiteral("Name")));
    g.addColumn(GridColumn(QStringLiteral("colNum"), QStringLiteral("NUM"), QStringLiteral("Nummer")));
    g.addColumn(GridColumn(QStringLiteral("colDay"), QStringLiteral("DAY"), QStringLiteral("Datum")));
    g.addColumn(GridColumn(QStringLiteral("colAmount"), QStringLiteral("AMOUNT"), QStringLiteral("Betrag")));
}

QList<int> records(const GridController& g)
{
    QList<int> out;
    for (int r = 0; r < g.rowCount(); ++r)
        out << g.recordAt(r);
    return out;
}

// The rows as a controller computing everything afresh over the same source shows them.
QList<int> fullyComputed(GridController& g)
{
    g.reapply();
    return records(g);
}

} // namespace

class TestGridAppend final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void appendedRowsLandWhereAFullSortPutsThem_data()
    {
        QTest::addColumn<QList<int>>("keys"); // column, negative for descending (column + 1)
        QTest::addColumn<bool>("filtered");
        QTest::addColumn<bool>("searched");
        QTest::newRow("none") << QList<int>{} << false << false;
        QTest::newRow("text") << QList<int>{0} << false << false;
        QTest::newRow("date desc, number") << QList<int>{-3, 1} << false << false;
        QTest::newRow("number desc, text desc") << QList<int>{-2, -1} << false << false;
        QTest::newRow("double, with filter") << QList<int>{3} << true << false;
        QTest::newRow("text, with search") << QList<int>{0, -3} << false << true;
    }
    void appendedRowsLandWhereAFullSortPutsThem()
    {
        QFETCH(QList<int>, keys);
        QFETCH(bool, filtered);
        QFETCH(bool, searched);
        QRandomGenerator rnd(4711);
        auto src = makeSource();
        GridController g;
        addColumns(g);
        appendRows(*src, 50, rnd);
        g.setSource(src.get());
        for (const int k : keys)
            g.setSortOrder(k < 0 ? -k - 1 : k, k < 0 ? GridSortOrder::Descending : GridSortOrder::Ascending);
        if (filtered) {
            GridFilterItem item;
            item.column = QStringLiteral("colDay");
            item.op = GridFilterOperator::ThisMonth;
            GridFilter filter;
            filter.active = true;
            filter.root.items.push_back(item);
            g.setTodayProvider([] { return QDate(2024, 5, 15); });
            g.setFilter(filter);
        }
        if (searched) {
            GridSearch search;
            search.text = QStringLiteral("ei");
            search.columns = {0};
            g.setSearch(search);
        }
        for (const int batch : {1, 7, 200, 0, 1000}) {
            appendRows(*src, batch, rnd);
            g.sourceAppended();
            QCOMPARE(g.appliedRowCount(), src->rowCount());
            const QList<int> merged = records(g);
            QCOMPARE(merged, fullyComputed(g));
        }
    }

    void focusStaysOnItsRecordAndEachArrivalIsAnnouncedOnce()
    {
        QRandomGenerator rnd(7);
        auto src = makeSource();
        GridController g;
        addColumns(g);
        appendRows(*src, 20, rnd);
        g.setSource(src.get());
        g.setSortOrder(1, GridSortOrder::Ascending);
        g.setFocusedRow(5);
        const int focused = g.focusedRecord();
        QSignalSpy layout(&g, &GridController::layoutChanged);
        QSignalSpy record(&g, &GridController::focusedRecordChanged);
        appendRows(*src, 300, rnd);
        g.sourceAppended();
        QCOMPARE(layout.count(), 1);
        QCOMPARE(record.count(), 0);
        QCOMPARE(g.focusedRecord(), focused);
        QCOMPARE(g.rowCount(), 320);
        // Nothing new: nothing announced.
        g.sourceAppended();
        QCOMPARE(layout.count(), 1);
    }

    void arrivingRowsLeaveTheScrollPositionAlone()
    {
        QRandomGenerator rnd(3);
        auto src = makeSource();
        appendRows(*src, 200, rnd);
        GridView view;
        addColumns(*view.controller());
        view.setSource(src.get());
        view.resize(400, 300);
        view.show();
        view.controller()->setFocusedRow(0);
        // The user scrolled away from the focused row while the rest arrives.
        view.scrollToRow(120);
        const int first = view.firstVisibleRow();
        QVERIFY(first > 0);
        appendRows(*src, 500, rnd);
        view.controller()->sourceAppended();
        QCOMPARE(view.firstVisibleRow(), first);
        QCOMPARE(view.controller()->rowCount(), 700);
        // A real change of the rows still brings the focused row back into view.
        view.controller()->setSortOrder(1, GridSortOrder::Descending);
        const int focused = view.controller()->focusedRow();
        QVERIFY(focused >= view.firstVisibleRow() && focused < view.firstVisibleRow() + 20);
    }

    void groupedArrivalsRegroupTheWholeSource()
    {
        QRandomGenerator rnd(11);
        auto src = makeSource();
        GridController g;
        addColumns(g);
        appendRows(*src, 30, rnd);
        g.setSource(src.get());
        g.groupBy(0);
        g.expandAll(true);
        // Rows that arrive unannounced stay out of the groups until sourceAppended().
        appendRows(*src, 70, rnd);
        int inGroups = 0;
        for (int r = 0; r < g.rowCount(); ++r)
            inGroups += g.isGroupRow(r) ? 0 : 1;
        QCOMPARE(inGroups, 30);
        g.sourceAppended();
        g.expandAll(true);
        inGroups = 0;
        for (int r = 0; r < g.rowCount(); ++r)
            inGroups += g.isGroupRow(r) ? 0 : 1;
        QCOMPARE(inGroups, 100);
        const std::vector<quint32> grouped = g.recordsInOrder();
        g.reapply();
        QCOMPARE(grouped, g.recordsInOrder());
    }
};

ORVANTA_TEST(TestGridAppend)
#include "tst_grid_append.moc"
