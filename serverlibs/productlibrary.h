#pragma once

// Locating and loading the product libraries that the module uses at run
// time (the server API and the data-store library).

#include <string>
#include <string_view>

namespace cv::vek::rovo::serverlibs {

// The file to load: the value "binDir" of registryKey in the registry of the
// local machine, followed by fileName. A separator is appended to the folder
// unless it ends with one ('\' when the folder holds one, else '/'). Without
// the value, or when it does not fit the 2000-byte buffer the registry is read
// into (999 UTF-16 characters and the terminator), the bare file name.
std::u16string ProductLibraryPath(std::u16string_view registryKey, std::u16string_view fileName);

// One dlopen handle. Loading uses RTLD_NOW | RTLD_LOCAL: the libraries carry
// RUNPATH $ORIGIN, so they find their own dependencies beside them, and their
// symbols (Init, Cleanup, ...) stay out of the global scope, where they would
// clash with each other and with the module's own exports.
class ProductLibrary final
{
public:
    ProductLibrary() = default;
    ProductLibrary(const ProductLibrary &) = delete;
    ProductLibrary &operator=(const ProductLibrary &) = delete;
    // Leaves a loaded library loaded: objects it handed out may still live.
    ~ProductLibrary() = default;

    // False when the file cannot be loaded; any library loaded before is unloaded first.
    bool Load(const std::u16string &path);
    void Unload();
    bool IsLoaded() const { return m_handle != nullptr; }

    // The entry point name, or null when the library lacks it or is not loaded.
    template <typename Function>
    Function Resolve(const char *name) const
    {
        return reinterpret_cast<Function>(Symbol(name));
    }

private:
    void *Symbol(const char *name) const;

    void *m_handle = nullptr;
};

} // namespace cv::vek::rovo::serverlibs
