#include "calllog/LogImages.h"

#include <QPainter>
#include <QPainterPath>

namespace orvanta::logimages {
namespace {

// An arrow from one corner to the other with a head at its end.
void drawArrow(QPainter& p, QPointF from, QPointF to, const QColor& color)
{
    p.setPen(QPen(color, 2.2, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
    p.drawLine(from, to);
    const QPointF dir = (to - from) / std::hypot(to.x() - from.x(), to.y() - from.y());
    const QPointF normal(-dir.y(), dir.x());
    QPainterPath head;
    head.moveTo(to + dir * 1.5);
    head.lineTo(to - dir * 5.0 + normal * 4.0);
    head.lineTo(to - dir * 5.0 - normal * 4.0);
    head.closeSubpath();
    p.setPen(Qt::NoPen);
    p.setBrush(color);
    p.drawPath(head);
}

// A handset: the receiver the arrows point at or away from.
void drawHandset(QPainter& p, const QColor& color)
{
    p.setPen(Qt::NoPen);
    p.setBrush(color);
    p.drawRoundedRect(QRectF(1, 10, 9, 4.5), 2, 2);
}

} // namespace

QPixmap image(Image which)
{
    QPixmap pm(16, 16);
    pm.fill(Qt::transparent);
    QPainter p(&pm);
    p.setRenderHint(QPainter::Antialiasing);
    switch (which) {
    case Incoming:
        drawHandset(p, QColor(0x40, 0x40, 0x40));
        drawArrow(p, QPointF(14, 2), QPointF(7.5, 8.5), QColor(0x1E, 0x8C, 0x2E));
        break;
    case Outgoing:
        drawHandset(p, QColor(0x40, 0x40, 0x40));
        drawArrow(p, QPointF(6, 9), QPointF(13, 2.5), QColor(0x1F, 0x5F, 0xC8));
        break;
    case AnsweringMachine: {
        // A cassette: body, two reels and the tape between them.
        p.setPen(QPen(QColor(0x30, 0x30, 0x30), 1));
        p.setBrush(QColor(0xE0, 0x4A, 0x2A));
        p.drawRoundedRect(QRectF(0.5, 3.5, 15, 10), 1.5, 1.5);
        p.setBrush(Qt::white);
        p.drawEllipse(QPointF(5, 8), 2.2, 2.2);
        p.drawEllipse(QPointF(11, 8), 2.2, 2.2);
        p.drawLine(QPointF(5, 10.2), QPointF(11, 10.2));
        break;
    }
    }
    return pm;
}

QList<QPixmap> eaImages()
{
    return {image(Incoming), image(Outgoing), image(AnsweringMachine)};
}

} // namespace orvanta::logimages
