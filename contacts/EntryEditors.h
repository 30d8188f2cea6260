#pragma once
// The two small modal editors of one entry of a contact's lists: Tcomeditform for a telephone
// number, Tmaileditform for an e-mail address. The caller sets the public fields, runs exec(),
// reads the OK flag and, when it is set, the fields; neither touches the record or the database.

#include <QDialog>

class QAction;
class QCheckBox;
class QLabel;
class QLineEdit;
class QPushButton;

namespace orvanta {

class EntryEditorBase : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(EntryEditorBase)

public:
    [[nodiscard]] bool ok() const { return m_ok; }

protected:
    EntryEditorBase(const QString& caption, const QString& header, QWidget* parent);
    // One labelled field in the form; maxLength 0: no limit.
    QLineEdit* addField(const char* name, const QString& label, int maxLength);
    void addButtons(const char* okAction);
    void showEvent(QShowEvent* event) override;
    virtual void FormShow() = 0;
    virtual bool okAllowed() const = 0;
    virtual void takeFields() = 0;

    QWidget* m_form = nullptr;
    QPushButton* m_okButton = nullptr;     // RzButton1
    QPushButton* m_cancelButton = nullptr; // RzButton2

private:
    void okUpdate();
    void okExecute();
    void applyColorScheme();

    QAction* m_okAction = nullptr; // comeditfo_ok / mailedit_ok
    bool m_ok = false;
    int m_row = 0;
};

class Tcomeditform final : public EntryEditorBase {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(Tcomeditform)

public:
    explicit Tcomeditform(QWidget* parent = nullptr);

    QString KOMMBEZ;
    QString LC;
    QString VORW;
    QString NUMBER;
    QString BEMERKUNG;
    bool AUTOREJECT = false;

protected:
    void FormShow() override;
    bool okAllowed() const override;
    void takeFields() override;

private:
    QLineEdit* m_kommbez; // RzEdit2
    QLineEdit* m_lc;      // RzEdit1
    QLineEdit* m_vorw;    // RzEdit3
    QLineEdit* m_number;  // RzEdit4
    QLineEdit* m_remark;  // RzEdit5
    QCheckBox* m_reject;  // RzCheckBox1
};

class Tmaileditform final : public EntryEditorBase {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(Tmaileditform)

public:
    explicit Tmaileditform(QWidget* parent = nullptr);

    QString MAILADDR;
    QString BEMERK;

protected:
    void FormShow() override;
    bool okAllowed() const override;
    void takeFields() override;

private:
    QLineEdit* m_addr;   // RzEdit2
    QLineEdit* m_remark; // RzEdit5
};

} // namespace orvanta
