#include "calllog/Tlogframe.h"
#include "tests/calllog/LogTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSearchPanel.h"
#include "ui/grid/GridView.h"
#include "ui/label/TVKCutLabel.h"

#include <QAction>
#include <QApplication>
#include <QCheckBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QMenu>
#include <QTest>

using namespace orvanta;
using orvanta::test::LogTestEnv;
using orvanta::test::firstep;

namespace {

// Four days of calls around the fixed today (Wednesday 15 May 2024).
void fillCalls(LogTestEnv& env)
{
    env.addCall(1, "'2024-05-01'", "'09:00:00'", "'Meier'", "'0301111'");
    env.addCall(2, "'2024-05-14'", "'08:00:00'", "'Schulz'", "'0402222'", 1);
    env.addCall(3, "'2024-05-14'", "'17:30:00'", "'Meier'", "'0301111'");
    env.addCall(4, "'2024-05-15'", "'10:15:00'", "''", "NULL", 0, "NULL", 3, "''", "''");
    env.addCall(5, "'2024-05-15'", "'11:45:00'", "''", "'0893333'", 2, "99");
    env.addCall(6, "'2024-04-30'", "'23:59:00'", "'Anders'", "'0214444'");
}

int lidAt(const Tlogframe& f, int row)
{
    const GridController* g = f.controller();
    const int record = g->recordAt(row);
    if (record < 0)
        return -1;
    return static_cast<int>(g->source()->intValue(static_cast<quint32>(record), g->source()->fieldIndex(u"LID")));
}

QList<int> lids(const Tlogframe& f)
{
    QList<int> out;
    for (int r = 0; r < f.controller()->rowCount(); ++r)
        out << lidAt(f, r);
    return out;
}

int column(const Tlogframe& f, const char* field)
{
    return f.controller()->columnByName(QStringLiteral("cxGrid1DBTableView1") + QLatin1String(field));
}

QString cell(const Tlogframe& f, int lid, const char* field)
{
    const GridController* g = f.controller();
    const int record = g->locate(lid);
    return record < 0 ? QStringLiteral("<none>") : g->cellText(static_cast<quint32>(record), column(f, field));
}

QAction* action(const Tlogframe& f, const char* name)
{
    return f.findChild<QAction*>(QLatin1String(name));
}

int lastStatus(LogTestEnv& env)
{
    env.host().flush();
    const auto status = env.host().of(WMSTATUSPANEL);
    return status.isEmpty() ? -1 : static_cast<int>(status.last().wParam);
}

} // namespace

class TstLogFrame final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void newFrameShowsWholeLogNewestFirst();
    void storedLayoutKeepsItsSortAndCannotShowHiddenColumns();
    void damagedLayoutFilesFallBackToDefault_data();
    void damagedLayoutFilesFallBackToDefault();
    void periodFilterAppliedOnceAndCleared();
    void displayRulesOfCallerServiceAndDirection();
    void oddValuesInTypedColumns();
    void groupingByCallerAndBack();
    void focusedRowDrivesActionsAndMessages();
    void columnMenuFollowsVisibility();
    void dayModeAndRefresh();
    void searchFindsNarrowsClearsAndCloses();
    void databaseGoneKeepsTheFrameUsable();
    void withoutADataModuleNothingIsRead();
};

void TstLogFrame::newFrameShowsWholeLogNewestFirst()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    f.setViewMode(0);
    QVERIFY(firstep(f, env));
    QCOMPARE(lids(f), (QList<int>{5, 4, 3, 2, 1, 6}));
    const GridController* g = f.controller();
    QCOMPARE(g->sortedColumns(), (std::vector<int>{column(f, "TSDATE"), column(f, "TSTIME")}));
    QCOMPARE(g->sortOrder(column(f, "TSDATE")), GridSortOrder::Descending);
    QCOMPARE(g->sortOrder(column(f, "TSTIME")), GridSortOrder::Descending);
    for (const char* hidden : {"ABID", "CCHARGE", "CTIME", "LID", "SERVICE"})
        QVERIFY2(!g->isColumnVisible(column(f, hidden)), hidden);
    for (const char* shown : {"TSDATE", "TSTIME", "CTYPE", "FROMBEZ", "REGION", "ONBEZ", "STATUS", "BEMERK"})
        QVERIFY2(g->isColumnVisible(column(f, shown)), shown);
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (alle)"));
    QCOMPARE(f.findChild<TVKCutLabel*>(QStringLiteral("CL1"))->text(), QStringLiteral("Anrufprotokoll (alle)"));
    QCOMPARE(lastStatus(env), 6);
    QCOMPARE(env.host().of(WMSTATUSPANEL).last().lParam, 0);
    // The newest call is focused and published.
    QCOMPARE(env.dm().CurLogLID, 5);
    QCOMPARE(env.dm().CurLogCType, 2);
    QCOMPARE(env.dm().CurLogFromPhone, QStringLiteral("0893333"));
    QCOMPARE(f.CurrentLogLID(), 5);
    QVERIFY(action(f, "lf_bemerkung")->isEnabled());
    QVERIFY(action(f, "lf_delitem")->isEnabled());
    for (const char* hidden : {"lf_playvoiceboxitem", "lf_attachtocontact", "lf_opencontactfromlog"})
        QVERIFY2(!action(f, hidden)->isVisible(), hidden);
    for (const char* entry : {"AnrufbeantworterNachricht1", "Kosten1", "Verbindungszeit1"}) {
        QVERIFY2(!f.popupMenu()->findChild<QAction*>(QLatin1String(entry))->isVisible(), entry);
        QVERIFY2(!f.popupMenu()->findChild<QAction*>(QLatin1String(entry))->isChecked(), entry);
    }
    QVERIFY(f.popupMenu()->findChild<QAction*>(QStringLiteral("Datum1"))->isChecked());
    QVERIFY(!f.popupMenu()->findChild<QAction*>(QStringLiteral("ISDNService1"))->isChecked());
    // The search panel stays collapsed and disabled.
    QVERIFY(!f.findChild<QWidget*>(QStringLiteral("cxTE1"))->isEnabled());
    QCOMPARE(f.findChild<QWidget*>(QStringLiteral("RzPanel1"))->height(), 1);
    // Collapsed, it does not force the frame wider than a small main window.
    QVERIFY2(f.minimumSizeHint().width() < 500, qPrintable(QString::number(f.minimumSizeHint().width())));

    // The layout goes to the program folder, not to the current directory.
    QVERIFY(f.StoreLogView());
    QVERIFY(QFile::exists(env.file(QStringLiteral("VStoreL"))));
    QVERIFY(!env.dm().ibcds_log.isActive());
    QCOMPARE(env.dialogs().count(), 0);
}

void TstLogFrame::storedLayoutKeepsItsSortAndCannotShowHiddenColumns()
{
    LogTestEnv env;
    fillCalls(env);
    {
        Tlogframe f(&env.dm());
        firstep(f, env);
        GridController* g = f.controller();
        g->headerClicked(column(f, "FROMBEZ"), Qt::NoModifier);
        g->setColumnVisible(column(f, "ABID"), true);
        g->setColumnVisible(column(f, "CCHARGE"), true);
        QVERIFY(f.StoreLogView());
    }
    Tlogframe f(&env.dm());
    firstep(f, env);
    const GridController* g = f.controller();
    QCOMPARE(g->sortedColumns(), std::vector<int>{column(f, "FROMBEZ")});
    // Display text order: "Anders", "Meier" x2, "Schulz", "Unbekannt" (no name, no number),
    // and the number of the caller without a name sorts by that number.
    QCOMPARE(cell(f, 5, "FROMBEZ"), QStringLiteral("0893333"));
    QCOMPARE(lids(f).first(), 5);
    QCOMPARE(lids(f).last(), 4);
    QVERIFY(!g->isColumnVisible(column(f, "ABID")));
    QVERIFY(!g->isColumnVisible(column(f, "CCHARGE")));
}

void TstLogFrame::damagedLayoutFilesFallBackToDefault_data()
{
    QTest::addColumn<QByteArray>("content");
    QTest::newRow("junk") << QByteArray("\x01\x02\xff\xfe garbage [[[ = ]\r\n\0\0", 24);
    QTest::newRow("truncated") << QByteArray("[2]\r\nVersion=1\r\nTag=2\r\n[2.Column.cxGrid1DBTableView1TSD");
    QTest::newRow("unknown columns") << QByteArray(
        "[2]\r\nVersion=1\r\n[2.Column.NoSuchColumn]\r\nPosition=0\r\nSortOrder=1\r\nSortIndex=0\r\nGroupIndex=0\r\n"
        "[2.Column.cxGrid1DBTableView1FROMBEZ]\r\nPosition=abc\r\nWidth=-5\r\nVisible=maybe\r\n");
    QTest::newRow("empty") << QByteArray();
}

void TstLogFrame::damagedLayoutFilesFallBackToDefault()
{
    QFETCH(QByteArray, content);
    LogTestEnv env;
    fillCalls(env);
    env.writeFile(QStringLiteral("VStoreL"), content);
    Tlogframe f(&env.dm());
    QVERIFY(firstep(f, env));
    QCOMPARE(lids(f), (QList<int>{5, 4, 3, 2, 1, 6}));
    QVERIFY(f.controller()->isColumnVisible(column(f, "FROMBEZ")));
    QVERIFY(!f.controller()->isGrouped());
    int filterKind = -1;
    LogGrouping groupKind = LogGrouping(-1);
    f.WhatsOn(filterKind, groupKind);
    QCOMPARE(filterKind, 0);
    QCOMPARE(groupKind, LogGrouping::None);
    QCOMPARE(env.dialogs().count(), 0);
}

void TstLogFrame::periodFilterAppliedOnceAndCleared()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    firstep(f, env);
    GridController* g = f.controller();

    f.SetNewFilter(2);
    f.SetNewFilter(2);
    QCOMPARE(g->filter().root.items.size(), size_t(1));
    QVERIFY(g->filter().active);
    QCOMPARE(g->tag(), 2);
    QCOMPARE(f.filterName(), QStringLiteral("is this week"));
    QCOMPARE(lids(f), (QList<int>{5, 4, 3, 2}));
    QCOMPARE(lastStatus(env), 4);
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"diese Woche\")"));

    f.SetNewFilter(1);
    QCOMPARE(lids(f), (QList<int>{5, 4}));
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"Heute\")"));
    f.SetNewFilter(3);
    QCOMPARE(lids(f), (QList<int>{5, 4, 3, 2, 1}));
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"dieser Monat\")"));

    // The stored layout carries the filter into the next frame, and WhatsOn reports it.
    QVERIFY(f.StoreLogView());
    Tlogframe next(&env.dm());
    firstep(next, env);
    int filterKind = -1;
    LogGrouping groupKind = LogGrouping(-1);
    next.WhatsOn(filterKind, groupKind);
    QCOMPARE(filterKind, 3);
    QCOMPARE(groupKind, LogGrouping::None);
    QCOMPARE(next.filterName(), QStringLiteral("is this month"));
    QCOMPARE(next.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"dieser Monat\")"));

    next.SetNewFilter(0);
    QVERIFY(next.controller()->filter().isEmpty());
    QCOMPARE(next.controller()->tag(), 0);
    QCOMPARE(next.controller()->rowCount(), 6);
    QCOMPARE(next.captionText(), QStringLiteral("Anrufprotokoll (alle)"));
    env.host().clear();
    next.SetNewFilter(0); // nothing set: only status and caption
    QCOMPARE(lastStatus(env), 6);

    // Kind 7 clears even what the name does not know about.
    next.controller()->setTag(3);
    next.controller()->addFilterItem(GridFilterItem::condition(QStringLiteral("cxGrid1DBTableView1TSDATE"),
                                                               GridFilterOperator::Today));
    next.controller()->setFilterActive(true);
    QCOMPARE(next.controller()->rowCount(), 2);
    next.SetNewFilter(7);
    QVERIFY(next.controller()->filter().isEmpty());
    QCOMPARE(next.controller()->tag(), 0);
    QCOMPARE(next.controller()->rowCount(), 6);
    QCOMPARE(lastStatus(env), 6);
}

void TstLogFrame::displayRulesOfCallerServiceAndDirection()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    firstep(f, env);
    QCOMPARE(cell(f, 4, "FROMBEZ"), QStringLiteral("Unbekannt"));
    QCOMPARE(cell(f, 5, "FROMBEZ"), QStringLiteral("0893333"));
    QCOMPARE(cell(f, 1, "FROMBEZ"), QStringLiteral("Meier"));
    QCOMPARE(cell(f, 4, "ONBEZ"), QStringLiteral("Unbekannt"));
    QCOMPARE(cell(f, 1, "ONBEZ"), QStringLiteral("Büro"));
    QCOMPARE(cell(f, 1, "CTYPE"), QStringLiteral("Eingang"));
    QCOMPARE(cell(f, 2, "CTYPE"), QStringLiteral("Ausgang"));
    QCOMPARE(cell(f, 5, "CTYPE"), QStringLiteral("Unbekannt"));
    QCOMPARE(cell(f, 1, "SERVICE"), QStringLiteral("Sprachanruf"));
    QCOMPARE(cell(f, 4, "SERVICE"), QStringLiteral("Unbekannt")); // null
    QCOMPARE(cell(f, 5, "SERVICE"), QString());                    // unknown code
    QCOMPARE(cell(f, 1, "CCHARGE"), QStringLiteral("1.50 €"));
    QCOMPARE(cell(f, 1, "TSDATE"), QStringLiteral("01.05.2024"));

    const GridController* g = f.controller();
    const GridColumn& ctype = g->column(column(f, "CTYPE"));
    const auto imageOf = [&](int lid) { return ctype.imageIndex(*g->source(), static_cast<quint32>(g->locate(lid))); };
    QCOMPARE(imageOf(1), 0);
    QCOMPARE(imageOf(2), 1);
    QCOMPARE(imageOf(5), -1);

    // The answering-machine icon is painted for ABID > 0 only, centred in its cell.
    f.controller()->setColumnVisible(column(f, "ABID"), true);
    f.resize(900, 300);
    f.show();
    QVERIFY(QTest::qWaitForWindowExposed(&f));
    const QImage shot = f.view()->viewport()->grab().toImage();
    const int abidCol = column(f, "ABID");
    const auto centre = [&](int lid) {
        const QRect r = f.view()->cellRect(g->rowOfRecord(static_cast<quint32>(g->locate(lid))), abidCol);
        return shot.pixelColor(r.center() * shot.devicePixelRatio());
    };
    QVERIFY(centre(4) != centre(3));
    QCOMPARE(centre(3), centre(2));
}

void TstLogFrame::oddValuesInTypedColumns()
{
    LogTestEnv env;
    // A log written by an older monitor: the type columns as free text.
    env.db().exec(QStringLiteral("ALTER TABLE LOG ALTER COLUMN CTYPE TYPE VARCHAR(12)"));
    env.db().exec(QStringLiteral("ALTER TABLE LOG ALTER COLUMN SERVICE TYPE VARCHAR(12)"));
    env.db().exec(QStringLiteral("ALTER TABLE LOG ALTER COLUMN ABID TYPE VARCHAR(12)"));
    env.db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, FROMBEZ, CTYPE, SERVICE, ABID) VALUES "
                                 "(1, '2024-05-15', '10:00:00', 'A', 'abc', 'x', 'kein')"));
    env.db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, FROMBEZ, CTYPE, SERVICE, ABID) VALUES "
                                 "(2, '2024-05-15', '11:00:00', 'B', ' 1 ', '-3', '7')"));
    env.db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, FROMBEZ, CTYPE, SERVICE, ABID) VALUES "
                                 "(3, NULL, NULL, NULL, '99999999', '12', '')"));
    Tlogframe f(&env.dm());
    QVERIFY(firstep(f, env));
    QCOMPARE(f.controller()->rowCount(), 3);
    QCOMPARE(cell(f, 1, "CTYPE"), QStringLiteral("Unbekannt"));
    QCOMPARE(cell(f, 2, "CTYPE"), QStringLiteral("Ausgang"));
    QCOMPARE(cell(f, 3, "CTYPE"), QStringLiteral("Unbekannt"));
    QCOMPARE(cell(f, 1, "SERVICE"), QStringLiteral("Unbekannt"));
    QCOMPARE(cell(f, 2, "SERVICE"), QString());
    QCOMPARE(cell(f, 3, "SERVICE"), QStringLiteral("Fax (4)"));
    QCOMPARE(cell(f, 3, "FROMBEZ"), QStringLiteral("Unbekannt"));

    // Focusing each record publishes what can be read, -1 for what cannot.
    GridController* g = f.controller();
    g->focusRecord(static_cast<quint32>(g->locate(1)));
    QCOMPARE(env.dm().CurLogLID, 1);
    QCOMPARE(env.dm().CurLogCType, -1);
    QCOMPARE(env.dm().CurLogABID, -1);
    g->focusRecord(static_cast<quint32>(g->locate(2)));
    QCOMPARE(env.dm().CurLogCType, 1);
    QCOMPARE(env.dm().CurLogABID, 7);

    // Grouping and sorting over those columns stay whole.
    f.ToGroup(LogGrouping::Direction);
    QCOMPARE(g->recordCount(), 3);
    g->headerClicked(column(f, "SERVICE"), Qt::NoModifier);
    QCOMPARE(g->recordCount(), 3);
    f.show();
    QVERIFY(QTest::qWaitForWindowExposed(&f));
    f.view()->viewport()->grab();
    QCOMPARE(env.dialogs().count(), 0);
}

void TstLogFrame::groupingByCallerAndBack()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    firstep(f, env);
    GridController* g = f.controller();
    const int anrufer = column(f, "FROMBEZ");

    f.ToGroup(LogGrouping::Caller);
    QCOMPARE(g->groupedColumns(), std::vector<int>{anrufer});
    QVERIFY(!g->isColumnVisible(anrufer));
    QVERIFY(f.CanExpandGroups());
    int filterKind = -1;
    LogGrouping groupKind = LogGrouping(-1);
    f.WhatsOn(filterKind, groupKind);
    QCOMPARE(groupKind, LogGrouping::Caller);
    // All groups collapsed but the one holding the data set's last record, which is focused.
    QCOMPARE(env.dm().CurLogLID, 6);
    QVERIFY(!g->isGroupRow(g->focusedRow()));
    // "0893333", "Anders" (open), "Meier", "Schulz", "Unbekannt"
    QCOMPARE(g->rowCount(), 6);
    f.ExpandAllGroups(true);
    QCOMPARE(g->rowCount(), 5 + 6);
    f.ExpandAllGroups(false);
    QCOMPARE(g->rowCount(), 5);
    QCOMPARE(g->groupRowText(2), QStringLiteral("Anrufer: Meier (2)"));

    f.ToGroup(LogGrouping::None);
    QVERIFY(!g->isGrouped());
    QVERIFY(g->isColumnVisible(anrufer));
    QCOMPARE(g->sortedColumns(), (std::vector<int>{column(f, "TSDATE"), column(f, "TSTIME")}));
    QCOMPARE(lids(f), (QList<int>{5, 4, 3, 2, 1, 6}));
    QVERIFY(!f.CanExpandGroups());

    f.ToGroup(LogGrouping::Date);
    f.ExpandAllGroups(true);
    QCOMPARE(g->groupRowText(0), QStringLiteral("Datum: 15.05.2024 (2)"));
    f.ToGroup(LogGrouping::Free);
    QVERIFY(g->isGroupByBoxVisible());
    f.WhatsOn(filterKind, groupKind);
    QCOMPARE(groupKind, LogGrouping::Free);
    f.ToGroup(LogGrouping::Direction);
    QVERIFY(!g->isGroupByBoxVisible());
    f.WhatsOn(filterKind, groupKind);
    QCOMPARE(groupKind, LogGrouping::Direction);
    f.ToGroup(LogGrouping(9)); // not a kind: nothing
    QVERIFY(!g->isGrouped());
}

void TstLogFrame::focusedRowDrivesActionsAndMessages()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    firstep(f, env);
    GridController* g = f.controller();
    env.host().clear();

    // A data row: Delete and double click ask the host.
    QTest::keyClick(f.view(), Qt::Key_Delete);
    env.host().flush();
    QCOMPARE(env.host().of(WMDELETELOGITEM).size(), 1);
    action(f, "lf_bemerkung")->trigger();
    env.host().flush();
    QCOMPARE(env.host().of(WMLOGOPENBEMERKUNG).size(), 1);
    QTest::keyClick(f.view(), Qt::Key_Return);
    env.host().flush();
    QCOMPARE(env.host().of(WMLOGOPENBEMERKUNG).size(), 2);

    // A group row: nothing is focused for the other windows, both actions go off.
    f.ToGroup(LogGrouping::Caller);
    g->setFocusedRow(0);
    QVERIFY(g->isGroupRow(0));
    QCOMPARE(env.dm().CurLogLID, -1);
    QCOMPARE(env.dm().CurLogCID, -1);
    QCOMPARE(env.dm().CurLogABID, -1);
    QCOMPARE(env.dm().CurLogCType, -1);
    QVERIFY(env.dm().CurLogFromPhone.isEmpty());
    QVERIFY(!action(f, "lf_bemerkung")->isEnabled());
    QVERIFY(!action(f, "lf_delitem")->isEnabled());
    env.host().clear();
    QTest::keyClick(f.view(), Qt::Key_Delete);
    QTest::keyClick(f.view(), Qt::Key_Enter);
    f.resize(800, 300);
    f.show();
    QVERIFY(QTest::qWaitForWindowExposed(&f));
    QTest::mouseDClick(f.view()->viewport(), Qt::LeftButton, {}, f.view()->rowRect(0).center() + QPoint(200, 0));
    env.host().flush();
    QVERIFY(env.host().of(WMDELETELOGITEM).isEmpty());
    QVERIFY(env.host().of(WMLOGOPENBEMERKUNG).isEmpty());

    // Back on a data row.
    g->expandAll(true);
    g->setFocusedRow(1);
    QVERIFY(env.dm().CurLogLID > 0);
    QVERIFY(action(f, "lf_delitem")->isEnabled());
    QTest::mouseDClick(f.view()->viewport(), Qt::LeftButton, {}, f.view()->rowRect(1).center());
    env.host().flush();
    QCOMPARE(env.host().of(WMLOGOPENBEMERKUNG).size(), 1);

    // The search panel's close button tells the host.
    QMetaObject::invokeMethod(f.findChild<QPushButton*>(QStringLiteral("AdvCloseSearchPan")), "click");
    env.host().flush();
    QCOMPARE(env.host().of(WMSEARCHUNCHECKED).size(), 1);
}

namespace {

// Types the text into "Suchen nach:" and presses Enter.
void search(Tlogframe& f, const QString& text)
{
    auto* edit = f.findChild<QLineEdit*>(QStringLiteral("cxTE1"));
    edit->setText(text);
    QTest::keyClick(edit, Qt::Key_Return);
}

void check(Tlogframe& f, const char* box, bool on)
{
    f.findChild<QCheckBox*>(QLatin1String(box))->setChecked(on);
}

void chooseColumns(Tlogframe& f, const QStringList& captions)
{
    f.searchPanel()->setChosenColumns(captions);
}

} // namespace

void TstLogFrame::searchFindsNarrowsClearsAndCloses()
{
    LogTestEnv env;
    fillCalls(env);
    env.addCall(7, "'2024-05-15'", "'12:00:00'", "'Müller'", "'0305555'");
    env.addCall(8, "'2024-05-14'", "'12:00:00'", "'Muller'", "'0306666'");
    env.addCall(9, "'2024-05-10'", "'12:00:00'", "'Bäckerei Straße'", "'0307777'");
    env.addCall(10, "'2024-05-01'", "'12:00:00'", "'a_b'", "NULL");
    env.addCall(11, "'2024-05-01'", "'13:00:00'", "'axb'", "NULL");
    env.db().exec(QStringLiteral("UPDATE LOG SET BEMERK = '50% \"Rabatt\"' WHERE LID = 3"));
    Tlogframe f(&env.dm());
    f.resize(900, 400);
    f.show();
    QVERIFY(QTest::qWaitForWindowActive(&f));
    firstep(f, env);
    auto* panel = f.findChild<QWidget*>(QStringLiteral("RzPanel1"));
    auto* edit = f.findChild<QLineEdit*>(QStringLiteral("cxTE1"));
    QCOMPARE(panel->height(), 1);

    // Ctrl+F in the grid opens the panel, every column chosen, the focus in "Suchen nach:".
    f.view()->setFocus();
    QTest::keyClick(f.view(), Qt::Key_F, Qt::ControlModifier);
    QVERIFY(f.isSearchShown());
    QVERIFY(panel->height() > 1);
    QVERIFY(edit->isEnabled());
    QTRY_COMPARE(QApplication::focusWidget(), edit);
    QCOMPARE(f.searchPanel()->chosenColumns().size(), 7);
    QCOMPARE(action(f, "lf_search")->text(), QStringLiteral("Suchen..."));
    QVERIFY(f.popupMenu()->actions().contains(action(f, "lf_search")));

    // Case and ß fold as the sort order does, umlauts stay apart.
    search(f, QStringLiteral("muller"));
    QCOMPARE(lids(f), QList<int>{8});
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (Suche: \"muller\")"));
    QCOMPARE(lastStatus(env), 1);
    search(f, QStringLiteral("MÜLLER"));
    QCOMPARE(lids(f), QList<int>{7});
    search(f, QStringLiteral("strasse"));
    QCOMPARE(lids(f), QList<int>{9});
    check(f, "RzChB3", true); // "Groß-/Kleinschreibung berücksichtigen"
    search(f, QStringLiteral("straße"));
    QCOMPARE(lids(f), QList<int>{});
    QCOMPARE(lastStatus(env), 0);
    search(f, QStringLiteral("Straße"));
    QCOMPARE(lids(f), QList<int>{9});
    check(f, "RzChB3", false);
    check(f, "RzChB2", true); // "genaue Suche": the whole cell
    search(f, QStringLiteral("meier"));
    QCOMPARE(lids(f), (QList<int>{3, 1}));
    search(f, QStringLiteral("Meie"));
    QCOMPARE(lids(f), QList<int>{});
    check(f, "RzChB2", false);

    // Wildcards and quotes are plain characters.
    search(f, QStringLiteral("a_b"));
    QCOMPARE(lids(f), QList<int>{10});
    search(f, QStringLiteral("%"));
    QCOMPARE(lids(f), QList<int>{3});
    search(f, QStringLiteral("\"Rabatt\""));
    QCOMPARE(lids(f), QList<int>{3});
    search(f, QStringLiteral("*"));
    QCOMPARE(lids(f), QList<int>{});

    // Only the chosen columns; dates by what the cell shows.
    chooseColumns(f, {QStringLiteral("Datum")});
    search(f, QStringLiteral("14.05."));
    QCOMPARE(lids(f), (QList<int>{3, 8, 2}));
    chooseColumns(f, {QStringLiteral("Zeit")});
    search(f, QStringLiteral("12:00:0"));
    QCOMPARE(lids(f), (QList<int>{7, 8, 9, 10}));
    chooseColumns(f, {QStringLiteral("Status"), QStringLiteral("An")});
    search(f, QStringLiteral("Meier"));
    QCOMPARE(lids(f), QList<int>{});
    QCOMPARE(env.dialogs().count(), 0);

    // A missing text or column: the warning, the grid as it was.
    chooseColumns(f, {});
    search(f, QStringLiteral("Meier"));
    chooseColumns(f, {QStringLiteral("Anrufer")});
    search(f, QString());
    QCOMPARE(env.dialogs().texts(DialogKind::Warning),
             QStringList(2, GridSearchPanel::missingInputWarning()));
    QCOMPARE(lids(f), QList<int>{});

    // With a period filter: the search replaces it, or narrows it with RzChB1. A period chosen
    // while a search replaces the filter makes the search narrow it.
    f.SetNewFilter(2);
    QVERIFY(f.findChild<QCheckBox*>(QStringLiteral("RzChB1"))->isChecked());
    QVERIFY(f.controller()->search().narrow);
    check(f, "RzChB1", false);
    search(f, QStringLiteral("Meier"));
    QCOMPARE(lids(f), (QList<int>{3, 1}));
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (Suche: \"Meier\")"));
    check(f, "RzChB1", true);
    QTest::mouseClick(f.findChild<QPushButton*>(QStringLiteral("ADVSearchStart")), Qt::LeftButton);
    QCOMPARE(lids(f), QList<int>{3});
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"diese Woche\", Suche: \"Meier\")"));
    QCOMPARE(lastStatus(env), 1);

    // "» Suchmaske löschen «": the mask emptied, the filter alone again.
    QTest::mouseClick(f.findChild<QLabel*>(QStringLiteral("L3")), Qt::LeftButton);
    QCOMPARE(edit->text(), QString());
    QCOMPARE(f.searchPanel()->chosenColumns().size(), 7);
    QVERIFY(!f.controller()->isSearching());
    QCOMPARE(lids(f), (QList<int>{7, 5, 4, 3, 8, 2}));
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"diese Woche\")"));
    QCOMPARE(lastStatus(env), 6);

    // A period chosen while a search replaces the filter: the search narrows the new period.
    check(f, "RzChB1", false);
    search(f, QStringLiteral("Meier"));
    QCOMPARE(lids(f), (QList<int>{3, 1}));
    f.SetNewFilter(1);
    QVERIFY(f.findChild<QCheckBox*>(QStringLiteral("RzChB1"))->isChecked());
    QCOMPARE(lids(f), QList<int>{});
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"Heute\", Suche: \"Meier\")"));

    // Closing removes the search and tells the host.
    env.host().clear();
    QTest::mouseClick(f.findChild<QPushButton*>(QStringLiteral("AdvCloseSearchPan")), Qt::LeftButton);
    QVERIFY(!f.isSearchShown());
    QCOMPARE(panel->height(), 1);
    QVERIFY(!edit->isEnabled());
    QCOMPARE(lids(f), (QList<int>{7, 5, 4}));
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll (gefiltert nach \"Heute\")"));
    QCOMPARE(lastStatus(env), 3);
    QCOMPARE(env.host().of(WMSEARCHUNCHECKED).size(), 1);

    // The main window's entry opens and closes the panel; a day shows its own caption.
    QVERIFY(f.isActionEnabled(QStringLiteral("_LogFo_LogSearch")));
    f.executeAction(QStringLiteral("_LogFo_LogSearch"));
    QVERIFY(f.isSearchShown());
    QVERIFY(f.OpenDBonDay(QDate(2024, 5, 14)));
    f.setViewMode(1);
    f.SetNewFilter(0);
    search(f, QStringLiteral("Schulz"));
    QCOMPARE(lids(f), QList<int>{2});
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll vom 14.05.2024 (Suche: \"Schulz\")"));
    f.executeAction(QStringLiteral("_LogFo_LogSearch"));
    QVERIFY(!f.isSearchShown());
    QCOMPARE(lids(f), (QList<int>{3, 8, 2}));
    QCOMPARE(env.dialogs().count(), 2);
}

void TstLogFrame::columnMenuFollowsVisibility()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    firstep(f, env);
    GridController* g = f.controller();
    QAction* region = f.popupMenu()->findChild<QAction*>(QStringLiteral("Region1"));
    QVERIFY(region->isChecked());
    region->trigger();
    QVERIFY(!region->isChecked());
    QVERIFY(!g->isColumnVisible(column(f, "REGION")));
    QAction* service = f.popupMenu()->findChild<QAction*>(QStringLiteral("ISDNService1"));
    service->trigger();
    QVERIFY(g->isColumnVisible(column(f, "SERVICE")));

    // Dragging a column out of the header unchecks its entry.
    QAction* status = f.popupMenu()->findChild<QAction*>(QStringLiteral("Status1"));
    QVERIFY(status->isChecked());
    g->setColumnVisible(column(f, "STATUS"), false);
    Q_EMIT f.view()->columnDraggedOut(column(f, "STATUS"));
    QVERIFY(!status->isChecked());

    // The context menu has the entries in their order, "Ansicht" last.
    QStringList names;
    for (QAction* a : f.popupMenu()->actions())
        names << (a->isSeparator() ? QStringLiteral("-") : a->menu() ? a->menu()->title() : a->objectName());
    QCOMPARE(names, (QStringList{"lf_bemerkung", "-", "lf_playvoiceboxitem", "-", "lf_attachtocontact",
                                 "lf_opencontactfromlog", "-", "lf_delitem", "-", "lf_search", "-", "Ansicht"}));

    // CL1 shortens what does not fit, keeping its text.
    auto* cl1 = f.findChild<TVKCutLabel*>(QStringLiteral("CL1"));
    cl1->setFixedWidth(120);
    const QString shown = cl1->displayedText();
    QVERIFY(shown.endsWith(QStringLiteral("...")));
    QVERIFY(cl1->fontMetrics().horizontalAdvance(shown) <= cl1->contentsRect().width());
    QVERIFY(QStringLiteral("Anrufprotokoll (alle)").startsWith(shown.chopped(3)));
    QCOMPARE(cl1->text(), QStringLiteral("Anrufprotokoll (alle)"));
    QCOMPARE(TVKCutLabel::shortened(QStringLiteral("abcdef"), cl1->fontMetrics(), 0), QStringLiteral("..."));
}

void TstLogFrame::dayModeAndRefresh()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    f.setViewMode(1);
    f.setLogDay(QDate(2024, 5, 14));
    QVERIFY(firstep(f, env));
    QCOMPARE(lids(f), (QList<int>{3, 2}));
    QCOMPARE(f.captionText(), QStringLiteral("Anrufprotokoll vom 14.05.2024"));
    QCOMPARE(lastStatus(env), 2);
    QVERIFY(f.OpenDBonDay(QDate(2024, 5, 15)));
    QCOMPARE(lids(f), (QList<int>{5, 4}));
    QCOMPARE(f.logDay(), QDate(2024, 5, 15));
    QVERIFY(f.OpenDBonDay(QDate(2020, 1, 1)));
    QCOMPARE(f.controller()->rowCount(), 0);
    QCOMPARE(lastStatus(env), 0);
    QCOMPARE(env.dm().CurLogLID, -1);
    QVERIFY(!action(f, "lf_bemerkung")->isEnabled());
    f.setNoLog(true);
    f.UpdateLogCaption();
    QCOMPARE(f.captionText(), QStringLiteral("Kein Protokoll vorhanden."));

    // A new call and a refresh: the row appears and takes the focus.
    QVERIFY(f.OpenDBonDay(QDate(2024, 5, 15)));
    env.addCall(7, "'2024-05-15'", "'09:00:00'", "'Neu'", "'011'");
    f.Refresh_View(7);
    QCOMPARE(lids(f), (QList<int>{5, 4, 7}));
    QCOMPARE(env.dm().CurLogLID, 7);
    QCOMPARE(lastStatus(env), 3);
    // LID 0 re-reads and keeps the focused call by its key.
    env.addCall(8, "'2024-05-15'", "'23:00:00'", "'Später'", "'012'");
    f.Refresh_View(0);
    QCOMPARE(lids(f), (QList<int>{8, 5, 4, 7}));
    QCOMPARE(env.dm().CurLogLID, 7);
    QVERIFY(f.StoreLogView());
    QVERIFY(QFile::exists(env.file(QStringLiteral("VStoreLK"))));
    QVERIFY(!QFile::exists(env.file(QStringLiteral("VStoreL"))));
}

void TstLogFrame::databaseGoneKeepsTheFrameUsable()
{
    LogTestEnv env;
    fillCalls(env);
    Tlogframe f(&env.dm());
    firstep(f, env);
    env.dm().IBDatabase1.disconnect();
    QCOMPARE(f.controller()->rowCount(), 0);
    f.Refresh_View(3);
    f.lf_bemerkungUpdate();
    QVERIFY(!action(f, "lf_bemerkung")->isEnabled());
    f.SetNewFilter(2);
    f.ToGroup(LogGrouping::Caller);
    QVERIFY(f.StoreLogView());
    QCOMPARE(env.dialogs().count(), 0);

    // Opening again fails with the report and leaves an empty, usable frame.
    Tlogframe again(&env.dm());
    QVERIFY(firstep(again, env));
    QCOMPARE(env.dialogs().count(), 1);
    QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Logframe - Firstep")));
    QCOMPARE(again.controller()->rowCount(), 0);
    QCOMPARE(lastStatus(env), 0);
    QVERIFY(!again.OpenDBonDay(QDate(2024, 5, 15)));
    QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Logframe - OpenDBonDay")));
}

void TstLogFrame::withoutADataModuleNothingIsRead()
{
    LogTestEnv env;
    fillCalls(env);
    env.dm().CurLogLID = 3; // a connected module with a focused call exists in the process
    Tlogframe f(nullptr);
    QVERIFY(firstep(f, env));
    QCOMPARE(env.dialogs().count(), 1);
    QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Logframe - Firstep")));
    QCOMPARE(f.controller()->rowCount(), 0);
    QCOMPARE(f.CurrentLogLID(), -1);
    QVERIFY(!action(f, "lf_bemerkung")->isEnabled());
    QVERIFY(!f.OpenDBonDay(QDate(2024, 5, 15)));
    QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Logframe - OpenDBonDay")));
    QVERIFY(!env.dm().ibcds_log.isActive());
}

ORVANTA_TEST(TstLogFrame)
#include "tst_logframe.moc"
