#pragma once
// The import window: a file is chosen, its contacts are shown as they will be created, and the
// import stores them one by one with a progress bar and a closing count.

#include "tools/oeimp/ContactImporter.h"

#include <QDialog>

#include <functional>

class QLabel;
class QListWidget;
class QProgressBar;
class QPushButton;
class QTableWidget;

namespace orvanta {
class TDM2;
}

namespace orvanta::oeimp {

class OEImpWindow final : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(OEImpWindow)

public:
    // dm: connected or not (then the window says so and imports nothing).
    OEImpWindow(TDM2& dm, int homeCountry, QWidget* parent = nullptr);

    // Reads the file and shows its contacts; false when it could not be read.
    bool openFile(const QString& path);
    // Stores the shown contacts. The counts of the last run:
    void runImport();
    [[nodiscard]] int importedCount() const { return m_imported; }
    [[nodiscard]] int skippedCount() const { return m_skipped; }
    [[nodiscard]] int failedCount() const { return m_failed; }

    // Test seam: the file choice instead of a file dialog (empty: cancelled).
    using FileChooser = std::function<QString(QWidget* parent)>;
    static void setFileChooser(FileChooser chooser);

private:
    void chooseFile();
    void fillPreview();

    TDM2& m_dm;
    int m_homeCountry;
    ImportPlan m_plan;
    bool m_connected = false;
    int m_imported = 0;
    int m_skipped = 0;
    int m_failed = 0;

    QPushButton* m_choose = nullptr;
    QLabel* m_file = nullptr;
    QTableWidget* m_preview = nullptr;
    QListWidget* m_messages = nullptr;
    QProgressBar* m_progress = nullptr;
    QLabel* m_summary = nullptr;
    QPushButton* m_import = nullptr;
    QPushButton* m_close = nullptr;
};

} // namespace orvanta::oeimp
