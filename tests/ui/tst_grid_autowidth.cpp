#include "platform/IniFile.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridHeader.h"
#include "ui/grid/GridLayoutStore.h"
#include "ui/grid/GridView.h"
#include "ui/grid/MemoryGridSource.h"

#include <QScrollBar>
#include <QTest>

#include <functional>

using namespace orvanta;

namespace {

// Columns of 40, 120, 30, 80 and 50 pixels (320 together) over 40 rows, so the vertical scroll
// bar takes part of the width.
struct Fixture {
    MemoryGridSource src{{{QStringLiteral("LID"), GridFieldType::Integer},
                          {QStringLiteral("NAME"), GridFieldType::Text},
                          {QStringLiteral("ABID"), GridFieldType::Integer},
                          {QStringLiteral("STATUS"), GridFieldType::Text},
                          {QStringLiteral("NOTE"), GridFieldType::Text}}};
    GridView view;
    std::vector<int> cols;

    explicit Fixture(bool autoWidth = true, int width = 500, const std::function<void(GridColumn&)>& adjust = {})
    {
        for (int i = 0; i < 40; ++i) {
            const quint32 r = src.appendRow();
            src.setInt(r, 0, i);
            src.setText(r, 1, QStringLiteral("Name %1").arg(i));
            src.setInt(r, 2, i % 3);
            src.setText(r, 3, i % 2 ? QStringLiteral("neu") : QStringLiteral("erledigt"));
            src.setText(r, 4, QStringLiteral("Bemerkung %1").arg(i));
        }
        const int widths[] = {40, 120, 30, 80, 50};
        const char* fields[] = {"LID", "NAME", "ABID", "STATUS", "NOTE"};
        for (int i = 0; i < 5; ++i) {
            const QString field = QLatin1String(fields[i]);
            GridColumn column(QLatin1Char('c') + field, field, field, i, widths[i]);
            if (adjust)
                adjust(column);
            cols.push_back(view.addColumn(column));
        }
        view.setSource(&src);
        view.resize(width, 300);
        view.setAutoWidth(autoWidth);
        view.show();
    }

    GridHeader* header() const { return view.header(); }
    int size(int c) const { return header()->sectionSize(c); }
    std::vector<int> sizes() const
    {
        std::vector<int> out;
        for (const int c : cols)
            out.push_back(header()->isSectionHidden(c) ? 0 : size(c));
        return out;
    }
    int shownTotal() const
    {
        int sum = 0;
        for (const int s : sizes())
            sum += s;
        return sum;
    }
    // The shown sections end exactly at the viewport's right edge and nothing scrolls sideways.
    void verifyFilled() const
    {
        QCOMPARE(shownTotal(), header()->width());
        QCOMPARE(header()->geometry().right(), view.viewport()->geometry().right());
        QCOMPARE(header()->length(), header()->width());
        QCOMPARE(view.horizontalScrollBar()->maximum(), 0);
    }
    // A section's width against its share of `total` by `weight` out of `weightSum`.
    void verifyShare(int c, int weight, int weightSum) const
    {
        const double expected = double(header()->width()) * weight / weightSum;
        QVERIFY2(std::abs(size(c) - expected) <= 1.0,
                 qPrintable(QStringLiteral("column %1: %2, expected %3").arg(c).arg(size(c)).arg(expected)));
    }
    void dragRightEdge(int c, int dx)
    {
        const int edge = header()->sectionViewportPosition(c) + size(c) - 1;
        const QPoint start(edge, header()->height() / 2);
        QTest::mousePress(header()->viewport(), Qt::LeftButton, {}, start);
        QTest::mouseMove(header()->viewport(), start + QPoint(dx / 2, 0));
        QTest::mouseMove(header()->viewport(), start + QPoint(dx, 0));
        QTest::mouseRelease(header()->viewport(), Qt::LeftButton, {}, start + QPoint(dx, 0));
    }
};

} // namespace

class TestGridAutoWidth final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void fillsTheWidthInProportionWithoutDrift()
    {
        Fixture f;
        f.verifyFilled();
        const std::vector<int> first = f.sizes();
        const int weights[] = {40, 120, 30, 80, 50};
        for (const int width : {731, 333, 1200, 499, 500}) {
            f.view.resize(width, 300);
            f.verifyFilled();
            for (size_t i = 0; i < f.cols.size(); ++i)
                f.verifyShare(f.cols[i], weights[i], 320);
        }
        // Back at the first width: the very same sections, and the columns' own widths untouched.
        QCOMPARE(f.sizes(), first);
        for (size_t i = 0; i < f.cols.size(); ++i)
            QCOMPARE(f.view.controller()->column(f.cols[i]).width, weights[i]);

        // Too narrow for the proportions: the small column keeps a usable minimum, still no gap.
        f.view.resize(100, 300);
        f.verifyFilled();
        for (const int c : f.cols)
            QVERIFY(f.size(c) >= f.header()->minimumSectionSize());
    }

    void hidingShowingAndGroupingRefit()
    {
        Fixture f;
        const std::vector<int> before = f.sizes();
        GridController* g = f.view.controller();
        g->setColumnVisible(f.cols[1], false);
        f.verifyFilled();
        f.verifyShare(f.cols[0], 40, 200);
        f.verifyShare(f.cols[4], 50, 200);
        g->setColumnVisible(f.cols[1], true);
        f.verifyFilled();
        QCOMPARE(f.sizes(), before);

        // A moved column keeps its share; grouping indents the header and the rest still fits.
        g->setColumnOrder({f.cols[4], f.cols[0], f.cols[1], f.cols[2], f.cols[3]});
        f.verifyFilled();
        QCOMPARE(f.sizes(), before);
        g->setGroupByBoxVisible(true);
        g->groupBy(f.cols[3]);
        QVERIFY(f.header()->x() > f.view.viewport()->x());
        f.verifyFilled();
        g->clearGrouping();
        f.verifyFilled();
    }

    void resizingAColumnTradesWithTheColumnsToItsRight()
    {
        Fixture f;
        const std::vector<int> before = f.sizes();
        f.dragRightEdge(f.cols[1], 60);
        f.verifyFilled();
        const std::vector<int> after = f.sizes();
        QCOMPARE(after[0], before[0]);
        QCOMPARE(after[1], before[1] + 60);
        // The columns to the right shrank together, keeping their proportions 30 : 80 : 50.
        for (size_t i = 2; i < after.size(); ++i)
            QVERIFY(after[i] < before[i]);
        f.verifyShare(f.cols[2], 30 * (after[2] + after[3] + after[4]), 160 * f.header()->width());
        // The new widths are the columns' own, so the stored layout gives the same look.
        GridController* g = f.view.controller();
        for (size_t i = 0; i < f.cols.size(); ++i)
            QCOMPARE(g->column(f.cols[i]).width, after[i]);

        // Window resizes follow the new proportions and come back to the same pixels.
        f.view.resize(900, 300);
        f.verifyFilled();
        f.view.resize(500, 300);
        QCOMPARE(f.sizes(), after);

        IniFile ini;
        GridLayoutStore::store(*g, ini, QStringLiteral("Log"));
        Fixture restored;
        QVERIFY(GridLayoutStore::restore(*restored.view.controller(), ini, QStringLiteral("Log")));
        restored.verifyFilled();
        QCOMPARE(restored.sizes(), after);

        // Dragging far beyond the view leaves the right columns their minimum.
        f.dragRightEdge(f.cols[0], 2000);
        f.verifyFilled();
        for (size_t i = 1; i < f.cols.size(); ++i)
            QCOMPARE(f.size(f.cols[i]), f.header()->minimumSectionSize());
        // The last column's right edge is the view's edge: dragging it changes nothing.
        const std::vector<int> pinned = f.sizes();
        f.dragRightEdge(f.cols[4], -20);
        f.verifyFilled();
        QCOMPARE(f.sizes(), pinned);
    }

    void fixedColumnsKeepTheirWidthAndNoneFallsBelowItsMinimum()
    {
        // LID keeps its 40 pixels; ABID never gets less than 60; the rest stretch by 120 : 80 : 50.
        Fixture f(true, 500, [](GridColumn& c) {
            if (c.fieldName == QLatin1String("LID"))
                c.stretches = false;
            if (c.fieldName == QLatin1String("ABID"))
                c.minWidth = 60;
        });
        const auto verifyStretching = [&f](bool abidAtMinimum) {
            const int rest = f.header()->width() - 40 - (abidAtMinimum ? 60 : 0);
            const int sum = abidAtMinimum ? 250 : 280;
            const std::pair<int, int> stretching[] = {{f.cols[1], 120}, {f.cols[3], 80}, {f.cols[4], 50}};
            for (const auto& [c, weight] : stretching) {
                const double expected = double(rest) * weight / sum;
                QVERIFY2(std::abs(f.size(c) - expected) <= 1.0,
                         qPrintable(QStringLiteral("column %1: %2, expected %3").arg(c).arg(f.size(c)).arg(expected)));
            }
        };
        f.verifyFilled();
        QCOMPARE(f.size(f.cols[0]), 40);
        QCOMPARE(f.size(f.cols[2]), 60); // its share (30 of 280) would be less
        verifyStretching(true);
        f.view.resize(1200, 300);
        f.verifyFilled();
        QCOMPARE(f.size(f.cols[0]), 40);
        QVERIFY(f.size(f.cols[2]) > 60);
        verifyStretching(false);

        // Narrower than the minimums together: nothing is cut below them, the view scrolls sideways.
        f.view.resize(110, 300);
        QCOMPARE(f.size(f.cols[0]), 40);
        QCOMPARE(f.size(f.cols[2]), 60);
        QVERIFY(f.view.horizontalScrollBar()->maximum() > 0);
        QCOMPARE(f.view.horizontalScrollBar()->maximum(), f.header()->length() - f.view.viewport()->width());

        // A stored layout's widths are the weights again, within the same rules.
        f.view.resize(500, 300);
        GridController* g = f.view.controller();
        g->setColumnWidth(f.cols[0], 70);
        g->setColumnWidth(f.cols[2], 20);
        f.verifyFilled();
        QCOMPARE(f.size(f.cols[0]), 70);
        QCOMPARE(f.size(f.cols[2]), 60);

        // With only fixed columns shown they fill the row between them.
        for (const int c : {f.cols[1], f.cols[2], f.cols[3], f.cols[4]})
            g->setColumnVisible(c, false);
        f.verifyFilled();
        QCOMPARE(f.size(f.cols[0]), f.header()->width());
    }

    void offKeepsEveryColumnsOwnWidth()
    {
        Fixture f(false, 200);
        const std::vector<int> own = {40, 120, 30, 80, 50};
        QCOMPARE(f.sizes(), own);
        QCOMPARE(f.view.horizontalScrollBar()->maximum(), 320 - f.view.viewport()->width());
        f.view.resize(700, 300);
        QCOMPARE(f.sizes(), own);
        QCOMPARE(f.view.horizontalScrollBar()->maximum(), 0);

        // Switching auto width on fits, switching it off again gives the own widths back.
        f.view.setAutoWidth(true);
        f.verifyFilled();
        f.view.setAutoWidth(false);
        QCOMPARE(f.sizes(), own);
        f.dragRightEdge(f.cols[1], 30);
        QCOMPARE(f.size(f.cols[2]), 30);
        QCOMPARE(f.view.controller()->column(f.cols[1]).width, 150);
    }
};

ORVANTA_TEST(TestGridAutoWidth)
#include "tst_grid_autowidth.moc"
