// The export wizard driven as a user would: pages, the enable table, values kept across back
// and next, the overwrite question, refused names, the result texts and opening the file.
#include "export/TExportGridForm.h"
#include "platform/Clock.h"
#include "tests/phone/ErrorLogFixture.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/MemoryGridSource.h"

#include <QCheckBox>
#include <QDesktopServices>
#include <QDir>
#include <QFile>
#include <QFileSystemModel>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QTemporaryDir>
#include <QTest>
#include <QTreeView>
#include <QUrl>

using namespace orvanta;

namespace {

struct Grid {
    MemoryGridSource src{{{QStringLiteral("LID"), GridFieldType::Integer}, {QStringLiteral("ABID"), GridFieldType::Integer}}};
    GridController g;
    Grid()
    {
        g.addColumn(GridColumn(QStringLiteral("cLID"), QStringLiteral("LID"), QStringLiteral("Nr.")));
        g.addColumn(GridColumn(QStringLiteral("cABID"), QStringLiteral("ABID"), QStringLiteral("ABID")));
        for (int i = 0; i < 3; ++i) {
            const quint32 r = src.appendRow();
            src.setInt(r, 0, 10 + i);
            src.setInt(r, 1, 99);
        }
        g.setSource(&src);
    }
};

template <typename T>
T* find(QWidget& form, const char* name)
{
    T* w = form.findChild<T*>(QLatin1String(name));
    if (!w)
        qWarning("no control %s", name);
    return w;
}

struct Buttons {
    QString next;
    bool nextOn, priorOn, cancelOn;
};

Buttons buttons(QWidget& form)
{
    return {find<QPushButton>(form, "RzButton2")->text(), find<QPushButton>(form, "RzButton2")->isEnabled(),
            find<QPushButton>(form, "RzButton3")->isEnabled(), find<QPushButton>(form, "RzButton1")->isEnabled()};
}

void chooseFolder(QWidget& form, const QString& path)
{
    auto* tree = find<QTreeView>(form, "cxSTV1");
    auto* model = qobject_cast<QFileSystemModel*>(tree->model());
    tree->setCurrentIndex(model->index(path));
}

class UrlCatcher : public QObject {
    Q_OBJECT
public:
    QList<QUrl> urls;
public Q_SLOTS:
    void open(const QUrl& url) { urls << url; }
};

} // namespace

class TestExportWizard : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // The whole way through: enable table on every page, back keeps the values, the file is written
    // without the left-out column, and "Schließen" ends the dialog.
    void walkThrough()
    {
        test::ErrorLogFixture log;
        Grid grid;
        QTemporaryDir dir;
        TExportGridForm form(&grid.g, nullptr, {QStringLiteral("cABID")});
        form.setStartDelay(0);
        form.show();
        QCOMPARE(form.windowTitle(), QStringLiteral("Export"));
        QCOMPARE(form.currentPage(), TExportGridForm::PageFormat);
        QVERIFY(find<QRadioButton>(form, "rb1")->isChecked());
        QCOMPARE(find<QLabel>(form, "Label1")->text(),
                 QStringLiteral("Bitte wählen Sie das Format aus, in das Ihre Daten exportiert\nwerden sollen.\n\n"
                                "Klicken Sie anschließend auf \"Weiter\" um mit dem Export\nfortzufahren."));
        auto b = buttons(form);
        QCOMPARE(b.next, QStringLiteral("Weiter >"));
        QVERIFY(b.nextOn && !b.priorOn && b.cancelOn);

        find<QRadioButton>(form, "rb4")->setChecked(true);
        find<QPushButton>(form, "RzButton2")->click();
        QCOMPARE(form.currentPage(), TExportGridForm::PageTarget);
        b = buttons(form);
        QCOMPARE(b.next, QStringLiteral("Exportieren"));
        QVERIFY(!b.nextOn && b.priorOn && b.cancelOn);   // no name yet
        auto* e1 = find<QLineEdit>(form, "E1");
        QCOMPARE(e1->maxLength(), 254);
        QTest::keyClicks(e1, QStringLiteral(" Liste"));
        QCOMPARE(e1->text(), QStringLiteral("Liste"));   // no blank at the start
        QVERIFY(buttons(form).nextOn);
        chooseFolder(form, dir.path());

        find<QPushButton>(form, "RzButton3")->click();
        QCOMPARE(form.currentPage(), TExportGridForm::PageFormat);
        QVERIFY(find<QRadioButton>(form, "rb4")->isChecked());
        find<QPushButton>(form, "RzButton2")->click();
        QCOMPARE(find<QLineEdit>(form, "E1")->text(), QStringLiteral("Liste"));

        find<QPushButton>(form, "RzButton2")->click();
        QCOMPARE(form.currentPage(), TExportGridForm::PageRunning);
        b = buttons(form);
        QVERIFY(!b.nextOn && !b.priorOn && !b.cancelOn);
        QTRY_COMPARE(form.currentPage(), TExportGridForm::PageResult);
        QCOMPARE(find<QLabel>(form, "L1")->text(), QStringLiteral("Der Export wurde erfolgreich abgeschlossen."));
        b = buttons(form);
        QCOMPARE(b.next, QStringLiteral("Schließen"));
        QVERIFY(b.nextOn && !b.priorOn && !b.cancelOn);
        QFile file(dir.filePath(QStringLiteral("Liste.txt")));
        QVERIFY(file.open(QIODevice::ReadOnly));
        QCOMPARE(file.readAll(), QByteArray("Nr.\r\n10\r\n11\r\n12\r\n"));
        find<QPushButton>(form, "RzButton2")->click();
        QVERIFY(!form.isVisible());
        QCOMPARE(form.result(), int(QDialog::Accepted));
    }

    // An existing file: "Nein" writes nothing and still reports success; "Ja" overwrites.
    void overwriteQuestion()
    {
        test::ErrorLogFixture log;
        Grid grid;
        QTemporaryDir dir;
        QFile old(dir.filePath(QStringLiteral("Liste.html")));
        QVERIFY(old.open(QIODevice::WriteOnly));
        old.write("old");
        old.close();
        for (const DialogButton answer : {DialogButton::No, DialogButton::Yes}) {
            TExportGridForm form(&grid.g);
            form.setStartDelay(0);
            form.show();
            find<QPushButton>(form, "RzButton2")->click();
            QTest::keyClicks(find<QLineEdit>(form, "E1"), QStringLiteral("Liste"));
            chooseFolder(form, dir.path());
            log.dialogs().enqueueAnswer(answer);
            find<QPushButton>(form, "RzButton2")->click();
            QTRY_COMPARE(form.currentPage(), TExportGridForm::PageResult);
            QCOMPARE(log.dialogs().last().text, QStringLiteral("Die angegebene Exportdatei \"") + old.fileName()
                                                    + QStringLiteral("\"\r\nexistiert bereits!\r\n\r\nÜberschreiben?"));
            QCOMPARE(log.dialogs().last().kind, DialogKind::Warning);
            QCOMPARE(find<QLabel>(form, "L1")->text(), QStringLiteral("Der Export wurde erfolgreich abgeschlossen."));
            QVERIFY(old.open(QIODevice::ReadOnly));
            const QByteArray content = old.readAll();
            old.close();
            if (answer == DialogButton::No)
                QCOMPARE(content, QByteArray("old"));
            else
                QVERIFY(content.startsWith("<!DOCTYPE html>"));
        }
    }

    // Names that would leave the folder and a folder that vanished end with the failure text and
    // write nothing.
    void refusedTargets()
    {
        test::ErrorLogFixture log;
        Grid grid;
        QTemporaryDir dir;
        QVERIFY(QDir(dir.path()).mkdir(QStringLiteral("sub")));
        const QString sub = dir.filePath(QStringLiteral("sub"));
        struct Case {
            QString name;
            bool removeFolder;
            QByteArray logged;
        };
        for (const Case& c : {Case{QStringLiteral("../oben"), false, "Der Dateiname ist ungültig!"},
                              Case{QStringLiteral("a/b"), false, "Der Dateiname ist ungültig!"},
                              Case{QStringLiteral("weg"), true, "Das ausgewählte Verzeichnis konnte nicht gefunden werden!"}}) {
            TExportGridForm form(&grid.g);
            form.setStartDelay(0);
            form.show();
            find<QPushButton>(form, "RzButton2")->click();
            QTest::keyClicks(find<QLineEdit>(form, "E1"), c.name);
            chooseFolder(form, sub);
            if (c.removeFolder)
                QVERIFY(QDir(sub).removeRecursively());
            find<QPushButton>(form, "RzButton2")->click();
            QTRY_COMPARE(form.currentPage(), TExportGridForm::PageResult);
            QCOMPARE(find<QLabel>(form, "L1")->text(), QStringLiteral("Der Export wurde mit Fehlern beendet."));
            QVERIFY(QString::fromUtf8(log.logged()).contains(QString::fromUtf8(c.logged))
                    || QString::fromLatin1(log.logged()).contains(QString::fromUtf8(c.logged)));
        }
        QCOMPARE(QDir(dir.path()).entryList(QDir::Files), QStringList());
    }

    // Without a folder the home folder is used, without a name "Export_" and the date.
    void defaultTarget()
    {
        test::ErrorLogFixture log;
        Grid grid;
        QTemporaryDir home;
        const QByteArray oldHome = qgetenv("HOME");
        qputenv("HOME", home.path().toLocal8Bit());
        const ScopedFixedClock clock(QDateTime(QDate(2026, 3, 9), QTime(10, 0)));
        TExportGridForm form(&grid.g);
        const bool ok = form.ToExport();
        qputenv("HOME", oldHome);
        QVERIFY(ok);
        QVERIFY(QFile::exists(home.filePath(QStringLiteral("Export_09032026.html"))));
    }

    // "Abbrechen" asks first; "Datei nach dem Export öffnen" hands the file to the desktop.
    void cancelAndOpen()
    {
        test::ErrorLogFixture log;
        Grid grid;
        {
            TExportGridForm form(&grid.g);
            form.show();
            log.dialogs().enqueueAnswer(DialogButton::No);
            find<QPushButton>(form, "RzButton1")->click();
            QCOMPARE(log.dialogs().last().text, QStringLiteral("Exportvorgang abbrechen?"));
            QVERIFY(form.isVisible());
            log.dialogs().enqueueAnswer(DialogButton::Yes);
            find<QPushButton>(form, "RzButton1")->click();
            QVERIFY(!form.isVisible());
            QCOMPARE(form.result(), int(QDialog::Rejected));
        }
        UrlCatcher catcher;
        QDesktopServices::setUrlHandler(QStringLiteral("file"), &catcher, "open");
        QTemporaryDir dir;
        TExportGridForm form(&grid.g);
        form.setStartDelay(0);
        form.show();
        find<QRadioButton>(form, "rb3")->setChecked(true);
        find<QCheckBox>(form, "cb1")->setChecked(true);
        find<QPushButton>(form, "RzButton2")->click();
        QTest::keyClicks(find<QLineEdit>(form, "E1"), QStringLiteral("offen"));
        chooseFolder(form, dir.path());
        find<QPushButton>(form, "RzButton2")->click();
        QTRY_COMPARE(form.currentPage(), TExportGridForm::PageResult);
        QDesktopServices::unsetUrlHandler(QStringLiteral("file"));
        QCOMPARE(catcher.urls, QList<QUrl>{QUrl::fromLocalFile(dir.filePath(QStringLiteral("offen.xml")))});
    }
};

ORVANTA_TEST(TestExportWizard)
#include "tst_exportwizard.moc"
