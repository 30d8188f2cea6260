#pragma once
// The program's error log: every caught failure is appended to a Windows-1252 text file in the
// program folder, grouped into one session per program run of which only the newest are kept,
// and is shown to the user as a message dialog.

#include <QByteArray>
#include <QMutex>
#include <QString>
#include <exception>

namespace orvanta {

class TvkErrorLog final {
public:
    // folder gets a trailing '/' when it has none. Bad parameters (empty folder or file name,
    // maxSessions < 1) or a failed InitialLogFile leave logging disabled, after one dialog.
    TvkErrorLog(const QString& folder, int maxSessions, const QString& fileName);
    ~TvkErrorLog();
    TvkErrorLog(const TvkErrorLog&) = delete;
    TvkErrorLog& operator=(const TvkErrorLog&) = delete;

    // Prepares the file for a new session: keeps the newest sessions that logged something and
    // starts this one. Run by the constructor; returns success.
    bool InitialLogFile();

    // Append a record; show nothing. An empty message writes nothing; failures are silent.
    void LogError(const QString& message, const std::exception* e = nullptr);
    void LogWarning(const QString& message, const std::exception* e = nullptr);
    // Reset the cursor, append the record, then show a modal dialog with the message and, given an
    // exception, "\r\n" + class name + " / " + its message. The dialog shows even when disabled.
    void ShowError(const QString& message, const std::exception* e = nullptr);
    void ShowWarning(const QString& message, const std::exception* e = nullptr);

    [[nodiscard]] bool enabled() const { return m_enabled; }
    [[nodiscard]] const QString& folder() const { return m_folder; }
    [[nodiscard]] const QString& fileName() const { return m_fileName; }
    [[nodiscard]] QString filePath() const { return m_folder + m_fileName; }
    [[nodiscard]] int maxSessions() const { return m_maxSessions; }

    static constexpr const char* kSessionSeparator = "\r\n\r\n***### - Session - ";
    // "dd.mm.yyyy - hh:nn:ss" of the program's clock.
    [[nodiscard]] static QString timeStamp();

private:
    void append(const char* kind, const QString& message, const std::exception* e);

    bool m_enabled = false;
    QString m_folder;
    QString m_fileName;
    int m_maxSessions = 0;
    QMutex m_lock;
};

// The class name the log prints before " / ": AppException::className(), "EOutOfMemory" for
// std::bad_alloc, "Exception" for anything else.
[[nodiscard]] QString exceptionClassName(const std::exception& e);
// The exception's message as text.
[[nodiscard]] QString exceptionMessage(const std::exception& e);
// class name + " / " + message.
[[nodiscard]] QString exceptionLine(const std::exception& e);

// The one shared error log; nullptr before it is created and after it is destroyed. The owner
// (the main window) keeps the object and installs it here; its destructor uninstalls it.
[[nodiscard]] TvkErrorLog* errorLog();
void setErrorLog(TvkErrorLog* log);

// Null-tolerant forms of the log's operations: nothing happens while there is no log.
void reportError(const QString& message, const std::exception* e = nullptr);   // ShowError
void reportWarning(const QString& message, const std::exception* e = nullptr); // ShowWarning
void logError(const QString& message, const std::exception* e = nullptr);      // LogError
void logWarning(const QString& message, const std::exception* e = nullptr);    // LogWarning

} // namespace orvanta
