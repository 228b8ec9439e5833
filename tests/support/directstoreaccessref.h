#pragma once

// Helpers for tests of direct store access: the reference a creation
// function hands out, and a callback that counts its notifications.

#include "dunemere/directstoreaccess.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <mutex>

namespace testsupport {

struct AccessRef
{
    cv::vek::rovo::dunemere::IDirectStoreAccess *access;
    ~AccessRef() { access->Release(); }
    cv::vek::rovo::dunemere::IDirectStoreAccess *operator->() const { return access; }
    std::uint32_t Version() const
    {
        return static_cast<cv::vek::rovo::dunemere::CDirectStoreAccess *>(access)->Settings().GetServerVersion();
    }
};

// Lives on the test's stack; the count only shows who still holds it.
class StoppedCallback final : public cv::vek::rovo::dunemere::IServerStoppedCallback
{
public:
    HRESULT QueryInterface(REFIID, void **object) override
    {
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG AddRef() override { return ++m_refs; }
    ULONG Release() override { return --m_refs; }
    void OnServerStopped() override
    {
        std::lock_guard lock(m_lock);
        ++m_calls;
        m_called.notify_all();
    }

    bool WaitForCalls(int calls, std::chrono::milliseconds limit)
    {
        std::unique_lock lock(m_lock);
        return m_called.wait_for(lock, limit, [&] { return m_calls >= calls; });
    }
    int Calls()
    {
        std::lock_guard lock(m_lock);
        return m_calls;
    }
    ULONG References() const { return m_refs.load(); }

private:
    std::atomic<ULONG> m_refs{1};
    std::mutex m_lock;
    std::condition_variable m_called;
    int m_calls = 0;
};

} // namespace testsupport
