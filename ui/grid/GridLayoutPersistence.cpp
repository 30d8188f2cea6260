#include "ui/grid/GridLayoutPersistence.h"

#include "ui/grid/GridLayoutStore.h"

namespace orvanta {

bool GridLayoutPersistence::restore(GridController& grid, int kind) const
{
    const QString path = file(kind);
    return !path.isEmpty() && GridLayoutStore::restoreFromFile(grid, path, m_viewName);
}

bool GridLayoutPersistence::store(const GridController& grid, int kind) const
{
    const QString path = file(kind);
    return !path.isEmpty() && GridLayoutStore::storeToFile(grid, path, m_viewName);
}

} // namespace orvanta
