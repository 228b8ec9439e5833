#include "tests/reference/referencelibs.h"

#include <QString>

#include <dlfcn.h>

#include <fstream>
#include <stdexcept>

namespace reftest {

namespace {

void *Open(const std::string &key, const char *file)
{
    const std::filesystem::path path = RegistryBinDir(key) / file;
    void *handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!handle)
        throw std::runtime_error(std::string("cannot load ") + path.string() + ": " + dlerror());
    return handle;
}

template <typename T>
T Resolve(void *handle, const char *name)
{
    void *symbol = dlsym(handle, name);
    if (!symbol)
        throw std::runtime_error(std::string("missing entry point ") + name);
    return reinterpret_cast<T>(symbol);
}

std::string Lower(std::string text)
{
    for (char &c : text)
        c = char(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

} // namespace

std::filesystem::path RegistryBinDir(const std::string &key)
{
    std::ifstream registry(SORVIK_REFERENCE_REGISTRY);
    std::string line, section;
    while (std::getline(registry, line)) {
        if (line.size() > 2 && line.front() == '[' && line.back() == ']')
            section = Lower(line.substr(1, line.size() - 2));
        else if (section == Lower(key) && Lower(line).rfind("bindir=", 0) == 0)
            return line.substr(7);
    }
    throw std::runtime_error("no binDir for " + key + " in " SORVIK_REFERENCE_REGISTRY);
}

const Vekex &VekexLibrary()
{
    static const Vekex library = [] {
        void *handle = Open("Software\\Corvane\\Common\\VEK", "libvekex.so");
        return Vekex{Resolve<cv::vekex::PFN_Init>(handle, "Init"),
                     Resolve<cv::vekex::PFN_Cleanup>(handle, "Cleanup"),
                     Resolve<cv::vekex::PFN_vekGetEnvironment>(handle, "vekGetEnvironment"),
                     Resolve<cv::vekex::PFN_vekCreateContainer>(handle, "vekCreateContainer"),
                     Resolve<cv::vekex::PFN_vekCreateInstList>(handle, "vekCreateInstList"),
                     Resolve<cv::vekex::PFN_vekCreateContainerList>(handle, "vekCreateContainerList"),
                     Resolve<cv::vekex::PFN_vekGetLastErrorText>(handle, "vekGetLastErrorText")};
    }();
    return library;
}

const Rovo &RovoLibrary()
{
    static const Rovo library = [] {
        void *handle = Open("Software\\Corvane\\Common\\Sorvik", "librovoApi.so");
        return Rovo{Resolve<cv::rovo::PFN_Init>(handle, "Init"), Resolve<cv::rovo::PFN_Cleanup>(handle, "Cleanup"),
                    Resolve<cv::rovo::PFN_rovoCreateEnvironment>(handle, "rovoCreateEnvironment"),
                    Resolve<cv::rovo::PFN_rovoGetLastErrorText>(handle, "rovoGetLastErrorText")};
    }();
    return library;
}

std::u16string U16(const std::string &text)
{
    return QString::fromStdString(text).toStdU16String();
}

std::string Utf8(const WString &text)
{
    return QString::fromStdU16String(text.toU16String()).toStdString();
}

RefPtr<cv::vekex::IEnvironment> DataStoreEnvironment()
{
    return RefPtr<cv::vekex::IEnvironment>::Adopt(Ok([](std::int32_t *status) {
        return VekexLibrary().getEnvironment(cv::vekex::kEnvironmentDesktop, WString(), 75504568u, status);
    }));
}

RefPtr<cv::vekex::IContainer> Container(std::initializer_list<const char16_t *> texts)
{
    auto container = RefPtr<cv::vekex::IContainer>::Adopt(
        Ok([](std::int32_t *status) { return VekexLibrary().createContainer(status); }));
    for (const char16_t *text : texts)
        OkVoid([&](std::int32_t *status) { container->Append(WString(text), status); });
    return container;
}

} // namespace reftest
