#include "serverlibs/testlibraries.h"

#include <dlfcn.h>

#include <fstream>

namespace testsupport {

namespace {

std::string RegistryText(const std::string &vekexFolder, const std::string &rovoApiFolder)
{
    std::string text;
    if (!vekexFolder.empty())
        text += "[Software\\Corvane\\Common\\VEK]\nbinDir=" + vekexFolder + "\n";
    if (!rovoApiFolder.empty())
        text += "[Software\\Corvane\\Common\\Sorvik]\nbinDir=" + rovoApiFolder + "\n";
    return text;
}

} // namespace

ScopedLibraryFolders::ScopedLibraryFolders(const std::string &vekexFolder, const std::string &rovoApiFolder)
    : m_registry("CORVANE_REGISTRY", m_dir.file("registry.ini").string())
{
    std::ofstream(m_dir.file("registry.ini")) << RegistryText(vekexFolder, rovoApiFolder);
}

bool IsLoaded(const std::string &path)
{
    void *handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (handle)
        ::dlclose(handle);
    return handle != nullptr;
}

FakeState *FakeStateOf(const std::string &path)
{
    void *handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (!handle)
        return nullptr;
    const auto state = reinterpret_cast<FakeStateFunction>(::dlsym(handle, "fakeState"));
    ::dlclose(handle);
    return state ? state() : nullptr;
}

} // namespace testsupport
