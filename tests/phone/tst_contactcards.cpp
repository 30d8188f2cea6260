#include "phone/AreaCodes.h"
#include "phone/ContactCards.h"
#include "phone/ContactCsv.h"
#include "tests/TestPaths.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;

namespace {

QString parts(const NumberParts& p)
{
    return p.LC + QLatin1Char('|') + p.VORW + QLatin1Char('|') + p.NUMBER;
}

QStringList kd(const TvkMiniKontakt& c)
{
    QStringList out;
    for (const TvkKommItem& e : c.KD())
        out << e.KOMMBEZ + QLatin1Char('=') + e.LC + QLatin1Char('|') + e.VORW + QLatin1Char('|') + e.NUMBER;
    return out;
}

} // namespace

class TestContactCards : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        const QString folder = QStringLiteral(ORVANTA_SOURCE_DIR "/data");
        LoadGermanAereaCodes(folder);
        LoadAustriaAereaCodes(folder);
        LoadSwissAereaCodes(folder);
    }

    void splitsNumbers_data()
    {
        QTest::addColumn<QString>("written");
        QTest::addColumn<int>("home");
        QTest::addColumn<QString>("expected");
        QTest::newRow("international") << "+49 30 6148273" << 1 << "0049|30|6148273";
        QTest::newRow("trunk zero in brackets") << "+49 (0)89 / 123-456" << 1 << "0049|89|123456";
        QTest::newRow("double zero") << "0049-221-9127731" << 1 << "0049|221|9127731";
        QTest::newRow("national, home Germany") << "030 6148273" << 1 << "0049|30|6148273";
        QTest::newRow("national, home Austria") << "0316 123456" << 2 << "0043|316|123456";
        QTest::newRow("Swiss from Germany") << "+41 44 1234567" << 1 << "0041|44|1234567";
        QTest::newRow("German mobile") << "+49 171 4471123" << 1 << "0049|171|4471123";
        QTest::newRow("Austrian mobile") << "0043 664 1234567" << 1 << "0043|664|1234567";
        QTest::newRow("other country") << "+33 1 23 45 67 89" << 1 << "||0033123456789";
        QTest::newRow("local") << "61 48 273" << 1 << "||6148273";
        QTest::newRow("no digits") << "n/a" << 1 << "||";
    }

    void splitsNumbers()
    {
        QFETCH(QString, written);
        QFETCH(int, home);
        QFETCH(QString, expected);
        const NumberParts p = splitDialledNumber(written, home);
        QCOMPARE(parts(p), expected);
        // The international form splits back into the same parts.
        TvkKommItem item;
        item.LC = p.LC;
        item.VORW = p.VORW;
        item.NUMBER = p.NUMBER;
        QCOMPARE(parts(splitDialledNumber(writtenNumber(item), home)), expected);
    }

    // A card from elsewhere: every value lands in its column, and what has no column of its own
    // goes into the note instead of being lost.
    void makesContactsOfCards()
    {
        VCardContact card;
        card.formattedName = QStringLiteral("Dr. Jürgen Müller");
        card.familyName = QStringLiteral("Müller");
        card.givenName = QStringLiteral("Jürgen");
        card.prefix = QStringLiteral("Herr Prof. Dr.");
        card.organization = QStringLiteral("Müller GmbH");
        card.department = QStringLiteral("Einkauf");
        card.title = QStringLiteral("Leiter");
        card.urls = {QStringLiteral("https://mueller.example"), QStringLiteral("https://blog.example")};
        card.addresses << VCardAddress{{}, QStringLiteral("Postfach 7"), QStringLiteral("Hinterhaus"),
                                       QStringLiteral("Hauptstraße 1"), QStringLiteral("Berlin"), QStringLiteral("Berlin"),
                                       QStringLiteral("10115"), QStringLiteral("Deutschland")}
                       << VCardAddress{{QStringLiteral("home")}, {}, {}, QStringLiteral("Seeweg 2"),
                                       QStringLiteral("Potsdam"), {}, QStringLiteral("14467"), {}};
        card.phones << VCardTyped{QStringLiteral("+49 30 6148273"), {QStringLiteral("work")}, {}}
                    << VCardTyped{QStringLiteral("0171 4471123"), {QStringLiteral("cell")}, {}}
                    << VCardTyped{QStringLiteral("030 999"), {}, QStringLiteral("Zentrale")}
                    << VCardTyped{QStringLiteral("unbekannt"), {}, {}};
        card.emails << VCardTyped{QStringLiteral("j@mueller.example"), {}, QStringLiteral("Büro")}
                    << VCardTyped{QString(41, QLatin1Char('x')), {}, {}};
        card.note = QStringLiteral("Notiz");
        card.categories = {QStringLiteral("Kunden"), QStringLiteral("VIP")};

        const CardImport made = contactFromCard(card, 1);
        const TvkMiniKontakt& c = made.contact;
        QCOMPARE(c.CONTBEZ(), card.formattedName);
        QCOMPARE(c.ANREDE(), QStringLiteral("Herr"));
        QCOMPARE(c.TITEL(), QStringLiteral("Prof. Dr."));
        QCOMPARE(c.VNAME(), QStringLiteral("Jürgen"));
        QCOMPARE(c.NAME(), QStringLiteral("Müller"));
        QCOMPARE(c.FIRMA(), QStringLiteral("Müller GmbH"));
        QCOMPARE(c.ABTEILUNG(), QStringLiteral("Einkauf"));
        QCOMPARE(c.WEBSITE(), QStringLiteral("https://mueller.example"));
        QCOMPARE(c.STR(), QStringLiteral("Hauptstraße 1"));
        QCOMPARE(c.ZUSATZ(), QStringLiteral("Hinterhaus, Postfach 7"));
        QCOMPARE(c.PLZ() + c.ORT() + c.BUNDESLAND() + c.LAND(), QStringLiteral("10115BerlinBerlinDeutschland"));
        QCOMPARE(c.KATBEZ(), QStringLiteral("Kunden"));
        QCOMPARE(kd(c), (QStringList{QStringLiteral("Telefon geschäftlich=0049|30|6148273"),
                                     QStringLiteral("Handy=0049|171|4471123"), QStringLiteral("Zentrale=0049|30|999")}));
        for (const TvkKommItem& e : c.KD())
            QCOMPARE(e.status, EntryStatus::New);
        QCOMPARE(c.KD().constFirst().LCVORWNUMBER, QStringLiteral("49306148273"));
        QCOMPARE(c.Mail().size(), 1);
        QCOMPARE(c.Mail().constFirst().BEMERK, QStringLiteral("Büro"));
        QCOMPARE(QString::fromLatin1(c.notes()),
                 QStringLiteral("Notiz\r\nPosition: Leiter\r\nWebsite: https://blog.example\r\n"
                                "Adresse: Seeweg 2, 14467 Potsdam\r\nKategorien: Kunden, VIP\r\nNummer: unbekannt\r\n"
                                "E-Mail: ") + QString(41, QLatin1Char('x')) + QStringLiteral("\r\n"));
        QCOMPARE(made.notes.size(), 4);

        // Too long for its column: cut, and said so.
        VCardContact longName;
        longName.formattedName = QString(100, QLatin1Char('A'));
        const CardImport cut = contactFromCard(longName, 1);
        QCOMPARE(cut.contact.CONTBEZ().size(), 80);
        QCOMPARE(cut.notes, QStringList{QStringLiteral("Bezeichnung auf 80 Zeichen gekürzt")});
    }

    // What the address book keeps survives the way out as a card and back in unchanged.
    void contactSurvivesACard()
    {
        TvkMiniKontakt c;
        c.setCONTBEZ(QStringLiteral("Müller / Jürgen"));
        c.setANREDE(QStringLiteral("Frau"));
        c.setTITEL(QStringLiteral("Dr."));
        c.setVNAME(QStringLiteral("Erika"));
        c.setNAME(QStringLiteral("Müller"));
        c.setFIRMA(QStringLiteral("Müller; Söhne, KG"));
        c.setABTEILUNG(QStringLiteral("Vertrieb"));
        c.setWEBSITE(QStringLiteral("https://example.de/a,b"));
        c.setSTR(QStringLiteral("Hauptstraße 1"));
        c.setPLZ(QStringLiteral("10115"));
        c.setORT(QStringLiteral("Berlin"));
        c.setZUSATZ(QStringLiteral("c/o Meier"));
        c.setLAND(QStringLiteral("Deutschland"));
        c.setBUNDESLAND(QStringLiteral("Berlin"));
        c.setKATBEZ(QStringLiteral("Kunden"));
        const auto number = [](const char* label, const char* lc, const char* vorw, const char* n) {
            TvkKommItem e;
            e.KOMMBEZ = QString::fromUtf8(label);
            e.LC = QLatin1String(lc);
            e.VORW = QLatin1String(vorw);
            e.NUMBER = QLatin1String(n);
            e.status = EntryStatus::New;
            return e;
        };
        c.AddKD(number("Telefon", "0049", "30", "6148273"));
        c.AddKD(number("Handy", "0049", "171", "4471123"));
        c.AddKD(number("Fax", "0049", "221", "9127731"));
        c.AddKD(number("Mobil privat", "0043", "316", "12345"));
        c.AddKD(number("Telefon privat", "0041", "44", "1234567"));
        TvkMailItem mail;
        mail.MAILADDR = QStringLiteral("erika@example.de");
        mail.BEMERK = QStringLiteral("privat");
        mail.status = EntryStatus::New;
        c.AddMail(mail);
        const QString note = QStringLiteral("Zeile 1\nZeile 2; mit, Zeichen \\ €");
        c.StoreNotes(note.split(QLatin1Char('\n')), note);

        const VCardContact card = cardFromContact(c, note + QStringLiteral("\r\n"));
        QCOMPARE(card.phones.at(1).types, QStringList{QStringLiteral("cell")});
        QVERIFY(card.phones.at(1).label.isEmpty()); // the kind says it
        QCOMPARE(card.phones.at(3).label, QStringLiteral("Mobil privat"));
        const VCardReadResult read = readVCards(writeVCards({card}));
        QCOMPARE(read.cards.size(), 1);
        const CardImport back = contactFromCard(read.cards.constFirst(), 1);
        QVERIFY2(back.notes.isEmpty(), qPrintable(back.notes.join(QLatin1Char('\n'))));
        for (int f = 0; f < TvkMiniKontakt::FieldCount; ++f) {
            const auto field = static_cast<TvkMiniKontakt::Field>(f);
            QCOMPARE(back.contact.value(field), c.value(field));
        }
        QCOMPARE(kd(back.contact), kd(c));
        QCOMPARE(back.contact.Mail(), c.Mail());
        QCOMPARE(back.contact.notes(), c.notes());
    }

    void readsOutlookCsv()
    {
        // German Outlook: semicolons, Windows-1252, a note with a line break and a quote.
        const QByteArray file =
            "Anrede;Vorname;Nachname;Firma;Abteilung;Position;Stra\xdf" "e gesch\xe4" "ftlich;Ort gesch\xe4" "ftlich;"
            "Postleitzahl gesch\xe4" "ftlich;Land/Region gesch\xe4" "ftlich;Stra\xdf" "e privat;Ort privat;"
            "Telefon gesch\xe4" "ftlich;Mobiltelefon;Fax gesch\xe4" "ftlich;E-Mail-Adresse;E-Mail 2: Adresse;"
            "Webseite;Notizen;Kategorien;Geburtstag\r\n"
            "Herr;J\xfcrgen;M\xfcller;M\xfcller GmbH;Einkauf;Leiter;Hauptstra\xdf" "e 1;Berlin;10115;Deutschland;"
            "Seeweg 2;Potsdam;+49 30 6148273;0171 4471123;030 999;j@m.example;jm@privat.example;"
            "www.m.example;\"Erste Zeile\r\nzweite \"\"Zeile\"\"; mit Semikolon\";Kunden;VIP;1.1.1970\r\n"
            ";;;;;;;;;;;;;;;;;;;;\r\n"
            "Frau;Erika;Meier;;;;;;;;;;\r\n"
            ";;;;;;;;;;;;;;;;;;;;;;;;\r\n"
            "Frau;;;;;;;;;;;;;;;;;;;;\r\n";
        const VCardReadResult result = readContactCsv(file);
        QCOMPARE(result.cards.size(), 2);
        const VCardContact& j = result.cards.at(0);
        QCOMPARE(j.formattedName, QStringLiteral("Herr Jürgen Müller"));
        QCOMPARE(j.prefix, QStringLiteral("Herr"));
        QCOMPARE(j.organization, QStringLiteral("Müller GmbH"));
        QCOMPARE(j.title, QStringLiteral("Leiter"));
        QCOMPARE(j.addresses.size(), 2);
        QCOMPARE(j.addresses.at(0).street, QStringLiteral("Hauptstraße 1")); // business first for a firm
        QCOMPARE(j.addresses.at(0).postalCode, QStringLiteral("10115"));
        QCOMPARE(j.addresses.at(1).locality, QStringLiteral("Potsdam"));
        QCOMPARE(j.phones.size(), 3);
        QCOMPARE(j.phones.at(1).types, QStringList{QStringLiteral("cell")});
        QCOMPARE(j.phones.at(2).types, (QStringList{QStringLiteral("work"), QStringLiteral("fax")}));
        QCOMPARE(j.emails.size(), 2);
        QCOMPARE(j.urls, QStringList{QStringLiteral("www.m.example")});
        QCOMPARE(j.note, QStringLiteral("Erste Zeile\nzweite \"Zeile\"; mit Semikolon"));
        // "Kunden;VIP" spills into the next column: the row is one field too long.
        QCOMPARE(j.categories, QStringList{QStringLiteral("Kunden")});
        QCOMPARE(result.cards.at(1).formattedName, QStringLiteral("Frau Erika Meier"));
        QCOMPARE(result.skippedCards, 1);
        QCOMPARE(result.messages,
                 (QStringList{QStringLiteral("Zeile 1: Spalten nicht übernommen: Geburtstag"),
                              QStringLiteral("Zeile 2: 22 statt 21 Felder"), QStringLiteral("Zeile 5: 13 statt 21 Felder"),
                              QStringLiteral("Zeile 7: Zeile ohne Namen und Nummern übersprungen")}));
    }

    void readsGoogleAndThunderbirdCsv()
    {
        const QByteArray google = "Name,Given Name,Family Name,Organization 1 - Name,E-mail 1 - Type,E-mail 1 - Value,"
                                  "Phone 1 - Type,Phone 1 - Value,Phone 2 - Type,Phone 2 - Value,Address 1 - Type,"
                                  "Address 1 - Street,Address 1 - City,Address 1 - Postal Code,Group Membership\n"
                                  "Anna Schmidt,Anna,Schmidt,,* Work,anna@example.org,Mobile,+49 171 1 ::: +49 171 2,"
                                  "Home,030 1234,Home,\"Weg 1\nHinterhaus\",Berlin,10115,* myContacts\n";
        const VCardReadResult g = readContactCsv(google);
        QVERIFY2(g.messages.size() == 1, qPrintable(g.messages.join(QLatin1Char('\n'))));
        QCOMPARE(g.cards.size(), 1);
        const VCardContact& a = g.cards.constFirst();
        QCOMPARE(a.formattedName, QStringLiteral("Anna Schmidt"));
        QCOMPARE(a.phones.size(), 3);
        QCOMPARE(a.phones.at(1).value, QStringLiteral("+49 171 2"));
        QCOMPARE(a.phones.at(1).types, QStringList{QStringLiteral("cell")});
        QCOMPARE(a.phones.at(2).types, QStringList{QStringLiteral("home")});
        QCOMPARE(a.emails.constFirst().label, QStringLiteral("geschäftlich"));
        QCOMPARE(a.addresses.constFirst().street, QStringLiteral("Weg 1\nHinterhaus"));

        const QByteArray thunderbird = "\xEF\xBB\xBF" "First Name\tLast Name\tDisplay Name\tPrimary Email\tWork Phone\t"
                                       "Mobile Number\tWork City\tWork ZipCode\n"
                                       "Karl\tKlein\tKarl Klein\tk@k.example\t089 123\t0151 999\tMünchen\t80331\n";
        const VCardReadResult t = readContactCsv(thunderbird);
        QVERIFY(t.messages.isEmpty());
        QCOMPARE(t.cards.constFirst().formattedName, QStringLiteral("Karl Klein"));
        QCOMPARE(t.cards.constFirst().addresses.constFirst().locality, QStringLiteral("München"));
        QCOMPARE(t.cards.constFirst().phones.size(), 2);

        // Not an address book at all.
        const VCardReadResult none = readContactCsv("a,b,c\n1,2,3\n");
        QVERIFY(none.cards.isEmpty());
        QCOMPARE(none.messages.size(), 1);
        QVERIFY(readContactCsv("\"Name\nOhne Ende").messages.constFirst().contains(QStringLiteral("nicht geschlossen")));
    }
};

ORVANTA_TEST(TestContactCards)
#include "tst_contactcards.moc"
