#pragma once
// The contact edit window: one contact's name and company data, address, numbers, e-mail
// addresses, category and rich-text note, on the in-memory record the main window created for it.
// It never touches the database: saving copies the fields into the record and sends WMSAVECONDATA
// to the main window, which stores the record and says through "saveFailed" when it could not.
// Closing posts WMCLOSECONTACTFORM; the main window then frees the record and the window.
//
// The main window sets, before showing it, the properties "tag" (its slot), "recordSlot"
// (DataIndex), "existingContact" (EditMode 1), "callerNumber" (NewNumber) and "saveFailed".

#include "contacts/ContactNoteEditor.h"

#include <QWidget>

#include <functional>

class QAction;
class QComboBox;
class QLabel;
class QLineEdit;
class QPushButton;
class QTableWidget;
class QTabWidget;
class QTextEdit;

namespace orvanta {

class TvkMiniKontakt;

class Tcontacteditform final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(Tcontacteditform)
    Q_PROPERTY(int tag READ Tag WRITE setTag)
    Q_PROPERTY(int recordSlot READ DataIndex WRITE setDataIndex)
    Q_PROPERTY(bool existingContact READ existingContact WRITE setExistingContact)
    Q_PROPERTY(QString callerNumber READ NewNumber WRITE setNewNumber)
    Q_PROPERTY(bool saveFailed READ SaveLocked WRITE setSaveLocked)

public:
    // The main window's contact records by slot (null: no record there).
    using RecordLookup = std::function<TvkMiniKontakt*(int slot)>;
    // mainHandle receives WMSAVECONDATA and WMCLOSECONTACTFORM.
    Tcontacteditform(QObject* mainHandle, RecordLookup records, QWidget* parent = nullptr);
    ~Tcontacteditform() override;

    // Installed by the program; until then "Drucken" prints nothing, the category button opens
    // nothing and the note's open/save dialogs are the standard ones.
    using NotePrinter = ContactNoteEditor::NotePrinter;
    static void setNotePrinter(NotePrinter printer);
    // The category manager in its pick mode: the chosen designation, empty when none was chosen.
    using CategoryPicker = std::function<QString(QWidget* parent)>;
    static void setCategoryPicker(CategoryPicker picker);
    // A file for "Öffnen" (save false) or "Speichern"; empty when cancelled.
    using FileChooser = ContactNoteEditor::FileChooser;
    static void setFileChooser(FileChooser chooser);

    // The monitor's country (AC: 1 Germany, 2 Austria, 3 Switzerland) for numbers without prefix.
    void setHomeCountry(int ac) { m_homeCountry = ac; }

    [[nodiscard]] int Tag() const { return m_tag; }
    void setTag(int tag) { m_tag = tag; }
    [[nodiscard]] int DataIndex() const { return m_dataIndex; }
    void setDataIndex(int slot) { m_dataIndex = slot; }
    [[nodiscard]] int EditMode() const { return m_editMode; }
    [[nodiscard]] bool existingContact() const { return m_editMode == 1; }
    void setExistingContact(bool existing) { m_editMode = existing ? 1 : 0; }
    [[nodiscard]] const QString& NewNumber() const { return m_newNumber; }
    void setNewNumber(const QString& number) { m_newNumber = number; }
    [[nodiscard]] bool SaveLocked() const { return m_saveLocked; }
    // Once a save failed, saving stays locked for the rest of the window's life.
    void setSaveLocked(bool failed);
    [[nodiscard]] bool Modified() const { return m_modified; }
    [[nodiscard]] bool DataError() const { return m_dataError; }

    // The designation made of first name, name and company.
    [[nodiscard]] static QString BuildContBez(const QString& v, const QString& n, const QString& f);

    // The category of the contact was renamed or the contact moved: shown without counting as a
    // change of the user.
    void KatHasChanged(const QString& katbez);

    // Entry operations of the number and e-mail grids (the buttons run them).
    void NewComData();
    void EditComData();
    void DelComData();
    void NewMailData();
    void EditMailData();
    void DelMailData();

    [[nodiscard]] QTextEdit* noteEditor() const { return m_notiz1; }
    [[nodiscard]] QStringList salutationHistory() const { return m_history; }

    static const QStringList& fixedSalutations();

protected:
    void showEvent(QShowEvent* event) override;
    void closeEvent(QCloseEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void buildLayout();
    QWidget* buildContactTab();
    QWidget* buildAddressTab();
    QWidget* buildCommunicationTab();
    QWidget* buildNotesTab();
    QLineEdit* addEdit(QWidget* page, const char* name, int maxLength);

    void FormShow();
    void FormClose();
    void applyColorScheme();
    void DisableEditing();
    bool FieldInitialNew();
    bool FieldInitialEdit();
    bool SetBlankGrid();
    bool SetBlankMailGrid();
    bool SetGridLines();
    bool SetGridMailLines();
    bool CheckNewNumber();
    bool GetDataToSave();
    [[nodiscard]] TvkMiniKontakt* record() const;
    // The list position of the selected grid row, -1 when the row holds no entry.
    [[nodiscard]] int selectedEntry(QTableWidget* grid, int textColumn, int idColumn, int listSize) const;

    void conedit_okUpdate();
    void conedit_okExecute();
    void conedit_uebernExecute();
    void sendSave();

    void nameChanged();        // RzEdit2Change, shared by "Vorname", "Name", "Firma"
    void designationChanged(); // RzEdit9Change
    void fieldChanged();
    void pickCategory();

    void loadHistory();
    void saveHistory();
    void fillSalutationBox();
    void removeFromHistory();

    QObject* m_main;
    RecordLookup m_records;
    int m_tag = -1;
    int m_dataIndex = -1;
    int m_editMode = 0;
    QString m_newNumber;
    int m_homeCountry = 0;
    bool m_saveLocked = false;
    bool m_modified = false;
    bool m_initialising = true;
    bool m_dataError = false;
    bool m_shown = false;
    bool m_closed = false;
    QStringList m_history;

    QLabel* m_header = nullptr;
    QTabWidget* m_pages = nullptr; // AdvPageControl1
    QComboBox* m_anrede = nullptr; // RzMRUCB1
    QLineEdit* m_vname = nullptr;  // RzEdit2
    QLineEdit* m_name = nullptr;   // RzEdit3
    QLineEdit* m_titel = nullptr;  // RzEdit1
    QLineEdit* m_firma = nullptr;  // RzEdit4
    QLineEdit* m_contbez = nullptr; // RzEdit9
    QLineEdit* m_website = nullptr; // RzEdit10
    QLineEdit* m_abteilung = nullptr; // RzEdit11
    QLineEdit* m_katbez = nullptr; // RzButtonEdit1
    QLineEdit* m_str = nullptr;    // RzEdit5
    QLineEdit* m_plz = nullptr;    // RzEdit6
    QLineEdit* m_ort = nullptr;    // RzEdit7
    QLineEdit* m_zusatz = nullptr; // RzEdit8
    QLineEdit* m_land = nullptr;   // RzEdit12
    QLineEdit* m_bundesland = nullptr; // RzEdit13
    QTableWidget* m_sg1 = nullptr;
    QTableWidget* m_mailGrid = nullptr;
    QTextEdit* m_notiz1 = nullptr;
    ContactNoteEditor* m_notes = nullptr;
    QAction* m_ok = nullptr;       // conedit_ok
    QAction* m_uebern = nullptr;   // conedit_uebern
    QAction* m_exit = nullptr;     // conedit_exit
};

} // namespace orvanta
