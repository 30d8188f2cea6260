#include "categories/CategoryDialogs.h"
#include "categories/TCatControl.h"
#include "categories/WindowBounds.h"
#include "db/TDM2.h"
#include "platform/IniFile.h"
#include "tests/categories/CategoryTestEnv.h"
#include "tests/categories/DialogDriver.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridHeader.h"
#include "ui/grid/GridView.h"
#include "ui/label/TVKCutLabel.h"

#include <QAction>
#include <QDropEvent>
#include <QGuiApplication>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QMenu>
#include <QMenuBar>
#include <QPushButton>
#include <QScreen>
#include <QTest>
#include <QToolBar>

#include <memory>

using namespace orvanta;
using orvanta::test::CategoryTestEnv;
using orvanta::test::onNextDialog;

namespace {

struct Calls {
    QStringList renamed; // "old>new"
    QStringList moved; // "cid>katbez"
};

std::unique_ptr<TCatControl> manager(CategoryTestEnv& env, Calls& calls)
{
    TCatControl::Callbacks cb;
    cb.HasRenameKatBez = [&calls](const QString& o, const QString& n) { calls.renamed << o + QLatin1Char('>') + n; };
    cb.ChangeRelatedKontKat
        = [&calls](int cid, const QString& k) { calls.moved << QString::number(cid) + QLatin1Char('>') + k; };
    return std::make_unique<TCatControl>(&env.dm(), cb);
}

// The standard data: Familie (Anna, Bert, Carl), Freunde (Dora), Leer.
void fill(CategoryTestEnv& env)
{
    env.addCategory(1, QStringLiteral("Familie"), QStringLiteral("die Nächsten"));
    env.addCategory(2, QStringLiteral("Freunde"));
    env.addCategory(3, QStringLiteral("Leer"));
    env.addContact(10, QStringLiteral("Anna"), 1, QStringLiteral("Bonn"));
    env.addContact(11, QStringLiteral("Bert"), 1);
    env.addContact(12, QStringLiteral("Carl"), 1);
    env.addContact(13, QStringLiteral("Dora"), 2);
}

QStringList column(const GridView* view, const char* name)
{
    const GridController* g = view->controller();
    QStringList out;
    for (int row = 0; row < g->rowCount(); ++row)
        out << g->displayText(row, g->columnByName(QString::fromLatin1(name)));
    return out;
}

int rowOf(const GridView* view, const char* columnName, const QString& text)
{
    return static_cast<int>(column(view, columnName).indexOf(text));
}

void clickRow(GridView* view, int row)
{
    QTest::mouseClick(view->viewport(), Qt::LeftButton, {}, view->rowRect(row).center());
}

void focusCategory(TCatControl& w, const QString& name)
{
    clickRow(w.categoryView(), rowOf(w.categoryView(), "KAT_KATBEZ", name));
    QCOMPARE(w.categoryView()->controller()->focusedRow(), rowOf(w.categoryView(), "KAT_KATBEZ", name));
}

QAction* act(const TCatControl& w, const char* name)
{
    return w.findChild<QAction*>(QLatin1String(name));
}

bool dragOnto(TCatControl& w, QMimeData* data, int row, bool drop)
{
    QWidget* target = w.categoryView()->viewport();
    const QPoint at = w.categoryView()->rowRect(row).center();
    QDragEnterEvent enter(at, Qt::MoveAction, data, Qt::LeftButton, {});
    QApplication::sendEvent(target, &enter);
    QDragMoveEvent move(at, Qt::MoveAction, data, Qt::LeftButton, {});
    QApplication::sendEvent(target, &move);
    if (drop && move.isAccepted()) {
        QDropEvent dropEvent(QPointF(at), Qt::MoveAction, data, Qt::LeftButton, {});
        QApplication::sendEvent(target, &dropEvent);
    }
    return move.isAccepted();
}

} // namespace

class TestCatControl final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void showsBothListsWithTheirColumnsMenusAndNotice()
    {
        CategoryTestEnv env;
        fill(env);
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        QCOMPARE(w->windowTitle(), QStringLiteral("Kategorieverwaltung"));
        QVERIFY(w->windowFlags() & Qt::WindowStaysOnTopHint);
        QCOMPARE(column(w->categoryView(), "KAT_KATBEZ"),
                 QStringList({ QStringLiteral("Familie"), QStringLiteral("Freunde"), QStringLiteral("Leer") }));
        QCOMPARE(column(w->categoryView(), "KAT_BEMERKUNG").first(), QStringLiteral("die Nächsten"));
        const GridController* k = w->categoryView()->controller();
        QVERIFY(!k->isColumnVisible(k->columnByName(u"KAT_LID")));
        QCOMPARE(k->column(k->columnByName(u"KAT_KATBEZ")).caption, QStringLiteral("Kategorie"));
        QCOMPARE(k->column(k->columnByName(u"KAT_KATBEZ")).width, 116);
        QCOMPARE(k->column(k->columnByName(u"KAT_BEMERKUNG")).width, 182);
        const GridController* d = w->contactView()->controller();
        for (const char* hidden : { "KATD_LID", "KATD_CID", "KATD_KID" })
            QVERIFY(!d->isColumnVisible(d->columnByName(QString::fromLatin1(hidden))));
        QCOMPARE(d->column(d->columnByName(u"KATD_STR")).caption, QStringLiteral("Straße"));
        QCOMPARE(d->column(d->columnByName(u"KATD_PLZ")).caption, QString());
        QCOMPARE(w->contactView()->sortedColumnColor(), QColor(0xEF, 0xEF, 0xEF));
        QCOMPARE(w->categoryView()->sortedColumnColor(), QColor(0xEF, 0xEF, 0xEF));

        // The first category is focused and its contacts shown.
        QCOMPARE(w->focusedCategoryId(), 1);
        QCOMPARE(column(w->contactView(), "KATD_CONTBEZ"),
                 QStringList({ QStringLiteral("Anna"), QStringLiteral("Bert"), QStringLiteral("Carl") }));
        QCOMPARE(w->footerText(), QStringLiteral("Kontakte: 3"));
        QCOMPARE(w->findChild<TVKCutLabel*>(QStringLiteral("CL1"), Qt::FindChildrenRecursively) != nullptr, true);
        const QString notice
            = TCatControl::noticeText().trimmed().replace(QStringLiteral("\r\n"), QStringLiteral("\n"));
        QCOMPARE(w->findChild<QLabel*>(QStringLiteral("L_HinweisText"))->text(), notice);
        QVERIFY(notice.contains(QStringLiteral("Menüpunkt \"Kontakt/Kontakt in andere Kategorie verschieben...\".")));

        QStringList menus;
        for (QAction* m : w->menuBar()->actions())
            menus << m->text();
        QCOMPARE(menus,
                 QStringList({ QStringLiteral("Kategorieverwaltung"), QStringLiteral("Kategorie"),
                               QStringLiteral("Kontakt") }));
        QStringList bars;
        for (QToolBar* tb : w->findChildren<QToolBar*>())
            bars << tb->windowTitle();
        QCOMPARE(bars,
                 QStringList({ QStringLiteral("Kategorie neu/bearbeiten"), QStringLiteral("Kategorie übernehmen"),
                               QStringLiteral("Kontakte - Zuordnung verändern") }));
        const struct {
            const char* name;
            const char* caption;
            const char* hint;
        } actions[]
            = { { "Kat_New", "Neu...", "Neue Kategorie anlegen" },
                { "Kat_Rename", "Bearbeiten...", "Kategorie umbenennen" },
                { "Kat_Delete", "Löschen", "Kategorie löschen" },
                { "Kat_Move", "Übernehmen", "Markierte Kategorie in Erfassungsform übernehmen" },
                { "Kon_Move", "Kontakt in andere Kategorie verschieben...",
                  "Kontakt in andere Kategorie verschieben..." },
                { "Kon_CutRelated", "Kontakt aus der Kategorie entfernen", "Kontakt aus der Kategorie entfernen" },
                { "dxBB1", "Schließen", "Schließen" } };
        for (const auto& a : actions) {
            QAction* action = act(*w, a.name);
            QVERIFY2(action, a.name);
            QCOMPARE(action->text(), QString::fromUtf8(a.caption));
            QCOMPARE(action->toolTip(), QString::fromUtf8(a.hint));
        }
        QCOMPARE(w->contactPopup()->actions(), QList<QAction*>({ act(*w, "Kon_Move"), act(*w, "Kon_CutRelated") }));

        // Update rules: no pick outside selection mode; contact actions need a focused contact.
        QVERIFY(!act(*w, "Kat_Move")->isEnabled());
        QVERIFY(act(*w, "Kon_Move")->isEnabled());
        QVERIFY(act(*w, "Kon_CutRelated")->isEnabled());
        const int loads = w->detailLoads();
        focusCategory(*w, QStringLiteral("Leer"));
        // A mouse click loads at once.
        QCOMPARE(w->detailLoads(), loads + 1);
        QCOMPARE(w->footerText(), QStringLiteral("Kontakte: 0"));
        QVERIFY(!act(*w, "Kon_Move")->isEnabled());
        QVERIFY(!act(*w, "Kon_CutRelated")->isEnabled());
        w->setSelectionMode(true);
        QVERIFY(act(*w, "Kat_Move")->isEnabled());
        w->close();
    }

    void holdingDownLoadsTheContactsOnceAfterTheKeysRest()
    {
        CategoryTestEnv env;
        for (int i = 1; i <= 8; ++i) {
            env.addCategory(i, QStringLiteral("Kategorie %1").arg(i));
            env.addContact(10 + i, QStringLiteral("Kontakt %1").arg(i), i);
        }
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        QVERIFY(QTest::qWaitForWindowExposed(w.get()));
        GridView* v = w->categoryView();
        v->setFocus();
        const int loads = w->detailLoads();
        for (int i = 0; i < 7; ++i) {
            QTest::keyClick(v, Qt::Key_Down);
            QTest::qWait(5);
        }
        QCOMPARE(v->controller()->focusedRow(), 7);
        QCOMPARE(w->focusedCategoryId(), 8);
        QCOMPARE(w->detailLoads(), loads);
        QVERIFY(w->delayTimer()->isActive());
        QCOMPARE(w->delayTimer()->interval(), 30);
        QTRY_COMPARE(w->detailLoads(), loads + 1);
        QCOMPARE(column(w->contactView(), "KATD_CONTBEZ"), QStringList(QStringLiteral("Kontakt 8")));
        QTest::qWait(100);
        QCOMPARE(w->detailLoads(), loads + 1);
        // A key that moves nothing does not delay the next click.
        QTest::keyClick(v, Qt::Key_Down);
        QTest::qWait(5);
        clickRow(v, 0);
        QCOMPARE(w->detailLoads(), loads + 2);
        w->close();
    }

    void aDuplicateNameReopensTheDialogWithTheEnteredText()
    {
        CategoryTestEnv env;
        fill(env);
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        QString reopenedWith;
        onNextDialog<Tkateditform>([&](Tkateditform* d) {
            QCOMPARE(d->findChild<QLineEdit*>(QStringLiteral("RzE1"))->text(), QString());
            QVERIFY(!d->findChild<QPushButton*>(QStringLiteral("RzB1"))->isEnabled());
            QTest::keyClicks(d->findChild<QLineEdit*>(QStringLiteral("RzE1")), QStringLiteral("FREUNDE"));
            QTest::keyClicks(d->findChild<QLineEdit*>(QStringLiteral("RzE2")), QStringLiteral("neu"));
            QTest::mouseClick(d->findChild<QPushButton*>(QStringLiteral("RzB1")), Qt::LeftButton);
            onNextDialog<Tkateditform>([&](Tkateditform* again) {
                reopenedWith = again->findChild<QLineEdit*>(QStringLiteral("RzE1"))->text() + QLatin1Char('|')
                    + again->findChild<QLineEdit*>(QStringLiteral("RzE2"))->text();
                auto* name = again->findChild<QLineEdit*>(QStringLiteral("RzE1"));
                name->selectAll();
                QTest::keyClicks(name, QStringLiteral("Verein"));
                QTest::mouseClick(again->findChild<QPushButton*>(QStringLiteral("RzB1")), Qt::LeftButton);
            });
        });
        act(*w, "Kat_New")->trigger();
        QCOMPARE(reopenedWith, QStringLiteral("FREUNDE|neu"));
        QCOMPARE(env.dialogs().texts(),
                 QStringList(QStringLiteral("Die angegebene Kategoriebezeichnung ist bereits vorhanden!")));
        QCOMPARE(env.text(QStringLiteral("SELECT BEMERKUNG FROM KAT WHERE KATBEZ = 'Verein'")), QStringLiteral("neu"));
        // The new category is in the list and focused.
        QCOMPARE(w->categoryView()->controller()->focusedRow(),
                 rowOf(w->categoryView(), "KAT_KATBEZ", QStringLiteral("Verein")));
        QVERIFY(calls.renamed.isEmpty());

        // Renaming: the main window hears of the new name.
        focusCategory(*w, QStringLiteral("Familie"));
        onNextDialog<Tkateditform>([](Tkateditform* d) {
            auto* name = d->findChild<QLineEdit*>(QStringLiteral("RzE1"));
            QCOMPARE(name->text(), QStringLiteral("Familie"));
            QCOMPARE(d->findChild<QLineEdit*>(QStringLiteral("RzE2"))->text(), QStringLiteral("die Nächsten"));
            name->end(false);
            QTest::keyClicks(name, QStringLiteral(" & Co"));
            QTest::mouseClick(d->findChild<QPushButton*>(QStringLiteral("RzB1")), Qt::LeftButton);
        });
        QTest::mouseDClick(w->categoryView()->viewport(), Qt::LeftButton, {},
                           w->categoryView()->rowRect(w->categoryView()->controller()->focusedRow()).center());
        QCOMPARE(calls.renamed, QStringList(QStringLiteral("Familie>Familie & Co")));
        QCOMPARE(env.text(QStringLiteral("SELECT KATBEZ FROM KAT WHERE LID = 1")), QStringLiteral("Familie & Co"));
        QCOMPARE(w->focusedCategoryId(), 1);
        QVERIFY(!w->databaseError());
        w->close();
    }

    void deletingAsksTheShortOrTheLongQuestion()
    {
        CategoryTestEnv env;
        fill(env);
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        focusCategory(*w, QStringLiteral("Leer"));
        env.dialogs().enqueueAnswer(DialogButton::No);
        act(*w, "Kat_Delete")->trigger();
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Kategorie \"Leer\" löschen?"));
        QCOMPARE(env.dialogs().last().kind, DialogKind::Warning);
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM KAT")), 3);
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        act(*w, "Kat_Delete")->trigger();
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM KAT WHERE LID = 3")), 0);
        QCOMPARE(column(w->categoryView(), "KAT_KATBEZ"),
                 QStringList({ QStringLiteral("Familie"), QStringLiteral("Freunde") }));
        QVERIFY(calls.renamed.isEmpty());

        focusCategory(*w, QStringLiteral("Familie"));
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        act(*w, "Kat_Delete")->trigger();
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("Der zu löschenden Kategorie \"Familie\" sind derzeit 3\r\nKontakte zugeordnet!\r\n\r\n"
                                "Die betreffenden Kontakte werden nach dem Löschvorgang\r\nkeiner Kategorie mehr "
                                "angehören.\r\n\r\nKategorie \"Familie\" löschen?"));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONKAT WHERE CID IN (10, 11, 12)")), 0);
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONTACT")), 4);
        QCOMPARE(calls.renamed, QStringList(QStringLiteral("Familie>")));
        // The remaining category is focused and shown.
        QCOMPARE(column(w->contactView(), "KATD_CONTBEZ"), QStringList(QStringLiteral("Dora")));
        w->close();
    }

    void deletingRightAfterAKeyStepAsksAboutTheFocusedCategory()
    {
        CategoryTestEnv env;
        env.addCategory(1, QStringLiteral("Alpha"));
        env.addCategory(2, QStringLiteral("Beta"));
        env.addContact(10, QStringLiteral("Anna"), 2);
        env.addContact(11, QStringLiteral("Bert"), 2);
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        QCOMPARE(w->footerText(), QStringLiteral("Kontakte: 0"));
        QTest::keyClick(w->categoryView(), Qt::Key_Down);
        QCOMPARE(w->focusedCategoryId(), 2);
        QVERIFY(w->delayTimer()->isActive()); // the list still shows Alpha's (no) contacts
        env.dialogs().enqueueAnswer(DialogButton::No);
        act(*w, "Kat_Delete")->trigger();
        QVERIFY(env.dialogs().last().text.startsWith(
            QStringLiteral("Der zu löschenden Kategorie \"Beta\" sind derzeit 2\r\n")));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM KAT")), 2);
        w->close();
    }

    void anOpenDialogBlocksTheOthersAndAVanishedCategoryLeavesTheList()
    {
        CategoryTestEnv env;
        fill(env);
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        QStringList whileOpen;
        onNextDialog<Tkateditform>([&](Tkateditform* d) {
            for (const char* name : { "Kat_New", "Kat_Rename", "Kat_Delete" }) {
                act(*w, name)->trigger();
                whileOpen << env.dialogs().last().text;
            }
            // Meanwhile another program deletes the category being renamed.
            env.db().exec(QStringLiteral("DELETE FROM KAT WHERE LID = 1"));
            QTest::keyClicks(d->findChild<QLineEdit*>(QStringLiteral("RzE1")), QStringLiteral("2"));
            QTest::mouseClick(d->findChild<QPushButton*>(QStringLiteral("RzB1")), Qt::LeftButton);
        });
        act(*w, "Kat_Rename")->trigger();
        const QString busy = QStringLiteral("\r\nDerzeit ist noch eine Kategorie in Bearbeitung.\r\nBitte beenden Sie "
                                            "zuerst die Arbeit mit der geöffneten Kategorie.");
        QCOMPARE(whileOpen,
                 QStringList({ QStringLiteral("# CatControl - Kat_NewExecute") + busy,
                               QStringLiteral("# CatControl - Kat_RenameExecute") + busy,
                               QStringLiteral("# CatControl - Kat_DeleteExecute") + busy }));
        QVERIFY(env.dialogs().last().text.startsWith(
            QStringLiteral("# CatControl - InsertKat\r\nEs ist ein Datenbankfehler bei der Bearbeitung aufgetreten!")));
        QVERIFY(w->databaseError());
        QVERIFY(calls.renamed.isEmpty());
        QCOMPARE(column(w->categoryView(), "KAT_KATBEZ"),
                 QStringList({ QStringLiteral("Freunde"), QStringLiteral("Leer") }));
        QCOMPARE(column(w->contactView(), "KATD_CONTBEZ"), QStringList(QStringLiteral("Dora")));
        w->close();
    }

    void aContactDraggedOntoACategoryMovesThere()
    {
        CategoryTestEnv env;
        fill(env);
        env.addContact(14, QStringLiteral("Alma"), 2);
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        // Bert of Familie, onto Freunde.
        clickRow(w->contactView(), 1);
        std::unique_ptr<QMimeData> data(w->createDragData());
        QCOMPARE(w->GetDragSourceGridView(data.get()), w->contactView());
        const int freunde = rowOf(w->categoryView(), "KAT_KATBEZ", QStringLiteral("Freunde"));
        QVERIFY(dragOnto(*w, data.get(), freunde, true));
        QCOMPARE(env.count(QStringLiteral("SELECT KID FROM CONKAT WHERE CID = 11")), 2);
        QCOMPARE(calls.moved, QStringList(QStringLiteral("11>Freunde")));
        QCOMPARE(w->focusedCategoryId(), 2);
        QCOMPARE(column(w->contactView(), "KATD_CONTBEZ"),
                 QStringList({ QStringLiteral("Alma"), QStringLiteral("Bert"), QStringLiteral("Dora") }));
        // The moved contact stays marked in its new category.
        QCOMPARE(w->contactView()->controller()->focusedRow(), 1);

        // Onto its own category: the procedure still runs and the list is read again.
        const int loads = w->detailLoads();
        data.reset(w->createDragData());
        QVERIFY(dragOnto(*w, data.get(), freunde, true));
        QCOMPARE(calls.moved.last(), QStringLiteral("11>Freunde"));
        QCOMPARE(w->detailLoads(), loads);
        QCOMPARE(w->footerText(), QStringLiteral("Kontakte: 3"));

        // Anything but a row of the contact grid is refused.
        QMimeData text;
        text.setText(QStringLiteral("Bert"));
        QVERIFY(!dragOnto(*w, &text, 0, true));
        GridDragData own(w->categoryView());
        QVERIFY(!dragOnto(*w, &own, 0, true));
        QCOMPARE(calls.moved.size(), 2);
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONKAT WHERE KID = 2")), 3);
        w->close();
    }

    void aContactMovesThroughTheChoiceAndLeavesItsCategory()
    {
        CategoryTestEnv env;
        fill(env);
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        clickRow(w->contactView(), 0); // Anna
        QStringList offered;
        onNextDialog<TSelKatForm>([&](TSelKatForm* d) {
            auto* list = d->findChild<QListWidget*>(QStringLiteral("FLB1"));
            for (int i = 0; i < list->count(); ++i)
                offered << list->item(i)->text();
            list->setCurrentRow(1);
            QTest::mouseClick(d->findChild<QPushButton*>(QStringLiteral("RzB1")), Qt::LeftButton);
        });
        act(*w, "Kon_Move")->trigger();
        QCOMPARE(offered,
                 QStringList({ QStringLiteral("Familie"), QStringLiteral("Freunde"), QStringLiteral("Leer") }));
        QCOMPARE(env.count(QStringLiteral("SELECT KID FROM CONKAT WHERE CID = 10")), 2);
        QCOMPARE(calls.moved, QStringList(QStringLiteral("10>Freunde")));
        QCOMPARE(column(w->contactView(), "KATD_CONTBEZ"),
                 QStringList({ QStringLiteral("Bert"), QStringLiteral("Carl") }));

        clickRow(w->contactView(), 1); // Carl
        env.dialogs().enqueueAnswer(DialogButton::No);
        act(*w, "Kon_CutRelated")->trigger();
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("Bitte beachten Sie, dass der Kontakt nach der Durchführung\r\nkeiner Kategorie mehr "
                                "zugeordnet ist!\r\n\r\nUm einen Kontakt einer anderen Kategorie zuzuordnen, "
                                "verwenden\r\nSie bitte den Menüpunkt \"Kontakt/Kontakt in andere Kategorie\r\n"
                                "verschieben...\".\r\n\r\nKontakt \"Carl\" aus der Kategorie \"Familie\" entfernen?"));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONKAT WHERE CID = 12")), 1);
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        act(*w, "Kon_CutRelated")->trigger();
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONKAT WHERE CID = 12")), 0);
        QCOMPARE(calls.moved.last(), QStringLiteral("12>"));
        QCOMPARE(w->footerText(), QStringLiteral("Kontakte: 1"));
        QVERIFY(calls.renamed.isEmpty());
        w->close();
    }

    void pickModeHandsTheCategoryBackByDoubleClick()
    {
        CategoryTestEnv env;
        fill(env);
        Calls calls;
        auto w = manager(env, calls);
        QTimer::singleShot(50, w.get(), [&w] {
            QVERIFY(QTest::qWaitForWindowExposed(w.get()));
            GridView* v = w->categoryView();
            const int row = rowOf(v, "KAT_KATBEZ", QStringLiteral("Freunde"));
            QVERIFY(!v->rowRect(row).isEmpty());
            // A user's double click begins with a press; the test's event does not.
            clickRow(v, row);
            QTest::mouseDClick(v->viewport(), Qt::LeftButton, {}, v->rowRect(row).center());
        });
        QCOMPARE(w->execPick(), QStringLiteral("Freunde"));
        QVERIFY(!w->isVisible());
        QVERIFY(w->selectionMode());
        // Closing without "Übernehmen" hands nothing back.
        QTimer::singleShot(50, w.get(), [&w] { act(*w, "dxBB1")->trigger(); });
        QCOMPARE(w->execPick(), QString());
    }

    void boundsAndLayoutsAreKeptAndAWindowFarOffComesBack()
    {
        CategoryTestEnv env;
        fill(env);
        env.writeFile(QStringLiteral("CCStore"),
                      "[CatControl]\r\nLeft=9000\r\nTop=7000\r\nRight=9700\r\nBottom=7450\r\nMaximized=0\r\n");
        env.writeFile(QStringLiteral("CCStoreT1"), "[1\r\nColumn=\xff\xfe\r\n[1.Column.KAT_KATBEZ]\r\nWidth=abc\r\n");
        env.writeFile(QStringLiteral("CCStoreT2"), QByteArray(200, '\0'));
        Calls calls;
        auto w = manager(env, calls);
        w->show();
        const QRect screen = QGuiApplication::primaryScreen()->availableGeometry();
        QVERIFY2(screen.contains(w->geometry()), qPrintable(QStringLiteral("%1,%2").arg(w->x()).arg(w->y())));
        QCOMPARE(w->geometry().size(), QSize(700, 450));
        QCOMPARE(column(w->categoryView(), "KAT_KATBEZ").size(), 3);
        QCOMPARE(w->footerText(), QStringLiteral("Kontakte: 3"));
        // Moved near an edge, it snaps onto it once it rests.
        w->move(screen.left() + 9, screen.top() + 40);
        QTRY_COMPARE(w->pos(), QPoint(screen.left(), screen.top() + 40));
        w->close();
        IniFile bounds(env.file(QStringLiteral("CCStore")));
        QCOMPARE(bounds.readInteger(QStringLiteral("CatControl"), QStringLiteral("Right"), 0)
                     - bounds.readInteger(QStringLiteral("CatControl"), QStringLiteral("Left"), 0),
                 700);
        QVERIFY(bounds.valueExists(QStringLiteral("CatControl"), QStringLiteral("Maximized")));
        QVERIFY(IniFile(env.file(QStringLiteral("CCStoreT1"))).sectionExists(QStringLiteral("1.Column.KAT_KATBEZ")));
        QVERIFY(IniFile(env.file(QStringLiteral("CCStoreT2"))).sectionExists(QStringLiteral("1.Column.KATD_CONTBEZ")));
        QVERIFY(IniFile(env.file(QStringLiteral("BarStore")))
                    .valueExists(QStringLiteral("CatControl"), QStringLiteral("State")));
        QVERIFY(!env.dm().kat_list.isActive());
        QVERIFY(!env.dm().katdetail.isActive());
    }

    void placingSnapsToTheEdgesAndBringsWindowsBack()
    {
        const QList<QRect> screens { QRect(0, 0, 1280, 800), QRect(1280, 0, 1024, 768) };
        // Within 15 pixels of an edge: onto it.
        QCOMPARE(WindowBounds::placeOnScreens(QRect(12, 15, 400, 300), screens, 15), QRect(0, 0, 400, 300));
        QCOMPARE(WindowBounds::placeOnScreens(QRect(16, 16, 400, 300), screens, 15), QRect(16, 16, 400, 300));
        QCOMPARE(WindowBounds::placeOnScreens(QRect(870, 490, 400, 300), screens, 15), QRect(880, 500, 400, 300));
        // Mostly on the second screen: it stays there, wholly.
        QCOMPARE(WindowBounds::placeOnScreens(QRect(1200, 100, 400, 300), screens, 15), QRect(1280, 100, 400, 300));
        // Moved by the user: only the snapping, a window partly off the screen stays so.
        QCOMPARE(WindowBounds::snapToEdges(QRect(-8, 40, 400, 300), screens, 15), QRect(0, 40, 400, 300));
        QCOMPARE(WindowBounds::snapToEdges(QRect(-100, 40, 400, 300), screens, 15), QRect(-100, 40, 400, 300));
        // Far off every screen: onto the nearest, and no larger than it.
        QCOMPARE(WindowBounds::placeOnScreens(QRect(-5000, 300, 2000, 300), screens, 15), QRect(0, 300, 1280, 300));
    }
};

ORVANTA_TEST(TestCatControl)
#include "tst_catcontrol.moc"
