#include "serverlibs/productlibrary.h"

#include "krn/osdep/pathjoin.h"
#include "krn/osdep/registry.h"
#include "krn/utf.h"

#include <dlfcn.h>

namespace cv::vek::rovo::serverlibs {

namespace {

// The registry read goes into a buffer of this many bytes, terminator included.
constexpr std::size_t kRegistryBufferBytes = 2000;

} // namespace

std::u16string ProductLibraryPath(std::u16string_view registryKey, std::u16string_view fileName)
{
    using namespace krn::osdep;
    std::u16string folder = ReadRegistryString(RegistryHive::LocalMachine, registryKey, u"binDir");
    // A value the buffer cannot hold counts as missing; a cut-off folder
    // would load some other file.
    if ((folder.size() + 1) * sizeof(char16_t) > kRegistryBufferBytes)
        folder.clear();
    return PathJoin(folder, fileName);
}

bool ProductLibrary::Load(const std::u16string &path)
{
    Unload();
    m_handle = ::dlopen(krn::ToUtf8(path).c_str(), RTLD_NOW | RTLD_LOCAL);
    return m_handle != nullptr;
}

void ProductLibrary::Unload()
{
    if (m_handle) {
        ::dlclose(m_handle);
        m_handle = nullptr;
    }
}

void *ProductLibrary::Symbol(const char *name) const
{
    return m_handle ? ::dlsym(m_handle, name) : nullptr;
}

} // namespace cv::vek::rovo::serverlibs
