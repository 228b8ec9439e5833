#include "reference/server/datastore.h"

#include "krn/osdep/registry.h"
#include "sorvik/vekex.h"

#include <QString>

#include <dlfcn.h>

#include <stdexcept>

namespace sorvik::server {

namespace {

// The environment kind and packed version every caller of the library passes.
constexpr std::int32_t kEnvironmentKind = cv::vekex::kEnvironmentDesktop;
constexpr std::uint32_t kPackedVersion = 75504568;

std::string LibraryPath()
{
    using namespace cv::krn::osdep;
    const std::u16string folder = ReadRegistryString(RegistryHive::LocalMachine, u"Software\\Corvane\\Common\\VEK", u"binDir");
    if (folder.empty())
        throw std::runtime_error("the registry names no folder of the data-store library (Software\\Corvane\\Common\\VEK, binDir)");
    QString path = QString::fromStdU16String(folder);
    if (!path.endsWith(u'/'))
        path += u'/';
    return (path + QStringLiteral("libvekex.so")).toStdString();
}

} // namespace

DataStore::DataStore()
{
    const std::string path = LibraryPath();
    m_library = ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!m_library)
        throw std::runtime_error("cannot load the data-store library " + path + ": " + ::dlerror());
    auto init = reinterpret_cast<cv::vekex::PFN_Init>(::dlsym(m_library, "Init"));
    m_cleanup = reinterpret_cast<cv::vekex::PFN_Cleanup>(::dlsym(m_library, "Cleanup"));
    auto getEnvironment = reinterpret_cast<cv::vekex::PFN_vekGetEnvironment>(::dlsym(m_library, "vekGetEnvironment"));
    if (!init || !m_cleanup || !getEnvironment) {
        ::dlclose(m_library);
        throw std::runtime_error("the data-store library " + path + " lacks its entry points");
    }
    init();
    std::int32_t status = 0;
    m_environment = getEnvironment(kEnvironmentKind, cv::krn::WString(), kPackedVersion, &status);
    if (status != 0 || !m_environment) {
        m_cleanup();
        ::dlclose(m_library);
        throw std::runtime_error("the data-store library gives no environment (status " + std::to_string(status) + ")");
    }
}

DataStore::~DataStore()
{
    m_environment->Release();
    m_cleanup();
    ::dlclose(m_library);
}

std::shared_ptr<const rovo::CatalogueInfo> DataStore::Catalogue()
{
    return rovo::ReadCatalogueInfo(m_environment);
}

} // namespace sorvik::server
