#include "krn/osdep/configpaths.h"

#include <cstdlib>

namespace cv::krn::osdep {

namespace {

std::filesystem::path FromEnvironment(const char *variable, const char *fallback)
{
    const char *value = std::getenv(variable);
    return (value && *value) ? std::filesystem::path(value) : std::filesystem::path(fallback);
}

} // namespace

std::filesystem::path RegistryFilePath()
{
    return FromEnvironment("CORVANE_REGISTRY", "/etc/corvane/registry.ini");
}

std::filesystem::path VelosIniPath()
{
    return FromEnvironment("CORVANE_VELOS_INI", "/etc/corvane/velos.ini");
}

std::filesystem::path MutexDirectory()
{
    return FromEnvironment("CORVANE_MUTEX_DIR", "/tmp/corvane-mutex");
}

} // namespace cv::krn::osdep
