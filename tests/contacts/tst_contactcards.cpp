#include "contacts/Tcontactlistframe.h"
#include "tests/contacts/ContactTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "db/TDM2.h"
#include "ui/grid/GridCardView.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridView.h"
#include "ui/markup/MarkupPanel.h"

#include <QAction>
#include <QMenu>
#include <QTest>
#include <QToolButton>

using namespace orvanta;
using orvanta::test::ContactTestEnv;

namespace {

QStringList designations(const GridController* g)
{
    QStringList out;
    const int c = g->columnByField(u"CONTBEZ");
    for (const quint32 r : g->recordsInOrder())
        out << g->cellText(r, c);
    return out;
}

// The text of a card row (by caption) on the card of a contact.
QString cardLine(const Tcontactlistframe& f, int lid, const char* caption)
{
    const GridController* g = f.cardView()->controller();
    const int record = g->locate(lid);
    const int c = g->columnByCaption(QString::fromUtf8(caption));
    if (record < 0 || c < 0)
        return QStringLiteral("<none>");
    return g->displayText(g->rowOfRecord(static_cast<quint32>(record)), c);
}

QAction* action(const Tcontactlistframe& f, const QString& name)
{
    return f.findChild<QAction*>(name);
}

void fill(ContactTestEnv& env)
{
    ContactTestEnv::Contact c;
    c.lid = 1;
    c.contbez = QStringLiteral("Meier, Eva");
    c.name = QStringLiteral("Meier");
    c.vname = QStringLiteral("Eva");
    c.plz = QStringLiteral("53111");
    c.ort = QStringLiteral("Bonn");
    c.kategorie = QStringLiteral("Familie");
    env.addContact(c);
    c = {};
    c.lid = 2;
    c.contbez = QStringLiteral("Müller GmbH");
    c.name = QStringLiteral("Müller");
    c.ort = QStringLiteral("Köln"); // no first name, no post code
    env.addContact(c);
    c = {};
    c.lid = 3;
    c.contbez = QStringLiteral("mahler");
    c.address = false; // no address row at all: the joined fields are null
    env.addContact(c);
    env.add(4, QStringLiteral("Anna"), QStringLiteral("Bonn"), QStringLiteral("Familie"), QStringLiteral("53111"));
    env.add(5, QStringLiteral("Zeta"), QStringLiteral("Köln"), QStringLiteral("Firma"), QStringLiteral("50667"));
}

} // namespace

class TstContactCards : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // Table -> cards with "M": filter, pressed button and caption stay; the cards show only the
    // M contacts, the card menu is the one of the cards; back to the table, its own grouping
    // comes back from its layout and the letter is still there.
    void letterFilterAndMenusFollowTheView()
    {
        ContactTestEnv env;
        fill(env);
        Tcontactlistframe f(&env.dm());
        f.resize(900, 600);
        f.show();
        QVERIFY(f.DBConnect(&env.host()));
        f.ToGroup(Tcontactlistframe::ByTown);
        f.findChild<QToolButton*>(QStringLiteral("AdvToolButton14"))->click();
        const QString caption = QStringLiteral("Kontakte (Kontakt gefiltert nach \"M\")");
        QCOMPARE(f.captionText(), caption);
        f.view()->controller()->expandAll(true);
        f.view()->controller()->focusRecord(static_cast<quint32>(f.view()->controller()->locate(2)));
        QCOMPARE(f.GetSelectedLID(), 2);

        QVERIFY(f.ChangeView(Tcontactlistframe::CardView));
        QCOMPARE(f.activeView(), 2);
        QVERIFY(f.cardView()->isVisible());
        QVERIFY(!f.view()->isVisible());
        QCOMPARE(f.controller(), f.cardView()->controller());
        QCOMPARE(f.captionText(), caption);
        QCOMPARE(f.pressedLetter(), 13);
        QVERIFY(f.findChild<QToolButton*>(QStringLiteral("AdvToolButton14"))->isChecked());
        QCOMPARE(designations(f.controller()), (QStringList{"mahler", "Meier, Eva", "Müller GmbH"}));
        QVERIFY(f.controller()->filterText().contains(QLatin1String("CONTBEZ LIKE")));
        QCOMPARE(f.controller()->tag(), 13);
        // The focused contact came along, and the cards are never grouped.
        QCOMPARE(f.GetSelectedLID(), 2);
        QVERIFY(!f.controller()->isGrouped());
        int kind = 0, grouping = -1;
        f.GetViewState(kind, grouping);
        QCOMPARE(kind, 2);
        QCOMPARE(grouping, 0);
        f.ToGroup(Tcontactlistframe::ByCategory); // only the table groups
        QVERIFY(!f.controller()->isGrouped());

        QCOMPARE(f.popupMenu()->objectName(), QStringLiteral("AdvPopupMenu1"));
        QMenu* rows = f.popupMenu()->findChild<QMenu*>(QStringLiteral("Ansicht2"));
        QVERIFY(rows);
        QCOMPARE(rows->title(), QStringLiteral("Ansicht"));
        QStringList captions, checked;
        for (QAction* a : rows->actions()) {
            captions << a->text();
            if (a->isChecked())
                checked << a->objectName();
        }
        QCOMPARE(captions, (QStringList{"Anrede", "Titel", "Name/Vorname", "Firma", "Kategorie", "Straße",
                                        "PLZ/Ort", "Anschriftenzusatz", "Land", "Bundesland"}));
        QCOMPARE(checked, (QStringList{"CVUM1", "CVUM3", "CVUM4", "CVUM5", "CVUM6", "CVUM7"}));
        // "Anschriftenzusatz" shows the row captioned "Zusatz"; "PLZ/Ort" hides the computed row.
        const GridController* cg = f.controller();
        action(f, QStringLiteral("CVUM8"))->trigger();
        QVERIFY(cg->isColumnVisible(cg->columnByCaption(u"Zusatz")));
        action(f, QStringLiteral("CVUM7"))->trigger();
        QVERIFY(!cg->isColumnVisible(cg->columnByCaption(u"PLZ / Ort")));
        // The table's items do nothing while the cards are active.
        const int katbez = f.view()->controller()->columnByField(u"KATBEZ");
        const bool katVisible = f.view()->controller()->isColumnVisible(katbez);
        action(f, QStringLiteral("tvum5"))->trigger();
        QCOMPARE(f.view()->controller()->isColumnVisible(katbez), katVisible);

        QVERIFY(f.ChangeView(Tcontactlistframe::TableView));
        QCOMPARE(f.captionText(), caption);
        QCOMPARE(f.pressedLetter(), 13);
        QCOMPARE(f.controller()->recordCount(), 3);
        f.GetViewState(kind, grouping);
        QCOMPARE(grouping, 3);
        QCOMPARE(f.popupMenu()->objectName(), QStringLiteral("AdvPopupMenu2"));

        // The hidden rows were stored with the cards' layout.
        QVERIFY(f.ChangeView(Tcontactlistframe::CardView));
        QVERIFY(cg->isColumnVisible(cg->columnByCaption(u"Zusatz")));
        QVERIFY(!cg->isColumnVisible(cg->columnByCaption(u"PLZ / Ort")));
        f.SetNewFilter(0);
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (alle)"));
        QCOMPARE(f.controller()->recordCount(), 5);
        f.DBDisconnect();
    }

    // Switching views shows the rows already read (no second read of the address book); a
    // refresh reads what changed meanwhile, in either view.
    void switchingKeepsTheRowsRefreshRereads()
    {
        ContactTestEnv env;
        fill(env);
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        env.add(6, QStringLiteral("Neu"));
        const int rebuilds = f.summaryRebuilds();
        QVERIFY(f.ChangeView(Tcontactlistframe::CardView));
        QCOMPARE(f.summaryRebuilds(), rebuilds + 1); // one summary per switch
        QVERIFY(env.dm().ibcds_card.isActive());
        QVERIFY(!env.dm().ibcds_list.isActive());
        QCOMPARE(f.controller()->recordCount(), 5);
        f.Refresh_View(6);
        QCOMPARE(f.controller()->recordCount(), 6);
        QCOMPARE(f.GetSelectedLID(), 6);
        QCOMPARE(cardLine(f, 6, "Name"), QStringLiteral("Neu"));
        QVERIFY(f.ChangeView(Tcontactlistframe::TableView));
        QCOMPARE(designations(f.controller()), (QStringList{"Anna", "mahler", "Meier, Eva", "Müller GmbH", "Neu", "Zeta"}));
        QCOMPARE(f.GetSelectedLID(), 6);
        QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 6"));
        f.DBDisconnect();
    }

    // The computed rows read the database's nulls as empty: no trailing or leading blanks.
    void computedRowsOfRealContacts()
    {
        ContactTestEnv env;
        fill(env);
        env.writeFile(QStringLiteral("VStore"), "[Level_GV]\r\nValue=2\r\nPercent=55\r\n");
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        QCOMPARE(f.activeView(), 2);
        QCOMPARE(cardLine(f, 1, "Name"), QStringLiteral("Meier Eva"));
        QCOMPARE(cardLine(f, 1, "PLZ / Ort"), QStringLiteral("53111  Bonn"));
        QCOMPARE(cardLine(f, 2, "Name"), QStringLiteral("Müller"));
        QCOMPARE(cardLine(f, 2, "PLZ / Ort"), QStringLiteral("Köln"));
        QCOMPARE(cardLine(f, 3, "PLZ / Ort"), QString());
        QCOMPARE(f.cardView()->captionColumn(), f.controller()->columnByField(u"CONTBEZ"));
        QCOMPARE(f.cardView()->cardWidth(), 300);
        // Sorted by the title, case-insensitively.
        QCOMPARE(designations(f.controller()), (QStringList{"Anna", "mahler", "Meier, Eva", "Müller GmbH", "Zeta"}));
        f.DBDisconnect();
    }

    // Keys, mouse and refresh on the cards keep SelectedLID, the actions and the summary in step.
    void cardNavigationKeepsTheSelectedContact()
    {
        ContactTestEnv env;
        fill(env);
        env.writeFile(QStringLiteral("VStore"), "[Level_GV]\r\nValue=2\r\n");
        Tcontactlistframe f(&env.dm());
        f.resize(1000, 700);
        f.show();
        QVERIFY(f.DBConnect(&env.host()));
        GridCardView* cards = f.cardView();
        QVERIFY(cards->isVisible());
        // Order: Anna (4), mahler (3), Meier (1), Müller (2), Zeta (5); the first card has the focus.
        QCOMPARE(f.GetSelectedLID(), 4);
        QCOMPARE(f.GetSelectedContBez(), QStringLiteral("Anna"));
        QVERIFY(action(f, QStringLiteral("cv_editcont"))->isEnabled());
        QTest::keyClick(cards, Qt::Key_Down);
        QCOMPARE(f.GetSelectedLID(), 3);
        QVERIFY(f.summaryTimer()->isActive()); // deferred after a navigation key
        QTest::keyClick(cards, Qt::Key_End);
        QCOMPARE(f.GetSelectedLID(), 5);
        QCOMPARE(f.GetSelectedContBez(), QStringLiteral("Zeta"));
        const int rebuilds = f.summaryRebuilds();
        for (int tick = 0; tick <= 10; ++tick)
            f.T1Timer();
        QCOMPARE(f.summaryRebuilds(), rebuilds + 1);
        QVERIFY(f.summaryPanel()->text().contains(QLatin1String("Zeta")));

        // A click rebuilds at once.
        const QRect second = cards->cardRect(1);
        QTest::mouseClick(cards->viewport(), Qt::LeftButton, {}, second.center());
        QCOMPARE(f.GetSelectedLID(), 3);
        QCOMPARE(f.summaryRebuilds(), rebuilds + 2);
        QVERIFY(!f.summaryTimer()->isActive());

        // Enter and a double click open the contact, Delete asks for its deletion.
        env.host().got.clear();
        QTest::keyClick(cards, Qt::Key_Return);
        QTest::keyClick(cards, Qt::Key_Delete);
        QTRY_COMPARE(env.host().got.size(), 2);
        QCOMPARE(env.host().got[0].message, WMOPENCONTACT);
        QCOMPARE(env.host().got[1].message, WMDELETECONTACT);

        // A refresh keeps the contact; a filter that drops it leaves none selected.
        f.Refresh_View(1);
        QCOMPARE(f.GetSelectedLID(), 1);
        f.SetNewFilter(26);
        QCOMPARE(f.controller()->recordCount(), 1);
        QCOMPARE(f.GetSelectedLID(), f.controller()->focusedRecord() < 0 ? -1 : 5);
        f.DBDisconnect();
    }

    // A damaged card layout (garbage, unknown rows, a fixed row moved, impossible values) opens
    // the cards as designed.
    void damagedCardLayoutOpensWithDefaults()
    {
        ContactTestEnv env;
        fill(env);
        env.writeFile(QStringLiteral("VStore"), "[Level_GV]\r\nValue=2\r\n");
        env.writeFile(QStringLiteral("VStoreC"),
                      QByteArray("\x01\xfe garbage [[[\r\n[1]\r\nTag=banana\r\nFilterActive=1\r\nCardWidth=-40\r\n"
                                 "[1.Column.NoSuchRow]\r\nPosition=0\r\nVisible=1\r\n"
                                 "[1.Column.cxGrid1DBCardView1LID]\r\nPosition=9\r\nVisible=1\r\n"
                                 "[1.Column.cxGrid1DBCardView1NAME]\r\nPosition=2\r\n"
                                 "[1.Column.cxGrid1DBCardView1FIRMA]\r\nPosition=abc\r\nVisible=maybe\r\n"
                                 "[1.Filter]\r\nCount=99999999\r\nItem0.Parent=7\r\nItem0.Kind=List\r\n"
                                 "Item1.Parent=-1\r\nItem1.Kind=Condition\r\nItem1.Column=Nope\r\n"
                                 "Item1.Operator=LIKE\r\nItem1.Value=Q%\r\n",
                                 QByteArray::size_type(400)));
        Tcontactlistframe f(&env.dm());
        f.resize(900, 600);
        f.show();
        QVERIFY(f.DBConnect(&env.host()));
        QCOMPARE(f.activeView(), 2);
        const GridController* g = f.controller();
        QCOMPARE(designations(g), (QStringList{"Anna", "mahler", "Meier, Eva", "Müller GmbH", "Zeta"}));
        QCOMPARE(f.captionText(), QStringLiteral("Kontakte (alle)"));
        QCOMPARE(f.pressedLetter(), 0);
        QCOMPARE(f.cardView()->cardWidth(), 300);
        // Rows that may not move are where they were designed.
        const QList<int> order = f.cardView()->rowOrder();
        QCOMPARE(order.indexOf(g->columnByName(u"cxGrid1DBCardView1LID")), 0);
        QCOMPARE(order.indexOf(g->columnByName(u"cxGrid1DBCardView1CONTBEZ")), 1);
        QCOMPARE(order.indexOf(g->columnByName(u"cxGrid1DBCardView1NAME")), 5);
        QVERIFY(g->isColumnVisible(g->columnByName(u"cxGrid1DBCardView1FIRMA")));
        f.cardView()->viewport()->grab(); // paints without tripping over anything
        QTest::keyClick(f.cardView(), Qt::Key_End);
        QCOMPARE(f.GetSelectedLID(), 5);
        f.DBDisconnect();
        QVERIFY(!f.isConnected());
    }
};

ORVANTA_TEST(TstContactCards)
#include "tst_contactcards.moc"
