#include "calllog/TLogPrintSelection.h"

#include "calllog/LogReport.h"
#include "db/TDM2.h"
#include "platform/Clock.h"
#include "platform/ErrorLog.h"
#include "ui/report/TitleBand.h"
#include "ui/scheme/ColorScheme.h"

#include <QComboBox>
#include <QDateEdit>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QPushButton>
#include <QRadioButton>
#include <QStyle>
#include <QToolButton>
#include <QVBoxLayout>

namespace orvanta {

namespace {

QDate today()
{
    return Clock::now().date();
}

} // namespace

TLogPrintSelection::TLogPrintSelection(TDM2* dm, QWidget* parent)
    : QDialog(parent, Qt::Dialog | Qt::FramelessWindowHint | Qt::WindowStaysOnTopHint)
    , m_dm(dm)
{
    setObjectName(QStringLiteral("TLogPrintSelection"));
    setWindowTitle(QStringLiteral("Protokollausgabe"));
    setFixedSize(459, 301);
    const PrintWindowColors& colors = printWindowColors(appColorScheme());
    setAutoFillBackground(true);
    QPalette palette = this->palette();
    palette.setColor(QPalette::Window, colors.window);
    setPalette(palette);
    const QString accent = colors.accent.name();
    auto framed = [&](QFrame* f, const char* name) {
        f->setObjectName(QLatin1String(name));
        f->setStyleSheet(QStringLiteral("QFrame#%1 { border: 1px solid %2; }").arg(QLatin1String(name), accent));
        return f;
    };

    auto* column = new QVBoxLayout(this);
    column->setContentsMargins(1, 1, 1, 8);
    auto* band = new TitleBand(QStringLiteral("Protokollausgabe"), this);
    band->setObjectName(QStringLiteral("Sh1"));
    band->setGradient(colors.gradientFrom, colors.gradientTo);
    // The close button closes through the window's own rule, not an action.
    connect(band->closeButton(), &QToolButton::clicked, this, &QWidget::close);
    column->addWidget(band);

    auto* l1 = new QLabel(QStringLiteral("Druckoptionen:"), this);
    l1->setObjectName(QStringLiteral("l1"));
    QFont bold = l1->font();
    bold.setBold(true);
    l1->setFont(bold);
    auto* top = new QHBoxLayout;
    top->setContentsMargins(12, 4, 12, 0);
    top->addWidget(l1);
    column->addLayout(top);
    auto* s1 = framed(new QFrame(this), "s1");
    s1->setFixedHeight(1);
    column->addWidget(s1);

    auto radio = [&](int i, const QString& caption, QWidget* parent, int tag = -1) {
        auto* r = new QRadioButton(caption, parent);
        r->setObjectName(QStringLiteral("rb%1").arg(i));
        if (tag >= 0) {
            r->setProperty("tag", tag);
            connect(r, &QRadioButton::clicked, this, [this, r] { rb1Click(r); });
        }
        m_rb[i] = r;
        return r;
    };
    auto dateEdit = [&](const char* name) {
        auto* edit = new QDateEdit(today(), this);
        edit->setObjectName(QLatin1String(name));
        edit->setDisplayFormat(QStringLiteral("dd.MM.yyyy"));
        edit->setCalendarPopup(true);
        auto* todayButton = new QToolButton(this);
        todayButton->setObjectName(QLatin1String(name) + QStringLiteral("Today"));
        todayButton->setToolTip(QStringLiteral("Heute"));
        todayButton->setIcon(style()->standardIcon(QStyle::SP_BrowserReload));
        connect(todayButton, &QToolButton::clicked, edit, [edit] { edit->setDate(today()); });
        auto* row = new QHBoxLayout;
        row->setSpacing(1);
        row->addWidget(edit);
        row->addWidget(todayButton);
        return std::pair{edit, row};
    };

    auto* grid = new QGridLayout;
    grid->setContentsMargins(12, 4, 12, 4);
    grid->setHorizontalSpacing(6);
    column->addLayout(grid);
    grid->addWidget(radio(1, QStringLiteral("Alles"), this, 2), 0, 0);
    grid->addWidget(radio(2, QStringLiteral("Tag:"), this, 0), 1, 0);
    auto [de1, de1Row] = dateEdit("DE1");
    m_de1 = de1;
    grid->addLayout(de1Row, 1, 1);
    grid->addWidget(radio(3, QStringLiteral("Zeitraum:"), this, 1), 2, 0);
    auto [de2, de2Row] = dateEdit("DE2");
    m_de2 = de2;
    grid->addLayout(de2Row, 2, 1);
    m_l2 = new QLabel(QStringLiteral("bis"), this);
    m_l2->setObjectName(QStringLiteral("l2"));
    grid->addWidget(m_l2, 2, 2);
    auto [de3, de3Row] = dateEdit("DE3");
    m_de3 = de3;
    grid->addLayout(de3Row, 2, 3);
    m_cb1 = new QComboBox(this);
    m_cb1->setObjectName(QStringLiteral("CB1"));
    m_cb1->addItems({QStringLiteral("Aktuelle Woche"), QStringLiteral("Letzte Woche"), QStringLiteral("Aktueller Monat"),
                     QStringLiteral("Letzter Monat"), QStringLiteral("Individuell")});
    m_cb1->setCurrentIndex(4);
    grid->addWidget(m_cb1, 3, 1, 1, 3);
    grid->setColumnStretch(4, 1);

    auto* panels = new QHBoxLayout;
    panels->setContentsMargins(12, 0, 12, 0);
    column->addLayout(panels);
    auto* p1 = framed(new QFrame(this), "p1");
    auto* p1Layout = new QVBoxLayout(p1);
    p1Layout->addWidget(radio(4, QStringLiteral("einfach"), p1));
    p1Layout->addWidget(radio(5, QStringLiteral("detailliert"), p1));
    p1Layout->addStretch(1);
    panels->addWidget(p1);
    auto* p2 = framed(new QFrame(this), "p2");
    auto* p2Layout = new QGridLayout(p2);
    auto* l3 = new QLabel(QStringLiteral("Gruppieren nach:"), p2);
    l3->setObjectName(QStringLiteral("l3"));
    p2Layout->addWidget(l3, 0, 0, 1, 3);
    p2Layout->addWidget(radio(6, QStringLiteral("ohne"), p2), 1, 0);
    p2Layout->addWidget(radio(7, QStringLiteral("Datum"), p2), 1, 1);
    p2Layout->addWidget(radio(8, QStringLiteral("Verbindung"), p2), 1, 2);
    p2Layout->addWidget(radio(9, QStringLiteral("Anrufer"), p2), 2, 0);
    p2Layout->addWidget(radio(10, QStringLiteral("An"), p2), 2, 1);
    panels->addWidget(p2, 1);

    auto* s2 = framed(new QFrame(this), "s2");
    s2->setFixedHeight(1);
    column->addStretch(1);
    column->addWidget(s2);
    auto* buttons = new QHBoxLayout;
    buttons->setContentsMargins(12, 0, 12, 0);
    auto* s3 = framed(new QFrame(this), "s3");
    s3->setFixedSize(8, 8);
    buttons->addWidget(s3);
    buttons->addStretch(1);
    auto* print = new QPushButton(QStringLiteral("Ausgeben"), this);
    print->setObjectName(QStringLiteral("AdvTB1"));
    print->setDefault(true);
    auto* cancel = new QPushButton(QStringLiteral("Abbrechen"), this);
    cancel->setObjectName(QStringLiteral("AdvTB2"));
    buttons->addWidget(print);
    buttons->addWidget(cancel);
    column->addLayout(buttons);
    connect(print, &QPushButton::clicked, this, &TLogPrintSelection::AdvTB1Click);
    connect(cancel, &QPushButton::clicked, this, &QWidget::close);

    connect(m_cb1, &QComboBox::currentIndexChanged, this, &TLogPrintSelection::CB1Change);
    // A date typed by hand makes the period an individual one.
    for (QDateEdit* edit : {m_de2, m_de3})
        connect(edit, &QDateEdit::dateChanged, this, [this] {
            if (!m_settingPreset)
                m_cb1->setCurrentIndex(4);
        });

    m_rb[1]->setChecked(true);
    rb1Click(m_rb[1]);
    m_rb[4]->setChecked(true);
    m_rb[6]->setChecked(true);
}

TLogPrintSelection::~TLogPrintSelection() = default;

std::pair<QDate, QDate> TLogPrintSelection::presetPeriod(int preset, QDate day)
{
    const QDate monday = day.addDays(1 - day.dayOfWeek());
    const QDate first(day.year(), day.month(), 1);
    switch (preset) {
    case 0:
        return {monday, monday.addDays(6)};
    case 1:
        return {monday.addDays(-7), monday.addDays(-1)};
    case 2:
        return {first, first.addMonths(1).addDays(-1)};
    case 3:
        return {first.addMonths(-1), first.addDays(-1)};
    default:
        return {};
    }
}

void TLogPrintSelection::CB1Change(int index)
{
    const auto [from, to] = presetPeriod(index, today());
    if (!from.isValid())
        return;
    m_settingPreset = true;
    m_de2->setDate(from);
    m_de3->setDate(to);
    m_settingPreset = false;
}

void TLogPrintSelection::rb1Click(QRadioButton* sender)
{
    const int tag = sender->property("tag").toInt();
    const bool day = tag == 0;
    const bool period = tag == 1;
    auto enable = [this](QWidget* w, bool on) {
        w->setEnabled(on);
        if (auto* today = findChild<QToolButton*>(w->objectName() + QStringLiteral("Today")))
            today->setEnabled(on);
    };
    enable(m_de1, day);
    for (QWidget* w : {static_cast<QWidget*>(m_de2), static_cast<QWidget*>(m_de3), static_cast<QWidget*>(m_l2),
                       static_cast<QWidget*>(m_cb1)})
        enable(w, period);
}

bool TLogPrintSelection::PrintPrepare()
{
    m_start = QDate();
    m_end = QDate();
    int grouping = 0;
    for (int i = 6; i <= 10; ++i)
        if (m_rb[i]->isChecked())
            grouping = i - 6;
    m_variant = 2 * grouping + (m_rb[5]->isChecked() ? 1 : 0);
    if (m_rb[1]->isChecked())
        return true;
    if (m_rb[2]->isChecked()) {
        m_start = m_de1->date();
    } else if (m_rb[3]->isChecked()) {
        // A period entered backwards means the same days.
        m_start = std::min(m_de2->date(), m_de3->date());
        m_end = std::max(m_de2->date(), m_de3->date());
    }
    return true;
}

void TLogPrintSelection::AdvTB1Click()
{
    if (PrintPrepare()) {
        ReportOutcome outcome;
        FbStatement* statement = m_dm ? &m_dm->rave_ibsql : nullptr;
        // The selection stays on top; the preview must not open behind it.
        hide();
        if (!LogPrint(statement, m_variant, outcome, m_end, m_start))
            reportError(reportFailureEntry(QStringLiteral("LogPrint"), outcome));
    }
    close();
}

} // namespace orvanta
