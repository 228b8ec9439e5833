#pragma once

// The comm library's ABI: a connected client socket that carries whole
// protocol records, and the export that makes one. The module loads the
// library at run time and reaches both only through this header, so the
// virtual slot order and the export's signature are fixed.

#include "sorvik/bytebuffer.h"
#include "sorvik/com.h"
#include "sorvik/wstring.h"

#include <cstdint>

namespace cv::vek::rovo::comm {

// Results of the socket operations. Everything that is neither success nor
// one of the first two named failures is a failure of its own kind.
inline constexpr std::uint32_t kResultOk = 0;
inline constexpr std::uint32_t kResultTimeout = 2381701122u;        // 0x8DF5E002
inline constexpr std::uint32_t kResultConnectionLost = 2381701123u; // 0x8DF5E003
inline constexpr std::uint32_t kResultFailure = 0x8DF5E001u;        // the system refused an operation
inline constexpr std::uint32_t kResultFrameTooLarge = 0x8DF5E004u;  // a record above kMaxFrameBytes
inline constexpr std::uint32_t kResultInvalidArgument = 0x8DF5E005u;
inline constexpr std::uint32_t kResultUnreachable = 0x8DF5E006u; // nobody listens for the service
inline constexpr std::uint32_t kResultUnknownHost = 0x8DF5E007u; // the server name did not resolve
// The local server's socket, or a folder above it, is not this user's or
// root's, or others may change it: somebody else may be standing in for the
// server. rovoCommGetLastErrorText says which.
inline constexpr std::uint32_t kResultUntrusted = 0x8DF5E008u;

// The largest record either side sends or accepts. A peer announcing more is
// refused before anything is allocated, and the connection is dropped.
inline constexpr std::uint32_t kMaxFrameBytes = 64u * 1024u * 1024u;

// A time-out of this value waits without limit.
inline constexpr std::uint32_t kInfinite = 0xFFFFFFFFu;

// A connected socket owned by whoever received it from NewClientSocket; one
// thread at a time uses it. Release closes it and frees it.
class ClientSocket
{
public:
    virtual void Release() = 0;
    // The time-out that Send and Receive use when they are given 0.
    virtual std::uint32_t SetTimeout(std::uint32_t milliseconds) = 0;
    // Sends the buffer's bytes as one record; the buffer is not changed.
    // The time-out covers the whole record.
    virtual std::uint32_t Send(cv::krn::ByteBuffer &buffer, std::uint32_t timeoutMs) = 0;
    // Replaces the buffer's content with exactly one received record. A
    // record cut short by the time-out is kept and completed by the next call.
    virtual std::uint32_t Receive(cv::krn::ByteBuffer &buffer, std::uint32_t timeoutMs) = 0;

    ClientSocket(const ClientSocket &) = delete;
    ClientSocket &operator=(const ClientSocket &) = delete;

protected:
    ClientSocket() = default;
    ~ClientSocket() = default;
};

} // namespace cv::vek::rovo::comm

// Connects to the service named by the three texts. Returns 0 and a socket
// owned by the caller, or a non-zero result (one of the kResult values as a
// signed number). A socket stored despite a failure is the caller's to
// release.
extern "C" SORVIK_EXPORT std::int32_t NewClientSocket(const cv::krn::WString &server,
                                                      const cv::krn::WString &serviceName,
                                                      const cv::krn::WString &serviceClass,
                                                      cv::vek::rovo::comm::ClientSocket **socket);

// A readable description of the last failure of NewClientSocket on the
// calling thread, empty when it has none to give; not an entry point a
// caller must find.
extern "C" SORVIK_EXPORT void rovoCommGetLastErrorText(cv::krn::WString *text);

namespace cv::vek::rovo::comm {

using NewClientSocketFunction = decltype(&::NewClientSocket);
inline constexpr const char *kNewClientSocketExport = "NewClientSocket";
using GetLastErrorTextFunction = decltype(&::rovoCommGetLastErrorText);
inline constexpr const char *kGetLastErrorTextExport = "rovoCommGetLastErrorText";

} // namespace cv::vek::rovo::comm
