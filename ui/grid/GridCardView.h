#pragma once
// The card view of the grid: every display row of the controller is a card of fixed width with
// the caption column as its title and the other visible columns as "Caption: value" lines
// ("rows" of the card). Cards flow top to bottom, then on into the next column; the view scrolls
// horizontally. It shares GridView's API so a list frame drives either with the same code, and
// it works through its own GridController: filter and sort are the table's, over index vectors.
//
// Cards have no grouping: a grouping set on the controller is undone. Only the cards on screen
// are formatted and painted, so the record count does not matter for scrolling.

#include "ui/grid/GridViewBase.h"

#include <QColor>
#include <QList>
#include <vector>

class QMenu;

namespace orvanta {

class GridCardView final : public GridViewBase {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridCardView)

public:
    explicit GridCardView(QWidget* parent = nullptr);
    ~GridCardView() override;

    void setCardWidth(int width);
    [[nodiscard]] int cardWidth() const { return m_cardWidth; }
    // The column whose value is the card's title (its caption is not shown); -1 for none.
    void setCaptionColumn(int column);
    [[nodiscard]] int captionColumn() const { return m_captionColumn; }

    // A row the user may not move keeps its place in the row order.
    void setRowMovable(int column, bool movable);
    [[nodiscard]] bool isRowMovable(int column) const;
    void setRowVisible(int column, bool visible);
    [[nodiscard]] bool isRowVisible(int column) const;
    // Every column, hidden ones included, in the order of the lines on a card.
    [[nodiscard]] QList<int> rowOrder() const;
    // Any permutation of the columns; anything else is ignored. Rows that may not move stay at
    // their positions, the others take the free positions in the given order.
    void setRowOrder(const QList<int>& order);
    // Moves a movable row to a position of the row order, as a drag onto another line does.
    void moveRow(int column, int toPosition);

    // Row order, visibility, card width, sort, filter and Tag under one view name of an INI file.
    [[nodiscard]] bool storeLayout(const QString& path, const QString& viewName) const;
    // False, and the view as it is, when the file is missing or holds no such view; damaged
    // values keep the view's own.
    bool restoreLayout(const QString& path, const QString& viewName);

    // Title gradient (top to bottom) and text of cards without focus; the focused card has its
    // own colours.
    void setCaptionColors(const QColor& start, const QColor& end, const QColor& text);
    void setFocusedCaptionColors(const QColor& start, const QColor& end, const QColor& text);
    void setBorderColor(const QColor& color);

    // Geometry (viewport coordinates). A card is a display row of the controller.
    [[nodiscard]] int cardHeight() const;
    [[nodiscard]] int lineHeight() const { return m_lineHeight; }
    [[nodiscard]] int cardsPerColumn() const;
    [[nodiscard]] QRect cardRect(int row) const;
    [[nodiscard]] int cardAt(const QPoint& viewportPos) const;
    [[nodiscard]] int displayRowAt(const QPoint& viewportPos) const override { return cardAt(viewportPos); }
    // Column of the line under the point on a card, -1 for the title or no line.
    [[nodiscard]] int rowAt(const QPoint& viewportPos) const;
    [[nodiscard]] QRect lineRect(int row, int column) const;
    // Cards (fully or partly) on screen: first and one past the last.
    [[nodiscard]] std::pair<int, int> visibleCards() const;
    void scrollToCard(int row);

    // Check items for the visible state of every row offered in a menu.
    void fillRowMenu(QMenu* menu);

protected:
    void columnAdded(int column) override;
    void updatesResumed() override;
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void scrollContentsBy(int dx, int dy) override;
    void wheelEvent(QWheelEvent* event) override;

private:
    [[nodiscard]] std::vector<int> shownLines() const;
    [[nodiscard]] int columnPitch() const;
    [[nodiscard]] int visibleColumnCount() const;
    void updateScrollBars();
    void ensureCardVisible(int row);
    void paintCard(QPainter& p, int row, const QRect& rect, const std::vector<int>& lines, int labelWidth);

    std::vector<bool> m_fixedRows;
    int m_captionColumn = -1;
    int m_cardWidth = 300;
    int m_lineHeight = 16;
    QColor m_captionStart{0xFF, 0xFF, 0xFF};
    QColor m_captionEnd{0xD8, 0xD8, 0xD8};
    QColor m_captionText{0, 0, 0};
    // The focused card's title: a light to a deep orange, black text.
    QColor m_focusStart{0xFB, 0xE6, 0x94};
    QColor m_focusEnd{0xEE, 0x95, 0x15};
    QColor m_focusText{0, 0, 0};
    QColor m_borderColor{0x80, 0x80, 0x80};
    // A row being dragged onto another line.
    int m_dragColumn = -1;
    QPoint m_dragStart;
    bool m_dragging = false;
    int m_dropPosition = -1;
};

} // namespace orvanta
