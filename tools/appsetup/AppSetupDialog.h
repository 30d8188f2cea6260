#pragma once
// The settings window of "Extras › Einstellungen…": where the call database lives (a file of the
// embedded engine or a path on a Firebird server), the user and password it is opened with, and
// the monitor settings a user changes. "Verbindung testen" connects with the values as entered.

#include "tools/appsetup/SetupSettings.h"

#include <QDialog>

class QCheckBox;
class QComboBox;
class QLabel;
class QLineEdit;
class QPushButton;
class QRadioButton;
class QTableWidget;

namespace orvanta::appsetup {

class AppSetupDialog final : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(AppSetupDialog)

public:
    explicit AppSetupDialog(QWidget* parent = nullptr);
    ~AppSetupDialog() override;

    // The values as the window shows them now.
    [[nodiscard]] SetupValues values() const;
    [[nodiscard]] const SetupSettings& settings() const { return m_settings; }

    // The buttons' work, callable without a click. Each reports a failure in a German message box
    // and returns false.
    bool testConnection();
    bool apply();

    void accept() override;

protected:
    void showEvent(QShowEvent* event) override;

private:
    QWidget* buildDatabaseGroup();
    QWidget* buildMonitorGroup();
    void display(const SetupValues& values);
    void addMsnRow(const MsnRecord& msn);
    void updateStates();

    SetupSettings m_settings;
    bool m_problemsShown = false;
    QRadioButton* m_embedded = nullptr;
    QRadioButton* m_server = nullptr;
    QLineEdit* m_serverName = nullptr;
    QLineEdit* m_path = nullptr;
    QPushButton* m_browse = nullptr;
    QLineEdit* m_user = nullptr;
    QLineEdit* m_password = nullptr;
    QLabel* m_testResult = nullptr;
    QComboBox* m_country = nullptr;
    QTableWidget* m_msns = nullptr;
    QPushButton* m_msnDelete = nullptr;
    QCheckBox* m_autostart = nullptr;
    QPushButton* m_apply = nullptr;
};

} // namespace orvanta::appsetup
