#include "app/Startup.h"

#include "app/MainWindowFeatures.h"
#include "db/SharedEngine.h"
#include "app/TLogform.h"
#include "calllog/LogMaintenance.h"
#include "db/TDM2.h"
#include "platform/NamedMutex.h"
#include "ui/dialogs/MessageBoxDialogService.h"

#include <QApplication>

namespace orvanta {

bool Startup::mayStart(std::unique_ptr<NamedMutex>& instance)
{
    if (NamedMutex::isHeld(QString::fromLatin1(BackupMutexName)))
        return false;
    auto mutex = std::make_unique<NamedMutex>(QString::fromLatin1(InstanceMutexName));
    if (mutex->alreadyExists())
        return false;
    instance = std::move(mutex);
    return true;
}

int Startup::run(int argc, char* argv[])
{
    (void)LogMaintenance::processLock();
    std::unique_ptr<NamedMutex> instance;
    if (!mayStart(instance))
        return 0;

    useSharedEmbeddedEngine();
    QApplication app(argc, argv);
    QApplication::setApplicationName(QStringLiteral("Varnik Orvanta"));
    // No display name: Qt would append it to every window title on Linux, and each window's
    // title is its own caption and nothing more.
    QApplication::setApplicationVersion(QStringLiteral(ORVANTA_VERSION));
    MessageBoxDialogService messageBoxes;
    setDialogService(&messageBoxes);
    int code = 0;
    {
        TDM2 dm;
        QStringList parameters = QApplication::arguments();
        parameters.removeFirst();
        {
            TLogform window(&dm, parameters, defaultMainWindowFeatures());
            window.show();
            code = QApplication::exec();
        }
        // The data module closes its data sets and the connection here.
    }
    setDialogService(nullptr);
    instance.reset();
    return code;
}

} // namespace orvanta
