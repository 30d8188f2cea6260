// About: the information window the main window starts from "? › Info" ("About.exe" resolves to
// this executable in the program folder).

#include "tools/about/AboutDialog.h"
#include "ui/scheme/ColorScheme.h"

#include <QApplication>

int main(int argc, char* argv[])
{
    QApplication app(argc, argv);
    QApplication::setApplicationName(QStringLiteral("Varnik Orvanta"));
    QApplication::setApplicationVersion(QStringLiteral(ORVANTA_VERSION));
    orvanta::loadAppColorScheme();
    orvanta::about::AboutDialog dialog;
    dialog.exec();
    return 0;
}
