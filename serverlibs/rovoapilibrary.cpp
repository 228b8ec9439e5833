#include "serverlibs/rovoapilibrary.h"

#include "serverlibs/objectcall.h"

namespace cv::vek::rovo::serverlibs {

void RovoApiLibrary::TakeUse()
{
    if (m_uses == 0)
        LoadAndResolve();
    ++m_uses;
    if (m_entry.init)
        m_entry.init();
}

void RovoApiLibrary::ReleaseUse()
{
    if (m_uses == 0)
        return;
    if (m_entry.cleanup)
        m_entry.cleanup();
    if (--m_uses == 0) {
        m_entry = {};
        m_library.Unload();
    }
}

krn::RefPtr<cv::rovo::IRovoEnvironment> RovoApiLibrary::CreateEnvironment(vekex::IEnvironment *dataStore)
{
    return AdoptFromEntryPoint(kRovoNotInitialized, m_entry.createEnvironment, dataStore);
}

void RovoApiLibrary::LoadAndResolve()
{
    m_entry = {};
    if (!m_library.Load(ProductLibraryPath(kRegistryKey, kFileName)))
        return;
    EntryPoints entry{m_library.Resolve<cv::rovo::PFN_Init>("Init"), m_library.Resolve<cv::rovo::PFN_Cleanup>("Cleanup"),
                      m_library.Resolve<cv::rovo::PFN_rovoCreateEnvironment>("rovoCreateEnvironment")};
    if (entry.init && entry.cleanup && entry.createEnvironment)
        m_entry = entry;
    else
        m_library.Unload();
}

RovoApiLibrary &RovoApi()
{
    static RovoApiLibrary binding;
    return binding;
}

} // namespace cv::vek::rovo::serverlibs
