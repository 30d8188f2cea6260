#include "categories/WindowBounds.h"

#include "platform/IniFile.h"

#include <QGuiApplication>
#include <QScreen>
#include <QWidget>

#include <limits>

namespace orvanta {
namespace {

    qint64 area(const QRect& r)
    {
        return r.isValid() ? qint64(r.width()) * r.height() : 0;
    }

    qint64 distance2(const QPoint& a, const QPoint& b)
    {
        const qint64 dx = a.x() - b.x();
        const qint64 dy = a.y() - b.y();
        return dx * dx + dy * dy;
    }

    QList<QRect> availableScreens()
    {
        QList<QRect> out;
        for (const QScreen* s : QGuiApplication::screens())
            out << s->availableGeometry();
        return out;
    }

} // namespace

QRect WindowBounds::placeOnScreens(QRect rect, const QList<QRect>& screens, int snap)
{
    if (screens.isEmpty() || !rect.isValid())
        return rect;
    const QRect* best = nullptr;
    qint64 bestOverlap = 0;
    for (const QRect& s : screens) {
        const qint64 overlap = area(s.intersected(rect));
        if (overlap > bestOverlap) {
            bestOverlap = overlap;
            best = &s;
        }
    }
    if (!best) {
        qint64 nearest = std::numeric_limits<qint64>::max();
        for (const QRect& s : screens) {
            const qint64 d = distance2(s.center(), rect.center());
            if (d < nearest) {
                nearest = d;
                best = &s;
            }
        }
    }
    const QRect& s = *best;
    rect.setWidth(qMin(rect.width(), s.width()));
    rect.setHeight(qMin(rect.height(), s.height()));
    // Wholly inside: a part off the screen could hold the title bar.
    if (rect.left() < s.left())
        rect.moveLeft(s.left());
    if (rect.right() > s.right())
        rect.moveRight(s.right());
    if (rect.top() < s.top())
        rect.moveTop(s.top());
    if (rect.bottom() > s.bottom())
        rect.moveBottom(s.bottom());
    if (rect.left() - s.left() <= snap)
        rect.moveLeft(s.left());
    else if (s.right() - rect.right() <= snap)
        rect.moveRight(s.right());
    if (rect.top() - s.top() <= snap)
        rect.moveTop(s.top());
    else if (s.bottom() - rect.bottom() <= snap)
        rect.moveBottom(s.bottom());
    return rect;
}

QRect WindowBounds::snapToEdges(QRect rect, const QList<QRect>& screens, int snap)
{
    const QRect* best = nullptr;
    qint64 bestOverlap = 0;
    for (const QRect& s : screens) {
        const qint64 overlap = area(s.intersected(rect));
        if (overlap > bestOverlap) {
            bestOverlap = overlap;
            best = &s;
        }
    }
    if (!best)
        return rect;
    const QRect& s = *best;
    if (qAbs(rect.left() - s.left()) <= snap)
        rect.moveLeft(s.left());
    else if (qAbs(s.right() - rect.right()) <= snap)
        rect.moveRight(s.right());
    if (qAbs(rect.top() - s.top()) <= snap)
        rect.moveTop(s.top());
    else if (qAbs(s.bottom() - rect.bottom()) <= snap)
        rect.moveBottom(s.bottom());
    return rect;
}

void WindowBounds::snap(QWidget& window) const
{
    const QRect frame = window.frameGeometry();
    const QRect snapped = snapToEdges(frame, availableScreens(), m_snap);
    if (snapped.topLeft() != frame.topLeft())
        window.move(snapped.topLeft());
}

bool WindowBounds::restore(QWidget& window) const
{
    const IniFile ini(m_file);
    if (!ini.sectionExists(m_section))
        return false;
    const int left = ini.readInteger(m_section, QStringLiteral("Left"), 0);
    const int top = ini.readInteger(m_section, QStringLiteral("Top"), 0);
    const int right = ini.readInteger(m_section, QStringLiteral("Right"), 0);
    const int bottom = ini.readInteger(m_section, QStringLiteral("Bottom"), 0);
    const bool maximized = ini.readBool(m_section, QStringLiteral("Maximized"), false);
    QRect r(QPoint(left, top), QPoint(right - 1, bottom - 1));
    if (!r.isValid())
        return false;
    r.setWidth(qMax(r.width(), window.minimumWidth()));
    r.setHeight(qMax(r.height(), window.minimumHeight()));
    window.setGeometry(placeOnScreens(r, availableScreens(), m_snap));
    if (maximized)
        window.setWindowState(window.windowState() | Qt::WindowMaximized);
    return true;
}

bool WindowBounds::save(const QWidget& window) const
{
    IniFile ini(m_file);
    ini.setPath(m_file);
    const bool maximized = window.isMaximized();
    const QRect r = maximized ? window.normalGeometry() : window.geometry();
    ini.writeInteger(m_section, QStringLiteral("Left"), r.left());
    ini.writeInteger(m_section, QStringLiteral("Top"), r.top());
    ini.writeInteger(m_section, QStringLiteral("Right"), r.left() + r.width());
    ini.writeInteger(m_section, QStringLiteral("Bottom"), r.top() + r.height());
    ini.writeBool(m_section, QStringLiteral("Maximized"), maximized);
    return ini.save();
}

} // namespace orvanta
