#pragma once
// The main window: navigation bar with the three views on the left, the hosted list frame in
// P1 on the right, menus, tool bars and the status bar. It owns the registries of open contact
// edit windows, contact records and log detail windows, and receives every window message of
// the program.

#include "app/ActionRegistry.h"
#include "app/WindowRegistries.h"
#include "calllog/LogMaintenance.h"
#include "platform/MonitorLink.h"
#include "ui/frames/ContactListFrame.h"
#include "ui/frames/LogListFrame.h"

#include <QDate>
#include <QMainWindow>
#include <QPointer>

#include <functional>
#include <memory>
#include <vector>

class QAction;
class QCheckBox;
class QLabel;
class QMenu;
class QRadioButton;
class QSplitter;
class QTextEdit;
class QTimer;
class QToolBar;

namespace orvanta {

class AdvNavBar;
class AdvNavBarPanel;
class PanelStatusBar;
class PlannerCalendar;
class ProgramLauncher;
class TDM2;
class TvkMiniKontakt;

class TLogform;

// How the main window makes the frames and windows that the features provide. A missing factory
// leaves the view with an empty frame (or opens no window).
struct MainWindowFactories {
    std::function<LogListFrame*(QWidget* parent)> logFrame;
    std::function<ContactListFrame*(QWidget* parent)> contactFrame;
    // A log detail window for one call; the main window keeps it in its registry.
    std::function<QWidget*(QWidget* mainWindow, int slot, int logKey)> logDetailWindow;
    // A contact edit window for the record in recordSlot; editSlot is the window's tag.
    // The main window sets these properties on it: "tag" (editSlot), "recordSlot",
    // "existingContact" (bool), "callerNumber" (new contact from a call), "saveFailed" (bool).
    std::function<QWidget*(QWidget* mainWindow, int editSlot, int recordSlot)> contactEditWindow;
    // Loads a stored contact into a record; false when it cannot (reported by the loader).
    std::function<bool(TLogform& mainWindow, TvkMiniKontakt& record, int contactKey)> loadContact;
    // Saves the record of a slot; kind 0 new, 1 existing, 2 new from a caller's number.
    std::function<bool(TLogform& mainWindow, int recordSlot, int kind)> saveContact;
};

// A feature registers itself with the main window: it fills the factories of the frames and
// windows it provides (handing them the main window's data module) and gives the actions it owns
// their handlers and enable rules.
using MainWindowFeature = std::function<void(TLogform& mainWindow)>;

class TLogform final : public QMainWindow {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TLogform)

public:
    // dm may be null (no data module: every database step reports the missing connection).
    // parameters: the command-line parameters without the program name.
    // features: registered in this order once the actions exist, before anything is shown.
    TLogform(TDM2* dm, const QStringList& parameters, const std::vector<MainWindowFeature>& features = {},
             QWidget* parent = nullptr);
    ~TLogform() override;

    // Navigation tab indices.
    enum Tab { TabContacts = 0, TabCalendar = 1, TabLog = 2 };

    [[nodiscard]] TDM2* dataModule() const { return m_dm; }
    // What the features register.
    [[nodiscard]] MainWindowFactories& factories() { return m_factories; }
    [[nodiscard]] ActionRegistry& actions() { return m_actions; }
    [[nodiscard]] AdvNavBar* navBar() const { return m_navBar; }
    [[nodiscard]] PlannerCalendar* calendar() const { return m_calendar; }
    [[nodiscard]] PanelStatusBar* statusPanels() const { return m_statusBar; }
    [[nodiscard]] QWidget* frameHost() const { return m_p1; }
    [[nodiscard]] LogListFrame* logFrame() const { return m_logFrame.data(); }
    [[nodiscard]] ContactListFrame* contactFrame() const { return m_contactFrame.data(); }
    [[nodiscard]] QWidget* emptyFrame() const { return m_emptyFrame.data(); }
    [[nodiscard]] LogMaintenance& maintenance() const { return *m_maintenance; }
    [[nodiscard]] MonitorLink& monitorLink() const { return *m_monitor; }
    [[nodiscard]] ProgramLauncher& launcher() const { return *m_launcher; }
    [[nodiscard]] int startLogRecordId() const { return m_startLogId; }
    [[nodiscard]] bool isBusy() const { return m_busy; }
    [[nodiscard]] bool isGrouping() const { return m_grouping; }
    [[nodiscard]] QTimer* closeRetryTimer() const { return m_t1; }

    // Registries of open windows and records.
    [[nodiscard]] WindowSlots& editWindows() { return m_windows.editWindows(); }
    [[nodiscard]] ObjectSlots<TvkMiniKontakt>& contactRecords() { return m_windows.contactRecords(); }
    [[nodiscard]] WindowSlots& logDetailWindows() { return m_windows.logDetailWindows(); }
    [[nodiscard]] const WindowRegistries& windowRegistries() const { return m_windows; }
    // Puts a log detail window for the call into the registry (or brings an open one forward).
    int CreateLogDetailFo(int logKey);
    [[nodiscard]] bool IfLogDetailArrayAllFree();
    bool SearchWndAndShowLogDetail(int logKey);
    [[nodiscard]] bool IfContactDataArrayExists(int contactKey);
    bool SearchWNDAndShow(int contactKey);
    // Opens a contact edit window: contactKey > 0 edits it, otherwise new (from the call logKey
    // when above 0). Returns the edit-window slot, or -1 when no window opened.
    int CreateConDataEdit(int contactKey, int logKey);

    // The navigation bar's change handler: builds the view of the panel now shown.
    void AdvNavBar1Change();
    // Runs one window message as the main window handles it.
    void dispatchMessage(int message, qintptr wParam, qintptr lParam);
    // Brings every action's enabled state up to date (also runs on a timer).
    void updateActions();
    // Re-reads whether the monitor runs and whether it is paused (done once a second otherwise).
    void refreshMonitorState();

    [[nodiscard]] QAction* action(const QString& objectName) const;
    // Runs an action of the current view's frame; a failure is reported with the action's name.
    void forwardToFrame(const QString& actionName);
    // What the calendar's day marks work on.
    [[nodiscard]] LogMarkContext markContext() const;

    // Closes the frames, registries and files in the tear-down order (also run by closeEvent).
    void tearDown();

protected:
    bool event(QEvent* e) override;
    void showEvent(QShowEvent* e) override;
    void closeEvent(QCloseEvent* e) override;
    void resizeEvent(QResizeEvent* e) override;

private:
    // creation
    void buildLayout();
    void buildContactsPanel(AdvNavBarPanel* panel);
    void buildCalendarPanel(AdvNavBarPanel* panel);
    void buildLogPanel(AdvNavBarPanel* panel);
    void buildActions();
    void buildMenusAndBars();
    void FormCreate(const QStringList& parameters);
    void FormShow();
    void applyColorScheme(int scheme);
    void readCommandLine(const QStringList& parameters);
    void restoreBars();
    void saveBars();
    void wrapToolBars();

    // views
    void freeFrames();
    void showEmptyFrame();
    void showContactFrame();
    void showLogFrame(int viewMode);
    void syncLogButtons();
    void PC1DaySelected(QDate day);
    void contactGroupClicked(QCheckBox* box);
    void logGroupClicked(QCheckBox* box);
    void logFilterClicked(int tag);
    void contactViewClicked(int kind);
    void selectPanelFromMenu(int tab);

    // actions
    [[nodiscard]] bool contactFrameReady() const;
    [[nodiscard]] bool contactSelected() const;
    // The enable rule of an action forwarded to the current view's frame.
    [[nodiscard]] bool frameAllows(const QString& actionName) const;
    void ContEditExecute();
    void ContDelExecute();
    void OEImpExecute();
    void runIfEnabled(const QString& actionName);

    // messages
    // (named after their messages; the underscore keeps the message constants visible)
    void WMLOGINFOCHANGE_(qintptr wParam, qintptr lParam);
    void WMSTATUSPANEL_(qintptr wParam, qintptr lParam);
    void WMCONTACTDATAFROMSCREEN_(qintptr wParam);
    void WMCLOSECONTACTFORM_(qintptr wParam);
    void WMSAVECONDATA_(qintptr wParam, qintptr lParam);
    void WMCLOSELOGDETAILFORM_(qintptr wParam);

    TDM2* m_dm;
    MainWindowFactories m_factories;
    ActionRegistry m_actions;
    std::unique_ptr<LogMaintenance> m_maintenance;
    std::unique_ptr<MonitorLink> m_monitor;
    ProgramLauncher* m_launcher = nullptr;

    AdvNavBar* m_navBar = nullptr;
    AdvNavBarPanel* m_panelContacts = nullptr; // AdvNavBarPanel3
    AdvNavBarPanel* m_panelCalendar = nullptr; // AdvNavBarPanel2
    AdvNavBarPanel* m_panelLog = nullptr;      // AdvNavBarPanel1
    PlannerCalendar* m_calendar = nullptr;
    QTextEdit* m_rzre1 = nullptr;
    QSplitter* m_splitter = nullptr;
    QWidget* m_p1 = nullptr;
    QWidget* m_p3 = nullptr;
    QWidget* m_p4 = nullptr;
    PanelStatusBar* m_statusBar = nullptr;
    QRadioButton* m_rzrb[7] = {};  // 1..6
    QCheckBox* m_rzcb[11] = {};    // 1..10
    QTimer* m_t1 = nullptr;
    QTimer* m_updateTimer = nullptr;
    QTimer* m_monitorTimer = nullptr;
    std::vector<QToolBar*> m_toolBars;

    QPointer<LogListFrame> m_logFrame;
    QPointer<ContactListFrame> m_contactFrame;
    QPointer<QWidget> m_emptyFrame;

    WindowRegistries m_windows;

    int m_startLogId = 0;
    bool m_busy = false;
    bool m_grouping = false;
    bool m_shown = false;
    bool m_tornDown = false;
    MonitorState m_monitorState = MonitorState::Absent;
};

} // namespace orvanta
