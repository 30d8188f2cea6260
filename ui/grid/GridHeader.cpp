#include "ui/grid/GridHeader.h"

#include "ui/grid/GridController.h"

#include <QApplication>
#include <QMouseEvent>
#include <QStyleOptionHeader>

#include <utility>

namespace orvanta {

GridHeader::GridHeader(GridController* controller, QWidget* parent)
    : QHeaderView(Qt::Horizontal, parent)
    , m_controller(controller)
{
    setSectionsMovable(true);
    setSectionsClickable(true);
    setHighlightSections(false);
    setSortIndicatorShown(false);
    setContextMenuPolicy(Qt::CustomContextMenu);
    setDefaultAlignment(Qt::AlignLeft | Qt::AlignVCenter);
    setMinimumSectionSize(8);
}

void GridHeader::initStyleOptionForIndex(QStyleOptionHeader* option, int logicalIndex) const
{
    QHeaderView::initStyleOptionForIndex(option, logicalIndex);
    if (logicalIndex < 0 || logicalIndex >= m_controller->columnCount())
        return;
    // The styles draw SortUp as an arrow pointing up: up for ascending, down for descending
    // (newest first shows a down arrow, as users of office programs expect).
    switch (m_controller->sortIndex(logicalIndex) >= 0 ? m_controller->sortOrder(logicalIndex) : GridSortOrder::None) {
    case GridSortOrder::Ascending:
        option->sortIndicator = QStyleOptionHeader::SortUp;
        break;
    case GridSortOrder::Descending:
        option->sortIndicator = QStyleOptionHeader::SortDown;
        break;
    case GridSortOrder::None:
        option->sortIndicator = QStyleOptionHeader::None;
        break;
    }
}

void GridHeader::mousePressEvent(QMouseEvent* event)
{
    m_modifiers = event->modifiers();
    m_pressed = -1;
    m_dragging = false;
    m_resizing = false;
    if (event->button() == Qt::LeftButton) {
        const int logical = logicalIndexAt(event->position().toPoint());
        // Not near a section edge: edges belong to resizing.
        const int pos = event->position().toPoint().x();
        const int left = logical >= 0 ? sectionViewportPosition(logical) : 0;
        const bool nearEdge = logical >= 0 && (pos - left < 4 || left + sectionSize(logical) - pos < 4);
        m_resizing = nearEdge;
        if (logical >= 0 && !nearEdge) {
            m_pressed = logical;
            m_pressedVisual = visualIndex(logical);
            m_pressPos = event->position().toPoint();
            if (logical < m_controller->columnCount() && !m_controller->column(logical).movable && sectionsMovable()) {
                setSectionsMovable(false);
                m_restoreMovable = true;
            }
        }
    }
    QHeaderView::mousePressEvent(event);
}

void GridHeader::mouseMoveEvent(QMouseEvent* event)
{
    if (m_pressed >= 0 && (event->position().toPoint() - m_pressPos).manhattanLength() >= QApplication::startDragDistance())
        m_dragging = true;
    QHeaderView::mouseMoveEvent(event);
}

void GridHeader::mouseReleaseEvent(QMouseEvent* event)
{
    m_modifiers = event->modifiers();
    const int pressed = m_pressed;
    const int pressedVisual = m_pressedVisual;
    const bool dragging = m_dragging;
    m_pressed = -1;
    m_dragging = false;
    const bool resizing = std::exchange(m_resizing, false);
    QHeaderView::mouseReleaseEvent(event);
    if (resizing)
        Q_EMIT resizeFinished();
    if (m_restoreMovable) {
        setSectionsMovable(true);
        m_restoreMovable = false;
    }
    if (pressed < 0 || !dragging || event->button() != Qt::LeftButton)
        return;
    const QPoint global = event->globalPosition().toPoint();
    const bool onBox = m_groupBox && m_groupBox->isVisible() && m_groupBox->rect().contains(m_groupBox->mapFromGlobal(global));
    const int y = event->position().toPoint().y();
    const bool away = y < -height() / 2 || y > height() + height() / 2;
    if (!onBox && !away)
        return;
    // Whatever move the header made on the way is undone: the column keeps its place.
    const int now = visualIndex(pressed);
    if (now >= 0 && pressedVisual >= 0 && now != pressedVisual)
        moveSection(now, pressedVisual);
    if (pressed < m_controller->columnCount() && !m_controller->column(pressed).movable)
        return;
    if (onBox)
        Q_EMIT sectionDroppedOnGroupBox(pressed);
    else
        Q_EMIT sectionDraggedOut(pressed);
}

} // namespace orvanta
