#include "ui/report/TitleBand.h"

#include <QHBoxLayout>
#include <QLabel>
#include <QLinearGradient>
#include <QMouseEvent>
#include <QPainter>
#include <QStyle>
#include <QToolButton>

namespace orvanta {

TitleBand::TitleBand(const QString& caption, QWidget* parent)
    : QFrame(parent)
    , m_caption(new QLabel(caption, this))
    , m_close(new QToolButton(this))
{
    setFixedHeight(26);
    auto* row = new QHBoxLayout(this);
    row->setContentsMargins(8, 0, 2, 0);
    QFont font = m_caption->font();
    font.setBold(true);
    m_caption->setFont(font);
    row->addWidget(m_caption, 1);
    m_close->setObjectName(QStringLiteral("AdvToolButton1"));
    m_close->setToolTip(QStringLiteral("Fenster schließen"));
    m_close->setAutoRaise(true);
    m_close->setIcon(style()->standardIcon(QStyle::SP_TitleBarCloseButton));
    row->addWidget(m_close);
}

void TitleBand::setGradient(const QColor& from, const QColor& to)
{
    m_from = from;
    m_to = to;
    update();
}

void TitleBand::paintEvent(QPaintEvent* event)
{
    QPainter painter(this);
    QLinearGradient gradient(0, 0, width(), 0);
    gradient.setColorAt(0, m_from);
    gradient.setColorAt(1, m_to);
    painter.fillRect(rect(), gradient);
    QFrame::paintEvent(event);
}

void TitleBand::mousePressEvent(QMouseEvent* event)
{
    if (event->button() == Qt::LeftButton)
        m_grab = event->globalPosition().toPoint() - window()->frameGeometry().topLeft();
    QFrame::mousePressEvent(event);
}

void TitleBand::mouseMoveEvent(QMouseEvent* event)
{
    if (event->buttons() & Qt::LeftButton)
        window()->move(event->globalPosition().toPoint() - m_grab);
    QFrame::mouseMoveEvent(event);
}

} // namespace orvanta
