#include "ui/grid/GridCardView.h"

#include "platform/IniFile.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridLayoutStore.h"

#include <QApplication>
#include <QContextMenuEvent>
#include <QFileInfo>
#include <QKeyEvent>
#include <QLinearGradient>
#include <QMenu>
#include <QPainter>
#include <QScrollBar>
#include <QWheelEvent>

#include <algorithm>

namespace orvanta {
namespace {
constexpr int kSpacing = 8;  // between cards and around them
constexpr int kBorder = 1;
constexpr int kPad = 3;      // text inset from the card's left edge
constexpr int kTitleTop = 2; // title text inset from its top
constexpr int kMinCardWidth = 40;
constexpr int kMaxCardWidth = 4000;

const QString kCardWidthKey = QStringLiteral("CardWidth");

// The wanted order with every fixed column back at its position in `current`; the other columns
// fill the free positions in their wanted order.
std::vector<int> pinFixed(const std::vector<int>& wanted, const std::vector<int>& current, const std::vector<bool>& fixed)
{
    std::vector<int> out(current.size(), -1);
    for (size_t p = 0; p < current.size(); ++p) {
        if (fixed[static_cast<size_t>(current[p])])
            out[p] = current[p];
    }
    size_t next = 0;
    for (const int c : wanted) {
        if (fixed[static_cast<size_t>(c)])
            continue;
        while (next < out.size() && out[next] >= 0)
            ++next;
        if (next < out.size())
            out[next] = c;
    }
    return out;
}
} // namespace

GridCardView::GridCardView(QWidget* parent)
    : GridViewBase(parent)
{
    viewport()->setMouseTracking(false);
    // Always shown: the cards per column follow the viewport's height, so a scroll bar that came
    // and went with the card count would re-flow the cards it was shown for.
    setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOn);
    setVerticalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    m_lineHeight = fontMetrics().height() + 2;
    horizontalScrollBar()->setSingleStep(20);

    connect(m_controller, &GridController::columnsChanged, this, [this] {
        if (m_controller->isGrouped()) {
            m_controller->clearGrouping();
            return;
        }
        updateScrollBars();
        viewport()->update();
    });
    connect(m_controller, &GridController::layoutChanged, this, [this] {
        updateScrollBars();
        ensureCardVisible(m_controller->focusedRow());
        viewport()->update();
    });
    connect(m_controller, &GridController::focusChanged, this, [this](int, int current) {
        ensureCardVisible(current);
        viewport()->update();
    });
}

GridCardView::~GridCardView() = default;

void GridCardView::columnAdded(int column)
{
    m_fixedRows.resize(static_cast<size_t>(column) + 1, false);
    m_fixedRows[static_cast<size_t>(column)] = !m_controller->column(column).movable;
}

void GridCardView::updatesResumed()
{
    updateScrollBars();
    viewport()->update();
}

void GridCardView::setCardWidth(int width)
{
    width = std::clamp(width, kMinCardWidth, kMaxCardWidth);
    if (width == m_cardWidth)
        return;
    m_cardWidth = width;
    updateScrollBars();
    ensureCardVisible(m_controller->focusedRow());
    viewport()->update();
}

void GridCardView::setCaptionColumn(int column)
{
    m_captionColumn = column >= 0 && column < m_controller->columnCount() ? column : -1;
    updateScrollBars();
    viewport()->update();
}

void GridCardView::setRowMovable(int column, bool movable)
{
    if (column >= 0 && column < static_cast<int>(m_fixedRows.size()))
        m_fixedRows[static_cast<size_t>(column)] = !movable;
}

bool GridCardView::isRowMovable(int column) const
{
    return column >= 0 && column < static_cast<int>(m_fixedRows.size()) && !m_fixedRows[static_cast<size_t>(column)];
}

void GridCardView::setRowVisible(int column, bool visible)
{
    if (column >= 0 && column < m_controller->columnCount())
        m_controller->setColumnVisible(column, visible);
}

bool GridCardView::isRowVisible(int column) const
{
    return column >= 0 && column < m_controller->columnCount() && m_controller->isColumnVisible(column);
}

QList<int> GridCardView::rowOrder() const
{
    const std::vector<int>& order = m_controller->columnOrder();
    return {order.begin(), order.end()};
}

void GridCardView::setRowOrder(const QList<int>& order)
{
    const int n = m_controller->columnCount();
    if (order.size() != n)
        return;
    std::vector<bool> seen(static_cast<size_t>(n), false);
    for (const int c : order) {
        if (c < 0 || c >= n || seen[static_cast<size_t>(c)])
            return;
        seen[static_cast<size_t>(c)] = true;
    }
    m_controller->setColumnOrder(pinFixed({order.begin(), order.end()}, m_controller->columnOrder(), m_fixedRows));
}

void GridCardView::moveRow(int column, int toPosition)
{
    if (!isRowMovable(column))
        return;
    std::vector<int> order = m_controller->columnOrder();
    order.erase(std::find(order.begin(), order.end(), column));
    toPosition = std::clamp(toPosition, 0, static_cast<int>(order.size()));
    order.insert(order.begin() + toPosition, column);
    setRowOrder({order.begin(), order.end()});
}

bool GridCardView::storeLayout(const QString& path, const QString& viewName) const
{
    IniFile ini;
    GridLayoutStore::store(*m_controller, ini, viewName);
    ini.writeInteger(viewName, kCardWidthKey, m_cardWidth);
    return ini.saveAs(path);
}

bool GridCardView::restoreLayout(const QString& path, const QString& viewName)
{
    if (!QFileInfo::exists(path))
        return false;
    IniFile ini;
    if (!ini.load(path) || !ini.sectionExists(viewName))
        return false;
    beginUpdate();
    const std::vector<int> before = m_controller->columnOrder();
    GridLayoutStore::restore(*m_controller, ini, viewName);
    // A file cannot move what the user cannot.
    m_controller->setColumnOrder(pinFixed(m_controller->columnOrder(), before, m_fixedRows));
    m_controller->clearGrouping();
    const int width = ini.readInteger(viewName, kCardWidthKey, m_cardWidth);
    if (width >= kMinCardWidth && width <= kMaxCardWidth)
        setCardWidth(width);
    endUpdate();
    return true;
}

void GridCardView::setCaptionColors(const QColor& start, const QColor& end, const QColor& text)
{
    m_captionStart = start;
    m_captionEnd = end;
    m_captionText = text;
    viewport()->update();
}

void GridCardView::setFocusedCaptionColors(const QColor& start, const QColor& end, const QColor& text)
{
    m_focusStart = start;
    m_focusEnd = end;
    m_focusText = text;
    viewport()->update();
}

void GridCardView::setBorderColor(const QColor& color)
{
    m_borderColor = color;
    viewport()->update();
}

// --- geometry --------------------------------------------------------------------------------

std::vector<int> GridCardView::shownLines() const
{
    std::vector<int> out = m_controller->visibleColumns();
    std::erase(out, m_captionColumn);
    return out;
}

int GridCardView::cardHeight() const
{
    const int title = m_lineHeight + 2;
    return 2 * kBorder + title + static_cast<int>(shownLines().size()) * m_lineHeight + kPad;
}

int GridCardView::cardsPerColumn() const
{
    return std::max(1, (viewport()->height() - kSpacing) / (cardHeight() + kSpacing));
}

int GridCardView::columnPitch() const
{
    return m_cardWidth + kSpacing;
}

// Card columns entirely on screen, at least one.
int GridCardView::visibleColumnCount() const
{
    return std::max(1, (viewport()->width() - kSpacing) / columnPitch());
}

QRect GridCardView::cardRect(int row) const
{
    if (row < 0 || row >= m_controller->rowCount())
        return {};
    const int per = cardsPerColumn();
    const int x = kSpacing + (row / per) * columnPitch() - horizontalScrollBar()->value();
    const int y = kSpacing + (row % per) * (cardHeight() + kSpacing);
    return {x, y, m_cardWidth, cardHeight()};
}

int GridCardView::cardAt(const QPoint& viewportPos) const
{
    const int x = viewportPos.x() + horizontalScrollBar()->value() - kSpacing;
    const int y = viewportPos.y() - kSpacing;
    if (x < 0 || y < 0 || x % columnPitch() >= m_cardWidth)
        return -1;
    const int pitchY = cardHeight() + kSpacing;
    const int per = cardsPerColumn();
    if (y % pitchY >= cardHeight() || y / pitchY >= per)
        return -1;
    const int row = (x / columnPitch()) * per + y / pitchY;
    return row < m_controller->rowCount() ? row : -1;
}

int GridCardView::rowAt(const QPoint& viewportPos) const
{
    const int card = cardAt(viewportPos);
    if (card < 0)
        return -1;
    const int y = viewportPos.y() - cardRect(card).top() - kBorder - (m_lineHeight + 2);
    const std::vector<int> lines = shownLines();
    if (y < 0 || y / m_lineHeight >= static_cast<int>(lines.size()))
        return -1;
    return lines[static_cast<size_t>(y / m_lineHeight)];
}

QRect GridCardView::lineRect(int row, int column) const
{
    const QRect card = cardRect(row);
    const std::vector<int> lines = shownLines();
    const auto it = std::find(lines.begin(), lines.end(), column);
    if (card.isEmpty() || it == lines.end())
        return {};
    const int top = card.top() + kBorder + m_lineHeight + 2 + static_cast<int>(it - lines.begin()) * m_lineHeight;
    return {card.left() + kBorder, top, m_cardWidth - 2 * kBorder, m_lineHeight};
}

std::pair<int, int> GridCardView::visibleCards() const
{
    const int value = horizontalScrollBar()->value();
    const int per = cardsPerColumn();
    const int firstColumn = std::max(0, (value - kSpacing) / columnPitch());
    const int lastColumn = (value + viewport()->width()) / columnPitch();
    const int rows = m_controller->rowCount();
    return {std::min(rows, firstColumn * per), std::min(rows, (lastColumn + 1) * per)};
}

void GridCardView::updateScrollBars()
{
    const int rows = m_controller->rowCount();
    const int per = cardsPerColumn();
    const int columns = (rows + per - 1) / per;
    const qint64 total = kSpacing + qint64{columns} * columnPitch();
    QScrollBar* bar = horizontalScrollBar();
    bar->setRange(0, static_cast<int>(std::clamp<qint64>(total - viewport()->width(), 0, INT_MAX)));
    bar->setPageStep(viewport()->width());
}

void GridCardView::ensureCardVisible(int row)
{
    if (row < 0 || row >= m_controller->rowCount())
        return;
    QScrollBar* bar = horizontalScrollBar();
    const int left = kSpacing + (row / cardsPerColumn()) * columnPitch();
    const int right = left + m_cardWidth;
    if (left - kSpacing < bar->value())
        bar->setValue(left - kSpacing);
    else if (right + kSpacing > bar->value() + viewport()->width())
        bar->setValue(std::min(left - kSpacing, right + kSpacing - viewport()->width()));
}

void GridCardView::scrollToCard(int row)
{
    ensureCardVisible(row);
}

// --- painting --------------------------------------------------------------------------------

void GridCardView::paintEvent(QPaintEvent* event)
{
    QPainter p(viewport());
    p.fillRect(event->rect(), palette().color(QPalette::Base));
    const std::vector<int> lines = shownLines();
    int labelWidth = 0;
    for (const int c : lines)
        labelWidth = std::max(labelWidth, fontMetrics().horizontalAdvance(m_controller->column(c).caption + QLatin1Char(':')));
    labelWidth = std::min(labelWidth + 2 * kPad, m_cardWidth / 2);
    const auto [first, end] = visibleCards();
    for (int row = first; row < end; ++row) {
        const QRect rect = cardRect(row);
        if (rect.intersects(event->rect()))
            paintCard(p, row, rect, lines, labelWidth);
    }
}

void GridCardView::paintCard(QPainter& p, int row, const QRect& rect, const std::vector<int>& lines, int labelWidth)
{
    const bool focused = row == m_controller->focusedRow();
    p.setPen(m_borderColor);
    p.setBrush(palette().color(QPalette::Base));
    p.drawRect(rect.adjusted(0, 0, -1, -1));
    p.setBrush(Qt::NoBrush);

    const QRect title(rect.left() + kBorder, rect.top() + kBorder, rect.width() - 2 * kBorder, m_lineHeight + 2);
    QLinearGradient gradient(title.topLeft(), title.bottomLeft());
    gradient.setColorAt(0, focused ? m_focusStart : m_captionStart);
    gradient.setColorAt(1, focused ? m_focusEnd : m_captionEnd);
    p.fillRect(title, gradient);
    if (m_captionColumn >= 0) {
        const QRect textRect = title.adjusted(kPad, kTitleTop, -kPad, 0);
        p.setPen(focused ? m_focusText : m_captionText);
        const QString text = m_controller->displayText(row, m_captionColumn);
        p.drawText(textRect, Qt::AlignLeft | Qt::AlignTop,
                   fontMetrics().elidedText(text, Qt::ElideRight, textRect.width()));
    }

    const QColor text = palette().color(QPalette::Text);
    int y = title.bottom() + 1;
    for (const int c : lines) {
        const GridColumn& col = m_controller->column(c);
        const QRect label(rect.left() + kBorder + kPad, y, labelWidth - kPad, m_lineHeight);
        const QRect value(rect.left() + kBorder + labelWidth, y, rect.width() - 2 * kBorder - labelWidth - kPad, m_lineHeight);
        p.setPen(text);
        p.drawText(label, Qt::AlignLeft | Qt::AlignVCenter,
                   fontMetrics().elidedText(col.caption + QLatin1Char(':'), Qt::ElideRight, label.width()));
        p.drawText(value, (col.alignment & Qt::AlignHorizontal_Mask) | Qt::AlignVCenter,
                   fontMetrics().elidedText(m_controller->displayText(row, c), Qt::ElideRight, value.width()));
        if (m_dragging && m_dropPosition >= 0 && c == m_controller->columnOrder()[static_cast<size_t>(m_dropPosition)]) {
            p.setPen(QPen(palette().color(QPalette::Highlight), 2));
            p.drawLine(rect.left() + kBorder, y, rect.right() - kBorder, y);
        }
        y += m_lineHeight;
    }
}

void GridCardView::resizeEvent(QResizeEvent* event)
{
    QAbstractScrollArea::resizeEvent(event);
    updateScrollBars();
    ensureCardVisible(m_controller->focusedRow());
}

void GridCardView::scrollContentsBy(int, int)
{
    viewport()->update();
}

// --- input -----------------------------------------------------------------------------------

// The cards only scroll sideways, so the wheel scrolls them sideways.
void GridCardView::wheelEvent(QWheelEvent* event)
{
    QApplication::sendEvent(horizontalScrollBar(), event);
}

void GridCardView::mousePressEvent(QMouseEvent* event)
{
    setFocus(Qt::MouseFocusReason);
    const int card = cardAt(event->position().toPoint());
    if (card >= 0)
        m_controller->setFocusedRow(card);
    if (event->button() == Qt::LeftButton) {
        const int line = rowAt(event->position().toPoint());
        m_dragColumn = isRowMovable(line) ? line : -1;
        m_dragStart = event->position().toPoint();
    }
    QAbstractScrollArea::mousePressEvent(event);
}

void GridCardView::mouseMoveEvent(QMouseEvent* event)
{
    if (m_dragColumn < 0 || !(event->buttons() & Qt::LeftButton))
        return;
    const QPoint pos = event->position().toPoint();
    if (!m_dragging && (pos - m_dragStart).manhattanLength() < QApplication::startDragDistance())
        return;
    m_dragging = true;
    const int over = rowAt(pos);
    m_dropPosition = over >= 0 ? m_controller->visualIndex(over) : -1;
    viewport()->update();
}

void GridCardView::mouseReleaseEvent(QMouseEvent* event)
{
    if (m_dragging && m_dropPosition >= 0)
        moveRow(m_dragColumn, m_dropPosition);
    m_dragging = false;
    m_dragColumn = -1;
    m_dropPosition = -1;
    viewport()->update();
    QAbstractScrollArea::mouseReleaseEvent(event);
}

void GridCardView::mouseDoubleClickEvent(QMouseEvent* event)
{
    const int card = cardAt(event->position().toPoint());
    if (card < 0 || event->button() != Qt::LeftButton)
        return;
    m_controller->setFocusedRow(card);
    Q_EMIT rowDoubleClicked(card);
}

// Up and Down step through the cards in their order (on into the next column), Left and Right
// go to the neighbouring column at the same height, the page keys by the cards on screen.
void GridCardView::keyPressEvent(QKeyEvent* event)
{
    Q_EMIT keyPressed(event->key(), event->modifiers());
    const int rows = m_controller->rowCount();
    // Without a focused card every navigation key starts at the first.
    const bool none = m_controller->focusedRow() < 0;
    const int current = std::max(0, m_controller->focusedRow());
    const int per = cardsPerColumn();
    const int page = per * visibleColumnCount();
    int target = current;
    switch (event->key()) {
    case Qt::Key_Up:
        target = current - 1;
        break;
    case Qt::Key_Down:
        target = current + 1;
        break;
    case Qt::Key_Left:
        target = current >= per ? current - per : current;
        break;
    case Qt::Key_Right:
        // The last column may be short: its last card stands in for the missing ones.
        target = current / per < (rows - 1) / per ? std::min(current + per, rows - 1) : current;
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
    case Qt::Key_Return:
    case Qt::Key_Enter:
        if (m_controller->focusedRow() >= 0)
            Q_EMIT rowDoubleClicked(m_controller->focusedRow());
        return;
    default:
        QAbstractScrollArea::keyPressEvent(event);
        return;
    }
    if (rows > 0)
        m_controller->setFocusedRow(none ? 0 : std::clamp(target, 0, rows - 1));
}

void GridCardView::fillRowMenu(QMenu* menu)
{
    for (const int c : m_controller->columnOrder()) {
        const GridColumn& col = m_controller->column(c);
        if (c == m_captionColumn || !col.showInColumnMenu || col.caption.isEmpty())
            continue;
        QAction* action = menu->addAction(col.caption);
        action->setCheckable(true);
        action->setChecked(col.visible);
        action->setData(c);
        connect(action, &QAction::toggled, this, [this, c](bool on) { setRowVisible(c, on); });
    }
}

} // namespace orvanta
