// A comm library for tests that passes every call on to the reference comm
// library and notes the time-out each call was given, so that a test sees
// what the client asked of its socket. A test reads the notes through
// TakeRecordedCommCalls while it keeps this library loaded itself (the client
// unloads it with every connection it drops).
//
// Notes, one per line: "SetTimeout MS", "Send CATEGORY/CODE MS", "Receive MS".

#include "sorvik/rovocomm.h"

#include <dlfcn.h>

#include <cstdint>
#include <mutex>
#include <string>

namespace {

namespace comm = cv::vek::rovo::comm;

std::mutex g_lock;
std::string g_notes;

void Note(const std::string &line)
{
    std::lock_guard lock(g_lock);
    g_notes += line + '\n';
}

std::uint32_t WordAt(const cv::krn::ByteBuffer &buffer, std::size_t offset)
{
    if (buffer.size() < offset + 4)
        return 0;
    const std::uint8_t *b = buffer.data() + offset;
    return std::uint32_t(b[0]) | std::uint32_t(b[1]) << 8 | std::uint32_t(b[2]) << 16 | std::uint32_t(b[3]) << 24;
}

class RecordingSocket final : public comm::ClientSocket
{
public:
    explicit RecordingSocket(comm::ClientSocket *real) : m_real(real) {}

    void Release() override
    {
        m_real->Release();
        delete this;
    }
    std::uint32_t SetTimeout(std::uint32_t milliseconds) override
    {
        Note("SetTimeout " + std::to_string(milliseconds));
        return m_real->SetTimeout(milliseconds);
    }
    std::uint32_t Send(cv::krn::ByteBuffer &buffer, std::uint32_t timeoutMs) override
    {
        // A request record starts with its size tag, version, a reserved
        // word, category and code.
        Note("Send " + std::to_string(WordAt(buffer, 12)) + '/' + std::to_string(WordAt(buffer, 16)) + ' ' +
             std::to_string(timeoutMs));
        return m_real->Send(buffer, timeoutMs);
    }
    std::uint32_t Receive(cv::krn::ByteBuffer &buffer, std::uint32_t timeoutMs) override
    {
        Note("Receive " + std::to_string(timeoutMs));
        return m_real->Receive(buffer, timeoutMs);
    }

private:
    ~RecordingSocket() = default;

    comm::ClientSocket *m_real;
};

// Loaded on first use and kept while this library is loaded.
struct RealLibrary
{
    RealLibrary() : handle(::dlopen(RECORDING_COMM_REAL_LIBRARY, RTLD_NOW | RTLD_LOCAL))
    {
        if (handle)
            newClientSocket = reinterpret_cast<comm::NewClientSocketFunction>(
                ::dlsym(handle, comm::kNewClientSocketExport));
    }
    ~RealLibrary()
    {
        if (handle)
            ::dlclose(handle);
    }

    void *handle;
    comm::NewClientSocketFunction newClientSocket = nullptr;
};

} // namespace

extern "C" SORVIK_EXPORT std::int32_t NewClientSocket(const cv::krn::WString &server,
                                                      const cv::krn::WString &serviceName,
                                                      const cv::krn::WString &serviceClass,
                                                      comm::ClientSocket **socket)
{
    static RealLibrary real;
    *socket = nullptr;
    if (!real.newClientSocket)
        return std::int32_t(comm::kResultFailure);
    comm::ClientSocket *connected = nullptr;
    const std::int32_t result = real.newClientSocket(server, serviceName, serviceClass, &connected);
    Note("NewClientSocket " + std::to_string(std::uint32_t(result)));
    if (connected)
        *socket = new RecordingSocket(connected);
    return result;
}

// The notes so far; taking them clears them.
extern "C" SORVIK_EXPORT void TakeRecordedCommCalls(std::string *notes)
{
    std::lock_guard lock(g_lock);
    notes->swap(g_notes);
    g_notes.clear();
}
