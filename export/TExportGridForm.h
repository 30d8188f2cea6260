#pragma once
// The export wizard: format, target folder and file name, a waiting page while the rows are
// written, and the result. It exports whatever grid it is handed (the log list, the contact
// list); columns named in excludedColumns are never written.

#include "export/writers/ExportWriter.h"

#include <QDialog>
#include <QPointer>
#include <QStringList>

class QLabel;
class QPushButton;
class QWidget;

namespace orvanta {

class GridController;

class TExportGridForm final : public QDialog {
    Q_OBJECT

public:
    enum Page { NoPage, PageFormat, PageTarget, PageRunning, PageResult };

    explicit TExportGridForm(GridController* grid, QWidget* parent = nullptr, QStringList excludedColumns = {});
    ~TExportGridForm() override;

    [[nodiscard]] Page currentPage() const { return m_page; }
    // Delay between showing the waiting page and starting the export, so the page is seen.
    void setStartDelay(int ms) { m_startDelay = ms; }

    // The steps of the wizard (also what its buttons do).
    void SetFirstFrame();
    void SetFrames(int direction);   // 0 = back, 1 = next
    bool ToExport();
    void ToOpen();
    // The target file of the current state; empty for an unknown format.
    [[nodiscard]] QString targetFile() const;

protected:
    void closeEvent(QCloseEvent* event) override;
    void reject() override;

private:
    void releasePage();
    void showPage(Page page);
    void updateButtons();
    void runExport();
    void cancelClicked();

    GridController* m_grid;
    QStringList m_excluded;
    bool m_openAfter = false;
    int m_format = 0;
    QString m_folder;
    QString m_fileName;
    Page m_page = NoPage;
    int m_startDelay = 1000;
    bool m_closing = false;

    QWidget* m_host = nullptr;          // P3
    QPointer<QWidget> m_current;
    QPushButton* m_prior = nullptr;     // RzButton3
    QPushButton* m_next = nullptr;      // RzButton2
    QPushButton* m_cancel = nullptr;    // RzButton1
};

} // namespace orvanta
