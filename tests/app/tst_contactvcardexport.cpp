// "Als vCard exportieren..." in the contact list: the contacts the list shows, in its order, as
// one vCard 4.0 file with their numbers, addresses, category and the note as plain text.

#include "app/ContactVCardExport.h"
#include "app/MainWindowFeatures.h"
#include "app/TLogform.h"
#include "contacts/Tcontactlistframe.h"
#include "phone/VCard.h"
#include "tests/app/AppTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"

#include <QAction>
#include <QFile>
#include <QMenu>
#include <QTest>

using namespace orvanta;
using orvanta::test::AppTestEnv;

class TestContactVCardExport final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void writesTheShownContacts()
    {
        AppTestEnv env;
        env.db().exec(QStringLiteral(
            "INSERT INTO CONTACT (LID, ANREDE, TITEL, VNAME, NAME, FIRMA, CONTBEZ, WEBSITE, NOTIZ) VALUES "
            "(1, 'Herr', 'Dr.', 'Jürgen', 'Müller', 'Müller; Söhne', 'Müller, Jürgen', 'https://m.example', "
            "'{\\rtf1\\ansi\\ansicpg1252 Erste Zeile\\par zweite \\b fett\\b0\\par}')"));
        env.db().exec(QStringLiteral("INSERT INTO ADDR (LID, CID, STR, PLZ, ORT) VALUES (1, 1, 'Hauptstraße 1', '10115', 'Berlin')"));
        env.db().exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Kunden')"));
        env.db().exec(QStringLiteral("INSERT INTO CONKAT (LID, CID, KID) VALUES (1, 1, 1)"));
        env.db().exec(QStringLiteral("INSERT INTO COM (LID, CID, KOMMBEZ, LC, VORW, NUMBER) VALUES "
                                     "(1, 1, 'Handy', '0049', '0171', '4471123')"));
        env.db().exec(QStringLiteral("INSERT INTO E_MAIL (LID, CID, MAILADDR, BEMERK) VALUES (1, 1, 'j@m.example', 'Büro')"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ, NOTIZ) VALUES (2, 'Meier', 'Meier', 'schlicht')"));
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, NAME, CONTBEZ) VALUES (3, 'Zander', 'Zander')"));
        TLogform& w = env.window({}, defaultMainWindowFeatures());
        w.show();
        w.findChild<QAction*>(QStringLiteral("dxBB_Ansicht_Kontakte"))->trigger();
        auto* frame = qobject_cast<Tcontactlistframe*>(w.contactFrame());
        QVERIFY(frame && frame->isConnected());

        // The entry follows "Löschen" in the context menu.
        QStringList entries;
        for (QAction* a : frame->popupMenu()->actions())
            entries << a->objectName();
        const qsizetype at = entries.indexOf(QStringLiteral("cv_vcardexport"));
        QVERIFY(at > 0);
        QCOMPARE(entries.at(at - 2), QStringLiteral("cv_deletecont"));
        QAction* action = frame->findChild<QAction*>(QStringLiteral("cv_vcardexport"));
        QCOMPARE(action->text(), QStringLiteral("Als vCard exportieren..."));

        // Only "M" is shown: Zander stays out.
        frame->SetNewFilter(13);
        QCOMPARE(frame->controller()->recordCount(), 2);
        const QString path = env.file(QStringLiteral("kontakte.vcf"));
        setVCardFileChooser([&](QWidget*) { return path; });
        action->trigger();
        setVCardFileChooser({});
        QTRY_COMPARE(env.dialogs().count(), 1);
        QCOMPARE(env.dialogs().texts().last(), QStringLiteral("2 Kontakte wurden in \"%1\" gespeichert.").arg(path));

        QFile file(path);
        QVERIFY(file.open(QIODevice::ReadOnly));
        const QByteArray bytes = file.readAll();
        QVERIFY(bytes.startsWith("BEGIN:VCARD\r\nVERSION:4.0\r\n"));
        const VCardReadResult read = readVCards(bytes);
        QVERIFY(read.messages.isEmpty());
        QCOMPARE(read.cards.size(), 2);
        // In the list's order: by designation.
        QCOMPARE(read.cards.at(0).formattedName, QStringLiteral("Meier"));
        QCOMPARE(read.cards.at(0).note, QStringLiteral("schlicht"));
        const VCardContact& m = read.cards.at(1);
        QCOMPARE(m.formattedName, QStringLiteral("Müller, Jürgen"));
        QCOMPARE(m.prefix, QStringLiteral("Herr Dr."));
        QCOMPARE(m.organization, QStringLiteral("Müller; Söhne"));
        QCOMPARE(m.phones.size(), 1);
        QCOMPARE(m.phones.constFirst().value, QStringLiteral("+49 171 4471123"));
        QCOMPARE(m.phones.constFirst().types, QStringList{QStringLiteral("cell")});
        QCOMPARE(m.emails.constFirst().label, QStringLiteral("Büro"));
        QCOMPARE(m.addresses.constFirst().street, QStringLiteral("Hauptstraße 1"));
        QCOMPARE(m.urls, QStringList{QStringLiteral("https://m.example")});
        QCOMPARE(m.categories, QStringList{QStringLiteral("Kunden")});
        QCOMPARE(m.note, QStringLiteral("Erste Zeile\nzweite fett")); // rich text as its text

        // A file that cannot be written: said so, nothing else happens.
        QCOMPARE(exportShownContacts(*frame, env.dm(), env.file(QStringLiteral("fehlt/x.vcf"))), -1);
        QTRY_COMPARE(env.dialogs().count(), 2);
        QVERIFY(env.dialogs().texts().last().startsWith(QStringLiteral("Die Datei")));
    }
};

ORVANTA_TEST(TestContactVCardExport)
#include "tst_contactvcardexport.moc"
