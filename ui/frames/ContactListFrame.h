#pragma once
// What the main window needs of the contact list it hosts in its client area.

#include <QWidget>

namespace orvanta {

class ContactListFrame : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(ContactListFrame)

public:
    using QWidget::QWidget;

    // mainWindow: receives the frame's command messages (WMNEWCONTACT, WMOPENCONTACT, ...).
    virtual bool DBConnect(QObject* mainWindow) = 0;
    virtual void DBDisconnect() = 0;
    // Whether the list shows open data ("shown and connected").
    [[nodiscard]] virtual bool isConnected() const = 0;
    virtual bool ChangeView(int kind) = 0;
    virtual void ToGroup(int kind) = 0;
    virtual void Refresh_View(int lid) = 0;
    [[nodiscard]] virtual int GetSelectedLID() const = 0;
    [[nodiscard]] virtual QString GetSelectedContBez() const = 0;
    virtual void GetViewState(int& viewKind, int& grouping) const = 0;
    [[nodiscard]] virtual bool CanExpandGroups() const = 0;
    virtual void ExpandGroups(bool expand) = 0;

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
