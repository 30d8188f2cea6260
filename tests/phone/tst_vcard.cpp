#include "phone/VCard.h"
#include "tests/support/TestRegistry.h"

#include <QElapsedTimer>
#include <QTest>

using namespace orvanta;

namespace {

QStringList numbers(const VCardContact& card)
{
    QStringList out;
    for (const VCardTyped& phone : card.phones)
        out << phone.value + QLatin1Char('|') + phone.types.join(QLatin1Char(',')) + QLatin1Char('|') + phone.label;
    return out;
}

} // namespace

class TestVCard : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void readsVersion21WithQuotedPrintableAndCharsets()
    {
        const QByteArray file = "BEGIN:VCARD\r\nVERSION:2.1\r\n"
                                "N;CHARSET=ISO-8859-1:M\xfcller;J\xfcrgen;;Dr.;\r\n"
                                "FN;CHARSET=UTF-8;ENCODING=QUOTED-PRINTABLE:Dr. J=C3=BCrgen M=C3=BCller\r\n"
                                "TEL;CELL;VOICE:+49 171 1234567\r\n"
                                "TEL;WORK;FAX:030/123456\r\n"
                                "NOTE;ENCODING=QUOTED-PRINTABLE:Erste Zeile=0D=0A=\r\nzweite; Zeile=\r\n\r\n"
                                "EMAIL;PREF;INTERNET:j.mueller@example.de\r\n"
                                "ADR;HOME;QUOTED-PRINTABLE:;;Hauptstra=DFe 1;Berlin;;10115;Deutschland\r\n"
                                "END:VCARD\r\n";
        const VCardReadResult result = readVCards(file);
        QVERIFY2(result.messages.isEmpty(), qPrintable(result.messages.join(QLatin1Char('\n'))));
        QCOMPARE(result.cards.size(), 1);
        const VCardContact& card = result.cards.constFirst();
        QCOMPARE(card.formattedName, QStringLiteral("Dr. Jürgen Müller"));
        QCOMPARE(card.familyName, QStringLiteral("Müller"));
        QCOMPARE(card.givenName, QStringLiteral("Jürgen"));
        QCOMPARE(card.prefix, QStringLiteral("Dr."));
        QCOMPARE(numbers(card), (QStringList{QStringLiteral("+49 171 1234567|cell,voice|"),
                                             QStringLiteral("030/123456|work,fax|")}));
        // The soft break joins the lines; the encoded CR LF is a line break; 2.1 knows no "\;".
        QCOMPARE(card.note, QStringLiteral("Erste Zeile\nzweite; Zeile"));
        QCOMPARE(card.emails.size(), 1);
        QCOMPARE(card.emails.constFirst().value, QStringLiteral("j.mueller@example.de"));
        QCOMPARE(card.emails.constFirst().types, (QStringList{QStringLiteral("pref"), QStringLiteral("internet")}));
        QCOMPARE(card.addresses.size(), 1);
        const VCardAddress& address = card.addresses.constFirst();
        QCOMPARE(address.types, QStringList{QStringLiteral("home")});
        QCOMPARE(address.street, QStringLiteral("Hauptstraße 1")); // QP bytes in Windows-1252
        QCOMPARE(address.locality, QStringLiteral("Berlin"));
        QCOMPARE(address.postalCode, QStringLiteral("10115"));
        QCOMPARE(address.country, QStringLiteral("Deutschland"));
    }

    void readsVersion30And40()
    {
        const QByteArray file = "\xEF\xBB\xBF"
                                "BEGIN:VCARD\nVERSION:3.0\nFN:Anna Schmidt\nN:Schmidt;Anna;Maria;;\n"
                                "ORG:Schmidt GmbH;Vertrieb;Nord\nTITLE:Leiterin\\, Vertrieb\n"
                                "TEL;TYPE=WORK,VOICE:+43 1 5551234\n"
                                "item1.TEL:0041 44 1234567\nITEM1.X-ABLabel:Zentrale\n"
                                "item2.EMAIL;type=INTERNET:anna@example.org\nitem2.X-ABLabel:_$!<Other>!$_\n"
                                "URL:https\\://example.org/a\n"
                                "NOTE:Notiz\\, mit Komma\\; Semikolon\\nund Umbruch und \n  gefaltet\\\\Ende\n"
                                "CATEGORIES:Kunden,Lieferanten\\,Partner,Kunden\n"
                                "END:VCARD\n"
                                "BEGIN:VCARD\r\nVERSION:4.0\r\nFN:Stra\xc3\x9f"
                                "enbau AG\r\nORG:Stra\xc3\x9f"
                                "enbau AG\r\n"
                                "TEL;VALUE=uri;TYPE=\"voice,home\":tel:+49-40-555-0100\r\n"
                                "EMAIL;TYPE=work:mailto:info@strassenbau.example\r\n"
                                "PHOTO;ENCODING=b;TYPE=JPEG:AAAA\r\n X\r\n"
                                "X-UNKNOWN;FOO=\"a:b;c\":wert\r\n"
                                "ADR;TYPE=work;LABEL=\"Hafen 3\\n20457 Hamburg\":;;Hafen 3;Hamburg;;20457;\r\n"
                                "END:VCARD\r\n";
        const VCardReadResult result = readVCards(file);
        QVERIFY2(result.messages.isEmpty(), qPrintable(result.messages.join(QLatin1Char('\n'))));
        QCOMPARE(result.cards.size(), 2);
        const VCardContact& anna = result.cards.at(0);
        QCOMPARE(anna.formattedName, QStringLiteral("Anna Schmidt"));
        QCOMPARE(anna.additionalNames, QStringLiteral("Maria"));
        QCOMPARE(anna.organization, QStringLiteral("Schmidt GmbH"));
        QCOMPARE(anna.department, QStringLiteral("Vertrieb, Nord"));
        QCOMPARE(anna.title, QStringLiteral("Leiterin, Vertrieb"));
        QCOMPARE(numbers(anna), (QStringList{QStringLiteral("+43 1 5551234|work,voice|"),
                                             QStringLiteral("0041 44 1234567||Zentrale")}));
        QCOMPARE(anna.emails.constFirst().label, QStringLiteral("Other"));
        QCOMPARE(anna.urls, QStringList{QStringLiteral("https://example.org/a")});
        QCOMPARE(anna.note, QStringLiteral("Notiz, mit Komma; Semikolon\nund Umbruch und  gefaltet\\Ende"));
        QCOMPARE(anna.categories, (QStringList{QStringLiteral("Kunden"), QStringLiteral("Lieferanten,Partner")}));

        const VCardContact& firm = result.cards.at(1);
        QCOMPARE(firm.formattedName, QStringLiteral("Straßenbau AG"));
        QCOMPARE(numbers(firm), QStringList{QStringLiteral("+49-40-555-0100|voice,home|")});
        QCOMPARE(firm.emails.constFirst().value, QStringLiteral("info@strassenbau.example"));
        QCOMPARE(firm.addresses.constFirst().street, QStringLiteral("Hafen 3"));
        QCOMPARE(firm.addresses.constFirst().types, QStringList{QStringLiteral("work")});
    }

    // Damaged files: every usable card is kept, and each repair or omission is named with its line.
    void reportsWhatItSkipped()
    {
        static const char raw[] = "junk\x00\xff vorne\r\nnoch mehr\r\n"
                                "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:Ohne Ende\r\nTEL:089 1234\r\n"
                                "BEGIN:VCARD\r\nFN;ENCODING=QUOTED-PRINTABLE:kaputt=Z1=C\r\n"
                                "ohne Doppelpunkt\r\nnoch eine\r\nEND:VCARD\r\n"
                                "BEGIN:VCARD\r\nVERSION:3.0\r\nX-ONLY:nichts\r\nEND:VCARD\r\n"
                                "BEGIN:VCARD\r\nN;CHARSET=X-KLINGON:Bar;Foo\r\nFN;CHARSET=UTF-8:Gr\xfc\xdf\r\n"
                                "END:VCARD\r\n"
                                "BEGIN:VCARD\r\nFN:Letzte\r\n";
        const VCardReadResult result = readVCards(QByteArrayView(raw, sizeof(raw) - 1));
        QStringList names;
        for (const VCardContact& card : result.cards)
            names << card.formattedName;
        QCOMPARE(names, (QStringList{QStringLiteral("Ohne Ende"), QStringLiteral("kaputt=Z1=C"),
                                     QStringLiteral("Grüß"), QStringLiteral("Letzte")}));
        QCOMPARE(result.cards.at(2).familyName, QStringLiteral("Bar"));
        QCOMPARE(result.skippedCards, 1);
        const QStringList expected = {
            QStringLiteral("Zeile 1: 2 Zeilen außerhalb einer Karte übersprungen"),
            QStringLiteral("Zeile 7: der Karte ab Zeile 3 fehlt END:VCARD"),
            QStringLiteral("Zeile 8: fehlerhaftes Quoted-Printable, unverändert übernommen"),
            QStringLiteral("Zeile 9: 2 unlesbare Zeilen übersprungen"),
            QStringLiteral("Zeile 12: Karte ohne Namen und Nummern übersprungen"),
            QStringLiteral("Zeile 17: Zeichensatz \"X-KLINGON\" unbekannt, der Text ist geraten"),
            QStringLiteral("Zeile 18: kein gültiges UTF-8, als Windows-1252 gelesen"),
            QStringLiteral("Zeile 21: der Karte ab Zeile 20 fehlt END:VCARD"),
        };
        QCOMPARE(result.messages, expected);

        // Nothing but junk, and nothing at all.
        QCOMPARE(readVCards("\x01\x02\xff\r\n\r\n:\r\n").cards.size(), 0);
        QVERIFY(readVCards(QByteArrayView()).messages.isEmpty());
    }

    void writesVersion40()
    {
        VCardContact card;
        card.formattedName = QStringLiteral("Dr. Jürgen Müller");
        card.familyName = QStringLiteral("Müller");
        card.givenName = QStringLiteral("Jürgen");
        card.prefix = QStringLiteral("Dr.");
        card.organization = QStringLiteral("Müller; Söhne, KG");
        card.phones << VCardTyped{QStringLiteral("+49 30 123456"), {QStringLiteral("work"), QStringLiteral("voice")},
                                  QStringLiteral("Büro, 2. Stock")};
        card.emails << VCardTyped{QStringLiteral("j@example.de"), {}, {}};
        card.urls << QStringLiteral("https://example.de/a,b;c");
        card.note = QStringLiteral("Zeile 1\r\nZeile 2 mit \\ und ") + QString(60, QChar(0x00FC)) + QStringLiteral(" Ende");
        card.categories = {QStringLiteral("Kunden"), QStringLiteral("A,B")};
        card.addresses << VCardAddress{{QStringLiteral("home")}, {}, {}, QStringLiteral("Hauptstraße 1"),
                                       QStringLiteral("Berlin"), {}, QStringLiteral("10115"), QStringLiteral("Deutschland")};

        const QByteArray out = writeVCards({card, card});
        QVERIFY(out.startsWith("BEGIN:VCARD\r\nVERSION:4.0\r\nFN:Dr. Jürgen Müller\r\n"));
        QVERIFY(out.contains("\r\nN:Müller;Jürgen;;Dr.;\r\n"));
        QVERIFY(out.contains("\r\nORG:Müller\\; Söhne\\, KG\r\n"));
        QVERIFY(out.contains("\r\nitem1.TEL;TYPE=work,voice:+49 30 123456\r\nitem1.X-ABLabel:Büro\\, 2. Stock\r\n"));
        QVERIFY(out.contains("\r\nURL:https://example.de/a\\,b\\;c\r\n"));
        QVERIFY(out.contains("\r\nCATEGORIES:Kunden,A\\,B\r\n"));
        QVERIFY(out.contains("NOTE:Zeile 1\\nZeile 2 mit \\\\ und "));
        QCOMPARE(out.count("BEGIN:VCARD"), 2);
        for (const QByteArray& line : out.split('\n')) {
            QVERIFY2(line.size() <= 76, line.constData()); // 75 octets and the CR
            QVERIFY(line.isEmpty() || line.endsWith('\r'));
            // A fold never cuts a UTF-8 sequence: every physical line is valid UTF-8 on its own.
            QCOMPARE(QString::fromUtf8(line).toUtf8(), line);
        }

        const VCardReadResult back = readVCards(out);
        QVERIFY(back.messages.isEmpty());
        QCOMPARE(back.cards.size(), 2);
        VCardContact expected = card;
        expected.note.replace(QLatin1String("\r\n"), QLatin1String("\n"));
        QCOMPARE(back.cards.at(0), expected);
        QCOMPARE(back.cards.at(1), expected);
    }

    // Many cards and a large photo are read in a moment and the photo is passed over.
    void readsLargeFiles()
    {
        QByteArray file;
        for (int i = 0; i < 10000; ++i)
            file += "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:Kontakt " + QByteArray::number(i) + "\r\nTEL:030 " + QByteArray::number(i)
                + "\r\nEND:VCARD\r\n";
        file += "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:Mit Foto\r\nPHOTO;ENCODING=b;TYPE=JPEG:";
        for (int i = 0; i < 5 * 1024 * 1024 / 74; ++i)
            file += QByteArray(74, 'A') + "\r\n ";
        file += "AA==\r\nEND:VCARD\r\n";
        QElapsedTimer timer;
        timer.start();
        const VCardReadResult result = readVCards(file);
        QCOMPARE(result.cards.size(), 10001);
        QVERIFY(result.messages.isEmpty());
        QCOMPARE(result.cards.constLast().formattedName, QStringLiteral("Mit Foto"));
        QVERIFY2(timer.elapsed() < 10000, qPrintable(QString::number(timer.elapsed())));
    }
};

ORVANTA_TEST(TestVCard)
#include "tst_vcard.moc"
