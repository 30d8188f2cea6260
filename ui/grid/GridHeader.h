#pragma once
// The column header of a grid view: sort arrows on every sorted column, sections that move and
// resize, and two gestures of its own: a section dragged off the header (up or down, away from
// the group-by box) hides its column; dropped on the group-by box it groups by that column.

#include <QHeaderView>

namespace orvanta {

class GridController;

class GridHeader final : public QHeaderView {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridHeader)

public:
    GridHeader(GridController* controller, QWidget* parent = nullptr);

    // The widget a section may be dropped on to group by it; nullptr when there is none.
    void setGroupByBox(QWidget* box) { m_groupBox = box; }
    // Keyboard modifiers of the last click, for multi-column sorting with Shift.
    [[nodiscard]] Qt::KeyboardModifiers lastModifiers() const { return m_modifiers; }
    // From a press on a section edge until the release: the user is dragging a section's width.
    [[nodiscard]] bool isResizing() const { return m_resizing; }

Q_SIGNALS:
    void sectionDraggedOut(int logicalIndex);
    void sectionDroppedOnGroupBox(int logicalIndex);
    // The mouse let go of a section edge.
    void resizeFinished();

protected:
    void initStyleOptionForIndex(QStyleOptionHeader* option, int logicalIndex) const override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;

private:
    GridController* m_controller;
    QWidget* m_groupBox = nullptr;
    Qt::KeyboardModifiers m_modifiers;
    int m_pressed = -1;
    int m_pressedVisual = -1;
    QPoint m_pressPos;
    bool m_dragging = false;
    bool m_restoreMovable = false;
    bool m_resizing = false;
};

} // namespace orvanta
