#pragma once
// The two small modal dialogs of the category manager. Tkateditform edits the name and remark of
// one category; TSelKatForm lets the user pick the category a contact moves to. The caller sets
// their fields, runs exec() and reads the result; neither touches the database.

#include <QDialog>
#include <QString>

#include <vector>

class QAction;
class QLabel;
class QLineEdit;
class QListWidget;
class QPushButton;

namespace orvanta {

// The header band and the two buttons both dialogs share.
class KatDialogBase : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(KatDialogBase)

protected:
    KatDialogBase(const QString& caption, const QString& headerLine2, QWidget* parent);
    // The OK button runs the action; "Abbrechen" closes unconfirmed.
    void addButtons(QAction* ok);
    void applyColorScheme();

    QWidget* m_body = nullptr;
    QPushButton* m_ok = nullptr; // RzB1
    QPushButton* m_cancel = nullptr; // RzB2
    QLabel* m_header = nullptr;
};

class Tkateditform final : public KatDialogBase {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(Tkateditform)

public:
    explicit Tkateditform(QWidget* parent = nullptr);

    // Given by the caller before exec(), returned after a confirmation.
    [[nodiscard]] const QString& name() const { return m_name; }
    void setName(const QString& name) { m_name = name; }
    [[nodiscard]] const QString& remark() const { return m_remark; }
    void setRemark(const QString& remark) { m_remark = remark; }
    // True only after "OK".
    [[nodiscard]] bool confirmed() const { return m_confirmed; }
    // The user edited the name since the dialog was filled.
    [[nodiscard]] bool changed() const { return m_changed; }

    void katedit_okUpdate();
    void katedit_okExecute();

protected:
    void showEvent(QShowEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void FormShow();

    QString m_name;
    QString m_remark;
    bool m_confirmed = false;
    bool m_changed = false;
    bool m_filling = false;
    QLineEdit* m_rzE1 = nullptr;
    QLineEdit* m_rzE2 = nullptr;
    QAction* m_katedit_ok = nullptr;
};

class TSelKatForm final : public KatDialogBase {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TSelKatForm)

public:
    explicit TSelKatForm(QWidget* parent = nullptr);

    // Appends an entry; an id below 1 or an empty name is ignored.
    void Add_kd(int id, const QString& name);
    [[nodiscard]] int entryCount() const { return static_cast<int>(m_entries.size()); }

    [[nodiscard]] bool confirmed() const { return m_confirmed; }
    [[nodiscard]] const QString& chosenName() const { return m_chosenName; }
    // -1 when no entry has the chosen name.
    [[nodiscard]] int chosenId() const { return m_chosenId; }

    // The id of the first entry of exactly this name (case-sensitive), -1 when none.
    [[nodiscard]] int GetKatID(const QString& name) const;
    // Fills the list box with the names in alphabetical order and selects the first line.
    void InitList();
    void SelKat_OKUpdate();
    void SelKat_OKExecute();

protected:
    void showEvent(QShowEvent* event) override;
    void closeEvent(QCloseEvent* event) override;

private:
    struct Entry {
        QString name;
        int id;
    };
    std::vector<Entry> m_entries;
    bool m_confirmed = false;
    QString m_chosenName;
    int m_chosenId = -1;
    QListWidget* m_flb1 = nullptr;
    QAction* m_selKat_OK = nullptr;
};

} // namespace orvanta
