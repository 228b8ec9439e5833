#pragma once

// The binding to the data-store library (libvekex.so). Uses may be taken and
// released on any thread: the count is atomic, and the first load and the
// last unload happen under the binding's lock with the count tested again
// inside it.

#include "serverlibs/productlibrary.h"
#include "sorvik/refcounted.h"
#include "sorvik/vekex.h"

#include <atomic>
#include <cstdint>
#include <mutex>

namespace cv::vek::rovo::serverlibs {

class VekexLibrary final
{
public:
    static constexpr char16_t kRegistryKey[] = u"Software\\Corvane\\Common\\VEK";
    static constexpr char16_t kFileName[] = u"libvekex.so";

    VekexLibrary() = default;
    VekexLibrary(const VekexLibrary &) = delete;
    VekexLibrary &operator=(const VekexLibrary &) = delete;

    // The first use loads the library; a use succeeds when all six entry
    // points exist, and then calls Init. A failed load raises nothing: the
    // calls raise -1006 later.
    void TakeUse();
    // Calls Cleanup; the last use unloads the library and forgets its entry
    // points. Without a use held nothing happens.
    void ReleaseUse();

    std::uint32_t UseCount() const { return m_uses.load(); }
    bool IsResolved() const { return m_entry.getEnvironment.load() != nullptr; }

    // kind: cv::vekex::kEnvironmentDesktop or kEnvironmentValdorn.
    krn::RefPtr<cv::vekex::IEnvironment> GetEnvironment(std::int32_t kind, const krn::WString &name,
                                                        std::uint32_t version);
    krn::RefPtr<cv::vekex::IContainer> CreateContainer();

private:
    struct EntryPoints
    {
        std::atomic<cv::vekex::PFN_Init> init{nullptr};
        std::atomic<cv::vekex::PFN_Cleanup> cleanup{nullptr};
        std::atomic<cv::vekex::PFN_vekGetEnvironment> getEnvironment{nullptr};
        std::atomic<cv::vekex::PFN_vekCreateContainer> createContainer{nullptr};
        // Required for a use, never called.
        std::atomic<cv::vekex::PFN_vekCreateInstList> createInstList{nullptr};
        std::atomic<cv::vekex::PFN_vekCreateContainerList> createContainerList{nullptr};
    };

    void LoadAndResolve();
    void Forget();

    std::mutex m_loadLock;
    ProductLibrary m_library;
    EntryPoints m_entry;
    std::atomic<std::uint32_t> m_uses{0};
};

// The module's binding.
VekexLibrary &Vekex();

} // namespace cv::vek::rovo::serverlibs
