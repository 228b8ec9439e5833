#include "optimize/waitforoptimizationthread.h"

#include "serverlibs/sorvikcalls.h"
#include "sorvik/vekexception.h"

namespace cv::vek::rovo::optimize {

CWaitForOptimizationThread::CWaitForOptimizationThread(krn::RefPtr<cv::rovo::IIndexManager> indexManager,
                                                       std::atomic<std::int32_t> *done, IWaitWindow *window)
    : m_indexManager(std::move(indexManager)), m_done(done), m_window(window)
{}

CWaitForOptimizationThread::~CWaitForOptimizationThread()
{
    SignalStop();
    Join();
}

void CWaitForOptimizationThread::ForgetWindow()
{
    const std::lock_guard<std::mutex> guard(m_windowLock);
    m_window = nullptr;
}

void CWaitForOptimizationThread::SignalStop()
{
    {
        const std::lock_guard<std::mutex> guard(m_stopLock);
        m_stop = true;
    }
    m_stopSignal.notify_all();
}

bool CWaitForOptimizationThread::PauseUnlessStopped()
{
    std::unique_lock<std::mutex> lock(m_stopLock);
    const bool stopped = m_stopSignal.wait_for(lock, kRetryPause, [this] { return m_stop; });
    m_stop = false;
    return stopped;
}

void CWaitForOptimizationThread::Finish()
{
    m_indexManager.Reset();
    m_done->store(1);
}

std::uint32_t CWaitForOptimizationThread::Run()
{
    {
        const std::lock_guard<std::mutex> guard(m_windowLock);
        if (!m_window || !m_done)
            return 0;
    }
    for (;;) {
        if (!m_indexManager) {
            m_done->store(1);
            return 0;
        }
        try {
            ++m_calls;
            serverlibs::WaitForUpdate(*m_indexManager);
            Finish();
            return 0;
        } catch (const Exception &e) {
            if (e.Code() != cv::rovo::status::UpdateTimedOut) {
                // The server failed or went away: nothing more to wait for.
                Finish();
                return 0;
            }
        }
        {
            const std::lock_guard<std::mutex> guard(m_windowLock);
            if (m_window)
                m_window->PostShowRequest();
        }
        if (PauseUnlessStopped())
            return 0;
    }
}

} // namespace cv::vek::rovo::optimize
