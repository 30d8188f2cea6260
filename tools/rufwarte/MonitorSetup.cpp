#include "tools/rufwarte/MonitorSetup.h"

#include "db/FbAttachment.h"
#include "db/Schema.h"
#include "db/SqlScript.h"
#include "db/StoredConnection.h"
#include "platform/AppException.h"
#include "platform/IniFile.h"
#include "platform/Registry.h"
#include "platform/RufwarteIni.h"
#include "tools/demo/DemoData.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace orvanta::rufwarte {

namespace {

void writeIni(const QString& path, bool overwrite, const std::function<void(IniFile&)>& fill)
{
    if (!overwrite && QFileInfo::exists(path))
        return;
    IniFile ini;
    ini.setPath(path);
    fill(ini);
    (void)ini.save();
}

const char* const kCalendarInfo =
    "{\\rtf1\\ansi\\ansicpg1252\\deff0{\\fonttbl{\\f0\\fswiss Arial;}}\\f0\\fs16 "
    "Tage mit Anrufen sind im Kalender {\\b fett} hinterlegt.\\par "
    "Ein Klick auf einen Tag zeigt das Anrufprotokoll dieses Tages.\\par}";

} // namespace

void writeSettingsFiles(const QString& programFolder, bool overwrite)
{
    const QString f = QDir(programFolder).absolutePath() + QLatin1Char('/');
    writeIni(f + QStringLiteral("OScheme"), overwrite,
             [](IniFile& ini) { ini.writeInteger(QStringLiteral("AppColor"), QStringLiteral("Value"), 2); });
    writeIni(f + QStringLiteral("VStore"), overwrite,
             [](IniFile& ini) { ini.writeInteger(QStringLiteral("Level_GV"), QStringLiteral("AP"), 1); });
    writeIni(f + QStringLiteral("ISDNStore"), overwrite, [](IniFile& ini) {
        const QString s = QStringLiteral("MoniOptions");
        ini.writeBool(s, QStringLiteral("INCOMING_MSN_ONLY"), false);
        ini.writeBool(s, QStringLiteral("IWND"), true);
        ini.writeInteger(s, QStringLiteral("CLOSE_WND"), 10);
        ini.writeInteger(s, QStringLiteral("WND_POS"), 3);
        ini.writeInteger(s, QStringLiteral("AMT"), 0);
        ini.writeInteger(s, QStringLiteral("MNSAL"), 2);
        ini.writeInteger(s, QStringLiteral("AC"), 1);
        ini.writeInteger(s, QStringLiteral("DBL"), 4);
        ini.writeInteger(s, QStringLiteral("TCPPORT"), 9090);
        ini.writeInteger(s, QStringLiteral("RA"), 16);
    });
    const QString msns = f + QStringLiteral("msns");
    if (overwrite || !QFileInfo::exists(msns)) {
        (void)writeMsnFile(msns, {MsnRecord{QStringLiteral("3012345670"), QStringLiteral("Büro")},
                                  MsnRecord{QStringLiteral("3012345671"), QStringLiteral("Fax")}});
    }
    const QString info = f + QStringLiteral("kalenderinfo.rtf");
    if (overwrite || !QFileInfo::exists(info)) {
        QFile file(info);
        if (file.open(QIODevice::WriteOnly))
            file.write(kCalendarInfo);
    }
}

bool writeRegistry(const QString& database, const QString& user, const QString& password)
{
    return StoredConnection{database, user, password}.write();
}

QString setUp(const SetupOptions& o)
{
    if (o.programFolder.isEmpty() || !QDir().mkpath(o.programFolder))
        return QStringLiteral("Das Programmverzeichnis \"%1\" kann nicht angelegt werden.").arg(o.programFolder);
    const bool embedded = o.database.startsWith(QLatin1Char('/'));
    if (embedded) {
        if (QFileInfo::exists(o.database)) {
            if (!o.overwrite)
                return QStringLiteral("Die Datenbank \"%1\" existiert bereits.").arg(o.database);
            QFile::remove(o.database);
        }
        QDir().mkpath(QFileInfo(o.database).absolutePath());
    }
    try {
        FbAttachment::createDatabase(o.database, o.user, o.password);
        FbAttachment db;
        db.attach(o.database, o.user, o.password);
        SqlScript::run(db, schemaScript());
        if (o.demo)
            demo::fillDemo(db);
        db.disconnect();
    } catch (const AppException& e) {
        return QStringLiteral("Die Datenbank \"%1\" konnte nicht angelegt werden:\n%2").arg(o.database, e.message());
    }
    if (!writeRegistry(o.database, o.user, o.password))
        return QStringLiteral("Die Registrierungsdatei \"%1\" kann nicht geschrieben werden.")
            .arg(Registry::filePath(RegistryRoot::LocalMachine));
    writeSettingsFiles(o.programFolder, o.overwrite);
    return {};
}

} // namespace orvanta::rufwarte
