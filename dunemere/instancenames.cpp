#include "dunemere/instancenames.h"

#include "krn/osdep/pathjoin.h"
#include "krn/osdep/registry.h"
#include "krn/osdep/runtimefolder.h"

namespace cv::vek::rovo::dunemere {

std::u16string InstanceMutexName(std::u16string_view portName)
{
    std::u16string name(kInstanceMutexPrefix);
    name += portName;
    return name;
}

std::unique_ptr<krn::osdep::Mutex> OpenGlobalServerMutex()
{
    return std::make_unique<krn::osdep::Mutex>(kGlobalServerMutexName);
}

std::unique_ptr<krn::osdep::Mutex> OpenInstanceMutex(std::u16string_view portName)
{
    return std::make_unique<krn::osdep::Mutex>(InstanceMutexName(portName));
}

std::u16string ServerFolder()
{
    return krn::osdep::ReadRegistryString(krn::osdep::RegistryHive::LocalMachine, kServerDesktopKey, u"binDir", {},
                                          krn::osdep::RegistryView::Bits32);
}

std::u16string ServerExecutablePath()
{
    return krn::osdep::PathJoin(ServerFolder(), kServerExecutable);
}

std::filesystem::path StartedServerLogPath()
{
    const std::filesystem::path folder = krn::osdep::RuntimeDirectory();
    if (!krn::osdep::EnsureTrustedFolder(folder).empty())
        return {};
    return folder / "Sorvik.log";
}

} // namespace cv::vek::rovo::dunemere
