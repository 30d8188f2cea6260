#pragma once
// A window's size and position kept in an INI file of the program folder under one section:
// "Left", "Top", "Right", "Bottom" and "Maximized". Restoring brings a window that would lie off
// every screen back onto the nearest one and snaps it to the screen edges within a few pixels.

#include <QList>
#include <QRect>
#include <QString>

class QWidget;

namespace orvanta {

class WindowBounds final {
public:
    WindowBounds(QString file, QString section, int snap = 15)
        : m_file(std::move(file))
        , m_section(std::move(section))
        , m_snap(snap)
    {
    }

    // False (and the window as it was) when the file holds no usable bounds.
    bool restore(QWidget& window) const;
    [[nodiscard]] bool save(const QWidget& window) const;

    // The rectangle moved (and shrunk when too large) into the screen it overlaps most, or the
    // nearest when it overlaps none, with each edge closer than snap pixels to that screen's edge
    // moved onto it.
    [[nodiscard]] static QRect placeOnScreens(QRect rect, const QList<QRect>& screens, int snap);
    // Only the snapping, for a window the user moved: each edge closer than snap pixels to an edge
    // of the screen it overlaps most goes onto it; a window partly off the screen stays so.
    [[nodiscard]] static QRect snapToEdges(QRect rect, const QList<QRect>& screens, int snap);
    // The same on the screens of this machine, for the window's frame.
    void snap(QWidget& window) const;

private:
    QString m_file;
    QString m_section;
    int m_snap;
};

} // namespace orvanta
