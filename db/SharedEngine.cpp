#include "db/SharedEngine.h"

#include "platform/MonitorLink.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace orvanta {

namespace {

QString installedEngineRoot()
{
    const QStringList candidates{QStringLiteral("/usr/lib/x86_64-linux-gnu/firebird/3.0"),
                                 QStringLiteral("/usr/lib/aarch64-linux-gnu/firebird/3.0"),
                                 QStringLiteral("/usr/lib/i386-linux-gnu/firebird/3.0"),
                                 QStringLiteral("/usr/lib/firebird/3.0"), QStringLiteral("/opt/firebird")};
    for (const QString& c : candidates)
        if (QFileInfo::exists(c + QStringLiteral("/plugins")))
            return c;
    return {};
}

} // namespace

QString useSharedEmbeddedEngine()
{
    if (!qEnvironmentVariableIsEmpty("FIREBIRD"))
        return qEnvironmentVariable("FIREBIRD");
    const QString installed = installedEngineRoot();
    if (installed.isEmpty())
        return {};
    const QString root = MonitorLink::runtimeFolder() + QStringLiteral("/orvanta-firebird");
    QDir().mkpath(root);
    const QDir source(installed);
    for (const QFileInfo& entry : source.entryInfoList(QDir::AllEntries | QDir::NoDotAndDotDot | QDir::System)) {
        if (entry.fileName() == QLatin1String("firebird.conf") || entry.fileName() == QLatin1String("intl"))
            continue;
        const QString link = root + QLatin1Char('/') + entry.fileName();
        if (!QFileInfo(link).exists() && !QFileInfo(link).isSymLink())
            QFile::link(entry.absoluteFilePath(), link);
    }
    // The engine refuses character-set modules reached through a symbolic link: copy them.
    const QString intl = root + QStringLiteral("/intl");
    if (QFileInfo(intl).isSymLink())
        QFile::remove(intl);
    QDir().mkpath(intl);
    for (const QFileInfo& entry : QDir(installed + QStringLiteral("/intl")).entryInfoList(QDir::Files)) {
        const QString target = intl + QLatin1Char('/') + entry.fileName();
        if (QFileInfo(target).size() != entry.size() || QFileInfo(target).isSymLink()) {
            QFile::remove(target + QStringLiteral(".new"));
            if (QFile::copy(entry.absoluteFilePath(), target + QStringLiteral(".new"))) {
                QFile::remove(target);
                QFile::rename(target + QStringLiteral(".new"), target);
            }
        }
    }
    // The installed settings with the server mode appended (a later line wins).
    QByteArray conf;
    QFile installedConf(installed + QStringLiteral("/firebird.conf"));
    if (installedConf.open(QIODevice::ReadOnly))
        conf = installedConf.readAll();
    conf += "\nServerMode = SuperClassic\n";
    const QString confPath = root + QStringLiteral("/firebird.conf");
    QFile current(confPath);
    if (!current.open(QIODevice::ReadOnly) || current.readAll() != conf) {
        current.close();
        QFile out(confPath + QStringLiteral(".new"));
        if (out.open(QIODevice::WriteOnly) && out.write(conf) == conf.size()) {
            out.close();
            QFile::remove(confPath);
            QFile::rename(confPath + QStringLiteral(".new"), confPath);
        }
    }
    qputenv("FIREBIRD", QFile::encodeName(root));
    return root;
}

} // namespace orvanta
