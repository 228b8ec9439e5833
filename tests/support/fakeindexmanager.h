#pragma once

// An index manager whose WaitForUpdate answers from a script, for the wait
// window and the dialogs that start it. Each scripted answer may hold the
// caller until the test lets it go. Safe to call from any thread.

#include "sorvik/rovoapi.h"
#include "support/refcountedfake.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <mutex>
#include <vector>

namespace testsupport {

class FakeIndexManager final : public RefCountedFake<cv::rovo::IIndexManager>
{
public:
    using Clock = std::chrono::steady_clock;

    struct Answer
    {
        std::int32_t status = 0;
        bool held = false; // waits for Release() before answering
    };

    static FakeIndexManager *Create() { return new FakeIndexManager; }

    // Answers in order; when none are left every call answers 0 at once.
    void Script(std::vector<Answer> answers);
    // Lets a held call answer.
    void Release1();
    // Blocks until n calls have started, or the time ran out.
    bool WaitForCalls(int n, std::chrono::milliseconds within = std::chrono::seconds(10));
    int Calls() const;
    std::vector<Clock::time_point> CallStarts() const;
    std::vector<Clock::time_point> CallEnds() const;

    void WaitForUpdate(std::int32_t *status) override;

    double GetVersion(std::int32_t *) override { return 18.0; }
    void ResetTimeoutFiles(std::int32_t *) override {}
    void ResetFailedFiles(std::int32_t *) override {}
    void SetServiceTimeout(std::int32_t, std::uint32_t, std::int32_t *) override {}
    cv::rovo::ILevelPropertyList *GetLevelProperties(const cv::krn::WString &, std::int32_t *) override
    {
        return nullptr;
    }
    cv::rovo::IServerContext *GetServerContext(std::int32_t *) override { return nullptr; }
    bool GetServerFlag(std::int32_t *) override { return false; }
    cv::rovo::IOptimizationEditor *GetOptimizationEditor(std::int32_t *) override { return nullptr; }
    cv::rovo::IIndexStatus *GetIndexStatus(std::int32_t *) override { return nullptr; }

private:
    FakeIndexManager() = default;
    ~FakeIndexManager() override = default;

    mutable std::mutex m_lock;
    std::condition_variable m_changed;
    std::deque<Answer> m_answers;
    int m_released = 0;
    std::vector<Clock::time_point> m_starts;
    std::vector<Clock::time_point> m_ends;
};

} // namespace testsupport
