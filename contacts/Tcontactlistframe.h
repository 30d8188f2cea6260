#pragma once
// The contact list: every contact of the address book, read-only, from the data module's
// ibcds_list (table) or ibcds_card (cards), with a letter bar filtering by the first letter of
// the designation, grouping by category, post code or town, a column menu, and the summary of
// the focused contact under the grid. Layouts live in the program folder: "VStore" (which view,
// splitter position), "VStoreT" (table), "VStoreC" (cards). It writes nothing: new, edit and
// delete are posted to the host, which refreshes the list afterwards. Each view has its own
// controller; the letter filter and the focused contact follow the user from one to the other.

#include "ui/frames/ContactListFrame.h"
#include "ui/grid/GridController.h"

#include <QPointer>
#include <QStringList>

#include <functional>
#include <memory>

class QAction;
class QButtonGroup;
class QLabel;
class QMenu;
class QScrollArea;
class QSplitter;
class QShowEvent;
class QTimer;
class QToolButton;

namespace orvanta {

class DataSet;
class GridCardView;
class GridColumnMenu;
class GridController;
struct GridFilter;
class GridLayoutPersistence;
class GridSearchPanel;
class GridView;
class GridViewBase;
class ListFrameScaffold;
class MarkupPanel;
class RecordStoreGridSource;
class TDM2;
class TVKCutLabel;

class Tcontactlistframe final : public ContactListFrame {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(Tcontactlistframe)

public:
    enum ViewKind { NoView = 0, TableView = 1, CardView = 2 };
    enum Grouping { NoGrouping = 0, ByCategory = 1, ByPostCode = 2, ByTown = 3 };

    // dm: the data module to read from; without one DBConnect fails and the frame is disabled.
    explicit Tcontactlistframe(TDM2* dm, QWidget* parent = nullptr);
    ~Tcontactlistframe() override;

    // --- what the host calls --------------------------------------------------------------
    bool DBConnect(QObject* mainWindow) override;
    void DBDisconnect() override;
    [[nodiscard]] bool isConnected() const override;
    // False when the new view could not be opened (reported).
    bool ChangeView(int kind) override;
    void ToGroup(int kind) override;
    void Refresh_View(int lid) override;
    [[nodiscard]] int GetSelectedLID() const override;
    [[nodiscard]] QString GetSelectedContBez() const override { return m_selectedContBez; }
    void GetViewState(int& viewKind, int& grouping) const override;
    [[nodiscard]] bool CanExpandGroups() const override;
    void ExpandGroups(bool expand) override;
    [[nodiscard]] bool isActionEnabled(const QString& actionName) const override;
    void executeAction(const QString& actionName) override;

    // --- letter filter ----------------------------------------------------------------------
    // t: 0 for none ("..."), 1 to 26 for "A" to "Z".
    void SetNewFilter(int t);
    void SetFilterCaption();
    // Reads the letter filter back from the active view's filter after a layout was restored.
    void SyncFilterState();
    // The LIKE patterns of letter t, in the order they are combined with OR.
    [[nodiscard]] static QStringList letterPatterns(int t);
    [[nodiscard]] const QString& currentLetter() const { return m_currentLetter; }
    [[nodiscard]] const QString& filterColumn() const { return m_filterColumn; }
    [[nodiscard]] QString captionText() const;
    // The tag of the pressed letter button.
    [[nodiscard]] int pressedLetter() const;

    // --- search -----------------------------------------------------------------------------
    // Collapsed, emptied, no search in either view (DBConnect).
    void InitSearchPanel();
    // Ctrl+F, "Suchen..." and the main window's entry: expanded, enabled, focus in "Suchen nach:".
    void OpenSearchPanel();
    // "Jetzt suchen" (or Enter) with a text and a column: the active view shows what it finds.
    void ADVSearchStartClick();
    // "» Suchmaske löschen «": the mask is emptied, the search removed.
    void L3Click();
    // "X": the search removed, the panel collapsed, the host told by WMSEARCHUNCHECKED.
    void AdvCloseSearchPanClick();
    [[nodiscard]] bool isSearchShown() const override;
    [[nodiscard]] GridSearchPanel* searchPanel() const { return m_searchPanel; }

    // --- summary ----------------------------------------------------------------------------
    // One tick of the summary delay timer (T1, 50 ms).
    void T1Timer();
    [[nodiscard]] QTimer* summaryTimer() const { return m_t1; }
    [[nodiscard]] MarkupPanel* summaryPanel() const { return m_summary; }
    // How often the summary was rebuilt since the frame was made.
    [[nodiscard]] int summaryRebuilds() const { return m_summaryRebuilds; }
    // A click on an anchor of the summary.
    void HTMLStaticText1AnchorClick(const QString& href);
    // Who opens the notes of a contact; the notes window unless replaced.
    void setNoteOpener(std::function<void(int lid)> opener) { m_noteOpener = std::move(opener); }

    // --- parts ------------------------------------------------------------------------------
    [[nodiscard]] int activeView() const { return m_viewKind; }
    // The table (cxGrid1DBTableView1) and the cards (cxGrid1DBCardView1); one of them is shown.
    [[nodiscard]] GridView* view() const { return m_view; }
    [[nodiscard]] GridCardView* cardView() const { return m_cards; }
    [[nodiscard]] GridViewBase* activeGrid() const;
    // The active view's controller.
    [[nodiscard]] GridController* controller() const;
    [[nodiscard]] QSplitter* splitter() const { return m_splitter; }
    // The splitter position as the upper part's percentage.
    [[nodiscard]] int splitterPercent() const;
    void setSplitterPercent(int percent);
    [[nodiscard]] QString footerText() const;
    // The active view's context menu (table AdvPopupMenu2, cards AdvPopupMenu1).
    [[nodiscard]] QMenu* popupMenu() const;
    // "VStore", "VStoreT", "VStoreC" in the program folder.
    [[nodiscard]] static QString viewStoreFile();
    [[nodiscard]] static QString layoutFile(int viewKind);

    // The enable rule of the three contact actions.
    void cv_editcontUpdate();
    void SetTableViewPopup();
    void SetCardViewPopup();
    void SetTableColVisibleState(bool visible, int tag);
    void SetCardRowVisibleState(bool visible, int tag);
    void ApplyColorScheme();

protected:
    void showEvent(QShowEvent* event) override;

private:
    void applySplitterPercent();
    void buildLayout();
    void buildColumns();
    void buildCards();
    void buildActions();
    void connectView(GridViewBase* view);
    void showActiveView();
    void setViewPopup();
    [[nodiscard]] GridViewBase* gridOf(int viewKind) const;
    [[nodiscard]] bool storeLayout(int viewKind) const;
    void restoreLayout(int viewKind);
    // The old view's filter for the new view's columns: conditions follow their field.
    [[nodiscard]] static GridSearch searchForView(const GridSearch& search, const GridController& from,
                                                  const GridController& to);
    void removeSearch();
    [[nodiscard]] static GridFilter filterForView(const GridFilter& filter, const GridController& from,
                                                  const GridController& to);
    void buildLetterBar(QWidget* parent);
    void bindSource();
    void detachSource();
    [[nodiscard]] DataSet* dataSetOf(int viewKind) const;
    // rowsFrom: an open data set whose rows the view may take over instead of reading, with
    // the sort keys computed on them.
    void openView(int viewKind, const char* statement, DataSet* rowsFrom = nullptr,
                  GridController::FieldRanks ranks = {});
    void GetAndSetView();
    bool GetGridView(int& kind, int& percent) const;
    void SetGridView(int kind);
    void NoGroup();
    void ColuGroup(const char* field);
    void SetCONTBEZSort();
    void SetLetterButton(int t);
    void FocusedRecordChanged();
    void updateFooter();
    void DisableFrame();
    void rebuildSummary();
    void showPopup(const QPoint& globalPos);

    TDM2* m_dm;
    std::unique_ptr<RecordStoreGridSource> m_source;
    QPointer<QObject> m_host;
    int m_viewKind = NoView;
    bool m_connected = false;
    bool m_deferSummary = false;
    bool m_refreshing = false;
    bool m_changingView = false;
    int m_summaryRebuilds = 0;
    int m_percent = 60;
    QString m_currentLetter;
    QString m_filterColumn = QStringLiteral("Kontakt");
    QString m_selectedContBez;
    QString m_searchedText; // the text of the search the grid shows, empty for none
    std::function<void(int)> m_noteOpener;

    std::unique_ptr<ListFrameScaffold> m_scaffold;
    std::unique_ptr<GridLayoutPersistence> m_layouts;
    TVKCutLabel* m_cl1 = nullptr;
    QSplitter* m_splitter = nullptr;
    QScrollArea* m_scrollBox4 = nullptr;
    MarkupPanel* m_summary = nullptr;
    QLabel* m_footer = nullptr;
    QWidget* m_toolbar = nullptr;
    QButtonGroup* m_letters = nullptr;
    GridView* m_view = nullptr;
    GridCardView* m_cards = nullptr;
    QTimer* m_t1 = nullptr;

    QAction* m_newCont = nullptr;
    QAction* m_editCont = nullptr;
    QAction* m_deleteCont = nullptr;
    QAction* m_search = nullptr;
    GridSearchPanel* m_searchPanel = nullptr; // RzPanel1
    QMenu* m_popup = nullptr;
    GridColumnMenu* m_columnMenu = nullptr;
    QMenu* m_cardPopup = nullptr;
    GridColumnMenu* m_rowMenu = nullptr;
};

} // namespace orvanta
