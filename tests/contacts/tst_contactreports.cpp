#include "contacts/ContactReports.h"
#include "contacts/Tnotizviewform.h"
#include "tests/TestPaths.h"
#include "tests/support/ProgramTestEnv.h"
#include "tests/support/ReportCapture.h"
#include "tests/support/TestRegistry.h"

#include <QFile>
#include <QTest>
#include <QTextCursor>
#include <QTextDocument>
#include <QTextList>

using namespace orvanta;
using namespace orvanta::test;

namespace {

void installReports(ProgramTestEnv& env)
{
    QVERIFY(env.writeFile(QStringLiteral("Orvex.rav"), shippedReportFile()));
}

} // namespace

class TestContactReports : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void overviewListsEveryContactOnce()
    {
        ProgramTestEnv env(QDateTime(QDate(2024, 5, 15), QTime(9, 30)), ProgramTestEnv::ErrorLogSetup::Create);
        installReports(env);
        env.db().exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Kunden')"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, CONTBEZ) VALUES (1, 'Müller GmbH')"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, CONTBEZ) VALUES (2, 'Ohne Alles')"));
        env.db().exec(QStringLiteral("INSERT INTO CONKAT (LID, CID, KID) VALUES (1, 1, 1)"));
        env.db().exec(QStringLiteral("INSERT INTO ADDR (LID, CID, STR, PLZ, ORT) VALUES (1, 1, 'Hauptstraße 5', '50667', 'Köln')"));
        ReportCapture capture;
        ReportOutcome outcome;
        QVERIFY(DruckKontaktUebersicht(&env.dm().rave_ibsql, outcome));
        QCOMPARE(capture.titles, QStringList{QStringLiteral("Vorschau Kontaktübersicht")});
        const QStringList text = pdfLines(capture.text());
        QVERIFY2(text.contains(QStringLiteral("Müller GmbH Kunden Hauptstraße 5 50667 Köln")), qPrintable(text.join(u'\n')));
        QCOMPARE(text.filter(QStringLiteral("Ohne Alles")), QStringList{QStringLiteral("Ohne Alles")});
        QVERIFY(text.contains(QStringLiteral("Kontakt Kategorie Straße PLZ Ort")));
        QVERIFY(!env.dm().rave_ibsql_ts.isActive());

        // Without a statement: its code, nothing shown.
        QVERIFY(!DruckKontaktUebersicht(nullptr, outcome));
        QCOMPARE(reportFailureEntry(QStringLiteral("DruckKontaktUebersicht"), outcome),
                 QStringLiteral("Methode: DruckKontaktUebersicht\r\nError: NO_QUERY_AVAILABLE\r\nError-Number: 0\r\n"));
        QCOMPARE(capture.count(), 1);
    }

    void theNotesWindowPrintsTheNoteOverPages()
    {
        ProgramTestEnv env(QDateTime(QDate(2024, 5, 15), QTime(9, 30)), ProgramTestEnv::ErrorLogSetup::Create);
        installReports(env);
        QTextDocument note;
        QTextCursor cursor(&note);
        cursor.insertText(QStringLiteral("Anfang: Bitte Rückruf wegen Übergabe."));
        QTextListFormat bullets;
        bullets.setStyle(QTextListFormat::ListDisc);
        cursor.insertList(bullets);
        for (int i = 1; i <= 120; ++i) {
            if (i > 1)
                cursor.insertBlock();
            cursor.insertText(QStringLiteral("Punkt %1: Größe prüfen").arg(i));
        }
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, CONTBEZ) VALUES (7, 'Bäckerei Schön')"));
        ReportCapture capture;
        Tnotizviewform w(&env.dm(), 7);
        w.show();
        QTRY_COMPARE(w.designation(), QStringLiteral("Bäckerei Schön"));
        w.noteView()->document()->setHtml(note.toHtml());
        w.RzB2Click();
        QCOMPARE(capture.reports, QStringList{QStringLiteral("NotizDruck")});
        QCOMPARE(capture.titles, QStringList{QStringLiteral("Vorschau Notiz")});
        QVERIFY(capture.pages.first() >= 2);
        const QStringList sheets = capture.text().split(u'\f', Qt::SkipEmptyParts);
        QVERIFY(sheets.first().contains(QStringLiteral("Bäckerei Schön")));
        QVERIFY(sheets.first().contains(QStringLiteral("Anfang: Bitte Rückruf wegen Übergabe.")));
        QVERIFY(sheets.last().contains(QStringLiteral("Punkt 120: Größe prüfen")));
        QVERIFY(sheets.last().contains(QStringLiteral("Seite %1 von %1").arg(capture.pages.first())));

        // A damaged report file: the error log's entry, nothing printed.
        QVERIFY(env.writeFile(QStringLiteral("Orvex.rav"), "orvex 1\nreport NotizDruck\n  band title 999999\nend\n"));
        w.RzB2Click();
        QCOMPARE(capture.count(), 1);
        QCOMPARE(env.dialogs().count(), 1);
        QVERIFY2(env.dialogs().last().text.startsWith(
                     QStringLiteral("Methode: NotizDruck\r\nError: UNEXPECTED\r\nError-Number: 0\r\nOrvex.rav: Zeile 3: Bandhöhe 999999 außerhalb")),
                 qPrintable(env.dialogs().last().text));
    }
};

ORVANTA_TEST(TestContactReports)
#include "tst_contactreports.moc"
