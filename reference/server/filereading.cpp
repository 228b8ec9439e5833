#include "reference/server/filereading.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace sorvik::server {

namespace {

constexpr std::size_t kPieceBytes = 64 * 1024;

class Descriptor
{
public:
    explicit Descriptor(int fd) : m_fd(fd) {}
    ~Descriptor()
    {
        if (m_fd >= 0)
            ::close(m_fd);
    }
    Descriptor(const Descriptor &) = delete;
    Descriptor &operator=(const Descriptor &) = delete;
    int get() const { return m_fd; }

private:
    int m_fd;
};

ReadResult Failed(const char *what)
{
    return {ReadOutcome::Unreadable, std::string(what) + ": " + std::strerror(errno)};
}

int MillisecondsLeft(std::chrono::steady_clock::time_point deadline)
{
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    return int(std::clamp<std::chrono::milliseconds::rep>(left.count(), 0, 1 << 30));
}

enum class Readiness
{
    Ready,
    TimedOut,
    Stopped,
};

Readiness WaitReadable(int fd, std::chrono::steady_clock::time_point deadline, const ReadInterruption &interruption)
{
    for (;;) {
        const int left = MillisecondsLeft(deadline);
        if (left == 0)
            return Readiness::TimedOut;
        pollfd waits[2] = {{fd, POLLIN, 0}, {interruption.wakeFd, POLLIN, 0}};
        const int ready = ::poll(waits, interruption.wakeFd >= 0 ? 2 : 1, left);
        if (ready < 0 && errno != EINTR)
            return Readiness::Ready; // the read reports what is wrong
        if (ready > 0 && waits[1].revents != 0 && interruption.stopRequested && interruption.stopRequested())
            return Readiness::Stopped;
        if (ready > 0 && waits[0].revents != 0)
            return Readiness::Ready;
    }
}

} // namespace

ReadResult ReadWithDeadline(const std::string &path, std::chrono::steady_clock::time_point deadline,
                            const ReadInterruption &interruption, std::vector<char> &buffer,
                            const std::function<void(std::string_view)> &consume)
{
    const Descriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_NOFOLLOW | O_CLOEXEC));
    if (file.get() < 0)
        return Failed("cannot open the file");
    struct stat info;
    if (::fstat(file.get(), &info) != 0)
        return Failed("cannot look at the file");
    ReadResult result;
    result.size = std::int64_t(info.st_size);
    result.modifiedNs = std::int64_t(info.st_mtim.tv_sec) * 1000000000 + info.st_mtim.tv_nsec;
    if (!S_ISREG(info.st_mode) && !S_ISFIFO(info.st_mode) && !S_ISCHR(info.st_mode))
    {
        result.outcome = ReadOutcome::Unreadable;
        result.why = "not a file that can be read";
        return result;
    }
    const bool mayWait = !S_ISREG(info.st_mode);
    if (buffer.size() < kPieceBytes)
        buffer.resize(kPieceBytes);

    for (;;) {
        if (mayWait) {
            switch (WaitReadable(file.get(), deadline, interruption)) {
            case Readiness::TimedOut:
                result.outcome = ReadOutcome::TimedOut;
                return result;
            case Readiness::Stopped:
                result.outcome = ReadOutcome::Stopped;
                return result;
            case Readiness::Ready:
                break;
            }
        } else if (std::chrono::steady_clock::now() >= deadline) {
            result.outcome = ReadOutcome::TimedOut;
            return result;
        }
        const ssize_t got = ::read(file.get(), buffer.data(), buffer.size());
        if (got == 0)
            return result;
        if (got < 0) {
            if (errno == EINTR || errno == EAGAIN || errno == EWOULDBLOCK)
                continue;
            const ReadResult failed = Failed("cannot read the file");
            result.outcome = failed.outcome;
            result.why = failed.why;
            return result;
        }
        consume(std::string_view(buffer.data(), std::size_t(got)));
    }
}

} // namespace sorvik::server
