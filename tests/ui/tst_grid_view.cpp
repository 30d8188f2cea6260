#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridGroupBox.h"
#include "ui/grid/GridHeader.h"
#include "ui/grid/GridModel.h"
#include "ui/grid/GridView.h"
#include "ui/grid/MemoryGridSource.h"
#include "ui/texts/UiTexts.h"

#include <QAbstractItemModelTester>
#include <QMenu>
#include <QSignalSpy>
#include <QTest>

using namespace orvanta;

namespace {

struct Fixture {
    MemoryGridSource src{{{QStringLiteral("LID"), GridFieldType::Integer},
                          {QStringLiteral("FROMBEZ"), GridFieldType::Text},
                          {QStringLiteral("ABID"), GridFieldType::Integer},
                          {QStringLiteral("CCHARGE"), GridFieldType::Money}}};
    GridView view;
    int lid, caller, abid, charge;

    Fixture()
    {
        const QStringList names = {QStringLiteral("Meier"), QStringLiteral("Abel"), QStringLiteral("Zorn"), QStringLiteral("abel")};
        for (int i = 0; i < 40; ++i) {
            const quint32 r = src.appendRow();
            src.setInt(r, 0, i);
            src.setText(r, 1, names[i % names.size()]);
            src.setInt(r, 2, i % 5 == 0 ? 1 : 0);
            src.setInt(r, 3, 150 * i);
        }
        lid = view.addColumn(GridColumn(QStringLiteral("cLID"), QStringLiteral("LID"), QStringLiteral("Nr"), 0, 40));
        caller = view.addColumn(GridColumn(QStringLiteral("cFROM"), QStringLiteral("FROMBEZ"), QStringLiteral("Anrufer"), 3, 120));
        abid = view.addColumn(GridColumn(QStringLiteral("cABID"), QStringLiteral("ABID"), QString(), 11, 30));
        GridColumn costs(QStringLiteral("cCHARGE"), QStringLiteral("CCHARGE"), QStringLiteral("Kosten"), 10, 80);
        costs.numberFormat = QStringLiteral("0.00 €");
        costs.alignment = Qt::AlignRight | Qt::AlignVCenter;
        charge = view.addColumn(costs);
        view.setSource(&src);
        view.resize(500, 300);
        view.setAutoWidth(false);
        view.show();
    }
    QPoint sectionCenter(int c) const
    {
        return {view.header()->sectionViewportPosition(c) + view.header()->sectionSize(c) / 2, view.header()->height() / 2};
    }
};

} // namespace

class TestGridView final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void modelPassesTheTesterThroughChanges()
    {
        Fixture f;
        QAbstractItemModelTester tester(f.view.model(), QAbstractItemModelTester::FailureReportingMode::QtTest);
        GridController* g = f.view.controller();
        g->setSortOrder(f.caller, GridSortOrder::Ascending);
        g->groupBy(f.caller);
        g->expandAll(true);
        g->setGroupExpanded(0, false);
        g->setColumnVisible(f.abid, false);
        g->addFilterItem(GridFilterItem::condition(QStringLiteral("cFROM"), GridFilterOperator::Like, QStringLiteral("Z%")));
        g->setFilterActive(true);
        g->clearGrouping();
        f.src.setText(0, 1, QStringLiteral("Zander"));
        g->sourceChanged();
        g->setSource(nullptr);
        QCOMPARE(f.view.model()->rowCount(), 0);
        g->setSource(&f.src);
        GridModel* m = f.view.model();
        QCOMPARE(m->rowCount(), 11);
        const QModelIndex cost = m->index(1, f.charge);
        QCOMPARE(m->data(cost).toString(), QStringLiteral("3.00 €")); // record 2 under LC_ALL=C
        QCOMPARE(m->data(cost, GridModel::RawValueRole).toLongLong(), 300);
        QCOMPARE(m->data(cost, GridModel::RecordRole).toInt(), 2);
        QCOMPARE(m->headerData(f.caller, Qt::Horizontal).toString(), QStringLiteral("Anrufer"));
    }

    void paintsSortedColumnsGreyAndCallsThePainterHook()
    {
        Fixture f;
        QPixmap mark(16, 16);
        mark.fill(Qt::red);
        f.view.setImages({mark});
        int painted = 0;
        f.view.setCellPainter([&](QPainter& p, const GridCellInfo& cell) {
            if (cell.column != f.abid)
                return false;
            ++painted;
            p.fillRect(cell.rect, cell.background);
            if (f.src.intValue(static_cast<quint32>(cell.record), 2) > 0)
                p.drawPixmap(cell.rect.left() + (cell.rect.width() - 16) / 2, cell.rect.top() + (cell.rect.height() - 16) / 2, mark);
            return true;
        });
        f.view.controller()->setSortOrder(f.caller, GridSortOrder::Descending);
        f.view.controller()->setFocusedRow(0);
        const QImage img = f.view.viewport()->grab().toImage();
        QVERIFY(painted > 0);
        // Row 1, not focused: the sorted column on #EFEFEF, the others on the base colour.
        const QRect sorted = f.view.cellRect(1, f.caller);
        const QRect plain = f.view.cellRect(1, f.lid);
        QVERIFY(!sorted.isNull() && !plain.isNull());
        QCOMPARE(img.pixelColor(sorted.right() - 3, sorted.top() + 2), QColor(0xEF, 0xEF, 0xEF));
        QCOMPARE(img.pixelColor(plain.right() - 3, plain.top() + 2), f.view.palette().color(QPalette::Base));
        // Focused row: highlight, also in the sorted column.
        const QRect focused = f.view.cellRect(0, f.caller);
        QVERIFY(img.pixelColor(focused.right() - 3, focused.top() + 2) != QColor(0xEF, 0xEF, 0xEF));
        // The hook drew the mark of the first row with ABID > 0.
        int row = 0;
        while (f.src.intValue(static_cast<quint32>(f.view.controller()->recordAt(row)), 2) == 0)
            ++row;
        const QRect icon = f.view.cellRect(row, f.abid);
        QCOMPARE(img.pixelColor(icon.center()), QColor(Qt::red));
    }

    void headerGesturesSortHideAndGroup()
    {
        Fixture f;
        GridController* g = f.view.controller();
        QSignalSpy draggedOut(&f.view, &GridView::columnDraggedOut);
        GridHeader* h = f.view.header();
        QTest::mouseClick(h->viewport(), Qt::LeftButton, {}, f.sectionCenter(f.caller));
        QCOMPARE(g->sortIndex(f.caller), 0);
        QCOMPARE(g->sortOrder(f.caller), GridSortOrder::Ascending);
        QTest::mouseClick(h->viewport(), Qt::LeftButton, Qt::ShiftModifier, f.sectionCenter(f.lid));
        QCOMPARE(g->sortedColumns(), (std::vector<int>{f.caller, f.lid}));

        // Dragged far below the header: hidden, and the order is unchanged.
        const std::vector<int> order = g->columnOrder();
        const QPoint start = f.sectionCenter(f.charge);
        QTest::mousePress(h->viewport(), Qt::LeftButton, {}, start);
        QTest::mouseMove(h->viewport(), start + QPoint(-30, 5));
        QTest::mouseMove(h->viewport(), start + QPoint(-60, 80));
        QTest::mouseRelease(h->viewport(), Qt::LeftButton, {}, start + QPoint(-60, 80));
        QVERIFY(!g->isColumnVisible(f.charge));
        QCOMPARE(draggedOut.count(), 1);
        QCOMPARE(g->columnOrder(), order);

        // Dropped on the group-by box: grouped.
        g->setGroupByBoxVisible(true);
        QTRY_VERIFY(f.view.groupByBox()->isVisible());
        const QPoint from = f.sectionCenter(f.caller);
        const QPoint onBox = h->viewport()->mapFrom(&f.view, f.view.groupByBox()->geometry().center());
        QTest::mousePress(h->viewport(), Qt::LeftButton, {}, from);
        QTest::mouseMove(h->viewport(), from + QPoint(10, -5));
        QTest::mouseMove(h->viewport(), onBox);
        QTest::mouseRelease(h->viewport(), Qt::LeftButton, {}, onBox);
        QCOMPARE(g->groupedColumns(), std::vector<int>{f.caller});
        QVERIFY(!g->isColumnVisible(f.caller));
        QCOMPARE(draggedOut.count(), 1);
        // Double click on its button in the box ungroups.
        const QRect button = f.view.groupByBox()->buttonRect(0);
        QTest::mouseDClick(f.view.groupByBox(), Qt::LeftButton, {}, button.center());
        QVERIFY(!g->isGrouped());
        QVERIFY(g->isColumnVisible(f.caller));
    }

    void columnMenuAndUserResizeReachTheController()
    {
        Fixture f;
        GridController* g = f.view.controller();
        QMenu menu;
        f.view.fillColumnMenu(&menu);
        QStringList captions;
        for (QAction* a : menu.actions())
            captions << a->text();
        QCOMPARE(captions, (QStringList{"Nr", "Anrufer", "Kosten"})); // no caption, no entry
        QSignalSpy visibility(g, &GridController::columnVisibilityChanged);
        menu.actions().at(1)->trigger();
        QVERIFY(!g->isColumnVisible(f.caller));
        QVERIFY(f.view.header()->isSectionHidden(f.caller));
        QCOMPARE(visibility.count(), 1);
        f.view.header()->resizeSection(f.lid, 77);
        QCOMPARE(g->column(f.lid).width, 77);
        f.view.header()->moveSection(f.view.header()->visualIndex(f.charge), 0);
        QCOMPARE(g->columnOrder().front(), f.charge);
        g->moveColumn(f.lid, 0); // and back from the controller to the header
        QCOMPARE(f.view.header()->logicalIndex(0), f.lid);
    }

    void keyboardAndMouseMoveTheFocus()
    {
        Fixture f;
        GridController* g = f.view.controller();
        QSignalSpy keys(&f.view, &GridView::keyPressed);
        QSignalSpy focus(&f.view, &GridView::focusedRecordChanged);
        QSignalSpy dbl(&f.view, &GridView::rowDoubleClicked);
        f.view.setFocus();
        g->setFocusedRow(0);
        QTest::keyClick(&f.view, Qt::Key_Down);
        QCOMPARE(g->focusedRow(), 1);
        QTest::keyClick(&f.view, Qt::Key_End);
        QCOMPARE(g->focusedRow(), 39);
        QVERIFY(f.view.firstVisibleRow() > 0); // scrolled to keep it in view
        QVERIFY(!f.view.rowRect(39).isNull());
        QTest::keyClick(&f.view, Qt::Key_Home);
        QCOMPARE(g->focusedRow(), 0);
        QCOMPARE(f.view.firstVisibleRow(), 0);
        QCOMPARE(keys.count(), 3);
        QCOMPARE(keys.at(0).at(0).toInt(), int(Qt::Key_Down));
        QVERIFY(focus.count() >= 3);
        const QRect third = f.view.rowRect(2);
        QTest::mouseClick(f.view.viewport(), Qt::LeftButton, {}, third.center());
        QCOMPARE(g->focusedRow(), 2);
        QTest::mouseDClick(f.view.viewport(), Qt::LeftButton, {}, third.center());
        QCOMPARE(dbl.count(), 1);
        // Group rows: + and - expand and collapse, a double click toggles, no double-click signal.
        g->groupBy(f.caller);
        g->setFocusedRow(0);
        QTest::keyClick(&f.view, Qt::Key_Plus);
        QVERIFY(g->isGroupExpanded(0));
        QTest::keyClick(&f.view, Qt::Key_Minus);
        QVERIFY(!g->isGroupExpanded(0));
        QTest::mouseDClick(f.view.viewport(), Qt::LeftButton, {}, f.view.rowRect(0).center());
        QVERIFY(g->isGroupExpanded(0));
        QCOMPARE(dbl.count(), 1);
        QCOMPARE(g->groupRowText(0), QStringLiteral("Anrufer: Abel (20)"));
    }

    void emptyGridAndGroupBoxShowTheInstalledTexts()
    {
        // The texts come from the one replaceable table, so the German ones installed at
        // start-up are what the user sees.
        MemoryGridSource empty({{QStringLiteral("LID"), GridFieldType::Integer}});
        GridView view;
        view.addColumn(GridColumn(QStringLiteral("cLID"), QStringLiteral("LID"), QStringLiteral("Nr"), 0, 40));
        view.setSource(&empty);
        view.resize(300, 200);
        const QString before = uiText(UiText::GridNoData);
        setUiText(UiText::GridNoData, QString());
        const QImage blank = view.viewport()->grab().toImage();
        setUiText(UiText::GridNoData, QStringLiteral("<Keine Daten vorhanden>"));
        const QImage withText = view.viewport()->grab().toImage();
        setUiText(UiText::GridNoData, before);
        QVERIFY(blank != withText);

        const QString hint = uiText(UiText::GridGroupByBox);
        setUiText(UiText::GridGroupByBox, QStringLiteral("Spaltenkopf hierher ziehen"));
        QCOMPARE(GridGroupBox::hintText(), QStringLiteral("Spaltenkopf hierher ziehen"));
        setUiText(UiText::GridGroupByBox, hint);
    }

    void lockDefersPaintingAndSignals()
    {
        Fixture f;
        QSignalSpy layout(f.view.controller(), &GridController::layoutChanged);
        f.view.beginUpdate();
        QVERIFY(!f.view.viewport()->updatesEnabled());
        f.view.controller()->setSortOrder(f.caller, GridSortOrder::Ascending);
        f.view.controller()->setSortOrder(f.lid, GridSortOrder::Descending);
        QCOMPARE(layout.count(), 0);
        f.view.endUpdate();
        QVERIFY(f.view.viewport()->updatesEnabled());
        QCOMPARE(layout.count(), 1);
    }
};

ORVANTA_TEST(TestGridView)
#include "tst_grid_view.moc"
