#pragma once

#include "dunemere/idirectstoreaccess.h"
#include "krn/osdep/thread.h"

#include <atomic>
#include <string>
#include <string_view>

namespace cv::vek::rovo::dunemere {

// Tells a client when a server instance has ended: the thread waits until it
// can take the instance's named mutex, which the instance holds for its whole
// life, and then calls the callback once, on this thread.
//
// Destroying the object waits until the instance has ended and the callback
// has returned.
class CStopWaitThread final : public krn::osdep::Thread, public IUnknown
{
public:
    static constexpr std::size_t kStackSize = 0x100000;

    // Holds a reference to the callback and starts the thread at once.
    CStopWaitThread(std::u16string_view instanceName, IServerStoppedCallback *callback);

    HRESULT QueryInterface(REFIID iid, void **object) override;
    ULONG AddRef() override;
    ULONG Release() override;

private:
    ~CStopWaitThread() override;
    std::uint32_t Run() override;

    std::u16string m_instanceName;
    IServerStoppedCallback *m_callback;
    std::atomic<std::uint32_t> m_refs{1};
};

} // namespace cv::vek::rovo::dunemere
