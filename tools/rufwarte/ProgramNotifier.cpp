#include "tools/rufwarte/ProgramNotifier.h"

#include "platform/MonitorLink.h"
#include "tools/rufwarte/Monitor.h"

namespace orvanta::rufwarte {

ProgramNotifier::ProgramNotifier()
    : m_thread([this] { run(); })
{
}

ProgramNotifier::~ProgramNotifier()
{
    {
        const std::lock_guard lock(m_mutex);
        m_stopping = true;
    }
    m_wake.notify_one();
    m_thread.join();
}

void ProgramNotifier::logChanged(int lid)
{
    {
        const std::lock_guard lock(m_mutex);
        m_pendingLid = lid;
        m_pending = true;
    }
    m_wake.notify_one();
}

int ProgramNotifier::sent() const
{
    const std::lock_guard lock(m_mutex);
    return m_sent;
}

void ProgramNotifier::run()
{
    std::unique_lock lock(m_mutex);
    for (;;) {
        m_wake.wait(lock, [this] { return m_pending || m_stopping; });
        if (!m_pending)
            return;
        const int lid = m_pendingLid;
        m_pending = false;
        lock.unlock();
        const bool delivered = Monitor::tellProgram(MonitorLink::MonitorLogChangedSend, lid);
        lock.lock();
        if (delivered)
            ++m_sent;
    }
}

} // namespace orvanta::rufwarte
