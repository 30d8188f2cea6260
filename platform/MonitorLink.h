#pragma once
// The message link between the program and the call monitor. Both listen on a local socket in
// the runtime folder ($XDG_RUNTIME_DIR, else the temporary folder): the program on
// "Varnik Orvanta.msg", the monitor on "Varnik Rufwarte.msg". A message is one line
// "number wParam lParam". The monitor "window exists" when its socket accepts a connection.
//
// The program side turns the monitor's messages into its own (the message filter of start-up):
//   1729 -> WMLOGINFOCHANGE, sent at once, wParam passed on
//   1733 -> WMLOGINFOCHANGE, posted, wParam passed on
//   1736 -> swallowed
//   1744 -> WMCONTACTDATAFROMSCREEN, posted, wParam = log record id
// A second start of the program uses the same socket: WMBRINGTOFRONT is posted as it comes, and
// its "/co-" switch travels as 1744. Anything else, and malformed lines, are dropped.

#include "platform/WindowMessages.h"

#include <QObject>
#include <QPointer>
#include <QStringList>

class QLocalServer;
class QLocalSocket;

namespace orvanta {

enum class MonitorState { Absent, Running, Paused };

class MonitorLink final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(MonitorLink)

public:
    // The monitor's own messages.
    static constexpr int MonitorLogChangedSend = WMMONITOR_LOGCHANGED_SEND;  // 1729
    static constexpr int MonitorLogChangedPost = WMMONITOR_LOGCHANGED_POST;  // 1733
    static constexpr int MonitorQuit = WMMONITOR_QUIT;                       // 1735
    static constexpr int MonitorIgnored = WMMONITOR_IGNORED;                 // 1736
    static constexpr int MonitorPauseResume = WMMONITOR_PAUSERESUME;         // 1740
    static constexpr int MonitorContactFromCall = WMMONITOR_CONTACTFROMLOG;  // 1744

    explicit MonitorLink(QObject* parent = nullptr);
    ~MonitorLink() override;

    [[nodiscard]] static QString runtimeFolder();
    [[nodiscard]] static QString programSocketPath();
    [[nodiscard]] static QString monitorSocketPath();

    // Starts listening for the monitor's messages; they go to target. False when the socket
    // cannot be opened (the program then runs without the monitor's messages).
    bool startListening(QObject* target);
    void stopListening();
    [[nodiscard]] bool isListening() const;

    // Whether the monitor's window exists (its socket accepts a connection).
    [[nodiscard]] bool monitorWindowExists() const;
    // What the monitor is doing now: Absent when its socket does not answer.
    [[nodiscard]] MonitorState monitorState() const;
    // Posts a message (wParam and lParam 0) to the monitor; false when it is not there.
    bool postToMonitor(int message) const;

    // Writes one message line to a socket; false when nobody listens there.
    static bool sendLine(const QString& socketPath, int message, qint64 wParam, qint64 lParam, int timeoutMs = 1000);
    // Parses "number wParam lParam"; false for anything else.
    [[nodiscard]] static bool parseLine(QByteArrayView line, int& message, qint64& wParam, qint64& lParam);

    // The message filter: turns one monitor message into the program's own for target.
    // Returns whether the message was one of the monitor's (and so handled).
    static bool filterMessage(QObject* target, int message, qint64 wParam, qint64 lParam);

    // A second start hands its business to the running program: bring the main window to the
    // front, then the "/co-" switch (a valid one) as 1744. False when nobody listens.
    static bool handToRunningProgram(const QStringList& parameters, int timeoutMs = 1000);

    // The monitor's answer to its state question, one line each.
    static constexpr const char* StateQuestion = "STATE";
    static constexpr const char* StateRunning = "running";
    static constexpr const char* StatePaused = "paused";

private:
    void readClient(QLocalSocket* socket);
    static bool writeLines(const QString& socketPath, const QByteArray& lines, int timeoutMs);

    QLocalServer* m_server = nullptr;
    QPointer<QObject> m_target;
};

} // namespace orvanta
