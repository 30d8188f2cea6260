#include "contacts/ContactPersistence.h"
#include "contacts/EntryEditors.h"
#include "contacts/Tcontacteditform.h"
#include "db/TDM2.h"
#include "phone/AreaCodes.h"
#include "phone/TvkMiniKontakt.h"
#include "platform/IniFile.h"
#include "tests/contacts/ContactTestEnv.h"
#include "tests/TestPaths.h"
#include "tests/support/TestRegistry.h"
#include "tests/support/TypeKeys.h"
#include "ui/rtf/RtfText.h"

#include <QAction>
#include <QApplication>
#include <QKeyEvent>
#include <QComboBox>
#include <QLineEdit>
#include <QPointer>
#include <QPushButton>
#include <QTableWidget>
#include <QTabWidget>
#include <QToolButton>
#include <QFile>
#include <QToolBar>
#include <QTest>
#include <QTextCursor>
#include <QTextEdit>
#include <QTextList>
#include <QTimer>

#include <memory>
#include <vector>

using namespace orvanta;
using orvanta::test::typeKeys;
using orvanta::test::ContactTestEnv;

namespace {

// The main window's part in the dialogue: it keeps the records and saves them on WMSAVECONDATA
// into the test's database, telling the window when that failed.
class Host final {
public:
    explicit Host(ContactTestEnv& env)
        : m_env(env)
    {
        env.host().answer = [this](const WindowMessageEvent& m) -> qintptr {
            if (m.message() != WMSAVECONDATA)
                return 0;
            kinds.append(static_cast<int>(m.lParam()));
            TvkMiniKontakt* r = records.at(static_cast<std::size_t>(m.wParam())).get();
            const bool ok = m.lParam() == 1 ? EditConData(m_env.dm(), r)
                                            : InsertConData(m_env.dm(), r, m.lParam() == 2 ? form->NewNumber() : QString());
            form->setProperty("saveFailed", !ok);
            return 0;
        };
    }

    // A window on a new record, or on the stored contact lid.
    Tcontacteditform& open(int lid = 0, const QString& caller = {}, int homeCountry = 0)
    {
        records.push_back(std::make_unique<TvkMiniKontakt>());
        if (lid > 0)
            (void)GetDSID_Data(m_env.dm(), records.back().get(), lid);
        form = new Tcontacteditform(&m_env.host(), [this](int slot) {
            return slot >= 0 && slot < static_cast<int>(records.size()) ? records.at(static_cast<std::size_t>(slot)).get()
                                                                         : nullptr;
        });
        owned.reset(form);
        form->setProperty("tag", 4);
        form->setProperty("recordSlot", static_cast<int>(records.size()) - 1);
        form->setProperty("existingContact", lid > 0);
        form->setProperty("callerNumber", caller);
        form->setProperty("saveFailed", false);
        form->setHomeCountry(homeCountry);
        form->show();
        return *form;
    }

    QLineEdit* edit(const char* name) const { return form->findChild<QLineEdit*>(QLatin1String(name)); }
    QAction* action(const char* name) const { return form->findChild<QAction*>(QLatin1String(name)); }
    TvkMiniKontakt& record() const { return *records.back(); }

    std::vector<std::unique_ptr<TvkMiniKontakt>> records;
    QList<int> kinds;
    QPointer<Tcontacteditform> form;
    std::unique_ptr<Tcontacteditform> owned;

private:
    ContactTestEnv& m_env;
};

// Types into a field as the user would (the change handlers run).
void type(QLineEdit* e, const QString& text)
{
    e->setFocus();
    e->setCursorPosition(e->text().size());
    typeKeys(e, text);
}

int closeMessages(ContactTestEnv& env)
{
    int n = 0;
    for (const auto& g : env.host().got)
        n += g.message == WMCLOSECONTACTFORM && g.wParam == 4 && g.posted ? 1 : 0;
    return n;
}

} // namespace

class TstContactEditForm : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void okNeedsAChangeAndANameAndStaysOffOnceASaveFailed()
    {
        ContactTestEnv env;
        Host host(env);
        host.open();
        QAction* ok = host.action("conedit_ok");
        QAction* take = host.action("conedit_uebern");
        QVERIFY(!ok->isEnabled());
        host.form->findChild<QComboBox*>(QStringLiteral("RzMRUCB1"))->setCurrentText(QStringLiteral("Herr"));
        QVERIFY(host.form->Modified());
        QVERIFY(!ok->isEnabled());
        type(host.edit("RzEdit9"), QStringLiteral("Nur Bezeichnung"));
        QVERIFY(!ok->isEnabled());
        type(host.edit("RzEdit4"), QStringLiteral("ACME"));
        QVERIFY(ok->isEnabled());
        QVERIFY(take->isEnabled());
        QVERIFY(host.form->findChild<QPushButton*>(QStringLiteral("RzButton3"))->isEnabled());

        host.form->setProperty("saveFailed", true);
        QVERIFY(!ok->isEnabled());
        type(host.edit("RzEdit2"), QStringLiteral("x"));
        QVERIFY(!ok->isEnabled());
        QVERIFY(!take->isEnabled());
        host.form->setProperty("saveFailed", false); // a later success does not unlock it
        QVERIFY(!ok->isEnabled());

        // The maximum lengths of the first tab, in tab order.
        const QList<QPair<const char*, int>> widths{{"RzEdit2", 30}, {"RzEdit3", 30}, {"RzEdit1", 25},
                                                    {"RzEdit4", 50}, {"RzEdit9", 80}, {"RzEdit10", 50},
                                                    {"RzEdit11", 35}, {"RzButtonEdit1", 30}, {"RzEdit5", 40},
                                                    {"RzEdit6", 10}, {"RzEdit7", 35}, {"RzEdit8", 30},
                                                    {"RzEdit12", 30}, {"RzEdit13", 30}};
        for (const auto& [name, width] : widths)
            QCOMPARE(host.edit(name)->maxLength(), width);
        QCOMPARE(host.form->findChild<QComboBox*>(QStringLiteral("RzMRUCB1"))->lineEdit()->maxLength(), 30);
    }

    void theDesignationFollowsTheNamesUntilTheUserWritesHisOwn()
    {
        ContactTestEnv env;
        Host host(env);
        host.open();
        QLineEdit* v = host.edit("RzEdit2");
        QLineEdit* n = host.edit("RzEdit3");
        QLineEdit* f = host.edit("RzEdit4");
        QLineEdit* d = host.edit("RzEdit9");
        type(v, QStringLiteral(" Hans")); // a leading blank is not taken
        type(n, QStringLiteral("Huber"));
        QCOMPARE(d->text(), QStringLiteral("Huber, Hans"));
        type(f, QStringLiteral("ACME"));
        QCOMPARE(d->text(), QStringLiteral("ACME / Huber, Hans"));
        d->setText(QStringLiteral("Mein Text"));
        type(n, QStringLiteral("r"));
        QCOMPARE(d->text(), QStringLiteral("Mein Text"));
        d->setText(QStringLiteral("ACME / Huberr, Hans"));
        type(n, QStringLiteral("t"));
        QCOMPARE(d->text(), QStringLiteral("ACME / Huberrt, Hans"));
        QCOMPARE(Tcontacteditform::BuildContBez({}, {}, QStringLiteral("F")), QStringLiteral("F"));
        QCOMPARE(Tcontacteditform::BuildContBez(QStringLiteral("V"), {}, QStringLiteral("F")), QStringLiteral("F / V"));
        QCOMPARE(Tcontacteditform::BuildContBez(QString(50, u'F'), QString(30, u'N'), QString(30, u'V')).size(), 80);
    }

    void aCallersNumberBecomesTheFirstEntry()
    {
        LoadGermanAereaCodes(QStringLiteral(ORVANTA_SOURCE_DIR "/data"));
        ContactTestEnv env;
        {
            Host host(env);
            host.open(0, QStringLiteral("0049891234567"));
            QCOMPARE(host.record().KD().size(), 1);
            const TvkKommItem& e = host.record().KD().at(0);
            QCOMPARE(e.KOMMBEZ, QStringLiteral("Telefon"));
            QCOMPARE(e.LC, QStringLiteral("0049"));
            QCOMPARE(e.VORW, QStringLiteral("89"));
            QCOMPARE(e.NUMBER, QStringLiteral("1234567"));
            QCOMPARE(e.BEMERKUNG, QStringLiteral("München"));
            QCOMPARE(e.status, EntryStatus::New);
            auto* grid = host.form->findChild<QTableWidget*>(QStringLiteral("SG1"));
            QCOMPARE(grid->item(0, 1)->text(), QStringLiteral("Telefon"));
            QCOMPARE(grid->item(0, 6)->text(), QStringLiteral("0"));
            QVERIFY(grid->isColumnHidden(6));
            QVERIFY(grid->item(0, 4)->textAlignment() & Qt::AlignRight);
            QVERIFY(!host.form->Modified());
        }
        {
            Host host(env);
            host.open(0, QStringLiteral("0891234567"), 1);
            QCOMPARE(host.record().KD().at(0).LC, QString());
            QCOMPARE(host.record().KD().at(0).VORW, QStringLiteral("089"));
        }
        {
            Host host(env);
            host.open(0, QStringLiteral("99912345678901234567"), 0);
            QCOMPARE(host.record().KD().at(0).LC, QString());
            QCOMPARE(host.record().KD().at(0).NUMBER, QStringLiteral("999123456789012"));
        }
    }

    void uebernehmenSendsNewThenEditAndTheDatabaseFollows()
    {
        ContactTestEnv env;
        Host host(env);
        host.open(0, QStringLiteral("0301234"));
        type(host.edit("RzEdit3"), QStringLiteral("Müller"));
        // Pasted line breaks and control characters do not reach the database.
        host.edit("RzEdit7")->insert(QStringLiteral("Köln\r\nMitte\t€"));
        host.action("conedit_uebern")->trigger();
        QCOMPARE(host.kinds, QList<int>{2});
        QCOMPARE(host.form->EditMode(), 1);
        QVERIFY(!host.form->Modified());
        const int lid = host.record().LID();
        QVERIFY(lid > 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT NAME FROM CONTACT WHERE LID = %1").arg(lid)).toString(),
                 QStringLiteral("Müller"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT ORT FROM ADDR WHERE CID = %1").arg(lid)).toString(),
                 QStringLiteral("Köln  Mitte €"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM COM WHERE CID = %1").arg(lid)).toInt(), 1);

        // Deleting a number hides it at once; saving removes it.
        auto* grid = host.form->findChild<QTableWidget*>(QStringLiteral("SG1"));
        grid->setCurrentCell(0, 1);
        env.dialogs().enqueueAnswer(DialogButton::Yes);
        host.form->DelComData();
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Kommunikationsdaten \"Telefon\" löschen?"));
        QCOMPARE(env.dialogs().last().kind, DialogKind::Warning);
        QVERIFY(grid->item(0, 1) == nullptr || grid->item(0, 1)->text().isEmpty());
        type(host.edit("RzEdit2"), QStringLiteral("Eva"));
        host.action("conedit_ok")->trigger();
        QCOMPARE(host.kinds, (QList<int>{2, 1}));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM COM WHERE CID = %1").arg(lid)).toInt(), 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT CONTBEZ FROM CONTACT WHERE LID = %1").arg(lid)).toString(),
                 QStringLiteral("Müller, Eva"));
        QVERIFY(!host.form->isVisible());
        QTRY_COMPARE(closeMessages(env), 1);
    }

    void aFailedSaveKeepsTheWindowAndEverythingTyped()
    {
        ContactTestEnv env;
        env.add(5, QStringLiteral("Huber"));
        Host host(env);
        host.open(5);
        QCOMPARE(host.edit("RzEdit9")->text(), QStringLiteral("Huber"));
        type(host.edit("RzEdit4"), QStringLiteral("Getippte Firma"));
        // Another program deletes the contact meanwhile.
        env.db().exec(QStringLiteral("EXECUTE PROCEDURE P_CONT_DELETE(5)"));
        host.action("conedit_ok")->trigger();
        QCOMPARE(host.kinds, QList<int>{1});
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Orvanta - EditConData\r\n")));
        QVERIFY(host.form->isVisible());
        QVERIFY(host.form->SaveLocked());
        QCOMPARE(host.edit("RzEdit4")->text(), QStringLiteral("Getippte Firma"));
        QVERIFY(!host.action("conedit_ok")->isEnabled());
        QCOMPARE(closeMessages(env), 0);
        // Cancelling stays possible.
        host.action("conedit_exit")->trigger();
        QTRY_COMPARE(closeMessages(env), 1);
    }

    void numbersAndMailsAreEditedThroughTheirEditors()
    {
        ContactTestEnv env;
        env.add(5, QStringLiteral("Huber"));
        env.addNumber(51, 5, {}, QStringLiteral("030"), QStringLiteral("111"), QStringLiteral("Büro"), 1, {});
        env.addMail(61, 5, QStringLiteral("a@h.de"), {});
        Host host(env);
        host.open(5);
        auto* grid = host.form->findChild<QTableWidget*>(QStringLiteral("SG1"));
        QVERIFY(!grid->item(0, 0)->icon().isNull()); // auto-reject mark
        grid->setCurrentCell(0, 1);
        QTimer::singleShot(0, [] {
            auto* editor = qobject_cast<Tcomeditform*>(QApplication::activeModalWidget());
            QVERIFY(editor);
            QCOMPARE(editor->findChild<QLineEdit*>(QStringLiteral("RzEdit4"))->text(), QStringLiteral("111"));
            editor->findChild<QLineEdit*>(QStringLiteral("RzEdit4"))->setText(QStringLiteral("222"));
            editor->findChild<QPushButton*>(QStringLiteral("RzButton1"))->click();
        });
        host.form->EditComData();
        QCOMPARE(host.record().KD().at(0).NUMBER, QStringLiteral("222"));
        QCOMPARE(host.record().KD().at(0).status, EntryStatus::Changed);
        QCOMPARE(grid->item(0, 4)->text(), QStringLiteral("222"));
        QVERIFY(host.form->Modified());

        // "Abbrechen" in the editor changes nothing.
        QTimer::singleShot(0, [] {
            auto* editor = qobject_cast<Tmaileditform*>(QApplication::activeModalWidget());
            QVERIFY(editor);
            editor->findChild<QLineEdit*>(QStringLiteral("RzEdit2"))->setText(QStringLiteral("x@y.de"));
            editor->findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
        });
        host.form->NewMailData();
        QCOMPARE(host.record().Mail().size(), 1);

        QTimer::singleShot(0, [] {
            auto* editor = qobject_cast<Tmaileditform*>(QApplication::activeModalWidget());
            QVERIFY(editor);
            editor->findChild<QLineEdit*>(QStringLiteral("RzEdit2"))->setText(QStringLiteral("neu@h.de"));
            editor->findChild<QPushButton*>(QStringLiteral("RzButton1"))->click();
        });
        host.form->NewMailData();
        QCOMPARE(host.record().Mail().size(), 2);
        QCOMPARE(host.record().Mail().at(1).status, EntryStatus::New);
        host.action("conedit_ok")->trigger();
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT NUMBER FROM COM WHERE LID = 51")).toString(),
                 QStringLiteral("222"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM E_MAIL WHERE CID = 5")).toInt(), 2);
    }

    void aFormattedNoteSurvivesSaveAndReload()
    {
        ContactTestEnv env;
        Host host(env);
        host.open();
        type(host.edit("RzEdit3"), QStringLiteral("Notiz"));
        QTextEdit* note = host.form->noteEditor();
        host.form->findChild<QTabWidget*>(QStringLiteral("AdvPageControl1"))->setCurrentIndex(3);
        QVERIFY(note->isVisible());
        QCOMPARE(host.form->findChildren<QToolBar*>().size(), 6);
        for (QToolBar* tb : host.form->findChildren<QToolBar*>())
            QVERIFY(tb->isVisible());
        QTextCursor c(note->document());
        QTextCharFormat bold;
        bold.setFontWeight(QFont::Bold);
        c.insertText(QStringLiteral("Fett äöü ß €"), bold);
        c.insertBlock();
        c.createList(QTextListFormat::ListDisc);
        QTextCharFormat red;
        red.setForeground(QColor(Qt::red));
        c.insertText(QStringLiteral("Punkt in Rot"), red);
        c.insertBlock();
        QTextBlockFormat right;
        right.setAlignment(Qt::AlignRight);
        c.setBlockFormat(right);
        c.insertText(QStringLiteral("rechts"));
        const QByteArray before = RtfText::content(*note);
        host.action("conedit_uebern")->trigger();
        QVERIFY(host.record().LID() > 0);

        TvkMiniKontakt stored;
        QVERIFY(GetDSID_Data(env.dm(), &stored, host.record().LID()));
        QTextEdit reloaded;
        reloaded.setFont(note->font());
        RtfText::setContent(&reloaded, stored.notes());
        QCOMPARE(RtfText::content(reloaded), before);
        QCOMPARE(RtfText::content(*note), before); // the window shows what was stored

        // The tool bar follows the selection.
        QTextCursor at(note->document());
        at.movePosition(QTextCursor::End);
        note->setTextCursor(at);
        QVERIFY(host.action("dxBB13")->isChecked());
        QVERIFY(!host.action("dxBB12")->isChecked());
        at.movePosition(QTextCursor::Start);
        at.movePosition(QTextCursor::Right);
        note->setTextCursor(at);
        QVERIFY(host.action("dxBB7")->isChecked());
        QVERIFY(host.action("dxBB11")->isChecked());
        host.action("dxBB12")->trigger();
        QCOMPARE(note->alignment() & Qt::AlignHorizontal_Mask, Qt::AlignHCenter);

        // An empty note leaves the record's note empty; blanks are kept.
        note->clear();
        GetDataToSaveThroughOk(host);
        QVERIFY(host.record().notes().isEmpty());
    }

    void theSalutationHistoryKeepsTwentyAndSurvivesDamage()
    {
        ContactTestEnv env;
        QByteArray big = "[Anrede]\r\n1_Count=500\r\n";
        for (int i = 0; i < 500; ++i)
            big += "1_Item" + QByteArray::number(i) + "=Anrede " + QByteArray::number(i) + "\r\n";
        env.writeFile(QStringLiteral("mru"), big);
        {
            Host host(env);
            host.open();
            QCOMPARE(host.form->salutationHistory().size(), 20);
            auto* box = host.form->findChild<QComboBox*>(QStringLiteral("RzMRUCB1"));
            for (const QString& fixed : Tcontacteditform::fixedSalutations())
                QVERIFY(box->findText(fixed) >= 0);
            box->setCurrentText(QStringLiteral("Frau Dr."));
            host.form->close();
        }
        IniFile mru(env.file(QStringLiteral("mru")));
        QCOMPARE(mru.readInteger(QStringLiteral("Anrede"), QStringLiteral("1_Count"), -1), 20);
        QCOMPARE(mru.readString(QStringLiteral("Anrede"), QStringLiteral("1_Item0")), QStringLiteral("Frau Dr."));
        QCOMPARE(mru.keys(QStringLiteral("Anrede")).size(), 21);

        env.writeFile(QStringLiteral("mru"), QByteArray("\x00\xff[Anrede\r\n1_Count=x\r\n1_Item0=\x01\x02", 30));
        Host host(env);
        host.open();
        QVERIFY(host.form->salutationHistory().isEmpty());
        host.form->close();
        QTRY_COMPARE(closeMessages(env), 2);
    }

    void categoryPrintAndNoteFilesGoThroughTheirSeams()
    {
        ContactTestEnv env;
        env.add(5, QStringLiteral("Huber"), {}, QStringLiteral("Kunden"));
        Host host(env);
        host.open(5);
        QCOMPARE(host.edit("RzButtonEdit1")->text(), QStringLiteral("Kunden"));
        // Taken over from the category manager without counting as the user's change.
        host.form->KatHasChanged(QStringLiteral("Stammkunden"));
        QCOMPARE(host.edit("RzButtonEdit1")->text(), QStringLiteral("Stammkunden"));
        QCOMPARE(host.record().KATBEZ(), QStringLiteral("Stammkunden"));
        QVERIFY(!host.form->Modified());
        // Picking one is the user's change.
        auto* pick = host.form->findChild<QToolButton*>(QStringLiteral("RzButtonEdit1Button"));
        pick->click(); // no category manager installed: nothing happens
        QVERIFY(!host.form->Modified());
        Tcontacteditform::setCategoryPicker([](QWidget*) { return QStringLiteral("Lieferanten"); });
        pick->click();
        Tcontacteditform::setCategoryPicker({});
        QCOMPARE(host.edit("RzButtonEdit1")->text(), QStringLiteral("Lieferanten"));
        QVERIFY(host.form->Modified());

        // Printing needs a designation; a failing report is written to the error log.
        host.edit("RzEdit9")->clear();
        host.action("dxBB3")->trigger();
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Bitte geben Sie erst eine Kontaktbezeichnung ein."));
        QCOMPARE(env.dialogs().last().kind, DialogKind::Warning);
        host.edit("RzEdit9")->setText(QStringLiteral("Huber"));
        host.form->noteEditor()->setPlainText(QStringLiteral("Rückruf"));
        QString printed;
        QByteArray rtf;
        Tcontacteditform::setNotePrinter([&](const QString& designation, const QByteArray& content) {
            printed = designation;
            rtf = content;
            return NotePrintResult{QStringLiteral("NO_REPORT_ASSIGNED"), 7, QStringLiteral("kein Bericht")};
        });
        host.action("dxBB3")->trigger();
        Tcontacteditform::setNotePrinter({});
        QCOMPARE(printed, QStringLiteral("Huber"));
        QVERIFY(rtf.startsWith("{\\rtf1"));
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Methode: NotizDruck\r\nError: NO_REPORT_ASSIGNED\r\n"
                                                           "Error-Number: 7\r\nkein Bericht"));
        QVERIFY(env.errorLogText().contains(QStringLiteral("Error-Number: 7")));

        // Saving asks before overwriting; opening reads rich or plain text.
        const QString path = env.file(QStringLiteral("notiz.rtf"));
        QList<bool> asked;
        Tcontacteditform::setFileChooser([&](QWidget*, bool save, const QString&, const QString& filter) {
            asked.append(save);
            [&] { QCOMPARE(filter, QStringLiteral("Richtext (*.rtf);;Text (*.txt)")); }();
            return path;
        });
        host.action("dxBB2")->trigger();
        QVERIFY(QFile::exists(path));
        host.form->noteEditor()->setPlainText(QStringLiteral("anders"));
        env.dialogs().enqueueAnswer(DialogButton::No);
        host.action("dxBB2")->trigger();
        QCOMPARE(env.dialogs().last().text, QStringLiteral("Überschreiben?"));
        host.action("dxBB1")->trigger();
        Tcontacteditform::setFileChooser({});
        QCOMPARE(asked, (QList<bool>{true, true, false}));
        QCOMPARE(host.form->noteEditor()->toPlainText(), QStringLiteral("Rückruf"));
    }

    void fieldsFollowInTabOrder()
    {
        ContactTestEnv env;
        Host host(env);
        host.open();
        QStringList order;
        QWidget* w = host.form->findChild<QComboBox*>(QStringLiteral("RzMRUCB1"));
        for (int i = 0; i < 11 && w; ++i) {
            order << w->objectName();
            do
                w = w->nextInFocusChain();
            while (w && ((w->focusPolicy() & Qt::TabFocus) != Qt::TabFocus || w->objectName().isEmpty()));
        }
        QCOMPARE(order, (QStringList{QStringLiteral("RzMRUCB1"), QStringLiteral("RzEdit2"), QStringLiteral("RzEdit3"),
                                     QStringLiteral("RzEdit1"), QStringLiteral("RzEdit4"), QStringLiteral("RzEdit9"),
                                     QStringLiteral("RzBitBtn1"), QStringLiteral("RzEdit10"), QStringLiteral("RzEdit11"),
                                     QStringLiteral("RzButtonEdit1"), QStringLiteral("RzButtonEdit1Button")}));
    }

    void aTenMegabyteNoteIsStoredAndReadBack()
    {
        ContactTestEnv env;
        TvkMiniKontakt r;
        r.setNAME(QStringLiteral("Viel"));
        QByteArray note = "{\\rtf1\\ansi ";
        // Long paragraphs: the size is the point, not the number of lines.
        const QByteArray paragraph = QByteArray("Zeile mit Text \\'e4\\'f6\\'fc ").repeated(100) + "\\par\r\n";
        while (note.size() < 10 * 1024 * 1024)
            note += paragraph;
        note += "}";
        r.StoreNotes(note, QStringLiteral("x"));
        QVERIFY(InsertConData(env.dm(), &r));
        QCOMPARE(r.notes(), note);
        Host host(env);
        host.open(r.LID());
        QVERIFY(host.form->noteEditor()->toPlainText().startsWith(QStringLiteral("Zeile mit Text äöü")));
        QVERIFY(!host.form->DataError());
    }

private:
    static void GetDataToSaveThroughOk(Host& host)
    {
        type(host.edit("RzEdit2"), QStringLiteral("x"));
        host.action("conedit_uebern")->trigger();
    }
};

ORVANTA_TEST(TstContactEditForm)
#include "tst_contacteditform.moc"
