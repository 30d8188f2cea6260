#include "calllog/LogReport.h"
#include "calllog/TLogPrintSelection.h"
#include "db/FbStatement.h"
#include "tests/TestPaths.h"
#include "tests/calllog/LogTestEnv.h"
#include "tests/support/ReportCapture.h"
#include "tests/support/TestRegistry.h"

#include <QComboBox>
#include <QDateEdit>
#include <QLabel>
#include <QPushButton>
#include <QRadioButton>
#include <QTest>

using namespace orvanta;
using namespace orvanta::test;

namespace {

// The shipped report file in the test's program folder.
void installReports(LogTestEnv& env)
{
    env.writeFile(QStringLiteral("Orvex.rav"), shippedReportFile());
}

void call(LogTestEnv& env, int lid, const char* date, const char* time, int ctype, const char* from, const char* to,
          const char* ctime = "00:00:00", const char* charge = "0", int abid = 0, const char* region = "")
{
    env.db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, CTYPE, FROMBEZ, ONBEZ, STATUS, CTIME, CCHARGE, "
                                 "ABID, REGION, BEMERK) VALUES (%1, '%2', '%3', %4, '%5', '%6', 'angenommen', '%7', %8, "
                                 "%9, '%10', 'Rückruf')")
                      .arg(lid)
                      .arg(QLatin1String(date), QLatin1String(time))
                      .arg(ctype)
                      .arg(QString::fromUtf8(from), QString::fromUtf8(to), QLatin1String(ctime), QLatin1String(charge))
                      .arg(abid)
                      .arg(QString::fromUtf8(region)));
}

void fillLog(LogTestEnv& env)
{
    call(env, 1, "2024-05-14", "09:00:00", 0, "Meier", "Büro", "00:00:00", "0", 0, "Bayern");
    call(env, 2, "2024-05-15", "17:30:00", 1, "Büro", "Schulz", "01:02:03", "12.5", 1, "Berlin");
    call(env, 3, "2024-05-15", "08:15:00", 0, "Özdemir", "Büro", "00:00:00", "0", 0, "");
    call(env, 4, "2024-05-16", "10:00:00", 0, "Meier", "Büro", "00:00:42", "0", 0, "Bayern");
}

} // namespace

class TestLogReport : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void statementsAndPeriods()
    {
        LogReportQuery all = logReportQuery(6, QDate(), QDate());
        QCOMPARE(all.sql, QStringLiteral("select TSDate, TSTime, CTYPE, FROMBEZ, STATUS, ONBEZ from LOG "
                                         "order by FROMBEZ, REGION, TSDATE, TSTIME"));
        QCOMPARE(all.zeitraum, QStringLiteral("(alles)"));
        LogReportQuery period = logReportQuery(1, QDate(2024, 5, 1), QDate(2024, 5, 31));
        QCOMPARE(period.sql, QStringLiteral("select TSDate, TSTime, CTYPE, FROMBEZ, STATUS, ONBEZ, CTIME, CCHARGE, BEMERK, "
                                            "ABID, REGION from LOG where (TSDATE >= :StartDay) and (TSDATE <= :EndDay) "
                                            "order by TSDATE, TSTIME"));
        QCOMPARE(period.zeitraum, QStringLiteral("(01.05.2024-31.05.2024)"));
        QCOMPARE(logReportQuery(0, QDate(2024, 5, 15), QDate()).zeitraum, QStringLiteral("(15.05.2024)"));
        QCOMPARE(LogReportConnection::durationText(26 * 3600 + 3 * 60 + 4), QStringLiteral("26:03:04"));
        QCOMPARE(LogReportConnection::durationText(0), QStringLiteral("0:00:00"));
        QVERIFY(!logReportVariant(10));
        QCOMPARE(QLatin1String(logReportVariant(9)->report), QLatin1String("LogDetailliertGruppeTerminating"));
    }

    void oneDayListsThatDayInTimeOrder()
    {
        LogTestEnv env;
        installReports(env);
        fillLog(env);
        ReportCapture capture;
        ReportOutcome outcome;
        QVERIFY(LogPrint(&env.dm().rave_ibsql, 0, outcome, QDate(), QDate(2024, 5, 15)));
        QCOMPARE(outcome.code, 0);
        QCOMPARE(capture.reports, QStringList{QStringLiteral("LogEinfach")});
        const QStringList text = pdfLines(capture.text());
        QVERIFY(text.contains(QStringLiteral("Zeitraum: (15.05.2024)")));
        const QString early = QStringLiteral("15.05.2024 08:15 ankommend Özdemir angenommen Büro");
        const QString late = QStringLiteral("15.05.2024 17:30 abgehend Büro angenommen Schulz");
        QVERIFY2(text.indexOf(early) >= 0 && text.indexOf(early) < text.indexOf(late), qPrintable(text.join(u'\n')));
        QVERIFY(!capture.text().contains(QStringLiteral("14.05.2024")));
        QVERIFY(!capture.text().contains(QStringLiteral("16.05.2024")));
        QVERIFY(capture.text().contains(QStringLiteral("Seite 1 von 1")));
        QVERIFY(capture.text().contains(QStringLiteral("Gedruckt am 15.05.2024 um 12:00")));
        QVERIFY(!env.dm().rave_ibsql_ts.isActive());
    }

    void detailedAndGroupedVariants()
    {
        LogTestEnv env;
        installReports(env);
        fillLog(env);
        ReportCapture capture;
        ReportOutcome outcome;
        QVERIFY(LogPrint(&env.dm().rave_ibsql, 1, outcome, QDate(), QDate()));
        const QString detailed = capture.text();
        if (qEnvironmentVariableIsSet("DUMP_PDF"))
            qWarning("%s", qPrintable(detailed));
        QVERIFY(detailed.contains(QStringLiteral("Zeitraum: (alles)")));
        QVERIFY(detailed.contains(QStringLiteral("0:00:00")));
        QVERIFY(detailed.contains(QStringLiteral("1:02:03")));
        QVERIFY(detailed.contains(QStringLiteral("0:00:42")));
        const QLocale locale = QLocale::system();
        QVERIFY(detailed.contains(locale.toCurrencyString(12.5, locale.currencySymbol(), 2)));
        QVERIFY(detailed.contains(QStringLiteral("Mitteilung vorhanden")));
        QVERIFY(detailed.contains(QStringLiteral("Rückruf")));

        // Grouped by connection: one head per value.
        QVERIFY(LogPrint(&env.dm().rave_ibsql, 4, outcome, QDate(), QDate()));
        const QString byKind = capture.text();
        QCOMPARE(byKind.count(QStringLiteral("Verbindung: ankommend")), 1);
        QCOMPARE(byKind.count(QStringLiteral("Verbindung: abgehend")), 1);
        QVERIFY(byKind.indexOf(QStringLiteral("Verbindung: ankommend")) < byKind.indexOf(QStringLiteral("Verbindung: abgehend")));

        // Grouped by caller, detailed: the region in parentheses, only in this variant.
        QVERIFY(LogPrint(&env.dm().rave_ibsql, 7, outcome, QDate(2024, 5, 16), QDate(2024, 5, 14)));
        const QString byCaller = capture.text();
        QCOMPARE(byCaller.count(QStringLiteral("Anrufer: Meier")), 1);
        QVERIFY(byCaller.contains(QStringLiteral("(Bayern)")));
        QVERIFY(!detailed.contains(QStringLiteral("(Bayern)")));
        QCOMPARE(capture.count(), 3);
    }

    void oddRestartsOnEveryOpen()
    {
        LogTestEnv env;
        fillLog(env);
        LogReportConnection connection(env.dm().rave_ibsql, logReportQuery(0, QDate(), QDate()), 0);
        for (int run = 0; run < 2; ++run) {
            connection.open();
            QStringList odd;
            for (; !connection.atEnd(); connection.next())
                odd.append(connection.row().last());
            connection.restore();
            QCOMPARE(odd, (QStringList{QStringLiteral("T"), QStringLiteral("F"), QStringLiteral("T"), QStringLiteral("F")}));
        }
    }

    void failuresGiveTheirCodeAndPrintNothing()
    {
        LogTestEnv env;
        fillLog(env);
        ReportCapture capture;
        ReportOutcome outcome;
        QVERIFY(!LogPrint(nullptr, 0, outcome, QDate(), QDate()));
        QCOMPARE(reportResultName(outcome.code), QStringLiteral("NO_QUERY_AVAILABLE"));
        QVERIFY(!LogPrint(&env.dm().rave_ibsql, 10, outcome, QDate(), QDate()));
        QCOMPARE(reportResultName(outcome.code), QStringLiteral("NO_REPORT_ASSIGNED"));
        // No report file.
        QVERIFY(!LogPrint(&env.dm().rave_ibsql, 0, outcome, QDate(), QDate()));
        QCOMPARE(outcome.code, 1);
        QVERIFY2(outcome.message.startsWith(QStringLiteral("Die Berichtsdatei")), qPrintable(outcome.message));
        // A damaged one.
        env.writeFile(QStringLiteral("Orvex.rav"), "orvex 1\nreport LogEinfach\n  band detail 5\n    text 0 0 10 5 \"{Datum}\n");
        QVERIFY(!LogPrint(&env.dm().rave_ibsql, 0, outcome, QDate(), QDate()));
        QCOMPARE(reportFailureEntry(QStringLiteral("LogPrint"), outcome),
                 QStringLiteral("Methode: LogPrint\r\nError: UNEXPECTED\r\nError-Number: 0\r\n"
                                "Orvex.rav: Zeile 4: Anführungszeichen nicht geschlossen"));
        // A report missing from the file, and one naming a field the log does not have.
        env.writeFile(QStringLiteral("Orvex.rav"), "orvex 1\nreport LogEinfach\n  band detail 5\n    text 0 0 10 5 \"{Datum} {Telefon}\"\nend\n");
        QVERIFY(!LogPrint(&env.dm().rave_ibsql, 2, outcome, QDate(), QDate()));
        QCOMPARE(outcome.message, QStringLiteral("Orvex.rav: es gibt keinen Bericht „LogEinfachGruppeDatum“"));
        QVERIFY(!LogPrint(&env.dm().rave_ibsql, 0, outcome, QDate(), QDate()));
        QVERIFY(outcome.message.contains(QStringLiteral("Zeile 4: unbekanntes Feld oder unbekannter Parameter „Telefon“")));
        QCOMPARE(capture.count(), 0);
        QVERIFY(!env.dm().rave_ibsql_ts.isActive());
    }

    // The database failing while the rows are read: the outcome carries its number and text, the
    // read is rolled back, and the same statement prints the next report.
    void aDatabaseFailureIsReportedAndLeavesTheStatementUsable()
    {
        LogTestEnv env;
        installReports(env);
        fillLog(env);
        ReportCapture capture;
        FbStatement& statement = env.dm().rave_ibsql;
        class Dividing final : public StatementReportSource {
        public:
            using StatementReportSource::StatementReportSource;
            QList<ReportField> fields() const override { return {field("Wert", 10)}; }
            QStringList row() const override { return {statement().asString(0)}; }
        };
        ReportOutcome outcome;
        QVERIFY(!runStatementReport(statement, outcome, [&statement] {
            Dividing source(statement, QStringLiteral("select 1 / (LID - 3) from LOG order by LID desc"));
            for (source.open(); !source.atEnd(); source.next())
                (void)source.row();
        }));
        QCOMPARE(reportResultName(outcome.code), QStringLiteral("UNEXPECTED"));
        QVERIFY(outcome.number != 0);
        QVERIFY2(!outcome.message.isEmpty(), qPrintable(outcome.message));
        QVERIFY(!env.dm().rave_ibsql_ts.isActive());

        QVERIFY2(LogPrint(&statement, 0, outcome, QDate(), QDate()), qPrintable(outcome.message));
        QCOMPARE(capture.count(), 1);
        QVERIFY(capture.text().contains(QStringLiteral("Özdemir")));
    }

    void printSelectionChoosesTheVariantAndPeriod()
    {
        LogTestEnv env;
        installReports(env);
        fillLog(env);
        ReportCapture capture;
        TLogPrintSelection w(&env.dm());
        w.show();
        QCOMPARE(w.windowTitle(), QStringLiteral("Protokollausgabe"));
        auto rb = [&w](int i) { return w.findChild<QRadioButton*>(QStringLiteral("rb%1").arg(i)); };
        auto* de1 = w.findChild<QDateEdit*>(QStringLiteral("DE1"));
        auto* de2 = w.findChild<QDateEdit*>(QStringLiteral("DE2"));
        auto* de3 = w.findChild<QDateEdit*>(QStringLiteral("DE3"));
        auto* cb1 = w.findChild<QComboBox*>(QStringLiteral("CB1"));
        QCOMPARE(rb(1)->text(), QStringLiteral("Alles"));
        QVERIFY(rb(1)->isChecked() && rb(4)->isChecked() && rb(6)->isChecked());
        QCOMPARE(w.findChild<QLabel*>(QStringLiteral("l3"))->text(), QStringLiteral("Gruppieren nach:"));
        QCOMPARE(de1->date(), LogTestEnv::today());
        QVERIFY(!de1->isEnabled() && !de2->isEnabled() && !cb1->isEnabled());

        rb(2)->click();
        QVERIFY(de1->isEnabled() && !de2->isEnabled());
        rb(3)->click();
        QVERIFY(!de1->isEnabled() && de2->isEnabled() && de3->isEnabled() && cb1->isEnabled());
        cb1->setCurrentIndex(1); // "Letzte Woche", from Monday
        QCOMPARE(de2->date(), QDate(2024, 5, 6));
        QCOMPARE(de3->date(), QDate(2024, 5, 12));
        cb1->setCurrentIndex(3); // "Letzter Monat"
        QCOMPARE(de2->date(), QDate(2024, 4, 1));
        QCOMPARE(de3->date(), QDate(2024, 4, 30));
        de3->setDate(QDate(2024, 5, 14));
        QCOMPARE(cb1->currentText(), QStringLiteral("Individuell"));
        rb(5)->click();
        rb(8)->click();
        QVERIFY(w.PrintPrepare());
        QCOMPARE(w.variant(), 5);
        QCOMPARE(w.startDate(), QDate(2024, 4, 1));
        QCOMPARE(w.endDate(), QDate(2024, 5, 14));

        // "Tag:" with the simple report prints that day.
        rb(2)->click();
        rb(4)->click();
        rb(6)->click();
        de1->setDate(QDate(2024, 5, 16));
        QTest::mouseClick(w.findChild<QPushButton*>(QStringLiteral("AdvTB1")), Qt::LeftButton);
        QCOMPARE(capture.reports, QStringList{QStringLiteral("LogEinfach")});
        QVERIFY(capture.text().contains(QStringLiteral("(16.05.2024)")));
        QVERIFY(capture.text().contains(QStringLiteral("00:42")) || capture.text().contains(QStringLiteral("10:00")));
        QVERIFY(!w.isVisible());
        QCOMPARE(env.dialogs().count(), 0);
    }

    void aFailedPrintIsReportedThroughTheErrorLog()
    {
        LogTestEnv env;
        fillLog(env);
        TLogPrintSelection w(&env.dm());
        w.show();
        w.AdvTB1Click();
        QCOMPARE(env.dialogs().count(), 1);
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("Methode: LogPrint\r\nError: UNEXPECTED\r\n")));
        QVERIFY(env.errorLogText().contains(QStringLiteral("Methode: LogPrint")));
    }
};

ORVANTA_TEST(TestLogReport)
#include "tst_logreport.moc"
