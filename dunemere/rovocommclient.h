#pragma once

#include "sorvik/rovocomm.h"
#include "sorvik/wstring.h"

#include <memory>
#include <string>

namespace PLUGIN {

// A connection through the product's comm library: the loaded library, its
// NewClientSocket entry and the socket it returned. Dropping it releases the
// socket first and then unloads the library.
class rovoCommClient final
{
public:
    // Loads the comm library from CommLibraryPath() and connects. Raises
    // DataCache::ToIntMsgDa (source "rovoCommClient"): code 65 when the
    // library does not load, lacks NewClientSocket or cannot connect, code 81
    // when the holder cannot be made.
    static std::unique_ptr<rovoCommClient> Create(const cv::krn::WString &server,
                                                  const cv::krn::WString &serviceName,
                                                  const cv::krn::WString &serviceClass);
    // As above with the library given by path.
    static std::unique_ptr<rovoCommClient> Create(const std::u16string &libraryPath,
                                                  const cv::krn::WString &server,
                                                  const cv::krn::WString &serviceName,
                                                  const cv::krn::WString &serviceClass);
    ~rovoCommClient();

    rovoCommClient(const rovoCommClient &) = delete;
    rovoCommClient &operator=(const rovoCommClient &) = delete;

    cv::vek::rovo::comm::ClientSocket &Socket() const noexcept { return *m_socket; }
    cv::vek::rovo::comm::NewClientSocketFunction NewClientSocketEntry() const noexcept { return m_newClientSocket; }

private:
    rovoCommClient(void *library, cv::vek::rovo::comm::NewClientSocketFunction newClientSocket,
                   cv::vek::rovo::comm::ClientSocket *socket) noexcept;

    void *m_library;
    cv::vek::rovo::comm::NewClientSocketFunction m_newClientSocket;
    cv::vek::rovo::comm::ClientSocket *m_socket;
};

inline constexpr std::u16string_view kSorvikKey = u"Software\\Corvane\\Common\\Sorvik";
inline constexpr std::u16string_view kConfigItemsKey = u"Software\\Corvane\\Common\\Sorvik\\ConfigItems";
inline constexpr std::u16string_view kDefaultCommLibrary = u"librovoCommVelosCompatWrapper.so";

// The "binDir" value of the Sorvik key joined with the "rovoCommDllClient"
// value of its ConfigItems key (default librovoCommVelosCompatWrapper.so),
// read from the registry now.
std::u16string FindCommLibrary();

// FindCommLibrary() as found by the first call in this process; later
// registry changes are not seen. Safe to call from any thread.
const std::u16string &CommLibraryPath();

} // namespace PLUGIN
