#pragma once
// The "Ansicht" submenu of a list's context menu: one check entry per column, tied to the
// column by its Tag (a column with Tag 0 has no entry). A click toggles the entry's check mark
// and, by default, shows or hides the first column with that Tag (on a card view: the row).

#include <QList>
#include <QObject>
#include <QString>
#include <functional>

class QAction;
class QMenu;

namespace orvanta {

class GridController;
class GridViewBase;

class GridColumnMenu final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridColumnMenu)

public:
    // Appends the submenu "Ansicht" (objectName: menuName) to popup.
    GridColumnMenu(GridViewBase* view, QMenu* popup, const QString& menuName, QObject* parent = nullptr);

    QAction* addEntry(const QString& objectName, const QString& caption, int tag);
    [[nodiscard]] QMenu* menu() const { return m_menu; }
    [[nodiscard]] const QList<QAction*>& entries() const { return m_entries; }
    [[nodiscard]] QAction* entryByTag(int tag) const;
    // What a click does once the check mark has toggled (default: setColumnVisible).
    void setClickHandler(std::function<void(QAction*)> handler) { m_onClick = std::move(handler); }

    // Shows or hides the first column with the tag, inside a view lock.
    void setColumnVisible(bool visible, int tag);
    // Checks the entry of every visible column; entries are never unchecked here.
    void checkVisibleColumns();
    // The column left the header: when it is no longer visible its entry is unchecked.
    void columnDraggedOut(int column);
    // Entries this view does not offer: hidden, and (as every hidden entry) unchecked.
    void withdrawEntry(const QString& objectName);

private:
    [[nodiscard]] GridController* controller() const;

    GridViewBase* m_view;
    QMenu* m_menu;
    QList<QAction*> m_entries;
    std::function<void(QAction*)> m_onClick;
};

} // namespace orvanta
