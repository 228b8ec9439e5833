#include "krn/exception/invalidoperation.h"
#include "krn/exception/outofrange.h"
#include "krn/osdep/posixerror.h"
#include "krn/osdep/thread.h"

#include <gtest/gtest.h>

#include <condition_variable>
#include <functional>
#include <limits>
#include <mutex>
#include <pthread.h>

namespace cv::krn::osdep {
namespace {

class FunctionThread final : public Thread
{
public:
    explicit FunctionThread(std::function<std::uint32_t()> body)
        : m_body(std::move(body))
    {
    }
    ~FunctionThread() override { Join(); }

protected:
    std::uint32_t Run() override { return m_body(); }

private:
    std::function<std::uint32_t()> m_body;
};

std::size_t OwnStackSize()
{
    pthread_attr_t attributes;
    std::size_t size = 0;
    if (::pthread_getattr_np(::pthread_self(), &attributes) == 0) {
        ::pthread_attr_getstacksize(&attributes, &size);
        ::pthread_attr_destroy(&attributes);
    }
    return size;
}

TEST(KrnThread, RunsTheBodyWithTheRequestedStack)
{
    std::size_t stackSize = 0;
    FunctionThread thread([&stackSize] {
        stackSize = OwnStackSize();
        return 4711u;
    });
    thread.Start(0, 0x100000);
    thread.Join();
    EXPECT_EQ(thread.Result(), 4711u);
    EXPECT_FALSE(thread.Failure());
    EXPECT_GE(stackSize, 0x100000u);
    EXPECT_LT(stackSize, 0x200000u);
}

TEST(KrnThread, IsRunningUntilTheBodyReturns)
{
    std::mutex lock;
    std::condition_variable changed;
    bool release = false;
    FunctionThread thread([&] {
        std::unique_lock<std::mutex> guard(lock);
        changed.wait(guard, [&] { return release; });
        return 1u;
    });
    EXPECT_FALSE(thread.IsRunning());
    thread.Start();
    EXPECT_TRUE(thread.IsRunning());
    EXPECT_THROW(thread.Start(), exception::InvalidOperation);
    {
        std::lock_guard<std::mutex> guard(lock);
        release = true;
    }
    changed.notify_all();
    thread.Join();
    EXPECT_FALSE(thread.IsRunning());

    // A priority is a hint: one the system refuses must not fail the start.
    for (const int priority : {-15, -2, 2, 15}) {
        thread.Start(priority);
        thread.Join();
        EXPECT_EQ(thread.Result(), 1u) << "priority " << priority;
    }
}

TEST(KrnThread, AFailedStartLeavesNoThread)
{
    bool ran = false;
    FunctionThread thread([&ran] {
        ran = true;
        return 3u;
    });
    try {
        thread.Start(0, std::numeric_limits<std::size_t>::max() / 4);
        FAIL() << "a stack of that size was granted";
    } catch (const PosixError &error) {
        EXPECT_EQ(error.SourceFile(), "Thread");
        EXPECT_NE(error.ErrorNumber(), 0u);
    }
    EXPECT_FALSE(thread.IsRunning());
    thread.Join();
    EXPECT_FALSE(ran);

    thread.Start(0, 0x100000);
    thread.Join();
    EXPECT_TRUE(ran);
}

TEST(KrnThread, AnEscapingExceptionEndsOnlyTheThread)
{
    FunctionThread failing([]() -> std::uint32_t { throw exception::OutOfRange("index 7"); });
    failing.Start();
    failing.Join();
    EXPECT_EQ(failing.Result(), 0x8ABC7007u);
    EXPECT_THROW(std::rethrow_exception(failing.Failure()), exception::OutOfRange);

    FunctionThread foreign([]() -> std::uint32_t { throw 5; });
    foreign.Start();
    foreign.Join();
    EXPECT_EQ(foreign.Result(), 0xFFFFFFFFu);
    EXPECT_TRUE(foreign.Failure());
}

} // namespace
} // namespace cv::krn::osdep
