#include "phone/ContactCsv.h"

#include "platform/Windows1252.h"

#include <QRegularExpression>
#include <QStringDecoder>

namespace orvanta {

namespace {

enum class Target {
    Ignore,
    FormattedName,
    Given,
    Additional,
    Family,
    Prefix,
    Suffix,
    Organization,
    Department,
    JobTitle,
    Phone,
    PhoneType, // Google: "Phone 1 - Type" names the kinds of "Phone 1 - Value"
    Email,
    EmailType,
    Url,
    Note,
    Categories,
    Address,
    AddressType,
};

enum class Part { None, Street, Street2, Locality, Region, PostalCode, Country, PoBox };

struct Column {
    Target target = Target::Ignore;
    QStringList types;
    QString slot; // which phone/e-mail/address of the row this column belongs to
    Part part = Part::None;
};

struct Alias {
    const char* name;
    Target target;
    const char* types; // comma list, or the address slot
    Part part = Part::None;
};

// Lower-case header names of the common exports.
constexpr Alias kAliases[] = {
    {"name", Target::FormattedName, ""},
    {"display name", Target::FormattedName, ""},
    {"anzeigename", Target::FormattedName, ""},
    {"full name", Target::FormattedName, ""},
    {"vollständiger name", Target::FormattedName, ""},
    {"bezeichnung", Target::FormattedName, ""},
    {"first name", Target::Given, ""},
    {"given name", Target::Given, ""},
    {"vorname", Target::Given, ""},
    {"middle name", Target::Additional, ""},
    {"additional name", Target::Additional, ""},
    {"weitere vornamen", Target::Additional, ""},
    {"last name", Target::Family, ""},
    {"family name", Target::Family, ""},
    {"nachname", Target::Family, ""},
    {"title", Target::Prefix, ""},
    {"name prefix", Target::Prefix, ""},
    {"anrede", Target::Prefix, ""},
    {"titel", Target::Prefix, ""},
    {"suffix", Target::Suffix, ""},
    {"name suffix", Target::Suffix, ""},
    {"company", Target::Organization, ""},
    {"organization", Target::Organization, ""},
    {"organisation", Target::Organization, ""},
    {"organization 1 - name", Target::Organization, ""},
    {"firma", Target::Organization, ""},
    {"department", Target::Department, ""},
    {"abteilung", Target::Department, ""},
    {"organization 1 - department", Target::Department, ""},
    {"job title", Target::JobTitle, ""},
    {"jobtitle", Target::JobTitle, ""},
    {"position", Target::JobTitle, ""},
    {"organization 1 - title", Target::JobTitle, ""},
    {"business phone", Target::Phone, "work,voice"},
    {"business phone 2", Target::Phone, "work,voice"},
    {"work phone", Target::Phone, "work,voice"},
    {"telefon geschäftlich", Target::Phone, "work,voice"},
    {"telefon geschäftlich 2", Target::Phone, "work,voice"},
    {"company main phone", Target::Phone, "work,voice"},
    {"telefon firma", Target::Phone, "work,voice"},
    {"home phone", Target::Phone, "home,voice"},
    {"home phone 2", Target::Phone, "home,voice"},
    {"telefon privat", Target::Phone, "home,voice"},
    {"telefon privat 2", Target::Phone, "home,voice"},
    {"mobile phone", Target::Phone, "cell"},
    {"mobile number", Target::Phone, "cell"},
    {"mobiltelefon", Target::Phone, "cell"},
    {"mobil", Target::Phone, "cell"},
    {"handy", Target::Phone, "cell"},
    {"business fax", Target::Phone, "work,fax"},
    {"fax geschäftlich", Target::Phone, "work,fax"},
    {"home fax", Target::Phone, "home,fax"},
    {"fax privat", Target::Phone, "home,fax"},
    {"fax number", Target::Phone, "fax"},
    {"fax", Target::Phone, "fax"},
    {"pager", Target::Phone, "pager"},
    {"other phone", Target::Phone, "voice"},
    {"weiteres telefon", Target::Phone, "voice"},
    {"primary phone", Target::Phone, "voice"},
    {"haupttelefon", Target::Phone, "voice"},
    {"phone", Target::Phone, "voice"},
    {"telefon", Target::Phone, "voice"},
    {"telefonnummer", Target::Phone, "voice"},
    {"e-mail address", Target::Email, ""},
    {"e-mail 2 address", Target::Email, ""},
    {"e-mail 3 address", Target::Email, ""},
    {"e-mail-adresse", Target::Email, ""},
    {"e-mail 2: adresse", Target::Email, ""},
    {"e-mail 3: adresse", Target::Email, ""},
    {"e-mail 2-adresse", Target::Email, ""},
    {"e-mail 3-adresse", Target::Email, ""},
    {"primary email", Target::Email, ""},
    {"secondary email", Target::Email, ""},
    {"email", Target::Email, ""},
    {"e-mail", Target::Email, ""},
    {"web page", Target::Url, ""},
    {"webseite", Target::Url, ""},
    {"website", Target::Url, ""},
    {"web page 2", Target::Url, ""},
    {"internet", Target::Url, ""},
    {"notes", Target::Note, ""},
    {"note", Target::Note, ""},
    {"notizen", Target::Note, ""},
    {"notiz", Target::Note, ""},
    {"categories", Target::Categories, ""},
    {"kategorien", Target::Categories, ""},
    {"kategorie", Target::Categories, ""},
    // Addresses: business, home, other and a plain one.
    {"business street", Target::Address, "work", Part::Street},
    {"business street 2", Target::Address, "work", Part::Street2},
    {"business city", Target::Address, "work", Part::Locality},
    {"business state", Target::Address, "work", Part::Region},
    {"business postal code", Target::Address, "work", Part::PostalCode},
    {"business country/region", Target::Address, "work", Part::Country},
    {"business country", Target::Address, "work", Part::Country},
    {"business po box", Target::Address, "work", Part::PoBox},
    {"straße geschäftlich", Target::Address, "work", Part::Street},
    {"straße geschäftlich 2", Target::Address, "work", Part::Street2},
    {"ort geschäftlich", Target::Address, "work", Part::Locality},
    {"region geschäftlich", Target::Address, "work", Part::Region},
    {"bundesland/kanton geschäftlich", Target::Address, "work", Part::Region},
    {"postleitzahl geschäftlich", Target::Address, "work", Part::PostalCode},
    {"land/region geschäftlich", Target::Address, "work", Part::Country},
    {"land geschäftlich", Target::Address, "work", Part::Country},
    {"postfach geschäftlich", Target::Address, "work", Part::PoBox},
    {"work address", Target::Address, "work", Part::Street},
    {"work address 2", Target::Address, "work", Part::Street2},
    {"work city", Target::Address, "work", Part::Locality},
    {"work state", Target::Address, "work", Part::Region},
    {"work zipcode", Target::Address, "work", Part::PostalCode},
    {"work country", Target::Address, "work", Part::Country},
    {"home street", Target::Address, "home", Part::Street},
    {"home street 2", Target::Address, "home", Part::Street2},
    {"home city", Target::Address, "home", Part::Locality},
    {"home state", Target::Address, "home", Part::Region},
    {"home postal code", Target::Address, "home", Part::PostalCode},
    {"home country/region", Target::Address, "home", Part::Country},
    {"home country", Target::Address, "home", Part::Country},
    {"home po box", Target::Address, "home", Part::PoBox},
    {"home address", Target::Address, "home", Part::Street},
    {"home address 2", Target::Address, "home", Part::Street2},
    {"home zipcode", Target::Address, "home", Part::PostalCode},
    {"straße privat", Target::Address, "home", Part::Street},
    {"straße privat 2", Target::Address, "home", Part::Street2},
    {"ort privat", Target::Address, "home", Part::Locality},
    {"region privat", Target::Address, "home", Part::Region},
    {"bundesland/kanton privat", Target::Address, "home", Part::Region},
    {"postleitzahl privat", Target::Address, "home", Part::PostalCode},
    {"land/region privat", Target::Address, "home", Part::Country},
    {"land privat", Target::Address, "home", Part::Country},
    {"postfach privat", Target::Address, "home", Part::PoBox},
    {"other street", Target::Address, "other", Part::Street},
    {"other city", Target::Address, "other", Part::Locality},
    {"other state", Target::Address, "other", Part::Region},
    {"other postal code", Target::Address, "other", Part::PostalCode},
    {"other country/region", Target::Address, "other", Part::Country},
    {"weitere straße", Target::Address, "other", Part::Street},
    {"weiterer ort", Target::Address, "other", Part::Locality},
    {"weitere postleitzahl", Target::Address, "other", Part::PostalCode},
    {"weiteres land/region", Target::Address, "other", Part::Country},
    {"street", Target::Address, "", Part::Street},
    {"straße", Target::Address, "", Part::Street},
    {"strasse", Target::Address, "", Part::Street},
    {"adresse", Target::Address, "", Part::Street},
    {"address", Target::Address, "", Part::Street},
    {"city", Target::Address, "", Part::Locality},
    {"ort", Target::Address, "", Part::Locality},
    {"stadt", Target::Address, "", Part::Locality},
    {"state", Target::Address, "", Part::Region},
    {"bundesland", Target::Address, "", Part::Region},
    {"zip", Target::Address, "", Part::PostalCode},
    {"zipcode", Target::Address, "", Part::PostalCode},
    {"postal code", Target::Address, "", Part::PostalCode},
    {"postleitzahl", Target::Address, "", Part::PostalCode},
    {"plz", Target::Address, "", Part::PostalCode},
    {"country", Target::Address, "", Part::Country},
    {"land", Target::Address, "", Part::Country},
};

Column columnFor(const QString& header)
{
    const QString name = header.trimmed().toLower();
    Column column;
    for (const Alias& alias : kAliases) {
        if (name != QString::fromUtf8(alias.name))
            continue;
        column.target = alias.target;
        if (alias.target == Target::Address) {
            column.slot = QString::fromLatin1(alias.types);
            if (!column.slot.isEmpty())
                column.types << column.slot;
        } else if (alias.target == Target::Phone) {
            column.types = QString::fromLatin1(alias.types).split(QLatin1Char(','));
            column.slot = name;
        }
        column.part = alias.part;
        return column;
    }
    // Google's numbered groups: "Phone 1 - Value", "E-mail 2 - Type", "Address 1 - Street" …
    static const QRegularExpression numbered(QStringLiteral("^(phone|e-mail|website|address) (\\d+) - (.+)$"));
    const QRegularExpressionMatch m = numbered.match(name);
    if (!m.hasMatch())
        return column;
    const QString group = m.captured(1);
    const QString field = m.captured(3);
    column.slot = group + m.captured(2);
    if (group == QLatin1String("phone"))
        column.target = field == QLatin1String("value") ? Target::Phone : field == QLatin1String("type") ? Target::PhoneType : Target::Ignore;
    else if (group == QLatin1String("e-mail"))
        column.target = field == QLatin1String("value") ? Target::Email : field == QLatin1String("type") ? Target::EmailType : Target::Ignore;
    else if (group == QLatin1String("website"))
        column.target = field == QLatin1String("value") ? Target::Url : Target::Ignore;
    else {
        static const QList<QPair<QString, Part>> parts = {
            {QStringLiteral("street"), Part::Street},         {QStringLiteral("extended address"), Part::Street2},
            {QStringLiteral("city"), Part::Locality},         {QStringLiteral("region"), Part::Region},
            {QStringLiteral("postal code"), Part::PostalCode}, {QStringLiteral("country"), Part::Country},
            {QStringLiteral("po box"), Part::PoBox}};
        column.target = field == QLatin1String("type") ? Target::AddressType : Target::Ignore;
        for (const auto& [text, part] : parts) {
            if (field == text) {
                column.target = Target::Address;
                column.part = part;
            }
        }
    }
    return column;
}

QString decodeFile(QByteArrayView bytes)
{
    if (bytes.startsWith("\xEF\xBB\xBF"))
        return QString::fromUtf8(bytes.sliced(3));
    if (bytes.startsWith("\xFF\xFE") || bytes.startsWith("\xFE\xFF")) {
        QStringDecoder decoder(QStringDecoder::Utf16);
        return decoder.decode(bytes);
    }
    QStringDecoder utf8(QStringDecoder::Utf8, QStringDecoder::Flag::Stateless);
    QString text = utf8.decode(bytes);
    return utf8.hasError() ? fromWindows1252(bytes) : text;
}

struct Record {
    int line = 0;
    QStringList fields;
};

// RFC 4180 with any separator; an unterminated quote takes the rest of the file and is reported.
QList<Record> splitRecords(const QString& text, QChar sep, QStringList& messages)
{
    QList<Record> records;
    Record current;
    QString field;
    int line = 1;
    current.line = 1;
    bool quoted = false;
    bool fieldStarted = false;
    int quoteLine = 0;
    const auto endRecord = [&] {
        current.fields << field;
        field.clear();
        fieldStarted = false;
        bool empty = true;
        for (const QString& f : std::as_const(current.fields))
            empty = empty && f.trimmed().isEmpty();
        if (!empty)
            records << current;
        current = Record{};
        current.line = line;
    };
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar c = text.at(i);
        if (quoted) {
            if (c == QLatin1Char('"')) {
                if (i + 1 < text.size() && text.at(i + 1) == QLatin1Char('"')) {
                    field += c;
                    ++i;
                } else {
                    quoted = false;
                }
            } else {
                if (c == QLatin1Char('\n'))
                    ++line;
                if (c == QLatin1Char('\r') && i + 1 < text.size() && text.at(i + 1) == QLatin1Char('\n'))
                    continue; // stored as one line break
                field += c == QLatin1Char('\r') ? QChar(QLatin1Char('\n')) : c;
            }
            continue;
        }
        if (c == QLatin1Char('"') && !fieldStarted) {
            quoted = true;
            fieldStarted = true;
            quoteLine = line;
        } else if (c == sep) {
            current.fields << field;
            field.clear();
            fieldStarted = false;
        } else if (c == QLatin1Char('\n') || c == QLatin1Char('\r')) {
            if (c == QLatin1Char('\r') && i + 1 < text.size() && text.at(i + 1) == QLatin1Char('\n'))
                ++i;
            ++line;
            endRecord();
        } else {
            field += c;
            fieldStarted = true;
        }
    }
    if (quoted)
        messages << QStringLiteral("Zeile %1: Anführungszeichen nicht geschlossen, der Rest der Datei ist ein Feld").arg(quoteLine);
    if (fieldStarted || !current.fields.isEmpty())
        endRecord();
    return records;
}

QChar guessSeparator(const QString& text)
{
    qsizetype end = text.indexOf(QLatin1Char('\n'));
    const QString first = text.left(end < 0 ? text.size() : end);
    QChar best = QLatin1Char(',');
    qsizetype bestCount = 0;
    for (const QChar sep : {QChar(QLatin1Char(',')), QChar(QLatin1Char(';')), QChar(QLatin1Char('\t'))}) {
        bool quoted = false;
        qsizetype count = 0;
        for (const QChar c : first) {
            if (c == QLatin1Char('"'))
                quoted = !quoted;
            else if (!quoted && c == sep)
                ++count;
        }
        if (count > bestCount) {
            best = sep;
            bestCount = count;
        }
    }
    return best;
}

void setPart(VCardAddress& a, Part part, const QString& value)
{
    switch (part) {
    case Part::Street: a.street = value; break;
    case Part::Street2: a.extended = value; break;
    case Part::Locality: a.locality = value; break;
    case Part::Region: a.region = value; break;
    case Part::PostalCode: a.postalCode = value; break;
    case Part::Country: a.country = value; break;
    case Part::PoBox: a.poBox = value; break;
    case Part::None: break;
    }
}

// Google writes several values in one field separated by " ::: ".
QStringList values(const QString& field)
{
    QStringList out;
    for (const QString& v : field.split(QStringLiteral(" ::: "))) {
        if (!v.trimmed().isEmpty())
            out << v.trimmed();
    }
    return out;
}

} // namespace

VCardReadResult readContactCsv(QByteArrayView contents)
{
    VCardReadResult result;
    const QString text = decodeFile(contents);
    const QList<Record> records = splitRecords(text, guessSeparator(text), result.messages);
    if (records.isEmpty())
        return result;

    QList<Column> columns;
    QStringList unknown;
    bool anyKnown = false;
    for (const QString& header : records.constFirst().fields) {
        columns << columnFor(header);
        if (columns.constLast().target == Target::Ignore && !header.trimmed().isEmpty())
            unknown << header.trimmed();
        anyKnown = anyKnown || columns.constLast().target != Target::Ignore;
    }
    if (!anyKnown) {
        result.messages << QStringLiteral("Zeile 1: die Kopfzeile nennt keine bekannte Spalte, nichts gelesen");
        return result;
    }
    if (!unknown.isEmpty())
        result.messages << QStringLiteral("Zeile 1: Spalten nicht übernommen: %1").arg(unknown.join(QStringLiteral(", ")));

    for (qsizetype r = 1; r < records.size(); ++r) {
        const Record& record = records.at(r);
        if (record.fields.size() != columns.size())
            result.messages << QStringLiteral("Zeile %1: %2 statt %3 Felder").arg(record.line).arg(record.fields.size()).arg(columns.size());
        VCardContact card;
        QMap<QString, VCardAddress> addresses; // by slot, in slot order
        QMap<QString, QStringList> kinds;       // Google types by slot
        QList<QPair<QString, VCardTyped>> phones, mails;
        const qsizetype n = std::min(record.fields.size(), columns.size());
        for (qsizetype i = 0; i < n; ++i) {
            const Column& col = columns.at(i);
            const QString value = record.fields.at(i).trimmed();
            if (value.isEmpty())
                continue;
            switch (col.target) {
            case Target::Ignore: break;
            case Target::FormattedName: card.formattedName = value; break;
            case Target::Given: card.givenName = value; break;
            case Target::Additional: card.additionalNames = value; break;
            case Target::Family: card.familyName = value; break;
            case Target::Prefix: card.prefix = card.prefix.isEmpty() ? value : card.prefix + QLatin1Char(' ') + value; break;
            case Target::Suffix: card.suffix = value; break;
            case Target::Organization: card.organization = value; break;
            case Target::Department: card.department = value; break;
            case Target::JobTitle: card.title = value; break;
            case Target::Phone:
                for (const QString& v : values(value))
                    phones.append({col.slot, VCardTyped{v, col.types, {}}});
                break;
            case Target::Email:
                for (const QString& v : values(value))
                    mails.append({col.slot, VCardTyped{v, {}, {}}});
                break;
            case Target::PhoneType:
            case Target::EmailType:
            case Target::AddressType: kinds[col.slot] = QStringList{value.toLower().remove(QStringLiteral("* "))}; break;
            case Target::Url: card.urls << values(value); break;
            case Target::Note: card.note = value; break;
            case Target::Categories:
                for (const QString& v : value.split(QRegularExpression(QStringLiteral("\\s*(?:;|,| ::: )\\s*")))) {
                    if (!v.trimmed().isEmpty() && !v.startsWith(QLatin1Char('*')))
                        card.categories << v.trimmed();
                }
                break;
            case Target::Address: {
                VCardAddress& a = addresses[col.slot];
                a.types = col.types;
                setPart(a, col.part, value);
                break;
            }
            }
        }
        for (auto& [slot, phone] : phones) {
            if (kinds.contains(slot)) {
                const QString kind = kinds.value(slot).constFirst();
                phone.types = {kind == QLatin1String("mobile") ? QStringLiteral("cell") : kind};
            }
            card.phones << phone;
        }
        for (auto& [slot, mail] : mails) {
            if (kinds.contains(slot))
                mail.label = kinds.value(slot).constFirst() == QLatin1String("work") ? QStringLiteral("geschäftlich")
                    : kinds.value(slot).constFirst() == QLatin1String("home")        ? QStringLiteral("privat")
                                                                                     : QString();
            card.emails << mail;
        }
        for (auto it = addresses.begin(); it != addresses.end(); ++it) {
            if (kinds.contains(it.key()))
                it->types = kinds.value(it.key());
            card.addresses << *it;
        }
        // A business contact lists its business address first.
        std::stable_sort(card.addresses.begin(), card.addresses.end(), [&](const VCardAddress& a, const VCardAddress& b) {
            const auto rank = [&](const VCardAddress& x) {
                if (x.types.contains(QLatin1String("work")))
                    return card.organization.isEmpty() ? 1 : 0;
                return x.types.contains(QLatin1String("home")) ? (card.organization.isEmpty() ? 0 : 1) : 2;
            };
            return rank(a) < rank(b);
        });
        if (card.formattedName.isEmpty())
            card.formattedName = displayName(card);
        if (card.isEmpty()) {
            ++result.skippedCards;
            result.messages << QStringLiteral("Zeile %1: Zeile ohne Namen und Nummern übersprungen").arg(record.line);
            continue;
        }
        result.cards << card;
    }
    return result;
}

} // namespace orvanta
