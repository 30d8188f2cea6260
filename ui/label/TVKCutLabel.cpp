#include "ui/label/TVKCutLabel.h"

#include <QPainter>
#include <QStyle>

namespace orvanta {

TVKCutLabel::TVKCutLabel(QWidget* parent)
    : QLabel(parent)
{
}

TVKCutLabel::TVKCutLabel(const QString& text, QWidget* parent)
    : QLabel(text, parent)
{
}

void TVKCutLabel::setAutoSize(bool on)
{
    if (m_autoSize == on)
        return;
    m_autoSize = on;
    updateGeometry();
    update();
}

QString TVKCutLabel::shortened(const QString& text, const QFontMetrics& metrics, int width)
{
    if (metrics.horizontalAdvance(text) <= width)
        return text;
    QString base = text;
    QString shown = text;
    do {
        base.chop(1);
        shown = base + QStringLiteral("...");
    } while (!base.isEmpty() && shown.size() >= 4 && metrics.horizontalAdvance(shown) > width);
    return shown;
}

QString TVKCutLabel::displayedText() const
{
    if (m_autoSize)
        return text();
    return shortened(text(), fontMetrics(), contentsRect().width());
}

QSize TVKCutLabel::minimumSizeHint() const
{
    if (m_autoSize)
        return QLabel::minimumSizeHint();
    // Without auto size the label may become narrower than its text: that is what it is for.
    return {0, QLabel::minimumSizeHint().height()};
}

void TVKCutLabel::paintEvent(QPaintEvent* event)
{
    if (m_autoSize || textFormat() == Qt::RichText) {
        QLabel::paintEvent(event);
        return;
    }
    QFrame::paintEvent(event);
    QPainter p(this);
    style()->drawItemText(&p, contentsRect(), static_cast<int>(alignment()), palette(), isEnabled(), displayedText(),
                          foregroundRole());
}

} // namespace orvanta
