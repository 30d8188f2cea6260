#pragma once
// The application colour scheme: 0 blue, 1 olive, 2 silver. Read once at start-up from the
// program folder's "OScheme"; every window paints its panels by it.

#include <QColor>

namespace orvanta {

// Any value outside 0..2 counts as 2 (silver).
[[nodiscard]] int normalizedColorScheme(int value);
[[nodiscard]] int appColorScheme();
void setAppColorScheme(int value);

// A Windows colour reference: blue in the high byte of the three.
[[nodiscard]] inline QColor colorFromBgr(unsigned bgr)
{
    return QColor::fromRgb(static_cast<int>(bgr & 0xFF), static_cast<int>((bgr >> 8) & 0xFF),
                           static_cast<int>((bgr >> 16) & 0xFF));
}

// The main window's colours of one scheme.
struct MainWindowColors {
    int navBarStyle;       // style index of the navigation bar
    QColor panels;         // tool-bar strip, status strip and splitter
    QColor gradientStart;  // calendar month gradient start
    QColor gradientEnd;    // calendar gradient end and selection
    QColor accent;         // view radio buttons and contact grouping boxes
};

[[nodiscard]] MainWindowColors mainWindowColors(int scheme);

} // namespace orvanta
