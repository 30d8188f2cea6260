#pragma once
// The note editor of the contact edit window: the rich-text editor `Notiz1` under its six tool
// bar groups (open/save/print, clipboard, text style, alignment, bullets, font), which follow the
// selection. The arrangement of the tool bars is kept in "BarStore" of the program folder.

#include <QMainWindow>

#include <functional>

class QActionGroup;
class QComboBox;
class QFontComboBox;
class QSpinBox;
class QTextEdit;

namespace orvanta {

// What printing a note reported: code "OK" on success, else the report's result code name with
// its error number and message.
struct NotePrintResult {
    QString code = QStringLiteral("OK");
    int number = 0;
    QString message;
};

class ContactNoteEditor final : public QMainWindow {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(ContactNoteEditor)

public:
    explicit ContactNoteEditor(QWidget* parent = nullptr);
    ~ContactNoteEditor() override;

    // Installed by the program; until then "Drucken" prints nothing and the open and save dialogs
    // are the standard ones.
    using NotePrinter = std::function<NotePrintResult(const QString& designation, const QByteArray& rtf)>;
    static void setNotePrinter(NotePrinter printer);
    // A file for "Öffnen" (save false) or "Speichern"; empty when cancelled.
    using FileChooser =
        std::function<QString(QWidget* parent, bool save, const QString& folder, const QString& filter)>;
    static void setFileChooser(FileChooser chooser);

    [[nodiscard]] QTextEdit* editor() const { return m_notiz1; }
    // The contact designation a printed note is headed with.
    void setDesignation(std::function<QString()> designation) { m_designation = std::move(designation); }

    // Puts every tool bar item into the state of the selection.
    void RichEditSelectionChange();
    void loadBars();
    void saveBars();

private:
    void buildToolBars();
    void openNote();
    void saveNote();
    void printNote();
    void setStyleBit(int bit, bool on);
    void setAlignment(int tag);
    void setBullets(bool on);
    void setFontName(const QString& name);
    void setFontSize(int size);
    void setFontColor(int index);

    std::function<QString()> m_designation;
    bool m_toolbarUpdating = false;
    QTextEdit* m_notiz1 = nullptr;
    QAction* m_style[4] = {};            // dxBB7..dxBB10
    QActionGroup* m_align = nullptr;     // dxBB11..dxBB13
    QAction* m_bullets = nullptr;        // dxBB14
    QFontComboBox* m_fontName = nullptr; // dxBFNC1
    QSpinBox* m_fontSize = nullptr;      // dxBSE1
    QComboBox* m_fontColor = nullptr;    // dxBCC1
};

} // namespace orvanta
