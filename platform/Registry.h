#pragma once
// The Windows registry as this program uses it: HKEY_LOCAL_MACHINE and HKEY_CURRENT_USER are INI
// files, one section per key path ("software\Varnik\rufwarte", case-insensitive), string values.
// HKEY_LOCAL_MACHINE is $VARNIK_HKLM (default /etc/xdg/Varnik/registry.ini), HKEY_CURRENT_USER
// is $VARNIK_HKCU (default $XDG_CONFIG_HOME/Varnik/registry.ini). A missing or corrupt file
// reads as an empty registry.

#include "platform/IniFile.h"

#include <QList>
#include <QString>

#include <utility>

namespace orvanta {

enum class RegistryRoot { LocalMachine, CurrentUser };

class Registry final {
public:
    explicit Registry(RegistryRoot root = RegistryRoot::CurrentUser);

    [[nodiscard]] static QString filePath(RegistryRoot root);
    [[nodiscard]] RegistryRoot root() const { return m_root; }

    // Opens an existing key; false (and no key open) when it does not exist.
    bool openKeyReadOnly(const QString& keyPath);
    // Opens a key for writing, creating it when canCreate is set; false when it cannot be opened.
    bool openKey(const QString& keyPath, bool canCreate);
    void closeKey();
    [[nodiscard]] bool keyExists(const QString& keyPath) const;
    [[nodiscard]] const QString& currentPath() const { return m_currentKey; }

    [[nodiscard]] bool valueExists(const QString& name) const;
    // A missing value, or no open key, reads as empty.
    [[nodiscard]] QString readString(const QString& name) const;
    // Writes and saves at once; false when no key is open for writing or the file cannot be written.
    bool writeString(const QString& name, const QString& value);
    bool deleteValue(const QString& name);
    // Writes several values with one save, so that they change together or not at all.
    bool writeStrings(const QList<std::pair<QString, QString>>& values);

    // "Software\Varnik\rufwarte\" and "software/varnik/Rufwarte" name the same key.
    [[nodiscard]] static QString normalizeKeyPath(const QString& keyPath);

private:
    void reload();
    bool saveFile();

    RegistryRoot m_root;
    IniFile m_file;
    QString m_currentKey;
    bool m_writable = false;
};

// Whether the application is started with the user's session: the XDG autostart entry
// $XDG_CONFIG_HOME/autostart/<name>.desktop exists, where <name> is applicationName without
// everything from its first "." ("rufwarte.exe" -> "rufwarte.desktop"). Empty name: false.
[[nodiscard]] bool autostartEntryExists(const QString& applicationName);
[[nodiscard]] QString autostartEntryPath(const QString& applicationName);
// Creates (atomically) or removes that entry. Enabling keeps an entry that exists as it is, so
// what the user or the desktop added to it survives; a new one runs commandLine (the Exec line
// of the desktop entry format). False when the file cannot be written or removed.
[[nodiscard]] bool setAutostartEntry(const QString& applicationName, bool enabled, const QString& displayName,
                                     const QString& commandLine);

} // namespace orvanta
