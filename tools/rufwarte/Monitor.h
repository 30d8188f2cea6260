#pragma once
// The running monitor: listens on its own socket for the program's quit (1735) and
// pause/resume (1740) messages and for the commands of the command line ("CALL <number>
// [<called number>]", "CONTACT <log id>"); logs calls into the database and tells the program.

#include <QObject>
#include <QTimer>

#include <memory>

class QLocalServer;
class QLocalSocket;

namespace orvanta {
class FbAttachment;
}

namespace orvanta::rufwarte {

class Monitor final : public QObject {
    Q_OBJECT

public:
    Monitor();
    ~Monitor() override;

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

    std::unique_ptr<FbAttachment> m_db;
    QLocalServer* m_server = nullptr;
    QTimer m_autoCall;
    bool m_paused = false;
};

// Connects to the database named in the monitor's registry key. Throws AppException.
std::unique_ptr<FbAttachment> connectFromRegistry();
// Inserts one incoming call now; returns its key. Throws AppException.
int insertCall(FbAttachment& db, const QString& fromPhone, const QString& onMsn);

} // namespace orvanta::rufwarte
