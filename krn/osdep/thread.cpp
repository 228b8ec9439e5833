#include "krn/osdep/thread.h"

#include "krn/exception/invalidoperation.h"
#include "krn/osdep/posixerror.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cxxabi.h>
#include <sys/resource.h>
#include <unistd.h>

namespace cv::krn::osdep {

namespace {

constexpr const char *kSource = "Thread";

int NiceOffset(int priority)
{
    if (priority <= -15)
        return 19;
    if (priority >= 15)
        return -20;
    return -5 * priority;
}

void ApplyPriority(int priority)
{
    const id_t self = static_cast<id_t>(::gettid());
    errno = 0;
    const int current = ::getpriority(PRIO_PROCESS, self);
    if (current == -1 && errno != 0)
        return;
    const int wanted = std::clamp(current + NiceOffset(priority), -20, 19);
    // Refused (EACCES, EPERM) for an unprivileged raise: keep running as is.
    ::setpriority(PRIO_PROCESS, self, wanted);
}

std::size_t UsableStackSize(std::size_t requested)
{
    const long minimum = ::sysconf(_SC_THREAD_STACK_MIN);
    const std::size_t floor = minimum > 0 ? static_cast<std::size_t>(minimum) : static_cast<std::size_t>(PTHREAD_STACK_MIN);
    return std::max(requested, floor);
}

class Attributes final
{
public:
    Attributes()
    {
        if (const int error = ::pthread_attr_init(&m_attr))
            throw PosixError(static_cast<std::uint32_t>(error), kSource, __LINE__);
    }
    ~Attributes() { ::pthread_attr_destroy(&m_attr); }
    Attributes(const Attributes &) = delete;
    Attributes &operator=(const Attributes &) = delete;

    void SetStackSize(std::size_t size)
    {
        if (const int error = ::pthread_attr_setstacksize(&m_attr, UsableStackSize(size)))
            throw PosixError(static_cast<std::uint32_t>(error), kSource, __LINE__);
    }
    const pthread_attr_t *Get() const { return &m_attr; }

private:
    pthread_attr_t m_attr;
};

} // namespace

Thread::Thread() = default;

Thread::~Thread()
{
    if (!m_started)
        return;
    if (::pthread_equal(m_handle, ::pthread_self()))
        ::pthread_detach(m_handle);
    else
        ::pthread_join(m_handle, nullptr);
}

void Thread::Start(int priority, std::size_t stackSize)
{
    if (m_started)
        throw exception::InvalidOperation(kSource, __LINE__);
    Attributes attributes;
    if (stackSize != 0)
        attributes.SetStackSize(stackSize);
    m_priority = priority;
    m_result = 0;
    m_failure = nullptr;
    m_running.store(true, std::memory_order_release);
    m_started = true;
    if (const int error = ::pthread_create(&m_handle, attributes.Get(), &Thread::Entry, this)) {
        m_started = false;
        m_running.store(false, std::memory_order_release);
        throw PosixError(static_cast<std::uint32_t>(error), kSource, __LINE__);
    }
}

void Thread::Join()
{
    if (!m_started)
        return;
    if (::pthread_equal(m_handle, ::pthread_self()))
        throw exception::InvalidOperation(kSource, __LINE__);
    if (const int error = ::pthread_join(m_handle, nullptr))
        throw PosixError(static_cast<std::uint32_t>(error), kSource, __LINE__);
    m_started = false;
}

void *Thread::Entry(void *self)
{
    static_cast<Thread *>(self)->RunBody();
    return nullptr;
}

void Thread::RunBody()
{
    if (m_priority != 0)
        ApplyPriority(m_priority);
    try {
        m_result = Run();
    } catch (abi::__forced_unwind &) {
        // pthread_exit or cancellation: the unwind must go on.
        m_running.store(false, std::memory_order_release);
        throw;
    } catch (const exception::Exception &error) {
        m_result = error.Code();
        m_failure = std::current_exception();
    } catch (...) {
        m_result = 0xFFFFFFFFu;
        m_failure = std::current_exception();
    }
    m_running.store(false, std::memory_order_release);
}

} // namespace cv::krn::osdep
