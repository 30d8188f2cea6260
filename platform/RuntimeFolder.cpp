#include "platform/RuntimeFolder.h"

#include <QDir>
#include <QFileInfo>
#include <QStandardPaths>

namespace orvanta {

QString userRuntimeFolder()
{
    const QString dir = qEnvironmentVariable("XDG_RUNTIME_DIR");
    if (!dir.isEmpty() && QFileInfo(dir).isDir())
        return QDir(dir).absolutePath();
    // Qt creates this one with mode 0700 and refuses a folder owned by someone else.
    const QString own = QStandardPaths::writableLocation(QStandardPaths::RuntimeLocation);
    return own.isEmpty() ? QDir::tempPath() : own;
}

} // namespace orvanta
