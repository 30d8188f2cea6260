#pragma once
// The preview of a report: pages one at a time, zoom, paging, print and PDF. The report is laid
// out page by page while the window is already open, so the first page shows at once.

#include "ui/report/TPrintF.h"

#include <QPointer>
#include <QWidget>

#include <functional>

class QAction;
class QHBoxLayout;
class QToolBar;
class QLabel;
class QLineEdit;
class QScrollArea;
class QStatusBar;
class QTimer;

namespace orvanta {

class ReportLayout;

class TRavePreviewF final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TRavePreviewF)

public:
    TRavePreviewF(ReportLayout& layout, const QString& title, QWidget* parent = nullptr);
    ~TRavePreviewF() override;

    // Shows the preview modally and returns when it is closed.
    static void showModal(ReportLayout& layout, const QString& title);

    // Where "PDF" saves: asks for a file name (empty = cancelled). Tests answer without a dialog.
    using PdfPathChooser = std::function<QString(QWidget* parent, const QString& suggested)>;
    static void setPdfPathChooser(PdfPathChooser chooser);

    [[nodiscard]] int currentPage() const { return m_page; } // 1-based
    [[nodiscard]] int pageCount() const;
    [[nodiscard]] double zoom() const { return m_zoom; }
    [[nodiscard]] ReportLayout& layout() const { return m_layout; }
    [[nodiscard]] TPrintF* printDialog() const { return m_printDialog; }

    void showPage(int page);
    void setZoom(double percent);
    // The zoom at which the page's width (or the whole page) fills the page area.
    [[nodiscard]] double fitWidthZoom() const;
    [[nodiscard]] double fitPageZoom() const;
    // Lays the rest of the report out now (printing and PDF need every page).
    void layoutAll();
    // "Drucken" is enabled while a printer is installed; asked again after a failed job, since
    // the printer may be the one that went away.
    void updatePrintAction();

    static constexpr double kZoomStep = 10;

    // rv_* handlers.
    void rv_PrintExecute();
    void rv_PDFExecute();

Q_SIGNALS:
    void closed();

protected:
    void resizeEvent(QResizeEvent* event) override;
    void wheelEvent(QWheelEvent* event) override;
    void closeEvent(QCloseEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void layoutStep();
    void wrapBars();
    void updateStatus();
    void rv_LastPageUpdate();
    void pageEditDone();
    void failed(const QString& message);

    ReportLayout& m_layout;
    int m_page = 1;
    double m_zoom = 100;
    bool m_failed = false;
    QList<QToolBar*> m_bars;
    QHBoxLayout* m_barRows[2] = {};
    QWidget* m_pageView = nullptr;
    QScrollArea* m_scroll = nullptr;
    QStatusBar* m_status = nullptr;
    QLabel* m_panels[3] = {};
    QLineEdit* m_pageEdit = nullptr;
    QLabel* m_zoomText = nullptr;
    QTimer* m_layoutTimer = nullptr;
    QAction* m_first = nullptr;
    QAction* m_prior = nullptr;
    QAction* m_next = nullptr;
    QAction* m_last = nullptr;
    QAction* m_print = nullptr;
    QAction* m_pdf = nullptr;
    QPointer<TPrintF> m_printDialog;
};

} // namespace orvanta
