#pragma once
// The group-by box above a grid's header: shows the grouped columns as buttons in their
// order, takes header sections dropped on it. A click on a button reverses that group's order,
// a double click removes the grouping by that column.

#include <QWidget>

namespace orvanta {

class GridController;

class GridGroupBox final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridGroupBox)

public:
    explicit GridGroupBox(GridController* controller, QWidget* parent = nullptr);

    [[nodiscard]] QSize sizeHint() const override;
    // Column of the button at a point, -1 for none.
    [[nodiscard]] int columnAt(const QPoint& pos) const;
    [[nodiscard]] QRect buttonRect(int level) const;

    static QString hintText();

protected:
    void paintEvent(QPaintEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;

private:
    GridController* m_controller;
};

} // namespace orvanta
