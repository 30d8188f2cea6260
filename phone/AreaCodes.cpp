#include "phone/AreaCodes.h"

#include "platform/AppException.h"
#include "platform/ErrorLog.h"
#include "platform/ProgramFolder.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace orvanta {

namespace {

void loadTable(AreaCodeTable& table, const QString& folder, const char* fileName, const char* operation)
{
    const QString header = QStringLiteral("# Orvex - ") + QLatin1String(operation);
    try {
        table.clear();
        const QString path = QDir(folder).filePath(QLatin1String(fileName));
        if (!QFileInfo(path).isFile()) {
            logError(header + QStringLiteral("\r\nDatei nicht gefunden!"));
            return;
        }
        QFile file(path);
        if (!file.open(QIODevice::ReadOnly))
            throw AppException(QStringLiteral("Die Datei \"%1\" kann nicht geöffnet werden. %2").arg(path, file.errorString()));
        const QByteArray contents = file.readAll();
        if (file.error() != QFileDevice::NoError)
            throw AppException(QStringLiteral("Fehler beim Lesen der Datei \"%1\". %2").arg(path, file.errorString()));
        table.appendFileContents(contents);
    } catch (const std::exception& e) {
        reportError(header, &e);
    }
}

bool lookupIn(const AreaCodeTable& table, const char* header, QStringView number, QString& prefix, QString& rest,
    QString& region)
{
    try {
        return table.lookup(number, prefix, rest, region);
    } catch (const std::exception& e) {
        reportError(QLatin1String(header), &e);
        return false;
    }
}

} // namespace

AreaCodeTable& germanAreaCodes()
{
    static AreaCodeTable table({2, 3, 4, 5});
    return table;
}

AreaCodeTable& austrianAreaCodes()
{
    static AreaCodeTable table({1, 2, 3, 4});
    return table;
}

AreaCodeTable& swissAreaCodes()
{
    static AreaCodeTable table({1, 2});
    return table;
}

void LoadGermanAereaCodes(const QString& folder)
{
    loadTable(germanAreaCodes(), folder, "AreaCodes_DE", "LoadGermanAereaCodes");
}

void LoadAustriaAereaCodes(const QString& folder)
{
    loadTable(austrianAreaCodes(), folder, "AreaCodes_A", "LoadAustriaAereaCodes");
}

void LoadSwissAereaCodes(const QString& folder)
{
    loadTable(swissAreaCodes(), folder, "AreaCodes_CH", "LoadSwissAereaCodes");
}

void LoadGermanAereaCodes()
{
    LoadGermanAereaCodes(programFolder());
}

void LoadAustriaAereaCodes()
{
    LoadAustriaAereaCodes(programFolder());
}

void LoadSwissAereaCodes()
{
    LoadSwissAereaCodes(programFolder());
}

bool GetGermanAereaCodes(QStringView number, QString& prefix, QString& rest, QString& region)
{
    return lookupIn(germanAreaCodes(), "# Rufwarte - GetGermanAereaCodes", number, prefix, rest, region);
}

bool GetAustriaAereaCodes(QStringView number, QString& prefix, QString& rest, QString& region)
{
    return lookupIn(austrianAreaCodes(), "# Rufwarte - GetAustriaAereaCodes", number, prefix, rest, region);
}

bool GetSwissAereaCodes(QStringView number, QString& prefix, QString& rest, QString& region)
{
    return lookupIn(swissAreaCodes(), "# Rufwarte - GetSwissAereaCodes", number, prefix, rest, region);
}

} // namespace orvanta
