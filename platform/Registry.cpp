#include "platform/Registry.h"

#include <QDir>
#include <QFileInfo>
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
        return path.isEmpty() ? QStringLiteral("/etc/xdg/Varnik/registry.ini") : path;
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

bool Registry::saveFile()
{
    const QString path = filePath(m_root);
    QDir().mkpath(QFileInfo(path).absolutePath());
    m_file.setPath(path);
    return m_file.save();
}

bool autostartEntryExists(const QString& applicationName)
{
    const QString name = applicationName.section(u'.', 0, 0);
    if (name.isEmpty())
        return false;
    return QFileInfo::exists(configHome() + QStringLiteral("/autostart/") + name + QStringLiteral(".desktop"));
}

} // namespace orvanta
