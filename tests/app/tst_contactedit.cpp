#include "app/ContactEditFeature.h"
#include "app/MainWindowFeatures.h"
#include "app/TLogform.h"
#include "calllog/Tlogframe.h"
#include "contacts/Tcontacteditform.h"
#include "contacts/Tcontactlistframe.h"
#include "phone/TvkMiniKontakt.h"
#include "tests/app/AppTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "tests/support/TypeKeys.h"
#include "ui/grid/GridController.h"

#include <QAction>
#include <QApplication>
#include <QKeyEvent>
#include <QLineEdit>
#include <QTableWidget>
#include <QTest>

using namespace orvanta;
using orvanta::test::typeKeys;
using orvanta::test::AppTestEnv;

namespace {

QAction* act(const QObject& w, const char* name)
{
    return w.findChild<QAction*>(QLatin1String(name));
}

Tcontacteditform* editWindow(TLogform& w, int slot)
{
    return qobject_cast<Tcontacteditform*>(w.editWindows().at(slot));
}

QString logCaller(const TLogform& w, int lid)
{
    const auto* f = qobject_cast<const Tlogframe*>(w.logFrame());
    if (!f)
        return QStringLiteral("<no log>");
    const GridController* g = f->controller();
    const int record = g->locate(lid);
    return record < 0 ? QStringLiteral("<none>")
                      : g->cellText(static_cast<quint32>(record), g->columnByName(QStringLiteral("cxGrid1DBTableView1FROMBEZ")));
}

void typeInto(Tcontacteditform* form, const char* field, const QString& text)
{
    auto* e = form->findChild<QLineEdit*>(QLatin1String(field));
    e->setFocus();
    typeKeys(e, text);
}

const QString kRelinkQuestion = QStringLiteral("Möchten Sie die Logbucheinträge der übergebene\r\nRufnummer "
                                               "\"0891234567\"\r\nmit dem neuen Kontakt verknüpfen?");

} // namespace

class TestContactEdit final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void aCallerBecomesAContactAndTheLogShowsTheNameAfterYes()
    {
        AppTestEnv env;
        env.addCall(17, QStringLiteral("2024-05-15"), QStringLiteral("0891234567"), QStringLiteral("0891234567"));
        env.addCall(18, QStringLiteral("2024-05-14"), QStringLiteral("0891234567"), QStringLiteral("0891234567"));
        env.addCall(19, QStringLiteral("2024-05-14"), QStringLiteral("0301111"), QStringLiteral("0301111"));
        TLogform& w = env.window({QStringLiteral("/co-17")}, defaultMainWindowFeatures());
        w.show();
        QTRY_VERIFY(editWindow(w, 0));
        Tcontacteditform* form = editWindow(w, 0);
        QTRY_VERIFY(form->isVisible());
        QCOMPARE(form->NewNumber(), QStringLiteral("0891234567"));
        // No area codes in this program folder: the number stays whole, the NUMBEROF form.
        auto* grid = form->findChild<QTableWidget*>(QStringLiteral("SG1"));
        QCOMPARE(grid->item(0, 4)->text(), QStringLiteral("0891234567"));
        QTRY_COMPARE(logCaller(w, 17), QStringLiteral("0891234567"));

        typeInto(form, "RzEdit3", QStringLiteral("Huber"));
        typeInto(form, "RzEdit2", QStringLiteral("Anna"));
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        act(*form, "conedit_ok")->trigger();
        QCOMPARE(env.dialogs().count(), 1);
        QCOMPARE(env.dialogs().last().text, kRelinkQuestion);
        const int lid = env.db().scalar(QStringLiteral("SELECT LID FROM CONTACT")).toInt();
        QVERIFY(lid > 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG WHERE CID = %1").arg(lid)).toInt(), 2);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT FROMANSCHLUSS FROM LOG WHERE LID = 18")).toString(),
                 QStringLiteral("Telefon"));
        QTRY_COMPARE(logCaller(w, 17), QStringLiteral("Huber, Anna"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT CID FROM LOG WHERE LID = 19")).toInt(), 0);
        // The window closed and the main window freed it and its record.
        QTRY_VERIFY(w.editWindows().allFree());
        QVERIFY(w.contactRecords().allFree());
    }

    void aSaveThatBreaksOffHalfWayLeavesNoContactAndKeepsTheWindow()
    {
        AppTestEnv env;
        env.addCall(17, QStringLiteral("2024-05-15"), QStringLiteral("0891234567"), QStringLiteral("0891234567"));
        // The database gives up after the contact row and the caller's number, at the second number.
        env.db().exec(QStringLiteral("CREATE EXCEPTION E_GONE 'Verbindung abgebrochen';\n"
                                     "SET TERM ^ ;\n"
                                     "CREATE TRIGGER T_GONE FOR COM BEFORE INSERT AS BEGIN\n"
                                     "  IF (NEW.KOMMBEZ = 'Zweite') THEN EXCEPTION E_GONE;\n"
                                     "END^\n"
                                     "SET TERM ; ^\n"));
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        sendMessage(&w, WMCONTACTDATAFROMSCREEN, 17, 0);
        Tcontacteditform* form = editWindow(w, 0);
        QVERIFY(form);
        TvkMiniKontakt* record = w.contactRecords().at(form->DataIndex());
        TvkKommItem second;
        second.KOMMBEZ = QStringLiteral("Zweite");
        second.NUMBER = QStringLiteral("555");
        second.status = EntryStatus::New;
        record->AddKD(second);
        typeInto(form, "RzEdit3", QStringLiteral("Halb"));
        act(*form, "conedit_ok")->trigger();
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Orvanta - InsertConData\r\n")));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM CONTACT")).toInt(), 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM COM")).toInt(), 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT CID FROM LOG WHERE LID = 17")).toInt(), 0);
        QVERIFY(form->isVisible());
        QVERIFY(form->SaveLocked());
        QVERIFY(!act(*form, "conedit_ok")->isEnabled());
        QVERIFY(!act(*form, "conedit_uebern")->isEnabled());
        QCOMPARE(form->findChild<QLineEdit*>(QStringLiteral("RzEdit3"))->text(), QStringLiteral("Halb"));
        QCOMPARE(record->KD().size(), 2);
        QCOMPARE(record->LID(), 0);
    }

    void answeringNoLeavesTheLogUntilTheCallerIsOfferedAgain()
    {
        AppTestEnv env;
        env.addCall(17, QStringLiteral("2024-05-15"), QStringLiteral("0891234567"), QStringLiteral("0891234567"));
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        sendMessage(&w, WMCONTACTDATAFROMSCREEN, 17, 0);
        Tcontacteditform* form = editWindow(w, 0);
        QVERIFY(form);
        typeInto(form, "RzEdit4", QStringLiteral("ACME"));
        env.dialogs().enqueueAnswer(DialogButton::No);
        act(*form, "conedit_uebern")->trigger();
        QCOMPARE(env.dialogs().last().text, kRelinkQuestion);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT CID FROM LOG WHERE LID = 17")).toInt(), 0);
        QCOMPARE(form->EditMode(), 1);
        act(*form, "conedit_exit")->trigger();
        QTRY_VERIFY(w.editWindows().allFree());

        // The number now belongs to a contact: no window, only the offer to relink.
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        sendMessage(&w, WMCONTACTDATAFROMSCREEN, 17, 0);
        QVERIFY(w.editWindows().allFree());
        QVERIFY(env.dialogs().texts().contains(QStringLiteral("Logbucheinträge wurden angepasst.")));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT FROMBEZ FROM LOG WHERE LID = 17")).toString(),
                 QStringLiteral("ACME"));
    }

    void newAndEditOpenOneWindowPerContactAndRefreshTheList()
    {
        AppTestEnv env;
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (5, 'Bernd', 'Bernd')"));
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        act(w, "dxBB_Ansicht_Kontakte")->trigger();
        auto* list = qobject_cast<Tcontactlistframe*>(w.contactFrame());
        QVERIFY(list);
        QCOMPARE(list->footerText(), QStringLiteral(" Kontakte: 1"));

        list->controller()->setFocusedRow(0);
        w.updateActions();
        act(w, "_LogFo_ContEdit")->trigger();
        Tcontacteditform* bernd = editWindow(w, 0);
        QVERIFY(bernd);
        QCOMPARE(bernd->findChild<QLineEdit*>(QStringLiteral("RzEdit3"))->text(), QStringLiteral("Bernd"));
        QCOMPARE(w.CreateConDataEdit(5, 0), -1); // brought forward, not opened twice
        QCOMPARE(w.editWindows().size(), 1);
        QVERIFY(bernd->isVisible());

        // Deleting a contact that is being edited is refused.
        act(w, "_LogFo_ContDel")->trigger();
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("Der zum Löschen ausgewählte Kontakt ist derzeit\r\nnoch in Bearbeitung."));

        act(w, "_LogFo_ContNew")->trigger();
        Tcontacteditform* fresh = editWindow(w, 1);
        QVERIFY(fresh);
        typeInto(fresh, "RzEdit4", QStringLiteral("Zeta GmbH"));
        act(*fresh, "conedit_ok")->trigger();
        QTRY_COMPARE(list->footerText(), QStringLiteral(" Kontakte: 2"));
        QTRY_VERIFY(!w.editWindows().at(1));

        typeInto(bernd, "RzEdit2", QStringLiteral("Ernie"));
        act(*bernd, "conedit_uebern")->trigger();
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT CONTBEZ FROM CONTACT WHERE LID = 5")).toString(),
                 QStringLiteral("Bernd, Ernie"));
        QCOMPARE(list->GetSelectedLID(), 5);

        // The category manager's changes reach the open window of the contact.
        ChangeRelatedKontKat(w, 5, QStringLiteral("Freunde"));
        QCOMPARE(bernd->findChild<QLineEdit*>(QStringLiteral("RzButtonEdit1"))->text(), QStringLiteral("Freunde"));
        HasRenameKatBez(w, QStringLiteral("Freunde"), QStringLiteral("Gute Freunde"));
        QCOMPARE(bernd->findChild<QLineEdit*>(QStringLiteral("RzButtonEdit1"))->text(), QStringLiteral("Gute Freunde"));
        QVERIFY(!bernd->Modified());

        // Closing the main window with an edit window open frees it with everything else.
        QPointer<Tcontacteditform> open = bernd;
        w.close();
        QTRY_VERIFY(open.isNull());
    }
};

ORVANTA_TEST(TestContactEdit)
#include "tst_contactedit.moc"
