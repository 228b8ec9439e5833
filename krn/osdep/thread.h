#pragma once

#include <pthread.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <exception>

namespace cv::krn::osdep {

// A thread whose body is the virtual Run() of a derived class. Built on
// pthreads rather than std::thread, which cannot set a stack size.
//
// Every derived class must call Join() in its own destructor: by the time
// ~Thread runs, the derived part is gone, and a body still running would use
// a destroyed object. ~Thread joins as a last resort only. For the same
// reason an object must not be destroyed by its own body.
//
// An exception that escapes Run() does not end the process: the thread ends
// with result 0xFFFFFFFF (or the Code() of a library exception) and the
// exception is kept for Failure().
class Thread
{
public:
    Thread();
    virtual ~Thread();

    Thread(const Thread &) = delete;
    Thread &operator=(const Thread &) = delete;

    // Starts Run() on a new thread with stackSize bytes of stack (0: the
    // platform default; smaller than the platform minimum: the minimum).
    //
    // priority uses the Windows scale (-15 idle, -2 lowest, -1 below normal,
    // 0 normal, 1 above normal, 2 highest, 15 time critical); a non-zero one
    // is applied by the new thread to itself as a nice offset of -5 per step
    // (idle 19, time critical -20). When the system refuses a higher
    // priority to an unprivileged user the thread runs at normal priority:
    // a priority is a hint, not a reason to fail.
    //
    // Raises PosixError (source "Thread") when no thread could be created,
    // leaving none; InvalidOperation when a thread was started and not yet
    // joined.
    void Start(int priority = 0, std::size_t stackSize = 0);

    // Waits without time limit until the thread has ended; nothing to do
    // when there is none. Raises InvalidOperation when called by the thread
    // itself.
    void Join();

    // True from Start until Run() has returned.
    bool IsRunning() const noexcept { return m_running.load(std::memory_order_acquire); }

    // What Run() returned, and what escaped it; valid after Join().
    std::uint32_t Result() const noexcept { return m_result; }
    std::exception_ptr Failure() const noexcept { return m_failure; }

protected:
    virtual std::uint32_t Run() = 0;

private:
    static void *Entry(void *self);
    void RunBody();

    pthread_t m_handle{};
    bool m_started = false;
    int m_priority = 0;
    std::atomic<bool> m_running{false};
    std::uint32_t m_result = 0;
    std::exception_ptr m_failure;
};

} // namespace cv::krn::osdep
