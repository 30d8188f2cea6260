#include "tests/support/TestRegistry.h"
#include "ui/grid/GridView.h"
#include "ui/grid/ListFrameScaffold.h"
#include "ui/label/TVKCutLabel.h"
#include "ui/scheme/ColorScheme.h"

#include <QFrame>
#include <QLayout>
#include <QTest>

using namespace orvanta;

class TestListFrame final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void schemeTablesGiveEachWindowKindItsColours_data()
    {
        QTest::addColumn<int>("scheme");
        QTest::addColumn<QColor>("listPanel");
        QTest::addColumn<QColor>("captionBar");
        QTest::addColumn<QColor>("controlFrame");
        QTest::addColumn<QColor>("footerEnd");
        QTest::addColumn<QColor>("mainPanels");
        QTest::addColumn<QColor>("detailHeader");
        QTest::newRow("0 blue") << 0 << QColor(0xC3, 0xDA, 0xF9) << QColor(0x03, 0x38, 0x93) << QColor(0x00, 0x2D, 0x96)
                                << QColor(0x7D, 0xA5, 0xE0) << QColor(0xC3, 0xDA, 0xF9) << QColor(0x03, 0x38, 0x93);
        QTest::newRow("1 olive") << 1 << QColor(0xF2, 0xF0, 0xE4) << QColor(0x68, 0x80, 0x48) << QColor(0x60, 0x80, 0x58)
                                 << QColor(0xB1, 0xC0, 0x8C) << QColor(0xF2, 0xF0, 0xE4) << QColor(0x68, 0x80, 0x48);
        QTest::newRow("2 silver") << 2 << QColor(0xF3, 0xF3, 0xF7) << QColor(0x75, 0x74, 0x95) << QColor(0x80, 0x7C, 0x98)
                                  << QColor(0x98, 0x96, 0xB3) << QColor(0xF3, 0xF3, 0xF7) << QColor(0x75, 0x74, 0x95);
        for (const int outside : {-1, 3, 1000}) {
            QTest::newRow(qPrintable(QStringLiteral("%1 counts as silver").arg(outside)))
                << outside << QColor(0xF3, 0xF3, 0xF7) << QColor(0x75, 0x74, 0x95) << QColor(0x80, 0x7C, 0x98)
                << QColor(0x98, 0x96, 0xB3) << QColor(0xF3, 0xF3, 0xF7) << QColor(0x75, 0x74, 0x95);
        }
    }

    void schemeTablesGiveEachWindowKindItsColours()
    {
        QFETCH(int, scheme);
        QFETCH(QColor, listPanel);
        QFETCH(QColor, captionBar);
        QFETCH(QColor, controlFrame);
        QFETCH(QColor, footerEnd);
        QFETCH(QColor, mainPanels);
        QFETCH(QColor, detailHeader);
        const ListFrameColors& list = listFrameColors(scheme);
        QCOMPARE(list.panel, listPanel);
        QCOMPARE(list.captionBar, captionBar);
        QCOMPARE(list.controlFrame, controlFrame);
        QCOMPARE(list.footerEnd, footerEnd);
        QCOMPARE(list.search, list.panel);
        QCOMPARE(list.searchFlat, list.panelBorder);
        QCOMPARE(mainWindowColors(scheme).panels, mainPanels);
        // The windows of one scheme share the panel colour; detail windows head with the
        // list frame's caption colour.
        QCOMPARE(detailWindowColors(scheme).window, listPanel);
        QCOMPARE(detailWindowColors(scheme).header, detailHeader);
    }

    void scaffoldStacksCaptionPanelsAndGridAndColoursThem()
    {
        QWidget frame;
        ListFrameScaffold scaffold(&frame);
        GridView* view = scaffold.addTableView(QStringLiteral("cxGrid1DBTableView1"));
        // A panel added after the view still goes above the grid.
        auto* search = new QFrame(scaffold.panel());
        search->setObjectName(QStringLiteral("RzPanel1"));
        scaffold.addPanel(search);

        QCOMPARE(frame.findChild<QFrame*>(QStringLiteral("FP3")), scaffold.panel());
        QCOMPARE(frame.findChild<TVKCutLabel*>(QStringLiteral("CL1")), scaffold.caption());
        QVERIFY(!scaffold.caption()->autoSize());
        QCOMPARE(view->parentWidget(), frame.findChild<QWidget*>(QStringLiteral("cxGrid1")));
        QLayout* box = scaffold.panel()->layout();
        QCOMPARE(box->count(), 3);
        QCOMPARE(box->itemAt(0)->widget(), scaffold.captionBar());
        QCOMPARE(box->itemAt(1)->widget(), search);
        QCOMPARE(box->itemAt(2)->widget(), scaffold.gridHost());

        for (const int scheme : {0, 1, 2, 7}) {
            scaffold.applyColorScheme(scheme);
            const ListFrameColors& c = listFrameColors(scheme);
            QCOMPARE(scaffold.panel()->palette().color(QPalette::Window), c.panel);
            QCOMPARE(scaffold.panel()->palette().color(QPalette::Light), c.panelBorder);
            QCOMPARE(scaffold.captionBar()->palette().color(QPalette::Window), c.captionBar);
            QCOMPARE(scaffold.captionBar()->palette().color(QPalette::Light), c.captionBarHighlight);
            QCOMPARE(search->palette().color(QPalette::Window), c.search);
            QVERIFY(search->autoFillBackground());
            QCOMPARE(view->groupRowColor(), c.panel);
        }
    }
};

ORVANTA_TEST(TestListFrame)
#include "tst_listframe.moc"
