#pragma once
// The set-up every test of the program's upper layers shares: a temporary program folder holding
// the registry stand-in, a fresh database reached through the registry with encrypted credentials
// as at a real start, scripted dialogs, a fixed clock, the data module on demand and, if asked
// for, the error log.

#include "db/TDM2.h"
#include "platform/Clock.h"
#include "platform/ErrorLog.h"
#include "tests/support/ScriptedDialogService.h"
#include "tests/support/TempDatabase.h"

#include <QTemporaryDir>

#include <memory>

namespace orvanta::test {

class ProgramTestEnv final {
public:
    enum class ErrorLogSetup { None, Create };

    ProgramTestEnv(const QDateTime& now, ErrorLogSetup errorLog);
    ~ProgramTestEnv();
    ProgramTestEnv(const ProgramTestEnv&) = delete;
    ProgramTestEnv& operator=(const ProgramTestEnv&) = delete;

    TempDatabase& db() { return m_db; }
    // The data module, connected on first use (after the test has filled the database).
    TDM2& dm();
    ScriptedDialogService& dialogs() { return m_dialogs.service(); }
    [[nodiscard]] TvkErrorLog* errorLog() const { return m_log.get(); }
    [[nodiscard]] QString folder() const { return m_dir.path(); }
    [[nodiscard]] QString file(const QString& name) const { return m_dir.filePath(name); }
    [[nodiscard]] bool writeFile(const QString& name, const QByteArray& bytes) const;
    [[nodiscard]] QByteArray readFile(const QString& name) const;

private:
    QTemporaryDir m_dir;
    ScopedFixedClock m_clock;
    ScopedScriptedDialogs m_dialogs;
    TempDatabase m_db;
    std::unique_ptr<TvkErrorLog> m_log;
    std::unique_ptr<TDM2> m_dm;
};

} // namespace orvanta::test
