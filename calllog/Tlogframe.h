#pragma once
// The call-log list: the rows of LOG through the data module's ibcds_log in a read-only grid,
// the whole log or one day, with one period filter at a time, a choice of grouping, a column
// menu, and a layout file per view ("VStoreL", "VStoreLK" in the program folder). It writes
// nothing to the database: deleting and opening remarks are asked of the host by posted
// messages, and the focused record is published in the data module's CurLog* fields.

#include "ui/frames/LogListFrame.h"

#include <QColor>
#include <QPointer>
#include <memory>

class QAction;
class QFrame;
class QLabel;
class QMenu;
class QPushButton;

namespace orvanta {

class GridColumnMenu;
class GridController;
struct GridCellInfo;
class GridLayoutPersistence;
class GridSearchPanel;
struct LogFieldIndexes;
class GridView;
class ListFrameScaffold;
class RecordStoreGridSource;
class TDM2;
class TVKCutLabel;

class Tlogframe final : public LogListFrame {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(Tlogframe)

public:
    // dm: the data module to read from; without one every opening reports the missing connection.
    explicit Tlogframe(TDM2* dm, QWidget* parent = nullptr);
    ~Tlogframe() override;

    // --- what the host calls --------------------------------------------------------------
    void setViewMode(int mode) override { m_viewMode = mode; }
    [[nodiscard]] int viewMode() const override { return m_viewMode; }
    void setLogDay(QDate day) override { m_logDay = day; }
    [[nodiscard]] QDate logDay() const override { return m_logDay; }
    void setNoLog(bool noLog) override { m_noLog = noLog; }
    void setCaptionText(const QString& text) override;
    [[nodiscard]] QString captionText() const override;
    [[nodiscard]] bool isBusy() const override { return m_busy; }
    // The log is still arriving (whole-log view), or reading it failed part way.
    [[nodiscard]] bool isLoading() const;
    [[nodiscard]] bool isIncomplete() const { return m_incomplete; }
    void setBusy(bool busy) override { m_busy = busy; }

    bool Firstep(QObject* host) override;
    bool OpenDBonDay(QDate day) override;
    void SetNewFilter(int kind) override;
    void ToGroup(LogGrouping kind) override;
    void WhatsOn(int& filterKind, LogGrouping& grouping) override;
    void SetTableViewPopup() override;
    void Refresh_View(int lid) override;
    bool StoreLogView() override;
    [[nodiscard]] bool CanExpandGroups() const override;
    void ExpandAllGroups(bool expand) override;
    [[nodiscard]] int CurrentLogLID() const override;

    // --- the frame's own steps --------------------------------------------------------------
    void EnsureSorting();
    void CheckSorting();
    void SetDateSort();
    bool NoGroup();
    void ColuGroup(const QString& caption);
    void FocusLastRecord();
    void ClearFilterItems();
    void UpdateLogCaption();
    void PostLogStatus();
    // The search panel: collapsed, emptied, no search.
    void ResetSearchPanel();
    // Ctrl+F, "Suchen..." and the main window's entry: expanded, enabled, focus in "Suchen nach:".
    void OpenSearchPanel();
    // "Jetzt suchen" (or Enter) with a text and a column: the grid shows what the search finds.
    void ADVSearchStartClick();
    // "» Suchmaske löschen «": the mask is emptied, the search removed.
    void L3Click();
    // "X": the search removed, the panel collapsed, the host told by WMSEARCHUNCHECKED.
    void AdvCloseSearchPanClick();
    [[nodiscard]] bool isSearchShown() const override;
    [[nodiscard]] GridSearchPanel* searchPanel() const { return m_searchPanel; }
    [[nodiscard]] bool isActionEnabled(const QString& actionName) const override;
    void executeAction(const QString& actionName) override;
    void ApplyColorScheme();
    void SetTableColVisibleState(bool visible, int tag);

    // The operator name of the active period filter ("is this week"), empty for none.
    [[nodiscard]] const QString& filterName() const { return m_filterName; }
    [[nodiscard]] GridView* view() const { return m_view; }
    [[nodiscard]] GridController* controller() const;
    [[nodiscard]] QMenu* popupMenu() const { return m_popup; }
    // "VStoreL" (whole log) or "VStoreLK" (one day) in the program folder.
    [[nodiscard]] static QString layoutFile(int viewMode);

    // The enable rule of lf_bemerkung and lf_delitem, run whenever what it depends on changes.
    void lf_bemerkungUpdate();

private:
    void buildColumns();
    void buildActions();
    void buildLayout();
    void bindSource();
    void detachSource();
    void TableViewFocusedRecordChanged();
    void Datum1Click(QAction* entry);
    void cxGrid1DBTableView1ColumnPosChanged(int column);
    void showPopup(const QPoint& globalPos);
    [[nodiscard]] bool paintAbidCell(QPainter& painter, const GridCellInfo& cell) const;
    void clearFocusedRecord();
    void removeSearch();
    [[nodiscard]] bool connected() const;
    // Arrival of the log read in the background.
    void rowsArrived();
    void rowsReplaced();
    void loadFinished(bool complete);
    // Refresh_View's cheap path: the new calls only. False when a full re-read is needed.
    bool readNewCalls();
    void reloadLog();
    void focusKey(int lid);
    // The counters of inserts and of other changes the triggers keep; false when unreadable.
    bool readChangeCounters(qint64& inserts, qint64& changes);

    TDM2* m_dm;
    std::unique_ptr<RecordStoreGridSource> m_source;
    std::shared_ptr<LogFieldIndexes> m_fieldIndexes;
    QPointer<QObject> m_host;

    int m_viewMode = 0;         // FViewMode
    QDate m_logDay;             // FLogDay
    bool m_noLog = false;       // FNoLog
    QString m_filterName;       // FFilterName
    bool m_busy = false;
    bool m_refreshing = false;
    bool m_incomplete = false;
    // A refresh asked for while the log was arriving, done when it is complete.
    bool m_refreshPending = false;
    int m_refreshLid = 0;
    // The change counters as they stood before the rows held were read; invalid when unknown.
    bool m_countersValid = false;
    qint64 m_inserts = 0;
    qint64 m_changes = 0;
    int m_abidColumn = -1;

    std::unique_ptr<ListFrameScaffold> m_scaffold;
    std::unique_ptr<GridLayoutPersistence> m_layouts;
    QFrame* m_fp3 = nullptr;
    TVKCutLabel* m_cl1 = nullptr;
    GridSearchPanel* m_searchPanel = nullptr; // RzPanel1
    QString m_searchedText; // the text of the search the grid shows, empty for none
    GridView* m_view = nullptr;

    QAction* m_lfBemerkung = nullptr;
    QAction* m_lfDelitem = nullptr;
    QAction* m_lfAttachToContact = nullptr;
    QAction* m_lfOpenContactFromLog = nullptr;
    QAction* m_lfPlayVoiceboxItem = nullptr;
    QAction* m_lfSearch = nullptr;
    QMenu* m_popup = nullptr;  // AdvPopupMenu1
    GridColumnMenu* m_columnMenu = nullptr;
};

} // namespace orvanta
