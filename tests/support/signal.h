#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>

namespace testsupport {

// A flag one thread raises and another waits for, within a limit.
class Signal
{
public:
    void Raise()
    {
        std::lock_guard lock(m_lock);
        m_raised = true;
        m_changed.notify_all();
    }

    // False when the limit ran out first.
    bool WaitFor(std::chrono::milliseconds limit)
    {
        std::unique_lock lock(m_lock);
        return m_changed.wait_for(lock, limit, [this] { return m_raised; });
    }

private:
    std::mutex m_lock;
    std::condition_variable m_changed;
    bool m_raised = false;
};

} // namespace testsupport
