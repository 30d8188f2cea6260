#include "ui/grid/GridSorter.h"

#include "ui/grid/GridCollation.h"

#include <algorithm>
#include <bit>
#include <limits>
#include <numeric>
#include <string_view>

namespace orvanta {
namespace {

// Stable counting sort of `order` by the key of each row; the keys are dense ranks.
void countingSortPass(std::vector<quint32>& order, const std::vector<quint32>& rank, quint32 maxRank, bool descending,
                      std::vector<quint32>& tmp)
{
    std::vector<quint32> counts(static_cast<size_t>(maxRank) + 2, 0);
    const auto key = [&](quint32 row) { return descending ? maxRank - rank[row] : rank[row]; };
    for (const quint32 row : order)
        ++counts[key(row) + 1];
    for (size_t i = 1; i < counts.size(); ++i)
        counts[i] += counts[i - 1];
    tmp.resize(order.size());
    for (const quint32 row : order)
        tmp[counts[key(row)]++] = row;
    order.swap(tmp);
}

// Open-addressing table from text to a dense id: the distinct texts of a column are few
// compared to its rows, so collation runs on the distinct ones only.
class TextInterner {
public:
    explicit TextInterner(size_t expected)
    {
        size_t cap = 1024;
        while (cap < expected / 4)
            cap <<= 1;
        m_slots.assign(cap, 0);
    }
    static size_t hashOf(QByteArrayView text)
    {
        // FNV-1a: the texts are short, and a cheap hash is what matters at a million rows.
        quint64 h = 14695981039346656037ull;
        for (const char c : text)
            h = (h ^ static_cast<unsigned char>(c)) * 1099511628211ull;
        return static_cast<size_t>(h ^ (h >> 29));
    }
    quint32 intern(QByteArrayView text)
    {
        const size_t h = hashOf(text);
        size_t mask = m_slots.size() - 1;
        size_t i = h & mask;
        for (;;) {
            const quint32 s = m_slots[i];
            if (s == 0)
                break;
            if (m_hashes[s - 1] == h && m_texts[s - 1] == text)
                return s - 1;
            i = (i + 1) & mask;
        }
        const auto id = static_cast<quint32>(m_texts.size());
        m_texts.push_back(text);
        m_hashes.push_back(h);
        m_slots[i] = id + 1;
        if (m_texts.size() * 2 > m_slots.size())
            grow();
        return id;
    }
    [[nodiscard]] const std::vector<QByteArrayView>& texts() const { return m_texts; }

private:
    void grow()
    {
        m_slots.assign(m_slots.size() * 2, 0);
        const size_t mask = m_slots.size() - 1;
        for (quint32 id = 0; id < m_texts.size(); ++id) {
            size_t i = m_hashes[id] & mask;
            while (m_slots[i] != 0)
                i = (i + 1) & mask;
            m_slots[i] = id + 1;
        }
    }
    std::vector<quint32> m_slots;
    std::vector<QByteArrayView> m_texts;
    std::vector<size_t> m_hashes;
};

void computeTextRanks(const GridSource& source, const GridColumnState& column, GridRanks& out)
{
    const quint32 n = source.rowCount();
    out.rank.resize(n);
    TextInterner interner(n);
    for (quint32 row = 0; row < n; ++row)
        out.rank[row] = interner.intern(column.keyText(source, row));
    // Collation keys of the distinct texts in one buffer, then a byte-wise sort of them.
    const std::vector<QByteArrayView>& texts = interner.texts();
    QByteArray keys;
    std::vector<quint32> keyStart(texts.size() + 1);
    for (size_t i = 0; i < texts.size(); ++i) {
        keyStart[i] = static_cast<quint32>(keys.size());
        gridcollation::appendSortKey(texts[i], keys);
    }
    keyStart[texts.size()] = static_cast<quint32>(keys.size());
    const auto key = [&](quint32 id) {
        return std::string_view(keys.constData() + keyStart[id], keyStart[id + 1] - keyStart[id]);
    };
    std::vector<quint32> byText(texts.size());
    std::iota(byText.begin(), byText.end(), 0u);
    std::sort(byText.begin(), byText.end(), [&](quint32 a, quint32 b) { return key(a) < key(b); });
    std::vector<quint32> rankOfId(texts.size());
    quint32 rank = 0;
    for (size_t i = 0; i < byText.size(); ++i) {
        if (i > 0 && key(byText[i - 1]) != key(byText[i]))
            ++rank;
        rankOfId[byText[i]] = rank;
    }
    for (quint32& v : out.rank)
        v = rankOfId[v];
    out.max = rank;
}

void computeNumericRanks(const GridSource& source, const GridColumnState& column, GridRanks& out)
{
    const quint32 n = source.rowCount();
    const int field = column.field;
    out.rank.assign(n, 0);
    out.max = 0;
    if (field < 0 || n == 0)
        return;
    const bool isDouble = source.fieldType(field) == GridFieldType::Double;
    // Values as order-preserving integers; doubles through their bit pattern.
    std::vector<qint64> values(n);
    std::vector<quint8> nulls(n, 0);
    qint64 lo = std::numeric_limits<qint64>::max();
    qint64 hi = std::numeric_limits<qint64>::min();
    bool any = false;
    for (quint32 r = 0; r < n; ++r) {
        if (source.isNull(r, field)) {
            nulls[r] = 1;
            continue;
        }
        qint64 v = 0;
        if (isDouble) {
            const auto bits = std::bit_cast<quint64>(source.doubleValue(r, field));
            const quint64 ordered = (bits & 0x8000'0000'0000'0000ull) ? ~bits : (bits | 0x8000'0000'0000'0000ull);
            v = static_cast<qint64>(ordered ^ 0x8000'0000'0000'0000ull);
        } else {
            v = source.intValue(r, field);
        }
        values[r] = v;
        lo = std::min(lo, v);
        hi = std::max(hi, v);
        any = true;
    }
    if (!any)
        return;
    const auto span = static_cast<quint64>(hi) - static_cast<quint64>(lo);
    // Times are stored in milliseconds but mostly whole seconds: scale them down when exact.
    quint64 step = 1;
    if (span >= (1u << 22)) {
        step = 1000;
        for (quint32 r = 0; r < n && step > 1; ++r) {
            if (!nulls[r] && (static_cast<quint64>(values[r]) - static_cast<quint64>(lo)) % step != 0)
                step = 1;
        }
    }
    const quint64 scaled = span / step;
    if (scaled < (1u << 22) || scaled < static_cast<quint64>(n) * 2) {
        for (quint32 r = 0; r < n; ++r) {
            if (!nulls[r])
                out.rank[r] = static_cast<quint32>((static_cast<quint64>(values[r]) - static_cast<quint64>(lo)) / step) + 1;
        }
        out.max = static_cast<quint32>(scaled) + 1;
        return;
    }
    std::vector<std::pair<qint64, quint32>> pairs;
    pairs.reserve(n);
    for (quint32 r = 0; r < n; ++r) {
        if (!nulls[r])
            pairs.emplace_back(values[r], r);
    }
    std::sort(pairs.begin(), pairs.end());
    quint32 rank = 0;
    for (size_t i = 0; i < pairs.size(); ++i) {
        if (i == 0 || pairs[i].first != pairs[i - 1].first)
            ++rank;
        out.rank[pairs[i].second] = rank;
    }
    out.max = rank;
}

} // namespace

int GridSorter::sortIndex(int c) const
{
    const auto it = std::find(m_sort.begin(), m_sort.end(), c);
    return it == m_sort.end() ? -1 : static_cast<int>(it - m_sort.begin());
}

void GridSorter::addKey(int c)
{
    if (sortIndex(c) < 0)
        m_sort.push_back(c);
}

bool GridSorter::removeKey(int c)
{
    const auto it = std::find(m_sort.begin(), m_sort.end(), c);
    if (it == m_sort.end())
        return false;
    m_sort.erase(it);
    return true;
}

std::vector<int> GridSorter::keysAfter(const std::vector<int>& groups) const
{
    std::vector<int> keys = groups;
    for (const int c : m_sort) {
        if (std::find(keys.begin(), keys.end(), c) == keys.end())
            keys.push_back(c);
    }
    return keys;
}

void GridSorter::invalidateRanks()
{
    for (GridRanks& r : m_ranks)
        r = GridRanks();
}

const GridRanks& GridSorter::ranksOf(int c, const GridSource& source, const GridColumnStates& columns) const
{
    GridRanks& r = m_ranks[static_cast<size_t>(c)];
    if (!r.valid) {
        const GridColumnState& column = columns[static_cast<size_t>(c)];
        if (column.textKey)
            computeTextRanks(source, column, r);
        else
            computeNumericRanks(source, column, r);
        r.valid = true;
    }
    return r;
}

void GridSorter::sort(std::vector<quint32>& order, const std::vector<int>& keys, const GridSource& source,
                      const GridColumnStates& columns) const
{
    if (keys.empty() || order.size() < 2)
        return;
    std::vector<quint32> tmp;
    // Least significant key first: each pass is stable, so earlier keys decide last.
    for (auto it = keys.rbegin(); it != keys.rend(); ++it) {
        const GridRanks& r = ranksOf(*it, source, columns);
        if (r.max == 0)
            continue;
        const bool descending = columns[static_cast<size_t>(*it)].sortOrder == GridSortOrder::Descending;
        countingSortPass(order, r.rank, r.max, descending, tmp);
    }
}

} // namespace orvanta
