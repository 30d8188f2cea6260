#include "platform/ErrorLog.h"

#include "platform/AppException.h"
#include "platform/BusyReset.h"
#include "platform/Clock.h"
#include "platform/DialogService.h"
#include "platform/Windows1252.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <atomic>
#include <new>
#include <vector>

namespace orvanta {
namespace {

std::atomic<TvkErrorLog*> g_errorLog{nullptr};

const QString kCannotLog = QString::fromUtf8("Die Fehlerprotokollierung kann nicht durchgeführt werden.");

void showFailure(const QString& text)
{
    dialogs().show(DialogKind::Error, {}, text, DialogButton::Ok, DialogButton::Ok);
}

// A session that holds only its header (the 21 characters of the time and two line ends) is
// shorter than this.
constexpr qsizetype kMinimumLastSession = 26;

} // namespace

TvkErrorLog::TvkErrorLog(const QString& folder, int maxSessions, const QString& fileName)
    : m_maxSessions(maxSessions)
{
    if (folder.isEmpty() || fileName.isEmpty() || maxSessions < 1) {
        showFailure(QStringLiteral("vkErrorLog - Create\r\nParameter sind nicht korrekt!\r\n") + kCannotLog);
        return;
    }
    m_folder = folder.endsWith(u'/') ? folder : folder + u'/';
    m_fileName = fileName;
    m_enabled = InitialLogFile();
}

TvkErrorLog::~TvkErrorLog()
{
    // The shared reference must never outlive the object it points to.
    TvkErrorLog* self = this;
    g_errorLog.compare_exchange_strong(self, nullptr);
}

QString TvkErrorLog::timeStamp()
{
    return Clock::now().toString(QStringLiteral("dd.MM.yyyy - hh:mm:ss"));
}

bool TvkErrorLog::InitialLogFile()
{
    const QString header = QStringLiteral("vkErrorLog - InitialLogFile\r\n");
    if (m_folder.isEmpty() || !QFileInfo(m_folder).isDir()) {
        showFailure(header + QStringLiteral("Verzeichnis der Fehlerprotokolldatei konnte nicht gefunden werden.\r\n")
                    + kCannotLog);
        return false;
    }

    const QString path = filePath();
    if (!QFileInfo::exists(path)) {
        QFile create(path);
        if (!create.open(QIODevice::WriteOnly | QIODevice::NewOnly)) {
            showFailure(header + QStringLiteral("Fehlerprotokolldatei konnte nicht angelegt werden.\r\n") + kCannotLog);
            return false;
        }
    }

    QByteArray text;
    {
        QFile file(path);
        if (!file.open(QIODevice::ReadOnly) || (text = file.readAll(), file.error() != QFileDevice::NoError)) {
            showFailure(header + QString::fromUtf8("Fehlerprotokolldatei konnte nicht geöffnet werden.\r\n") + kCannotLog
                        + QStringLiteral("\r\n"));
            return false;
        }
    }

    // Split into sessions, each entry beginning with the separator. Text in front of the first
    // separator travels with the first session; a last session that never got a record is dropped.
    const QByteArray separator(kSessionSeparator);
    std::vector<QByteArray> sessions;
    qsizetype at = text.indexOf(separator);
    if (at >= 0) {
        QByteArray rest = text.left(at) + text.mid(at + separator.size());
        for (;;) {
            const qsizetype next = rest.indexOf(separator);
            if (next >= 0) {
                sessions.push_back(separator + rest.left(next));
                rest = rest.mid(next + separator.size());
                continue;
            }
            if (rest.size() >= kMinimumLastSession)
                sessions.push_back(separator + rest);
            break;
        }
    }

    sessions.push_back(separator + toWindows1252(timeStamp()) + "\r\n\r\n");
    const auto keep = static_cast<std::size_t>(m_maxSessions);
    const std::size_t drop = sessions.size() > keep ? sessions.size() - keep : 0;

    QByteArray joined;
    for (std::size_t i = drop; i < sessions.size(); ++i)
        joined += sessions[i];

    QFile file(path);
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate) || file.write(joined) != joined.size() || !file.flush()) {
        showFailure(header + QStringLiteral("Fehlerprotokolldatei konnte nicht geschrieben werden.\r\n") + kCannotLog);
        return false;
    }
    return true;
}

void TvkErrorLog::append(const char* kind, const QString& message, const std::exception* e)
{
    if (!m_enabled)
        return;
    try {
        QMutexLocker lock(&m_lock);
        if (message.isEmpty() || !QFileInfo(m_folder).isDir())
            return;
        QFile file(filePath());
        // An existing file only: a log deleted during the run stays deleted.
        if (!file.open(QIODevice::ReadWrite | QIODevice::ExistingOnly))
            return;
        QString record = QString::fromLatin1(kind) + timeStamp() + QStringLiteral("\r\n") + message;
        if (e != nullptr)
            record += QStringLiteral("\r\n") + exceptionLine(*e);
        record += QStringLiteral("\r\n\r\n");
        file.seek(file.size());
        file.write(toWindows1252(record));
    } catch (...) {
        // A failing log must never take the failure report down with it.
    }
}

void TvkErrorLog::LogError(const QString& message, const std::exception* e)
{
    append("Error: ", message, e);
}

void TvkErrorLog::LogWarning(const QString& message, const std::exception* e)
{
    append("Warning: ", message, e);
}

void TvkErrorLog::ShowError(const QString& message, const std::exception* e)
{
    resetBusyIndicator();
    LogError(message, e);
    QString text = message;
    if (e != nullptr)
        text += QStringLiteral("\r\n") + exceptionLine(*e);
    dialogs().show(DialogKind::Error, {}, text, DialogButton::Ok, DialogButton::Ok);
}

void TvkErrorLog::ShowWarning(const QString& message, const std::exception* e)
{
    resetBusyIndicator();
    LogWarning(message, e);
    QString text = message;
    if (e != nullptr)
        text += QStringLiteral("\r\n") + exceptionLine(*e);
    dialogs().show(DialogKind::Warning, {}, text, DialogButton::Ok, DialogButton::Ok);
}

QString exceptionClassName(const std::exception& e)
{
    if (const auto* app = dynamic_cast<const AppException*>(&e))
        return app->className();
    if (dynamic_cast<const std::bad_alloc*>(&e) != nullptr)
        return QStringLiteral("EOutOfMemory");
    return QStringLiteral("Exception");
}

QString exceptionMessage(const std::exception& e)
{
    if (const auto* app = dynamic_cast<const AppException*>(&e))
        return app->message();
    return QString::fromUtf8(e.what());
}

QString exceptionLine(const std::exception& e)
{
    return exceptionClassName(e) + QStringLiteral(" / ") + exceptionMessage(e);
}

TvkErrorLog* errorLog()
{
    return g_errorLog.load();
}

void setErrorLog(TvkErrorLog* log)
{
    g_errorLog.store(log);
}

void reportError(const QString& message, const std::exception* e)
{
    if (TvkErrorLog* log = errorLog())
        log->ShowError(message, e);
}

void reportWarning(const QString& message, const std::exception* e)
{
    if (TvkErrorLog* log = errorLog())
        log->ShowWarning(message, e);
}

void logError(const QString& message, const std::exception* e)
{
    if (TvkErrorLog* log = errorLog())
        log->LogError(message, e);
}

void logWarning(const QString& message, const std::exception* e)
{
    if (TvkErrorLog* log = errorLog())
        log->LogWarning(message, e);
}

} // namespace orvanta
