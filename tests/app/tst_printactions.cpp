// The main window's "Drucken" actions: the log's print selection and the contact overview, run
// on a real database and read back from the PDF the preview hook writes instead of showing.
#include "app/MainWindowFeatures.h"
#include "app/TLogform.h"
#include "calllog/TLogPrintSelection.h"
#include "contacts/ContactNoteEditor.h"
#include "contacts/Tcontactlistframe.h"
#include "tests/TestPaths.h"
#include "tests/app/AppTestEnv.h"
#include "tests/support/ReportCapture.h"
#include "tests/support/TestRegistry.h"

#include <QAction>
#include <QApplication>
#include <QPushButton>
#include <QRadioButton>
#include <QTest>
#include <QTextEdit>
#include <QTimer>

using namespace orvanta;

namespace {

QByteArray shippedReports()
{
    QFile file(QStringLiteral(ORVANTA_SOURCE_DIR "/data/Orvex.rav"));
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

} // namespace

class TestPrintActions : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void logPrintGoesThroughTheSelection()
    {
        test::AppTestEnv env;
        env.writeFile(QStringLiteral("Orvex.rav"), shippedReports());
        env.addCall(1, QStringLiteral("2024-05-14"), QStringLiteral("0301111"), QStringLiteral("Meier"));
        env.addCall(2, QStringLiteral("2024-05-15"), QStringLiteral("0302222"), QStringLiteral("Schulz"));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        TLogform& w = env.window({}, f);
        w.show();
        test::ReportCapture capture;
        bool chosen = false;
        QTimer::singleShot(0, &w, [&] {
            auto* selection = qobject_cast<TLogPrintSelection*>(QApplication::activeModalWidget());
            QVERIFY(selection);
            selection->findChild<QRadioButton*>(QStringLiteral("rb7"))->click(); // grouped by date
            chosen = true;
            selection->findChild<QPushButton*>(QStringLiteral("AdvTB1"))->click();
        });
        w.updateActions();
        QAction* print = w.findChild<QAction*>(QStringLiteral("_LogFo_Print"));
        QVERIFY(print->isEnabled());
        print->trigger();
        QVERIFY(chosen);
        QCOMPARE(capture.reports, QStringList{QStringLiteral("LogEinfachGruppeDatum")});
        const QString text = capture.text();
        QVERIFY(text.contains(QStringLiteral("Datum: 14.05.2024")));
        QVERIFY(text.contains(QStringLiteral("Datum: 15.05.2024")));
        QVERIFY(text.contains(QStringLiteral("Zeitraum: (alles)")));
        QCOMPARE(env.dialogs().count(), 0);
    }

    void contactOverviewFromTheMenu()
    {
        test::AppTestEnv env;
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (1, 'Zorn', 'Zorn')"));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        TLogform& w = env.window({}, f);
        w.show();
        w.findChild<QAction*>(QStringLiteral("dxBB_Ansicht_Kontakte"))->trigger();
        QVERIFY(w.contactFrame() && w.contactFrame()->isConnected());
        test::ReportCapture capture;
        w.updateActions();
        QAction* overview = w.findChild<QAction*>(QStringLiteral("_LogFo_PrintContactOverview"));
        QVERIFY(overview->isEnabled());

        // Without the report file: the error entry, nothing shown.
        overview->trigger();
        QCOMPARE(capture.count(), 0);
        QCOMPARE(env.dialogs().count(), 1);
        QVERIFY(env.dialogs().last().text.startsWith(
            QStringLiteral("Methode: DruckKontaktUebersicht\r\nError: UNEXPECTED\r\nError-Number: 0\r\nDie Berichtsdatei")));

        env.writeFile(QStringLiteral("Orvex.rav"), shippedReports());
        overview->trigger();
        QCOMPARE(capture.titles, QStringList{QStringLiteral("Vorschau Kontaktübersicht")});
        QVERIFY(capture.text().contains(QStringLiteral("Zorn")));
    }

    void theEditWindowsNotePrintsThroughTheNoteReport()
    {
        test::AppTestEnv env;
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        TLogform& w = env.window({}, f);
        w.show();
        test::ReportCapture capture;
        ContactNoteEditor editor;
        editor.setDesignation([] { return QStringLiteral("Bäckerei Schön"); });
        editor.editor()->setPlainText(QStringLiteral("Brötchen für Montag bestellen."));
        QAction* print = editor.findChild<QAction*>(QStringLiteral("dxBB3"));
        QVERIFY(print);

        print->trigger(); // no report file yet
        QCOMPARE(capture.count(), 0);
        QCOMPARE(env.dialogs().count(), 1);
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("Methode: NotizDruck\r\nError: UNEXPECTED\r\n")));

        env.writeFile(QStringLiteral("Orvex.rav"), shippedReports());
        print->trigger();
        QCOMPARE(capture.titles, QStringList{QStringLiteral("Vorschau Notiz")});
        QVERIFY(capture.text().contains(QStringLiteral("Bäckerei Schön")));
        QVERIFY(capture.text().contains(QStringLiteral("Brötchen für Montag bestellen.")));
        QCOMPARE(env.dialogs().count(), 1);
    }
};

ORVANTA_TEST(TestPrintActions)
#include "tst_printactions.moc"
