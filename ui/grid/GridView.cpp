#include "ui/grid/GridView.h"

#include "ui/texts/UiTexts.h"

#include "ui/grid/GridController.h"
#include "ui/grid/GridGroupBox.h"
#include "ui/grid/GridHeader.h"
#include "ui/grid/GridModel.h"

#include <QKeyEvent>
#include <QMenu>
#include <QPainter>
#include <QScrollBar>
#include <QStyleOptionHeader>

#include <algorithm>
#include <utility>

namespace orvanta {
namespace {
constexpr int kIndent = 16;
constexpr int kPad = 3;

// Splits `total` pixels in proportion to `weights` so that the parts add up to exactly `total`.
// A part whose share would fall below its minimum gets the minimum and the others share the
// rest; when even the minimums do not fit, every part is its minimum.
std::vector<int> proportionalWidths(const std::vector<int>& weights, int total, const std::vector<int>& minimums)
{
    const size_t n = weights.size();
    std::vector<int> out = minimums;
    qint64 minimumSum = 0;
    for (const int m : minimums)
        minimumSum += m;
    if (n == 0 || total <= minimumSum)
        return out;
    std::vector<bool> atMinimum(n, false);
    qint64 room = 0;
    qint64 weightSum = 0;
    for (;;) {
        room = total;
        weightSum = 0;
        for (size_t i = 0; i < n; ++i) {
            if (atMinimum[i])
                room -= minimums[i];
            else
                weightSum += std::max(1, weights[i]);
        }
        bool changed = false;
        for (size_t i = 0; i < n; ++i) {
            if (!atMinimum[i] && room * std::max(1, weights[i]) < qint64{minimums[i]} * weightSum) {
                atMinimum[i] = true;
                changed = true;
            }
        }
        // The total exceeds the sum of the minimums, so at least one part always stays proportional.
        if (!changed)
            break;
    }
    // Whole pixels first, then the remaining pixels to the largest fractions (earlier columns
    // first on a tie), so the same weights and total always give the same widths.
    std::vector<std::pair<qint64, size_t>> fractions;
    qint64 used = 0;
    for (size_t i = 0; i < n; ++i) {
        if (atMinimum[i])
            continue;
        const qint64 share = room * std::max(1, weights[i]);
        out[i] = static_cast<int>(share / weightSum);
        used += out[i];
        fractions.emplace_back(share % weightSum, i);
    }
    std::stable_sort(fractions.begin(), fractions.end(), [](const auto& a, const auto& b) { return a.first > b.first; });
    for (size_t k = 0; used < room && k < fractions.size(); ++k, ++used)
        ++out[fractions[k].second];
    return out;
}
} // namespace

GridView::GridView(QWidget* parent)
    : GridViewBase(parent)
    , m_model(new GridModel(m_controller, this))
    , m_headerModel(new GridHeaderModel(m_controller, this))
    , m_header(new GridHeader(m_controller, this))
    , m_groupBox(new GridGroupBox(m_controller, this))
{
    m_header->setModel(m_headerModel);
    m_header->setGroupByBox(m_groupBox);
    m_header->setStretchLastSection(true);
    m_groupBox->hide();
    m_rowHeight = fontMetrics().height() + 5;
    verticalScrollBar()->setSingleStep(1);
    horizontalScrollBar()->setSingleStep(20);

    connect(m_controller, &GridController::columnsChanged, this, &GridView::syncHeader);
    connect(m_controller, &GridController::layoutChanged, this, [this] {
        updateGeometries();
        updateScrollBars();
        if (!m_controller->isAnnouncingArrival())
            ensureRowVisible(m_controller->focusedRow());
        viewport()->update();
    });
    connect(m_controller, &GridController::focusChanged, this, [this](int, int current) {
        if (!m_controller->isAnnouncingArrival())
            ensureRowVisible(current);
        viewport()->update();
    });

    connect(m_header, &QHeaderView::sectionMoved, this, [this] {
        if (m_syncing)
            return;
        std::vector<int> order;
        for (int v = 0; v < m_header->count(); ++v)
            order.push_back(m_header->logicalIndex(v));
        m_controller->setColumnOrder(order);
    });
    connect(m_header, &QHeaderView::sectionResized, this, [this](int logical, int, int size) {
        if (m_syncing)
            return;
        if (m_autoWidth) {
            columnResizedByUser(logical, size);
            return;
        }
        // The stretched last section follows the view's width; its own width stays as defined.
        if (m_header->stretchLastSection()) {
            const std::vector<int> visible = m_controller->visibleColumns();
            if (!visible.empty() && visible.back() == logical) {
                viewport()->update();
                return;
            }
        }
        m_controller->setColumnWidth(logical, size);
        updateScrollBars();
        viewport()->update();
    });
    connect(m_header, &QHeaderView::sectionClicked, this,
            [this](int logical) { m_controller->headerClicked(logical, m_header->lastModifiers()); });
    connect(m_header, &GridHeader::sectionDraggedOut, this, [this](int logical) {
        m_controller->setColumnVisible(logical, false);
        Q_EMIT columnDraggedOut(logical);
    });
    connect(m_header, &GridHeader::sectionDroppedOnGroupBox, this, [this](int logical) {
        if (m_controller->isGroupByBoxVisible())
            m_controller->groupBy(logical);
    });
    connect(m_header, &GridHeader::resizeFinished, this, &GridView::takeSectionWidths);
    connect(m_header, &QWidget::customContextMenuRequested, this, &GridView::showHeaderMenu);
    connect(horizontalScrollBar(), &QScrollBar::rangeChanged, this,
            [this] { m_header->setOffset(horizontalScrollBar()->value()); });
    setHeaderHeight(21);
}

GridView::~GridView() = default;

void GridView::setImages(QList<QPixmap> images)
{
    m_images = std::move(images);
    viewport()->update();
}

void GridView::setHeaderHeight(int height)
{
    m_headerHeight = std::max(height, 8);
    m_header->setFixedHeight(m_headerHeight);
    updateGeometries();
}

void GridView::setAutoWidth(bool on)
{
    m_autoWidth = on;
    m_header->setStretchLastSection(false);
    // Off: the sections get the columns' own widths back.
    syncHeader();
}

std::vector<int> GridView::shownSections() const
{
    std::vector<int> out;
    for (int v = 0; v < m_header->count(); ++v) {
        const int logical = m_header->logicalIndex(v);
        if (!m_header->isSectionHidden(logical))
            out.push_back(logical);
    }
    return out;
}

int GridView::minimumWidth(int section) const
{
    const int floor = m_header->minimumSectionSize();
    return section < m_controller->columnCount() ? std::max(floor, m_controller->column(section).minWidth) : floor;
}

std::vector<int> GridView::fittedWidths(const std::vector<int>& sections, int available) const
{
    const int n = static_cast<int>(sections.size());
    std::vector<int> out(sections.size(), 0);
    const auto stretches = [this](int c) {
        return c >= m_controller->columnCount() || m_controller->column(c).stretches;
    };
    const auto weight = [this](int c) {
        return c < m_controller->columnCount() ? m_controller->column(c).width : m_header->sectionSize(c);
    };
    // Without a stretching column among them, all of them fill the row.
    const bool anyStretches = std::any_of(sections.begin(), sections.end(), stretches);
    std::vector<int> weights;
    std::vector<int> minimums;
    std::vector<int> sharing;
    int rest = available;
    for (int i = 0; i < n; ++i) {
        const int c = sections[static_cast<size_t>(i)];
        if (anyStretches && !stretches(c)) {
            out[static_cast<size_t>(i)] = std::max(weight(c), minimumWidth(c));
            rest -= out[static_cast<size_t>(i)];
            continue;
        }
        sharing.push_back(i);
        weights.push_back(weight(c));
        minimums.push_back(minimumWidth(c));
    }
    const std::vector<int> shared = proportionalWidths(weights, rest, minimums);
    for (size_t k = 0; k < sharing.size(); ++k)
        out[static_cast<size_t>(sharing[k])] = shared[k];
    return out;
}

// The columns' own widths stay untouched here: they are the weights, so resizing the window
// back and forth always gives the same sections and the stored layout keeps the proportions.
void GridView::fitColumns()
{
    if (!m_autoWidth)
        return;
    const std::vector<int> shown = shownSections();
    const int available = std::max(0, viewport()->width() - indentWidth());
    const std::vector<int> widths = fittedWidths(shown, available);
    const bool wasSyncing = std::exchange(m_syncing, true);
    for (size_t i = 0; i < shown.size(); ++i) {
        if (m_header->sectionSize(shown[i]) != widths[i])
            m_header->resizeSection(shown[i], widths[i]);
    }
    m_syncing = wasSyncing;
}

// The resized column takes its space from the columns to its right, which share the rest as a
// fit does; the last column's right edge is the view's edge and stays put. The new pixel widths
// become the columns' widths when the drag ends, so a refit reproduces them exactly and the
// result depends only on where the mouse was let go, not on the way there.
void GridView::columnResizedByUser(int logical, int size)
{
    const std::vector<int> shown = shownSections();
    const auto it = std::find(shown.begin(), shown.end(), logical);
    if (it == shown.end() || it + 1 == shown.end()) {
        fitColumns();
        viewport()->update();
        return;
    }
    const size_t k = static_cast<size_t>(it - shown.begin());
    const int available = std::max(0, viewport()->width() - indentWidth());
    int left = 0;
    for (size_t i = 0; i < k; ++i)
        left += m_header->sectionSize(shown[i]);
    const std::vector<int> rightSections(it + 1, shown.end());
    int rightMinimum = 0;
    for (const int w : fittedWidths(rightSections, 0))
        rightMinimum += w;
    const int minimum = minimumWidth(logical);
    size = std::clamp(size, minimum, std::max(minimum, available - left - rightMinimum));
    const std::vector<int> right = fittedWidths(rightSections, available - left - size);

    const bool wasSyncing = std::exchange(m_syncing, true);
    if (m_header->sectionSize(logical) != size)
        m_header->resizeSection(logical, size);
    for (size_t i = 0; i < right.size(); ++i) {
        if (m_header->sectionSize(shown[k + 1 + i]) != right[i])
            m_header->resizeSection(shown[k + 1 + i], right[i]);
    }
    m_syncing = wasSyncing;
    m_widthsPending = true;
    if (!m_header->isResizing())
        takeSectionWidths();
    updateScrollBars();
    viewport()->update();
}

int GridView::contentWidth(const QStringList& cellTexts, const QString& caption, bool withImage, bool sortArrow) const
{
    const QFontMetrics fm = fontMetrics();
    int cell = 0;
    for (const QString& text : cellTexts)
        cell = std::max(cell, fm.horizontalAdvance(text));
    int image = 0;
    if (withImage)
        image = (m_images.isEmpty() ? 16 : m_images.first().width()) + kPad;
    // The style's own measure of a header section.
    QStyleOptionHeader opt;
    opt.initFrom(m_header);
    opt.text = caption;
    opt.sortIndicator = sortArrow ? QStyleOptionHeader::SortDown : QStyleOptionHeader::None;
    const int header = m_header->style()->sizeFromContents(QStyle::CT_HeaderSection, &opt, QSize(), m_header).width();
    // One more pixel for the grid line at the cell's right edge.
    return std::max(cell + image + 2 * kPad + 1, header);
}

void GridView::takeSectionWidths()
{
    if (!m_widthsPending)
        return;
    m_widthsPending = false;
    m_controller->beginUpdate();
    for (const int c : shownSections()) {
        if (c < m_controller->columnCount())
            m_controller->setColumnWidth(c, m_header->sectionSize(c));
    }
    m_controller->endUpdate();
}

int GridView::indentWidth() const
{
    return static_cast<int>(m_controller->groupedColumns().size()) * kIndent;
}

int GridView::visibleRowCapacity() const
{
    return std::max(1, viewport()->height() / m_rowHeight);
}

int GridView::firstVisibleRow() const
{
    return verticalScrollBar()->value();
}

QRect GridView::rowRect(int row) const
{
    const int y = (row - firstVisibleRow()) * m_rowHeight;
    if (row < 0 || row >= m_controller->rowCount() || y < 0 || y >= viewport()->height())
        return {};
    return {0, y, viewport()->width(), m_rowHeight};
}

int GridView::rowAt(const QPoint& pos) const
{
    if (pos.y() < 0)
        return -1;
    const int row = firstVisibleRow() + pos.y() / m_rowHeight;
    return row < m_controller->rowCount() ? row : -1;
}

QRect GridView::cellRect(int row, int column) const
{
    const QRect r = rowRect(row);
    if (r.isNull() || column < 0 || column >= m_controller->columnCount() || m_header->isSectionHidden(column))
        return {};
    return {indentWidth() + m_header->sectionViewportPosition(column), r.y(), m_header->sectionSize(column), r.height()};
}

void GridView::scrollToRow(int row)
{
    verticalScrollBar()->setValue(row);
}

void GridView::ensureRowVisible(int row)
{
    if (row < 0)
        return;
    const int first = firstVisibleRow();
    const int capacity = visibleRowCapacity();
    if (row < first)
        verticalScrollBar()->setValue(row);
    else if (row >= first + capacity)
        verticalScrollBar()->setValue(row - capacity + 1);
}

void GridView::syncHeader()
{
    m_syncing = true;
    m_headerModel->syncColumnCount();
    m_headerModel->captionsChanged();
    const int n = m_controller->columnCount();
    for (int c = 0; c < n; ++c) {
        const GridColumn& col = m_controller->column(c);
        if (m_header->isSectionHidden(c) == col.visible)
            m_header->setSectionHidden(c, !col.visible);
        // With auto width the fit below sizes the shown sections.
        if (!m_autoWidth && m_header->sectionSize(c) != col.width)
            m_header->resizeSection(c, col.width);
    }
    const std::vector<int>& order = m_controller->columnOrder();
    for (int v = 0; v < static_cast<int>(order.size()) && v < m_header->count(); ++v) {
        const int from = m_header->visualIndex(order[static_cast<size_t>(v)]);
        if (from != v && from >= 0)
            m_header->moveSection(from, v);
    }
    m_groupBox->setVisible(m_controller->isGroupByBoxVisible());
    m_groupBox->update();
    m_syncing = false;
    updateGeometries();
    updateScrollBars();
    m_header->viewport()->update();
    viewport()->update();
}

void GridView::updateGeometries()
{
    const int box = m_controller->isGroupByBoxVisible() ? m_groupBox->sizeHint().height() : 0;
    const QMargins margins(0, box + m_headerHeight, 0, 0);
    if (viewportMargins() != margins)
        setViewportMargins(margins);
    const QRect vg = viewport()->geometry();
    m_groupBox->setGeometry(vg.left(), vg.top() - m_headerHeight - box, vg.width(), box);
    const int indent = indentWidth();
    m_header->setGeometry(vg.left() + indent, vg.top() - m_headerHeight, std::max(0, vg.width() - indent), m_headerHeight);
    fitColumns();
}

void GridView::updateScrollBars()
{
    const int rows = m_controller->rowCount();
    const int capacity = visibleRowCapacity();
    verticalScrollBar()->setPageStep(capacity);
    verticalScrollBar()->setRange(0, std::max(0, rows - capacity));
    const int total = m_header->length() + indentWidth();
    horizontalScrollBar()->setPageStep(viewport()->width());
    horizontalScrollBar()->setRange(0, std::max(0, total - viewport()->width()));
}

void GridView::resizeEvent(QResizeEvent* event)
{
    QAbstractScrollArea::resizeEvent(event);
    updateGeometries();
    updateScrollBars();
}

void GridView::changeEvent(QEvent* event)
{
    QAbstractScrollArea::changeEvent(event);
    if (event->type() == QEvent::FontChange) {
        m_rowHeight = fontMetrics().height() + 5;
        updateScrollBars();
        viewport()->update();
    }
}

void GridView::scrollContentsBy(int, int)
{
    m_header->setOffset(horizontalScrollBar()->value());
    viewport()->update();
}

void GridView::paintEvent(QPaintEvent* event)
{
    QPainter p(viewport());
    p.fillRect(event->rect(), palette().base());
    const int rows = m_controller->rowCount();
    const int first = firstVisibleRow();
    const int last = std::min(rows, first + visibleRowCapacity() + 1);
    const int focused = m_controller->focusedRow();
    if (rows == 0) {
        // An empty grid says so instead of showing a blank area.
        p.setPen(palette().color(QPalette::Disabled, QPalette::Text));
        p.drawText(viewport()->rect().adjusted(4, 4, -4, -4), Qt::AlignHCenter | Qt::AlignTop, uiText(UiText::GridNoData));
        return;
    }
    for (int row = first; row < last; ++row) {
        const QRect rect(0, (row - first) * m_rowHeight, viewport()->width(), m_rowHeight);
        if (!rect.intersects(event->rect()))
            continue;
        if (m_controller->isGroupRow(row))
            paintGroupRow(p, row, rect, row == focused);
        else
            paintDataRow(p, row, rect, row == focused);
    }
}

void GridView::paintGroupRow(QPainter& p, int row, const QRect& rect, bool focused)
{
    const int x0 = m_controller->groupLevel(row) * kIndent;
    const QColor groupColor = m_groupColor.isValid() ? m_groupColor : palette().color(QPalette::Button);
    p.fillRect(rect, groupColor);
    const QPalette::ColorGroup cg = hasFocus() ? QPalette::Active : QPalette::Inactive;
    const QRect textRect(x0 + kIndent + 2, rect.y(), rect.width() - x0 - kIndent - 2, rect.height());
    if (focused)
        p.fillRect(QRect(x0 + kIndent, rect.y(), rect.width() - x0 - kIndent, rect.height()), palette().color(cg, QPalette::Highlight));
    // Expander: a small box with "+" or "-".
    const QRect box(x0 + (kIndent - 9) / 2, rect.y() + (rect.height() - 9) / 2, 8, 8);
    p.setPen(palette().color(QPalette::Dark));
    p.setBrush(palette().base());
    p.drawRect(box);
    p.setPen(palette().color(QPalette::Text));
    p.drawLine(box.left() + 2, box.center().y(), box.right() - 2, box.center().y());
    if (!m_controller->isGroupExpanded(row))
        p.drawLine(box.center().x(), box.top() + 2, box.center().x(), box.bottom() - 2);
    QFont bold = font();
    bold.setBold(true);
    p.setFont(bold);
    p.setPen(focused ? palette().color(cg, QPalette::HighlightedText) : palette().color(QPalette::ButtonText));
    p.drawText(textRect, Qt::AlignLeft | Qt::AlignVCenter,
               QFontMetrics(bold).elidedText(m_controller->groupRowText(row), Qt::ElideRight, textRect.width()));
    p.setFont(font());
    p.setPen(m_lineColor);
    p.drawLine(rect.left(), rect.bottom(), rect.right(), rect.bottom());
}

void GridView::paintDataRow(QPainter& p, int row, const QRect& rect, bool focused)
{
    const int indent = indentWidth();
    if (indent > 0) {
        const QColor groupColor = m_groupColor.isValid() ? m_groupColor : palette().color(QPalette::Button);
        p.fillRect(QRect(rect.left(), rect.top(), indent, rect.height()), groupColor);
    }
    const int record = m_controller->recordAt(row);
    const QPalette::ColorGroup cg = hasFocus() ? QPalette::Active : QPalette::Inactive;
    const GridSource* source = m_controller->source();
    for (const int c : m_controller->visibleColumns()) {
        const int x = indent + m_header->sectionViewportPosition(c);
        const int w = m_header->sectionSize(c);
        if (x + w < 0 || x > rect.right())
            continue;
        const QRect cell(x, rect.y(), w, rect.height());
        GridCellInfo info;
        info.row = row;
        info.record = record;
        info.column = c;
        info.rect = cell;
        info.selected = focused;
        info.sortedColumn = m_controller->sortIndex(c) >= 0;
        info.background = focused ? palette().color(cg, QPalette::Highlight)
                                  : (info.sortedColumn ? m_sortedColor : palette().color(QPalette::Base));
        info.textColor = focused ? palette().color(cg, QPalette::HighlightedText) : palette().color(QPalette::Text);
        p.save();
        p.setClipRect(cell);
        bool done = false;
        if (m_cellPainter)
            done = m_cellPainter(p, info);
        if (!done) {
            p.fillRect(cell, info.background);
            const GridColumn& col = m_controller->column(c);
            QRect textRect = cell.adjusted(kPad, 0, -kPad, 0);
            if (col.imageIndex && source && record >= 0) {
                const int image = col.imageIndex(*source, static_cast<quint32>(record));
                if (image >= 0 && image < m_images.size()) {
                    const QPixmap& pm = m_images.at(image);
                    p.drawPixmap(textRect.left(), cell.top() + (cell.height() - pm.height()) / 2, pm);
                    textRect.setLeft(textRect.left() + pm.width() + kPad);
                }
            }
            p.setPen(info.textColor);
            const QString text = record >= 0 ? m_controller->cellText(static_cast<quint32>(record), c) : QString();
            p.drawText(textRect, static_cast<int>(col.alignment),
                       fontMetrics().elidedText(text, Qt::ElideRight, textRect.width()));
        }
        p.restore();
        p.setPen(m_lineColor);
        p.drawLine(cell.right(), cell.top(), cell.right(), cell.bottom());
    }
    p.setPen(m_lineColor);
    p.drawLine(rect.left() + indent, rect.bottom(), rect.right(), rect.bottom());
}

void GridView::mousePressEvent(QMouseEvent* event)
{
    setFocus(Qt::MouseFocusReason);
    const QPoint pos = event->position().toPoint();
    const int row = rowAt(pos);
    if (row < 0)
        return;
    m_controller->setFocusedRow(row);
    if (event->button() == Qt::LeftButton && m_controller->isGroupRow(row)) {
        const int x0 = m_controller->groupLevel(row) * kIndent;
        if (pos.x() >= x0 && pos.x() < x0 + kIndent)
            m_controller->setGroupExpanded(row, !m_controller->isGroupExpanded(row));
    }
}

void GridView::mouseReleaseEvent(QMouseEvent* event)
{
    // The press did all the work; the release is ours too, not the parent's.
    event->accept();
}

void GridView::mouseDoubleClickEvent(QMouseEvent* event)
{
    const int row = rowAt(event->position().toPoint());
    if (row < 0 || event->button() != Qt::LeftButton)
        return;
    if (m_controller->isGroupRow(row)) {
        const int x0 = m_controller->groupLevel(row) * kIndent;
        // The expander already toggled on the press.
        if (event->position().x() >= x0 + kIndent)
            m_controller->setGroupExpanded(row, !m_controller->isGroupExpanded(row));
        return;
    }
    Q_EMIT rowDoubleClicked(row);
}

void GridView::keyPressEvent(QKeyEvent* event)
{
    Q_EMIT keyPressed(event->key(), event->modifiers());
    const int rows = m_controller->rowCount();
    const int current = m_controller->focusedRow();
    const int page = std::max(1, visibleRowCapacity() - 1);
    int target = current;
    switch (event->key()) {
    case Qt::Key_Up:
        target = current - 1;
        break;
    case Qt::Key_Down:
        target = current + 1;
        break;
    case Qt::Key_PageUp:
        target = current - page;
        break;
    case Qt::Key_PageDown:
        target = current + page;
        break;
    case Qt::Key_Home:
        target = 0;
        break;
    case Qt::Key_End:
        target = rows - 1;
        break;
    case Qt::Key_Left:
    case Qt::Key_Minus:
        if (m_controller->isGroupRow(current))
            m_controller->setGroupExpanded(current, false);
        return;
    case Qt::Key_Right:
    case Qt::Key_Plus:
        if (m_controller->isGroupRow(current))
            m_controller->setGroupExpanded(current, true);
        return;
    default:
        QAbstractScrollArea::keyPressEvent(event);
        return;
    }
    if (rows > 0)
        m_controller->setFocusedRow(std::clamp(target, 0, rows - 1));
}

void GridView::fillColumnMenu(QMenu* menu)
{
    for (const int c : m_controller->columnOrder()) {
        const GridColumn& col = m_controller->column(c);
        if (!col.showInColumnMenu || col.caption.isEmpty() || m_controller->groupIndex(c) >= 0)
            continue;
        QAction* action = menu->addAction(col.caption);
        action->setCheckable(true);
        action->setChecked(col.visible);
        action->setData(c);
        connect(action, &QAction::toggled, this, [this, c](bool on) { m_controller->setColumnVisible(c, on); });
    }
}

void GridView::showHeaderMenu(const QPoint& pos)
{
    QMenu menu(this);
    fillColumnMenu(&menu);
    if (!menu.isEmpty())
        menu.exec(m_header->mapToGlobal(pos));
}

} // namespace orvanta
