#include "calllog/LogMaintenance.h"
#include "calllog/Tlogframe.h"
#include "phone/PhoneNumbers.h"
#include "tests/calllog/LogTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/calendar/PlannerCalendar.h"

#include <QTest>

using namespace orvanta;
using orvanta::test::LogTestEnv;

namespace {

void fillDays(LogTestEnv& env)
{
    env.addCall(1, "'2024-05-01'", "'09:00:00'", "'Meier'", "'0301111'");
    env.addCall(2, "'2024-05-14'", "'08:00:00'", "'Schulz'", "'0402222'");
    env.addCall(3, "'2024-05-14'", "'17:30:00'", "''", "'0301111'");
    env.addCall(4, "'2024-04-30'", "'23:59:00'", "'Anders'", "'0214444'");
}

// A contact "Müller GmbH" (key 7) whose number "Zentrale" is 030 1111.
void addContact(LogTestEnv& env)
{
    const QString digits = NormalizeNumber(u"0301111");
    env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (7, 'Müller', 'Müller GmbH')"));
    env.db().exec(QStringLiteral("INSERT INTO COM (LID, CID, KOMMBEZ, LC, VORW, NUMBER, VORWNUMBER, LCVORWNUMBER, "
                                 "NUMBEROF) VALUES (70, 7, 'Zentrale', '49', '30', '1111', '%1', '49%1', '%1')")
                      .arg(digits));
}

int count(LogTestEnv& env, const QString& where)
{
    return env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM LOG WHERE ") + where).toInt();
}

} // namespace

class TestLogMaintenance final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void marksEveryDayWithItsHint()
    {
        LogTestEnv env;
        fillDays(env);
        LogMaintenance m(&env.dm());
        PlannerCalendar calendar;
        calendar.addEvent(QDate(2020, 1, 1), QStringLiteral("stale"));
        QVERIFY(m.gettinglogdates(calendar));
        QCOMPARE(calendar.eventCount(), 3);
        QVERIFY(!calendar.hasEvent(QDate(2020, 1, 1)));
        QCOMPARE(calendar.hintFor(QDate(2024, 5, 14)), QStringLiteral("Protokoll vom 14.05.2024"));
        QCOMPARE(calendar.hintFor(QDate(2024, 4, 30)), QStringLiteral("Protokoll vom 30.04.2024"));
        QCOMPARE(calendar.latestEventDay(), QDate(2024, 5, 14));
        QCOMPARE(env.dialogs().count(), 0);
        // Marking leaves no transaction open behind it.
        QVERIFY(!env.dm().LogAllgemeinTS.isActive());
    }

    void modeOneMovesTheDayViewToADayWithEntries()
    {
        LogTestEnv env;
        fillDays(env);
        LogMaintenance m(&env.dm());
        PlannerCalendar calendar;
        Tlogframe frame(&env.dm());
        frame.setViewMode(1);
        frame.setLogDay(LogTestEnv::today()); // no calls today
        frame.Firstep(&env.host());

        // The calendar view is not shown: marks only.
        QVERIFY(m.markLogDays(DayMarking::MarksAndShowDay, {&calendar, &frame, false}));
        QCOMPARE(frame.logDay(), LogTestEnv::today());

        QVERIFY(m.markLogDays(DayMarking::MarksAndShowDay, {&calendar, &frame, true}));
        QCOMPARE(frame.logDay(), QDate(2024, 5, 14));
        QCOMPARE(calendar.date(), QDate(2024, 5, 14));
        QCOMPARE(frame.captionText(), QStringLiteral("Anrufprotokoll vom 14.05.2024"));

        // A day that has entries stays.
        frame.OpenDBonDay(QDate(2024, 5, 1));
        QVERIFY(m.markLogDays(DayMarking::MarksAndShowDay, {&calendar, &frame, true}));
        QCOMPARE(frame.logDay(), QDate(2024, 5, 1));
        QCOMPARE(calendar.date(), QDate(2024, 5, 1));
    }

    void modeOneOnAnEmptyLogShowsTodayWithoutLog()
    {
        LogTestEnv env;
        LogMaintenance m(&env.dm());
        PlannerCalendar calendar;
        Tlogframe frame(&env.dm());
        frame.setViewMode(1);
        frame.setLogDay(QDate(2024, 1, 1));
        frame.Firstep(&env.host());
        QVERIFY(m.markLogDays(DayMarking::MarksAndShowDay, {&calendar, &frame, true}));
        QVERIFY(!calendar.hasEvents());
        QCOMPARE(frame.logDay(), LogTestEnv::today());
        QVERIFY(frame.isBusy());
        QCOMPARE(frame.captionText(), QStringLiteral("Kein Protokoll vorhanden."));
    }

    void deletesOneRecordAndOneDay()
    {
        LogTestEnv env;
        fillDays(env);
        LogMaintenance m(&env.dm());
        QVERIFY(m.DeleteLogItem(2, &env.host()));
        QCOMPARE(count(env, QStringLiteral("LID = 2")), 0);
        QCOMPARE(count(env, QStringLiteral("1 = 1")), 3);
        env.host().flush();
        QCOMPARE(env.host().of(WMUPDATEVOICEBOXGRID).size(), 1);

        QVERIFY(m.DeleteLogDay(QDate(2024, 5, 14), &env.host()));
        QCOMPARE(count(env, QStringLiteral("TSDATE = '2024-05-14'")), 0);
        QCOMPARE(count(env, QStringLiteral("1 = 1")), 2);
        QVERIFY(!env.dm().LogAllgemeinTS.isActive());
        QCOMPARE(env.dialogs().count(), 0);
    }

    void findsTheCallersNumberOrSaysWhy()
    {
        LogTestEnv env;
        fillDays(env);
        env.addCall(5, "'2024-05-15'", "'10:00:00'", "''", "''");
        LogMaintenance m(&env.dm());
        QString number;
        QVERIFY(m.GetFromphoneByLog(3, number));
        QCOMPARE(number, QStringLiteral("0301111"));

        QVERIFY(!m.GetFromphoneByLog(99, number));
        QVERIFY(number.isEmpty());
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("# Orvanta - GetFromphoneByLog\r\nDer Protokolleintrag konnte in der Datenbank nicht "
                                "gefunden werden!\r\nAufgabe kann nicht durchgeführt werden."));
        QVERIFY(!m.GetFromphoneByLog(5, number));
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("# Orvanta - GetFromphoneByLog\r\nDie Telefonnummer des Anrufers im Protokolleintrag "
                                "ist leer!\r\nAufgabe kann nicht durchgeführt werden."));
        QCOMPARE(env.dialogs().last().kind, DialogKind::Error);
    }

    void relinkingMatchesCallerNumberAndSubAddress()
    {
        LogTestEnv env;
        fillDays(env);
        env.db().exec(QStringLiteral("UPDATE LOG SET FROMPHONE = '0409999', FROMSUBB = '0301111' WHERE LID = 4"));
        LogMaintenance m(&env.dm());
        QVERIFY(m.LogbuchAnpassen(QStringLiteral("0301111"), QStringLiteral("Zentrale"), 7, QStringLiteral("Müller GmbH")));
        QCOMPARE(count(env, QStringLiteral("CID = 7 AND FROMBEZ = 'Müller GmbH' AND FROMANSCHLUSS = 'Zentrale'")), 3);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT LIST(LID) FROM (SELECT LID FROM LOG WHERE CID = 7 ORDER BY LID)"))
                     .toString(),
                 QStringLiteral("1,3,4"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT FROMBEZ FROM LOG WHERE LID = 2")).toString(), QStringLiteral("Schulz"));

        QVERIFY(m.LogCheckOfNumber(QStringLiteral("0301111")));
        QVERIFY(!m.LogCheckOfNumber(QStringLiteral("0777777")));
    }

    void aStoredNumberIsOfferedForRelinking()
    {
        LogTestEnv env;
        fillDays(env);
        addContact(env);
        LogMaintenance m(&env.dm());

        QCOMPARE(m.CheckOfNumber(QStringLiteral("0777777")), NumberCheck::NotStored);
        QCOMPARE(env.dialogs().count(), 0);

        // No: nothing changes, but the number counts as stored.
        env.dialogs().enqueueAnswer(DialogButton::No);
        QCOMPARE(m.CheckOfNumber(QStringLiteral("0301111")), NumberCheck::Stored);
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("Die Rufnummer ist bereits als\r\n\"Zentrale\"\r\nbei dem Kontakt\r\n\"Müller GmbH\"\r\n"
                                "hinterlegt!\r\n\r\nMöchten Sie die Logbucheinträge mit dem Kontakt verknüpfen?"));
        QCOMPARE(count(env, QStringLiteral("CID = 7")), 0);

        env.dialogs().enqueueAnswer(DialogButton::Yes);
        QCOMPARE(m.CheckOfNumber(QStringLiteral("0301111")), NumberCheck::Stored);
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Logbucheinträge wurden angepasst."));
        QCOMPARE(env.dialogs().last().kind, DialogKind::Information);
        QCOMPARE(count(env, QStringLiteral("CID = 7")), 2);
    }

    void withoutConnectionEveryOperationSaysSo()
    {
        LogTestEnv env;
        LogMaintenance m(nullptr);
        PlannerCalendar calendar;
        QVERIFY(!m.gettinglogdates(calendar));
        QVERIFY(!m.DeleteLogItem(1, nullptr));
        QString number;
        QVERIFY(!m.GetFromphoneByLog(1, number));
        QCOMPARE(m.CheckOfNumber(QStringLiteral("0301111")), NumberCheck::Failed);
        QCOMPARE(env.dialogs().count(), 4);
        for (const QString& text : env.dialogs().texts())
            QCOMPARE(text, QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!"));
    }

    void aFailedDeletionIsReportedAndRolledBack()
    {
        LogTestEnv env;
        fillDays(env);
        // The server refuses to delete the last of three rows of a day: the whole day stays.
        env.db().exec(QStringLiteral("CREATE EXCEPTION E_KEEP 'Protokoll gesperrt'"));
        env.db().exec(QStringLiteral("SET TERM ^ ;\nCREATE TRIGGER LOG_BD FOR LOG BEFORE DELETE AS BEGIN "
                                     "IF (OLD.LID = 3) THEN EXCEPTION E_KEEP; END^\nSET TERM ; ^"));
        TDM2& dm = env.dm();
        LogMaintenance m(&dm);
        QVERIFY(!m.DeleteLogDay(QDate(2024, 5, 14), &env.host()));
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Orvanta - DeleteLogDay\r\n")));
        QVERIFY(env.dialogs().last().text.contains(QStringLiteral("Protokoll gesperrt")));
        QVERIFY(!dm.LogAllgemeinTS.isActive());
        QCOMPARE(count(env, QStringLiteral("TSDATE = '2024-05-14'")), 2);
        env.host().flush();
        QVERIFY(env.host().of(WMUPDATEVOICEBOXGRID).isEmpty());

        // A connection lost while running: every operation reports it, nothing else happens.
        dm.IBDatabase1.disconnect();
        PlannerCalendar calendar;
        QVERIFY(!m.gettinglogdates(calendar));
        QCOMPARE(env.dialogs().last().text, QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!"));
    }
};

ORVANTA_TEST(TestLogMaintenance)
#include "tst_logmaintenance.moc"
