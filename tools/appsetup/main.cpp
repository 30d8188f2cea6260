// AppSetup: the settings program the main window starts from "Extras › Einstellungen…"
// ("AppSetup.exe" resolves to this executable in the program folder).

#include "db/SharedEngine.h"
#include "platform/DialogService.h"
#include "tools/appsetup/AppSetupDialog.h"
#include "ui/dialogs/MessageBoxDialogService.h"
#include "ui/scheme/ColorScheme.h"

#include <QApplication>

int main(int argc, char* argv[])
{
    using namespace orvanta;
    // The connection test must not lock the file against the running program and monitor.
    useSharedEmbeddedEngine();
    QApplication app(argc, argv);
    QApplication::setApplicationName(QStringLiteral("Varnik Orvanta"));
    QApplication::setApplicationVersion(QStringLiteral(ORVANTA_VERSION));
    MessageBoxDialogService messageBoxes;
    setDialogService(&messageBoxes);
    loadAppColorScheme();

    {
        appsetup::AppSetupDialog dialog;
        dialog.exec();
    }
    setDialogService(nullptr);
    return 0;
}
