#pragma once
// The running monitor: listens on its own socket for the program's quit (1735) and
// pause/resume (1740) messages and for the commands of the command line ("CALL <number>
// [<called number>]", "CONTACT <log id>", "STATE"); logs calls into the database and tells the
// program. One runs at a time: it holds the mutex "Varnik Rufwarte" while it runs.

#include "platform/RufwarteIni.h"

#include <QDateTime>
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

class RouterSource;

class Monitor final : public QObject {
    Q_OBJECT

public:
    static constexpr const char* MutexName = "Varnik Rufwarte";

    Monitor();
    ~Monitor() override;

    // Whether a monitor runs now (holds the mutex, or answers on the socket).
    [[nodiscard]] static bool isRunning();

    enum class DatabaseAtStart { Required, MayFollow };
    // Connects with the registry's connection data and opens the socket; false with a message.
    // MayFollow: a database out of reach is reported and tried again when there is a call.
    bool start(QString& error, DatabaseAtStart database = DatabaseAtStart::Required);
    [[nodiscard]] bool isPaused() const { return m_paused; }
    // Logs a random call every few seconds (0 = never).
    void setAutoCallInterval(int seconds);

    // Inserts one call and sends the log-changed message; the new key, or 0 (paused, failure).
    int logCall(const QString& fromPhone, const QString& onMsn, bool postMessage);

    // The program's message socket: tells it about a new call or asks for a contact.
    static bool tellProgram(int message, qint64 wParam);

    // Takes the calls of a router's call monitor from now on (pausing applies to them too).
    void watchRouter(RouterSource* source);

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
    RouterSource* m_router = nullptr;
    bool m_paused = false;
};

// One finished call as the log keeps it.
struct LoggedCall {
    enum Direction { Incoming = 0, Outgoing = 1 }; // the values of LOG.CTYPE
    int direction = Incoming;
    QString number;    // the other party (caller or called); empty when the caller withheld it
    QString ownNumber; // the own number (MSN) called or used
    bool answered = false;
    QDateTime start;
    int durationSeconds = 0;
    // Read back from the queue file: it may have been written just before the monitor ended, so
    // an identical row means it is logged already.
    bool mayBeLogged = false;
};

enum class WriteResult {
    Written,
    LockConflict, // another writer held a row or took the key: worth trying again at once
    Failed,       // the database refused or is gone: the attachment is not to be trusted
};

// Connects to the database named in the monitor's registry key. Throws AppException.
std::unique_ptr<FbAttachment> connectFromRegistry();
// Writes one LOG row for a call in one transaction: the caller's text is the contact's name when a
// stored number matches, else the number, "Nummer unterdrückt" when withheld; the region comes
// from the area-code tables, the own number's name from the MSN list. `lid` gets the new key,
// `error` the reason of a failure.
WriteResult writeCall(FbAttachment& db, const LoggedCall& call, const QList<MsnRecord>& msns, int& lid,
                      QString& error);
// Inserts one incoming unanswered call now; returns its key. Throws AppException.
int insertCall(FbAttachment& db, const QString& fromPhone, const QString& onMsn);
// One line of the monitor's output (standard output, flushed).
void say(const QString& text);
// The MSN list of the program folder.
[[nodiscard]] QList<MsnRecord> programFolderMsns();

} // namespace orvanta::rufwarte
