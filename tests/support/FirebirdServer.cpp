#include "tests/support/FirebirdServer.h"

#include "tests/support/TempDatabase.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>
#include <QStandardPaths>
#include <QThread>

#include <arpa/inet.h>
#include <csignal>
#include <netinet/in.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <unistd.h>

namespace orvanta::test {
namespace {

const QString kServerBinary = QStringLiteral("/usr/sbin/firebird");

// The folder of the installed engine's plugins, character sets and messages
// (/usr/lib/<multiarch>/firebird/3.0 on Debian).
QString engineFolder()
{
    const QDir lib(QStringLiteral("/usr/lib"));
    for (const QString& sub : lib.entryList(QDir::Dirs | QDir::NoDotAndDotDot)) {
        const QString candidate = lib.filePath(sub + QStringLiteral("/firebird/3.0"));
        if (QFileInfo::exists(candidate + QStringLiteral("/plugins/libEngine12.so")))
            return candidate;
    }
    return {};
}

QString isqlBinary()
{
    QString found = QStandardPaths::findExecutable(QStringLiteral("isql-fb"));
    if (found.isEmpty())
        found = QStandardPaths::findExecutable(QStringLiteral("isql-fb"), {QStringLiteral("/usr/bin")});
    return found;
}

int loopbackSocket()
{
    return ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
}

sockaddr_in loopback(quint16 port)
{
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_port = htons(port);
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    return a;
}

// Binds port 0 and reads back what the kernel chose; closed again for the server to take.
quint16 freePort()
{
    const int fd = loopbackSocket();
    if (fd < 0)
        return 0;
    sockaddr_in a = loopback(0);
    quint16 port = 0;
    socklen_t len = sizeof a;
    if (::bind(fd, reinterpret_cast<sockaddr*>(&a), sizeof a) == 0
        && ::getsockname(fd, reinterpret_cast<sockaddr*>(&a), &len) == 0)
        port = ntohs(a.sin_port);
    ::close(fd);
    return port;
}

bool accepts(quint16 port)
{
    const int fd = loopbackSocket();
    if (fd < 0)
        return false;
    const sockaddr_in a = loopback(port);
    const bool ok = ::connect(fd, reinterpret_cast<const sockaddr*>(&a), sizeof a) == 0;
    ::close(fd);
    return ok;
}

bool writeText(const QString& path, const QString& text)
{
    QFile f(path);
    return f.open(QIODevice::WriteOnly | QIODevice::Truncate) && f.write(text.toUtf8()) >= 0;
}

} // namespace

FirebirdServer::FirebirdServer(QString password)
    : m_password(std::move(password))
{
}

FirebirdServer::~FirebirdServer()
{
    stop();
}

QString FirebirdServer::unavailableReason()
{
    if (!QFileInfo(kServerBinary).isExecutable())
        return QStringLiteral("No Firebird server here (%1 missing; package firebird3.0-server)").arg(kServerBinary);
    if (engineFolder().isEmpty())
        return QStringLiteral("No Firebird engine plugins under /usr/lib/*/firebird/3.0 (package firebird3.0-server-core)");
    if (isqlBinary().isEmpty())
        return QStringLiteral("isql-fb missing (package firebird3.0-utils)");
    return {};
}

QProcessEnvironment FirebirdServer::environment() const
{
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    env.insert(QStringLiteral("FIREBIRD"), m_root.path());
    env.insert(QStringLiteral("FIREBIRD_LOCK"), m_root.filePath(QStringLiteral("lock")));
    env.insert(QStringLiteral("FIREBIRD_TMP"), m_root.filePath(QStringLiteral("tmp")));
    return env;
}

bool FirebirdServer::prepare()
{
    if (m_prepared)
        return true;
    const QString reason = unavailableReason();
    if (!reason.isEmpty()) {
        m_error = reason;
        return false;
    }
    if (!m_root.isValid()) {
        m_error = QStringLiteral("Cannot create a temporary folder");
        return false;
    }
    const QDir root(m_root.path());
    for (const char* sub : {"lock", "tmp", "data"})
        root.mkpath(QString::fromLatin1(sub));
    // The server looks for plugins, character sets and messages beside its configuration.
    const QString engine = engineFolder();
    for (const char* item : {"plugins", "UDF", "lib", "firebird.msg"}) {
        const QString target = engine + QLatin1Char('/') + QString::fromLatin1(item);
        if (QFileInfo::exists(target))
            QFile::link(target, root.filePath(QString::fromLatin1(item)));
    }
    // The character sets must be a real file below the root: the engine refuses a module whose
    // resolved path lies elsewhere, and then knows no ISO8859_1.
    root.mkpath(QStringLiteral("intl"));
    for (const char* item : {"libfbintl.so", "fbintl.conf"})
        QFile::copy(engine + QStringLiteral("/intl/") + QString::fromLatin1(item),
                    root.filePath(QStringLiteral("intl/") + QString::fromLatin1(item)));
    const QString security = root.filePath(QStringLiteral("security3.fdb"));
    m_port = freePort();
    const bool written =
        writeText(root.filePath(QStringLiteral("firebird.conf")),
                  QStringLiteral("RemoteBindAddress = 127.0.0.1\n"
                                 "RemoteServicePort = %1\n"
                                 "SecurityDatabase = %2\n"
                                 "TempDirectories = %3\n"
                                 "ServerMode = Super\n"
                                 "UdfAccess = None\n"
                                 "AuthServer = Srp\n")
                      .arg(m_port)
                      .arg(security, root.filePath(QStringLiteral("tmp"))))
        && writeText(root.filePath(QStringLiteral("databases.conf")),
                     QStringLiteral("security.db = %1\n{\n\tRemoteAccess = false\n}\n").arg(security))
        && writeText(root.filePath(QStringLiteral("plugins.conf")),
                     QStringLiteral("Plugin = UDR {\n\tModule = $(dir_plugins)/udr_engine\n\tConfig = UDR_config\n}\n"
                                    "Config = UDR_config {\n\tpath = $(dir_plugins)/udr\n}\n"));
    if (!written || m_port == 0) {
        m_error = QStringLiteral("Cannot write the server's configuration in %1").arg(root.path());
        return false;
    }
    // An empty security database, opened in-process by isql; the user manager makes its tables
    // when the first user is created.
    QString literal = m_password;
    literal.replace(QLatin1Char('\''), QStringLiteral("''"));
    const QString script = QStringLiteral("CREATE DATABASE '%1' USER 'SYSDBA';\n"
                                          "CREATE USER SYSDBA PASSWORD '%2' USING PLUGIN Srp;\n"
                                          "COMMIT;\n")
                               .arg(security, literal);
    QByteArray output;
    if (runTool(isqlBinary(), {QStringLiteral("-q")}, &output, script.toUtf8()) != 0 || !QFileInfo::exists(security)
        || output.contains("failed")) {
        m_error = QStringLiteral("Cannot create the security database: %1").arg(QString::fromLocal8Bit(output));
        return false;
    }
    m_prepared = true;
    return true;
}

bool FirebirdServer::start()
{
    if (isRunning())
        return true;
    if (!prepare())
        return false;
    m_process = std::make_unique<QProcess>();
    m_process->setProgram(kServerBinary);
    m_process->setProcessEnvironment(environment());
    m_process->setWorkingDirectory(m_root.path());
    m_process->setProcessChannelMode(QProcess::MergedChannels);
    m_process->setStandardOutputFile(m_root.filePath(QStringLiteral("server.out")), QIODevice::Append);
    // A test process that dies must not leave its server behind.
    m_process->setChildProcessModifier([] { ::prctl(PR_SET_PDEATHSIG, SIGKILL); });
    m_process->start();
    if (!m_process->waitForStarted(5000)) {
        m_error = QStringLiteral("%1 did not start: %2").arg(kServerBinary, m_process->errorString());
        m_process.reset();
        return false;
    }
    const QDeadlineTimer deadline(20000);
    while (!accepts(m_port)) {
        if (m_process->state() != QProcess::Running || deadline.hasExpired()) {
            QFile out(m_root.filePath(QStringLiteral("server.out")));
            const QByteArray said = out.open(QIODevice::ReadOnly) ? out.readAll() : QByteArray();
            m_error = QStringLiteral("The server does not accept connections on 127.0.0.1:%1 (%2)")
                          .arg(m_port)
                          .arg(QString::fromLocal8Bit(said).trimmed());
            kill();
            return false;
        }
        QThread::msleep(20);
    }
    return true;
}

void FirebirdServer::stop()
{
    if (!m_process)
        return;
    if (m_process->state() != QProcess::NotRunning) {
        m_process->terminate();
        if (!m_process->waitForFinished(10000)) {
            m_process->kill();
            m_process->waitForFinished(5000);
        }
    }
    m_process.reset();
}

void FirebirdServer::kill()
{
    if (!m_process)
        return;
    if (m_process->state() != QProcess::NotRunning) {
        m_process->kill();
        m_process->waitForFinished(5000);
    }
    m_process.reset();
}

bool FirebirdServer::isRunning() const
{
    return m_process && m_process->state() == QProcess::Running;
}

qint64 FirebirdServer::pid() const
{
    return m_process ? m_process->processId() : 0;
}

QString FirebirdServer::dataFolder() const
{
    return m_root.filePath(QStringLiteral("data"));
}

QString FirebirdServer::databaseName(const QString& filePath) const
{
    return QStringLiteral("127.0.0.1/%1:%2").arg(m_port).arg(QFileInfo(filePath).absoluteFilePath());
}

QString FirebirdServer::newDatabase(const QString& fileName) const
{
    const QString path = QDir(dataFolder()).filePath(fileName);
    TempDatabase::copySchemaTo(path);
    return path;
}

int FirebirdServer::runTool(const QString& tool, const QStringList& args, QByteArray* output,
                            const QByteArray& input) const
{
    QProcess p;
    p.setProcessEnvironment(environment());
    p.setWorkingDirectory(m_root.path());
    p.setProcessChannelMode(QProcess::MergedChannels);
    const QString program = tool.contains(QLatin1Char('/')) ? tool : QStandardPaths::findExecutable(tool);
    p.start(program.isEmpty() ? tool : program, args);
    if (!p.waitForStarted(5000))
        return -1;
    if (!input.isEmpty())
        p.write(input);
    p.closeWriteChannel();
    if (!p.waitForFinished(120000)) {
        p.kill();
        p.waitForFinished(2000);
        return -1;
    }
    if (output)
        *output = p.readAll();
    return p.exitStatus() == QProcess::NormalExit ? p.exitCode() : -1;
}

SilentListener::SilentListener()
{
    m_fd = loopbackSocket();
    if (m_fd < 0)
        return;
    sockaddr_in a = loopback(0);
    socklen_t len = sizeof a;
    // Nobody ever calls accept(): the kernel completes the handshakes, the bytes sent go unread.
    if (::bind(m_fd, reinterpret_cast<sockaddr*>(&a), sizeof a) == 0 && ::listen(m_fd, 16) == 0
        && ::getsockname(m_fd, reinterpret_cast<sockaddr*>(&a), &len) == 0)
        m_port = ntohs(a.sin_port);
}

SilentListener::~SilentListener()
{
    if (m_fd >= 0)
        ::close(m_fd);
}

} // namespace orvanta::test
