// OEImp: the contact import the main window starts ("OEImp.exe" resolves to this executable in
// the program folder) and waits for; it reloads its contact list when this ends.
//   OEImp [-OEImpRufwarte] [file]   a file given is read at once

#include "db/SharedEngine.h"
#include "db/TDM2.h"
#include "phone/AreaCodes.h"
#include "platform/DialogService.h"
#include "platform/RufwarteIni.h"
#include "tools/oeimp/OEImpWindow.h"
#include "ui/dialogs/MessageBoxDialogService.h"
#include "ui/scheme/ColorScheme.h"

#include <QApplication>
#include <QFileInfo>

int main(int argc, char* argv[])
{
    using namespace orvanta;
    // The program and the monitor keep the database open meanwhile.
    useSharedEmbeddedEngine();
    QApplication app(argc, argv);
    QApplication::setApplicationName(QStringLiteral("Varnik Orvanta"));
    QApplication::setApplicationVersion(QStringLiteral(ORVANTA_VERSION));
    MessageBoxDialogService messageBoxes;
    setDialogService(&messageBoxes);
    loadAppColorScheme();
    LoadGermanAereaCodes();
    LoadAustriaAereaCodes();
    LoadSwissAereaCodes();

    int homeCountry = 1;
    {
        TRufwarteIni monitor;
        monitor.SetProgramFolderFiles();
        if (QFileInfo(monitor.settingsFile()).isFile() && monitor.ReadFromIni())
            homeCountry = monitor.AC();
    }

    QString file;
    for (const QString& arg : QApplication::arguments().mid(1)) {
        if (!arg.startsWith(QLatin1Char('-')))
            file = arg;
    }
    {
        TDM2 dm;
        oeimp::OEImpWindow window(dm, homeCountry);
        if (!file.isEmpty())
            window.openFile(file);
        window.exec();
    }
    setDialogService(nullptr);
    return 0;
}
