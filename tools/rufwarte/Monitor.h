#pragma once
// The running monitor: listens on its own socket for the program's quit (1735) and
// pause/resume (1740) messages and for the commands of the command line ("CALL <number>
// [<called number>]", "CONTACT <log id>", "STATE"); logs calls into the database and tells the
// program. One runs at a time: it holds the mutex "Varnik Rufwarte" while it runs.

#include <QObject>
#include <QTimer>

#include <memory>

class QLocalServer;
class QLocalSocket;

namespace orvanta {
class FbAttachment;
class NamedMutex;
}

namespace orvanta::rufwarte {

class Monitor final : public QObject {
    Q_OBJECT

public:
    static constexpr const char* MutexName = "Varnik Rufwarte";

    Monitor();
    ~Monitor() override;

    // Whether a monitor runs now (holds the mutex, or answers on the socket).
    [[nodiscard]] static bool isRunning();

    // Connects with the registry's connection data and opens the socket; false with a message.
    bool start(QString& error);
    [[nodiscard]] bool isPaused() const { return m_paused; }
    // Logs a random call every few seconds (0 = never).
    void setAutoCallInterval(int seconds);

    // Inserts one call and sends the log-changed message; the new key, or 0 (paused, failure).
    int logCall(const QString& fromPhone, const QString& onMsn, bool postMessage);

    // The program's message socket: tells it about a new call or asks for a contact.
    static bool tellProgram(int message, qint64 wParam);

Q_SIGNALS:
    void quitRequested();

private:
    void handleLine(const QByteArray& line, QLocalSocket* socket);
    bool listen(QString& error);
    // A socket file removed under a running monitor would cut the program off from it.
    void keepSocket();

    std::unique_ptr<NamedMutex> m_instance;
    std::unique_ptr<FbAttachment> m_db;
    QLocalServer* m_server = nullptr;
    QTimer m_autoCall;
    QTimer m_socketWatch;
    bool m_paused = false;
};

// Connects to the database named in the monitor's registry key. Throws AppException.
std::unique_ptr<FbAttachment> connectFromRegistry();
// Inserts one incoming call now; returns its key. Throws AppException.
int insertCall(FbAttachment& db, const QString& fromPhone, const QString& onMsn);

} // namespace orvanta::rufwarte
