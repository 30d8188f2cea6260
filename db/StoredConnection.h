#pragma once
// The connection data in the monitor's registry key: the database name as stored ("host:path"
// for a server, a plain path for the embedded engine) and the user name and password, each
// encrypted by CredentialCipher. The data module reads them at start-up; the monitor's set-up and
// the settings program write them, through the same pair of functions so the two cannot drift.

#include <QString>

namespace orvanta {

struct StoredConnection {
    static constexpr const char* kRegistryKey = "software\\Varnik\\rufwarte";

    QString database;
    QString user;
    QString password;

    // Reads and decrypts the values of HKEY_LOCAL_MACHINE; a missing key or value reads as empty.
    // Throws ConvertError or AppException for a stored value that does not decrypt.
    [[nodiscard]] static StoredConnection read();
    // The database name alone, without touching the credentials; empty when none is stored.
    [[nodiscard]] static QString readDatabaseName();
    // Encrypts and writes the three values with one save. Returns success.
    [[nodiscard]] bool write() const;

    // Connects with these data (ISO8859_1, as the data module does) and disconnects again.
    // Throws DatabaseError with the client's message when the connection fails.
    void test() const;

    friend bool operator==(const StoredConnection&, const StoredConnection&) = default;
};

} // namespace orvanta
