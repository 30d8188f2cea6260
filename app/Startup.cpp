#include "app/Startup.h"

#include "app/MainWindowFeatures.h"
#include "db/SharedEngine.h"
#include "app/TLogform.h"
#include "calllog/LogMaintenance.h"
#include "db/TDM2.h"
#include "platform/MonitorLink.h"
#include "platform/NamedMutex.h"
#include "platform/TerminationSignals.h"
#include "ui/dialogs/MessageBoxDialogService.h"

#include <QApplication>
#include <QDeadlineTimer>
#include <QDialog>
#include <QPointer>
#include <QThread>
#include <QTimer>

#include <functional>

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

bool Startup::handToRunningInstance(const QStringList& parameters, int waitMs)
{
    // The first instance listens once its window is built; a start right behind it waits for that
    // as long as the first still holds its mutex.
    const QDeadlineTimer deadline(waitMs);
    for (;;) {
        if (MonitorLink::handToRunningProgram(parameters, 500))
            return true;
        if (deadline.hasExpired() || !NamedMutex::isHeld(QString::fromLatin1(InstanceMutexName)))
            return false;
        QThread::msleep(100);
    }
}

int Startup::run(int argc, char* argv[])
{
    (void)LogMaintenance::processLock();
    std::unique_ptr<NamedMutex> instance;
    if (!mayStart(instance)) {
        // A user who starts the program again wants to see it: the running one comes forward
        // (with the "/co-" switch given here). Either way this start ends silently.
        if (!NamedMutex::isHeld(QString::fromLatin1(BackupMutexName))) {
            QCoreApplication handOver(argc, argv);
            QStringList parameters = QCoreApplication::arguments();
            parameters.removeFirst();
            (void)handToRunningInstance(parameters, 3000);
        }
        return 0;
    }

    useSharedEmbeddedEngine();
    QApplication app(argc, argv);
    QApplication::setApplicationName(QStringLiteral("Varnik Orvanta"));
    // No display name: Qt would append it to every window title on Linux, and each window's
    // title is its own caption and nothing more.
    QApplication::setApplicationVersion(QStringLiteral(ORVANTA_VERSION));
    MessageBoxDialogService messageBoxes;
    setDialogService(&messageBoxes);

    // SIGTERM/SIGINT end the run as a close of the main window does. Modal dialogs go first,
    // one per turn of the event loop, so that the code that opened each one goes on before
    // the window closes under it.
    TerminationSignals termination;
    keepConnectionsOnTerminationSignals();
    QPointer<QWidget> mainWindow;
    bool terminating = false;
    int attempts = 0;
    std::function<void()> endRun = [&] {
        terminating = true;
        if (QWidget* modal = QApplication::activeModalWidget(); modal && ++attempts < 100) {
            if (auto* dialog = qobject_cast<QDialog*>(modal))
                dialog->reject();
            else
                modal->close();
            QTimer::singleShot(0, &app, endRun);
            return;
        }
        if (mainWindow)
            mainWindow->close();
    };
    QObject::connect(&termination, &TerminationSignals::terminationRequested, &app, [&endRun] { endRun(); });

    int code = 0;
    {
        TDM2 dm;
        QStringList parameters = QApplication::arguments();
        parameters.removeFirst();
        {
            TLogform window(&dm, parameters, defaultMainWindowFeatures());
            mainWindow = &window;
            window.show();
            if (terminating)
                QTimer::singleShot(0, &window, &QWidget::close);
            code = QApplication::exec();
        }
        // The data module closes its data sets and the connection here.
    }
    setDialogService(nullptr);
    instance.reset();
    return code;
}

} // namespace orvanta
