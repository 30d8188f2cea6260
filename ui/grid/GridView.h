#pragma once
// The table view of the grid: a read-only, whole-row-focus table painted straight from the
// controller, so only the rows on screen are ever formatted. Group rows span the width, show
// "caption: value (count)" and expand or collapse by click, double click or the + / - keys.
//
// A frame defines its columns (addColumn), sets a source, listens to focusedRecordChanged and
// asks controller() for everything else; GridLayoutStore saves and restores what the user
// changed.

#include "ui/grid/GridViewBase.h"

#include <QPixmap>
#include <functional>
#include <vector>

class QMenu;

namespace orvanta {

class GridGroupBox;
class GridHeader;
class GridHeaderModel;
class GridModel;

// What a custom cell painter gets to know about the cell it may paint.
struct GridCellInfo {
    int row = -1;
    int record = -1;
    int column = -1;
    QRect rect;
    bool selected = false;
    bool sortedColumn = false;
    QColor background;
    QColor textColor;
};

class GridView final : public GridViewBase {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridView)

public:
    // Paints a cell completely and returns true, or returns false for the default painting.
    using CellPainter = std::function<bool(QPainter&, const GridCellInfo&)>;

    explicit GridView(QWidget* parent = nullptr);
    ~GridView() override;

    [[nodiscard]] GridModel* model() const { return m_model; }
    [[nodiscard]] GridHeader* header() const { return m_header; }
    [[nodiscard]] GridGroupBox* groupByBox() const { return m_groupBox; }

    void setImages(QList<QPixmap> images);
    [[nodiscard]] const QList<QPixmap>& images() const { return m_images; }
    void setCellPainter(CellPainter painter) { m_cellPainter = std::move(painter); }

    void setHeaderHeight(int height);
    [[nodiscard]] int rowHeight() const { return m_rowHeight; }
    void setSortedColumnColor(const QColor& color) { m_sortedColor = color; viewport()->update(); }
    [[nodiscard]] QColor sortedColumnColor() const { return m_sortedColor; }
    void setGridLineColor(const QColor& color) { m_lineColor = color; viewport()->update(); }
    void setGroupRowColor(const QColor& color) { m_groupColor = color; viewport()->update(); }
    [[nodiscard]] QColor groupRowColor() const { return m_groupColor; }
    // On: the visible columns fill the width exactly: the columns that stretch share what the
    // others leave in proportion to their own widths, none narrower than its minimum; only when
    // even the minimums do not fit does the view scroll sideways. A column the user resizes trades
    // space with the columns to its right. Off: every column has its own width. Before the first
    // call the last column stretches to the view's edge.
    void setAutoWidth(bool on);
    [[nodiscard]] bool autoWidth() const { return m_autoWidth; }
    // The width a column needs to show these cell texts and its caption uncut, in this view's
    // fonts and style (withImage: an image stands before the text; sortArrow: room for the arrow
    // of a column that is sorted).
    [[nodiscard]] int contentWidth(const QStringList& cellTexts, const QString& caption, bool withImage = false,
                                   bool sortArrow = false) const;

    // Viewport geometry of a row, empty when it is scrolled out.
    [[nodiscard]] QRect rowRect(int row) const;
    [[nodiscard]] int rowAt(const QPoint& viewportPos) const;
    [[nodiscard]] int displayRowAt(const QPoint& viewportPos) const override { return rowAt(viewportPos); }
    [[nodiscard]] QRect cellRect(int row, int column) const;
    [[nodiscard]] int firstVisibleRow() const;
    void scrollToRow(int row);

    // Check items for the visible state of every column offered in the column menu.
    void fillColumnMenu(QMenu* menu);

Q_SIGNALS:
    void columnDraggedOut(int column);

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void scrollContentsBy(int dx, int dy) override;
    void changeEvent(QEvent* event) override;

private:
    void syncHeader();
    void updateGeometries();
    void updateScrollBars();
    void fitColumns();
    // Widths of the given sections sharing `available` pixels by the rule of setAutoWidth.
    [[nodiscard]] std::vector<int> fittedWidths(const std::vector<int>& sections, int available) const;
    [[nodiscard]] int minimumWidth(int section) const;
    void columnResizedByUser(int logical, int size);
    void takeSectionWidths();
    [[nodiscard]] std::vector<int> shownSections() const;
    void ensureRowVisible(int row);
    [[nodiscard]] int indentWidth() const;
    [[nodiscard]] int visibleRowCapacity() const;
    void paintGroupRow(QPainter& p, int row, const QRect& rect, bool focused);
    void paintDataRow(QPainter& p, int row, const QRect& rect, bool focused);
    void showHeaderMenu(const QPoint& pos);

    GridModel* m_model;
    GridHeaderModel* m_headerModel;
    GridHeader* m_header;
    GridGroupBox* m_groupBox;
    QList<QPixmap> m_images;
    CellPainter m_cellPainter;
    QColor m_sortedColor{0xEF, 0xEF, 0xEF};
    QColor m_lineColor{0xC0, 0xC0, 0xC0};
    QColor m_groupColor;
    int m_rowHeight = 18;
    int m_headerHeight = 21;
    bool m_syncing = false;
    bool m_autoWidth = false;
    bool m_widthsPending = false;
};

} // namespace orvanta
