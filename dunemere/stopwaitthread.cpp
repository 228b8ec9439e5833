#include "dunemere/stopwaitthread.h"

#include "dunemere/instancenames.h"
#include "krn/osdep/mutex.h"

namespace cv::vek::rovo::dunemere {

CStopWaitThread::CStopWaitThread(std::u16string_view instanceName, IServerStoppedCallback *callback)
    : m_instanceName(instanceName), m_callback(callback)
{
    if (m_callback)
        m_callback->AddRef();
    try {
        Start(0, kStackSize);
    } catch (...) {
        if (m_callback)
            m_callback->Release();
        throw;
    }
}

CStopWaitThread::~CStopWaitThread()
{
    Join();
    if (m_callback)
        m_callback->Release();
}

HRESULT CStopWaitThread::QueryInterface(REFIID, void **object)
{
    if (object)
        *object = nullptr;
    return E_NOINTERFACE;
}

ULONG CStopWaitThread::AddRef()
{
    return ++m_refs;
}

ULONG CStopWaitThread::Release()
{
    const std::uint32_t left = --m_refs;
    if (left == 0)
        delete this;
    return left;
}

std::uint32_t CStopWaitThread::Run()
{
    // A mutex that cannot be opened raises here; the thread then ends
    // without calling back.
    auto mutex = OpenInstanceMutex(m_instanceName);
    mutex->Acquire();
    mutex->Release();
    if (m_callback)
        m_callback->OnServerStopped();
    return 0;
}

} // namespace cv::vek::rovo::dunemere
