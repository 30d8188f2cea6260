// "Exportieren..." of the log list: the wizard over the log grid of a real database, with the
// internal ABID column hidden while it is open, left out of the file and shown again afterwards.
#include "app/MainWindowFeatures.h"
#include "app/TLogform.h"
#include "calllog/Tlogframe.h"
#include "contacts/Tcontactlistframe.h"
#include "export/TExportGridForm.h"
#include "export/writers/ExportWriter.h"
#include "tests/export/ExportReadBack.h"
#include "tests/app/AppTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSnapshot.h"

#include <QAction>
#include <QApplication>
#include <QFileSystemModel>
#include <QLineEdit>
#include <QPushButton>
#include <QTemporaryDir>
#include <QTest>
#include <QTimer>
#include <QTreeView>

using namespace orvanta;

class TestExportFeature : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void exportsTheLogGridWithoutAbid()
    {
        test::AppTestEnv env;
        env.addCall(1, QStringLiteral("2024-05-14"), QStringLiteral("0301111"), QStringLiteral("Müller & Söhne"));
        env.addCall(2, QStringLiteral("2024-05-14"), QStringLiteral("0302222"), QStringLiteral("<Abel>"));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        TLogform& w = env.window({}, f);
        w.show();
        auto* frame = dynamic_cast<Tlogframe*>(w.logFrame());
        QVERIFY(frame);
        QTRY_VERIFY(!frame->isLoading());
        GridController* grid = frame->controller();
        const int abid = grid->columnByField(u"ABID");
        QVERIFY(abid >= 0);
        grid->setColumnVisible(abid, true);

        bool abidVisibleWhileOpen = true;
        bool walked = false;
        QTimer::singleShot(0, &w, [&] {
            auto* form = qobject_cast<TExportGridForm*>(QApplication::activeModalWidget());
            QVERIFY(form);
            abidVisibleWhileOpen = grid->isColumnVisible(abid);
            form->setStartDelay(0);
            form->findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
            QTest::keyClicks(form->findChild<QLineEdit*>(QStringLiteral("E1")), QStringLiteral("Anrufe"));
            auto* tree = form->findChild<QTreeView*>(QStringLiteral("cxSTV1"));
            tree->setCurrentIndex(qobject_cast<QFileSystemModel*>(tree->model())->index(env.folder()));
            form->findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
            QTRY_COMPARE(form->currentPage(), TExportGridForm::PageResult);
            walked = true;
            form->findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
        });
        w.updateActions();
        QAction* action = w.findChild<QAction*>(QStringLiteral("_LogFo_Export"));
        QVERIFY(action->isEnabled());
        action->trigger();
        QVERIFY(walked);
        QVERIFY(!abidVisibleWhileOpen);
        QVERIFY(grid->isColumnVisible(abid));

        const QString html = QString::fromUtf8(env.readFile(QStringLiteral("Anrufe.html")));
        QVERIFY(html.contains(QStringLiteral("Müller &amp; Söhne")));
        QVERIFY(html.contains(QStringLiteral("&lt;Abel&gt;")));
        QVERIFY(!html.contains(QStringLiteral("<th>ABID</th>")));
        QVERIFY(!html.contains(QStringLiteral("<th></th>")));   // the ABID column has no caption
    }

    void exportsTheContactGridAsShown()
    {
        test::AppTestEnv env;
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (1, 'Bäcker', 'Bäcker, \"Brot\" & Co')"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (2, 'Zorn', 'Zorn')"));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        TLogform& w = env.window({}, f);
        w.show();
        w.findChild<QAction*>(QStringLiteral("dxBB_Ansicht_Kontakte"))->trigger();
        auto* frame = qobject_cast<Tcontactlistframe*>(w.contactFrame());
        QVERIFY(frame && frame->isConnected());
        // What the grid shows is what is written: here only the contacts under "B".
        frame->SetNewFilter(2);

        bool walked = false;
        QTimer::singleShot(0, &w, [&] {
            auto* form = qobject_cast<TExportGridForm*>(QApplication::activeModalWidget());
            QVERIFY(form);
            form->setStartDelay(0);
            form->findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
            QLineEdit* name = form->findChild<QLineEdit*>(QStringLiteral("E1"));
            name->clear();
            QTest::keyClicks(name, QStringLiteral("Kontakte"));
            auto* tree = form->findChild<QTreeView*>(QStringLiteral("cxSTV1"));
            tree->setCurrentIndex(qobject_cast<QFileSystemModel*>(tree->model())->index(env.folder()));
            form->findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
            QTRY_COMPARE(form->currentPage(), TExportGridForm::PageResult);
            walked = true;
            form->findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
        });
        w.updateActions();
        QAction* action = w.findChild<QAction*>(QStringLiteral("_LogFo_ContExport"));
        QVERIFY(action->isEnabled());
        action->trigger();
        QVERIFY(walked);

        const QString html = QString::fromUtf8(env.readFile(QStringLiteral("Kontakte.html")));
        QVERIFY(html.contains(QStringLiteral("Bäcker, &quot;Brot&quot; &amp; Co")));
        QVERIFY(!html.contains(QStringLiteral("Zorn")));
    }

    // The log and the contact grid of a real database, each format read back by readers we
    // did not write: every cell equals the grid's display text, group rows included.
    void everyFormatHoldsWhatTheGridsShow()
    {
        test::AppTestEnv env;
        env.addCall(1, QStringLiteral("2024-05-14"), QStringLiteral("0301111"), QStringLiteral("Müller & Söhne, \"Köln\""));
        env.addCall(2, QStringLiteral("2024-05-14"), QStringLiteral("0302222"), QStringLiteral("<Abel>"));
        env.addCall(3, QStringLiteral("2024-05-15"), QStringLiteral("0303333"), QStringLiteral("Straße; 12,50 €"));
        env.db().exec(QStringLiteral("UPDATE LOG SET BEMERK = 'Zeile eins' || ASCII_CHAR(10) || 'zwei, drei' WHERE LID = 2"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (1, 'Bäcker', 'Bäcker, \"Brot\" & Co')"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (2, 'Öz', '<Öz>')"));
        env.db().exec(QStringLiteral("INSERT INTO ADDR (LID, CID, STR, ORT) VALUES (1, 1, 'Hauptstraße 1', 'Köln')"));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        TLogform& w = env.window({}, f);
        w.show();
        auto* log = dynamic_cast<Tlogframe*>(w.logFrame());
        QVERIFY(log);
        QTRY_VERIFY(!log->isLoading());
        log->ToGroup(LogGrouping::Date);

        QTemporaryDir dir;
        const auto everyFormat = [&dir](GridController& grid) {
            const int abid = grid.columnByField(u"ABID");
            const QStringList excluded = abid >= 0 ? QStringList{grid.column(abid).name} : QStringList{};
            const test::Table want = test::shownTable(grid, excluded);
            QVERIFY(want.size() > 2);
            for (const ExportFormat format : {ExportFormat::Html, ExportFormat::Excel, ExportFormat::Xml, ExportFormat::Text}) {
                const QString path = dir.filePath(QStringLiteral("Export.") + exportExtension(format));
                GridSnapshot snapshot(grid, excluded);
                const ExportResult result = exportGrid(snapshot, format, path);
                QVERIFY2(result.ok, qPrintable(result.error));
                const QList<test::Table> tables = test::readBack(exportExtension(format), path);
                QCOMPARE(tables.size(), 1);
                test::compareTables(tables.front(), want, format == ExportFormat::Html || format == ExportFormat::Xml);
                if (QTest::currentTestFailed())
                    return;
            }
        };
        everyFormat(*log->controller());
        if (QTest::currentTestFailed())
            return;
        // The view switch replaces the log frame with the contact list.
        w.findChild<QAction*>(QStringLiteral("dxBB_Ansicht_Kontakte"))->trigger();
        auto* contacts = qobject_cast<Tcontactlistframe*>(w.contactFrame());
        QVERIFY(contacts && contacts->isConnected());
        everyFormat(*contacts->controller());
    }
};

ORVANTA_TEST(TestExportFeature)
#include "tst_exportfeature.moc"
