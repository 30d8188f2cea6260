#pragma once
// What the main window needs of the call-log list it hosts in its client area. The call-log
// list derives from this; the main window creates it per log view, sets the view mode (and the
// day), calls Firstep, asks WhatsOn for its buttons, and frees it after StoreLogView.

#include <QDate>
#include <QWidget>

namespace orvanta {

// How the log list groups its rows. The values are the main window's group boxes' tags minus 5
// and what a restored layout reports back.
enum class LogGrouping : int { None = 0, Date = 1, Caller = 2, Callee = 3, Free = 4, Direction = 5 };

class LogListFrame : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(LogListFrame)

public:
    using QWidget::QWidget;

    // 0 = whole log, 1 = one day (set before Firstep).
    virtual void setViewMode(int mode) = 0;
    [[nodiscard]] virtual int viewMode() const = 0;
    // The day shown in day mode (set before Firstep, changed by OpenDBonDay).
    virtual void setLogDay(QDate day) = 0;
    [[nodiscard]] virtual QDate logDay() const = 0;
    // The host marks an empty log and then writes its own text into the caption label.
    virtual void setNoLog(bool noLog) = 0;
    virtual void setCaptionText(const QString& text) = 0;
    [[nodiscard]] virtual QString captionText() const = 0;
    // A busy frame disables the main window's log actions (print, export, delete).
    [[nodiscard]] virtual bool isBusy() const = 0;
    virtual void setBusy(bool busy) = 0;

    // host: receives the frame's command messages (WMLOGOPENBEMERKUNG, WMDELETELOGITEM, ...).
    virtual bool Firstep(QObject* host) = 0;
    virtual bool OpenDBonDay(QDate day) = 0;
    virtual void SetNewFilter(int kind) = 0;
    virtual void ToGroup(LogGrouping kind) = 0;
    virtual void WhatsOn(int& filterKind, LogGrouping& grouping) = 0;
    virtual void SetTableViewPopup() = 0;
    virtual void Refresh_View(int lid) = 0;
    virtual bool StoreLogView() = 0;
    [[nodiscard]] virtual bool CanExpandGroups() const = 0;
    virtual void ExpandAllGroups(bool expand) = 0;
    [[nodiscard]] virtual int CurrentLogLID() const = 0;

    // Main-window actions that belong to the view (search, expand, export ...) are forwarded by
    // their object name; a frame that does not know the name leaves the action disabled.
    [[nodiscard]] virtual bool isActionEnabled(const QString& actionName) const
    {
        Q_UNUSED(actionName);
        return false;
    }
    virtual void executeAction(const QString& actionName) { Q_UNUSED(actionName); }
    // Whether the list's search panel is open (the main window's search entry shows it checked).
    [[nodiscard]] virtual bool isSearchShown() const { return false; }
};

} // namespace orvanta
