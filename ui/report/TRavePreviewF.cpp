#include "ui/report/TRavePreviewF.h"

#include "platform/AppException.h"
#include "platform/ErrorLog.h"
#include "ui/report/ReportLayout.h"
#include "ui/report/ReportRenderer.h"
#include "ui/report/TPrintF.h"

#include <QAction>
#include <QCloseEvent>
#include <QEventLoop>
#include <QFileDialog>
#include <QHBoxLayout>
#include <QKeyEvent>
#include <QLabel>
#include <QLineEdit>
#include <QLocale>
#include <QPainter>
#include <QRegularExpressionValidator>
#include <QScrollArea>
#include <QScrollBar>
#include <QStatusBar>
#include <QStyle>
#include <QTimer>
#include <QToolBar>
#include <QVBoxLayout>
#include <QWheelEvent>

#include <cmath>

namespace orvanta {

namespace {

constexpr int kShadow = 2;
constexpr double kMargin = 0.05; // of the page's width, around it

TRavePreviewF::PdfPathChooser& pdfChooser()
{
    static TRavePreviewF::PdfPathChooser chooser;
    return chooser;
}

// The page area's content: the current page on a grey desk with a shadow.
class PageView final : public QWidget {
public:
    explicit PageView(TRavePreviewF* preview)
        : QWidget(nullptr)
        , m_preview(preview)
    {
        setObjectName(QStringLiteral("PageView"));
        setAutoFillBackground(true);
        QPalette p = palette();
        p.setColor(QPalette::Window, QColor(0x80, 0x80, 0x80));
        setPalette(p);
    }

    [[nodiscard]] QSizeF pageSize(double zoom) const
    {
        const QSizeF paper = m_preview->layout().definition().paper;
        const double scale = logicalDpiX() / 25.4 * zoom / 100;
        return paper * scale;
    }
    [[nodiscard]] QRectF pageRect() const
    {
        const QSizeF page = pageSize(m_preview->zoom());
        const double margin = page.width() * kMargin;
        return QRectF(QPointF(margin, margin), page);
    }
    void resizeToPage()
    {
        const QRectF r = pageRect();
        resize(int(std::ceil(r.right() + r.left() + kShadow)), int(std::ceil(r.bottom() + r.top() + kShadow)));
        update();
    }

protected:
    void paintEvent(QPaintEvent*) override
    {
        QPainter painter(this);
        const QRectF r = pageRect();
        painter.fillRect(r.translated(kShadow, kShadow), Qt::black);
        const ReportLayout& layout = m_preview->layout();
        const int index = m_preview->currentPage() - 1;
        if (index < layout.completePages())
            ReportRenderer::paintPage(painter, layout, index, r);
        else
            painter.fillRect(r, Qt::white);
        painter.setPen(Qt::black);
        painter.drawRect(r);
    }

private:
    TRavePreviewF* m_preview;
};

PageView* view(QWidget* w)
{
    return static_cast<PageView*>(w);
}

} // namespace

TRavePreviewF::TRavePreviewF(ReportLayout& layout, const QString& title, QWidget* parent)
    : QWidget(parent, Qt::Window)
    , m_layout(layout)
{
    setObjectName(QStringLiteral("TRavePreviewF"));
    setAttribute(Qt::WA_DeleteOnClose, false);
    setWindowTitle(title);
    resize(747, 654);

    auto* column = new QVBoxLayout(this);
    column->setContentsMargins(0, 0, 0, 0);
    column->setSpacing(0);
    for (QHBoxLayout*& row : m_barRows) {
        row = new QHBoxLayout;
        row->setSpacing(2);
        row->setContentsMargins(2, 1, 2, 1);
        column->addLayout(row);
    }

    QStyle* st = style();
    auto bar = [&](const char* name, const QString& caption, Qt::ToolButtonStyle buttons) {
        auto* b = new QToolBar(caption, this);
        b->setObjectName(QLatin1String(name));
        b->setToolButtonStyle(buttons);
        b->setMovable(false);
        b->setContextMenuPolicy(Qt::PreventContextMenu); // not customisable
        m_bars.append(b);
        return b;
    };
    auto action = [&](QToolBar* b, const char* name, const QString& caption, QStyle::StandardPixmap icon) {
        auto* a = new QAction(st->standardIcon(icon), caption, this);
        a->setObjectName(QLatin1String(name));
        a->setToolTip(caption);
        b->addAction(a);
        return a;
    };
    QToolBar* end = bar("Beenden", QStringLiteral("Beenden"), Qt::ToolButtonTextBesideIcon);
    connect(action(end, "rv_Close", QStringLiteral("Beenden"), QStyle::SP_DialogCloseButton), &QAction::triggered, this,
            &QWidget::close);
    QToolBar* out = bar("Ausgabe", QStringLiteral("Ausgabe"), Qt::ToolButtonTextBesideIcon);
    m_print = action(out, "rv_Print", QStringLiteral("Drucken"), QStyle::SP_DialogSaveButton);
    connect(m_print, &QAction::triggered, this, &TRavePreviewF::rv_PrintExecute);
    m_pdf = action(out, "rv_PDF", QStringLiteral("PDF"), QStyle::SP_FileIcon);
    m_pdf->setToolTip(QStringLiteral("Ausgeben als PDF"));
    connect(m_pdf, &QAction::triggered, this, &TRavePreviewF::rv_PDFExecute);

    QToolBar* pages = bar("Seiten", QStringLiteral("Seiten"), Qt::ToolButtonIconOnly);
    m_first = action(pages, "rv_FirstPage", QStringLiteral("Erste Seite"), QStyle::SP_MediaSkipBackward);
    connect(m_first, &QAction::triggered, this, [this] { showPage(1); });
    m_prior = action(pages, "rv_PriorPage", QStringLiteral("Vorherige Seite"), QStyle::SP_MediaSeekBackward);
    connect(m_prior, &QAction::triggered, this, [this] {
        if (m_page > 1)
            showPage(m_page - 1);
    });
    auto* goLabel = new QLabel(QStringLiteral("Gehen zu Seite: "), this);
    pages->addWidget(goLabel);
    m_pageEdit = new QLineEdit(this);
    m_pageEdit->setObjectName(QStringLiteral("dxPage"));
    m_pageEdit->setFixedWidth(50);
    m_pageEdit->setValidator(new QRegularExpressionValidator(QRegularExpression(QStringLiteral("[0-9]{0,6}")), m_pageEdit));
    m_pageEdit->installEventFilter(this);
    connect(m_pageEdit, &QLineEdit::editingFinished, this, &TRavePreviewF::pageEditDone);
    pages->addWidget(m_pageEdit);
    m_next = action(pages, "rv_NextPage", QStringLiteral("Nächste Seite"), QStyle::SP_MediaSeekForward);
    connect(m_next, &QAction::triggered, this, [this] {
        if (m_page < pageCount())
            showPage(m_page + 1);
    });
    m_last = action(pages, "rv_LastPage", QStringLiteral("Letzte Seite"), QStyle::SP_MediaSkipForward);
    connect(m_last, &QAction::triggered, this, [this] { showPage(pageCount()); });

    QToolBar* zoom = bar("Zoom", QStringLiteral("Zoom"), Qt::ToolButtonIconOnly);
    auto* zoomOut = action(zoom, "rv_ZoomOut", QStringLiteral("Verkleinern"), QStyle::SP_ArrowDown);
    connect(zoomOut, &QAction::triggered, this, [this] {
        if (m_zoom > kZoomStep)
            setZoom(m_zoom - kZoomStep);
    });
    connect(action(zoom, "rv_ZoomIn", QStringLiteral("Vergrößern"), QStyle::SP_ArrowUp), &QAction::triggered, this,
            [this] { setZoom(m_zoom + kZoomStep); });
    connect(action(zoom, "rv_Zoom100", QStringLiteral("100%"), QStyle::SP_TitleBarNormalButton), &QAction::triggered,
            this, [this] { setZoom(100); });
    connect(action(zoom, "rv_ZoomPageSize", QStringLiteral("Ganze Seite"), QStyle::SP_TitleBarMaxButton),
            &QAction::triggered, this, [this] { setZoom(fitPageZoom()); });
    m_zoomText = new QLabel(QStringLiteral("Seitengröße:"), this);
    m_zoomText->setObjectName(QStringLiteral("dxBS1"));
    zoom->addWidget(m_zoomText);
    wrapBars();

    m_scroll = new QScrollArea(this);
    m_scroll->setObjectName(QStringLiteral("ScrollBox1"));
    m_scroll->setAlignment(Qt::AlignHCenter | Qt::AlignTop);
    m_scroll->viewport()->installEventFilter(this);
    m_pageView = new PageView(this);
    m_scroll->setWidget(m_pageView);
    column->addWidget(m_scroll, 1);

    m_status = new QStatusBar(this);
    m_status->setObjectName(QStringLiteral("dxSB1"));
    m_status->setSizeGripEnabled(false);
    for (int i = 0; i < 3; ++i) {
        m_panels[i] = new QLabel(this);
        m_panels[i]->setObjectName(QStringLiteral("dxSB1Panel%1").arg(i));
        m_panels[i]->setMinimumWidth(160);
        m_status->addWidget(m_panels[i], i == 0 ? 1 : 0);
    }
    column->addWidget(m_status);

    updatePrintAction();
    // Saving as PDF needs no printer; it is offered on purpose.
    m_pdf->setEnabled(true);

    m_layoutTimer = new QTimer(this);
    m_layoutTimer->setInterval(0);
    connect(m_layoutTimer, &QTimer::timeout, this, &TRavePreviewF::layoutStep);
    // The first page before the window shows; the rest while it is open.
    layoutStep();
    if (!m_layout.finished() && !m_failed)
        m_layoutTimer->start();
    view(m_pageView)->resizeToPage();
    updateStatus();
}

TRavePreviewF::~TRavePreviewF()
{
    // Closing the window moves the focus out of the page edit, whose "editingFinished" would
    // otherwise reach this window while QWidget's destructor runs.
    m_pageEdit->disconnect(this);
    delete m_printDialog;
}

void TRavePreviewF::showModal(ReportLayout& layout, const QString& title)
{
    TRavePreviewF preview(layout, title);
    preview.setWindowModality(Qt::ApplicationModal);
    QEventLoop loop;
    connect(&preview, &TRavePreviewF::closed, &loop, &QEventLoop::quit);
    preview.show();
    loop.exec();
}

void TRavePreviewF::setPdfPathChooser(PdfPathChooser chooser)
{
    pdfChooser() = std::move(chooser);
}

int TRavePreviewF::pageCount() const
{
    return std::max(1, m_layout.completePages());
}

void TRavePreviewF::failed(const QString& message)
{
    m_failed = true;
    m_layoutTimer->stop();
    reportError(QStringLiteral("Der Bericht konnte nicht vollständig aufbereitet werden.\r\n") + message);
}

void TRavePreviewF::layoutStep()
{
    const int before = m_layout.completePages();
    try {
        m_layout.layoutMore(1);
    } catch (const std::exception& e) {
        failed(QString::fromUtf8(e.what()));
    }
    if (m_layout.finished() || m_failed)
        m_layoutTimer->stop();
    if (m_layout.completePages() != before || m_layout.finished()) {
        updateStatus();
        // "von m" on the page shown changes while later pages arrive.
        m_pageView->update();
    }
}

void TRavePreviewF::layoutAll()
{
    while (!m_layout.finished() && !m_failed)
        layoutStep();
}

void TRavePreviewF::updatePrintAction()
{
    m_print->setEnabled(printTarget().available && printTarget().available());
}

void TRavePreviewF::showPage(int page)
{
    m_page = std::clamp(page, 1, pageCount());
    m_pageView->update();
    m_scroll->verticalScrollBar()->setValue(0);
    updateStatus();
}

void TRavePreviewF::setZoom(double percent)
{
    m_zoom = std::clamp(percent, 1.0, 1000.0);
    view(m_pageView)->resizeToPage();
    updateStatus();
}

double TRavePreviewF::fitWidthZoom() const
{
    const double at100 = view(m_pageView)->pageSize(100).width() * (1 + 2 * kMargin) + kShadow;
    return std::max(1.0, (m_scroll->viewport()->width() - 1) / at100 * 100);
}

double TRavePreviewF::fitPageZoom() const
{
    const QSizeF at100 = view(m_pageView)->pageSize(100);
    const double margin = at100.width() * kMargin * 2;
    const double byWidth = (m_scroll->viewport()->width() - 1) / (at100.width() + margin + kShadow);
    const double byHeight = (m_scroll->viewport()->height() - 1) / (at100.height() + margin + kShadow);
    return std::max(1.0, std::min(byWidth, byHeight) * 100);
}

void TRavePreviewF::updateStatus()
{
    if (m_page > pageCount())
        m_page = pageCount();
    m_pageEdit->setText(QString::number(m_page));
    m_panels[0]->setText(m_layout.finished() || m_failed ? QString() : QStringLiteral("die Vorschau wird vorbereitet..."));
    m_panels[1]->setText(QStringLiteral("Seite %1 von %2").arg(m_page).arg(pageCount()));
    const QString zoom = QStringLiteral("Seitengröße: %1%").arg(QLocale().toString(m_zoom, 'f', 1), 4);
    m_zoomText->setText(zoom);
    m_panels[2]->setText(zoom);
    rv_LastPageUpdate();
}

void TRavePreviewF::rv_LastPageUpdate()
{
    const int count = pageCount();
    m_first->setEnabled(m_page >= 2);
    m_prior->setEnabled(m_page >= 2);
    m_next->setEnabled(count > m_page);
    m_last->setEnabled(count > m_page);
}

void TRavePreviewF::pageEditDone()
{
    bool ok = false;
    const int page = m_pageEdit->text().toInt(&ok);
    if (ok)
        showPage(page);
    else
        m_pageEdit->setText(QString::number(m_page));
}

void TRavePreviewF::rv_PrintExecute()
{
    if (m_printDialog && !m_printDialog->isVisible())
        delete m_printDialog; // closed, its deletion still pending
    if (m_printDialog) {
        m_printDialog->show();
        m_printDialog->raise();
        m_printDialog->activateWindow();
        return;
    }
    layoutAll();
    m_printDialog = new TPrintF(this);
    m_printDialog->setAttribute(Qt::WA_DeleteOnClose);
    if (windowModality() != Qt::NonModal)
        m_printDialog->setWindowModality(Qt::ApplicationModal);
    m_printDialog->show();
}

void TRavePreviewF::rv_PDFExecute()
{
    const ReportDefinition& definition = m_layout.definition();
    const QString suggested = definition.name + QStringLiteral(".pdf");
    const QString path = pdfChooser() ? pdfChooser()(this, suggested)
                                      : QFileDialog::getSaveFileName(this, QStringLiteral("Ausgeben als PDF"), suggested,
                                                                     QStringLiteral("PDF-Dateien (*.pdf)"));
    if (path.isEmpty())
        return;
    layoutAll();
    try {
        ReportRenderer::writePdf(path, m_layout);
    } catch (const AppException& e) {
        reportError(QStringLiteral("Der Bericht konnte nicht als PDF gespeichert werden."), &e);
    }
}

void TRavePreviewF::wrapBars()
{
    // The bars fill the first row as far as they fit and go on in the second, so that no button
    // hides behind a bar's "»".
    for (QHBoxLayout* row : m_barRows)
        while (QLayoutItem* item = row->takeAt(0))
            delete item;
    int used = 0;
    for (QToolBar* b : std::as_const(m_bars)) {
        const int needed = b->sizeHint().width() + 2;
        QHBoxLayout* row = used > 0 && used + needed > width() - 4 ? m_barRows[1] : m_barRows[0];
        if (row == m_barRows[1])
            used = width(); // the rest goes on in the second row
        else
            used += needed;
        row->addWidget(b);
    }
    for (QHBoxLayout* row : m_barRows)
        row->addStretch(1);
}

void TRavePreviewF::resizeEvent(QResizeEvent* event)
{
    QWidget::resizeEvent(event);
    wrapBars();
    if (isVisible())
        setZoom(fitWidthZoom());
}

void TRavePreviewF::wheelEvent(QWheelEvent* event)
{
    const int delta = event->angleDelta().y();
    if (delta != 0) {
        const int step = event->modifiers().testFlag(Qt::ShiftModifier) ? 1
            : event->modifiers().testFlag(Qt::ControlModifier)          ? 15
                                                                        : 4;
        QScrollBar* bar = m_scroll->verticalScrollBar();
        bar->setValue(bar->value() - (delta > 0 ? 1 : -1) * step * bar->singleStep());
    }
    event->accept();
}

bool TRavePreviewF::eventFilter(QObject* watched, QEvent* event)
{
    if (m_scroll && watched == m_scroll->viewport() && event->type() == QEvent::Wheel) {
        wheelEvent(static_cast<QWheelEvent*>(event));
        return true;
    }
    if (watched == m_pageEdit && event->type() == QEvent::KeyPress) {
        const auto* key = static_cast<QKeyEvent*>(event);
        if (key->key() == Qt::Key_Return || key->key() == Qt::Key_Enter) {
            pageEditDone();
            return true;
        }
    }
    return QWidget::eventFilter(watched, event);
}

void TRavePreviewF::closeEvent(QCloseEvent* event)
{
    if (m_printDialog)
        m_printDialog->close();
    m_layoutTimer->stop();
    QWidget::closeEvent(event);
    Q_EMIT closed();
}

} // namespace orvanta
