#include "platform/IniFile.h"

#include "platform/Windows1252.h"

#include <QFile>
#include <QSaveFile>
#include <QStringDecoder>
#include <limits>

namespace orvanta {
namespace {

bool isBlank(QChar c)
{
    return c == u' ' || c == u'\t';
}

QStringView trimBlanks(QStringView text)
{
    qsizetype from = 0;
    qsizetype to = text.size();
    while (from < to && isBlank(text[from]))
        ++from;
    while (to > from && isBlank(text[to - 1]))
        --to;
    return text.mid(from, to - from);
}

// A line break inside a written name or value would split it into lines of its own.
QString singleLine(const QString& text)
{
    QString line = text;
    line.replace(u'\r', u' ').replace(u'\n', u' ').remove(QChar(0));
    return line;
}

} // namespace

IniFile::IniFile(const QString& path)
{
    load(path);
}

bool IniFile::load(const QString& path)
{
    clear();
    m_path = path;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return false;
    const QByteArray bytes = file.readAll();
    if (file.error() != QFileDevice::NoError)
        return false;
    parse(bytes);
    m_loaded = true;
    return true;
}

void IniFile::parse(QByteArrayView bytes)
{
    m_sections.clear();
    m_sectionIndex.clear();
    m_prelude.clear();

    // NUL bytes carry nothing in a text file. They go before the byte-order mark is looked for:
    // dropped later, NULs in front of a mark would turn it into text that reads as a mark once
    // the file is written back.
    QByteArray withoutNuls;
    if (bytes.contains('\0')) {
        withoutNuls = bytes.toByteArray();
        withoutNuls.removeIf([](char c) { return c == '\0'; });
        bytes = withoutNuls;
    }
    QString text;
    m_utf8Bom = bytes.startsWith("\xEF\xBB\xBF");
    if (m_utf8Bom) {
        QStringDecoder utf8(QStringDecoder::Utf8);
        text = utf8(bytes.sliced(3));
    } else {
        text = fromWindows1252(bytes);
    }

    Section* current = nullptr;
    bool currentIsDuplicate = false;
    // Lines that carry nothing readable wait here until it is known what they belong to.
    QStringList pending;
    const auto flushPending = [&] {
        QStringList& target = current != nullptr ? current->tail : m_prelude;
        target += pending;
        pending.clear();
    };
    qsizetype lineStart = 0;
    const qsizetype size = text.size();
    while (lineStart < size) {
        qsizetype lineEnd = lineStart;
        while (lineEnd < size && text[lineEnd] != u'\n' && text[lineEnd] != u'\r')
            ++lineEnd;
        const QString raw = text.mid(lineStart, lineEnd - lineStart);
        lineStart = lineEnd + 1;
        if (lineEnd + 1 < size && text[lineEnd] == u'\r' && text[lineEnd + 1] == u'\n')
            ++lineStart;
        const QStringView line = trimBlanks(raw);

        if (line.isEmpty() || line.front() == u';') {
            pending.append(raw);
            continue;
        }
        if (line.front() == u'[') {
            const qsizetype close = line.indexOf(u']');
            const QString name = trimBlanks(line.mid(1, close < 0 ? -1 : close - 1)).toString();
            const QString folded = fold(name);
            // Later duplicates of a section are invisible, as with the Windows profile functions.
            currentIsDuplicate = m_sectionIndex.contains(folded);
            if (currentIsDuplicate) {
                pending.append(raw);
                continue;
            }
            flushPending();
            m_sectionIndex.insert(folded, m_sections.size());
            m_sections.push_back(Section{name, raw, {}, {}, {}});
            current = &m_sections.back();
            continue;
        }
        const qsizetype eq = line.indexOf(u'=');
        const QString key = eq > 0 ? trimBlanks(line.left(eq)).toString() : QString();
        if (current == nullptr || currentIsDuplicate || key.isEmpty() || findEntry(*current, key) != nullptr) {
            pending.append(raw);
            continue;
        }
        addEntry(*current, key, trimBlanks(line.mid(eq + 1)).toString());
        Entry& entry = current->entries.back();
        entry.lead = std::move(pending);
        entry.line = raw;
        pending.clear();
    }
    flushPending();
}

QByteArray IniFile::serialize() const
{
    QStringList lines = m_prelude;
    for (const Section& section : m_sections) {
        if (!section.header.isEmpty()) {
            lines.append(section.header);
        } else {
            if (!lines.isEmpty() && !lines.constLast().isEmpty())
                lines.append(QString());
            lines.append(u'[' + section.name + u']');
        }
        for (const Entry& entry : section.entries) {
            lines += entry.lead;
            lines.append(entry.line.isEmpty() ? entry.key + u'=' + entry.value : entry.line);
        }
        lines += section.tail;
    }
    if (lines.isEmpty())
        return {};
    const QString text = lines.join(QStringLiteral("\r\n")) + QStringLiteral("\r\n");
    return m_utf8Bom ? QByteArray("\xEF\xBB\xBF") + text.toUtf8() : toWindows1252(text);
}

bool IniFile::save() const
{
    if (m_path.isEmpty())
        return false;
    QSaveFile file(m_path);
    if (!file.open(QIODevice::WriteOnly))
        return false;
    const QByteArray bytes = serialize();
    if (file.write(bytes) != bytes.size()) {
        file.cancelWriting();
        return false;
    }
    return file.commit();
}

bool IniFile::saveAs(const QString& path)
{
    m_path = path;
    return save();
}

QStringList IniFile::sections() const
{
    QStringList names;
    names.reserve(static_cast<qsizetype>(m_sections.size()));
    for (const Section& section : m_sections)
        names.append(section.name);
    return names;
}

QStringList IniFile::keys(const QString& section) const
{
    QStringList names;
    if (const Section* found = findSection(section)) {
        for (const Entry& entry : found->entries)
            names.append(entry.key);
    }
    return names;
}

bool IniFile::sectionExists(const QString& section) const
{
    return findSection(section) != nullptr;
}

bool IniFile::valueExists(const QString& section, const QString& key) const
{
    const Section* found = findSection(section);
    return found != nullptr && findEntry(*found, key) != nullptr;
}

QString IniFile::readString(const QString& section, const QString& key, const QString& defaultValue) const
{
    const Section* found = findSection(section);
    if (found == nullptr)
        return defaultValue;
    const Entry* entry = findEntry(*found, key);
    return entry != nullptr ? entry->value : defaultValue;
}

bool IniFile::parseInteger(QStringView text, int& value)
{
    QStringView rest = trimBlanks(text);
    bool negative = false;
    if (!rest.isEmpty() && (rest.front() == u'-' || rest.front() == u'+')) {
        negative = rest.front() == u'-';
        rest = rest.mid(1);
    }
    int base = 10;
    if (rest.startsWith(u'$')) {
        base = 16;
        rest = rest.mid(1);
    } else if (rest.size() > 2 && rest[0] == u'0' && (rest[1] == u'x' || rest[1] == u'X')) {
        base = 16;
        rest = rest.mid(2);
    }
    if (rest.isEmpty())
        return false;

    // Hexadecimal fills the 32 bits (so $FFFFFFFF is -1); decimal must fit the signed range.
    const quint64 limit = base == 16 ? 0xFFFFFFFFull : (negative ? 0x80000000ull : 0x7FFFFFFFull);
    quint64 magnitude = 0;
    for (const QChar c : rest) {
        const int digit = c.isDigit() && c.unicode() < 0x80   ? c.unicode() - u'0'
            : base == 16 && c >= u'a' && c <= u'f'             ? c.unicode() - u'a' + 10
            : base == 16 && c >= u'A' && c <= u'F'             ? c.unicode() - u'A' + 10
                                                               : -1;
        if (digit < 0)
            return false;
        magnitude = magnitude * static_cast<quint64>(base) + static_cast<quint64>(digit);
        if (magnitude > limit)
            return false;
    }
    const auto bits = static_cast<quint32>(magnitude);
    const quint32 result = negative ? 0u - bits : bits;
    value = static_cast<int>(result);
    return true;
}

int IniFile::readInteger(const QString& section, const QString& key, int defaultValue) const
{
    int value = 0;
    return parseInteger(readString(section, key), value) ? value : defaultValue;
}

bool IniFile::readBool(const QString& section, const QString& key, bool defaultValue) const
{
    return readInteger(section, key, defaultValue ? 1 : 0) != 0;
}

double IniFile::readFloat(const QString& section, const QString& key, double defaultValue) const
{
    QString text = readString(section, key).trimmed();
    if (text.isEmpty())
        return defaultValue;
    // Files written on a German system carry a decimal comma.
    if (!text.contains(u'.'))
        text.replace(u',', u'.');
    bool ok = false;
    const double value = QLocale::c().toDouble(text, &ok);
    return ok && std::isfinite(value) ? value : defaultValue;
}

void IniFile::writeString(const QString& section, const QString& key, const QString& value)
{
    const QString cleanKey = singleLine(key).trimmed().remove(u'=');
    if (cleanKey.isEmpty())
        return;
    Section& target = sectionForWrite(section);
    const auto at = target.index.constFind(fold(cleanKey));
    if (at != target.index.cend()) {
        Entry& entry = target.entries[*at];
        const QString clean = singleLine(value);
        // An unchanged value keeps its line as it was written, blanks and all.
        if (clean != entry.value) {
            entry.value = clean;
            entry.line.clear();
        }
    } else
        addEntry(target, cleanKey, singleLine(value));
}

void IniFile::writeInteger(const QString& section, const QString& key, int value)
{
    writeString(section, key, QString::number(value));
}

void IniFile::writeBool(const QString& section, const QString& key, bool value)
{
    writeString(section, key, value ? QStringLiteral("1") : QStringLiteral("0"));
}

void IniFile::writeFloat(const QString& section, const QString& key, double value)
{
    writeString(section, key, QString::number(value, 'g', 17));
}

void IniFile::deleteKey(const QString& section, const QString& key)
{
    const auto sectionAt = m_sectionIndex.constFind(fold(section));
    if (sectionAt == m_sectionIndex.cend())
        return;
    Section& target = m_sections[*sectionAt];
    const auto at = target.index.constFind(fold(key));
    if (at == target.index.cend())
        return;
    // Comments above the key stay with what follows it.
    const QStringList lead = target.entries[*at].lead;
    if (*at + 1 < target.entries.size())
        target.entries[*at + 1].lead = lead + target.entries[*at + 1].lead;
    else
        target.tail = lead + target.tail;
    target.entries.erase(target.entries.begin() + static_cast<std::ptrdiff_t>(*at));
    target.index.clear();
    for (std::size_t i = 0; i < target.entries.size(); ++i)
        target.index.insert(fold(target.entries[i].key), i);
}

void IniFile::eraseSection(const QString& section)
{
    const auto at = m_sectionIndex.constFind(fold(section));
    if (at == m_sectionIndex.cend())
        return;
    m_sections.erase(m_sections.begin() + static_cast<std::ptrdiff_t>(*at));
    m_sectionIndex.clear();
    for (std::size_t i = 0; i < m_sections.size(); ++i)
        m_sectionIndex.insert(fold(m_sections[i].name), i);
}

void IniFile::clear()
{
    m_sections.clear();
    m_sectionIndex.clear();
    m_prelude.clear();
    m_utf8Bom = false;
    m_loaded = false;
}

QString IniFile::fold(const QString& name)
{
    return name.toCaseFolded();
}

const IniFile::Section* IniFile::findSection(const QString& name) const
{
    const auto at = m_sectionIndex.constFind(fold(trimBlanks(name).toString()));
    return at != m_sectionIndex.cend() ? &m_sections[*at] : nullptr;
}

IniFile::Section& IniFile::sectionForWrite(const QString& name)
{
    const QString clean = singleLine(name).trimmed().remove(u']');
    const QString folded = fold(clean);
    const auto at = m_sectionIndex.constFind(folded);
    if (at != m_sectionIndex.cend())
        return m_sections[*at];
    m_sectionIndex.insert(folded, m_sections.size());
    m_sections.push_back(Section{clean, {}, {}, {}, {}});
    return m_sections.back();
}

const IniFile::Entry* IniFile::findEntry(const Section& section, const QString& key)
{
    const auto at = section.index.constFind(fold(trimBlanks(key).toString()));
    return at != section.index.cend() ? &section.entries[*at] : nullptr;
}

void IniFile::addEntry(Section& section, const QString& key, const QString& value)
{
    section.index.insert(fold(key), section.entries.size());
    section.entries.push_back(Entry{key, value, {}, {}});
}

} // namespace orvanta
