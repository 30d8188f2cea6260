#pragma once
// Tells the program about logged calls without making the monitor wait for it. A program busy
// refreshing accepts its socket late; sending from the writing loop held the monitor to the
// program's pace (about one call per refresh). Here a thread of its own sends, and messages that
// pile up meanwhile become one carrying the newest key: the program reads every call above the
// keys it holds on any log-changed message, so nothing is missed by merging them.

#include <condition_variable>
#include <mutex>
#include <thread>

namespace orvanta::rufwarte {

class ProgramNotifier final {
public:
    ProgramNotifier();
    // Sends what is still pending, then ends the thread.
    ~ProgramNotifier();
    ProgramNotifier(const ProgramNotifier&) = delete;
    ProgramNotifier& operator=(const ProgramNotifier&) = delete;

    // Queues the log-changed message for this key; returns at once.
    void logChanged(int lid);
    // How many messages went out (for the monitor's own tests and output).
    [[nodiscard]] int sent() const;

private:
    void run();

    mutable std::mutex m_mutex;
    std::condition_variable m_wake;
    int m_pendingLid = 0;
    bool m_pending = false;
    bool m_stopping = false;
    int m_sent = 0;
    std::thread m_thread;
};

} // namespace orvanta::rufwarte
