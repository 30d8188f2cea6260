#include "db/StoredConnection.h"

#include "db/CredentialCipher.h"
#include "db/FbAttachment.h"
#include "platform/Registry.h"

namespace orvanta {

StoredConnection StoredConnection::read()
{
    QString database;
    QString user;
    QString password;
    {
        Registry registry(RegistryRoot::LocalMachine);
        if (registry.openKeyReadOnly(QString::fromLatin1(kRegistryKey))) {
            password = registry.readString(QStringLiteral("Password"));
            user = registry.readString(QStringLiteral("Username"));
            database = registry.readString(QStringLiteral("Database"));
        }
    }
    return StoredConnection{database, CredentialCipher::decrypt(user), CredentialCipher::decrypt(password)};
}

QString StoredConnection::readDatabaseName()
{
    Registry registry(RegistryRoot::LocalMachine);
    if (!registry.openKeyReadOnly(QString::fromLatin1(kRegistryKey)))
        return {};
    return registry.readString(QStringLiteral("Database"));
}

bool StoredConnection::write() const
{
    Registry registry(RegistryRoot::LocalMachine);
    if (!registry.openKey(QString::fromLatin1(kRegistryKey), true))
        return false;
    return registry.writeStrings({{QStringLiteral("Database"), database},
                                  {QStringLiteral("Username"), CredentialCipher::encrypt(user)},
                                  {QStringLiteral("Password"), CredentialCipher::encrypt(password)}});
}

void StoredConnection::test() const
{
    FbAttachment attachment;
    attachment.attach(database, user, password);
    attachment.disconnect();
}

} // namespace orvanta
