#include "app/ProgramLauncher.h"

#include "platform/AppException.h"
#include "platform/ErrorLog.h"

#include <QDir>
#include <QFileInfo>
#include <QProcess>

namespace orvanta {

ProgramLauncher::ProgramLauncher(QObject* parent)
    : QObject(parent)
{
}

ProgramLauncher::~ProgramLauncher() = default;

QString ProgramLauncher::resolve(const QString& name) const
{
    const QString folder = m_folder.isEmpty() ? QDir::currentPath() + QLatin1Char('/') : m_folder;
    const QString path = folder + name;
    if (QFileInfo(path).isFile())
        return path;
    if (name.endsWith(QLatin1String(".exe"), Qt::CaseInsensitive)) {
        const QString bare = path.chopped(4);
        if (QFileInfo(bare).isFile())
            return bare;
    }
    return {};
}

bool ProgramLauncher::start(const QString& name, const QStringList& arguments, bool wait)
{
    const QString program = resolve(name);
    if (program.isEmpty()) {
        reportError(QStringLiteral("# Orvanta - StartProgram\r\nDas Programm \"%1\" wurde im Programmverzeichnis nicht gefunden.")
                        .arg(name));
        return false;
    }
    if (!wait) {
        if (!QProcess::startDetached(program, arguments, m_folder)) {
            reportError(QStringLiteral("# Orvanta - StartProgram\r\nDas Programm \"%1\" konnte nicht gestartet werden.").arg(name));
            return false;
        }
        return true;
    }
    auto* process = new QProcess(this);
    process->setWorkingDirectory(m_folder);
    connect(process, &QProcess::finished, this, [this, process] {
        process->deleteLater();
        if (m_waiting) {
            m_waiting = false;
            Q_EMIT finishedWaiting();
        }
    });
    connect(process, &QProcess::errorOccurred, this, [this, process, name](QProcess::ProcessError error) {
        if (error != QProcess::FailedToStart)
            return;
        process->deleteLater();
        m_waiting = false;
        reportError(QStringLiteral("# Orvanta - StartProgram\r\nDas Programm \"%1\" konnte nicht gestartet werden.").arg(name));
    });
    m_waiting = true;
    process->start(program, arguments);
    return true;
}

} // namespace orvanta
