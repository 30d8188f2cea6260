// The contact import on a real database: its window shows what a file will create, stores each
// contact whole through the contact persistence, skips what is already there, and what the
// program writes as vCards comes back as the same contacts.

#include "contacts/ContactPersistence.h"
#include "db/TDM2.h"
#include "phone/AreaCodes.h"
#include "phone/ContactCards.h"
#include "platform/Windows1252.h"
#include "tests/TestPaths.h"
#include "tests/support/ProgramTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "tools/oeimp/OEImpWindow.h"
#include "ui/rtf/RtfReader.h"

#include <QLabel>
#include <QListWidget>
#include <QProgressBar>
#include <QPushButton>
#include <QTableWidget>
#include <QTest>
#include <QTextDocument>

using namespace orvanta;
using namespace orvanta::oeimp;
using orvanta::test::ProgramTestEnv;

namespace {

template <typename T>
T* child(QWidget& w, const char* name)
{
    T* found = w.findChild<T*>(QLatin1String(name));
    if (found == nullptr)
        qFatal("no child %s", name);
    return found;
}

QDateTime testNow()
{
    return QDateTime(QDate(2024, 5, 15), QTime(12, 0));
}

// Every stored contact, loaded as the edit window loads it, in key order.
QList<TvkMiniKontakt> storedContacts(ProgramTestEnv& env)
{
    QList<TvkMiniKontakt> out;
    const int count = env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM CONTACT")).toInt();
    for (int lid = 1, found = 0; found < count && lid < 10000; ++lid) {
        if (env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM CONTACT WHERE LID = %1").arg(lid)).toInt() == 0)
            continue;
        TvkMiniKontakt c;
        if (!GetDSID_Data(env.dm(), &c, lid))
            qFatal("contact %d not loaded", lid);
        out << c;
        ++found;
    }
    return out;
}

// What a contact is, apart from its keys.
QString describe(const TvkMiniKontakt& c)
{
    QStringList parts;
    for (int f = 0; f < TvkMiniKontakt::FieldCount; ++f)
        parts << c.value(static_cast<TvkMiniKontakt::Field>(f));
    for (const TvkKommItem& e : c.KD())
        parts << e.KOMMBEZ + QLatin1Char('=') + e.LC + QLatin1Char('|') + e.VORW + QLatin1Char('|') + e.NUMBER
                + QLatin1Char('|') + e.LCVORWNUMBER;
    for (const TvkMailItem& e : c.Mail())
        parts << e.MAILADDR + QLatin1Char('|') + e.BEMERK;
    parts << QString::fromLatin1(c.notes().toHex());
    return parts.join(QLatin1Char('/'));
}

TvkKommItem number(const char* label, const char* lc, const char* vorw, const char* n)
{
    TvkKommItem e;
    e.KOMMBEZ = QString::fromUtf8(label);
    e.LC = QLatin1String(lc);
    e.VORW = QLatin1String(vorw);
    e.NUMBER = QLatin1String(n);
    e.status = EntryStatus::New;
    return e;
}

const QByteArray kTwoCards =
    "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:Jürgen Müller\r\nN:Müller;Jürgen;;Herr Dr.;\r\nORG:Müller GmbH;Einkauf\r\n"
    "TEL;TYPE=WORK:+49 30 6148273\r\nTEL;TYPE=CELL:0171 4471123\r\nEMAIL:j@mueller.example\r\n"
    "ADR;TYPE=WORK:;;Hauptstraße 1;Berlin;;10115;Deutschland\r\nCATEGORIES:Lieferanten\r\n"
    "NOTE:Ruft gern\\nvormittags an\r\nEND:VCARD\r\n"
    "BEGIN:VCARD\r\nVERSION:2.1\r\nFN:Erika Meier\r\nTEL;HOME:089 2389011\r\nEND:VCARD\r\n"
    "BEGIN:VCARD\r\nVERSION:3.0\r\nNOTE:niemand\r\nEND:VCARD\r\n"
    "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:Ohne Ende\r\nTEL:0221 9127731\r\n";

} // namespace

class TestOEImp : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        const QString folder = QStringLiteral(ORVANTA_SOURCE_DIR "/data");
        LoadGermanAereaCodes(folder);
        LoadAustriaAereaCodes(folder);
        LoadSwissAereaCodes(folder);
    }

    void previewsImportsAndSkipsDuplicates()
    {
        ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
        QVERIFY(env.writeFile(QStringLiteral("kontakte.vcf"), kTwoCards));
        OEImpWindow w(env.dm(), 1);
        OEImpWindow::setFileChooser([&](QWidget*) { return env.file(QStringLiteral("kontakte.vcf")); });
        child<QPushButton>(w, "btnChoose")->click();
        OEImpWindow::setFileChooser({});

        auto* preview = child<QTableWidget>(w, "tblPreview");
        QCOMPARE(preview->rowCount(), 3);
        QCOMPARE(preview->item(0, 0)->text(), QStringLiteral("Jürgen Müller"));
        QCOMPARE(preview->item(0, 5)->text(), QStringLiteral("Telefon geschäftlich: 0049 30 6148273; Handy: 0049 171 4471123"));
        QCOMPARE(preview->item(1, 5)->text(), QStringLiteral("Telefon privat: 0049 89 2389011"));
        QCOMPARE(child<QLabel>(w, "lblSummary")->text(),
                 QStringLiteral("3 Kontakte werden angelegt. 1 Eintrag der Datei ist kein Kontakt."));
        QStringList messages;
        for (int i = 0; i < child<QListWidget>(w, "lstMessages")->count(); ++i)
            messages << child<QListWidget>(w, "lstMessages")->item(i)->text();
        QCOMPARE(messages, (QStringList{QStringLiteral("Zeile 18: Karte ohne Namen und Nummern übersprungen"),
                                        QStringLiteral("Zeile 25: der Karte ab Zeile 22 fehlt END:VCARD")}));
        QVERIFY(child<QPushButton>(w, "btnImport")->isEnabled());

        child<QPushButton>(w, "btnImport")->click();
        QCOMPARE(child<QLabel>(w, "lblSummary")->text(), QStringLiteral("3 importiert, 1 übersprungen, 0 fehlerhaft"));
        QCOMPARE(child<QProgressBar>(w, "pbImport")->value(), 3);
        QCOMPARE(preview->item(2, 1)->text(), QStringLiteral("importiert"));
        QVERIFY(!child<QPushButton>(w, "btnImport")->isEnabled());

        const QList<TvkMiniKontakt> stored = storedContacts(env);
        QCOMPARE(stored.size(), 3);
        const TvkMiniKontakt& j = stored.at(0);
        QCOMPARE(j.CONTBEZ(), QStringLiteral("Jürgen Müller"));
        QCOMPARE(j.ANREDE() + QLatin1Char('|') + j.TITEL() + QLatin1Char('|') + j.VNAME() + QLatin1Char('|') + j.NAME(),
                 QStringLiteral("Herr|Dr.|Jürgen|Müller"));
        QCOMPARE(j.FIRMA() + QLatin1Char('|') + j.ABTEILUNG(), QStringLiteral("Müller GmbH|Einkauf"));
        QCOMPARE(j.STR() + QLatin1Char('|') + j.PLZ() + QLatin1Char('|') + j.ORT(), QStringLiteral("Hauptstraße 1|10115|Berlin"));
        // The category did not exist: it was created and the contact put into it.
        QCOMPARE(j.KATBEZ(), QStringLiteral("Lieferanten"));
        QCOMPARE(j.KD().size(), 2);
        QCOMPARE(j.KD().at(1).VORW, QStringLiteral("171"));
        QCOMPARE(j.Mail().constFirst().MAILADDR, QStringLiteral("j@mueller.example"));
        QCOMPARE(fromWindows1252(j.notes()), QStringLiteral("Ruft gern\r\nvormittags an\r\n"));

        // The same file again: everything is there already. A changed number makes a new contact.
        QByteArray again = kTwoCards;
        again.replace("089 2389011", "089 2389012");
        QVERIFY(env.writeFile(QStringLiteral("nochmal.vcf"), again));
        QVERIFY(w.openFile(env.file(QStringLiteral("nochmal.vcf"))));
        QCOMPARE(child<QLabel>(w, "lblSummary")->text(),
                 QStringLiteral("1 Kontakt wird angelegt. 2 sind schon vorhanden. 1 Eintrag der Datei ist kein Kontakt."));
        QCOMPARE(preview->item(0, 1)->text(), QStringLiteral("schon vorhanden"));
        QVERIFY(preview->item(1, 1)->text().isEmpty());
        w.runImport();
        QCOMPARE(child<QLabel>(w, "lblSummary")->text(), QStringLiteral("1 importiert, 3 übersprungen, 0 fehlerhaft"));
        QCOMPARE(preview->item(0, 1)->text(), QStringLiteral("übersprungen (schon vorhanden)"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM CONTACT")).toInt(), 4);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM KAT")).toInt(), 1);
    }

    // A contact stored with the trunk zero after its country code ("0049" "089") is the same
    // number as "+49 89 …" and is found; a different designation is another contact.
    void findsNumbersStoredInEitherForm()
    {
        ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, CONTBEZ) VALUES (1000, 'Schmidt, Anna')"));
        env.db().exec(QStringLiteral("INSERT INTO COM (LID, CID, KOMMBEZ, LC, VORW, NUMBER, VORWNUMBER, LCVORWNUMBER, "
                                     "NUMBEROF) VALUES (1000, 1000, 'Telefon', '0049', '089', '2389011', '892389011', "
                                     "'490892389011', '2389011')"));
        QVERIFY(env.writeFile(QStringLiteral("anna.vcf"),
                              "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:schmidt, anna\r\nTEL:+49 89 2389011\r\nEND:VCARD\r\n"
                              "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:Schmidt, Anne\r\nTEL:089 2389011\r\nEND:VCARD\r\n"));
        OEImpWindow w(env.dm(), 1);
        QVERIFY(w.openFile(env.file(QStringLiteral("anna.vcf"))));
        w.runImport();
        QCOMPARE(child<QLabel>(w, "lblSummary")->text(), QStringLiteral("1 importiert, 1 übersprungen, 0 fehlerhaft"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM COM")).toInt(), 2);
    }

    // A contact whose number the database refuses is not stored at all, and the rest goes on.
    void aFailedContactLeavesNothingBehind()
    {
        ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
        // The next number key is taken, so storing the first card's number fails.
        env.db().exec(QStringLiteral("INSERT INTO CONTACT (LID, CONTBEZ) VALUES (1000, 'Vorhanden')"));
        env.db().exec(QStringLiteral("INSERT INTO COM (LID, CID, NUMBER) VALUES (1, 1000, '1')"));
        QVERIFY(env.writeFile(QStringLiteral("zwei.vcf"),
                              "BEGIN:VCARD\r\nFN:Mit Nummer\r\nADR:;;Weg 1;Ort;;12345;\r\nTEL:030 1234\r\nEND:VCARD\r\n"
                              "BEGIN:VCARD\r\nFN:Ohne Nummer\r\nEMAIL:o@n.example\r\nEND:VCARD\r\n"));
        OEImpWindow w(env.dm(), 1);
        QVERIFY(w.openFile(env.file(QStringLiteral("zwei.vcf"))));
        w.runImport();
        QCOMPARE(child<QLabel>(w, "lblSummary")->text(), QStringLiteral("1 importiert, 0 übersprungen, 1 fehlerhaft"));
        auto* messages = child<QListWidget>(w, "lstMessages");
        QCOMPARE(messages->item(messages->count() - 1)->text(), QStringLiteral("Mit Nummer: konnte nicht gespeichert werden"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM CONTACT WHERE CONTBEZ = 'Mit Nummer'")).toInt(), 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM ADDR WHERE STR = 'Weg 1'")).toInt(), 0);
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM CONTACT WHERE CONTBEZ = 'Ohne Nummer'")).toInt(), 1);
    }

    void reportsUnreadableFiles()
    {
        ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
        OEImpWindow w(env.dm(), 1);
        QVERIFY(!w.openFile(env.file(QStringLiteral("fehlt.vcf"))));
        QVERIFY(child<QLabel>(w, "lblSummary")->text().startsWith(QStringLiteral("Die Datei \"")));
        QVERIFY(env.writeFile(QStringLiteral("leer.vcf"), "nur Text\r\n"));
        QVERIFY(w.openFile(env.file(QStringLiteral("leer.vcf"))));
        QVERIFY(!child<QPushButton>(w, "btnImport")->isEnabled());
        QCOMPARE(child<QListWidget>(w, "lstMessages")->item(0)->text(),
                 QStringLiteral("Zeile 1: 1 Zeilen außerhalb einer Karte übersprungen"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT COUNT(*) FROM CONTACT")).toInt(), 0);
    }

    // A note with characters the code page lacks is stored as rich text and loses none of them.
    void keepsEveryCharacterOfANote()
    {
        ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
        const QString note = QStringLiteral("Grüße aus 北京 🙂\nzweite Zeile");
        QVERIFY(env.writeFile(QStringLiteral("notiz.vcf"),
                              "BEGIN:VCARD\r\nVERSION:4.0\r\nFN:Li Wei\r\nNOTE:"
                                  + QString(note).replace(QLatin1Char('\n'), QLatin1String("\\n")).toUtf8()
                                  + "\r\nEND:VCARD\r\n"));
        OEImpWindow w(env.dm(), 1);
        QVERIFY(w.openFile(env.file(QStringLiteral("notiz.vcf"))));
        w.runImport();
        QCOMPARE(w.importedCount(), 1);
        const QByteArray stored = storedContacts(env).constFirst().notes();
        QVERIFY(RtfReader::isRtf(stored));
        QTextDocument doc;
        QVERIFY(RtfReader::read(stored, &doc));
        QCOMPARE(doc.toPlainText(), note);
    }

    void importsOutlookCsv()
    {
        ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
        QVERIFY(env.writeFile(QStringLiteral("outlook.csv"),
                              "Anrede;Vorname;Nachname;Firma;Telefon gesch\xe4" "ftlich;Mobiltelefon;E-Mail-Adresse;"
                              "Stra\xdf" "e gesch\xe4" "ftlich;Postleitzahl gesch\xe4" "ftlich;Ort gesch\xe4" "ftlich;Notizen\r\n"
                              "Frau;Erika;Meier;Meier KG;+49 221 9127731;;e@meier.example;Domplatz 1;50667;K\xf6ln;"
                              "\"zwei\r\nZeilen\"\r\n"
                              "Herr;Karl;;;;0151 22874410;;;;;\r\n"));
        OEImpWindow w(env.dm(), 1);
        QVERIFY(w.openFile(env.file(QStringLiteral("outlook.csv"))));
        w.runImport();
        QCOMPARE(w.importedCount(), 2);
        const QList<TvkMiniKontakt> stored = storedContacts(env);
        QCOMPARE(stored.at(0).CONTBEZ(), QStringLiteral("Frau Erika Meier"));
        QCOMPARE(stored.at(0).ORT(), QStringLiteral("Köln"));
        QCOMPARE(stored.at(0).KD().constFirst().VORW, QStringLiteral("221"));
        QCOMPARE(fromWindows1252(stored.at(0).notes()), QStringLiteral("zwei\r\nZeilen\r\n"));
        QCOMPARE(stored.at(1).KD().constFirst().KOMMBEZ, QStringLiteral("Handy"));
    }

    // The program's contacts written as vCards and imported into an empty database are the same.
    void exportedContactsComeBackTheSame()
    {
        QByteArray file;
        QStringList original;
        {
            ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
            env.db().exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Kunden')"));
            TvkMiniKontakt a;
            a.setCONTBEZ(QStringLiteral("Müller / Jürgen"));
            a.setANREDE(QStringLiteral("Herr"));
            a.setTITEL(QStringLiteral("Prof. Dr."));
            a.setVNAME(QStringLiteral("Jürgen"));
            a.setNAME(QStringLiteral("Müller"));
            a.setFIRMA(QStringLiteral("Müller; Söhne, KG"));
            a.setABTEILUNG(QStringLiteral("Vertrieb"));
            a.setWEBSITE(QStringLiteral("https://mueller.example/a,b"));
            a.setSTR(QStringLiteral("Hauptstraße 1"));
            a.setPLZ(QStringLiteral("10115"));
            a.setORT(QStringLiteral("Berlin"));
            a.setZUSATZ(QStringLiteral("Hinterhaus"));
            a.setLAND(QStringLiteral("Deutschland"));
            a.setBUNDESLAND(QStringLiteral("Berlin"));
            a.setKATBEZ(QStringLiteral("Kunden"));
            a.AddKD(number("Telefon", "0049", "30", "6148273"));
            a.AddKD(number("Handy", "0049", "171", "4471123"));
            a.AddKD(number("Fax Zentrale", "0043", "316", "12345"));
            TvkMailItem mail;
            mail.MAILADDR = QStringLiteral("j@mueller.example");
            mail.BEMERK = QStringLiteral("Büro");
            mail.status = EntryStatus::New;
            a.AddMail(mail);
            const QString note = QStringLiteral("Zeile 1; mit, Zeichen\nZeile 2 \\ € Ende");
            a.StoreNotes(note.split(QLatin1Char('\n')), note);
            TvkMiniKontakt b;
            b.setCONTBEZ(QStringLiteral("Straßenbau AG"));
            b.setFIRMA(QStringLiteral("Straßenbau AG"));
            b.AddKD(number("Telefon privat", "0041", "44", "1234567"));
            QVERIFY(InsertConData(env.dm(), &a));
            QVERIFY(InsertConData(env.dm(), &b));

            QList<VCardContact> cards;
            for (const TvkMiniKontakt& c : storedContacts(env)) {
                original << describe(c);
                cards << cardFromContact(c, fromWindows1252(c.notes()));
            }
            file = writeVCards(cards);
        }
        ProgramTestEnv env(testNow(), ProgramTestEnv::ErrorLogSetup::Create);
        QVERIFY(env.writeFile(QStringLiteral("export.vcf"), file));
        OEImpWindow w(env.dm(), 1);
        QVERIFY(w.openFile(env.file(QStringLiteral("export.vcf"))));
        QVERIFY(child<QListWidget>(w, "lstMessages")->count() == 0);
        w.runImport();
        QCOMPARE(child<QLabel>(w, "lblSummary")->text(), QStringLiteral("2 importiert, 0 übersprungen, 0 fehlerhaft"));
        QStringList imported;
        for (const TvkMiniKontakt& c : storedContacts(env))
            imported << describe(c);
        QCOMPARE(imported, original);
    }
};

ORVANTA_TEST(TestOEImp)
#include "tst_oeimp.moc"
