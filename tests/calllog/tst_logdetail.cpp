#include "calllog/NoticeForms.h"
#include "calllog/TLogDetailForm.h"
#include "tests/calllog/LogTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/markup/MarkupPanel.h"

#include <QAction>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QTabWidget>
#include <QTest>

using namespace orvanta;
using orvanta::test::LogTestEnv;

namespace {

QString vl(const TLogDetailForm& w, int n)
{
    return w.findChild<QLabel*>(QStringLiteral("VL%1").arg(n))->text();
}

QLineEdit* edit(const TLogDetailForm& w)
{
    return w.findChild<QLineEdit*>(QStringLiteral("RzE1"));
}

bool saveEnabled(const TLogDetailForm& w)
{
    const bool ok = w.findChild<QAction*>(QStringLiteral("logdetail_OK"))->isEnabled();
    const bool uebern = w.findChild<QAction*>(QStringLiteral("logdetail_uebern"))->isEnabled();
    // The buttons follow their actions.
    if (w.findChild<QPushButton*>(QStringLiteral("RzB1"))->isEnabled() != ok
        || w.findChild<QPushButton*>(QStringLiteral("RzB2"))->isEnabled() != uebern || ok != uebern)
        return !ok; // a mismatch fails every comparison below
    return ok;
}

void click(const TLogDetailForm& w, const char* button)
{
    QTest::mouseClick(w.findChild<QPushButton*>(QLatin1String(button)), Qt::LeftButton);
}

// A detail window on one call, shown as the host shows it.
std::unique_ptr<TLogDetailForm> openWindow(LogTestEnv& env, int lid, int tag = 3)
{
    auto w = std::make_unique<TLogDetailForm>(&env.dm(), lid);
    w->setHostWindow(&env.host());
    w->setTag(tag);
    w->show();
    return w;
}

QVariant remarkOf(LogTestEnv& env, int lid)
{
    return env.db().scalar(QStringLiteral("SELECT BEMERK FROM LOG WHERE LID = %1").arg(lid));
}

void addFullCall(LogTestEnv& env)
{
    env.db().exec(QStringLiteral(
        "INSERT INTO LOG (LID, SERVICE, FROMPHONE, FROMBEZ, FROMSUBB, ONMSN, ONBEZ, STATUS, TSDATE, TSTIME, BEMERK, "
        "CTYPE, CTIME, CCHARGE, ABID, REGION, FROM2, FROMANSCHLUSS, NTYPE, NPLAN, PRESENT, B1, B2, B3) VALUES "
        "(10, 1, '0301234', 'Meier, Hans', '', '4711', 'Büro', 'angenommen', '2024-05-14', '17:05:33', 'alt', "
        "1, '00:02:07', 0.36, 0, 'Berlin', NULL, 'ISDN', 2, 1, 0, 1, 0, 0)"));
}

} // namespace

class TstLogDetail final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void showsEveryDetail();
    void emptyDateAndUnknownDirection();
    void saveActionsFollowTheRemark();
    void cancelAsksOnlyWhenChanged();
    void enterSavesAndEscapeCancels();
    void failedLoadLocksTheSaves();
    void recordDeletedWhileOpen();
    void databaseGoneWhileEditing();
    void showsTheCallItWasGiven();
    void noticeDialogs();
};

void TstLogDetail::showsEveryDetail()
{
    LogTestEnv env;
    addFullCall(env);
    auto w = openWindow(env, 10);
    QCOMPARE(w->windowTitle(), QStringLiteral("Bemerkung/Detailinformationen"));
    QCOMPARE(vl(*w, 1), QStringLiteral("14.05.2024 - 17:05"));
    QCOMPARE(vl(*w, 2), QStringLiteral("Berlin"));
    QCOMPARE(vl(*w, 3), QStringLiteral("Meier, Hans"));
    QCOMPARE(vl(*w, 4), QStringLiteral("0301234"));
    QCOMPARE(vl(*w, 5), QStringLiteral("-")); // null
    QCOMPARE(vl(*w, 6), QStringLiteral("-")); // empty
    QCOMPARE(vl(*w, 7), QStringLiteral("Büro"));
    QCOMPARE(vl(*w, 8), QStringLiteral("4711"));
    QCOMPARE(vl(*w, 9), QStringLiteral("ISDN"));
    QCOMPARE(vl(*w, 17), QStringLiteral("angenommen"));
    QCOMPARE(vl(*w, 10), QStringLiteral("Sprachanruf"));
    QCOMPARE(vl(*w, 11), QStringLiteral("2"));
    QCOMPARE(vl(*w, 13), QStringLiteral("0"));
    QCOMPARE(vl(*w, 18), QStringLiteral("Ausgang"));
    QCOMPARE(vl(*w, 19), QStringLiteral("00:02:07"));
    const QLocale locale = QLocale::system();
    QCOMPARE(vl(*w, 20), locale.toCurrencyString(0.36, locale.currencySymbol(), 2));
    QCOMPARE(edit(*w)->text(), QStringLiteral("alt"));
    QCOMPARE(edit(*w)->maxLength(), 50);
    QCOMPARE(w->savedRemark(), QStringLiteral("alt"));
    QCOMPARE(w->findChild<QTabWidget*>(QStringLiteral("AdvPageControl1"))->currentIndex(), 0);
    QVERIFY(!saveEnabled(*w));
    // The detail transaction is ended after loading.
    QVERIFY(!env.dm().LogDetailTS.isActive());
    QCOMPARE(env.dialogs().count(), 0);
}

void TstLogDetail::emptyDateAndUnknownDirection()
{
    LogTestEnv env;
    env.db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, CTYPE, SERVICE) VALUES (5, NULL, '08:30:00', 2, 77)"));
    auto w = openWindow(env, 5);
    QCOMPARE(vl(*w, 1), QStringLiteral("??.??.???? - 08:30"));
    QCOMPARE(vl(*w, 18), QStringLiteral("-"));
    QCOMPARE(vl(*w, 10), QStringLiteral("-")); // a code without a name
    QCOMPARE(vl(*w, 3), QStringLiteral("-"));
    QVERIFY(edit(*w)->text().isEmpty());
    QVERIFY(!w->savesLocked());
}

void TstLogDetail::saveActionsFollowTheRemark()
{
    LogTestEnv env;
    addFullCall(env);
    auto w = openWindow(env, 10);
    QLineEdit* e = edit(*w);

    e->setText(QStringLiteral("neu"));
    QVERIFY(saveEnabled(*w));
    e->setText(QStringLiteral("alt")); // typed back: nothing to save
    QVERIFY(!saveEnabled(*w));

    e->setText(QStringLiteral("erste Änderung"));
    click(*w, "RzB2"); // Übernehmen
    QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("erste Änderung"));
    env.host().flush();
    QCOMPARE(env.host().of(WMLOGINFOCHANGE).size(), 1);
    QCOMPARE(env.host().of(WMLOGINFOCHANGE).first().wParam, 10);
    QCOMPARE(env.host().of(WMLOGINFOCHANGE).first().lParam, 1);
    QVERIFY(w->isVisible());
    QVERIFY(!saveEnabled(*w));
    QVERIFY(!env.dm().LogDetailTS.isActive());

    // After a save the remark can be edited and saved again.
    e->setText(QStringLiteral("zweite Änderung"));
    QVERIFY(saveEnabled(*w));
    click(*w, "RzB1"); // OK
    QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("zweite Änderung"));
    QVERIFY(!w->isVisible());
    env.host().flush();
    QCOMPARE(env.host().of(WMCLOSELOGDETAILFORM).size(), 1);
    QCOMPARE(env.host().of(WMCLOSELOGDETAILFORM).first().wParam, 3);
    QCOMPARE(env.dialogs().count(), 0);

    // More than 50 characters cannot be typed; 50 are saved.
    auto w2 = openWindow(env, 10);
    edit(*w2)->clear();
    QTest::keyClicks(edit(*w2), QString(60, QLatin1Char('x')));
    QCOMPARE(edit(*w2)->text().size(), 50);
    click(*w2, "RzB2");
    QCOMPARE(remarkOf(env, 10).toString(), QString(50, QLatin1Char('x')));
}

void TstLogDetail::cancelAsksOnlyWhenChanged()
{
    LogTestEnv env;
    addFullCall(env);
    {
        auto w = openWindow(env, 10);
        click(*w, "RzB3");
        QCOMPARE(env.dialogs().count(), 0);
        QVERIFY(!w->isVisible());
    }
    {
        // "Nein": closes without saving.
        auto w = openWindow(env, 10);
        edit(*w)->setText(QStringLiteral("verworfen"));
        env.dialogs().enqueueAnswer(DialogButton::No);
        click(*w, "RzB3");
        QCOMPARE(env.dialogs().count(), 1);
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Änderungen speichern?"));
        QCOMPARE(env.dialogs().last().kind, DialogKind::Question);
        QCOMPARE(env.dialogs().last().buttons, DialogButton::Yes | DialogButton::No);
        QVERIFY(!w->isVisible());
        QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("alt"));
    }
    {
        // "Ja" after an earlier save: the new text is really saved.
        auto w = openWindow(env, 10);
        edit(*w)->setText(QStringLiteral("zuerst"));
        click(*w, "RzB2");
        edit(*w)->setText(QStringLiteral("danach"));
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        click(*w, "RzB3");
        QCOMPARE(env.dialogs().count(), 2);
        QVERIFY(!w->isVisible());
        QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("danach"));
    }
}

void TstLogDetail::enterSavesAndEscapeCancels()
{
    LogTestEnv env;
    addFullCall(env);
    {
        // Enter in the remark field saves and closes, like "OK".
        auto w = openWindow(env, 10);
        edit(*w)->setFocus();
        edit(*w)->setText(QStringLiteral("per Enter"));
        QTest::keyClick(edit(*w), Qt::Key_Return);
        QVERIFY(!w->isVisible());
        QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("per Enter"));
        QCOMPARE(env.dialogs().count(), 0);
    }
    {
        // Nothing changed: Enter just closes.
        auto w = openWindow(env, 10);
        QTest::keyClick(edit(*w), Qt::Key_Enter);
        QVERIFY(!w->isVisible());
        QCOMPARE(env.dialogs().count(), 0);
    }
    {
        // Escape is "Abbrechen": it asks about the change, and "Nein" keeps the stored text.
        auto w = openWindow(env, 10);
        edit(*w)->setText(QStringLiteral("verworfen"));
        env.dialogs().enqueueAnswer(DialogButton::No);
        QTest::keyClick(edit(*w), Qt::Key_Escape);
        QCOMPARE(env.dialogs().count(), 1);
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Änderungen speichern?"));
        QVERIFY(!w->isVisible());
        QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("per Enter"));
    }
}

void TstLogDetail::failedLoadLocksTheSaves()
{
    LogTestEnv env;
    addFullCall(env);
    {
        auto w = openWindow(env, 0);
        QVERIFY(w->savesLocked());
        edit(*w)->setText(QStringLiteral("x"));
        QVERIFY(!saveEnabled(*w));
        QCOMPARE(vl(*w, 1), QStringLiteral("-"));
        QVERIFY(env.errorLogText().contains(
            QStringLiteral("# LogDetailForm - Show\r\nDie Detaildaten konnten nicht ermittelt werden.")));
        // Asked, but there is nothing it could save to.
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        click(*w, "RzB3");
        QVERIFY(!w->isVisible());
    }
    auto w = openWindow(env, 999);
    QVERIFY(w->savesLocked());
    QVERIFY(env.errorLogText().contains(
        QStringLiteral("# LogDetailForm - GetLogDSData\r\nDer Datensatz konnte nicht ermittelt werden.")));
    QVERIFY(!env.dm().LogDetailTS.isActive());
    QCOMPARE(env.dialogs().count(), 1);
}

void TstLogDetail::recordDeletedWhileOpen()
{
    LogTestEnv env;
    addFullCall(env);
    auto w = openWindow(env, 10);
    env.db().exec(QStringLiteral("DELETE FROM LOG WHERE LID = 10"));
    edit(*w)->setText(QStringLiteral("zu spät"));
    click(*w, "RzB1");
    // Nothing was saved and the user is told; the window and the text stay.
    QVERIFY(w->isVisible());
    QCOMPARE(edit(*w)->text(), QStringLiteral("zu spät"));
    QVERIFY(saveEnabled(*w));
    QCOMPARE(env.dialogs().count(), 1);
    QVERIFY(env.dialogs().last().text.contains(QStringLiteral("Der Protokolleintrag existiert nicht mehr.")));
    env.host().flush();
    QVERIFY(env.host().of(WMLOGINFOCHANGE).isEmpty());
    QVERIFY(!env.dm().LogDetailTS.isActive());
}

void TstLogDetail::databaseGoneWhileEditing()
{
    LogTestEnv env;
    addFullCall(env);
    auto w = openWindow(env, 10);
    edit(*w)->setText(QStringLiteral("ungespeichert"));
    env.dm().IBDatabase1.disconnect();
    click(*w, "RzB1");
    QVERIFY(w->isVisible());
    QCOMPARE(env.dialogs().count(), 1);
    QCOMPARE(env.dialogs().last().text, QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!"));
    QVERIFY(saveEnabled(*w));
    // "Abbrechen" still asks, and a save that cannot happen keeps the window open.
    env.dialogs().enqueueAnswer(DialogButton::Yes);
    click(*w, "RzB3");
    QVERIFY(w->isVisible());
    QCOMPARE(edit(*w)->text(), QStringLiteral("ungespeichert"));
    env.host().flush();
    QVERIFY(env.host().of(WMCLOSELOGDETAILFORM).isEmpty());
}

void TstLogDetail::showsTheCallItWasGiven()
{
    LogTestEnv env;
    addFullCall(env);
    env.addCall(11, "'2024-05-15'", "'09:00:00'", "'Schulz'", "'0402222'");
    env.dm().CurLogLID = 11; // the log list has another call focused
    {
        auto w = openWindow(env, 10);
        QCOMPARE(w->logId(), 10);
        QCOMPARE(vl(*w, 3), QStringLiteral("Meier, Hans"));
        edit(*w)->setText(QStringLiteral("neu"));
        click(*w, "RzB2");
        QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("neu"));
        QVERIFY(remarkOf(env, 11).isNull());
    }
    // Without a data module there is no connection: reported, nothing shown, nothing to save.
    TLogDetailForm w(nullptr, 10);
    w.setHostWindow(&env.host());
    w.show();
    QCOMPARE(env.dialogs().last().text, QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!"));
    QVERIFY(w.savesLocked());
    QCOMPARE(vl(w, 3), QStringLiteral("-"));
    QVERIFY(!w.SetBemerkung());
    QCOMPARE(remarkOf(env, 10).toString(), QStringLiteral("neu"));
}

void TstLogDetail::noticeDialogs()
{
    LogTestEnv env;
    {
        THinweisForm f;
        QCOMPARE(f.windowTitle(), QStringLiteral("Hinweis"));
        QCOMPARE(f.heading(), QStringLiteral("Hinweis zur Kontaktbezeichnung:"));
        QVERIFY(f.windowFlags().testFlag(Qt::WindowStaysOnTopHint));
        QVERIFY(f.textPanel()->text().startsWith(QStringLiteral("Sie können die Vorgabe übernehemen")));
        QVERIFY(f.textPanel()->document()->toPlainText().contains(QStringLiteral("'Firma / Name, Vorname'")));
        QTimer::singleShot(0, &f, [&f] { f.findChild<QPushButton*>(QStringLiteral("RzButton2"))->click(); });
        QCOMPARE(f.exec(), int(QDialog::Accepted));
    }
    THinwAutoAblehnForm f;
    QCOMPARE(f.heading(), QStringLiteral("Hinweis zum automatischen Ablehnen:"));
    const QString plain = f.textPanel()->document()->toPlainText();
    QVERIFY(plain.contains(QStringLiteral("auch \"hartes Ablehnen\" genannt.")));
    QVERIFY(!plain.contains(QStringLiteral("<BR>")));
    QTimer::singleShot(0, &f, [&f] { f.findChild<QPushButton*>(QStringLiteral("RzButton2"))->click(); });
    f.exec();
    QVERIFY(!f.isVisible());
}

ORVANTA_TEST(TstLogDetail)
#include "tst_logdetail.moc"
