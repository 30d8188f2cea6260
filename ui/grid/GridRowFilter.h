#pragma once
// The filter part of the grid: holds the filter and today's date for the period conditions,
// writes the filter's text and picks the source rows that pass it.

#include "ui/grid/GridColumnState.h"
#include "ui/grid/GridFilter.h"
#include "ui/grid/GridSearch.h"

#include <QDate>
#include <functional>
#include <vector>

namespace orvanta {

class GridRowFilter final {
public:
    GridRowFilter();

    [[nodiscard]] const GridFilter& filter() const { return m_filter; }
    void setFilter(const GridFilter& filter);
    // These return whether anything changed.
    bool setActive(bool active);
    void addItem(GridFilterItem item);
    bool clearItems();

    // The search beside the filter; inactive when it has no text or no column. Returns whether
    // anything changed.
    [[nodiscard]] const GridSearch& search() const { return m_search; }
    bool setSearch(const GridSearch& search);

    // nullptr: the program clock.
    void setTodayProvider(std::function<QDate()> today);
    [[nodiscard]] QDate today() const { return m_today(); }

    // "TSDATE is this week", "(CONTBEZ LIKE 'A%' OR CONTBEZ LIKE 'a%')"; empty without items.
    [[nodiscard]] QString text(const GridColumnStates& columns) const;
    // Source rows passing the filter, ascending; every row when it is inactive or empty. An
    // active search then keeps the rows it finds: among those (narrowing) or among all rows.
    // With from > 0 only the rows from there on are tested, and those passing are appended to
    // out, which holds the result for the rows before.
    void apply(const GridSource& source, const GridColumnStates& columns, std::vector<quint32>& out,
               quint32 from = 0) const;

private:
    void applyFilter(const GridSource& source, const GridColumnStates& columns, std::vector<quint32>& out,
                     quint32 from) const;

    GridFilter m_filter;
    GridSearch m_search;
    std::function<QDate()> m_today;
};

} // namespace orvanta
