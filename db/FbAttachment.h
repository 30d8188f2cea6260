#pragma once
// One connection to a Firebird database. A plain path opens the file in-process with the embedded
// engine; "host:path" goes through a server. Connection parameters are lines "name=value" in the
// order the caller gives them ("user_name=", "password=", "lc_ctype=", "sql_role_name=").

#include <QString>
#include <QStringList>

#include <functional>
#include <memory>

namespace orvanta {

class FbTransaction;
class FbStatement;

class FbAttachment final {
public:
    FbAttachment();
    explicit FbAttachment(QString databaseName, QStringList params = {});
    ~FbAttachment();
    FbAttachment(const FbAttachment&) = delete;
    FbAttachment& operator=(const FbAttachment&) = delete;

    [[nodiscard]] const QString& databaseName() const;
    void setDatabaseName(const QString& name);
    [[nodiscard]] const QStringList& params() const;
    [[nodiscard]] QStringList& params();
    void setParams(QStringList params);

    // Sets name and parameters (user, password, lc_ctype=ISO8859_1) and connects.
    void attach(const QString& databaseName, const QString& user, const QString& password);
    // Connects with the current name and parameters. Throws DatabaseError.
    void connect();
    // Closes statements, ends active transactions with their end action, then detaches.
    void disconnect();
    [[nodiscard]] bool isConnected() const;
    // Whether the server still answers on this connection. One found broken (server stopped,
    // network gone) is let go without the server: its transactions and statements end, and
    // isConnected() is false from then on.
    [[nodiscard]] bool ping();

    // Called before the connection goes away (data sets close themselves here).
    void setBeforeDisconnect(std::function<void()> hook);

    // Runs one statement without parameters or results: DDL, procedure bodies, scripts.
    void executeImmediate(const QString& sql, FbTransaction& transaction);

    // Creates an empty database (dialect 3, default character set ISO8859_1) and leaves it closed.
    // Without forced writes the engine does not sync every page write (scratch databases only).
    static void createDatabase(const QString& databaseName, const QString& user, const QString& password,
                               int pageSize = 8192, bool forcedWrites = true);
    // The client library's version: "3.0.11.33637" (major, minor, patch level, build).
    [[nodiscard]] static QString clientVersion();
    // Deletes the connected database file (tests, tools).
    void dropDatabase();

    struct Private;
    [[nodiscard]] Private* d_func() const { return d.get(); }

private:
    std::unique_ptr<Private> d;
};

} // namespace orvanta
