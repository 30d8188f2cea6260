#include "ui/grid/GridSearch.h"

#include "ui/grid/GridCollation.h"

#include <array>
#include <bit>
#include <string_view>

namespace orvanta {
namespace {

// Windows-1252 characters of 0x80-0x9F; 0 where the code page has none.
constexpr std::array<char16_t, 32> kWindows1252 = {
    0x20AC, 0,      0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0,      0x017D, 0,      0,      0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0,      0x017E, 0x0178};

// Each byte's search folding, built once from the collation.
struct FoldTable {
    std::array<std::array<char, 2>, 256> bytes{};
    std::array<quint8, 256> length{};
    FoldTable()
    {
        for (int c = 0; c < 256; ++c)
            length[static_cast<size_t>(c)] =
                static_cast<quint8>(gridcollation::searchFold(static_cast<unsigned char>(c), bytes[static_cast<size_t>(c)].data()));
    }
};

const FoldTable& foldTable()
{
    static const FoldTable t;
    return t;
}

} // namespace

bool gridSearchBytes(const QString& text, QByteArray& out)
{
    out.clear();
    out.reserve(text.size());
    for (const QChar ch : text) {
        const char16_t u = ch.unicode();
        if (u <= 0xFF && (u < 0x80 || u > 0x9F)) {
            out.append(static_cast<char>(u));
            continue;
        }
        bool found = false;
        for (size_t i = 0; i < kWindows1252.size(); ++i) {
            if (kWindows1252[i] != 0 && kWindows1252[i] == u) {
                out.append(static_cast<char>(0x80 + i));
                found = true;
                break;
            }
        }
        if (!found)
            return false;
    }
    return true;
}

GridSearchMatcher::GridSearchMatcher(const GridSearch& search, const GridSource& source,
                                     const GridColumnStates& columns)
    : m_source(source)
    , m_exact(search.exact)
    , m_fold(!search.caseSensitive)
{
    QByteArray raw;
    m_impossible = !gridSearchBytes(search.text, raw) || raw.isEmpty();
    if (m_fold)
        gridcollation::appendSearchFold(raw, m_needle);
    else
        m_needle = raw;
    // The bytes a match can begin in (also inside a two-letter character): a cell with none of
    // them is passed over without folding it.
    if (m_fold && !m_needle.isEmpty()) {
        const FoldTable& t = foldTable();
        const char first = m_needle.front();
        for (size_t c = 0; c < 256; ++c)
            m_canStart[c] = t.bytes[c][0] == first || (t.length[c] == 2 && t.bytes[c][1] == first);
    }
    for (const int c : search.columns) {
        if (c < 0 || static_cast<size_t>(c) >= columns.size())
            continue;
        const GridColumnState& s = columns[static_cast<size_t>(c)];
        Column col;
        col.state = &s;
        // A display rule of its own may read other fields: that text is formatted per row.
        col.bytes = s.textKey && !s.def.displayText;
        col.perValue = !col.bytes && !s.def.displayText && !s.def.sortText && s.field >= 0;
        if (!col.bytes && !col.perValue && !s.def.displayText)
            continue; // no field, no text: nothing to find
        // The field's type is read once: a source may work to answer it.
        const GridFieldType type = col.perValue ? source.fieldType(s.field) : GridFieldType::Text;
        col.time = type == GridFieldType::Time;
        col.isDouble = type == GridFieldType::Double;
        m_columns.push_back(col);
    }
    m_valueHits.resize(m_columns.size());
    m_nullHit.assign(m_columns.size(), -1);
    m_last.assign(m_columns.size(), LastValue());
}

bool GridSearchMatcher::matchesText(QByteArrayView text) const
{
    if (m_impossible)
        return false;
    const std::string_view needle(m_needle.constData(), static_cast<size_t>(m_needle.size()));
    if (!m_fold) {
        const std::string_view hay(text.data(), static_cast<size_t>(text.size()));
        return m_exact ? hay == needle : hay.find(needle) != std::string_view::npos;
    }
    // Folding at most doubles a text; one that cannot reach the needle's length is out early.
    if (static_cast<size_t>(text.size()) * 2 < needle.size())
        return false;
    bool candidate = false;
    for (const char ch : text) {
        if (m_canStart[static_cast<unsigned char>(ch)]) {
            candidate = true;
            break;
        }
    }
    if (!candidate)
        return false;
    const FoldTable& t = foldTable();
    if (m_buffer.size() < static_cast<size_t>(text.size()) * 2)
        m_buffer.resize(static_cast<size_t>(text.size()) * 2);
    char* out = m_buffer.data();
    size_t n = 0;
    for (const char ch : text) {
        const auto b = static_cast<unsigned char>(ch);
        out[n] = t.bytes[b][0];
        if (t.length[b] == 2)
            out[++n] = t.bytes[b][1];
        ++n;
    }
    const std::string_view hay(out, n);
    return m_exact ? hay == needle : hay.find(needle) != std::string_view::npos;
}

bool GridSearchMatcher::matches(quint32 row) const
{
    if (m_impossible)
        return false;
    for (size_t i = 0; i < m_columns.size(); ++i) {
        const Column& col = m_columns[i];
        const GridColumnState& s = *col.state;
        if (col.bytes) {
            if (matchesText(s.keyText(m_source, row)))
                return true;
            continue;
        }
        if (col.time) {
            // Times have too many values to format each once: "hh:mm:ss" is written here directly.
            if (!m_source.isNull(row, s.field)) {
                const qint64 ms = m_source.intValue(row, s.field);
                if (ms >= 0 && ms < gridvalue::msPerDay) {
                    const auto secs = static_cast<int>(ms / 1000);
                    const int parts[3] = {secs / 3600, secs / 60 % 60, secs % 60};
                    char text[8];
                    for (int i = 0; i < 3; ++i) {
                        text[i * 3] = static_cast<char>('0' + parts[i] / 10);
                        text[i * 3 + 1] = static_cast<char>('0' + parts[i] % 10);
                        if (i < 2)
                            text[i * 3 + 2] = ':';
                    }
                    if (matchesText(QByteArrayView(text, 8)))
                        return true;
                    continue;
                }
            }
        }
        if (col.perValue) {
            if (m_source.isNull(row, s.field)) {
                if (m_nullHit[i] < 0) {
                    QByteArray text;
                    m_nullHit[i] = gridSearchBytes(s.cellText(m_source, row), text) && matchesText(text) ? 1 : 0;
                }
                if (m_nullHit[i] == 1)
                    return true;
                continue;
            }
            const qint64 value = col.isDouble
                                     ? std::bit_cast<qint64>(m_source.doubleValue(row, s.field))
                                     : m_source.intValue(row, s.field);
            // Neighbouring rows often share a value (the calls of one day).
            LastValue& last = m_last[i];
            if (!last.valid || last.value != value) {
                auto& hits = m_valueHits[i];
                auto it = hits.find(value);
                if (it == hits.end()) {
                    QByteArray text;
                    const bool hit = gridSearchBytes(s.cellText(m_source, row), text) && matchesText(text);
                    it = hits.emplace(value, hit).first;
                }
                last = {value, it->second, true};
            }
            if (last.hit)
                return true;
            continue;
        }
        QByteArray text;
        if (gridSearchBytes(s.cellText(m_source, row), text) && matchesText(text))
            return true;
    }
    return false;
}

} // namespace orvanta
