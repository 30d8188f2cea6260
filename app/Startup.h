#pragma once
// The program's entry: the single-instance rule, the data module, the main window, the message
// loop and the tear-down order.

#include <QString>
#include <QStringList>

#include <memory>

namespace orvanta {

class NamedMutex;

class Startup final {
public:
    static constexpr const char* BackupMutexName = "Varnik Rufwarte Backup&Restore";
    static constexpr const char* InstanceMutexName = "Varnik Orvanta";

    // Whether this process may run: not while the monitor's backup tool runs, and only as the
    // one instance. On true, instance holds the instance mutex until the end of the run.
    [[nodiscard]] static bool mayStart(std::unique_ptr<NamedMutex>& instance);

    // A refused second start: asks the running instance to bring its window to the front and
    // passes on a valid "/co-" switch. False when no instance took it within waitMs.
    static bool handToRunningInstance(const QStringList& parameters, int waitMs);

    // The whole run; returns the exit code. A refused start ends at once and silently.
    static int run(int argc, char* argv[]);
};

} // namespace orvanta
