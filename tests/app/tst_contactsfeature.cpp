#include "app/MainWindowFeatures.h"
#include "app/TLogform.h"
#include "contacts/Tcontactlistframe.h"
#include "tests/app/AppTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/navbar/AdvNavBar.h"

#include <QAction>
#include <QCheckBox>
#include <QRadioButton>
#include <QTest>

using namespace orvanta;
using orvanta::test::AppTestEnv;

namespace {

QAction* act(const TLogform& w, const char* name)
{
    return w.findChild<QAction*>(QLatin1String(name));
}

int contactCount(AppTestEnv& env)
{
    DataSet& q = env.dm().GetDetailQuery;
    q.close();
    q.setCommandText(QStringLiteral("SELECT LID FROM CONTACT"));
    q.open();
    const int n = q.rowCount();
    q.close();
    return n;
}

} // namespace

class TestContactsFeature final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void theContactsPageShowsTheListAndDeletesAfterAsking()
    {
        AppTestEnv env;
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (1, 'Anna', 'Anna \"A\"')"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (2, 'Bernd', 'Bernd')"));
        env.db().exec(QStringLiteral("INSERT INTO COM (LID, CID, NUMBER) VALUES (1, 1, '1234')"));
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        act(w, "dxBB_Ansicht_Kontakte")->trigger();
        QCOMPARE(w.navBar()->activeTabIndex(), int(TLogform::TabContacts));
        auto* frame = qobject_cast<Tcontactlistframe*>(w.contactFrame());
        QVERIFY(frame);
        QVERIFY(frame->isConnected());
        QCOMPARE(frame->footerText(), QStringLiteral(" Kontakte: 2"));

        // A letter without contacts: nothing focused, edit and delete stay off.
        frame->SetNewFilter(26);
        QCOMPARE(frame->GetSelectedLID(), -1);
        w.updateActions();
        QVERIFY(!act(w, "_LogFo_ContDel")->isEnabled());
        QVERIFY(act(w, "_LogFo_ContNew")->isEnabled());

        frame->SetNewFilter(0);
        frame->controller()->setFocusedRow(0);
        QCOMPARE(frame->GetSelectedLID(), 1);
        w.updateActions();
        QVERIFY(act(w, "_LogFo_ContDel")->isEnabled());

        // No: nothing happens.
        env.dialogs().enqueueAnswer(DialogButton::No);
        frame->executeAction(QStringLiteral("cv_deletecont"));
        QTRY_COMPARE(env.dialogs().count(), 1);
        QCOMPARE(env.dialogs().texts().last(), QStringLiteral("Soll der Kontakt \"Anna \"A\"\" gelöscht werden?"));
        QCOMPARE(contactCount(env), 2);

        // Yes: the contact and its numbers go, the list follows.
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        frame->executeAction(QStringLiteral("cv_deletecont"));
        QTRY_COMPARE(env.dialogs().count(), 2);
        QTRY_COMPARE(frame->footerText(), QStringLiteral(" Kontakte: 1"));
        QCOMPARE(contactCount(env), 1);
    }
};

ORVANTA_TEST(TestContactsFeature)
#include "tst_contactsfeature.moc"
