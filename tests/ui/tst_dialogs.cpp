#include "ui/dialogs/BusyCursor.h"
#include "platform/Clock.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "ui/dialogs/MessageBoxDialogService.h"
#include "platform/ProgramFolder.h"
#include "tests/support/ScriptedDialogService.h"
#include "tests/support/TestRegistry.h"

#include <QApplication>
#include <QMessageBox>
#include <QPushButton>
#include <QTest>
#include <QTimer>

using namespace orvanta;

class TestDialogs : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void scriptedAnswersComeFromTheQueueThenTheDefault()
    {
        test::ScopedScriptedDialogs scripted;
        auto& service = scripted.service();
        service.enqueueAnswer(DialogButton::No);
        QCOMPARE(dialogs().question(QStringLiteral("Wirklich?")), DialogButton::No);
        QCOMPARE(dialogs().question(QStringLiteral("Nochmal?"), DialogButton::Yes | DialogButton::No | DialogButton::Cancel,
                                    DialogButton::Cancel),
                 DialogButton::Cancel);
        service.setDefaultAnswer(DialogButton::Yes);
        QCOMPARE(dialogs().question(QStringLiteral("Und?"), DialogButton::Yes | DialogButton::No, DialogButton::No),
                 DialogButton::Yes);
        dialogs().error(QStringLiteral("kaputt"));

        QCOMPARE(service.count(), 4);
        QCOMPARE(service.count(DialogKind::Question), 3);
        QCOMPARE(service.last().title, QStringLiteral("Fehler"));
        QCOMPARE(service.texts(DialogKind::Error), QStringList{QStringLiteral("kaputt")});
    }

    void installingRestoresThePreviousService()
    {
        DialogService* real = &dialogs();
        {
            test::ScopedScriptedDialogs outer;
            {
                test::ScopedScriptedDialogs inner;
                dialogs().information(QStringLiteral("innen"));
                QCOMPARE(inner.service().count(), 1);
            }
            dialogs().information(QStringLiteral("außen"));
            QCOMPARE(outer.service().count(), 1);
        }
        QCOMPARE(&dialogs(), real);
    }

    void messageBoxHasGermanButtonsAndReturnsTheClick()
    {
        QStringList buttonTexts;
        QString boxText;
        QTimer::singleShot(0, this, [&] {
            auto* box = qobject_cast<QMessageBox*>(QApplication::activeModalWidget());
            QVERIFY(box != nullptr);
            boxText = box->text();
            QPushButton* no = nullptr;
            for (QAbstractButton* button : box->buttons()) {
                buttonTexts.append(button->text());
                if (button->text() == QStringLiteral("Nein"))
                    no = qobject_cast<QPushButton*>(button);
            }
            QVERIFY(no != nullptr);
            no->click();
        });
        MessageBoxDialogService real;
        const DialogButton answer = real.show(DialogKind::Question, {}, QStringLiteral("Zeile 1\r\nZeile 2"),
                                              DialogButton::Yes | DialogButton::No | DialogButton::Cancel,
                                              DialogButton::Yes);
        QCOMPARE(answer, DialogButton::No);
        buttonTexts.sort();
        QCOMPARE(buttonTexts, QStringList({QStringLiteral("Abbrechen"), QStringLiteral("Ja"), QStringLiteral("Nein")}));
        QCOMPARE(boxText, QStringLiteral("Zeile 1\nZeile 2"));

        QTimer::singleShot(0, this, [] {
            if (QWidget* box = QApplication::activeModalWidget())
                QTest::keyClick(box, Qt::Key_Escape);
        });
        QCOMPARE(real.show(DialogKind::Error, {}, QStringLiteral("x"), DialogButton::Ok, DialogButton::Ok), DialogButton::Ok);
    }

    void busyCursorNestsAndResets()
    {
        QVERIFY(!BusyCursor::isBusy());
        {
            BusyCursor outer;
            {
                BusyCursor inner;
                QVERIFY(BusyCursor::isBusy());
            }
            QVERIFY(BusyCursor::isBusy());
            BusyCursor::resetCursor();
            QVERIFY(!BusyCursor::isBusy());
            BusyCursor later;
            QVERIFY(BusyCursor::isBusy());
        }
        // The scope made before the reset did not pop anything of its own after it.
        QVERIFY(QGuiApplication::overrideCursor() == nullptr);
    }

    void anErrorReportEndsTheHourglass()
    {
        test::ScopedScriptedDialogs scripted;
        BusyCursor::setHourglass();
        BusyCursor::setHourglass();
        QVERIFY(BusyCursor::isBusy());
        TvkErrorLog log(QDir::tempPath() + u'/', 0, QStringLiteral("orvanta-tst-dialogs.log"));
        log.ShowError(QStringLiteral("kaputt"));
        QVERIFY(!BusyCursor::isBusy());
        QVERIFY(scripted.service().texts(DialogKind::Error).contains(QStringLiteral("kaputt")));
        QFile::remove(QDir::tempPath() + QStringLiteral("/orvanta-tst-dialogs.log"));
    }

    void withoutAnInstalledServiceNothingBlocks()
    {
        // Command-line tools and early start-up have no message boxes: the answer is the one
        // closing the box gives, at once.
        QVERIFY(setDialogService(nullptr) == nullptr);
        QCOMPARE(dialogs().question(QStringLiteral("Weiter?"), DialogButton::Yes | DialogButton::No), DialogButton::No);
        QCOMPARE(dialogs().question(QStringLiteral("Weiter?"), DialogButton::Yes | DialogButton::No | DialogButton::Cancel),
                 DialogButton::Cancel);
    }

    void programFolderAndClockAreReplaceable()
    {
        QCOMPARE(programFolder(), QCoreApplication::applicationDirPath() + u'/');
        setProgramFolder(QStringLiteral("/tmp/prog"));
        QCOMPARE(programFile(QStringLiteral("OScheme")), QStringLiteral("/tmp/prog/OScheme"));
        setProgramFolder(QString());
        QCOMPARE(programFolder(), QCoreApplication::applicationDirPath() + u'/');

        const QDateTime moment(QDate(2023, 12, 31), QTime(23, 59, 59));
        {
            ScopedFixedClock fixed(moment);
            QCOMPARE(Clock::now(), moment);
            QCOMPARE(Clock::today(), QDate(2023, 12, 31));
        }
        QVERIFY(!Clock::isFixed());
        QVERIFY(qAbs(Clock::now().secsTo(QDateTime::currentDateTime())) < 5);
    }
};

ORVANTA_TEST(TestDialogs)
#include "tst_dialogs.moc"
