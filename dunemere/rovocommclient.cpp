#include "dunemere/rovocommclient.h"

#include "dunemere/tointmsgda.h"
#include "krn/osdep/pathjoin.h"
#include "krn/osdep/registry.h"
#include "krn/utf.h"

#include <dlfcn.h>

#include <new>

namespace PLUGIN {

namespace {

namespace comm = cv::vek::rovo::comm;
namespace osdep = cv::krn::osdep;

constexpr std::u16string_view kSource = u"rovoCommClient";

class LoadedLibrary final
{
public:
    explicit LoadedLibrary(const std::u16string &path)
        // RTLD_LOCAL keeps the library's symbols from mixing with the module's.
        : m_handle(::dlopen(cv::krn::ToUtf8(path).c_str(), RTLD_NOW | RTLD_LOCAL))
    {
    }
    ~LoadedLibrary()
    {
        if (m_handle)
            ::dlclose(m_handle);
    }
    LoadedLibrary(const LoadedLibrary &) = delete;
    LoadedLibrary &operator=(const LoadedLibrary &) = delete;

    void *Get() const noexcept { return m_handle; }
    void *Take() noexcept
    {
        void *handle = m_handle;
        m_handle = nullptr;
        return handle;
    }

private:
    void *m_handle;
};

// What the library can say about its last failure, as " " + its text; empty
// when it says nothing (or cannot be asked).
std::u16string Explanation(void *library)
{
    const auto lastError =
        reinterpret_cast<comm::GetLastErrorTextFunction>(::dlsym(library, comm::kGetLastErrorTextExport));
    if (!lastError)
        return {};
    cv::krn::WString text;
    lastError(&text);
    return text.empty() ? std::u16string() : u" " + std::u16string(text.view());
}

} // namespace

std::u16string FindCommLibrary()
{
    const std::u16string folder =
        osdep::ReadRegistryString(osdep::RegistryHive::LocalMachine, kSorvikKey, u"binDir");
    const std::u16string file = osdep::ReadRegistryString(osdep::RegistryHive::LocalMachine, kConfigItemsKey,
                                                          u"rovoCommDllClient", kDefaultCommLibrary);
    return osdep::PathJoin(folder, file);
}

const std::u16string &CommLibraryPath()
{
    static const std::u16string path = FindCommLibrary();
    return path;
}

std::unique_ptr<rovoCommClient> rovoCommClient::Create(const cv::krn::WString &server,
                                                       const cv::krn::WString &serviceName,
                                                       const cv::krn::WString &serviceClass)
{
    return Create(CommLibraryPath(), server, serviceName, serviceClass);
}

std::unique_ptr<rovoCommClient> rovoCommClient::Create(const std::u16string &libraryPath,
                                                       const cv::krn::WString &server,
                                                       const cv::krn::WString &serviceName,
                                                       const cv::krn::WString &serviceClass)
{
    LoadedLibrary library(libraryPath);
    if (!library.Get())
        throw DataCache::ToIntMsgDa(kSource, 65, u"SKCP:     Unable to load Comm library!");

    const auto newClientSocket =
        reinterpret_cast<comm::NewClientSocketFunction>(::dlsym(library.Get(), comm::kNewClientSocketExport));
    if (!newClientSocket)
        throw DataCache::ToIntMsgDa(kSource, 65, u"SKCP:     Cannot find NewClientSocket function!");

    comm::ClientSocket *socket = nullptr;
    if (newClientSocket(server, serviceName, serviceClass, &socket) != 0) {
        if (socket)
            socket->Release();
        throw DataCache::ToIntMsgDa(kSource, 65, u"SKCP:     Unable to connect to socket!" + Explanation(library.Get()));
    }
    if (!socket)
        throw DataCache::ToIntMsgDa(kSource, 65, u"SKCP:     Unable to connect to socket!");

    auto *client = new (std::nothrow) rovoCommClient(library.Get(), newClientSocket, socket);
    if (!client) {
        socket->Release();
        throw DataCache::ToIntMsgDa(kSource, 81, u"PLUGIN: Couldn't initialize the client/server communication!");
    }
    library.Take();
    return std::unique_ptr<rovoCommClient>(client);
}

rovoCommClient::rovoCommClient(void *library, comm::NewClientSocketFunction newClientSocket,
                               comm::ClientSocket *socket) noexcept
    : m_library(library), m_newClientSocket(newClientSocket), m_socket(socket)
{
}

rovoCommClient::~rovoCommClient()
{
    // The socket's code lives in the library.
    m_socket->Release();
    ::dlclose(m_library);
}

} // namespace PLUGIN
