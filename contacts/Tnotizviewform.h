#pragma once
// The notes window: the rich-text note of one contact, read-only, on top of the other windows.
// At most one exists; the summary's notes anchor opens it or points it at another contact.

#include <QPointer>
#include <QWidget>

#include <functional>

class QLabel;
class QPushButton;
class QTextEdit;

namespace orvanta {

class TDM2;

class Tnotizviewform final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(Tnotizviewform)

public:
    Tnotizviewform(TDM2* dm, int contactLid, QWidget* parent = nullptr);
    ~Tnotizviewform() override;

    // The open window, null when there is none.
    [[nodiscard]] static Tnotizviewform* instance();
    // Shows the note of lid: in the open window (brought to the front), or in a new one.
    static Tnotizviewform* showNote(TDM2* dm, int lid);
    // Closes the open window, if any.
    static void closeInstance();

    // Prints a note: the designation and the note's RTF; false when printing failed (the printer
    // reports its own errors). By default the note report in the preview; an empty one restores it.
    using NotePrinter = std::function<bool(const QString& designation, const QByteArray& rtf)>;
    static void setNotePrinter(NotePrinter printer);

    // Loads another contact's note; the same contact or a key below 1 changes nothing.
    void SetContactLID(int lid);
    // Reads the note into the view; false when it could not be read.
    bool GetNotizData();
    void ClearContent();
    // "Drucken".
    void RzB2Click();

    [[nodiscard]] int contactLid() const { return m_lid; }
    [[nodiscard]] const QString& designation() const { return m_contbez; }
    [[nodiscard]] QTextEdit* noteView() const { return m_notiz1; }
    [[nodiscard]] int loads() const { return m_loads; }

protected:
    void showEvent(QShowEvent* event) override;

private:
    void load();

    TDM2* m_dm;
    int m_lid;
    int m_loads = 0;
    QString m_contbez;
    QLabel* m_l1 = nullptr;
    QTextEdit* m_notiz1 = nullptr;
    QPushButton* m_print = nullptr; // RzB2
    QPushButton* m_close = nullptr; // RzB1
};

} // namespace orvanta
