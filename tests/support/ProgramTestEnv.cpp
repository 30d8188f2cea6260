#include "tests/support/ProgramTestEnv.h"

#include "db/CredentialCipher.h"
#include "platform/ProgramFolder.h"
#include "platform/Registry.h"

#include <QFile>

namespace orvanta::test {

ProgramTestEnv::ProgramTestEnv(const QDateTime& now, ErrorLogSetup errorLog)
    : m_clock(now)
{
    qputenv("VARNIK_HKLM", m_dir.filePath(QStringLiteral("hklm.ini")).toLocal8Bit());
    setProgramFolder(m_dir.path());
    if (errorLog == ErrorLogSetup::Create) {
        m_log = std::make_unique<TvkErrorLog>(m_dir.path(), 20, QStringLiteral("OXError.log"));
        setErrorLog(m_log.get());
    }
    Registry r(RegistryRoot::LocalMachine);
    if (r.openKey(QStringLiteral("Software\\Varnik\\Rufwarte"), true)) {
        r.writeString(QStringLiteral("Database"), m_db.path());
        r.writeString(QStringLiteral("Username"), CredentialCipher::encrypt(QStringLiteral("SYSDBA")));
        r.writeString(QStringLiteral("Password"), CredentialCipher::encrypt(QStringLiteral("masterkey")));
    }
}

ProgramTestEnv::~ProgramTestEnv()
{
    m_dm.reset();
    if (m_log)
        setErrorLog(nullptr);
    setProgramFolder(QString());
    qunsetenv("VARNIK_HKLM");
}

TDM2& ProgramTestEnv::dm()
{
    if (!m_dm)
        m_dm = std::make_unique<TDM2>();
    return *m_dm;
}

bool ProgramTestEnv::writeFile(const QString& name, const QByteArray& bytes) const
{
    QFile f(file(name));
    if (!f.open(QIODevice::WriteOnly | QIODevice::Truncate))
        return false;
    return f.write(bytes) == bytes.size();
}

QByteArray ProgramTestEnv::readFile(const QString& name) const
{
    QFile f(file(name));
    return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray();
}

} // namespace orvanta::test
