#include "tools/demo/DemoContacts.h"

namespace orvanta::demo {
namespace {

QString t(const char* utf8) { return QString::fromUtf8(utf8); }

DemoNumber num(const char* label, const char* lc, const char* vorw, const char* number, const char* remark = "",
               bool autoReject = false)
{
    return DemoNumber{t(label), t(lc), t(vorw), t(number), t(remark), autoReject};
}

DemoMail mail(const char* address, const char* remark = "") { return DemoMail{t(address), t(remark)}; }

struct Person {
    const char* anrede;
    const char* titel;
    const char* vname;
    const char* name;
    const char* firma;
    const char* abteilung;
    const char* website;
    const char* contbez;
    const char* kategorie;
};

struct Address {
    const char* str;
    const char* plz;
    const char* ort;
    const char* zusatz;
    const char* land;
    const char* bundesland;
};

DemoContact contact(const Person& p, const Address& a, std::vector<DemoNumber> numbers, std::vector<DemoMail> mails,
                    QStringList note = {}, int callWeight = 1, bool linked = true)
{
    DemoContact c;
    c.anrede = t(p.anrede);
    c.titel = t(p.titel);
    c.vname = t(p.vname);
    c.name = t(p.name);
    c.firma = t(p.firma);
    c.abteilung = t(p.abteilung);
    c.website = t(p.website);
    c.contbez = t(p.contbez);
    c.kategorie = t(p.kategorie);
    c.str = t(a.str);
    c.plz = t(a.plz);
    c.ort = t(a.ort);
    c.zusatz = t(a.zusatz);
    c.land = t(a.land);
    c.bundesland = t(a.bundesland);
    c.numbers = std::move(numbers);
    c.mails = std::move(mails);
    c.note = std::move(note);
    c.callWeight = callWeight;
    c.linked = linked;
    return c;
}

QStringList lines(std::initializer_list<const char*> l)
{
    QStringList out;
    for (const char* s : l)
        out << t(s);
    return out;
}

std::vector<DemoContact> build()
{
    std::vector<DemoContact> v;
    v.push_back(contact({"Herr", "", "Thomas", "Müller", "", "", "", "Müller, Thomas", "Familie"},
                        {"Lindenstraße 12", "10969", "Berlin", "", "Deutschland", "Berlin"},
                        {num("Telefon", "0049", "030", "6148273"), num("Handy", "0049", "0171", "4471123")},
                        {mail("thomas.mueller@example.de", "privat")},
                        lines({"Bruder von Anna.", "Geburtstag: 14. März", "Lieblingsessen: Käsespätzle"}), 5));
    v.push_back(contact({"Frau", "", "Anna", "Schmidt", "", "", "", "Schmidt, Anna", "Familie"},
                        {"Am Wiesengrund 3", "80331", "München", "", "Deutschland", "Bayern"},
                        {num("Telefon", "0049", "089", "2389011"), num("Handy", "0049", "0151", "22874410")},
                        {mail("anna.schmidt@example.de")}, {}, 4));
    v.push_back(contact({"Herr", "Dr.", "Klaus", "Weber", "Praxis Dr. Weber", "", "www.praxis-weber.example",
                         "Praxis Dr. Weber / Weber, Klaus", "Ärzte"},
                        {"Hauptstraße 45", "50667", "Köln", "2. OG", "Deutschland", "Nordrhein-Westfalen"},
                        {num("Praxis", "0049", "0221", "9127730", "Sprechzeiten Mo-Fr 8-12"),
                         num("Fax", "0049", "0221", "9127731")},
                        {mail("praxis@weber.example")},
                        lines({"Hausarzt.", "Termine nur nach Vereinbarung.", "Notdienst: 116 117"}), 2));
    v.push_back(contact({"Firma", "", "", "", "Meyer & Söhne GmbH", "Vertrieb", "www.meyer-soehne.example",
                         "Meyer & Söhne GmbH", "Lieferanten"},
                        {"Industriestraße 7", "20095", "Hamburg", "Tor 3", "Deutschland", "Hamburg"},
                        {num("Zentrale", "0049", "040", "3344550"), num("Vertrieb", "0049", "040", "3344561"),
                         num("Fax", "0049", "040", "3344599")},
                        {mail("vertrieb@meyer-soehne.example", "Bestellungen"),
                         mail("info@meyer-soehne.example")},
                        lines({"Rahmenvertrag bis Ende des Jahres.", "Ansprechpartner: Herr Brandt (Durchwahl -61)",
                               "Zahlungsziel 30 Tage, 2 % Skonto bei 10 Tagen."}),
                        6));
    v.push_back(contact({"Frau", "", "Sabine", "Fischer", "Fischer Steuerberatung", "", "", "Fischer Steuerberatung / Fischer, Sabine",
                         "Dienstleister"},
                        {"Königstraße 20", "70173", "Stuttgart", "", "Deutschland", "Baden-Württemberg"},
                        {num("Büro", "0049", "0711", "2299340")}, {mail("s.fischer@fischer-stb.example")},
                        lines({"Unterlagen für die Steuererklärung bis 31. Mai einreichen."}), 2));
    v.push_back(contact({"Herr", "Mag.", "Johann", "Gruber", "", "", "", "Gruber, Johann", "Freunde"},
                        {"Mariahilfer Straße 88", "1070", "Wien", "Stiege 2, Tür 14", "Österreich", "Wien"},
                        {num("Telefon", "0043", "1", "5236617"), num("Handy", "0043", "664", "3817264")},
                        {mail("johann.gruber@example.at")}, lines({"Kennengelernt im Urlaub am Wörthersee."}), 3));
    v.push_back(contact({"Frau", "", "Maria", "Huber", "Huber Tischlerei", "", "www.huber-tischlerei.example",
                         "Huber Tischlerei / Huber, Maria", "Handwerker"},
                        {"Annenstraße 5", "8020", "Graz", "", "Österreich", "Steiermark"},
                        {num("Werkstatt", "0043", "316", "712245")}, {mail("office@huber-tischlerei.example")}, {},
                        1));
    v.push_back(contact({"Herr", "", "Lukas", "Keller", "", "", "", "Keller, Lukas", "Freunde"},
                        {"Bahnhofstrasse 10", "8001", "Zürich", "", "Schweiz", "Zürich"},
                        {num("Telefon", "0041", "44", "2213344"), num("Mobil", "0041", "79", "5512233")},
                        {mail("lukas.keller@example.ch")}, lines({"Segelt im Sommer auf dem Zürichsee."}), 3));
    v.push_back(contact({"Frau", "", "Claudia", "Meier", "Meier Treuhand AG", "Buchhaltung", "",
                         "Meier Treuhand AG / Meier, Claudia", "Kunden"},
                        {"Marktgasse 9", "3011", "Bern", "", "Schweiz", "Bern"},
                        {num("Büro", "0041", "31", "3127788")}, {mail("c.meier@meier-treuhand.example")}, {}, 2));
    v.push_back(contact({"Herr", "Prof. Dr.", "Heinrich", "Becker", "Universität Leipzig", "Institut für Informatik",
                         "", "Universität Leipzig / Becker, Heinrich", "Kunden"},
                        {"Augustusplatz 10", "04109", "Leipzig", "", "Deutschland", "Sachsen"},
                        {num("Institut", "0049", "0341", "9732201")}, {mail("becker@uni.example")},
                        lines({"Projekt \"Telefonstatistik\" - Angebot Nr. 2024-117."}), 2));
    v.push_back(contact({"Frau", "", "Petra", "Wagner", "", "", "", "Wagner, Petra", "Nachbarn"},
                        {"Lindenstraße 14", "10969", "Berlin", "", "Deutschland", "Berlin"},
                        {num("Telefon", "0049", "030", "6148390")}, {}, lines({"Hat den Zweitschlüssel."}), 2));
    v.push_back(contact({"Firma", "", "", "", "Stadtwerke Dresden", "Kundenservice", "www.stadtwerke.example",
                         "Stadtwerke Dresden", "Dienstleister"},
                        {"Rosa-Luxemburg-Platz 3", "01069", "Dresden", "", "Deutschland", "Sachsen"},
                        {num("Service", "0049", "0351", "8604400"), num("Störung", "0049", "0351", "8604444")}, {}, {},
                        1));
    v.push_back(contact({"Herr", "", "Stefan", "Hoffmann", "Hoffmann Elektro", "", "", "Hoffmann Elektro / Hoffmann, Stefan",
                         "Handwerker"},
                        {"Kaiserstraße 61", "60329", "Frankfurt am Main", "", "Deutschland", "Hessen"},
                        {num("Büro", "0049", "069", "2740015"), num("Handy", "0049", "0176", "61238844")},
                        {mail("info@hoffmann-elektro.example")}, {}, 2));
    v.push_back(contact({"Frau", "", "Julia", "Schulz", "", "", "", "Schulz, Julia", "Kollegen"},
                        {"Schillerstraße 2", "30159", "Hannover", "", "Deutschland", "Niedersachsen"},
                        {num("Handy", "0049", "0151", "40022781")}, {mail("julia.schulz@example.de"), mail("j.schulz@firma.example", "dienstlich")},
                        {}, 3));
    v.push_back(contact({"Herr", "", "Markus", "Bauer", "", "", "", "Bauer, Markus", "Kollegen"},
                        {"Rüttenscheider Straße 150", "45131", "Essen", "", "Deutschland", "Nordrhein-Westfalen"},
                        {num("Telefon", "0049", "0201", "776612")}, {mail("markus.bauer@example.de")}, {}, 2));
    v.push_back(contact({"Firma", "", "", "", "Alpen Reisen GmbH", "Buchung", "www.alpenreisen.example", "Alpen Reisen GmbH",
                         "Lieferanten"},
                        {"Getreidegasse 20", "5020", "Salzburg", "", "Österreich", "Salzburg"},
                        {num("Buchung", "0043", "662", "845500")}, {mail("buchung@alpenreisen.example")},
                        lines({"Hotel für August angefragt, Antwort steht aus."}), 1));
    v.push_back(contact({"Herr", "", "Andreas", "Koch", "", "", "", "Koch, Andreas", "Freunde"},
                        {"Steinenvorstadt 30", "4051", "Basel", "", "Schweiz", "Basel-Stadt"},
                        {num("Telefon", "0041", "61", "2718890")}, {}, {}, 2));
    v.push_back(contact({"Firma", "", "", "", "Werbung Direkt KG", "", "", "Werbung Direkt KG", ""},
                        {"", "", "", "", "", ""},
                        {num("Zentrale", "0049", "0202", "4400123", "ruft ständig an", true)}, {},
                        lines({"Unerwünschte Werbeanrufe - Nummer wird abgewiesen."}), 2));
    // Calls from this contact stay unlinked in the log: the user can try linking them.
    v.push_back(contact({"Frau", "", "Sandra", "Richter", "", "", "", "Richter, Sandra", "Freunde"},
                        {"Königsallee 1", "40212", "Düsseldorf", "", "Deutschland", "Nordrhein-Westfalen"},
                        {num("Telefon", "0049", "0211", "1359920")}, {mail("sandra.richter@example.de")}, {}, 3,
                        false));
    return v;
}

} // namespace

const QStringList& demoCategories()
{
    static const QStringList cats = [] {
        QStringList l;
        for (const char* s : {"Familie", "Freunde", "Nachbarn", "Kollegen", "Kunden", "Lieferanten", "Handwerker",
                              "Dienstleister", "Ärzte", "Behörden"})
            l << QString::fromUtf8(s);
        return l;
    }();
    return cats;
}

const std::vector<DemoContact>& demoContacts()
{
    static const std::vector<DemoContact> contacts = build();
    return contacts;
}

QString dialledForm(const DemoNumber& n)
{
    // Domestic numbers keep their area code's zero; foreign ones get the country code.
    if (n.lc.isEmpty() || n.lc == QStringLiteral("0049"))
        return n.vorw + n.number;
    return n.lc + n.vorw + n.number;
}

} // namespace orvanta::demo
