#include "app/MainWindowFeatures.h"
#include "app/TLogform.h"
#include "categories/CategoryDialogs.h"
#include "categories/TCatControl.h"
#include "contacts/Tcontacteditform.h"
#include "contacts/Tcontactlistframe.h"
#include "tests/app/AppTestEnv.h"
#include "tests/categories/DialogDriver.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridView.h"

#include <QAction>
#include <QApplication>
#include <QDropEvent>
#include <QLineEdit>
#include <QPushButton>
#include <QTest>
#include <QToolButton>

using namespace orvanta;
using orvanta::test::AppTestEnv;
using orvanta::test::onNextDialog;

namespace {

QAction* act(const QObject& w, const char* name)
{
    return w.findChild<QAction*>(QLatin1String(name));
}

TCatControl* managerOf(const TLogform& w)
{
    const QList<TCatControl*> all = w.findChildren<TCatControl*>();
    return all.size() == 1 ? all.first() : nullptr;
}

int rowOf(const GridView* view, const QString& name)
{
    const GridController* g = view->controller();
    for (int row = 0; row < g->rowCount(); ++row)
        if (g->displayText(row, g->columnByName(u"KAT_KATBEZ")) == name)
            return row;
    return -1;
}

QString category(const Tcontacteditform* form)
{
    return form->findChild<QLineEdit*>(QStringLiteral("RzButtonEdit1"))->text();
}

void fill(AppTestEnv& env)
{
    env.db().exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Familie');\n"
                                 "INSERT INTO KAT (LID, KATBEZ) VALUES (2, 'Freunde');\n"
                                 "INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (5, 'Anna', 'Anna');\n"
                                 "INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (6, 'Bert', 'Bert');\n"
                                 "INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (7, 'Carl', 'Carl');\n"
                                 "INSERT INTO CONKAT (LID, CID, KID) VALUES (50, 5, 1);\n"
                                 "INSERT INTO CONKAT (LID, CID, KID) VALUES (60, 6, 1);\n"
                                 "SET GENERATOR GEN_KAT_ID TO 100;\n"
                                 "SET GENERATOR GEN_CONKAT_ID TO 100;\n"));
}

} // namespace

class TestCategoriesFeature final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void theMenuShowsOneManagerAndItsRenameReachesOpenEditWindows()
    {
        AppTestEnv env;
        fill(env);
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        act(w, "dxBB_Ansicht_Kontakte")->trigger();
        QCOMPARE(w.CreateConDataEdit(5, 0), 0);
        QCOMPARE(w.CreateConDataEdit(6, 0), 1);
        auto* anna = qobject_cast<Tcontacteditform*>(w.editWindows().at(0));
        auto* bert = qobject_cast<Tcontacteditform*>(w.editWindows().at(1));
        QCOMPARE(category(anna), QStringLiteral("Familie"));

        w.updateActions();
        QVERIFY(act(w, "_LogFo_KatVerw")->isEnabled());
        act(w, "_LogFo_KatVerw")->trigger();
        TCatControl* manager = managerOf(w);
        QVERIFY(manager);
        QVERIFY(manager->isVisible());
        act(w, "_LogFo_KatVerw")->trigger();
        QCOMPARE(managerOf(w), manager);

        QCOMPARE(manager->focusedCategoryId(), 1);
        onNextDialog<Tkateditform>([](Tkateditform* d) {
            auto* name = d->findChild<QLineEdit*>(QStringLiteral("RzE1"));
            name->selectAll();
            QTest::keyClicks(name, QStringLiteral("Verwandte"));
            QTest::mouseClick(d->findChild<QPushButton*>(QStringLiteral("RzB1")), Qt::LeftButton);
        });
        act(*manager, "Kat_Rename")->trigger();
        // Both open windows of that category show the new name, neither counts as changed.
        QCOMPARE(category(anna), QStringLiteral("Verwandte"));
        QCOMPARE(category(bert), QStringLiteral("Verwandte"));
        QVERIFY(!anna->Modified());
        QVERIFY(!bert->Modified());
        auto* list = qobject_cast<Tcontactlistframe*>(w.contactFrame());
        const GridController* g = list->controller();
        QCOMPARE(g->cellText(static_cast<quint32>(g->locate(5)), g->columnByField(u"KATBEZ")),
                 QStringLiteral("Verwandte"));

        // Dragging Anna to Freunde: her window follows, Bert's stays.
        GridView* contacts = manager->contactView();
        contacts->controller()->setFocusedRow(0);
        std::unique_ptr<QMimeData> data(manager->createDragData());
        const QPoint at
            = manager->categoryView()->rowRect(rowOf(manager->categoryView(), QStringLiteral("Freunde"))).center();
        QDragEnterEvent enter(at, Qt::MoveAction, data.get(), Qt::LeftButton, {});
        QApplication::sendEvent(manager->categoryView()->viewport(), &enter);
        QDragMoveEvent move(at, Qt::MoveAction, data.get(), Qt::LeftButton, {});
        QApplication::sendEvent(manager->categoryView()->viewport(), &move);
        QVERIFY(move.isAccepted());
        QDropEvent drop(QPointF(at), Qt::MoveAction, data.get(), Qt::LeftButton, {});
        QApplication::sendEvent(manager->categoryView()->viewport(), &drop);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT KID FROM CONKAT WHERE CID = 5")).toInt(), 2);
        QCOMPARE(category(anna), QStringLiteral("Freunde"));
        QCOMPARE(category(bert), QStringLiteral("Verwandte"));
        QCOMPARE(g->cellText(static_cast<quint32>(g->locate(5)), g->columnByField(u"KATBEZ")),
                 QStringLiteral("Freunde"));

        QPointer<TCatControl> open = manager;
        act(*manager, "dxBB1")->trigger();
        QTRY_VERIFY(open.isNull());
    }

    void theCategoryButtonPicksInTheManager()
    {
        AppTestEnv env;
        fill(env);
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        QCOMPARE(w.CreateConDataEdit(7, 0), 0);
        auto* carl = qobject_cast<Tcontacteditform*>(w.editWindows().at(0));
        QVERIFY(carl);
        carl->show();
        QCOMPARE(category(carl), QString());
        // The manager is open already: the pick replaces it.
        act(w, "_LogFo_KatVerw")->trigger();
        QPointer<TCatControl> open = managerOf(w);
        QVERIFY(open);

        bool pickMode = false;
        QTimer::singleShot(50, &w, [&pickMode] {
            auto* picker = qobject_cast<TCatControl*>(QApplication::activeModalWidget());
            QVERIFY(picker);
            pickMode = picker->selectionMode() && act(*picker, "Kat_Move")->isEnabled();
            GridView* v = picker->categoryView();
            const QPoint at = v->rowRect(rowOf(v, QStringLiteral("Freunde"))).center();
            QTest::mouseClick(v->viewport(), Qt::LeftButton, {}, at);
            QTest::mouseDClick(v->viewport(), Qt::LeftButton, {}, at);
        });
        auto* button = carl->findChild<QAbstractButton*>(QStringLiteral("RzButtonEdit1Button"));
        QVERIFY(button);
        button->click();
        QVERIFY(pickMode);
        QTRY_VERIFY(open.isNull());
        QCOMPARE(category(carl), QStringLiteral("Freunde"));
        QVERIFY(carl->Modified());
        act(*carl, "conedit_uebern")->trigger();
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT KID FROM CONKAT WHERE CID = 7")).toInt(), 2);
    }
};

ORVANTA_TEST(TestCategoriesFeature)
#include "tst_categoriesfeature.moc"
