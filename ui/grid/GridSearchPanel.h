#pragma once
// The search panel of the list frames (RzPanel1): "Suchen nach:" (cxTE1), "Suchen in:" with a
// check list of the columns (cxCheckComboBox1), the options RzChB1 (narrow the current filter),
// RzChB2 (exact) and RzChB3 (case), the link L3 that clears the mask, "Jetzt suchen"
// (ADVSearchStart) and the close button (AdvCloseSearchPan). It only collects the input; the
// frame turns a request into the grid's GridSearch.

#include <QFrame>
#include <QStringList>

class QCheckBox;
class QLabel;
class QLineEdit;
class QMenu;
class QPushButton;
class QToolButton;

namespace orvanta {

class GridSearchPanel final : public QFrame {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridSearchPanel)

public:
    // columns: the captions offered under "Suchen in:", in this order.
    explicit GridSearchPanel(const QStringList& columns, QWidget* parent = nullptr);

    // Collapsed to a height of 1, every control disabled and emptied, no column chosen.
    void reset();
    // Expanded and enabled with the focus in "Suchen nach:"; with no column chosen yet, all are.
    void open();
    [[nodiscard]] bool isOpen() const { return m_open; }

    [[nodiscard]] QString searchText() const;
    void setSearchText(const QString& text);
    [[nodiscard]] QStringList chosenColumns() const;
    void setChosenColumns(const QStringList& captions);
    [[nodiscard]] bool narrowsFilter() const;
    void setNarrowsFilter(bool on);
    [[nodiscard]] bool exact() const;
    [[nodiscard]] bool caseSensitive() const;

    // "Jetzt suchen" as the button and Enter do it: warns about a missing text or column, else
    // asks for the search.
    void startSearch();
    // "» Suchmaske löschen «": empties the text, chooses every column again (the options stay) and
    // asks for the search to be removed.
    void clearMask();

    [[nodiscard]] static QString missingInputWarning();

Q_SIGNALS:
    void searchRequested();
    void clearRequested();
    void closeRequested();

private:
    void updateColumnText();

    bool m_open = false;
    QLineEdit* m_text = nullptr;          // cxTE1
    QToolButton* m_columns = nullptr;     // cxCheckComboBox1
    QMenu* m_columnMenu = nullptr;
    QCheckBox* m_options[3] = {};         // RzChB1, RzChB2, RzChB3
    QLabel* m_clear = nullptr;            // L3
    QPushButton* m_start = nullptr;       // ADVSearchStart
    QPushButton* m_close = nullptr;       // AdvCloseSearchPan
};

} // namespace orvanta
