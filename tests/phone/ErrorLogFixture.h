#pragma once
// A shared error log in a temporary folder and scripted dialogs, installed for one test.

#include "platform/ErrorLog.h"
#include "tests/support/ScriptedDialogService.h"

#include <QFile>
#include <QTemporaryDir>

#include <memory>

namespace orvanta::test {

class ErrorLogFixture final {
public:
    ErrorLogFixture()
        : m_log(std::make_unique<TvkErrorLog>(m_dir.path(), 20, QStringLiteral("OXError.log")))
    {
        setErrorLog(m_log.get());
    }
    ~ErrorLogFixture() { setErrorLog(nullptr); }
    ErrorLogFixture(const ErrorLogFixture&) = delete;
    ErrorLogFixture& operator=(const ErrorLogFixture&) = delete;

    // The log file's text after the session header.
    [[nodiscard]] QByteArray logged() const
    {
        QFile file(m_log->filePath());
        if (!file.open(QIODevice::ReadOnly))
            return {};
        return file.readAll();
    }
    ScriptedDialogService& dialogs() { return m_dialogs.service(); }

private:
    QTemporaryDir m_dir;
    ScopedScriptedDialogs m_dialogs;
    std::unique_ptr<TvkErrorLog> m_log;
};

} // namespace orvanta::test
