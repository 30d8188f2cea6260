#include "phone/ContactCards.h"

#include "phone/AreaCodes.h"

namespace orvanta {

namespace {

using Field = TvkMiniKontakt::Field;

QString digitsOf(QStringView text)
{
    QString digits;
    for (const QChar c : text) {
        if (c >= QLatin1Char('0') && c <= QLatin1Char('9'))
            digits += c;
    }
    return digits;
}

QString countryCode(int homeCountry)
{
    switch (homeCountry) {
    case 2: return QStringLiteral("43");
    case 3: return QStringLiteral("41");
    default: return QStringLiteral("49");
    }
}

// The mobile networks' prefixes, which the area-code tables do not list (national digits after
// the trunk zero): Germany 15x/16x/17x, Austria 650…699, Switzerland 75…79.
int mobilePrefixLength(const QString& country, const QString& national)
{
    const auto starts = [&](const char* digits) { return national.startsWith(QLatin1String(digits)); };
    if (country == QLatin1String("49") && (starts("15") || starts("16") || starts("17")))
        return 3;
    if (country == QLatin1String("43") && national.size() > 2 && national.at(0) == QLatin1Char('6')
        && national.at(1) >= QLatin1Char('5'))
        return 3;
    if (country == QLatin1String("41") && national.size() > 1 && national.at(0) == QLatin1Char('7')
        && national.at(1) >= QLatin1Char('5'))
        return 2;
    return 0;
}

bool lookup(const QString& country, const QString& national, QString& prefix, QString& rest)
{
    QString region;
    if (country == QLatin1String("49"))
        return GetGermanAereaCodes(national, prefix, rest, region);
    if (country == QLatin1String("43"))
        return GetAustriaAereaCodes(national, prefix, rest, region);
    return GetSwissAereaCodes(national, prefix, rest, region);
}

QString joinWords(const QStringList& words)
{
    QStringList kept;
    for (const QString& w : words) {
        if (!w.trimmed().isEmpty())
            kept << w.trimmed();
    }
    return kept.join(QLatin1Char(' '));
}

// Sets a field and says so when the value had to be cut to the column's width.
void put(TvkMiniKontakt& contact, Field field, const QString& value, const char* caption, QStringList& notes)
{
    contact.setValue(field, value);
    if (contact.value(field) != value)
        notes << QStringLiteral("%1 auf %2 Zeichen gekürzt").arg(QLatin1String(caption)).arg(TvkMiniKontakt::width(field));
}

QString addressText(const VCardAddress& a)
{
    const QString town = joinWords({a.postalCode, a.locality});
    QStringList parts;
    for (const QString& p : {a.poBox, a.extended, a.street, town, a.region, a.country}) {
        if (!p.trimmed().isEmpty())
            parts << p.trimmed();
    }
    return parts.join(QStringLiteral(", "));
}

} // namespace

bool isSalutation(const QString& word)
{
    static const QStringList known{QStringLiteral("herr"), QStringLiteral("frau"), QStringLiteral("firma"),
                                   QStringLiteral("praxis"), QStringLiteral("bürogemeinschaft"),
                                   QStringLiteral("familie"), QStringLiteral("mr."), QStringLiteral("mrs."),
                                   QStringLiteral("ms."), QStringLiteral("mr"), QStringLiteral("mrs"), QStringLiteral("ms")};
    return known.contains(word.toLower());
}

NumberParts splitDialledNumber(QStringView written, int homeCountry)
{
    NumberParts parts;
    const QStringView text = written.trimmed();
    const QString digits = digitsOf(text);
    if (digits.isEmpty())
        return parts;
    QString international;
    if (text.startsWith(QLatin1Char('+')))
        international = digits;
    else if (digits.startsWith(QLatin1String("00")))
        international = digits.mid(2);
    else if (digits.startsWith(QLatin1Char('0')))
        international = countryCode(homeCountry) + digits.mid(1);
    else {
        parts.NUMBER = digits; // a local number: its area code is unknown
        return parts;
    }

    const QString country = international.left(2);
    if (country != QLatin1String("49") && country != QLatin1String("43") && country != QLatin1String("41")) {
        parts.NUMBER = QStringLiteral("00") + international;
        return parts;
    }
    QString national = international.mid(2);
    // "+49 (0)30 …": the trunk zero written after the country code is not part of the number.
    if (national.startsWith(QLatin1Char('0')))
        national.remove(0, 1);
    parts.LC = QStringLiteral("00") + country;
    // After a country code the area code has no trunk zero, as the edit window stores a number
    // it splits: "0049" "30" "6148273" is what a caller's international number matches.
    if (const int mobile = mobilePrefixLength(country, national); mobile > 0 && national.size() > mobile) {
        parts.VORW = national.left(mobile);
        parts.NUMBER = national.mid(mobile);
        return parts;
    }
    QString prefix, rest;
    if (lookup(country, national, prefix, rest) && !prefix.isEmpty()) {
        parts.VORW = prefix;
        parts.NUMBER = rest;
    } else {
        parts.NUMBER = national;
    }
    return parts;
}

QString writtenNumber(const TvkKommItem& item)
{
    const QString lc = digitsOf(item.LC);
    QString area = digitsOf(item.VORW);
    QString number = item.NUMBER.trimmed();
    if (lc.isEmpty())
        return joinWords({item.VORW, number});
    qsizetype zeros = 0;
    while (zeros < lc.size() && lc.at(zeros) == QLatin1Char('0'))
        ++zeros;
    if (area.isEmpty()) {
        // The national form after a country code loses its trunk zero.
        if (number.startsWith(QLatin1Char('0')) && !number.startsWith(QLatin1String("00")))
            number.remove(0, 1);
    } else {
        while (area.startsWith(QLatin1Char('0')))
            area.remove(0, 1);
    }
    return joinWords({QLatin1Char('+') + lc.mid(zeros), area, number});
}

QString numberLabel(const VCardTyped& phone)
{
    if (!phone.label.trimmed().isEmpty())
        return phone.label.trimmed();
    const QStringList& t = phone.types;
    if (t.contains(QLatin1String("cell")) || t.contains(QLatin1String("mobile")))
        return QStringLiteral("Handy");
    if (t.contains(QLatin1String("fax")))
        return QStringLiteral("Fax");
    if (t.contains(QLatin1String("pager")))
        return QStringLiteral("Pager");
    if (t.contains(QLatin1String("home")))
        return QStringLiteral("Telefon privat");
    if (t.contains(QLatin1String("work")))
        return QStringLiteral("Telefon geschäftlich");
    return QStringLiteral("Telefon");
}

CardImport contactFromCard(const VCardContact& card, int homeCountry)
{
    CardImport out;
    TvkMiniKontakt& c = out.contact;
    QStringList& notes = out.notes;
    QStringList noteLines;

    QString designation = card.formattedName;
    if (designation.isEmpty() && !card.emails.isEmpty())
        designation = card.emails.constFirst().value;
    if (designation.isEmpty() && !card.phones.isEmpty())
        designation = card.phones.constFirst().value;
    put(c, Field::CONTBEZ, designation, "Bezeichnung", notes);
    put(c, Field::NAME, card.familyName, "Name", notes);
    put(c, Field::VNAME, joinWords({card.givenName, card.additionalNames}), "Vorname", notes);
    QStringList prefix = card.prefix.split(QLatin1Char(' '), Qt::SkipEmptyParts);
    if (!prefix.isEmpty() && isSalutation(prefix.constFirst()))
        put(c, Field::ANREDE, prefix.takeFirst(), "Anrede", notes);
    put(c, Field::TITEL, joinWords({prefix.join(QLatin1Char(' ')), card.suffix}), "Titel", notes);
    put(c, Field::FIRMA, card.organization, "Firma", notes);
    put(c, Field::ABTEILUNG, card.department, "Abteilung", notes);
    if (!card.title.isEmpty())
        noteLines << QStringLiteral("Position: ") + card.title;

    if (!card.urls.isEmpty()) {
        put(c, Field::WEBSITE, card.urls.constFirst(), "Website", notes);
        for (qsizetype i = 1; i < card.urls.size(); ++i)
            noteLines << QStringLiteral("Website: ") + card.urls.at(i);
    }
    if (!card.addresses.isEmpty()) {
        const VCardAddress& a = card.addresses.constFirst();
        QString street = a.street;
        QString extra = a.extended;
        if (street.isEmpty())
            street = a.poBox;
        else if (!a.poBox.isEmpty())
            extra = extra.isEmpty() ? a.poBox : extra + QStringLiteral(", ") + a.poBox;
        put(c, Field::STR, street, "Straße", notes);
        put(c, Field::ZUSATZ, extra, "Zusatz", notes);
        put(c, Field::PLZ, a.postalCode, "PLZ", notes);
        put(c, Field::ORT, a.locality, "Ort", notes);
        put(c, Field::BUNDESLAND, a.region, "Bundesland", notes);
        put(c, Field::LAND, a.country, "Land", notes);
        for (qsizetype i = 1; i < card.addresses.size(); ++i)
            noteLines << QStringLiteral("Adresse: ") + addressText(card.addresses.at(i));
        if (card.addresses.size() > 1)
            notes << QStringLiteral("%1 weitere Adressen in die Notiz übernommen").arg(card.addresses.size() - 1);
    }
    if (!card.categories.isEmpty()) {
        put(c, Field::KATBEZ, card.categories.constFirst(), "Kategorie", notes);
        if (card.categories.size() > 1) {
            noteLines << QStringLiteral("Kategorien: ") + card.categories.join(QStringLiteral(", "));
            notes << QStringLiteral("nur die erste Kategorie zugeordnet");
        }
    }

    for (const VCardTyped& phone : card.phones) {
        const NumberParts parts = splitDialledNumber(phone.value, homeCountry);
        if (parts.NUMBER.isEmpty()) {
            noteLines << QStringLiteral("Nummer: ") + phone.value;
            notes << QStringLiteral("\"%1\" ist keine Telefonnummer").arg(phone.value);
            continue;
        }
        TvkKommItem item;
        item.KOMMBEZ = numberLabel(phone);
        item.LC = parts.LC;
        item.VORW = parts.VORW;
        item.NUMBER = parts.NUMBER;
        item.status = EntryStatus::New;
        if (parts.NUMBER.size() > TvkKommItem::NUMBERWidth) {
            noteLines << QStringLiteral("Nummer: ") + phone.value;
            notes << QStringLiteral("Nummer %1 zu lang, in die Notiz übernommen").arg(phone.value);
            continue;
        }
        c.AddKD(item);
    }
    for (const VCardTyped& mail : card.emails) {
        if (mail.value.size() > TvkMailItem::MAILADDRWidth) {
            noteLines << QStringLiteral("E-Mail: ") + mail.value;
            notes << QStringLiteral("E-Mail-Adresse %1 zu lang, in die Notiz übernommen").arg(mail.value);
            continue;
        }
        TvkMailItem item;
        item.MAILADDR = mail.value;
        item.BEMERK = mail.label;
        item.status = EntryStatus::New;
        c.AddMail(item);
    }

    QString note = card.note;
    if (!noteLines.isEmpty())
        note = note.isEmpty() ? noteLines.join(QLatin1Char('\n')) : note + QLatin1Char('\n') + noteLines.join(QLatin1Char('\n'));
    if (!note.isEmpty())
        c.StoreNotes(note.split(QLatin1Char('\n')), note);
    out.noteText = note;
    return out;
}

VCardContact cardFromContact(const TvkMiniKontakt& c, const QString& notePlainText)
{
    VCardContact card;
    card.formattedName = c.CONTBEZ();
    card.familyName = c.NAME();
    card.givenName = c.VNAME();
    card.prefix = joinWords({c.ANREDE(), c.TITEL()});
    card.organization = c.FIRMA();
    card.department = c.ABTEILUNG();
    if (!c.WEBSITE().isEmpty())
        card.urls << c.WEBSITE();
    if (!(c.STR() + c.PLZ() + c.ORT() + c.ZUSATZ() + c.LAND() + c.BUNDESLAND()).trimmed().isEmpty()) {
        VCardAddress a;
        a.extended = c.ZUSATZ();
        a.street = c.STR();
        a.locality = c.ORT();
        a.region = c.BUNDESLAND();
        a.postalCode = c.PLZ();
        a.country = c.LAND();
        card.addresses << a;
    }
    for (const TvkKommItem& item : c.KD()) {
        if (item.status == EntryStatus::Deleted)
            continue;
        VCardTyped phone;
        phone.value = writtenNumber(item);
        const QString kind = item.KOMMBEZ.toLower();
        if (kind.contains(QLatin1String("fax")))
            phone.types << QStringLiteral("fax");
        else if (kind.contains(QLatin1String("handy")) || kind.contains(QLatin1String("mobil")))
            phone.types << QStringLiteral("cell");
        else if (kind.contains(QLatin1String("pager")))
            phone.types << QStringLiteral("pager");
        else
            phone.types << QStringLiteral("voice");
        if (kind.contains(QLatin1String("privat")))
            phone.types << QStringLiteral("home");
        else if (kind.contains(QLatin1String("gesch")) || kind.contains(QLatin1String("büro")))
            phone.types << QStringLiteral("work");
        // A label only where the kinds do not already say it, as other programs show the kinds.
        if (numberLabel(phone) != item.KOMMBEZ.trimmed())
            phone.label = item.KOMMBEZ.trimmed();
        if (!phone.value.isEmpty())
            card.phones << phone;
    }
    for (const TvkMailItem& item : c.Mail()) {
        if (item.status != EntryStatus::Deleted && !item.MAILADDR.trimmed().isEmpty())
            card.emails << VCardTyped{item.MAILADDR.trimmed(), {}, item.BEMERK.trimmed()};
    }
    QString note = notePlainText;
    note.replace(QLatin1String("\r\n"), QLatin1String("\n"));
    while (note.endsWith(QLatin1Char('\n')))
        note.chop(1);
    card.note = note;
    if (!c.KATBEZ().isEmpty())
        card.categories << c.KATBEZ();
    return card;
}

} // namespace orvanta
