#pragma once
// The search of a grid: rows where any chosen column contains a text (or, exactly, is it). It
// lives beside the filter, not in it: a search is never stored with a layout, and it either
// narrows the filter's rows or replaces the filter while it lasts. Text is taken literally: no
// wildcards.
//
// Without caseSensitive the comparison folds both sides as gridcollation::searchFold does (case,
// and "ß" as "ss"), so "strasse" finds "Straße" and "müller" finds "Müller", but "muller" does
// not. Text columns are searched in the bytes they sort by; other columns in their display text,
// formatted once per distinct value (times, with a value per second, as they are met).

#include "ui/grid/GridColumnState.h"

#include <QByteArray>
#include <QString>
#include <array>
#include <unordered_map>
#include <vector>

namespace orvanta {

struct GridSearch {
    QString text;
    std::vector<int> columns; // controller column indexes
    bool exact = false;         // the whole cell, not a part of it
    bool caseSensitive = false;
    bool narrow = false;        // within the rows the filter passes; else instead of the filter

    // Without a text or a column there is nothing to search.
    [[nodiscard]] bool isActive() const { return !text.isEmpty() && !columns.empty(); }
    bool operator==(const GridSearch&) const = default;
};

// The search text as the grid's text bytes (ISO 8859-1 with the Windows characters of 0x80-0x9F,
// as the database stores them); false when it holds a character no cell can contain.
[[nodiscard]] bool gridSearchBytes(const QString& text, QByteArray& out);

// The predicate over one source: compiled once, then asked row by row.
class GridSearchMatcher final {
public:
    GridSearchMatcher(const GridSearch& search, const GridSource& source, const GridColumnStates& columns);

    [[nodiscard]] bool matches(quint32 row) const;
    // One text against the compiled search text (the text as it would stand in a cell).
    [[nodiscard]] bool matchesText(QByteArrayView text) const;

private:
    struct Column {
        const GridColumnState* state = nullptr;
        bool bytes = false;     // searched in its key bytes
        bool perValue = false;  // display text depends on the field value alone
        bool time = false;      // a plain time: formatted on the spot
        bool isDouble = false;
    };

    const GridSource& m_source;
    std::vector<Column> m_columns;
    QByteArray m_needle;
    bool m_exact = false;
    bool m_fold = true;
    bool m_impossible = false;
    std::array<bool, 256> m_canStart{};
    mutable std::vector<char> m_buffer;
    // Per column, the answer for each value already seen (non-text columns).
    mutable std::vector<std::unordered_map<qint64, bool>> m_valueHits;
    mutable std::vector<signed char> m_nullHit;
    struct LastValue {
        qint64 value = 0;
        bool hit = false;
        bool valid = false;
    };
    mutable std::vector<LastValue> m_last;
};

} // namespace orvanta
