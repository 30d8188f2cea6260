#include "tools/appsetup/SetupSettings.h"

#include "platform/ErrorLog.h"
#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"
#include "platform/Registry.h"
#include "platform/Windows1252.h"

#include <QFileInfo>
#include <QSet>

namespace orvanta::appsetup {

namespace {

const QString kSection = QLatin1String(TRufwarteIni::kSection);

// The settings files and the stored credentials are Windows-1252: a character it lacks would
// come back as '?'.
bool fitsCodePage(const QString& text)
{
    return fromWindows1252(toWindows1252(text)) == text;
}

bool isDigits(const QString& text)
{
    for (const QChar c : text)
        if (c < u'0' || c > u'9')
            return false;
    return true;
}

QString writeCountry(int country)
{
    const QString path = programFile(QLatin1String(TRufwarteIni::kSettingsFile));
    IniFile ini;
    // An existing file that cannot be read must not be replaced by one holding a single key.
    if (!ini.load(path) && QFileInfo::exists(path))
        return QStringLiteral("Die Datei \"%1\" kann nicht gelesen werden.").arg(path);
    ini.setPath(path);
    ini.writeInteger(kSection, QStringLiteral("AC"), country);
    if (!ini.save())
        return QStringLiteral("Die Datei \"%1\" kann nicht geschrieben werden.").arg(path);
    return {};
}

} // namespace

DatabaseLocation splitDatabaseName(const QString& name)
{
    const QString trimmed = name.trimmed();
    const qsizetype colon = trimmed.indexOf(u':');
    if (trimmed.startsWith(u'/') || colon <= 0)
        return {QString(), trimmed};
    return {trimmed.left(colon).trimmed(), trimmed.mid(colon + 1).trimmed()};
}

QString joinDatabaseName(const DatabaseLocation& location)
{
    const QString server = location.server.trimmed();
    const QString path = location.path.trimmed();
    return server.isEmpty() ? path : server + u':' + path;
}

QString monitorCommandLine(const QString& programFolder, const QString& registryFile)
{
    const auto quoted = [](const QString& argument) {
        QString text = QStringLiteral("\"");
        for (const QChar c : argument) {
            if (c == u'"' || c == u'`' || c == u'$' || c == u'\\')
                text += u'\\';
            text += c;
        }
        return text + u'"';
    };
    QString program = programFolder;
    if (!program.endsWith(u'/'))
        program += u'/';
    program += QStringLiteral("rufwarte");
    const QString command = quoted(program) + QStringLiteral(" run");
    if (registryFile.isEmpty())
        return command;
    return QStringLiteral("env ") + quoted(QStringLiteral("VARNIK_HKLM=") + registryFile) + u' ' + command;
}

SetupSettings SetupSettings::load()
{
    SetupSettings settings;
    SetupValues& v = settings.m_loaded;
    try {
        v.connection = StoredConnection::read();
    } catch (const std::exception& e) {
        v.connection.database = StoredConnection::readDatabaseName();
        settings.m_problems.append(
            QStringLiteral("Der gespeicherte Benutzername oder das Kennwort kann nicht gelesen werden (%1). Bitte "
                           "geben Sie beide neu ein.")
                .arg(exceptionLine(e)));
    }

    TRufwarteIni monitor;
    monitor.SetProgramFolderFiles();
    // A missing file is no error here: saving creates it. The monitor then works with the
    // settings object's initial values, which the window shows.
    if (QFileInfo(monitor.settingsFile()).isFile())
        monitor.ReadFromIni();
    v.country = monitor.AC();
    v.msns = monitor.MSNs();
    v.autostart = monitor.IsAppInRun();
    return settings;
}

QString SetupSettings::validateConnection(const StoredConnection& connection)
{
    const DatabaseLocation location = splitDatabaseName(connection.database);
    if (location.path.isEmpty())
        return QStringLiteral("Bitte geben Sie die Datenbank an.");
    if (location.server.isEmpty() && !location.path.startsWith(u'/'))
        return QStringLiteral("Der Pfad der Datenbankdatei muss vollständig sein (er beginnt mit \"/\").");
    if (connection.user.trimmed().isEmpty())
        return QStringLiteral("Bitte geben Sie den Benutzernamen an.");
    if (!fitsCodePage(connection.database) || !fitsCodePage(connection.user) || !fitsCodePage(connection.password))
        return QStringLiteral("Datenbank, Benutzername und Kennwort dürfen nur westeuropäische Zeichen enthalten.");
    return {};
}

QString SetupSettings::validate(const SetupValues& values)
{
    if (const QString problem = validateConnection(values.connection); !problem.isEmpty())
        return problem;
    QSet<QString> seen;
    for (const MsnRecord& msn : values.msns) {
        if (msn.MSN.isEmpty())
            return QStringLiteral("Zur Bezeichnung \"%1\" fehlt die MSN.").arg(msn.Bezeichnung);
        if (!isDigits(msn.MSN) || msn.MSN.size() > 20)
            return QStringLiteral("Die MSN \"%1\" darf nur aus Ziffern bestehen, höchstens 20.").arg(msn.MSN);
        if (seen.contains(msn.MSN))
            return QStringLiteral("Die MSN \"%1\" ist doppelt eingetragen.").arg(msn.MSN);
        seen.insert(msn.MSN);
        if (msn.Bezeichnung.size() > 30)
            return QStringLiteral("Die Bezeichnung \"%1\" ist länger als 30 Zeichen.").arg(msn.Bezeichnung);
        if (!fitsCodePage(msn.Bezeichnung))
            return QStringLiteral("Die Bezeichnung \"%1\" enthält Zeichen, die nicht gespeichert werden können.")
                .arg(msn.Bezeichnung);
    }
    return {};
}

QString SetupSettings::save(const SetupValues& values)
{
    if (const QString problem = validate(values); !problem.isEmpty())
        return problem;
    // A value the monitor wrote that this program does not offer stays until one is chosen.
    if (values.country != m_loaded.country && (values.country < 1 || values.country > 3))
        return QStringLiteral("Bitte wählen Sie das Land der Vorwahlen.");

    if (values.connection != m_loaded.connection) {
        if (!values.connection.write())
            return QStringLiteral("Die Registrierungsdatei \"%1\" kann nicht geschrieben werden.")
                .arg(Registry::filePath(RegistryRoot::LocalMachine));
        m_loaded.connection = values.connection;
        m_problems.clear();
    }
    if (values.country != m_loaded.country) {
        if (const QString problem = writeCountry(values.country); !problem.isEmpty())
            return problem;
        m_loaded.country = values.country;
    }
    if (values.msns != m_loaded.msns) {
        const QString path = programFile(QLatin1String(TRufwarteIni::kMsnFile));
        if (!writeMsnFile(path, values.msns))
            return QStringLiteral("Die Datei \"%1\" kann nicht geschrieben werden.").arg(path);
        m_loaded.msns = values.msns;
    }
    if (values.autostart != m_loaded.autostart) {
        const QString app = QLatin1String(TRufwarteIni::kApplicationName);
        const QString registry = qEnvironmentVariableIsSet("VARNIK_HKLM")
            ? Registry::filePath(RegistryRoot::LocalMachine) : QString();
        if (!setAutostartEntry(app, values.autostart, QStringLiteral("Rufwarte"),
                               monitorCommandLine(programFolder(), registry)))
            return QStringLiteral("Der Autostart-Eintrag \"%1\" kann nicht %2 werden.")
                .arg(autostartEntryPath(app),
                     values.autostart ? QStringLiteral("angelegt") : QStringLiteral("entfernt"));
        m_loaded.autostart = values.autostart;
    }
    return {};
}

} // namespace orvanta::appsetup
