#include "ui/report/TPrintF.h"

#include "platform/AppException.h"
#include "platform/ErrorLog.h"
#include "ui/report/ReportLayout.h"
#include "ui/report/ReportRenderer.h"
#include "ui/report/TRavePreviewF.h"
#include "ui/report/TitleBand.h"
#include "ui/scheme/ColorScheme.h"

#include <QGridLayout>
#include <QLabel>
#include <QLineEdit>
#include <QPrinter>
#include <QPrinterInfo>
#include <QPushButton>
#include <QRadioButton>
#include <QRegularExpressionValidator>
#include <QToolButton>
#include <QVBoxLayout>

namespace orvanta {

namespace {

PrintTarget systemPrinters()
{
    return PrintTarget{[] { return !QPrinterInfo::availablePrinterNames().isEmpty(); },
                       []() -> std::unique_ptr<QPagedPaintDevice> {
                           // The default printer, else the first there is; none when every
                           // printer has gone since the preview opened.
                           QPrinterInfo info = QPrinterInfo::defaultPrinter();
                           if (info.isNull()) {
                               const QStringList names = QPrinterInfo::availablePrinterNames();
                               if (names.isEmpty())
                                   return nullptr;
                               info = QPrinterInfo::printerInfo(names.first());
                           }
                           auto printer = std::make_unique<QPrinter>(info, QPrinter::HighResolution);
                           if (!printer->isValid())
                               return nullptr;
                           return printer;
                       }};
}

PrintTarget& target()
{
    static PrintTarget t = systemPrinters();
    return t;
}

} // namespace

const PrintTarget& printTarget()
{
    return target();
}

void setPrintTarget(PrintTarget t)
{
    target() = t.open ? std::move(t) : systemPrinters();
}

TPrintF::TPrintF(TRavePreviewF* preview)
    : QDialog(preview, Qt::Dialog | Qt::FramelessWindowHint)
    , m_preview(preview)
{
    setObjectName(QStringLiteral("TPrintF"));
    setWindowTitle(QStringLiteral("Druckdialog"));
    setFixedSize(280, 245);
    const PrintWindowColors& colors = printWindowColors(appColorScheme());
    setAutoFillBackground(true);
    QPalette p = palette();
    p.setColor(QPalette::Window, colors.window);
    setPalette(p);

    auto* column = new QVBoxLayout(this);
    column->setContentsMargins(1, 1, 1, 8);
    auto* band = new TitleBand(QStringLiteral("Druckdialog"), this);
    band->setObjectName(QStringLiteral("S2"));
    band->setGradient(colors.gradientFrom, colors.gradientTo);
    connect(band->closeButton(), &QToolButton::clicked, this, &QWidget::close);
    column->addWidget(band);

    auto* grid = new QGridLayout;
    grid->setContentsMargins(16, 8, 16, 0);
    column->addLayout(grid);
    auto radio = [&](const char* name, const QString& caption) {
        auto* r = new QRadioButton(caption, this);
        r->setObjectName(QLatin1String(name));
        connect(r, &QRadioButton::toggled, this, &TPrintF::cxRB1Click);
        return r;
    };
    auto edit = [&](const char* name) {
        auto* e = new QLineEdit(QStringLiteral("1"), this);
        e->setObjectName(QLatin1String(name));
        e->setMaxLength(4);
        e->setFixedWidth(50);
        e->setValidator(new QRegularExpressionValidator(QRegularExpression(QStringLiteral("[0-9]*")), e));
        return e;
    };
    m_all = radio("cxRB1", QStringLiteral("Alles"));
    m_current = radio("cxRB2", QStringLiteral("Aktuelle Seite"));
    m_range = radio("cxRB3", QStringLiteral("Seiten von:"));
    m_from = edit("cxTE1");
    m_to = edit("cxTE2");
    m_copies = edit("cxTE3");
    auto* toLabel = new QLabel(QStringLiteral("bis:"), this);
    toLabel->setObjectName(QStringLiteral("Label1"));
    auto* copiesLabel = new QLabel(QStringLiteral("Kopien:"), this);
    copiesLabel->setObjectName(QStringLiteral("Label2"));
    grid->addWidget(m_all, 0, 0, 1, 4);
    grid->addWidget(m_current, 1, 0, 1, 4);
    grid->addWidget(m_range, 2, 0);
    grid->addWidget(m_from, 2, 1);
    grid->addWidget(toLabel, 2, 2);
    grid->addWidget(m_to, 2, 3);
    grid->addWidget(copiesLabel, 3, 0);
    grid->addWidget(m_copies, 3, 1);
    grid->setRowMinimumHeight(3, 34);

    auto* buttons = new QHBoxLayout;
    buttons->setContentsMargins(16, 0, 16, 0);
    auto* print = new QPushButton(QStringLiteral("Drucken"), this);
    print->setObjectName(QStringLiteral("AdvTB1"));
    print->setDefault(true);
    auto* cancel = new QPushButton(QStringLiteral("Abbrechen"), this);
    cancel->setObjectName(QStringLiteral("AdvTB2"));
    buttons->addStretch(1);
    buttons->addWidget(print);
    buttons->addWidget(cancel);
    column->addStretch(1);
    column->addLayout(buttons);
    connect(print, &QPushButton::clicked, this, &TPrintF::AdvTB1Click);
    connect(cancel, &QPushButton::clicked, this, &QWidget::close);

    m_all->setChecked(true);
    cxRB1Click();
}

TPrintF::~TPrintF() = default;

void TPrintF::cxRB1Click()
{
    const bool range = m_range->isChecked();
    m_from->setEnabled(range);
    m_to->setEnabled(range);
}

std::pair<int, int> TPrintF::pageRange()
{
    if (m_from->text().isEmpty())
        m_from->setText(QStringLiteral("1"));
    if (m_to->text().isEmpty())
        m_to->setText(m_from->text());
    if (m_copies->text().isEmpty())
        m_copies->setText(QStringLiteral("1"));
    const int count = m_preview->pageCount();
    if (m_current->isChecked())
        return {m_preview->currentPage(), m_preview->currentPage()};
    if (!m_range->isChecked())
        return {1, count};
    int from = m_from->text().toInt();
    int to = m_to->text().toInt();
    if (to < from)
        std::swap(from, to);
    return {std::max(from, 1), std::min(to, count)};
}

void TPrintF::AdvTB1Click()
{
    const auto [from, to] = pageRange();
    const int copies = m_copies->text().toInt();
    if (copies > 0 && from <= to) {
        try {
            m_preview->layoutAll();
            std::unique_ptr<QPagedPaintDevice> device = printTarget().open();
            ReportRenderer::print(device.get(), m_preview->layout(), from, to, copies);
        } catch (const std::exception& e) {
            reportError(QStringLiteral("Der Bericht konnte nicht gedruckt werden."), &e);
            m_preview->updatePrintAction();
        }
    }
    close();
}

} // namespace orvanta
