#pragma once

// The binding to the server API library (librovoApi.so). Uses are counted
// with a plain integer: they are taken and released on the user-interface
// thread only.

#include "serverlibs/productlibrary.h"
#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"

#include <cstdint>

namespace cv::vek::rovo::serverlibs {

class RovoApiLibrary final
{
public:
    static constexpr char16_t kRegistryKey[] = u"Software\\Corvane\\Common\\Sorvik";
    static constexpr char16_t kFileName[] = u"librovoApi.so";

    RovoApiLibrary() = default;
    RovoApiLibrary(const RovoApiLibrary &) = delete;
    RovoApiLibrary &operator=(const RovoApiLibrary &) = delete;

    // The first use loads the library; a use succeeds when all of Init,
    // Cleanup and rovoCreateEnvironment exist, and then calls Init. A failed
    // load raises nothing: the calls raise -13001 later.
    void TakeUse();
    // Calls Cleanup; the last use unloads the library and forgets its entry
    // points. Without a use held nothing happens.
    void ReleaseUse();

    std::uint32_t UseCount() const { return m_uses; }
    bool IsResolved() const { return m_entry.createEnvironment != nullptr; }

    // The server environment built on a data-store environment.
    krn::RefPtr<cv::rovo::IRovoEnvironment> CreateEnvironment(vekex::IEnvironment *dataStore);

private:
    struct EntryPoints
    {
        cv::rovo::PFN_Init init = nullptr;
        cv::rovo::PFN_Cleanup cleanup = nullptr;
        cv::rovo::PFN_rovoCreateEnvironment createEnvironment = nullptr;
    };

    void LoadAndResolve();

    ProductLibrary m_library;
    EntryPoints m_entry;
    std::uint32_t m_uses = 0;
};

// The module's binding.
RovoApiLibrary &RovoApi();

} // namespace cv::vek::rovo::serverlibs
