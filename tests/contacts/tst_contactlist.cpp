#include "contacts/Tcontactlistframe.h"
#include "tests/contacts/ContactTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "db/TDM2.h"
#include "platform/IniFile.h"
#include "platform/WindowMessages.h"
#include "ui/grid/GridCardView.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSearchPanel.h"
#include "ui/grid/GridView.h"

#include <QAction>
#include <QApplication>
#include <QCheckBox>
#include <QLabel>
#include <QLineEdit>
#include <QMenu>
#include <QPushButton>
#include <QSplitter>
#include <QTest>
#include <QToolButton>

using namespace orvanta;
using orvanta::test::ContactTestEnv;

namespace {

QStringList names(const Tcontactlistframe& f)
{
    const GridController* g = f.controller();
    QStringList out;
    const int c = g->columnByField(u"CONTBEZ");
    for (const quint32 r : g->recordsInOrder())
        out << g->cellText(r, c);
    return out;
}

void clickLetter(Tcontactlistframe& f, int t)
{
    auto* b = f.findChild<QToolButton*>(QStringLiteral("AdvToolButton%1").arg(t + 1));
    QVERIFY(b);
    b->click();
}

bool enabled(const Tcontactlistframe& f, const char* action)
{
    return f.findChild<QAction*>(QLatin1String(action))->isEnabled();
}

void fillLetters(ContactTestEnv& env)
{
    int lid = 1;
    for (const char* n : {"Apfel", "Äpfel", "ärger", "anton", "Bauer", "bach", "Schulz", "sonne", "ßtraße", "Zander",
                          "zeta", "Über", "umbra", "Ober", "Öl", "Xaver"})
        env.add(lid++, QString::fromUtf8(n));
}

int rowOfLid(const Tcontactlistframe& f, int lid)
{
    const GridController* g = f.controller();
    const int record = g->locate(lid);
    return record < 0 ? -1 : g->rowOfRecord(static_cast<quint32>(record));
}

void search(Tcontactlistframe& f, const QString& text)
{
    auto* edit = f.findChild<QLineEdit*>(QStringLiteral("cxTE1"));
    edit->setText(text);
    QTest::keyClick(edit, Qt::Key_Return);
}

void check(Tcontactlistframe& f, const char* box, bool on)
{
    f.findChild<QCheckBox*>(QLatin1String(box))->setChecked(on);
}

void fillSearch(ContactTestEnv& env)
{
    const auto add = [&env](int lid, const char* contbez, const char* name, const char* str, const char* ort) {
        ContactTestEnv::Contact c;
        c.lid = lid;
        c.contbez = QString::fromUtf8(contbez);
        c.name = QString::fromUtf8(name);
        c.str = QString::fromUtf8(str);
        c.ort = QString::fromUtf8(ort);
        env.addContact(c);
    };
    add(1, "Müller, Hans", "Müller", "Hauptstraße 1", "Berlin");
    add(2, "Muller, Eva", "Muller", "Gartenweg 2", "Bremen");
    add(3, "Meier AG", "", "Lindenstrasse 5", "München");
    add(4, "Bauer", "Bauer", "", "Berlin");
    add(5, "100% Bio_Laden", "", "", "Köln");
    add(6, "Meiser", "Meiser", "", "Hamburg");
}

} // namespace

class TstContactList : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void searchInBothViewsNarrowsClearsAndCloses()
    {
        ContactTestEnv env;
        fillSearch(env);
        {
            Tcontactlistframe f(&env.dm());
            f.resize(900, 500);
            f.show();
            QVERIFY(QTest::qWaitForWindowActive(&f));
            QVERIFY(f.DBConnect(&env.host()));
            auto* panel = f.findChild<QWidget*>(QStringLiteral("RzPanel1"));
            auto* edit = f.findChild<QLineEdit*>(QStringLiteral("cxTE1"));
            QCOMPARE(panel->height(), 1);
            QVERIFY(!edit->isEnabled());
            QVERIFY(!f.findChild<QCheckBox*>(QStringLiteral("RzChB1"))->isChecked());

            // "Suchen..." in the context menu opens the panel with the focus in "Suchen nach:".
            QAction* entry = f.findChild<QAction*>(QStringLiteral("cv_search"));
            QCOMPARE(entry->text(), QStringLiteral("Suchen..."));
            QCOMPARE(entry->shortcut(), QKeySequence(QKeySequence::Find));
            QVERIFY(f.popupMenu()->actions().contains(entry));
            entry->trigger();
            QVERIFY(f.isSearchShown());
            QVERIFY(panel->height() > 1);
            QTRY_COMPARE(QApplication::focusWidget(), edit);
            QCOMPARE(f.searchPanel()->chosenColumns().size(), 13);

            search(f, QStringLiteral("muller"));
            QCOMPARE(names(f), QStringList{"Muller, Eva"});
            QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Suche: \"muller\")"));
            QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 1"));
            QCOMPARE(env.dm().SelectedLID, 2);
            search(f, QStringLiteral("MÜLLER"));
            QCOMPARE(names(f), QStringList{"Müller, Hans"});
            search(f, QStringLiteral("strasse"));
            QCOMPARE(names(f), (QStringList{"Meier AG", "Müller, Hans"}));
            check(f, "RzChB3", true);
            search(f, QStringLiteral("strasse"));
            QCOMPARE(names(f), QStringList{"Meier AG"});
            check(f, "RzChB3", false);
            check(f, "RzChB2", true);
            search(f, QStringLiteral("meier ag"));
            QCOMPARE(names(f), QStringList{"Meier AG"});
            search(f, QStringLiteral("meier"));
            QCOMPARE(names(f), QStringList{});
            QCOMPARE(env.dm().SelectedLID, -1);
            check(f, "RzChB2", false);
            search(f, QStringLiteral("%"));
            QCOMPARE(names(f), QStringList{"100% Bio_Laden"});
            search(f, QStringLiteral("o_L"));
            QCOMPARE(names(f), QStringList{"100% Bio_Laden"});
            search(f, QStringLiteral("Bio%"));
            QCOMPARE(names(f), QStringList{});

            // A letter filter: replaced by the search, or narrowed by it.
            // A letter chosen while a search replaces the filter: the search now narrows it.
            clickLetter(f, 13);
            QVERIFY(f.findChild<QCheckBox*>(QStringLiteral("RzChB1"))->isChecked());
            check(f, "RzChB1", false);
            f.searchPanel()->setChosenColumns({QStringLiteral("Ort")});
            search(f, QStringLiteral("berlin"));
            QCOMPARE(names(f), (QStringList{"Bauer", "Müller, Hans"}));
            QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Suche: \"berlin\")"));
            check(f, "RzChB1", true);
            QTest::mouseClick(f.findChild<QPushButton*>(QStringLiteral("ADVSearchStart")), Qt::LeftButton);
            QCOMPARE(names(f), QStringList{"Müller, Hans"});
            QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"M\", Suche: \"berlin\")"));

            // The search follows into the cards and back.
            QVERIFY(f.ChangeView(2));
            QCOMPARE(names(f), QStringList{"Müller, Hans"});
            QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"M\", Suche: \"berlin\")"));
            QVERIFY(f.cardView()->controller()->isSearching());
            QVERIFY(f.popupMenu()->actions().contains(entry));
            QVERIFY(f.ChangeView(1));
            QCOMPARE(names(f), QStringList{"Müller, Hans"});

            // "» Suchmaske löschen «": the letter alone again.
            QTest::mouseClick(f.findChild<QLabel*>(QStringLiteral("L3")), Qt::LeftButton);
            QCOMPARE(edit->text(), QString());
            QCOMPARE(names(f), (QStringList{"Meier AG", "Meiser", "Muller, Eva", "Müller, Hans"}));
            QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"M\")"));

            // Closing removes the search and tells the main window.
            search(f, QStringLiteral("Bio"));
            QCOMPARE(names(f), QStringList{});
            env.host().got.clear();
            QTest::mouseClick(f.findChild<QPushButton*>(QStringLiteral("AdvCloseSearchPan")), Qt::LeftButton);
            QVERIFY(!f.isSearchShown());
            QCOMPARE(panel->height(), 1);
            QCOMPARE(names(f).size(), 4);
            QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 4"));
            QTRY_COMPARE(env.host().got.size(), 1);
            QCOMPARE(env.host().got[0].message, WMSEARCHUNCHECKED);

            // Ctrl+F in the grid, and the main window's entry, which also closes it.
            f.view()->setFocus();
            QTest::keyClick(f.view(), Qt::Key_F, Qt::ControlModifier);
            QVERIFY(f.isSearchShown());
            QVERIFY(f.isActionEnabled(QStringLiteral("_LogFo_Search")));
            f.executeAction(QStringLiteral("_LogFo_Search"));
            QVERIFY(!f.isSearchShown());
            QCOMPARE(env.dialogs().count(), 0);
            f.DBDisconnect();
        }
        // Opened again with a letter filter stored: RzChB1 is checked, no search.
        Tcontactlistframe g(&env.dm());
        QVERIFY(g.DBConnect(&env.host()));
        QCOMPARE(g.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"M\")"));
        QVERIFY(g.findChild<QCheckBox*>(QStringLiteral("RzChB1"))->isChecked());
        QVERIFY(!g.controller()->isSearching());
        g.searchPanel()->open();
        search(g, QString());
        QCOMPARE(env.dialogs().texts(DialogKind::Warning), QStringList{GridSearchPanel::missingInputWarning()});
        g.DBDisconnect();
    }

    void letterFilterCaptionsAndPatterns()
    {
        ContactTestEnv env;
        fillLetters(env);
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (alle)"));
        QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 16"));
        QCOMPARE(f.pressedLetter(), 0);

        clickLetter(f, 2);
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"B\")"));
        QCOMPARE(names(f), (QStringList{"bach", "Bauer"}));
        QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 2"));
        clickLetter(f, 2); // the same letter again keeps everything
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"B\")"));
        QCOMPARE(names(f).size(), 2);
        QCOMPARE(f.pressedLetter(), 2);

        clickLetter(f, 0);
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (alle)"));
        QCOMPARE(names(f).size(), 16);
        QVERIFY(!f.controller()->filter().active);

        const auto sorted = [](QStringList l) {
            l.sort();
            return l;
        };
        f.SetNewFilter(1);
        QCOMPARE(sorted(names(f)), sorted(QStringList{"Apfel", "Äpfel", "ärger", "anton"}));
        f.SetNewFilter(19);
        QCOMPARE(sorted(names(f)), sorted(QStringList{"Schulz", "sonne", "ßtraße"}));
        f.SetNewFilter(26);
        QCOMPARE(sorted(names(f)), sorted(QStringList{"Zander", "zeta"}));
        f.SetNewFilter(21);
        QCOMPARE(sorted(names(f)), sorted(QStringList{"Über", "umbra"}));
        f.SetNewFilter(15);
        QCOMPARE(sorted(names(f)), sorted(QStringList{"Ober", "Öl"}));
        QCOMPARE(f.controller()->tag(), 15);
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"O\")"));

        QCOMPARE(Tcontactlistframe::letterPatterns(1), (QStringList{"A%", "Ä%", "a%", "ä%"}));
        QCOMPARE(Tcontactlistframe::letterPatterns(19), (QStringList{"S%", "s%", "ß%"}));
        QCOMPARE(Tcontactlistframe::letterPatterns(26), (QStringList{"Z%", "z%"}));
        f.DBDisconnect();
    }

    void letterFilterSurvivesViewChangeAndRestart()
    {
        ContactTestEnv env;
        fillLetters(env);
        {
            Tcontactlistframe f(&env.dm());
            QVERIFY(f.DBConnect(&env.host()));
            QCOMPARE(f.activeView(), 1);
            f.SetNewFilter(2);
            QVERIFY(f.ChangeView(2));
            int kind = 0, grouping = -1;
            f.GetViewState(kind, grouping);
            QCOMPARE(kind, 2);
            QCOMPARE(grouping, 0);
            QCOMPARE(f.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"B\")"));
            QCOMPARE(f.pressedLetter(), 2);
            QCOMPARE(names(f).size(), 2);
            QVERIFY(env.dm().ibcds_card.isActive());
            QVERIFY(!env.dm().ibcds_list.isActive());
            QVERIFY(f.ChangeView(7)); // unknown kinds change nothing
            QCOMPARE(f.activeView(), 2);
            f.DBDisconnect();
        }
        IniFile vstore(Tcontactlistframe::viewStoreFile());
        QCOMPARE(vstore.readInteger(QStringLiteral("Level_GV"), QStringLiteral("Value"), 0), 2);
        QVERIFY(QFile::exists(Tcontactlistframe::layoutFile(2)));
        // The next start opens the cards with the letter still set.
        Tcontactlistframe g(&env.dm());
        QVERIFY(g.DBConnect(&env.host()));
        QCOMPARE(g.activeView(), 2);
        QCOMPARE(g.captionText(), QStringLiteral("Kontakte (Kontakt gefiltert nach \"B\")"));
        QCOMPARE(g.currentLetter(), QStringLiteral("B"));
        QCOMPARE(names(g).size(), 2);
        g.DBDisconnect();
    }

    void viewStoreDefaults()
    {
        ContactTestEnv env;
        env.add(1, QStringLiteral("Anna"));
        {
            Tcontactlistframe f(&env.dm());
            f.resize(800, 600);
            QVERIFY(f.DBConnect(&env.host()));
            QCOMPARE(f.activeView(), 1);
            QCOMPARE(f.splitterPercent(), 60);
            f.DBDisconnect();
        }
        env.writeFile(QStringLiteral("VStore"), "[Level_GV]\r\nValue=5\r\nPercent=40\r\n");
        // A damaged table layout naming columns that do not exist leaves the designed one.
        env.writeFile(QStringLiteral("VStoreT"), QByteArray("[1]\r\nTag=x\r\nNoSuchColumn.Width=abc\r\n\x01\xff[[\r\n"));
        Tcontactlistframe f(&env.dm());
        f.resize(800, 600);
        QVERIFY(f.DBConnect(&env.host()));
        QCOMPARE(f.activeView(), 1);
        QCOMPARE(f.splitterPercent(), 40);
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (alle)"));
        QCOMPARE(names(f), QStringList{QStringLiteral("Anna")});
        f.DBDisconnect();
    }

    void groupingCountsAndGroupRows()
    {
        ContactTestEnv env;
        env.add(1, QStringLiteral("Anna"), QStringLiteral("Berlin"), QStringLiteral("Familie"), QStringLiteral("10115"));
        env.add(2, QStringLiteral("Bernd"), QStringLiteral("Berlin"), QStringLiteral("Familie"), QStringLiteral("10115"));
        env.add(3, QStringLiteral("Carla"), QStringLiteral("Köln"), QStringLiteral("Firma"), QStringLiteral("50667"));
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        GridController* g = f.controller();
        const int katbez = g->columnByField(u"KATBEZ");

        f.ToGroup(1);
        int kind = 0, grouping = 0;
        f.GetViewState(kind, grouping);
        QCOMPARE(grouping, 1);
        QVERIFY(!g->isColumnVisible(katbez));
        QVERIFY(f.CanExpandGroups());
        f.ExpandGroups(true);
        QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 3"));
        QStringList groups;
        for (int r = 0; r < g->rowCount(); ++r)
            if (g->isGroupRow(r))
                groups << g->groupRowText(r);
        QCOMPARE(groups, (QStringList{"Kategorie: Familie (2)", "Kategorie: Firma (1)"}));

        // A data row selects its contact, a group row none.
        g->setFocusedRow(rowOfLid(f, 3));
        QCOMPARE(f.GetSelectedLID(), 3);
        QCOMPARE(f.GetSelectedContBez(), QStringLiteral("Carla"));
        QVERIFY(enabled(f, "cv_editcont"));
        g->setFocusedRow(0);
        QVERIFY(g->isGroupRow(0));
        QCOMPARE(f.GetSelectedLID(), -1);
        QCOMPARE(f.GetSelectedContBez(), QString());
        QVERIFY(!enabled(f, "cv_editcont"));
        QVERIFY(!enabled(f, "cv_deletecont"));
        QVERIFY(enabled(f, "cv_newcont"));

        f.ToGroup(3);
        f.GetViewState(kind, grouping);
        QCOMPARE(grouping, 3);
        QVERIFY(g->isColumnVisible(katbez));
        f.ToGroup(0);
        f.GetViewState(kind, grouping);
        QCOMPARE(grouping, 0);
        QVERIFY(!f.CanExpandGroups());
        QCOMPARE(g->sortOrder(g->columnByField(u"CONTBEZ")), GridSortOrder::Ascending);
        f.DBDisconnect();
    }

    void actionsPostToTheHost()
    {
        ContactTestEnv env;
        Tcontactlistframe empty(&env.dm());
        QVERIFY(empty.DBConnect(&env.host()));
        QCOMPARE(empty.GetSelectedLID(), -1);
        QVERIFY(enabled(empty, "cv_newcont"));
        QVERIFY(!empty.isActionEnabled(QStringLiteral("cv_editcont")));
        QVERIFY(!empty.isActionEnabled(QStringLiteral("cv_deletecont")));
        QCOMPARE(empty.footerText(), QStringLiteral(" Kontakte: 0"));
        empty.DBDisconnect();

        env.add(1, QStringLiteral("Anna"));
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        f.controller()->setFocusedRow(0);
        QCOMPARE(f.GetSelectedLID(), 1);
        env.host().got.clear();
        f.executeAction(QStringLiteral("cv_deletecont"));
        f.executeAction(QStringLiteral("cv_editcont"));
        f.executeAction(QStringLiteral("cv_newcont"));
        QTRY_COMPARE(env.host().got.size(), 3);
        QCOMPARE(env.host().got[0].message, WMDELETECONTACT);
        QCOMPARE(env.host().got[1].message, WMOPENCONTACT);
        QCOMPARE(env.host().got[2].message, WMNEWCONTACT);
        f.DBDisconnect();
    }

    void summaryWaitsForTheLastKeyStep()
    {
        ContactTestEnv env;
        for (int i = 1; i <= 5; ++i)
            env.add(i, QStringLiteral("Kontakt %1").arg(i));
        Tcontactlistframe f(&env.dm());
        f.resize(800, 600);
        f.show();
        QVERIFY(f.DBConnect(&env.host()));
        f.controller()->setFocusedRow(0);
        const int before = f.summaryRebuilds();
        // Holding Down: every step restarts the wait, nothing is rebuilt meanwhile.
        for (int step = 0; step < 3; ++step) {
            QTest::keyClick(f.view(), Qt::Key_Down);
            QVERIFY(f.summaryTimer()->isActive());
            for (int tick = 0; tick < 5; ++tick)
                f.T1Timer();
        }
        QCOMPARE(f.summaryRebuilds(), before);
        QCOMPARE(f.GetSelectedLID(), 4);
        for (int tick = 0; tick < 5; ++tick)
            f.T1Timer();
        QCOMPARE(f.summaryRebuilds(), before);
        f.T1Timer(); // the eleventh tick after the last step
        QCOMPARE(f.summaryRebuilds(), before + 1);
        QVERIFY(!f.summaryTimer()->isActive());
        // A focus change without a navigation key rebuilds at once.
        f.controller()->setFocusedRow(0);
        QCOMPARE(f.summaryRebuilds(), before + 2);
        f.DBDisconnect();
    }
};

ORVANTA_TEST(TstContactList)
#include "tst_contactlist.moc"
