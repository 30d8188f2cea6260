#include "tests/support/TestRegistry.h"
#include "ui/grid/GridCardView.h"
#include "ui/grid/GridColumnMenu.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridUpdateLock.h"
#include "ui/grid/MemoryGridSource.h"

#include <QFile>
#include <QMenu>
#include <QMouseEvent>
#include <QScrollBar>
#include <QSignalSpy>
#include <QTemporaryDir>
#include <QTest>
#include <QWheelEvent>

using namespace orvanta;

namespace {

enum Field { LID, CONTBEZ, PLZ, ORT };

// Contacts "Kontakt 00" .. in a shuffled order, so sorting shows.
struct Fixture {
    MemoryGridSource src{{{QStringLiteral("LID"), GridFieldType::Integer},
                          {QStringLiteral("CONTBEZ"), GridFieldType::Text},
                          {QStringLiteral("PLZ"), GridFieldType::Text},
                          {QStringLiteral("ORT"), GridFieldType::Text}}};
    GridCardView view;
    int lid, title, plz, ort;

    explicit Fixture(int records = 30)
    {
        for (int i = 0; i < records; ++i) {
            const quint32 r = src.appendRow();
            const int n = (i * 7) % records;
            src.setInt(r, LID, n);
            src.setText(r, CONTBEZ, QStringLiteral("%1 Kontakt %2").arg(n % 3 == 0 ? QStringLiteral("M") : QStringLiteral("B")).arg(n, 2, 10, QLatin1Char('0')));
            src.setText(r, PLZ, QString::number(10000 + n));
            src.setText(r, ORT, n % 2 ? QStringLiteral("Köln") : QStringLiteral("Berlin"));
        }
        GridColumn key(QStringLiteral("cLID"), QStringLiteral("LID"));
        key.visible = false;
        key.movable = false;
        lid = view.addColumn(key);
        GridColumn caption(QStringLiteral("cCONTBEZ"), QStringLiteral("CONTBEZ"), QStringLiteral("Kontaktbezeichnung"), 15);
        caption.movable = false;
        title = view.addColumn(caption);
        plz = view.addColumn(GridColumn(QStringLiteral("cPLZ"), QStringLiteral("PLZ"), QStringLiteral("PLZ"), 18));
        ort = view.addColumn(GridColumn(QStringLiteral("cORT"), QStringLiteral("ORT"), QStringLiteral("Ort"), 19));
        view.setCaptionColumn(title);
        view.setCardWidth(200);
        view.setSource(&src);
        view.resize(700, 300);
        view.show();
    }
    GridController* g() const { return view.controller(); }
    QString titleOf(int card) const { return g()->displayText(card, title); }
    void key(int k) { QTest::keyClick(&view, static_cast<Qt::Key>(k)); }
};

QRect viewportRect(const GridCardView& v)
{
    return v.viewport()->rect();
}

void sendMouse(QWidget* w, QEvent::Type type, const QPoint& pos, Qt::MouseButtons buttons)
{
    QMouseEvent e(type, pos, w->mapToGlobal(pos), Qt::LeftButton, buttons, Qt::NoModifier);
    QApplication::sendEvent(w, &e);
}

} // namespace

class TestGridCardView final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void cardsFlowDownThenIntoTheNextColumn()
    {
        Fixture f;
        const int per = f.view.cardsPerColumn();
        QVERIFY(per >= 1);
        // Every card of a column lies inside the viewport's height, one more would not.
        const QRect last = f.view.cardRect(per - 1);
        QVERIFY(last.bottom() < f.view.viewport()->height());
        QVERIFY(last.bottom() + f.view.cardHeight() > f.view.viewport()->height());
        for (int k = 1; k < per; ++k) {
            QCOMPARE(f.view.cardRect(k).left(), f.view.cardRect(0).left());
            QVERIFY(f.view.cardRect(k).top() > f.view.cardRect(k - 1).bottom());
        }
        const QRect next = f.view.cardRect(per);
        QCOMPARE(next.top(), f.view.cardRect(0).top());
        QVERIFY(next.left() > f.view.cardRect(0).right());
        QCOMPARE(next.width(), 200);
        for (const int k : {0, per - 1, per, 2 * per + 1})
            QCOMPARE(f.view.cardAt(f.view.cardRect(k).center()), k);
        QCOMPARE(f.view.cardAt(QPoint(2, 2)), -1); // the margin
        QVERIFY(f.view.cardRect(30).isNull());

        // A taller view holds more cards per column; hiding a row makes every card shorter.
        f.view.resize(700, 600);
        QVERIFY(f.view.cardsPerColumn() > per);
        const int height = f.view.cardHeight();
        f.view.setRowVisible(f.plz, false);
        QVERIFY(!f.view.isRowVisible(f.plz));
        QCOMPARE(f.view.cardHeight(), height - f.view.lineHeight());
        QVERIFY(f.view.lineRect(0, f.plz).isNull());
        QVERIFY(!f.view.lineRect(0, f.ort).isNull());

        // The caption row is the title, not a line; the lines are the visible rows in order.
        QCOMPARE(f.view.rowAt(f.view.lineRect(3, f.ort).center()), f.ort);
        QCOMPARE(f.view.rowAt(f.view.cardRect(3).topLeft() + QPoint(5, 3)), -1);
    }

    void keysMoveTheFocusAcrossCardsAndColumns()
    {
        Fixture f;
        QSignalSpy keys(&f.view, &GridCardView::keyPressed);
        QSignalSpy activated(&f.view, &GridCardView::rowDoubleClicked);
        QSignalSpy focused(&f.view, &GridCardView::focusedRecordChanged);
        const int per = f.view.cardsPerColumn();
        QVERIFY(per < 30);
        f.g()->setFocusedRow(per - 1);
        f.key(Qt::Key_Down); // off the bottom: top of the next column
        QCOMPARE(f.g()->focusedRow(), per);
        f.key(Qt::Key_Up);
        QCOMPARE(f.g()->focusedRow(), per - 1);
        f.key(Qt::Key_Right);
        QCOMPARE(f.g()->focusedRow(), 2 * per - 1);
        f.key(Qt::Key_Left);
        f.key(Qt::Key_Left); // first column: stays
        QCOMPARE(f.g()->focusedRow(), per - 1);
        f.key(Qt::Key_End);
        QCOMPARE(f.g()->focusedRow(), 29);
        f.key(Qt::Key_Right); // last column: stays
        QCOMPARE(f.g()->focusedRow(), 29);
        // The end scrolled into view.
        QVERIFY(viewportRect(f.view).contains(f.view.cardRect(29)));
        QVERIFY(f.view.horizontalScrollBar()->value() > 0);
        f.key(Qt::Key_Home);
        QCOMPARE(f.g()->focusedRow(), 0);
        QCOMPARE(f.view.horizontalScrollBar()->value(), 0);
        // The wheel scrolls the cards sideways.
        QWheelEvent wheel(QPointF(50, 50), f.view.viewport()->mapToGlobal(QPointF(50, 50)), {}, QPoint(0, -120),
                          Qt::NoButton, Qt::NoModifier, Qt::NoScrollPhase, false);
        QApplication::sendEvent(f.view.viewport(), &wheel);
        QVERIFY(f.view.horizontalScrollBar()->value() > 0);
        f.view.horizontalScrollBar()->setValue(0);
        f.key(Qt::Key_PageDown); // by the cards on screen
        const int page = f.g()->focusedRow();
        QVERIFY(page >= per);
        QCOMPARE(page % per, 0);
        QVERIFY(viewportRect(f.view).contains(f.view.cardRect(page)));
        f.key(Qt::Key_PageUp);
        QCOMPARE(f.g()->focusedRow(), 0);
        QCOMPARE(keys.count(), 10);
        QCOMPARE(keys.first().at(0).toInt(), int(Qt::Key_Down));
        QCOMPARE(focused.count(), 9); // the keys that stayed announced nothing

        f.key(Qt::Key_Down);
        f.key(Qt::Key_Return);
        QCOMPARE(activated.count(), 1);
        QCOMPARE(activated.first().at(0).toInt(), 1);
        QTest::mouseDClick(f.view.viewport(), Qt::LeftButton, {}, f.view.cardRect(per).center());
        QCOMPARE(activated.count(), 2);
        QCOMPARE(activated.last().at(0).toInt(), per);
        QCOMPARE(f.g()->focusedRow(), per);

        // An empty view takes the keys without a focus.
        f.view.setSource(nullptr);
        f.key(Qt::Key_Down);
        f.key(Qt::Key_Return);
        QCOMPARE(f.g()->focusedRow(), -1);
        QCOMPARE(activated.count(), 2);
    }

    void sortAndFilterWorkOnTheSourceRows()
    {
        Fixture f;
        QCOMPARE(f.g()->source(), &f.src);
        f.g()->setSortOrder(f.title, GridSortOrder::Descending);
        QCOMPARE(f.titleOf(0), QStringLiteral("M Kontakt 27"));
        QCOMPARE(f.titleOf(29), QStringLiteral("B Kontakt 01"));
        f.g()->addFilterItem(GridFilterItem::condition(QStringLiteral("cCONTBEZ"), GridFilterOperator::Like, QStringLiteral("M%")));
        f.g()->setFilterActive(true);
        QCOMPARE(f.g()->rowCount(), 10);
        for (int k = 0; k < 10; ++k)
            QVERIFY(f.titleOf(k).startsWith(QLatin1Char('M')));
        QVERIFY(f.view.cardRect(10).isNull());
        QCOMPARE(f.g()->recordAt(9), 0); // "M Kontakt 00" is record 0, sorted last

        // Cards read the source, not a copy: a value changed in place shows at once.
        f.src.setText(0, ORT, QStringLiteral("Oberammergau"));
        QCOMPARE(f.g()->displayText(9, f.ort), QStringLiteral("Oberammergau"));

        // Cards have no groups: a grouping set on the controller is dropped.
        f.g()->groupBy(f.ort);
        QVERIFY(!f.g()->isGrouped());
        QVERIFY(f.view.isRowVisible(f.ort));
        QCOMPARE(f.g()->rowCount(), 10);
    }

    void onlyTheCardsOnScreenAreFormatted()
    {
        MemoryGridSource src({{QStringLiteral("LID"), GridFieldType::Integer}});
        for (int i = 0; i < 100'000; ++i)
            src.setInt(src.appendRow(), 0, i);
        GridCardView view;
        int formatted = 0;
        GridColumn id(QStringLiteral("cLID"), QStringLiteral("LID"), QStringLiteral("Nr"));
        id.displayText = [&formatted](const GridSource& s, quint32 r) {
            ++formatted;
            return QString::number(s.intValue(r, 0));
        };
        view.setCaptionColumn(view.addColumn(id));
        view.addColumn(id);
        view.setSource(&src);
        view.resize(800, 600);
        view.show();
        QVERIFY(QTest::qWaitForWindowExposed(&view));
        formatted = 0;
        view.viewport()->grab();
        const auto [first, end] = view.visibleCards();
        QVERIFY(end - first > 0 && end - first < 200);
        QVERIFY(formatted > 0);
        QVERIFY(formatted <= 2 * (end - first));

        QTest::keyClick(&view, Qt::Key_End);
        formatted = 0;
        view.viewport()->grab();
        QCOMPARE(view.visibleCards().second, 100'000);
        QVERIFY(formatted > 0 && formatted <= 2 * (end - first));
    }

    void movedRowsMoveOnEveryCardAndFixedRowsStay()
    {
        Fixture f;
        const QList<int> initial = f.view.rowOrder();
        QCOMPARE(initial, (QList<int>{f.lid, f.title, f.plz, f.ort}));
        QVERIFY(f.view.lineRect(0, f.plz).top() < f.view.lineRect(0, f.ort).top());

        f.view.moveRow(f.ort, 0); // in front of the fixed key and title: behind them
        QCOMPARE(f.view.rowOrder(), (QList<int>{f.lid, f.title, f.ort, f.plz}));
        for (const int card : {0, 5, 29})
            QVERIFY(f.view.lineRect(card, f.ort).top() < f.view.lineRect(card, f.plz).top());

        f.view.moveRow(f.title, 3); // not movable
        f.view.setRowOrder({f.plz, f.ort, f.title, f.lid});
        QCOMPARE(f.view.rowOrder(), (QList<int>{f.lid, f.title, f.plz, f.ort}));
        f.view.setRowOrder({f.plz, f.plz, f.title, f.lid}); // no permutation
        f.view.setRowOrder({f.plz});
        QCOMPARE(f.view.rowOrder(), (QList<int>{f.lid, f.title, f.plz, f.ort}));

        // Dragging a row's line onto another line of any card.
        QWidget* vp = f.view.viewport();
        const QPoint from = f.view.lineRect(1, f.ort).center();
        const QPoint to = f.view.lineRect(2, f.plz).center();
        sendMouse(vp, QEvent::MouseButtonPress, from, Qt::LeftButton);
        sendMouse(vp, QEvent::MouseMove, from + QPoint(0, -20), Qt::LeftButton);
        sendMouse(vp, QEvent::MouseMove, to, Qt::LeftButton);
        sendMouse(vp, QEvent::MouseButtonRelease, to, Qt::NoButton);
        QCOMPARE(f.view.rowOrder(), (QList<int>{f.lid, f.title, f.ort, f.plz}));
        QCOMPARE(f.g()->focusedRow(), 1);

        // A row marked fixed later cannot be dragged either.
        f.view.setRowMovable(f.plz, false);
        QVERIFY(!f.view.isRowMovable(f.plz));
        f.view.moveRow(f.plz, 2);
        QCOMPARE(f.view.rowOrder(), (QList<int>{f.lid, f.title, f.ort, f.plz}));

        // The row menu offers the rows (not the title or the key) and hides them.
        QMenu menu;
        f.view.fillRowMenu(&menu);
        QCOMPARE(menu.actions().size(), 2);
        QCOMPARE(menu.actions().first()->text(), QStringLiteral("Ort"));
        menu.actions().first()->toggle();
        QVERIFY(!f.view.isRowVisible(f.ort));

        // The frames' "Ansicht" menu drives rows by Tag as it drives table columns.
        QMenu popup;
        GridColumnMenu view(&f.view, &popup, QStringLiteral("CVUM"));
        QAction* plz = view.addEntry(QStringLiteral("CVUM7"), QStringLiteral("PLZ/Ort"), 18);
        QAction* ort = view.addEntry(QStringLiteral("CVUM8"), QStringLiteral("Ort"), 19);
        view.checkVisibleColumns();
        QVERIFY(plz->isChecked());
        QVERIFY(!ort->isChecked());
        plz->trigger();
        QVERIFY(!f.view.isRowVisible(f.plz));
        ort->trigger();
        QVERIFY(f.view.isRowVisible(f.ort));
        {
            const GridUpdateLock lock(&f.view);
            QVERIFY(!f.view.viewport()->updatesEnabled());
        }
        QVERIFY(f.view.viewport()->updatesEnabled());
    }

    void layoutStoreRoundTripAndDamagedFiles()
    {
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("VStoreC"));
        {
            Fixture f;
            f.view.moveRow(f.ort, 2);
            f.view.setRowVisible(f.plz, false);
            f.view.setCardWidth(250);
            f.g()->setSortOrder(f.title, GridSortOrder::Descending);
            f.g()->setTag(13);
            QVERIFY(f.view.storeLayout(path, QStringLiteral("1")));
        }
        {
            Fixture f;
            QVERIFY(f.view.restoreLayout(path, QStringLiteral("1")));
            QCOMPARE(f.view.rowOrder(), (QList<int>{f.lid, f.title, f.ort, f.plz}));
            QVERIFY(!f.view.isRowVisible(f.plz));
            QVERIFY(!f.view.isRowVisible(f.lid));
            QCOMPARE(f.view.cardWidth(), 250);
            QCOMPARE(f.view.cardRect(0).width(), 250);
            QCOMPARE(f.g()->sortOrder(f.title), GridSortOrder::Descending);
            QCOMPARE(f.g()->tag(), 13);
            QCOMPARE(f.titleOf(0), QStringLiteral("M Kontakt 27"));
            QVERIFY(!f.view.restoreLayout(path, QStringLiteral("2")));
            QVERIFY(!f.view.restoreLayout(dir.filePath(QStringLiteral("missing")), QStringLiteral("1")));
            QCOMPARE(f.view.cardWidth(), 250);
        }

        // Damaged: a fixed row moved to the front, values that do not parse, a width out of
        // range, grouping, an unknown row and plain garbage.
        QFile file(path);
        QVERIFY(file.open(QIODevice::WriteOnly | QIODevice::Truncate));
        file.write("\x01\xff garbage without a section\n"
                   "[1]\nVersion=1\nCardWidth=99999999\nTag=zz\n"
                   "[1.Column.cCONTBEZ]\nPosition=0\nVisible=0\n"
                   "[1.Column.cLID]\nPosition=5\n"
                   "[1.Column.cORT]\nPosition=-3\nGroupIndex=0\nWidth=abc\n"
                   "[1.Column.cUNKNOWN]\nPosition=1\n"
                   "[1.Column.cPLZ]\nVisible=maybe\n");
        file.close();
        {
            Fixture f;
            f.view.restoreLayout(path, QStringLiteral("1"));
            const QList<int> order = f.view.rowOrder();
            QCOMPARE(order.size(), 4);
            QCOMPARE(order.at(0), f.lid);
            QCOMPARE(order.at(1), f.title);
            QCOMPARE(f.view.cardWidth(), 200);
            QCOMPARE(f.g()->tag(), 0);
            QVERIFY(!f.g()->isGrouped());
            QVERIFY(f.view.isRowVisible(f.plz));
            QCOMPARE(f.g()->rowCount(), 30);
            f.key(Qt::Key_End); // still a working view
            QCOMPARE(f.g()->focusedRow(), 29);
        }
    }
};

ORVANTA_TEST(TestGridCardView)
#include "tst_grid_cardview.moc"
