#pragma once
// The application colour scheme: 0 blue, 1 olive, 2 silver. Read once at start-up from the
// program folder's "OScheme"; every window paints its panels by it. The colours are one table per
// kind of window, looked up by scheme, so that a window only says which of its parts gets which.

#include <QColor>

namespace orvanta {

// Any value outside 0..2 counts as 2 (silver).
[[nodiscard]] int normalizedColorScheme(int value);
[[nodiscard]] int appColorScheme();
void setAppColorScheme(int value);
// Sets the scheme from the program folder's "OScheme" (section "AppColor", key "Value"; a
// missing file or value gives 2) and returns it. The program and its companion programs share it.
int loadAppColorScheme();

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

// The list frames' colours (call log, contact list).
struct ListFrameColors {
    QColor panel;               // frame panel FP3
    QColor panelBorder;         // FP3 highlight and shadow
    QColor captionBar;          // the caption strip RzSeparator2
    QColor captionBarHighlight;
    QColor searchFlat;          // search panel border when flat
    QColor search;              // search panel
    QColor controlFrame;        // check-box and button frames
    QColor footerStart;         // footer gradient, top to bottom
    QColor footerEnd;
    QColor footerBorder;
    QColor cardTitleText;       // title text of a card that has no focus
};

[[nodiscard]] const ListFrameColors& listFrameColors(int scheme);

// The detail and edit windows' colours; notice dialogs use the window colour.
struct DetailWindowColors {
    QColor window;
    QColor header;  // title band
    QColor border;
};

[[nodiscard]] const DetailWindowColors& detailWindowColors(int scheme);

// The print selection's and the print dialog's colours (decimal Windows colour values).
struct PrintWindowColors {
    QColor gradientFrom; // title band, left to right
    QColor gradientTo;
    QColor window;
    QColor accent; // panel borders, shapes, radio-button frames, button borders
    int buttonStyle;
};

[[nodiscard]] const PrintWindowColors& printWindowColors(int scheme);

// The number and e-mail editors' colours.
struct EditorDialogColors {
    QColor panel;
    QColor border;          // panel border, edit and check-box frames
    QColor buttonHighlight;
    QColor headerStart;     // header band gradient start
};

[[nodiscard]] const EditorDialogColors& editorDialogColors(int scheme);

} // namespace orvanta
