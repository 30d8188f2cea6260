#include "phone/VCard.h"

#include "platform/Windows1252.h"

#include <QHash>
#include <QRegularExpression>
#include <QStringDecoder>

namespace orvanta {

QString displayName(const VCardContact& card)
{
    QStringList words;
    for (const QString& part : {card.givenName, card.additionalNames, card.familyName, card.suffix}) {
        if (!part.trimmed().isEmpty())
            words << part.trimmed();
    }
    // A salutation or title alone names nobody.
    if (!words.isEmpty() && !card.prefix.trimmed().isEmpty())
        words.prepend(card.prefix.trimmed());
    return words.isEmpty() ? card.organization.trimmed() : words.join(QLatin1Char(' '));
}

bool VCardContact::isEmpty() const
{
    const bool named = !formattedName.trimmed().isEmpty() || !familyName.trimmed().isEmpty()
        || !givenName.trimmed().isEmpty() || !organization.trimmed().isEmpty();
    return !named && phones.isEmpty() && emails.isEmpty();
}

namespace {

// ---------------------------------------------------------------------------------------------
// Reading

struct Param {
    QByteArray name; // upper case; empty for a vCard 2.1 bare value such as "HOME"
    QByteArray value;
};

struct Property {
    int line = 0;
    QByteArray group; // upper case, without the dot
    QByteArray name;  // upper case
    QList<Param> params;
    QByteArray value;
};

bool isValidUtf8(QByteArrayView bytes)
{
    QStringDecoder decoder(QStringDecoder::Utf8, QStringDecoder::Flag::Stateless);
    const QString decoded = decoder.decode(bytes); // the decoding runs on conversion
    return !decoder.hasError();
}

QString decodeText(QByteArrayView bytes, const QByteArray& charset, int line, QStringList& messages)
{
    const QByteArray name = charset.trimmed().toLower();
    if (name.isEmpty() || name == "utf-8" || name == "utf8") {
        if (isValidUtf8(bytes))
            return QString::fromUtf8(bytes);
        if (!name.isEmpty())
            messages << QStringLiteral("Zeile %1: kein gültiges UTF-8, als Windows-1252 gelesen").arg(line);
        return fromWindows1252(bytes);
    }
    if (name == "iso-8859-1" || name == "latin1" || name == "windows-1252" || name == "cp1252"
        || name == "us-ascii" || name == "ascii")
        return fromWindows1252(bytes);
    QStringDecoder decoder(name.constData());
    if (decoder.isValid()) {
        QString text = decoder.decode(bytes);
        if (!decoder.hasError())
            return text;
    }
    messages << QStringLiteral("Zeile %1: Zeichensatz \"%2\" unbekannt, der Text ist geraten")
                    .arg(line)
                    .arg(QString::fromLatin1(charset.left(40)));
    return isValidUtf8(bytes) ? QString::fromUtf8(bytes) : fromWindows1252(bytes);
}

int hexDigit(char c)
{
    if (c >= '0' && c <= '9')
        return c - '0';
    if (c >= 'A' && c <= 'F')
        return c - 'A' + 10;
    if (c >= 'a' && c <= 'f')
        return c - 'a' + 10;
    return -1;
}

// Quoted-printable; a broken escape stays as it stands and is reported.
QByteArray decodeQuotedPrintable(QByteArrayView in, int line, QStringList& messages)
{
    QByteArray out;
    out.reserve(in.size());
    bool broken = false;
    for (qsizetype i = 0; i < in.size(); ++i) {
        const char c = in[i];
        if (c != '=') {
            out.append(c);
            continue;
        }
        if (i + 2 < in.size()) {
            const int high = hexDigit(in[i + 1]);
            const int low = hexDigit(in[i + 2]);
            if (high >= 0 && low >= 0) {
                out.append(static_cast<char>(high * 16 + low));
                i += 2;
                continue;
            }
        }
        if (i + 1 == in.size())
            continue; // a soft break left at the very end
        broken = true;
        out.append(c);
    }
    if (broken)
        messages << QStringLiteral("Zeile %1: fehlerhaftes Quoted-Printable, unverändert übernommen").arg(line);
    return out;
}

// Splits on sep where it is not escaped by a backslash, then resolves the escapes of each part.
// vCard 2.1 knows only "\;" (and writers of it leave other backslashes as they are).
QStringList splitValue(const QString& text, QChar sep, bool version21)
{
    QStringList parts;
    QString current;
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar c = text.at(i);
        if (c == QLatin1Char('\\') && i + 1 < text.size()) {
            const QChar next = text.at(i + 1);
            if (version21) {
                if (next == QLatin1Char(';') || next == QLatin1Char(',')) {
                    current += next;
                    ++i;
                } else {
                    current += c;
                }
                continue;
            }
            ++i;
            if (next == QLatin1Char('n') || next == QLatin1Char('N'))
                current += QLatin1Char('\n');
            else
                current += next; // "\\", "\,", "\;" and any other escaped character
            continue;
        }
        if (!sep.isNull() && c == sep) {
            parts << current;
            current.clear();
            continue;
        }
        current += c;
    }
    parts << current;
    return parts;
}

QString unescape(const QString& text, bool version21)
{
    return splitValue(text, QChar(), version21).constFirst();
}

QString normalizeBreaks(QString text)
{
    text.replace(QLatin1String("\r\n"), QLatin1String("\n"));
    text.replace(QLatin1Char('\r'), QLatin1Char('\n'));
    return text;
}

// "group.NAME;P1=a;P2=\"b:c\";HOME:value" — false when the line has no colon outside quotes.
bool splitLine(const QByteArray& line, Property& property)
{
    qsizetype colon = -1;
    bool quoted = false;
    QList<QByteArray> pieces;
    qsizetype start = 0;
    for (qsizetype i = 0; i < line.size(); ++i) {
        const char c = line.at(i);
        if (c == '"') {
            quoted = !quoted;
        } else if (!quoted && (c == ';' || c == ':')) {
            pieces << line.mid(start, i - start);
            start = i + 1;
            if (c == ':') {
                colon = i;
                break;
            }
        }
    }
    if (colon < 0 || pieces.isEmpty())
        return false;
    QByteArray name = pieces.takeFirst().trimmed().toUpper();
    const qsizetype dot = name.lastIndexOf('.');
    if (dot >= 0) {
        property.group = name.left(dot);
        name = name.mid(dot + 1);
    }
    if (name.isEmpty())
        return false;
    property.name = name;
    for (const QByteArray& piece : std::as_const(pieces)) {
        const qsizetype eq = piece.indexOf('=');
        Param param;
        if (eq < 0) {
            param.value = piece.trimmed();
        } else {
            param.name = piece.left(eq).trimmed().toUpper();
            param.value = piece.mid(eq + 1).trimmed();
            if (param.value.size() >= 2 && param.value.startsWith('"') && param.value.endsWith('"'))
                param.value = param.value.mid(1, param.value.size() - 2);
        }
        property.params << param;
    }
    property.value = line.mid(colon + 1);
    return true;
}

QByteArray paramValue(const Property& property, const char* name)
{
    for (const Param& param : property.params) {
        if (param.name == name)
            return param.value;
    }
    return {};
}

bool isQuotedPrintable(const Property& property)
{
    for (const Param& param : property.params) {
        if ((param.name.isEmpty() || param.name == "ENCODING") && param.value.toUpper() == "QUOTED-PRINTABLE")
            return true;
    }
    return false;
}

bool isBinary(const Property& property)
{
    for (const Param& param : property.params) {
        const QByteArray value = param.value.toUpper();
        if ((param.name.isEmpty() || param.name == "ENCODING") && (value == "BASE64" || value == "B"))
            return true;
    }
    return false;
}

// The kinds of a TEL, EMAIL or ADR: TYPE values (comma lists, repeated, quoted) and the bare
// values of vCard 2.1, lower case.
QStringList typesOf(const Property& property)
{
    QStringList types;
    for (const Param& param : property.params) {
        if (!param.name.isEmpty() && param.name != "TYPE")
            continue;
        const QByteArray upper = param.value.toUpper();
        if (param.name.isEmpty() && (upper == "QUOTED-PRINTABLE" || upper == "BASE64" || upper.startsWith("CHARSET")))
            continue;
        for (const QByteArray& part : param.value.split(',')) {
            // Only the characters a type name is made of, so that a written card reads back equal.
            QString type;
            for (const char c : part) {
                const char lower = (c >= 'A' && c <= 'Z') ? char(c - 'A' + 'a') : c;
                if ((lower >= 'a' && lower <= 'z') || (lower >= '0' && lower <= '9') || lower == '-')
                    type += QLatin1Char(lower);
            }
            if (type.isEmpty() || type == QLatin1String("8bit") || type == QLatin1String("7bit") || types.contains(type))
                continue;
            types << type;
        }
    }
    return types;
}

class Reader final {
public:
    explicit Reader(QByteArrayView contents) : m_contents(contents.toByteArray()) {}

    VCardReadResult run();

private:
    // Logical lines: folds joined, quoted-printable soft breaks joined.
    void collectLines();
    void handle(const Property& property);
    void finishCard(int line, bool sawEnd);
    QString text(const Property& property);

    QByteArray m_contents;
    struct Line {
        int number;
        QByteArray text;
    };
    QList<Line> m_lines;
    VCardReadResult m_result;

    bool m_inCard = false;
    int m_cardLine = 0;
    bool m_version21 = false;
    VCardContact m_card;
    QHash<QByteArray, QString> m_labels; // X-ABLABEL by group
    QList<QPair<QByteArray, int>> m_phoneGroups;
    QList<QPair<QByteArray, int>> m_mailGroups;
    int m_junkFrom = 0;
    int m_junkLines = 0;
    // Lines without a colon inside a card (such as an unindented photo), reported once per run.
    int m_badFrom = 0;
    int m_badLines = 0;

    void reportUnreadable()
    {
        if (m_badLines == 0)
            return;
        m_result.messages << QStringLiteral("Zeile %1: %2 unlesbare Zeilen übersprungen").arg(m_badFrom).arg(m_badLines);
        m_badLines = 0;
    }
};

void Reader::collectLines()
{
    if (m_contents.startsWith("\xEF\xBB\xBF")) {
        m_contents.remove(0, 3);
    } else if (m_contents.startsWith("\xFF\xFE") || m_contents.startsWith("\xFE\xFF")) {
        QStringDecoder decoder(QStringDecoder::Utf16);
        const QString decoded = decoder.decode(m_contents);
        m_contents = decoded.toUtf8();
    }

    qsizetype pos = 0;
    int number = 0;
    const qsizetype size = m_contents.size();
    bool qpContinues = false;
    while (pos < size) {
        qsizetype end = pos;
        while (end < size && m_contents.at(end) != '\n' && m_contents.at(end) != '\r')
            ++end;
        QByteArray physical = m_contents.mid(pos, end - pos);
        ++number;
        if (end < size && m_contents.at(end) == '\r' && end + 1 < size && m_contents.at(end + 1) == '\n')
            ++end;
        pos = end + 1;

        const bool folded = !physical.isEmpty() && (physical.at(0) == ' ' || physical.at(0) == '\t');
        // A soft break at the end of a card's last line must not swallow the card's end.
        if (qpContinues && (physical.toUpper().startsWith("END:VCARD") || physical.toUpper().startsWith("BEGIN:VCARD")))
            qpContinues = false;
        if (qpContinues && !m_lines.isEmpty()) {
            // The soft break "=" at the end of the previous line joins the lines; a fold's
            // whitespace (some writers fold quoted-printable too) is part of the text here.
            QByteArray& previous = m_lines.last().text;
            previous.chop(1);
            previous += physical;
        } else if (folded && !m_lines.isEmpty()) {
            m_lines.last().text += physical.mid(1);
        } else if (physical.trimmed().isEmpty()) {
            qpContinues = false;
            continue;
        } else {
            m_lines.append({number, physical});
        }
        const QByteArray& current = m_lines.last().text;
        qpContinues = false;
        if (current.endsWith('=')) {
            Property property;
            qpContinues = splitLine(current, property) && isQuotedPrintable(property);
        }
    }
}

QString Reader::text(const Property& property)
{
    QByteArray raw = property.value;
    if (isQuotedPrintable(property))
        raw = decodeQuotedPrintable(raw, property.line, m_result.messages);
    return normalizeBreaks(decodeText(raw, paramValue(property, "CHARSET"), property.line, m_result.messages));
}

void Reader::finishCard(int line, bool sawEnd)
{
    if (!sawEnd)
        m_result.messages << QStringLiteral("Zeile %1: der Karte ab Zeile %2 fehlt END:VCARD").arg(line).arg(m_cardLine);
    for (const auto& [group, index] : std::as_const(m_phoneGroups)) {
        if (m_labels.contains(group))
            m_card.phones[index].label = m_labels.value(group);
    }
    for (const auto& [group, index] : std::as_const(m_mailGroups)) {
        if (m_labels.contains(group))
            m_card.emails[index].label = m_labels.value(group);
    }
    if (m_card.isEmpty()) {
        ++m_result.skippedCards;
        m_result.messages << QStringLiteral("Zeile %1: Karte ohne Namen und Nummern übersprungen").arg(m_cardLine);
    } else {
        if (m_card.formattedName.trimmed().isEmpty())
            m_card.formattedName = displayName(m_card);
        m_result.cards << m_card;
    }
    m_inCard = false;
    m_card = {};
    m_labels.clear();
    m_phoneGroups.clear();
    m_mailGroups.clear();
}

void Reader::handle(const Property& property)
{
    const QByteArray& name = property.name;
    const bool begin = name == "BEGIN" && property.value.trimmed().toUpper() == "VCARD";
    if (begin) {
        if (m_inCard)
            finishCard(property.line, false);
        m_inCard = true;
        m_cardLine = property.line;
        m_version21 = false;
        return;
    }
    if (!m_inCard) {
        if (m_junkLines++ == 0)
            m_junkFrom = property.line;
        return;
    }
    if (name == "END") {
        finishCard(property.line, true);
        return;
    }
    if (name == "VERSION") {
        m_version21 = property.value.trimmed() == "2.1";
        return;
    }
    if (isBinary(property))
        return; // photos, sounds, keys
    if (name == "FN") {
        m_card.formattedName = unescape(text(property), m_version21).trimmed();
    } else if (name == "N") {
        QStringList parts = splitValue(text(property), QLatin1Char(';'), m_version21);
        while (parts.size() < 5)
            parts << QString();
        m_card.familyName = parts.at(0).trimmed();
        m_card.givenName = parts.at(1).trimmed();
        m_card.additionalNames = parts.at(2).trimmed();
        m_card.prefix = parts.at(3).trimmed();
        m_card.suffix = parts.at(4).trimmed();
    } else if (name == "ORG") {
        QStringList parts = splitValue(text(property), QLatin1Char(';'), m_version21);
        m_card.organization = parts.takeFirst().trimmed();
        parts.removeIf([](const QString& part) { return part.trimmed().isEmpty(); });
        m_card.department = parts.join(QStringLiteral(", ")).trimmed();
    } else if (name == "TITLE") {
        m_card.title = unescape(text(property), m_version21).trimmed();
    } else if (name == "ADR") {
        QStringList parts = splitValue(text(property), QLatin1Char(';'), m_version21);
        while (parts.size() < 7)
            parts << QString();
        VCardAddress address;
        address.types = typesOf(property);
        address.poBox = parts.at(0).trimmed();
        address.extended = parts.at(1).trimmed();
        address.street = parts.at(2).trimmed();
        address.locality = parts.at(3).trimmed();
        address.region = parts.at(4).trimmed();
        address.postalCode = parts.at(5).trimmed();
        address.country = parts.at(6).trimmed();
        m_card.addresses << address;
    } else if (name == "TEL") {
        QString value = unescape(text(property), m_version21).trimmed();
        if (value.startsWith(QLatin1String("tel:"), Qt::CaseInsensitive))
            value = value.mid(4);
        if (value.isEmpty())
            return;
        m_card.phones << VCardTyped{value, typesOf(property), {}};
        if (!property.group.isEmpty())
            m_phoneGroups.append({property.group, int(m_card.phones.size() - 1)});
    } else if (name == "EMAIL") {
        QString value = unescape(text(property), m_version21).trimmed();
        if (value.startsWith(QLatin1String("mailto:"), Qt::CaseInsensitive))
            value = value.mid(7);
        if (value.isEmpty())
            return;
        m_card.emails << VCardTyped{value, typesOf(property), {}};
        if (!property.group.isEmpty())
            m_mailGroups.append({property.group, int(m_card.emails.size() - 1)});
    } else if (name == "URL") {
        const QString value = unescape(text(property), m_version21).trimmed();
        if (!value.isEmpty())
            m_card.urls << value;
    } else if (name == "NOTE") {
        const QString value = unescape(text(property), m_version21);
        m_card.note = m_card.note.isEmpty() ? value : m_card.note + QLatin1Char('\n') + value;
    } else if (name == "CATEGORIES") {
        for (const QString& category : splitValue(text(property), QLatin1Char(','), m_version21)) {
            if (!category.trimmed().isEmpty() && !m_card.categories.contains(category.trimmed()))
                m_card.categories << category.trimmed();
        }
    } else if (name == "X-ABLABEL" && !property.group.isEmpty()) {
        QString label = unescape(text(property), m_version21).trimmed();
        // Apple's built-in labels look like "_$!<Mobile>!$_".
        if (label.startsWith(QLatin1String("_$!<")) && label.endsWith(QLatin1String(">!$_")))
            label = label.mid(4, label.size() - 8);
        m_labels.insert(property.group, label);
    }
}

VCardReadResult Reader::run()
{
    collectLines();
    for (const Line& line : std::as_const(m_lines)) {
        Property property;
        property.line = line.number;
        if (!splitLine(line.text, property)) {
            if (m_inCard) {
                if (m_badLines++ == 0)
                    m_badFrom = line.number;
            } else if (m_junkLines++ == 0) {
                m_junkFrom = line.number;
            }
            continue;
        }
        reportUnreadable();
        if (!m_inCard && property.name == "BEGIN" && m_junkLines > 0) {
            m_result.messages << QStringLiteral("Zeile %1: %2 Zeilen außerhalb einer Karte übersprungen")
                                     .arg(m_junkFrom)
                                     .arg(m_junkLines);
            m_junkLines = 0;
        }
        handle(property);
    }
    reportUnreadable();
    if (m_inCard)
        finishCard(m_lines.isEmpty() ? 0 : m_lines.last().number, false);
    if (m_junkLines > 0)
        m_result.messages << QStringLiteral("Zeile %1: %2 Zeilen außerhalb einer Karte übersprungen")
                                 .arg(m_junkFrom)
                                 .arg(m_junkLines);
    return std::move(m_result);
}

// ---------------------------------------------------------------------------------------------
// Writing

QString escapeText(const QString& text)
{
    QString out;
    out.reserve(text.size() + 8);
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar c = text.at(i);
        if (c == QLatin1Char('\\') || c == QLatin1Char(',') || c == QLatin1Char(';')) {
            out += QLatin1Char('\\');
            out += c;
        } else if (c == QLatin1Char('\r')) {
            out += QLatin1String("\\n");
            if (i + 1 < text.size() && text.at(i + 1) == QLatin1Char('\n'))
                ++i;
        } else if (c == QLatin1Char('\n')) {
            out += QLatin1String("\\n");
        } else {
            out += c;
        }
    }
    return out;
}

QString joinEscaped(const QStringList& parts, QChar sep)
{
    QStringList escaped;
    escaped.reserve(parts.size());
    for (const QString& part : parts)
        escaped << escapeText(part);
    return escaped.join(sep);
}

// Appends one content line, folded so that no line exceeds 75 octets and no UTF-8 sequence is cut.
void appendLine(QByteArray& out, const QString& line)
{
    const QByteArray bytes = line.toUtf8();
    qsizetype pos = 0;
    qsizetype limit = 75;
    while (bytes.size() - pos > limit) {
        qsizetype cut = pos + limit;
        while (cut > pos && (static_cast<unsigned char>(bytes.at(cut)) & 0xC0) == 0x80)
            --cut;
        out += bytes.mid(pos, cut - pos);
        out += "\r\n ";
        pos = cut;
        limit = 74; // the leading space counts
    }
    out += bytes.mid(pos);
    out += "\r\n";
}

QString typeParam(const QStringList& types)
{
    QStringList clean;
    for (const QString& type : types) {
        QString t = type.trimmed().toLower();
        t.remove(QRegularExpression(QStringLiteral("[^a-z0-9-]")));
        if (!t.isEmpty() && !clean.contains(t))
            clean << t;
    }
    if (clean.isEmpty())
        return {};
    return QStringLiteral(";TYPE=") + clean.join(QLatin1Char(','));
}

} // namespace

VCardReadResult readVCards(QByteArrayView contents)
{
    return Reader(contents).run();
}

QByteArray writeVCards(const QList<VCardContact>& cards)
{
    QByteArray out;
    for (const VCardContact& card : cards) {
        appendLine(out, QStringLiteral("BEGIN:VCARD"));
        appendLine(out, QStringLiteral("VERSION:4.0"));
        appendLine(out, QStringLiteral("FN:") + escapeText(card.formattedName));
        appendLine(out, QStringLiteral("N:") + joinEscaped({card.familyName, card.givenName, card.additionalNames,
                                                             card.prefix, card.suffix},
                                                            QLatin1Char(';')));
        if (!card.organization.isEmpty() || !card.department.isEmpty()) {
            QStringList org{card.organization};
            if (!card.department.isEmpty())
                org << card.department;
            appendLine(out, QStringLiteral("ORG:") + joinEscaped(org, QLatin1Char(';')));
        }
        if (!card.title.isEmpty())
            appendLine(out, QStringLiteral("TITLE:") + escapeText(card.title));
        for (const VCardAddress& a : card.addresses) {
            appendLine(out, QStringLiteral("ADR") + typeParam(a.types) + QLatin1Char(':')
                                + joinEscaped({a.poBox, a.extended, a.street, a.locality, a.region, a.postalCode,
                                               a.country},
                                              QLatin1Char(';')));
        }
        int item = 0;
        const auto typed = [&](const char* name, const VCardTyped& entry) {
            QString group;
            if (!entry.label.isEmpty())
                group = QStringLiteral("item%1.").arg(++item);
            appendLine(out, group + QLatin1String(name) + typeParam(entry.types) + QLatin1Char(':')
                                + escapeText(entry.value));
            if (!group.isEmpty())
                appendLine(out, group + QStringLiteral("X-ABLabel:") + escapeText(entry.label));
        };
        for (const VCardTyped& phone : card.phones)
            typed("TEL", phone);
        for (const VCardTyped& mail : card.emails)
            typed("EMAIL", mail);
        // Escaped like text, as common readers expect of a web address with a comma.
        for (const QString& url : card.urls)
            appendLine(out, QStringLiteral("URL:") + escapeText(url));
        if (!card.note.isEmpty())
            appendLine(out, QStringLiteral("NOTE:") + escapeText(card.note));
        if (!card.categories.isEmpty())
            appendLine(out, QStringLiteral("CATEGORIES:") + joinEscaped(card.categories, QLatin1Char(',')));
        appendLine(out, QStringLiteral("END:VCARD"));
    }
    return out;
}

} // namespace orvanta
