#pragma once
// Locks a grid view against repainting (and its controller against announcing) for one scope,
// so that a rebuild of filter, sorting, grouping or columns is applied and painted once.

#include "ui/grid/GridCardView.h"
#include "ui/grid/GridView.h"

namespace orvanta {

class GridUpdateLock final {
public:
    explicit GridUpdateLock(GridView* view)
        : m_table(view)
    {
        m_table->beginUpdate();
    }
    explicit GridUpdateLock(GridCardView* view)
        : m_cards(view)
    {
        m_cards->beginUpdate();
    }
    ~GridUpdateLock()
    {
        if (m_table)
            m_table->endUpdate();
        else
            m_cards->endUpdate();
    }
    GridUpdateLock(const GridUpdateLock&) = delete;
    GridUpdateLock& operator=(const GridUpdateLock&) = delete;

private:
    GridView* m_table = nullptr;
    GridCardView* m_cards = nullptr;
};

} // namespace orvanta
