#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/MemoryGridSource.h"

#include <QSignalSpy>
#include <QTest>

using namespace orvanta;

namespace {

// Callers and days of a small log: record i has LID 100 + i.
std::unique_ptr<MemoryGridSource> makeLog()
{
    auto src = std::make_unique<MemoryGridSource>(std::vector<MemoryGridSource::Field>{
        {QStringLiteral("LID"), GridFieldType::Integer},
        {QStringLiteral("FROMBEZ"), GridFieldType::Text},
        {QStringLiteral("TSDATE"), GridFieldType::Date},
    });
    const QList<std::pair<QString, QDate>> rows = {
        {QStringLiteral("Meier"), QDate(2024, 3, 1)},  {QStringLiteral("Abel"), QDate(2024, 3, 2)},
        {QStringLiteral("meier"), QDate(2024, 3, 2)},  {QStringLiteral("Zorn"), QDate(2024, 3, 1)},
        {QStringLiteral("MEIER"), QDate(2024, 3, 3)},  {QStringLiteral("Abel"), QDate(2024, 3, 1)},
    };
    for (int i = 0; i < rows.size(); ++i) {
        const quint32 r = src->appendRow();
        src->setInt(r, 0, 100 + i);
        src->setText(r, 1, rows[i].first);
        src->setDate(r, 2, rows[i].second);
    }
    return src;
}

struct Grid {
    std::unique_ptr<MemoryGridSource> src = makeLog();
    GridController g;
    int lid, caller, day;
    Grid()
    {
        lid = g.addColumn(GridColumn(QStringLiteral("cLID"), QStringLiteral("LID")));
        caller = g.addColumn(GridColumn(QStringLiteral("cFROMBEZ"), QStringLiteral("FROMBEZ"), QStringLiteral("Anrufer"), 3));
        day = g.addColumn(GridColumn(QStringLiteral("cTSDATE"), QStringLiteral("TSDATE"), QStringLiteral("Datum"), 1));
        g.setKeyField(QStringLiteral("LID"));
        g.setSource(src.get());
    }
    QStringList rows() const
    {
        QStringList out;
        for (int r = 0; r < g.rowCount(); ++r)
            out << (g.isGroupRow(r) ? QStringLiteral("G%1 ").arg(g.groupLevel(r)) + g.groupRowText(r) : g.displayText(r, lid));
        return out;
    }
};

} // namespace

class TestGridGroup final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void groupRowsCountRecordsAndExpand()
    {
        Grid t;
        t.g.setSortOrder(t.day, GridSortOrder::Descending);
        t.g.groupBy(t.caller);
        QVERIFY(!t.g.isColumnVisible(t.caller));
        QCOMPARE(t.g.groupIndex(t.caller), 0);
        // Case variants form one group, named after its first record; groups start collapsed.
        QCOMPARE(t.rows(), (QStringList{"G0 Anrufer: Abel (2)", "G0 Anrufer: MEIER (3)", "G0 Anrufer: Zorn (1)"}));
        QCOMPARE(t.g.recordCount(), 6);
        t.g.setGroupExpanded(1, true);
        QCOMPARE(t.rows(), (QStringList{"G0 Anrufer: Abel (2)", "G0 Anrufer: MEIER (3)", "104", "102", "100", "G0 Anrufer: Zorn (1)"}));
        QVERIFY(t.g.isGroupExpanded(1));
        t.g.setGroupExpanded(1, false);
        QCOMPARE(t.g.rowCount(), 3);
        t.g.expandAll(true);
        QCOMPARE(t.g.rowCount(), 9);
        t.g.expandAll(false);
        QCOMPARE(t.g.rowCount(), 3);
        t.g.setGroupSortOrder(t.caller, GridSortOrder::Descending);
        QCOMPARE(t.g.groupValueText(0), QStringLiteral("Zorn"));
    }

    void expansionSurvivesARefresh()
    {
        Grid t;
        t.g.groupBy(t.caller);
        t.g.setGroupExpanded(2, true); // Zorn
        t.src->setText(5, 1, QStringLiteral("Zorn"));
        t.g.sourceChanged();
        QCOMPARE(t.rows(), (QStringList{"G0 Anrufer: Abel (1)", "G0 Anrufer: Meier (3)", "G0 Anrufer: Zorn (2)", "103", "105"}));
    }

    void ungroupShowsTheColumnAgain()
    {
        Grid t;
        t.g.setColumnVisible(t.day, false);
        t.g.groupBy(t.caller);
        t.g.groupBy(t.day);
        QCOMPARE(t.g.groupedColumns(), (std::vector<int>{t.caller, t.day}));
        t.g.expandAll(true);
        QCOMPARE(t.rows().first(), QStringLiteral("G0 Anrufer: Abel (2)"));
        QCOMPARE(t.rows().at(1), QStringLiteral("G1 Datum: 01.03.2024 (1)"));
        t.g.clearGrouping();
        QVERIFY(t.g.groupedColumns().empty());
        QVERIFY(t.g.isColumnVisible(t.caller));
        QVERIFY(t.g.isColumnVisible(t.day)); // grouping by it showed it once ungrouped
        QCOMPARE(t.g.rowCount(), 6);
        QCOMPARE(t.rows().first(), QStringLiteral("100")); // no sort left: source order
        GridColumn fixed(QStringLiteral("cFixed"), QStringLiteral("LID"), QStringLiteral("Fest"));
        fixed.groupable = false;
        const int f = t.g.addColumn(fixed);
        t.g.groupBy(f);
        QVERIFY(!t.g.isGrouped());
        QVERIFY(t.g.isColumnVisible(f));
    }

    void groupRowFocusHasNoRecord()
    {
        Grid t;
        QSignalSpy spy(&t.g, &GridController::focusedRecordChanged);
        t.g.setFocusedRow(4); // record 4
        QCOMPARE(t.g.focusedRecord(), 4);
        t.g.groupBy(t.caller);
        // Its group is collapsed: the focus moves to the group row holding it.
        QVERIFY(t.g.isGroupRow(t.g.focusedRow()));
        QCOMPARE(t.g.focusedRecord(), -1);
        QCOMPARE(t.g.groupValueText(t.g.focusedRow()), QStringLiteral("Meier"));
        QVERIFY(spy.count() >= 2);
        // Focusing a record expands the groups that hold it.
        QVERIFY(t.g.focusRecord(5));
        QCOMPARE(t.g.focusedRecord(), 5);
        QVERIFY(t.g.isGroupExpanded(0));
        QVERIFY(!t.g.isGroupExpanded(t.g.rowCount() - 1));
        // Collapse all, then the last record: only its group opens.
        t.g.expandAll(false);
        QVERIFY(t.g.isGroupRow(t.g.focusedRow()));
        QVERIFY(t.g.focusRecord(t.src->rowCount() - 1));
        QCOMPARE(t.g.focusedRecord(), 5);
        QCOMPARE(t.g.rowCount(), 5);
    }

    void lockAnnouncesOnce()
    {
        Grid t;
        QSignalSpy layout(&t.g, &GridController::layoutChanged);
        t.g.beginUpdate();
        t.g.clearGrouping();
        t.g.clearSorting();
        t.g.setSortOrder(t.day, GridSortOrder::Descending);
        t.g.groupBy(t.caller);
        t.g.beginUpdate();
        t.g.expandAll(true);
        t.g.endUpdate();
        QCOMPARE(layout.count(), 0);
        // Queries inside the lock already see the new rows.
        QCOMPARE(t.g.rowCount(), 9);
        t.g.endUpdate();
        QCOMPARE(layout.count(), 1);
        t.g.endUpdate(); // unbalanced: ignored
        QCOMPARE(layout.count(), 1);
    }
};

ORVANTA_TEST(TestGridGroup)
#include "tst_grid_group.moc"
