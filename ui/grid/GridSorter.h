#pragma once
// The sort part of the grid: the list of sort keys and, per column, the dense rank of every
// source row (computed once per source content and reused by sorting and grouping). Sorting is
// a stable counting sort per key over those ranks, so a million rows sort without comparing
// texts row by row.

#include "ui/grid/GridColumnState.h"

#include <utility>
#include <vector>

namespace orvanta {

// A column's rank per source row: equal values, equal ranks; nulls rank 0.
struct GridRanks {
    std::vector<quint32> rank;
    quint32 max = 0;
    bool valid = false;
};

class GridSorter final {
public:
    // The sort keys in order of significance.
    [[nodiscard]] const std::vector<int>& sortedColumns() const { return m_sort; }
    [[nodiscard]] int sortIndex(int c) const; // -1 when not a key
    void addKey(int c);                       // appended as the least significant key
    bool removeKey(int c);                    // whether it was a key
    void clearKeys() { m_sort.clear(); }

    // The grouped columns first, then the sort keys not grouped.
    [[nodiscard]] std::vector<int> keysAfter(const std::vector<int>& groups) const;

    // Rank cache: one slot per column, emptied whenever the source or a column's binding changes.
    void addColumn() { m_ranks.emplace_back(); }
    void invalidateRanks();
    [[nodiscard]] const GridRanks& ranksOf(int c, const GridSource& source, const GridColumnStates& columns) const;
    // Hands a column's ranks out (the slot is empty afterwards) or takes computed ones in.
    [[nodiscard]] GridRanks takeRanks(int c) { return std::exchange(m_ranks[static_cast<size_t>(c)], GridRanks()); }
    void adoptRanks(int c, GridRanks ranks) { m_ranks[static_cast<size_t>(c)] = std::move(ranks); }

    // Sorts order stably by the keys, each by its column's direction (ascending when none).
    void sort(std::vector<quint32>& order, const std::vector<int>& keys, const GridSource& source,
              const GridColumnStates& columns) const;

private:
    std::vector<int> m_sort;
    mutable std::vector<GridRanks> m_ranks;
};

} // namespace orvanta
