#include "app/MainWindowFeatures.h"
#include "app/ProgramLauncher.h"
#include "app/TLogform.h"
#include "calllog/Tlogframe.h"
#include "db/BackgroundFetch.h"
#include "platform/IniFile.h"
#include "tests/app/AppTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/calendar/PlannerCalendar.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridHeader.h"
#include "ui/grid/GridView.h"
#include "ui/navbar/AdvNavBar.h"
#include "ui/scheme/ColorScheme.h"
#include "ui/statusbar/PanelStatusBar.h"

#include <QAction>
#include <QCheckBox>
#include <QPushButton>
#include <QMenuBar>
#include <QRadioButton>
#include <QSignalSpy>
#include <QTest>
#include <QTextEdit>
#include <QToolBar>

using namespace orvanta;
using orvanta::test::AppTestEnv;
using orvanta::test::RecordingLogFrame;

namespace {

template <class T>
T* child(const TLogform& w, const char* name)
{
    return w.findChild<T*>(QLatin1String(name));
}

QAction* act(const TLogform& w, const char* name)
{
    return w.findChild<QAction*>(QLatin1String(name));
}

void trigger(TLogform& w, const char* name)
{
    w.updateActions();
    QVERIFY2(act(w, name)->isEnabled(), name);
    act(w, name)->trigger();
}

} // namespace

class TestMainWindow final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void theLogAndTheBarsFitCommonWindowSizes()
    {
        AppTestEnv env;
        env.db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, FROMBEZ, FROMPHONE, REGION, ONBEZ, CTYPE, "
                                     "SERVICE, STATUS) VALUES (1, '2026-12-06', '23:59:58', 'Meier', '0301111', "
                                     "'Frankfurt am Main', 'Büro', 0, 1, 'Nicht angenommen')"));
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        auto* grid = w.findChild<GridView*>(QStringLiteral("cxGrid1DBTableView1"));
        QVERIFY(grid);
        QTRY_COMPARE(grid->controller()->rowCount(), 1);
        const auto section = [grid](const char* field) {
            return grid->header()->sectionSize(
                grid->controller()->columnByName(QStringLiteral("cxGrid1DBTableView1") + QLatin1String(field)));
        };
        // A cell shows its text uncut when the section holds it and the padding on both sides.
        const auto holds = [grid](int width, const QString& text) {
            return width >= grid->fontMetrics().horizontalAdvance(text) + 6;
        };
        // The classic size, 1024 x 700, and the default on a 1280 x 800 screen.
        for (const QSize size : {QSize(922, 640), QSize(1024, 700), QSize(1088, 680)}) {
            const QString at = QStringLiteral("%1x%2").arg(size.width()).arg(size.height());
            w.resize(size);
            QCoreApplication::processEvents();
            QVERIFY2(holds(section("TSDATE"), QStringLiteral("06.12.2026")), qPrintable(at));
            QVERIFY2(holds(section("TSTIME"), QStringLiteral("23:59:58")), qPrintable(at));
            QVERIFY2(holds(section("STATUS"), QStringLiteral("Nicht angenommen")), qPrintable(at));
            QVERIFY2(holds(section("STATUS"), QStringLiteral("Anrufbeantworter")), qPrintable(at));
            // The row is filled and nothing scrolls sideways; the caller has the widest column.
            QCOMPARE(grid->header()->length(), grid->header()->width());
            QVERIFY2(section("FROMBEZ") > section("REGION"), qPrintable(at));
            QVERIFY2(section("FROMBEZ") > section("TSDATE"), qPrintable(at));
            // No tool button hides behind a bar's "»".
            for (auto* bar : w.findChildren<QToolBar*>()) {
                auto* more = bar->findChild<QWidget*>(QStringLiteral("qt_toolbar_ext_button"));
                QVERIFY2(!more || !more->isVisible(), qPrintable(bar->objectName() + QLatin1Char(' ') + at));
                for (QAction* a : bar->actions()) {
                    if (a->isVisible() && !a->isSeparator())
                        QVERIFY2(bar->widgetForAction(a)->isVisible(),
                                 qPrintable(a->objectName() + QLatin1Char(' ') + at));
                }
            }
        }
        // Wide enough, the bars share one row again.
        w.resize(1900, 900);
        QCoreApplication::processEvents();
        for (auto* bar : w.findChildren<QToolBar*>())
            QVERIFY2(!w.toolBarBreak(bar), qPrintable(bar->objectName()));
    }

    void layoutCarriesTheDesignedNamesAndTexts()
    {
        AppTestEnv env;
        TLogform& w = env.window();
        QCOMPARE(w.windowTitle(), QStringLiteral("Orvanta"));
        QCOMPARE(w.minimumSize(), QSize(730, 530));
        AdvNavBar* nav = child<AdvNavBar>(w, "AdvNavBar1");
        QVERIFY(nav);
        QCOMPARE(nav->panelCount(), 3);
        QCOMPARE(nav->panel(0)->objectName(), QStringLiteral("AdvNavBarPanel3"));
        QCOMPARE(nav->panel(0)->caption(), QStringLiteral("Kontakte"));
        QCOMPARE(nav->panel(1)->objectName(), QStringLiteral("AdvNavBarPanel2"));
        QCOMPARE(nav->panel(1)->caption(), QStringLiteral("Protokoll per Kalender"));
        QCOMPARE(nav->panel(2)->objectName(), QStringLiteral("AdvNavBarPanel1"));
        QCOMPARE(nav->panel(2)->caption(), QStringLiteral("Protokoll"));
        for (const char* name : {"PC1", "rzre1", "P1", "RzSplitter1", "P3", "P4"})
            QVERIFY2(w.findChild<QWidget*>(QLatin1String(name)), name);
        QVERIFY(nav->panel(1)->isAncestorOf(child<PlannerCalendar>(w, "PC1")));
        QVERIFY(nav->panel(1)->isAncestorOf(child<QTextEdit>(w, "rzre1")));

        const QStringList radios{"Liste", "Adresskarten", "ohne", "Heute", "diese Woche", "dieser Monat"};
        for (int i = 1; i <= 6; ++i)
            QCOMPARE(child<QRadioButton>(w, qPrintable(QStringLiteral("rzrb%1").arg(i)))->text(), radios[i - 1]);
        const QStringList boxes{"ohne Gruppierung", "Kategorie", "PLZ", "Ort", "ohne Gruppierung",
                                "Datum", "Anrufer", "An", "individuell", "Verbindung"};
        for (int i = 1; i <= 10; ++i)
            QCOMPARE(child<QCheckBox>(w, qPrintable(QStringLiteral("rzcb%1").arg(i)))->text(), boxes[i - 1]);
        for (const char* checked : {"rzrb1", "rzrb3"})
            QVERIFY(child<QRadioButton>(w, checked)->isChecked());
        for (const char* checked : {"rzcb1", "rzcb5"})
            QVERIFY(child<QCheckBox>(w, checked)->isChecked());

        const struct {
            const char* name;
            const char* caption;
        } actions[] = {{"_LogFo_Close", "Beenden"}, {"_LogFo_CloseApp", "Beenden"},
                       {"_LogFo_MoniSTOP", "Anhalten/Fortsetzen"}, {"_LogFo_MoniSTART", "Starten"},
                       {"_LogFo_Setup", "Einstellungen..."}, {"_LogFo_About", "Info"},
                       {"_LogFo_OEImp", "Outlook Express"}, {"_LogFo_Print", "Drucken"},
                       {"_LogFo_Export", "Exportieren..."}, {"_LogFo_DelLog", "Protokolleintrag löschen"},
                       {"_LogFo_DelDayLog", "Tagesprotokoll löschen"}, {"_LogFo_ContNew", "Neu..."},
                       {"_LogFo_ContEdit", "Bearbeiten..."}, {"_LogFo_ContDel", "Löschen"},
                       {"_LogFo_OpenLogBemerkung", "Bemerkung/Detailinformationen"},
                       {"_LogFo_KatVerw", "Kategorieverwaltung"}, {"_LogFo_PrintContactOverview", "Kontaktliste"},
                       {"_LogFo_PrintContactExposee", "Exposé"}, {"dxBB_Ansicht_Proto", "Protokoll"},
                       {"dxBB_Ansicht_Proto_PK", "Protokoll per Kalender"}, {"dxBB_Ansicht_Kontakte", "Kontakte"}};
        for (const auto& a : actions) {
            QVERIFY2(act(w, a.name), a.name);
            QCOMPARE(act(w, a.name)->text(), QString::fromUtf8(a.caption));
        }
        QCOMPARE(act(w, "_LogFo_CloseApp")->toolTip(), QStringLiteral("Rufwarte beenden"));
        for (const char* hidden : {"_LogFo_PlayVBItem", "_LogFo_ContCall", "_LogFo_AttachToContact",
                                   "_LogFo_lf_OpenContactFromLog", "_LogFo_LogSearch", "_LogFo_Search"})
            QVERIFY2(!act(w, hidden)->isVisible(), hidden);

        QStringList menus;
        for (QAction* m : w.menuBar()->actions())
            menus << m->text();
        QCOMPARE(menus, (QStringList{"Programm", "Protokoll", "Kontakt", "Kategorie", "Monitor", "Ansicht", "Extras", "?"}));

        w.show();
        auto* status = child<PanelStatusBar>(w, "dxStatusBar1");
        QCOMPARE(status->panelCount(), 5);
        QCOMPARE(status->panelText(0), QStringLiteral("Modulversion: ") + QStringLiteral(ORVANTA_VERSION));
        QCOMPARE(status->panelText(3), QStringLiteral("Freeware"));
        QCOMPARE(env.dialogs().count(), 0);
    }

    void colourSchemeAndPanelComeFromTheSettingsFiles_data()
    {
        QTest::addColumn<QByteArray>("oscheme");
        QTest::addColumn<QByteArray>("vstore");
        QTest::addColumn<int>("scheme");
        QTest::addColumn<int>("tab");
        QTest::newRow("no files") << QByteArray() << QByteArray() << 2 << 2;
        QTest::newRow("silver for 5, log for 7") << QByteArray("[AppColor]\r\nValue=5\r\n")
                                                  << QByteArray("[Level_GV]\r\nAP=7\r\n") << 2 << 2;
        QTest::newRow("blue, calendar") << QByteArray("[AppColor]\r\nValue=0\r\n") << QByteArray("[Level_GV]\r\nAP=2\r\n")
                                        << 0 << 1;
        QTest::newRow("olive, contacts") << QByteArray("[AppColor]\r\nValue=1\r\n")
                                         << QByteArray("[Level_GV]\r\nAP=3\r\n") << 1 << 0;
        QTest::newRow("negative, junk") << QByteArray("[AppColor]\r\nValue=-1\r\n") << QByteArray("\x01\xff junk\r\nAP")
                                        << 2 << 2;
    }

    void colourSchemeAndPanelComeFromTheSettingsFiles()
    {
        QFETCH(QByteArray, oscheme);
        QFETCH(QByteArray, vstore);
        QFETCH(int, scheme);
        QFETCH(int, tab);
        AppTestEnv env;
        if (!oscheme.isEmpty())
            env.writeFile(QStringLiteral("OScheme"), oscheme);
        if (!vstore.isEmpty())
            env.writeFile(QStringLiteral("VStore"), vstore);
        TLogform& w = env.window();
        QCOMPARE(appColorScheme(), scheme);
        const MainWindowColors colors = mainWindowColors(scheme);
        QCOMPARE(w.navBar()->styleIndex(), colors.navBarStyle);
        QCOMPARE(w.calendar()->gradientStart(), colors.gradientStart);
        QCOMPARE(w.calendar()->selectionColor(), colors.gradientEnd);
        QCOMPARE(child<QRadioButton>(w, "rzrb1")->palette().color(QPalette::WindowText), colors.accent);
        QCOMPARE(w.navBar()->activeTabIndex(), tab);
        QCOMPARE(env.dialogs().count(), 0);
    }

    void silverIsTheSchemeOfValueTwoAndOfAnythingElse()
    {
        QCOMPARE(mainWindowColors(2).gradientStart, QColor(0xE1, 0xE2, 0xEC));
        QCOMPARE(mainWindowColors(5).panels, QColor(0xF3, 0xF3, 0xF7));
        QCOMPARE(mainWindowColors(0).accent, QColor(0x00, 0x2D, 0x96));
        QCOMPARE(mainWindowColors(1).navBarStyle, 2);
    }

    void anUnreadableViewStoreFallsBackToTheLog()
    {
        AppTestEnv env;
        QDir(env.folder()).mkdir(QStringLiteral("VStore")); // a folder cannot be read as a file
        TLogform& w = env.window();
        QCOMPARE(w.navBar()->activeTabIndex(), int(TLogform::TabLog));
        QCOMPARE(env.dialogs().count(), 1);
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# GetActivePanel\r\n")));
    }

    void closingStoresThePanelAndTheBars()
    {
        QList<QPointer<RecordingLogFrame>> frames;
        AppTestEnv env;
        {
            TLogform& w = env.window({}, test::recordingFeatures(&frames));
            w.show();
            w.navBar()->setActiveTabIndex(TLogform::TabCalendar);
            w.AdvNavBar1Change();
            child<QToolBar>(w, "dxBarMonitor")->hide();
            QVERIFY(w.close());
            QVERIFY(frames.last().isNull()); // freed on close, after storing its view
        }
        env.destroyWindow();
        const IniFile vstore(env.file(QStringLiteral("VStore")));
        QCOMPARE(vstore.readInteger(QStringLiteral("Level_GV"), QStringLiteral("AP"), 0), 2);
        QVERIFY(!env.readFile(QStringLiteral("BarStore")).isEmpty());

        // The next start restores the bars; a damaged store leaves the designed ones.
        TLogform& again = env.window();
        again.show();
        QVERIFY(child<QToolBar>(again, "dxBarMonitor")->isHidden());
        QCOMPARE(again.navBar()->activeTabIndex(), int(TLogform::TabCalendar));
        env.destroyWindow();
        env.writeFile(QStringLiteral("BarStore"), "[BarStore]\r\nState=AAAA////garbage\r\n");
        TLogform& third = env.window();
        third.show();
        QVERIFY(!child<QToolBar>(third, "dxBarMonitor")->isHidden());
    }

    void calendarInfoIsReadAsRichText()
    {
        {
            AppTestEnv env;
            env.writeFile(QStringLiteral("kalenderinfo.rtf"),
                          "{\\rtf1\\ansi\\ansicpg1252{\\fonttbl{\\f0 Arial;}}\\f0 Tage mit {\\b Anrufen}\\par}");
            QCOMPARE(child<QTextEdit>(env.window(), "rzre1")->toPlainText().trimmed(), QStringLiteral("Tage mit Anrufen"));
        }
        {
            AppTestEnv env;
            env.writeFile(QStringLiteral("kalenderinfo.rtf"), "{\\rtf1\\ansi {{{{ Hinweis \\'e4\\u");
            TLogform& w = env.window();
            QVERIFY(child<QTextEdit>(w, "rzre1")->toPlainText().contains(QStringLiteral("Hinweis")));
            QCOMPARE(env.dialogs().count(), 0);
        }
        {
            AppTestEnv env;
            QVERIFY(child<QTextEdit>(env.window(), "rzre1")->toPlainText().isEmpty());
        }
    }

    void theContactSwitchIsReadOnlyWhenAlone()
    {
        {
            AppTestEnv env;
            TLogform& w = env.window({QStringLiteral("/co-x")});
            QCOMPARE(w.startLogRecordId(), 0);
            QCOMPARE(env.dialogs().count(), 1);
            QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("Übergabeparameter ist nicht korrekt!")));
            QCOMPARE(env.dialogs().last().kind, DialogKind::Error);
        }
        {
            AppTestEnv env;
            QCOMPARE(env.window({QStringLiteral("/co-17"), QStringLiteral("x")}).startLogRecordId(), 0);
        }
        {
            AppTestEnv env;
            QCOMPARE(env.window({QStringLiteral("/co-99999999999")}).startLogRecordId(), 0);
            QCOMPARE(env.window().startLogRecordId(), 0);
        }
    }

    void coSwitchOpensTheContactPathOnceShown()
    {
        QList<QPointer<RecordingLogFrame>> frames;
        AppTestEnv env;
        env.addCall(17, QStringLiteral("2024-05-15"), QStringLiteral("0891234567"));
        TLogform& w = env.window({QStringLiteral("/co-17")}, test::recordingFeatures(&frames));
        QCOMPARE(w.startLogRecordId(), 17);
        QCoreApplication::processEvents();
        QVERIFY(w.editWindows().allFree()); // nothing before the window is shown
        w.show();
        QTRY_VERIFY(!w.editWindows().allFree());
        QWidget* edit = w.editWindows().at(0);
        QCOMPARE(edit->property("callerNumber").toString(), QStringLiteral("0891234567"));
        QCOMPARE(edit->property("existingContact").toBool(), false);
        QVERIFY(w.contactRecords().at(edit->property("recordSlot").toInt()));
        QCOMPARE(env.dialogs().count(), 0);
    }

    void aCallerWhoIsAlreadyAContactOpensNoWindow()
    {
        QList<QPointer<RecordingLogFrame>> frames;
        AppTestEnv env;
        env.addCall(17, QStringLiteral("2024-05-15"), QStringLiteral("0891234567"));
        env.addCall(18, QStringLiteral("2024-05-15"), QStringLiteral("Unbekannt"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, CONTBEZ) VALUES (5, 'Huber')"));
        env.db().exec(QStringLiteral("INSERT INTO COM (LID, CID, KOMMBEZ, NUMBER, VORWNUMBER, NUMBEROF) "
                                     "VALUES (50, 5, 'Mobil', '1234567', '891234567', '891234567')"));
        TLogform& w = env.window({}, test::recordingFeatures(&frames));
        env.dialogs().enqueueAnswer(DialogButton::No);
        sendMessage(&w, WMCONTACTDATAFROMSCREEN, 17, 0);
        QVERIFY(w.editWindows().allFree());
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("Die Rufnummer ist bereits als\r\n\"Mobil\"")));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT CID FROM LOG WHERE LID = 17")).toInt(), 0);

        sendMessage(&w, WMCONTACTDATAFROMSCREEN, 18, 0);
        QCOMPARE(env.dialogs().last().text, QStringLiteral("# Orvanta - CreateConDataEdit\r\nTelefonnummer des Anrufers "
                                                           "konnte nicht korrekt aus der Datenbank ermittelt werden."));
        const int shown = env.dialogs().count();
        for (qintptr odd : {qintptr(0), qintptr(-5), qintptr(1) << 40})
            sendMessage(&w, WMCONTACTDATAFROMSCREEN, odd, 0);
        QCOMPARE(env.dialogs().count(), shown);
        QVERIFY(w.editWindows().allFree());
    }

    void theSearchEntryFollowsTheListsPanel()
    {
        AppTestEnv env;
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        QVERIFY(w.logFrame());
        QVERIFY(act(w, "_LogFo_LogSearch")->isVisible());
        QVERIFY(!act(w, "_LogFo_Search")->isVisible());
        w.updateActions();
        trigger(w, "_LogFo_LogSearch");
        QVERIFY(w.logFrame()->isSearchShown());
        w.updateActions();
        QVERIFY(act(w, "_LogFo_LogSearch")->isChecked());
        // The list's close button: WMSEARCHUNCHECKED unchecks the entry.
        auto* close = w.logFrame()->findChild<QPushButton*>(QStringLiteral("AdvCloseSearchPan"));
        QTest::mouseClick(close, Qt::LeftButton);
        QTRY_VERIFY(!act(w, "_LogFo_LogSearch")->isChecked());
        QVERIFY(!w.logFrame()->isSearchShown());

        trigger(w, "dxBB_Ansicht_Kontakte");
        QVERIFY(act(w, "_LogFo_Search")->isVisible());
        QVERIFY(!act(w, "_LogFo_LogSearch")->isVisible());
        w.updateActions();
        trigger(w, "_LogFo_Search");
        QVERIFY(w.contactFrame()->isSearchShown());
        w.updateActions();
        QVERIFY(act(w, "_LogFo_Search")->isChecked());
        trigger(w, "_LogFo_Search"); // again: closed
        QVERIFY(!w.contactFrame()->isSearchShown());
        QTRY_VERIFY(!act(w, "_LogFo_Search")->isChecked());
        QCOMPARE(env.dialogs().count(), 0);
    }

    void statusPanelShowsCounts()
    {
        AppTestEnv env;
        TLogform& w = env.window();
        PanelStatusBar* status = w.statusPanels();
        sendMessage(&w, WMSTATUSPANEL, -3, 0);
        QCOMPARE(status->panelText(2), QStringLiteral("Protokolleinträge: 0"));
        sendMessage(&w, WMSTATUSPANEL, 12, 1);
        QCOMPARE(status->panelText(2), QStringLiteral("Kontakte: 12"));
        sendMessage(&w, WMSTATUSPANEL, 12, 7);
        QCOMPARE(status->panelText(2), QString());
        sendMessage(&w, WMSTATUSPANEL, 200, kStatusLogLoading);
        QCOMPARE(status->panelText(2), QStringLiteral("Protokolleinträge: 200 (wird geladen …)"));
        sendMessage(&w, WMSTATUSPANEL, 400, kStatusLogIncomplete);
        QCOMPARE(status->panelText(2), QStringLiteral("Protokolleinträge: 400 (unvollständig)"));
        QVERIFY(!w.isBusy());
    }

    void windowIsUpBeforeTheLogHasArrived()
    {
        AppTestEnv env;
        env.db().exec(QStringLiteral("SET TERM ^ ;\nEXECUTE BLOCK AS DECLARE I INTEGER = 1; BEGIN WHILE (I <= 1000) DO "
                                     "BEGIN INSERT INTO LOG (LID, TSDATE, TSTIME, FROMPHONE, STATUS) VALUES (:I, "
                                     "'2024-05-14', '10:00:00', '030' || :I, 'angenommen'); I = I + 1; END END^\n"
                                     "SET TERM ; ^"));
        BackgroundFetch::setBatchDelayForTests(200);
        struct Undelay {
            ~Undelay() { BackgroundFetch::setBatchDelayForTests(0); }
        } undelay;
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        auto* log = qobject_cast<Tlogframe*>(w.logFrame());
        QVERIFY(log);
        QVERIFY(log->isLoading());
        QTRY_VERIFY(log->controller()->rowCount() > 0);
        QVERIFY(log->isLoading());
        PanelStatusBar* status = w.statusPanels();
        QTRY_VERIFY(status->panelText(2).endsWith(QStringLiteral(" (wird geladen …)")));
        QTRY_COMPARE_WITH_TIMEOUT(status->panelText(2), QStringLiteral("Protokolleinträge: 1000"), 20000);
        QCOMPARE(env.dialogs().count(), 0);
    }

    void registriesReuseFreeSlotsAndGrow()
    {
        QList<QPointer<RecordingLogFrame>> frames;
        AppTestEnv env;
        TLogform& w = env.window({}, test::recordingFeatures(&frames));
        QCOMPARE(w.CreateLogDetailFo(101), 0);
        QCOMPARE(w.CreateLogDetailFo(102), 1);
        QCOMPARE(w.CreateLogDetailFo(103), 2);
        QCOMPARE(w.CreateLogDetailFo(102), 1); // already open: brought forward
        QCOMPARE(w.logDetailWindows().size(), 3);
        QPointer<QWidget> second = w.logDetailWindows().at(1);
        sendMessage(&w, WMCLOSELOGDETAILFORM, 1, 0);
        QVERIFY(!w.logDetailWindows().at(1));
        QTRY_VERIFY(second.isNull());
        QCOMPARE(w.CreateLogDetailFo(104), 1);
        QCOMPARE(w.CreateLogDetailFo(105), 3);
        QCOMPARE(w.logDetailWindows().size(), 4);
        QCOMPARE(w.logDetailWindows().at(3)->property("tag").toInt(), 3);
        QVERIFY(!w.IfLogDetailArrayAllFree());
        for (qintptr odd : {qintptr(-1), qintptr(99), qintptr(1) << 40})
            sendMessage(&w, WMCLOSELOGDETAILFORM, odd, 0);
        QCOMPARE(w.logDetailWindows().size(), 4);

        QCOMPARE(w.CreateConDataEdit(0, 0), 0);
        QCOMPARE(w.CreateConDataEdit(0, 0), 1);
        QCOMPARE(w.contactRecords().size(), 2);
        sendMessage(&w, WMCLOSECONTACTFORM, 0, 0);
        QVERIFY(!w.editWindows().at(0));
        QVERIFY(!w.contactRecords().at(0));
        QCOMPARE(w.CreateConDataEdit(0, 0), 0);
        QCOMPARE(w.editWindows().at(0)->property("recordSlot").toInt(), 0);
        QCOMPARE(w.CreateConDataEdit(0, 0), 2);
        QCOMPARE(w.contactRecords().size(), 3);
    }

    void savingWithoutARecordIsReported()
    {
        AppTestEnv env;
        TLogform& w = env.window();
        sendMessage(&w, WMSAVECONDATA, 0, 0);
        QCOMPARE(env.dialogs().last().text, QStringLiteral("# Orvanta - WMSAVECONDATA\r\nDatentyp ist nicht initialisiert!"
                                                           "\r\nKontaktdaten können nicht gespeichert werden."));
        QList<QPointer<RecordingLogFrame>> frames;
        env.destroyWindow();
        TLogform& w2 = env.window({}, test::recordingFeatures(&frames));
        w2.CreateConDataEdit(0, 0);
        sendMessage(&w2, WMSAVECONDATA, 5, 0);
        QCOMPARE(env.dialogs().last().text, QStringLiteral("# Orvanta - WMSAVECONDATA\r\nDaten-Item ist nicht "
                                                           "initialisiert!\r\nKontaktdaten können nicht gespeichert werden."));
        // Nobody saves contacts yet: the window learns that its save failed.
        sendMessage(&w2, WMSAVECONDATA, 0, 0);
        QCOMPARE(w2.editWindows().at(0)->property("saveFailed").toBool(), true);
    }

    void deletingADayWaitsForTheDetailWindows()
    {
        AppTestEnv env;
        env.addCall(1, QStringLiteral("2024-05-14"), QStringLiteral("0301111"));
        env.addCall(2, QStringLiteral("2024-05-14"), QStringLiteral("0302222"));
        env.addCall(3, QStringLiteral("2024-05-10"), QStringLiteral("0303333"));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        env.writeFile(QStringLiteral("VStore"), "[Level_GV]\r\nAP=2\r\n");
        TLogform& w = env.window({}, f);
        w.show();
        QVERIFY(w.logFrame());
        QCOMPARE(w.logFrame()->logDay(), QDate(2024, 5, 14)); // latest day with calls, today has none
        QCOMPARE(w.calendar()->eventCount(), 2);
        QCOMPARE(w.calendar()->hintFor(QDate(2024, 5, 10)), QStringLiteral("Protokoll vom 10.05.2024"));

        w.CreateLogDetailFo(1);
        trigger(w, "_LogFo_DelDayLog");
        QCOMPARE(env.dialogs().count(), 1);
        QCOMPARE(env.dialogs().last().kind, DialogKind::Warning);
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("Derzeit ist noch ein Informationsfenster eines\r\nProtokolleintrags geöffnet.\r\n"
                                "Bitte schließen Sie vor dem Löschen erst alle\r\nFenster mit den Detailinformationen."));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG")).toInt(), 3);

        sendMessage(&w, WMCLOSELOGDETAILFORM, 0, 0);
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        trigger(w, "_LogFo_DelDayLog");
        QCOMPARE(env.dialogs().texts().at(1), QStringLiteral("Tagesprotokoll vom 14.05.2024 löschen?"));
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Tagesprotokoll wurde erfolgreich gelöscht."));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG")).toInt(), 1);
        QCOMPARE(w.calendar()->eventCount(), 1);
        QCOMPARE(w.logFrame()->logDay(), QDate(2024, 5, 10));

        // Only the calendar view deletes days.
        trigger(w, "dxBB_Ansicht_Proto");
        w.updateActions();
        QVERIFY(!act(w, "_LogFo_DelDayLog")->isEnabled());
        QVERIFY(act(w, "_LogFo_DelLog")->isEnabled());
    }

    void closingDuringARefreshHappensAboutASecondAfterIt()
    {
        QList<QPointer<RecordingLogFrame>> frames;
        AppTestEnv env;
        TLogform& w = env.window({}, test::recordingFeatures(&frames));
        w.show();
        QVERIFY(!frames.isEmpty());
        RecordingLogFrame* frame = frames.last();
        frame->refreshMs = 400;
        bool refusedWhileBusy = false;
        QTimer::singleShot(100, &w, [&] { refusedWhileBusy = !w.close() && w.isVisible() && w.closeRetryTimer()->isActive(); });
        QSignalSpy retries(w.closeRetryTimer(), &QTimer::timeout);
        sendMessage(&w, WMLOGINFOCHANGE, 7, 1);
        QVERIFY(refusedWhileBusy);
        QCOMPARE(frame->refreshedLid, 7);
        QCOMPARE(frame->refreshes, 1);
        QVERIFY(w.isVisible());
        // The close is retried by the one-second timer and succeeds at its first tick.
        QCOMPARE(w.closeRetryTimer()->interval(), 1000);
        QCOMPARE(retries.count(), 0);
        QTRY_VERIFY_WITH_TIMEOUT(!w.isVisible(), 3000);
        QCOMPARE(retries.count(), 1);
    }

    void buttonsOfTheLogPanelActAsOneChoice()
    {
        QList<QPointer<RecordingLogFrame>> frames;
        AppTestEnv env;
        TLogform& w = env.window({}, test::recordingFeatures(&frames));
        w.show();
        RecordingLogFrame* frame = frames.last();
        frame->groupings = 0;
        frame->columnMenuBuilds = 0;
        child<QCheckBox>(w, "rzcb7")->click();
        QCOMPARE(frame->groupKind, LogGrouping::Caller);
        QCOMPARE(frame->groupings, 1);
        QCOMPARE(frame->columnMenuBuilds, 1); // the grouped column left the "Ansicht" menu
        for (int n = 5; n <= 10; ++n)
            QCOMPARE(child<QCheckBox>(w, qPrintable(QStringLiteral("rzcb%1").arg(n)))->isChecked(), n == 7);
        // Clicking the checked box keeps it checked.
        child<QCheckBox>(w, "rzcb7")->click();
        QVERIFY(child<QCheckBox>(w, "rzcb7")->isChecked());
        child<QCheckBox>(w, "rzcb10")->click();
        QCOMPARE(frame->groupKind, LogGrouping::Direction);

        // A click arriving while grouping is in progress does nothing.
        frame->groupings = 0;
        frame->onToGroup = [&] { child<QCheckBox>(w, "rzcb6")->click(); };
        child<QCheckBox>(w, "rzcb9")->click();
        QCOMPARE(frame->groupKind, LogGrouping::Free);
        QCOMPARE(frame->groupings, 1);
        frame->onToGroup = nullptr;

        frame->groupings = 0;
        child<QRadioButton>(w, "rzrb5")->click();
        QCOMPARE(frame->filterKind, 2);
        QCOMPARE(frame->groupings, 0);
    }

    void theViewSwitchBuildsTheFrameOfThePanel()
    {
        QList<QPointer<RecordingLogFrame>> frames;
        AppTestEnv env;
        TLogform& w = env.window({}, test::recordingFeatures(&frames));
        w.show();
        QCOMPARE(frames.size(), 1);
        QCOMPARE(frames.last()->viewMode(), 0);

        // The log list reports its restored filter and grouping; the buttons follow.
        frames.last()->whatsOnFilter = 3;
        frames.last()->whatsOnGroup = LogGrouping::Callee;
        sendMessage(&w, WMCHANGELOGFILTERANDGROUPBUTTONS, 0, 0);
        QVERIFY(child<QRadioButton>(w, "rzrb6")->isChecked());
        QVERIFY(child<QCheckBox>(w, "rzcb8")->isChecked());
        QVERIFY(!child<QCheckBox>(w, "rzcb5")->isChecked());

        trigger(w, "dxBB_Ansicht_Kontakte");
        QCOMPARE(w.navBar()->activeTabIndex(), int(TLogform::TabContacts));
        QVERIFY(frames.first().isNull());
        QVERIFY(w.emptyFrame());
        QVERIFY(!w.logFrame());
        w.updateActions();
        for (const char* off : {"_LogFo_Print", "_LogFo_DelLog", "_LogFo_ContNew", "_LogFo_ContEdit", "_LogFo_OEImp"})
            QVERIFY2(!act(w, off)->isEnabled(), off);
        QVERIFY(act(w, "_LogFo_KatVerw")->isEnabled());

        trigger(w, "dxBB_Ansicht_Proto_PK");
        QVERIFY(!w.emptyFrame());
        QCOMPARE(frames.size(), 2);
        QCOMPARE(frames.last()->viewMode(), 1);
        QCOMPARE(frames.last()->logDay(), AppTestEnv::today()); // empty log: today
        QCOMPARE(frames.last()->captionText(), QStringLiteral("Kein Protokoll vorhanden."));

        // Picking a day opens it in the list.
        QTest::keyClick(w.calendar(), Qt::Key_Left);
        QCOMPARE(frames.last()->logDay(), QDate(2024, 5, 14));

        // A busy list disables the log actions.
        frames.last()->busy = true;
        w.updateActions();
        QVERIFY(!act(w, "_LogFo_Print")->isEnabled());
        frames.last()->busy = false;
        w.updateActions();
        QVERIFY(act(w, "_LogFo_DelDayLog")->isEnabled());
    }

    void companionProgramsStartFromTheProgramFolder()
    {
        AppTestEnv env;
        TLogform& w = env.window();
        env.writeFile(QStringLiteral("About"), "#!/bin/sh\necho about > \"$(pwd)/about.out\"\n");
        env.writeFile(QStringLiteral("OEImp"), "#!/bin/sh\necho \"$@\" > \"$(pwd)/import.out\"\n");
        for (const char* f : {"About", "OEImp"})
            QFile::setPermissions(env.file(QLatin1String(f)), QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);

        trigger(w, "_LogFo_About");
        QTRY_VERIFY(QFileInfo::exists(env.file(QStringLiteral("about.out"))));

        QSignalSpy finished(&w.launcher(), &ProgramLauncher::finishedWaiting);
        QVERIFY(w.launcher().start(QStringLiteral("OEImp.exe"), {QStringLiteral("-OEImpRufwarte")}, true));
        QVERIFY(w.launcher().isWaiting());
        QTRY_COMPARE(finished.size(), 1);
        QVERIFY(!w.launcher().isWaiting());
        QCOMPARE(env.readFile(QStringLiteral("import.out")).trimmed(), QByteArray("-OEImpRufwarte"));

        QVERIFY(!w.launcher().start(QStringLiteral("AppSetup.exe"), {}, false));
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Orvanta - StartProgram\r\n")));
        QVERIFY(env.dialogs().last().text.contains(QStringLiteral("AppSetup.exe")));
    }

    void withoutADatabaseTheNavigationIsDisabled()
    {
        AppTestEnv env;
        Registry r(RegistryRoot::LocalMachine);
        QVERIFY(r.openKey(QStringLiteral("software\\Varnik\\rufwarte"), true));
        r.writeString(QStringLiteral("Database"), env.file(QStringLiteral("missing.fdb")));
        TLogform& w = env.window();
        QVERIFY(!w.navBar()->isEnabled());
        QVERIFY(env.dialogs().texts().contains(QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!")));
        w.show();
        QVERIFY(w.close());
    }
};

ORVANTA_TEST(TestMainWindow)
#include "tst_mainwindow.moc"
