#include "platform/Registry.h"

#include "platform/ProgramFolder.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QSaveFile>
#include <QStandardPaths>

namespace orvanta {
namespace {

QString configHome()
{
    return QStandardPaths::writableLocation(QStandardPaths::GenericConfigLocation);
}

} // namespace

Registry::Registry(RegistryRoot root)
    : m_root(root)
{
    reload();
}

QString Registry::filePath(RegistryRoot root)
{
    if (root == RegistryRoot::LocalMachine) {
        const QString path = qEnvironmentVariable("VARNIK_HKLM");
        if (!path.isEmpty())
            return path;
        // An installation is one folder: the machine key beside the programs when there is one,
        // so the program, the monitor and the settings program started from there agree.
        const QString beside = programFile(QStringLiteral("registry.ini"));
        return QFileInfo::exists(beside) ? beside : QStringLiteral("/etc/xdg/Varnik/registry.ini");
    }
    const QString path = qEnvironmentVariable("VARNIK_HKCU");
    return path.isEmpty() ? configHome() + QStringLiteral("/Varnik/registry.ini") : path;
}

QString Registry::normalizeKeyPath(const QString& keyPath)
{
    QString path = keyPath;
    path.replace(u'/', u'\\');
    QStringList parts = path.split(u'\\', Qt::SkipEmptyParts);
    for (QString& part : parts)
        part = part.trimmed();
    parts.removeAll(QString());
    return parts.join(u'\\');
}

void Registry::reload()
{
    // Read fresh on every open, so another process's writes are seen.
    m_file.load(filePath(m_root));
}

bool Registry::openKeyReadOnly(const QString& keyPath)
{
    closeKey();
    reload();
    const QString path = normalizeKeyPath(keyPath);
    if (path.isEmpty() || !m_file.sectionExists(path))
        return false;
    m_currentKey = path;
    return true;
}

bool Registry::openKey(const QString& keyPath, bool canCreate)
{
    closeKey();
    reload();
    const QString path = normalizeKeyPath(keyPath);
    if (path.isEmpty())
        return false;
    // A new key comes into the file with its first value: an INI section needs one to exist.
    if (!canCreate && !m_file.sectionExists(path))
        return false;
    m_currentKey = path;
    m_writable = true;
    return true;
}

void Registry::closeKey()
{
    m_currentKey.clear();
    m_writable = false;
}

bool Registry::keyExists(const QString& keyPath) const
{
    const QString path = normalizeKeyPath(keyPath);
    if (path.isEmpty())
        return false;
    IniFile fresh(filePath(m_root));
    return fresh.sectionExists(path);
}

bool Registry::valueExists(const QString& name) const
{
    return !m_currentKey.isEmpty() && m_file.valueExists(m_currentKey, name);
}

QString Registry::readString(const QString& name) const
{
    return m_currentKey.isEmpty() ? QString() : m_file.readString(m_currentKey, name);
}

bool Registry::writeString(const QString& name, const QString& value)
{
    if (!m_writable || m_currentKey.isEmpty())
        return false;
    m_file.writeString(m_currentKey, name, value);
    return saveFile();
}

bool Registry::deleteValue(const QString& name)
{
    if (!m_writable || m_currentKey.isEmpty() || !m_file.valueExists(m_currentKey, name))
        return false;
    m_file.deleteKey(m_currentKey, name);
    return saveFile();
}

bool Registry::writeStrings(const QList<std::pair<QString, QString>>& values)
{
    if (!m_writable || m_currentKey.isEmpty())
        return false;
    for (const auto& [name, value] : values)
        m_file.writeString(m_currentKey, name, value);
    return saveFile();
}

bool Registry::saveFile()
{
    const QString path = filePath(m_root);
    QDir().mkpath(QFileInfo(path).absolutePath());
    m_file.setPath(path);
    return m_file.save();
}

QString autostartEntryPath(const QString& applicationName)
{
    const QString name = applicationName.section(u'.', 0, 0);
    if (name.isEmpty())
        return {};
    return configHome() + QStringLiteral("/autostart/") + name + QStringLiteral(".desktop");
}

bool autostartEntryExists(const QString& applicationName)
{
    const QString path = autostartEntryPath(applicationName);
    return !path.isEmpty() && QFileInfo::exists(path);
}

bool setAutostartEntry(const QString& applicationName, bool enabled, const QString& displayName,
                       const QString& commandLine)
{
    const QString path = autostartEntryPath(applicationName);
    if (path.isEmpty())
        return false;
    if (!enabled)
        return !QFileInfo::exists(path) || QFile::remove(path);
    if (QFileInfo::exists(path))
        return true;
    if (!QDir().mkpath(QFileInfo(path).absolutePath()))
        return false;
    // The desktop entry format is UTF-8 with LF, unlike the program's own settings files; its
    // string values take a backslash doubled before the Exec line's own quoting sees it.
    QString exec = commandLine;
    exec.replace(u'\\', QStringLiteral("\\\\"));
    const QByteArray entry = QStringLiteral("[Desktop Entry]\nType=Application\nName=%1\nExec=%2\n"
                                            "X-GNOME-Autostart-enabled=true\n")
                                 .arg(displayName, exec)
                                 .toUtf8();
    QSaveFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(entry) != entry.size())
        return false;
    return file.commit();
}

} // namespace orvanta
