#pragma once
// Locks a grid view against repainting (and its controller against announcing) for one scope,
// so that a rebuild of filter, sorting, grouping or columns is applied and painted once.

#include "ui/grid/GridViewBase.h"

namespace orvanta {

class GridUpdateLock final {
public:
    explicit GridUpdateLock(GridViewBase* view)
        : m_view(view)
    {
        m_view->beginUpdate();
    }
    ~GridUpdateLock() { m_view->endUpdate(); }
    GridUpdateLock(const GridUpdateLock&) = delete;
    GridUpdateLock& operator=(const GridUpdateLock&) = delete;

private:
    GridViewBase* m_view;
};

} // namespace orvanta
