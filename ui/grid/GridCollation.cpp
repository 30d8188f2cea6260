#include "ui/grid/GridCollation.h"

#include <array>

namespace orvanta::gridcollation {
namespace {

// Primary weights (0 = ignored at the first level), up to two per byte for expansions, and an
// accent class for the second level.
struct Weight {
    quint16 w1 = 0;
    quint16 w2 = 0;
    quint8 accent = 0;
};

constexpr quint16 letterWeight(char base) { return static_cast<quint16>(0x300 + (base - 'a') * 2); }

struct Table {
    std::array<Weight, 256> w{};

    Table()
    {
        // Control characters are ignored; other symbols keep their code order before digits.
        for (int c = 0x20; c < 256; ++c)
            w[c].w1 = static_cast<quint16>(0x100 + c);
        w[' '].w1 = 0x100; // blank first
        w['-'].w1 = 0;
        w['\''].w1 = 0;
        w[0xAD].w1 = 0; // soft hyphen
        for (int d = 0; d < 10; ++d)
            w['0' + d].w1 = static_cast<quint16>(0x200 + d);
        w[0xB9].w1 = 0x201;
        w[0xB2].w1 = 0x202;
        w[0xB3].w1 = 0x203;
        for (int c = 'a'; c <= 'z'; ++c) {
            w[c].w1 = letterWeight(static_cast<char>(c));
            w[c - 0x20].w1 = letterWeight(static_cast<char>(c));
        }
        const auto accented = [this](unsigned char upper, char base, quint8 accent) {
            w[upper] = {letterWeight(base), 0, accent};
            w[upper + 0x20] = {letterWeight(base), 0, accent};
        };
        // À Á Â Ã Ä Å
        for (int i = 0; i < 6; ++i)
            accented(static_cast<unsigned char>(0xC0 + i), 'a', static_cast<quint8>(i + 1));
        accented(0xC7, 'c', 7);
        for (int i = 0; i < 4; ++i) // È É Ê Ë
            accented(static_cast<unsigned char>(0xC8 + i), 'e', static_cast<quint8>(i + 1));
        for (int i = 0; i < 4; ++i) // Ì Í Î Ï
            accented(static_cast<unsigned char>(0xCC + i), 'i', static_cast<quint8>(i + 1));
        accented(0xD0, 'd', 8);
        accented(0xD1, 'n', 4);
        for (int i = 0; i < 5; ++i) // Ò Ó Ô Õ Ö
            accented(static_cast<unsigned char>(0xD2 + i), 'o', static_cast<quint8>(i + 1));
        accented(0xD8, 'o', 8);
        for (int i = 0; i < 4; ++i) // Ù Ú Û Ü
            accented(static_cast<unsigned char>(0xD9 + i), 'u', static_cast<quint8>(i + 1));
        accented(0xDD, 'y', 2);
        w[0xFF] = {letterWeight('y'), 0, 5};
        // Æ æ → ae, Þ þ → th, ß → ss
        w[0xC6] = w[0xE6] = {letterWeight('a'), letterWeight('e'), 9};
        w[0xDE] = w[0xFE] = {letterWeight('t'), letterWeight('h'), 9};
        w[0xDF] = {letterWeight('s'), letterWeight('s'), 9};
        w[0xAA] = {letterWeight('a'), 0, 10}; // ª
        w[0xBA] = {letterWeight('o'), 0, 10}; // º
    }
};

const Table& table()
{
    static const Table t;
    return t;
}

// Walks the primary weights of a text, expanding two-weight characters.
class PrimaryCursor {
public:
    explicit PrimaryCursor(QByteArrayView s)
        : m_s(s)
    {
    }
    // Next non-ignored weight, 0 at the end.
    quint16 next()
    {
        const auto& t = table().w;
        if (m_pending) {
            const quint16 p = m_pending;
            m_pending = 0;
            return p;
        }
        while (m_i < m_s.size()) {
            const Weight& w = t[static_cast<unsigned char>(m_s[m_i++])];
            if (w.w1 == 0)
                continue;
            m_pending = w.w2;
            return w.w1;
        }
        return 0;
    }

private:
    QByteArrayView m_s;
    qsizetype m_i = 0;
    quint16 m_pending = 0;
};

int compareAccents(QByteArrayView a, QByteArrayView b)
{
    const auto& t = table().w;
    qsizetype i = 0;
    qsizetype j = 0;
    for (;;) {
        while (i < a.size() && t[static_cast<unsigned char>(a[i])].w1 == 0)
            ++i;
        while (j < b.size() && t[static_cast<unsigned char>(b[j])].w1 == 0)
            ++j;
        if (i == a.size() || j == b.size())
            return (i == a.size() ? 0 : 1) - (j == b.size() ? 0 : 1);
        const int d = t[static_cast<unsigned char>(a[i])].accent - t[static_cast<unsigned char>(b[j])].accent;
        if (d != 0)
            return d;
        ++i;
        ++j;
    }
}

} // namespace

unsigned char foldCase(unsigned char c)
{
    if ((c >= 'A' && c <= 'Z') || (c >= 0xC0 && c <= 0xDE && c != 0xD7))
        return static_cast<unsigned char>(c + 0x20);
    return c;
}

int searchFold(unsigned char c, char out[2])
{
    const Weight& w = table().w[c];
    if (w.w2 != 0) {
        // Expansions are letters: weight 0x300 + 2 * (letter - 'a').
        out[0] = static_cast<char>('a' + (w.w1 - 0x300) / 2);
        out[1] = static_cast<char>('a' + (w.w2 - 0x300) / 2);
        return 2;
    }
    out[0] = static_cast<char>(foldCase(c));
    return 1;
}

void appendSearchFold(QByteArrayView text, QByteArray& out)
{
    char buf[2];
    for (const char ch : text)
        out.append(buf, searchFold(static_cast<unsigned char>(ch), buf));
}

int compare(QByteArrayView a, QByteArrayView b)
{
    {
        PrimaryCursor ca(a);
        PrimaryCursor cb(b);
        for (;;) {
            const quint16 wa = ca.next();
            const quint16 wb = cb.next();
            if (wa != wb)
                return wa < wb ? -1 : 1;
            if (wa == 0)
                break;
        }
    }
    if (const int d = compareAccents(a, b); d != 0)
        return d < 0 ? -1 : 1;
    const qsizetype n = std::min(a.size(), b.size());
    for (qsizetype i = 0; i < n; ++i) {
        const unsigned char fa = foldCase(static_cast<unsigned char>(a[i]));
        const unsigned char fb = foldCase(static_cast<unsigned char>(b[i]));
        if (fa != fb)
            return fa < fb ? -1 : 1;
    }
    return a.size() == b.size() ? 0 : (a.size() < b.size() ? -1 : 1);
}

void appendSortKey(QByteArrayView text, QByteArray& out)
{
    const auto& t = table().w;
    // Primary weights as two big-endian bytes each (all >= 0x0100), ended by two zero bytes.
    for (const char ch : text) {
        const Weight& w = t[static_cast<unsigned char>(ch)];
        if (w.w1 == 0)
            continue;
        out.append(static_cast<char>(w.w1 >> 8)).append(static_cast<char>(w.w1 & 0xFF));
        if (w.w2 != 0)
            out.append(static_cast<char>(w.w2 >> 8)).append(static_cast<char>(w.w2 & 0xFF));
    }
    out.append('\0').append('\0');
    // Accents of the characters that count, plus one so that the end marker sorts first.
    for (const char ch : text) {
        const Weight& w = t[static_cast<unsigned char>(ch)];
        if (w.w1 != 0)
            out.append(static_cast<char>(w.accent + 1));
    }
    out.append('\0');
    for (const char ch : text)
        out.append(static_cast<char>(foldCase(static_cast<unsigned char>(ch))));
}

QByteArray sortKey(QByteArrayView text)
{
    QByteArray key;
    key.reserve(text.size() * 4 + 3);
    appendSortKey(text, key);
    return key;
}

bool like(QByteArrayView text, QByteArrayView pattern, bool caseSensitive)
{
    // Iterative wildcard match with one backtrack point: linear for the patterns grids use.
    const auto same = [caseSensitive](char x, char y) {
        if (caseSensitive)
            return x == y;
        return foldCase(static_cast<unsigned char>(x)) == foldCase(static_cast<unsigned char>(y));
    };
    qsizetype t = 0;
    qsizetype p = 0;
    qsizetype starP = -1;
    qsizetype starT = 0;
    while (t < text.size()) {
        if (p < pattern.size() && pattern[p] == '%') {
            starP = p++;
            starT = t;
        } else if (p < pattern.size() && (pattern[p] == '_' || same(pattern[p], text[t]))) {
            ++p;
            ++t;
        } else if (starP >= 0) {
            p = starP + 1;
            t = ++starT;
        } else {
            return false;
        }
    }
    while (p < pattern.size() && pattern[p] == '%')
        ++p;
    return p == pattern.size();
}

} // namespace orvanta::gridcollation
