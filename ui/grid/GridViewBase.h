#pragma once
// What the table view and the card view share: the controller they paint, the update lock,
// and the signals a list frame listens to. A frame (or GridColumnMenu, GridUpdateLock) that
// holds a GridViewBase drives either view with the same code.

#include "ui/grid/GridColumn.h"

#include <QAbstractScrollArea>

namespace orvanta {

class GridController;

class GridViewBase : public QAbstractScrollArea {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridViewBase)

public:
    ~GridViewBase() override;

    [[nodiscard]] GridController* controller() const { return m_controller; }

    int addColumn(GridColumn column);
    // Not owned; nullptr unbinds.
    void setSource(const GridSource* source);

    // Lock and unlock: changes in between are applied and painted once.
    void beginUpdate();
    void endUpdate();
    [[nodiscard]] bool isUpdateLocked() const { return m_lock > 0; }

    // Display row under a viewport point, -1 for none.
    [[nodiscard]] virtual int displayRowAt(const QPoint& viewportPos) const = 0;

Q_SIGNALS:
    void focusedRecordChanged();
    void rowDoubleClicked(int row);
    // Before the view handles a key: frames defer work on navigation keys or act on Delete.
    void keyPressed(int key, Qt::KeyboardModifiers modifiers);
    void rowContextMenuRequested(const QPoint& globalPos);

protected:
    explicit GridViewBase(QWidget* parent);

    // A column was added (its index in the controller).
    virtual void columnAdded(int column);
    // The outermost endUpdate() resumed painting.
    virtual void updatesResumed();

    // Focuses the row under the mouse, then asks the frame for its menu.
    void contextMenuEvent(QContextMenuEvent* event) override;

    GridController* const m_controller;

private:
    int m_lock = 0;
};

} // namespace orvanta
