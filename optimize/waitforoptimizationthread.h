#pragma once

// The worker behind the wait window: it waits in the index manager until the
// server has applied the committed changes, asks the window to show itself
// when the first wait times out, retries after a pause, and reports the end
// through a flag the window polls. It never touches a widget and never waits
// for the user-interface thread: the show request is posted.

#include "krn/osdep/thread.h"
#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <mutex>

namespace cv::vek::rovo::optimize {

// What the worker asks of its window; called on the worker thread.
class IWaitWindow
{
public:
    // Queues the request to show the window; must not block.
    virtual void PostShowRequest() = 0;

protected:
    ~IWaitWindow() = default;
};

class CWaitForOptimizationThread final : public krn::osdep::Thread
{
public:
    static constexpr std::chrono::milliseconds kRetryPause{500};

    CWaitForOptimizationThread(krn::RefPtr<cv::rovo::IIndexManager> indexManager, std::atomic<std::int32_t> *done,
                               IWaitWindow *window);
    ~CWaitForOptimizationThread() override;

    // The window is closing: no show request reaches it from now on.
    void ForgetWindow();
    // Ends the worker at its next pause (the call in progress runs to its end).
    void SignalStop();
    // Calls of WaitForUpdate made so far.
    int Calls() const { return m_calls.load(); }

protected:
    std::uint32_t Run() override;

private:
    // True when the stop was signalled within the pause.
    bool PauseUnlessStopped();
    void Finish();

    krn::RefPtr<cv::rovo::IIndexManager> m_indexManager;
    std::atomic<std::int32_t> *m_done;

    std::mutex m_windowLock; // guards m_window
    IWaitWindow *m_window;

    std::mutex m_stopLock;
    std::condition_variable m_stopSignal;
    bool m_stop = false; // reset when the worker has seen it (an auto-reset event)

    std::atomic<int> m_calls{0};
};

} // namespace cv::vek::rovo::optimize
