#pragma once
// The category manager "Kategorieverwaltung": the categories (the data module's kat_list) on the
// left, the contacts of the focused category (katdetail) on the right. New, rename and delete a
// category; move a contact to another category by dragging it onto one or through TSelKatForm;
// remove a contact from its category. In selection mode (the contact edit window's category
// button) "Übernehmen" or a double click hands the focused category back and closes.
//
// It writes through CategoryStore only; what the main window must learn of (a category renamed or
// deleted, a contact moved or removed) goes out through the callbacks the program installs.
// Layouts: "CCStoreT1", "CCStoreT2", the bars in "BarStore", the bounds in "CCStore".

#include "ui/grid/GridView.h"

#include <QMainWindow>
#include <QMimeData>
#include <QPointer>

#include <functional>
#include <memory>

class QAction;
class QEventLoop;
class QLabel;
class QMenu;
class QSplitter;
class QTimer;
class QToolBar;

namespace orvanta {

class GridController;
class GridLayoutPersistence;
class ListFrameScaffold;
class RecordStoreGridSource;
class TDM2;
class Tkateditform;
class WindowBounds;

// What a row dragged out of a grid carries: the view it came from.
class GridDragData final : public QMimeData {
    Q_OBJECT

public:
    static constexpr const char* kFormat = "application/x-orvanta-grid-row";
    explicit GridDragData(GridView* source);
    [[nodiscard]] GridView* source() const { return m_source.data(); }

private:
    QPointer<GridView> m_source;
};

class TCatControl final : public QMainWindow {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TCatControl)

public:
    struct Callbacks {
        // A category was renamed (new name) or deleted (empty new name).
        std::function<void(const QString& oldName, const QString& newName)> HasRenameKatBez;
        // A contact now belongs to that category (empty: to none).
        std::function<void(int contactKey, const QString& katbez)> ChangeRelatedKontKat;
    };

    // dm: the data module; without one every database step does nothing.
    explicit TCatControl(TDM2* dm, Callbacks callbacks = {}, QWidget* parent = nullptr);
    ~TCatControl() override;

    // --- selection mode ---------------------------------------------------------------------
    void setSelectionMode(bool on);
    [[nodiscard]] bool selectionMode() const { return m_selectionMode; }
    // The KATBEZ "Übernehmen" handed back; empty when none was.
    [[nodiscard]] const QString& chosenCategory() const { return m_chosen; }
    // Shows the window modally in selection mode until it closes; returns the chosen category.
    QString execPick();

    // --- lists ------------------------------------------------------------------------------
    bool KatDBConnect();
    bool KatDetailDBConnect(int id);
    // LID of the focused category, -1 when none.
    [[nodiscard]] int focusedCategoryId() const { return m_focusedId; }
    // How often the contact list was loaded since the window was made.
    [[nodiscard]] int detailLoads() const { return m_detailLoads; }
    [[nodiscard]] int countdown() const { return m_countdown; }
    [[nodiscard]] bool databaseError() const { return m_dbError; }

    // --- actions ----------------------------------------------------------------------------
    void Kat_NewExecute();
    void Kat_RenameExecute();
    void Kat_DeleteExecute();
    void Kat_MoveExecute();
    void Kon_MoveExecute();
    void Kon_CutRelatedExecute();
    // The update rules of every action.
    void updateActions();
    // Runs the action when it is enabled.
    void runIfEnabled(QAction* action);

    // --- drag and drop ----------------------------------------------------------------------
    // What a drag out of the contact grid carries; starting one clears the dragged ids.
    [[nodiscard]] QMimeData* createDragData();
    // The grid view a drag started in, or none.
    [[nodiscard]] GridView* GetDragSourceGridView(const QMimeData* data) const;
    // Over the category grid at a viewport position: whether a drop is accepted there.
    bool Grid1DBTableView1DragOver(const QMimeData* data, const QPoint& pos);
    void Grid1DBTableView1DragDrop(const QMimeData* data, const QPoint& pos);

    // --- parts ------------------------------------------------------------------------------
    [[nodiscard]] GridView* categoryView() const { return m_katView; }
    [[nodiscard]] GridView* contactView() const { return m_detailView; }
    [[nodiscard]] QTimer* delayTimer() const { return m_t1; }
    [[nodiscard]] QString footerText() const;
    [[nodiscard]] QMenu* contactPopup() const { return m_popup; }

    static const QString& noticeText();

protected:
    void showEvent(QShowEvent* event) override;
    void closeEvent(QCloseEvent* event) override;
    void moveEvent(QMoveEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void buildLayout();
    void buildColumns();
    void buildActions();
    void buildMenusAndBars();
    void FormCreate();
    void FormShow();
    void FormClose();
    void applyColorScheme();

    void bindCategories();
    void bindDetail();
    void categoryFocusChanged();
    void t1Timer();
    // Re-reads a list (after a save) and focuses the record with that key (none for 0).
    void rereadCategories(int id);
    void rereadDetail(int id);
    // Loads the contacts of the focused category when the list shows another one.
    void followFocus();
    // The row of the category list with that key, -1 when none.
    [[nodiscard]] int categoryRow(int id) const;
    [[nodiscard]] QString categoryText(int row, const char* field) const;
    [[nodiscard]] int focusedDetailValue(const char* field) const;
    // Runs the edit dialog until the name is stored, the user cancels or the database fails.
    int editLoop(int id, QString name, QString remark, QString* savedName);
    bool editorOpen(const char* operation) const;
    void startDrag();
    void updateFooter();

    TDM2* m_dm;
    Callbacks m_callbacks;
    std::unique_ptr<RecordStoreGridSource> m_katSource;
    std::unique_ptr<RecordStoreGridSource> m_detailSource;
    std::unique_ptr<ListFrameScaffold> m_katScaffold;
    std::unique_ptr<ListFrameScaffold> m_detailScaffold;
    std::unique_ptr<GridLayoutPersistence> m_layouts;
    std::unique_ptr<WindowBounds> m_fs1;
    QPointer<Tkateditform> m_editForm;
    QEventLoop* m_pickLoop = nullptr;

    int m_focusedId = -1;
    int m_countdown = 10;
    bool m_keyboard = false;
    bool m_detailLayoutRestored = false;
    bool m_dbError = false;
    bool m_selectionMode = false;
    bool m_refreshing = false;
    bool m_closed = false;
    bool m_shown = false;
    QString m_chosen;
    int m_dragLid = 0;
    int m_dragCid = 0;
    int m_loadedId = -2;
    int m_detailLoads = 0;
    QPoint m_pressPos;
    bool m_pressed = false;

    QSplitter* m_splitter = nullptr;
    GridView* m_katView = nullptr; // cxGrid1DBTableView1
    GridView* m_detailView = nullptr; // cxGrid2DBTableView1
    QWidget* m_footer = nullptr;
    QLabel* m_notice = nullptr;
    QTimer* m_t1 = nullptr;
    QTimer* m_updateTimer = nullptr;
    QTimer* m_snapTimer = nullptr;
    QMenu* m_popup = nullptr;
    QAction* m_katNew = nullptr;
    QAction* m_katRename = nullptr;
    QAction* m_katDelete = nullptr;
    QAction* m_katMove = nullptr;
    QAction* m_konMove = nullptr;
    QAction* m_konCutRelated = nullptr;
    QAction* m_close = nullptr; // dxBB1
};

} // namespace orvanta
