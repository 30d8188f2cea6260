#include "platform/ProgramFolder.h"

#include <QCoreApplication>
#include <QDir>

namespace orvanta {
namespace {

QString& overrideFolder()
{
    static QString folder;
    return folder;
}

QString withSlash(QString folder)
{
    if (!folder.endsWith(u'/'))
        folder += u'/';
    return folder;
}

} // namespace

QString programFolder()
{
    if (!overrideFolder().isEmpty())
        return overrideFolder();
    const QString dir = QCoreApplication::instance() != nullptr ? QCoreApplication::applicationDirPath()
                                                               : QDir::currentPath();
    return withSlash(dir);
}

void setProgramFolder(const QString& folder)
{
    overrideFolder() = folder.isEmpty() ? QString() : withSlash(folder);
}

QString programFile(const QString& bareName)
{
    return programFolder() + bareName;
}

} // namespace orvanta
