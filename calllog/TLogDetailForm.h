#pragma once
// The detail window of one call: every stored detail of a LOG record on two pages, and its
// remark to edit. The host creates one per call with that call's log id, sets its own window and
// the slot (tag), and is told by WMCLOSELOGDETAILFORM when the window closes; after each save it gets
// WMLOGINFOCHANGE so the log list re-reads and refocuses the call.

#include <QPointer>
#include <QWidget>

class QAction;
class QFrame;
class QGridLayout;
class QLabel;
class QLineEdit;
class QPushButton;
class QTabWidget;

namespace orvanta {

class TDM2;
class TVKCutLabel;

class TLogDetailForm final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TLogDetailForm)

public:
    // dm: the data module (without one, loading and saving report the missing connection).
    // logId: the call shown, fixed for the window's life.
    TLogDetailForm(TDM2* dm, int logId, QWidget* parent = nullptr);
    ~TLogDetailForm() override;

    [[nodiscard]] int logId() const { return m_logId; }
    void setHostWindow(QObject* host) { m_host = host; }
    // The slot in the host's registry (also the "tag" property the host may set itself).
    void setTag(int tag) { setProperty("tag", tag); }
    [[nodiscard]] int tag() const { return property("tag").toInt(); }

    // Loads the call into the controls; false when it cannot (reported in the error log).
    bool GetLogDSData();
    // Saves the edit field as the call's remark; false when it was not saved.
    bool SetBemerkung();

    [[nodiscard]] const QString& savedRemark() const { return m_savedRemark; }
    // Set when loading failed: both save actions stay disabled.
    [[nodiscard]] bool savesLocked() const { return m_locked; }
    // The update rule of the two save actions.
    void logdetail_OKUpdate();

    static constexpr int kRemarkLength = 50;

protected:
    void showEvent(QShowEvent* event) override;
    void closeEvent(QCloseEvent* event) override;
    // Enter acts as "OK" (closing when nothing changed), Escape as "Abbrechen".
    void keyPressEvent(QKeyEvent* event) override;

private:
    void FormShow();
    void ApplyColorScheme();
    void logdetail_OKExecute();
    void logdetail_uebernExecute();
    void RzB3Click();
    bool save();
    QLabel* addRow(QGridLayout* grid, int row, const QString& caption, const char* name, bool cut = false);

    TDM2* m_dm;
    QPointer<QObject> m_host;
    const int m_logId;
    QString m_savedRemark;
    bool m_locked = false;
    bool m_shown = false;

    QFrame* m_p1 = nullptr;
    QTabWidget* m_pages = nullptr;
    QLabel* m_vl[21] = {};
    QLineEdit* m_rzE1 = nullptr;
    QAction* m_ok = nullptr;
    QAction* m_uebern = nullptr;
    QPushButton* m_rzB1 = nullptr;
    QPushButton* m_rzB2 = nullptr;
    QPushButton* m_rzB3 = nullptr;
};

} // namespace orvanta
