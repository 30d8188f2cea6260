#pragma once
// What the settings program edits, apart from its window: the connection data in the monitor's
// registry key and the monitor settings a user changes (the country of the area codes, the MSNs
// with their names, the start with the session). Loading reads through the code the program
// itself reads with; saving writes only what changed, each file atomically and in its own
// format, keeping every key and line it does not know.

#include "db/StoredConnection.h"
#include "platform/RufwarteIni.h"

#include <QList>
#include <QString>
#include <QStringList>

namespace orvanta::appsetup {

struct SetupValues {
    StoredConnection connection;
    int country = 1; // "AC" of the monitor settings: 1 Germany, 2 Austria, 3 Switzerland
    QList<MsnRecord> msns;
    bool autostart = false;

    friend bool operator==(const SetupValues&, const SetupValues&) = default;
};

// A database name splits into server and path at the first ':' unless it is a plain path.
struct DatabaseLocation {
    QString server; // empty: the embedded engine opens the file itself
    QString path;
};
[[nodiscard]] DatabaseLocation splitDatabaseName(const QString& name);
[[nodiscard]] QString joinDatabaseName(const DatabaseLocation& location);

// The Exec line that starts the monitor in its program folder, quoted as desktop entries want.
// A registry file other than the default (VARNIK_HKLM) is passed on, since a session's
// autostart does not inherit this program's environment.
[[nodiscard]] QString monitorCommandLine(const QString& programFolder, const QString& registryFile = {});

class SetupSettings final {
public:
    // Reads the registry stand-in and the program folder's monitor files. Credentials that do
    // not decrypt start empty and leave a German message in problems().
    [[nodiscard]] static SetupSettings load();

    [[nodiscard]] const SetupValues& loaded() const { return m_loaded; }
    [[nodiscard]] const QStringList& problems() const { return m_problems; }

    // The German message for the first value that cannot be stored; empty when all can.
    [[nodiscard]] static QString validate(const SetupValues& values);
    // The same for the connection data alone (before a connection test).
    [[nodiscard]] static QString validateConnection(const StoredConnection& connection);
    // Validates, then writes what differs from loaded(). Returns empty on success, else the
    // German message; what was written before a failure counts as loaded from then on.
    [[nodiscard]] QString save(const SetupValues& values);

private:
    SetupValues m_loaded;
    QStringList m_problems;
};

} // namespace orvanta::appsetup
