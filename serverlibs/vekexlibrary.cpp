#include "serverlibs/vekexlibrary.h"

#include "serverlibs/objectcall.h"

namespace cv::vek::rovo::serverlibs {

void VekexLibrary::TakeUse()
{
    {
        const std::lock_guard lock(m_loadLock);
        // The library may still be loaded at a count of 0 while the releaser
        // of the last use waits for the lock; it then sees this use and keeps it.
        if (m_uses.load() == 0 && !m_library.IsLoaded())
            LoadAndResolve();
        // Counting inside the lock keeps a second first use from loading again.
        m_uses.fetch_add(1);
    }
    if (const auto init = m_entry.init.load())
        init();
}

void VekexLibrary::ReleaseUse()
{
    std::uint32_t uses = m_uses.load();
    if (uses == 0)
        return;
    if (const auto cleanup = m_entry.cleanup.load())
        cleanup();
    while (!m_uses.compare_exchange_weak(uses, uses - 1)) {
        if (uses == 0)
            return;
    }
    if (uses != 1)
        return;
    const std::lock_guard lock(m_loadLock);
    if (m_uses.load() == 0) {
        Forget();
        m_library.Unload();
    }
}

krn::RefPtr<cv::vekex::IEnvironment> VekexLibrary::GetEnvironment(std::int32_t kind, const krn::WString &name,
                                                                  std::uint32_t version)
{
    return AdoptFromEntryPoint(kVekNotInitialized, m_entry.getEnvironment.load(), kind, name, version);
}

krn::RefPtr<cv::vekex::IContainer> VekexLibrary::CreateContainer()
{
    return AdoptFromEntryPoint(kVekNotInitialized, m_entry.createContainer.load());
}

void VekexLibrary::LoadAndResolve()
{
    Forget();
    if (!m_library.Load(ProductLibraryPath(kRegistryKey, kFileName)))
        return;
    using namespace cv::vekex;
    const auto init = m_library.Resolve<PFN_Init>("Init");
    const auto cleanup = m_library.Resolve<PFN_Cleanup>("Cleanup");
    const auto getEnvironment = m_library.Resolve<PFN_vekGetEnvironment>("vekGetEnvironment");
    const auto createContainer = m_library.Resolve<PFN_vekCreateContainer>("vekCreateContainer");
    const auto createInstList = m_library.Resolve<PFN_vekCreateInstList>("vekCreateInstList");
    const auto createContainerList = m_library.Resolve<PFN_vekCreateContainerList>("vekCreateContainerList");
    if (!init || !cleanup || !getEnvironment || !createContainer || !createInstList || !createContainerList) {
        m_library.Unload();
        return;
    }
    m_entry.init = init;
    m_entry.cleanup = cleanup;
    m_entry.getEnvironment = getEnvironment;
    m_entry.createContainer = createContainer;
    m_entry.createInstList = createInstList;
    m_entry.createContainerList = createContainerList;
}

void VekexLibrary::Forget()
{
    m_entry.init = nullptr;
    m_entry.cleanup = nullptr;
    m_entry.getEnvironment = nullptr;
    m_entry.createContainer = nullptr;
    m_entry.createInstList = nullptr;
    m_entry.createContainerList = nullptr;
}

VekexLibrary &Vekex()
{
    static VekexLibrary binding;
    return binding;
}

} // namespace cv::vek::rovo::serverlibs
