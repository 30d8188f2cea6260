#include "ui/grid/GridGroupBox.h"

#include "ui/texts/UiTexts.h"

#include "ui/grid/GridController.h"

#include <QMouseEvent>
#include <QPainter>

namespace orvanta {

GridGroupBox::GridGroupBox(GridController* controller, QWidget* parent)
    : QWidget(parent)
    , m_controller(controller)
{
    setObjectName(QStringLiteral("GroupByBox"));
    setAutoFillBackground(true);
    setBackgroundRole(QPalette::Mid);
}

QString GridGroupBox::hintText()
{
    return uiText(UiText::GridGroupByBox);
}

QSize GridGroupBox::sizeHint() const
{
    return {200, fontMetrics().height() * 2 + 12};
}

QRect GridGroupBox::buttonRect(int level) const
{
    const auto& groups = m_controller->groupedColumns();
    if (level < 0 || level >= static_cast<int>(groups.size()))
        return {};
    const QFontMetrics fm = fontMetrics();
    const int h = fm.height() + 6;
    int x = 8;
    for (int i = 0; i <= level; ++i) {
        const int w = fm.horizontalAdvance(m_controller->column(groups[static_cast<size_t>(i)]).caption) + 28;
        if (i == level)
            return {x, 6 + i * 4, w, h};
        x += w + 8;
    }
    return {};
}

int GridGroupBox::columnAt(const QPoint& pos) const
{
    const auto& groups = m_controller->groupedColumns();
    for (int i = 0; i < static_cast<int>(groups.size()); ++i) {
        if (buttonRect(i).contains(pos))
            return groups[static_cast<size_t>(i)];
    }
    return -1;
}

void GridGroupBox::paintEvent(QPaintEvent*)
{
    QPainter p(this);
    const auto& groups = m_controller->groupedColumns();
    if (groups.empty()) {
        p.setPen(palette().color(QPalette::Dark).darker(150));
        p.drawText(rect().adjusted(8, 0, -8, 0), Qt::AlignLeft | Qt::AlignVCenter, hintText());
        return;
    }
    for (int i = 0; i < static_cast<int>(groups.size()); ++i) {
        const int c = groups[static_cast<size_t>(i)];
        const QRect r = buttonRect(i);
        p.setPen(palette().color(QPalette::Dark));
        p.setBrush(palette().button());
        p.drawRect(r.adjusted(0, 0, -1, -1));
        p.setPen(palette().color(QPalette::ButtonText));
        p.drawText(r.adjusted(6, 0, -20, 0), Qt::AlignLeft | Qt::AlignVCenter, m_controller->column(c).caption);
        // Direction mark of the group order.
        const bool desc = m_controller->sortOrder(c) == GridSortOrder::Descending;
        const QPoint m(r.right() - 11, r.center().y());
        QPolygon tri;
        if (desc)
            tri << m + QPoint(-4, -2) << m + QPoint(4, -2) << m + QPoint(0, 3);
        else
            tri << m + QPoint(-4, 2) << m + QPoint(4, 2) << m + QPoint(0, -3);
        p.setBrush(palette().color(QPalette::ButtonText));
        p.drawPolygon(tri);
    }
}

void GridGroupBox::mouseReleaseEvent(QMouseEvent* event)
{
    const int c = columnAt(event->position().toPoint());
    if (c < 0 || event->button() != Qt::LeftButton)
        return;
    m_controller->setGroupSortOrder(c, m_controller->sortOrder(c) == GridSortOrder::Descending
                                           ? GridSortOrder::Ascending
                                           : GridSortOrder::Descending);
    update();
}

void GridGroupBox::mouseDoubleClickEvent(QMouseEvent* event)
{
    const int c = columnAt(event->position().toPoint());
    if (c >= 0)
        m_controller->ungroup(c);
}

} // namespace orvanta
