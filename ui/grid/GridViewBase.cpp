#include "ui/grid/GridViewBase.h"

#include "ui/grid/GridController.h"

#include <QContextMenuEvent>

namespace orvanta {

GridViewBase::GridViewBase(QWidget* parent)
    : QAbstractScrollArea(parent)
    , m_controller(new GridController(this))
{
    setFocusPolicy(Qt::StrongFocus);
    viewport()->setBackgroundRole(QPalette::Base);
    connect(m_controller, &GridController::focusedRecordChanged, this, &GridViewBase::focusedRecordChanged);
}

GridViewBase::~GridViewBase() = default;

int GridViewBase::addColumn(GridColumn column)
{
    const int c = m_controller->addColumn(std::move(column));
    columnAdded(c);
    return c;
}

void GridViewBase::setSource(const GridSource* source)
{
    m_controller->setSource(source);
}

void GridViewBase::beginUpdate()
{
    if (m_lock++ == 0)
        viewport()->setUpdatesEnabled(false);
    m_controller->beginUpdate();
}

void GridViewBase::endUpdate()
{
    if (m_lock == 0)
        return;
    m_controller->endUpdate();
    if (--m_lock == 0) {
        viewport()->setUpdatesEnabled(true);
        updatesResumed();
    }
}

void GridViewBase::columnAdded(int) {}

void GridViewBase::updatesResumed()
{
    viewport()->update();
}

void GridViewBase::contextMenuEvent(QContextMenuEvent* event)
{
    const int row = displayRowAt(event->pos());
    if (row >= 0)
        m_controller->setFocusedRow(row);
    Q_EMIT rowContextMenuRequested(event->globalPos());
}

} // namespace orvanta
