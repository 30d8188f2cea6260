#pragma once
// A real Firebird 3 server of the test's own, run from a temporary folder: its own firebird.conf
// (127.0.0.1 and a free port only), its own security database with a SYSDBA password the test
// chooses, its own lock and temporary folders. The installed system service is never touched.
//
//   FirebirdServer server;
//   if (!FirebirdServer::unavailableReason().isEmpty())
//       QSKIP(qPrintable(FirebirdServer::unavailableReason()));
//   QVERIFY2(server.start(), qPrintable(server.error()));
//   const QString name = server.databaseName(server.newDatabase("calls.fdb"));  // "127.0.0.1/port:/…"
//
// The server stops when the object goes, also when the test fails; a test process that dies
// takes the server with it.

#include <QByteArray>
#include <QProcessEnvironment>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>

#include <memory>

class QProcess;

namespace orvanta::test {

class FirebirdServer final {
public:
    static constexpr const char* User = "SYSDBA";

    explicit FirebirdServer(QString password = QStringLiteral("Wart3-Schluessel"));
    ~FirebirdServer();
    FirebirdServer(const FirebirdServer&) = delete;
    FirebirdServer& operator=(const FirebirdServer&) = delete;

    // Why no server can be run on this machine (a package missing), empty when one can.
    [[nodiscard]] static QString unavailableReason();

    // Prepares the folder (first time only), starts the server and waits until it accepts
    // connections. A restart keeps folder, port and password. False: see error().
    [[nodiscard]] bool start();
    // Asks the server to shut down and waits; kills it when it does not go.
    void stop();
    // SIGKILL, as a crash or a pulled plug would end it.
    void kill();
    [[nodiscard]] bool isRunning() const;
    [[nodiscard]] qint64 pid() const;
    [[nodiscard]] const QString& error() const { return m_error; }

    [[nodiscard]] quint16 port() const { return m_port; }
    [[nodiscard]] const QString& password() const { return m_password; }
    // A folder for the test's database files.
    [[nodiscard]] QString dataFolder() const;
    // The name a client connects with: "127.0.0.1/port:" + the absolute file path.
    [[nodiscard]] QString databaseName(const QString& filePath) const;
    // A new database file with the program's schema in dataFolder(); returns its path.
    [[nodiscard]] QString newDatabase(const QString& fileName) const;

    // Runs a Firebird tool (gfix, isql-fb) and returns its exit code (-1: did not run); output
    // gets stdout and stderr together.
    int runTool(const QString& tool, const QStringList& args, QByteArray* output = nullptr,
                const QByteArray& input = {}) const;

private:
    bool prepare();
    [[nodiscard]] QProcessEnvironment environment() const;

    QTemporaryDir m_root;
    QString m_password;
    quint16 m_port = 0;
    bool m_prepared = false;
    QString m_error;
    std::unique_ptr<QProcess> m_process;
};

// A TCP port on 127.0.0.1 that accepts connections into its backlog but never answers, like a
// server that hangs; closed with the object.
class SilentListener final {
public:
    SilentListener();
    ~SilentListener();
    SilentListener(const SilentListener&) = delete;
    SilentListener& operator=(const SilentListener&) = delete;
    [[nodiscard]] quint16 port() const { return m_port; }

private:
    int m_fd = -1;
    quint16 m_port = 0;
};

} // namespace orvanta::test
