#include "ui/grid/GridColumnMenu.h"

#include "ui/grid/GridController.h"
#include "ui/grid/GridUpdateLock.h"

#include <QAction>
#include <QMenu>

namespace orvanta {

GridColumnMenu::GridColumnMenu(GridViewBase* view, QMenu* popup, const QString& menuName, QObject* parent)
    : QObject(parent)
    , m_view(view)
    , m_menu(popup->addMenu(QStringLiteral("Ansicht")))
{
    m_menu->setObjectName(menuName);
}

GridController* GridColumnMenu::controller() const
{
    return m_view->controller();
}

QAction* GridColumnMenu::addEntry(const QString& objectName, const QString& caption, int tag)
{
    QAction* a = m_menu->addAction(caption);
    a->setObjectName(objectName);
    a->setCheckable(true);
    a->setProperty("tag", tag);
    connect(a, &QAction::triggered, this, [this, a] {
        if (m_onClick)
            m_onClick(a);
        else
            setColumnVisible(a->isChecked(), a->property("tag").toInt());
    });
    m_entries.append(a);
    return a;
}

QAction* GridColumnMenu::entryByTag(int tag) const
{
    for (QAction* a : m_entries) {
        if (a->property("tag").toInt() == tag)
            return a;
    }
    return nullptr;
}

void GridColumnMenu::setColumnVisible(bool visible, int tag)
{
    const GridUpdateLock lock(m_view);
    GridController* g = controller();
    const int c = g->columnByTag(tag);
    if (c >= 0)
        g->setColumnVisible(c, visible);
}

void GridColumnMenu::checkVisibleColumns()
{
    const GridUpdateLock lock(m_view);
    const QSignalBlocker block(m_menu);
    const GridController* g = controller();
    for (const int c : g->visibleColumns()) {
        const int tag = g->column(c).tag;
        if (tag == 0)
            continue;
        if (QAction* a = entryByTag(tag))
            a->setChecked(true);
    }
}

void GridColumnMenu::columnDraggedOut(int column)
{
    const GridController* g = controller();
    if (column < 0 || column >= g->columnCount() || g->isColumnVisible(column))
        return;
    const int tag = g->column(column).tag;
    if (tag == 0)
        return;
    if (QAction* a = entryByTag(tag))
        a->setChecked(false);
}

void GridColumnMenu::withdrawEntry(const QString& objectName)
{
    for (QAction* a : m_entries) {
        if (a->objectName() == objectName) {
            a->setVisible(false);
            a->setChecked(false);
        }
    }
}

} // namespace orvanta
