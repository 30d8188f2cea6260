#pragma once
// Sets up what the program finds of an installed monitor: a call database (with demo content),
// the monitor's registry key with the connection data (credentials encrypted as the monitor
// stores them), and the settings files of the program folder.

#include <QString>

namespace orvanta::rufwarte {

struct SetupOptions {
    QString programFolder; // settings files go here
    QString database;      // plain path (embedded) or host:path
    QString user = QStringLiteral("SYSDBA");
    QString password = QStringLiteral("masterkey");
    bool demo = true;      // contacts and a few hundred calls
    bool overwrite = false; // replace an existing database file
};

// Returns an empty string on success, else the German message for the user.
[[nodiscard]] QString setUp(const SetupOptions& options);

// The settings files alone (kept when they exist unless overwrite is set).
void writeSettingsFiles(const QString& programFolder, bool overwrite);
// The registry values the program reads.
bool writeRegistry(const QString& database, const QString& user, const QString& password);

} // namespace orvanta::rufwarte
