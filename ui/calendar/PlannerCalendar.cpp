#include "ui/calendar/PlannerCalendar.h"

#include <QHBoxLayout>
#include <QHelpEvent>
#include <QKeyEvent>
#include <QLabel>
#include <QLocale>
#include <QPainter>
#include <QPushButton>
#include <QToolButton>
#include <QToolTip>
#include <QVBoxLayout>

namespace orvanta {

namespace {

constexpr int kRows = 6;
constexpr int kColumns = 7;
constexpr int kWeekdayRowHeight = 18;

const QLocale& germanLocale()
{
    static const QLocale locale(QLocale::German, QLocale::Germany);
    return locale;
}

} // namespace

PlannerCalendar::PlannerCalendar(QWidget* parent)
    : QWidget(parent)
    , m_date(QDate::currentDate())
    , m_month(m_date.year(), m_date.month(), 1)
    , m_gradientStart(0xE1, 0xE2, 0xEC)
    , m_gradientEnd(0x98, 0x96, 0xB3)
    , m_selection(0x98, 0x96, 0xB3)
{
    setFocusPolicy(Qt::StrongFocus);
    setMouseTracking(true);
    setAttribute(Qt::WA_OpaquePaintEvent, false);

    m_prev = new QToolButton(this);
    m_prev->setObjectName(QStringLiteral("PC1_prevMonth"));
    m_prev->setArrowType(Qt::LeftArrow);
    m_prev->setAutoRaise(true);
    m_prev->setToolTip(QStringLiteral("vorheriger Monat"));
    m_next = new QToolButton(this);
    m_next->setObjectName(QStringLiteral("PC1_nextMonth"));
    m_next->setArrowType(Qt::RightArrow);
    m_next->setAutoRaise(true);
    m_next->setToolTip(QStringLiteral("nächster Monat"));
    m_title = new QLabel(this);
    m_title->setObjectName(QStringLiteral("PC1_title"));
    m_title->setAlignment(Qt::AlignCenter);
    QFont bold = m_title->font();
    bold.setBold(true);
    m_title->setFont(bold);
    m_today = new QPushButton(QStringLiteral("Heute"), this);
    m_today->setObjectName(QStringLiteral("PC1_today"));
    m_today->setToolTip(QStringLiteral("Heute"));
    m_today->setFlat(true);

    auto* header = new QHBoxLayout;
    header->setContentsMargins(2, 2, 2, 2);
    header->addWidget(m_prev);
    header->addWidget(m_title, 1);
    header->addWidget(m_next);
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addLayout(header);
    layout->addStretch(1); // the day grid is painted into this space
    layout->addWidget(m_today, 0, Qt::AlignHCenter);

    connect(m_prev, &QToolButton::clicked, this, [this] { showMonth(m_month.addMonths(-1)); });
    connect(m_next, &QToolButton::clicked, this, [this] { showMonth(m_month.addMonths(1)); });
    connect(m_today, &QPushButton::clicked, this, [this] { pick(QDate::currentDate()); });
    updateTitle();
}

void PlannerCalendar::setDate(QDate day)
{
    if (!day.isValid())
        return;
    m_date = day;
    showMonth(day);
    update();
}

void PlannerCalendar::showMonth(QDate anyDayOfMonth)
{
    if (!anyDayOfMonth.isValid())
        return;
    m_month = QDate(anyDayOfMonth.year(), anyDayOfMonth.month(), 1);
    updateTitle();
    update();
}

void PlannerCalendar::clearEvents()
{
    m_events.clear();
    update();
}

void PlannerCalendar::addEvent(QDate day, const QString& hint)
{
    if (!day.isValid())
        return;
    m_events.insert(day, hint);
    update();
}

QDate PlannerCalendar::latestEventDay(QDate from) const
{
    if (m_events.isEmpty())
        return {};
    const QDate last = m_events.lastKey();
    return (!from.isValid() || last >= from) ? last : QDate();
}

void PlannerCalendar::beginUpdate()
{
    if (m_frozen++ == 0)
        setUpdatesEnabled(false);
}

void PlannerCalendar::endUpdate()
{
    if (m_frozen > 0 && --m_frozen == 0) {
        setUpdatesEnabled(true);
        update();
    }
}

void PlannerCalendar::setColors(QColor gradientStart, QColor gradientEnd, QColor selection)
{
    m_gradientStart = gradientStart;
    m_gradientEnd = gradientEnd;
    m_selection = selection;
    update();
}

QSize PlannerCalendar::sizeHint() const
{
    return {200, 190};
}

QSize PlannerCalendar::minimumSizeHint() const
{
    return {170, 170};
}

void PlannerCalendar::updateTitle()
{
    m_title->setText(germanLocale().standaloneMonthName(m_month.month()) + QLatin1Char(' ')
                     + QString::number(m_month.year()));
}

QRect PlannerCalendar::gridRect() const
{
    const int top = m_prev->geometry().bottom() + 3;
    const int bottom = m_today->geometry().top() - 2;
    return QRect(2, top, width() - 4, std::max(0, bottom - top));
}

QDate PlannerCalendar::firstCellDate() const
{
    // Weeks start on Monday; a month that starts on Monday still shows the previous week first,
    // so the grid always has days before and after the month.
    const int offset = m_month.dayOfWeek() - 1;
    return m_month.addDays(-(offset == 0 ? 7 : offset));
}

QRect PlannerCalendar::dayRect(QDate day) const
{
    const QDate first = firstCellDate();
    const qint64 index = first.daysTo(day);
    if (index < 0 || index >= kRows * kColumns)
        return {};
    const QRect grid = gridRect().adjusted(0, kWeekdayRowHeight, 0, 0);
    const int cellW = grid.width() / kColumns;
    const int cellH = grid.height() / kRows;
    const int row = static_cast<int>(index / kColumns);
    const int col = static_cast<int>(index % kColumns);
    return QRect(grid.left() + col * cellW, grid.top() + row * cellH, cellW, cellH);
}

QDate PlannerCalendar::dateAt(QPoint pos) const
{
    const QRect grid = gridRect().adjusted(0, kWeekdayRowHeight, 0, 0);
    const int cellW = grid.width() / kColumns;
    const int cellH = grid.height() / kRows;
    if (cellW <= 0 || cellH <= 0 || !grid.contains(pos))
        return {};
    const int col = (pos.x() - grid.left()) / cellW;
    const int row = (pos.y() - grid.top()) / cellH;
    if (col >= kColumns || row >= kRows)
        return {};
    return firstCellDate().addDays(row * kColumns + col);
}

bool PlannerCalendar::event(QEvent* e)
{
    if (e->type() == QEvent::ToolTip) {
        auto* help = static_cast<QHelpEvent*>(e);
        const QDate day = dateAt(help->pos());
        const QString hint = day.isValid() ? m_events.value(day) : QString();
        if (hint.isEmpty())
            QToolTip::hideText();
        else
            QToolTip::showText(help->globalPos(), hint, this, dayRect(day));
        return true;
    }
    return QWidget::event(e);
}

void PlannerCalendar::paintEvent(QPaintEvent*)
{
    QPainter p(this);
    p.setRenderHint(QPainter::Antialiasing, false);
    QLinearGradient header(0, 0, 0, m_prev->geometry().bottom() + 2);
    header.setColorAt(0, m_gradientStart);
    header.setColorAt(1, m_gradientEnd);
    p.fillRect(QRect(0, 0, width(), m_prev->geometry().bottom() + 2), header);
    p.fillRect(QRect(0, m_prev->geometry().bottom() + 2, width(), height()), palette().base());

    const QRect grid = gridRect();
    const int cellW = grid.width() / kColumns;
    QFont normal = font();
    QFont bold = normal;
    bold.setBold(true);

    p.setPen(palette().color(QPalette::Text));
    for (int c = 0; c < kColumns; ++c) {
        const QRect r(grid.left() + c * cellW, grid.top(), cellW, kWeekdayRowHeight);
        p.drawText(r, Qt::AlignCenter, germanLocale().dayName(c + 1, QLocale::ShortFormat).left(2));
    }
    p.setPen(m_gradientEnd);
    p.drawLine(grid.left(), grid.top() + kWeekdayRowHeight - 1, grid.left() + cellW * kColumns,
               grid.top() + kWeekdayRowHeight - 1);

    const QDate today = QDate::currentDate();
    QDate day = firstCellDate();
    for (int i = 0; i < kRows * kColumns; ++i, day = day.addDays(1)) {
        const QRect r = dayRect(day).adjusted(1, 1, -1, -1);
        const bool inMonth = day.month() == m_month.month();
        const bool marked = m_events.contains(day);
        if (day == m_date) {
            p.fillRect(r, m_selection);
        } else if (marked) {
            QColor mark = m_gradientStart;
            p.fillRect(r, mark);
        }
        if (day == today) {
            p.setPen(QPen(m_gradientEnd.darker(140), 1));
            p.drawRect(r.adjusted(0, 0, -1, -1));
        }
        p.setFont(marked ? bold : normal);
        QColor text = palette().color(QPalette::Text);
        if (day == m_date)
            text = Qt::white;
        else if (!inMonth)
            text = palette().color(QPalette::Disabled, QPalette::Text);
        p.setPen(text);
        p.drawText(r, Qt::AlignCenter, QString::number(day.day()));
    }
    if (hasFocus()) {
        p.setPen(QPen(palette().color(QPalette::Highlight), 1, Qt::DotLine));
        p.drawRect(dayRect(m_date).adjusted(1, 1, -2, -2));
    }
}

void PlannerCalendar::pick(QDate day)
{
    if (!day.isValid())
        return;
    setDate(day);
    Q_EMIT daySelected(day);
}

void PlannerCalendar::mousePressEvent(QMouseEvent* e)
{
    if (e->button() != Qt::LeftButton)
        return QWidget::mousePressEvent(e);
    pick(dateAt(e->position().toPoint()));
}

void PlannerCalendar::keyPressEvent(QKeyEvent* e)
{
    int step = 0;
    switch (e->key()) {
    case Qt::Key_Left: step = -1; break;
    case Qt::Key_Right: step = 1; break;
    case Qt::Key_Up: step = -7; break;
    case Qt::Key_Down: step = 7; break;
    case Qt::Key_PageUp: pick(m_date.addMonths(-1)); return;
    case Qt::Key_PageDown: pick(m_date.addMonths(1)); return;
    default: return QWidget::keyPressEvent(e);
    }
    pick(m_date.addDays(step));
}

void PlannerCalendar::resizeEvent(QResizeEvent* e)
{
    QWidget::resizeEvent(e);
    update();
}

} // namespace orvanta
