#include "tests/support/TestRegistry.h"
#include "ui/grid/GridColumnMenu.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridLayoutPersistence.h"
#include "ui/grid/GridView.h"
#include "ui/grid/MemoryGridSource.h"

#include <QAction>
#include <QFile>
#include <QMenu>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

namespace {

MemoryGridSource& source()
{
    static MemoryGridSource src({{QStringLiteral("LID"), GridFieldType::Integer},
                                 {QStringLiteral("TSDATE"), GridFieldType::Date},
                                 {QStringLiteral("FROMBEZ"), GridFieldType::Text},
                                 {QStringLiteral("SERVICE"), GridFieldType::Text}});
    if (src.rowCount() == 0) {
        for (int i = 0; i < 3; ++i) {
            const quint32 r = src.appendRow();
            src.setInt(r, 0, i + 1);
            src.setDate(r, 1, QDate(2024, 3, 1 + i));
            src.setText(r, 2, QStringLiteral("Anrufer %1").arg(i));
        }
    }
    return src;
}

// A list as a frame builds it: a key column without entry, three tagged columns (one hidden
// by default), the context menu with its "Ansicht" submenu.
struct ListUnderTest {
    GridView view;
    QMenu popup;
    GridColumnMenu menu{&view, &popup, QStringLiteral("Ansicht1")};

    ListUnderTest()
    {
        GridColumn lid(QStringLiteral("cLID"), QStringLiteral("LID"));
        lid.visible = false;
        view.addColumn(lid);
        view.addColumn(GridColumn(QStringLiteral("cDATE"), QStringLiteral("TSDATE"), QStringLiteral("Datum"), 1));
        view.addColumn(GridColumn(QStringLiteral("cFROM"), QStringLiteral("FROMBEZ"), QStringLiteral("Anrufer"), 3));
        GridColumn service(QStringLiteral("cSERVICE"), QStringLiteral("SERVICE"), QStringLiteral("ISDN-Service"), 6);
        service.visible = false;
        view.addColumn(service);
        view.setSource(&source());
        menu.addEntry(QStringLiteral("Datum1"), QStringLiteral("Datum"), 1);
        menu.addEntry(QStringLiteral("Anrufer1"), QStringLiteral("Anrufer"), 3);
        menu.addEntry(QStringLiteral("ISDNService1"), QStringLiteral("ISDN-Service"), 6);
    }
    QAction* entry(const char* name) const { return popup.findChild<QAction*>(QLatin1String(name)); }
    GridController& grid() const { return *view.controller(); }
    int column(const char* name) const { return grid().columnByName(QString::fromLatin1(name)); }
    QString checks() const
    {
        QString s;
        for (const QAction* a : menu.entries())
            s += a->isChecked() ? QLatin1Char('x') : QLatin1Char('-');
        return s;
    }
};

} // namespace

class TestGridColumnMenu final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void entriesToggleTheirColumnsAndFollowTheHeader()
    {
        ListUnderTest list;
        QCOMPARE(list.popup.actions().last()->menu(), list.menu.menu());
        QCOMPARE(list.menu.menu()->title(), QStringLiteral("Ansicht"));
        QCOMPARE(list.menu.menu()->objectName(), QStringLiteral("Ansicht1"));
        QCOMPARE(list.checks(), QStringLiteral("---"));
        list.menu.checkVisibleColumns();
        QCOMPARE(list.checks(), QStringLiteral("xx-"));

        list.entry("Anrufer1")->trigger();
        QVERIFY(!list.grid().isColumnVisible(list.column("cFROM")));
        list.entry("ISDNService1")->trigger();
        QVERIFY(list.grid().isColumnVisible(list.column("cSERVICE")));
        QCOMPARE(list.checks(), QStringLiteral("x-x"));
        list.entry("Anrufer1")->trigger();
        QVERIFY(list.grid().isColumnVisible(list.column("cFROM")));

        // Checking never unchecks: a column hidden behind the menu's back keeps its mark until
        // the header reports it dragged out.
        list.grid().setColumnVisible(list.column("cDATE"), false);
        list.menu.checkVisibleColumns();
        QVERIFY(list.entry("Datum1")->isChecked());
        list.menu.columnDraggedOut(list.column("cDATE"));
        QVERIFY(!list.entry("Datum1")->isChecked());
        // A column still visible, one without a tag, or no column at all changes no entry.
        list.menu.columnDraggedOut(list.column("cFROM"));
        list.menu.columnDraggedOut(list.column("cLID"));
        list.menu.columnDraggedOut(99);
        QCOMPARE(list.checks(), QStringLiteral("-xx"));

        // A withdrawn entry is hidden and unchecked, and checking does not bring its mark back
        // into view.
        list.menu.withdrawEntry(QStringLiteral("ISDNService1"));
        QVERIFY(!list.entry("ISDNService1")->isVisible());
        QVERIFY(!list.entry("ISDNService1")->isChecked());
    }

    void aClickHandlerReplacesTheDefault()
    {
        ListUnderTest list;
        QList<int> clicked;
        list.menu.setClickHandler([&](QAction* a) { clicked << a->property("tag").toInt(); });
        list.entry("Anrufer1")->trigger();
        QCOMPARE(clicked, QList<int>{3});
        QVERIFY(list.grid().isColumnVisible(list.column("cFROM")));
        QCOMPARE(list.menu.entryByTag(6), list.entry("ISDNService1"));
        QCOMPARE(list.menu.entryByTag(0), nullptr);
    }

    void visibilityChosenInTheMenuSurvivesStoreAndRestore()
    {
        QTemporaryDir dir;
        GridLayoutPersistence layouts(QStringLiteral("2"));
        layouts.setFile(0, dir.filePath(QStringLiteral("VStoreL")));
        layouts.setFile(1, dir.filePath(QStringLiteral("VStoreLK")));
        {
            ListUnderTest list;
            list.menu.checkVisibleColumns();
            list.entry("Anrufer1")->trigger();
            list.entry("ISDNService1")->trigger();
            QVERIFY(layouts.store(list.grid(), 1));
        }
        QVERIFY(QFile::exists(layouts.file(1)));
        QVERIFY(!QFile::exists(layouts.file(0)));

        ListUnderTest reopened;
        QVERIFY(!layouts.restore(reopened.grid(), 0));
        QVERIFY(reopened.grid().isColumnVisible(reopened.column("cFROM")));
        QVERIFY(layouts.restore(reopened.grid(), 1));
        reopened.menu.checkVisibleColumns();
        QCOMPARE(reopened.checks(), QStringLiteral("x-x"));
        QVERIFY(!reopened.grid().isColumnVisible(reopened.column("cFROM")));
        QVERIFY(reopened.grid().isColumnVisible(reopened.column("cSERVICE")));
    }

    void aDamagedOrMissingLayoutLeavesTheDefaults_data()
    {
        QTest::addColumn<QByteArray>("file");
        QTest::addColumn<bool>("write");
        QTest::newRow("missing") << QByteArray() << false;
        QTest::newRow("empty") << QByteArray() << true;
        QTest::newRow("binary") << QByteArray("\x00\x9f\xff[2]\x00\x01", 9) << true;
        QTest::newRow("other view only") << QByteArray("[1]\r\n[1.Column.cFROM]\r\nVisible=0\r\n") << true;
        QTest::newRow("values that do not parse")
            << QByteArray("[2]\r\n[2.Column.cFROM]\r\nVisible=nein\r\nPosition=x\r\nWidth=-1\r\n[2.Column.cSERVICE]\r\nVis")
            << true;
    }

    void aDamagedOrMissingLayoutLeavesTheDefaults()
    {
        QFETCH(QByteArray, file);
        QFETCH(bool, write);
        QTemporaryDir dir;
        GridLayoutPersistence layouts(QStringLiteral("2"));
        layouts.setFile(0, dir.filePath(QStringLiteral("VStoreL")));
        if (write) {
            QFile f(layouts.file(0));
            QVERIFY(f.open(QIODevice::WriteOnly));
            f.write(file);
        }
        ListUnderTest list;
        layouts.restore(list.grid(), 0);
        list.menu.checkVisibleColumns();
        QCOMPARE(list.checks(), QStringLiteral("xx-"));
        QCOMPARE(list.grid().column(list.column("cFROM")).width, 64);
        QVERIFY(!list.grid().isColumnVisible(list.column("cLID")));
        QCOMPARE(list.grid().rowCount(), 3);
        // A kind without a file is neither restored nor stored.
        QVERIFY(!layouts.restore(list.grid(), 7));
        QVERIFY(!layouts.store(list.grid(), 7));
    }
};

ORVANTA_TEST(TestGridColumnMenu)
#include "tst_grid_columnmenu.moc"
