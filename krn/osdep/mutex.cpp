#include "krn/osdep/mutex.h"

#include "krn/osdep/configpaths.h"
#include "krn/osdep/posixerror.h"
#include "krn/utf.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace cv::krn::osdep {

namespace {

constexpr const char *kSource = "Mutex";

bool KeepsAsIs(unsigned char c)
{
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '-' || c == '_'
        || c == '.';
}

void EnsureDirectory(const std::filesystem::path &directory)
{
    if (::mkdir(directory.c_str(), 01777) == 0) {
        // mkdir applies the umask; the folder must be open to every user.
        if (::chmod(directory.c_str(), 01777) != 0)
            throw PosixError(kSource, __LINE__);
    } else if (errno != EEXIST) {
        throw PosixError(kSource, __LINE__);
    }
}

int OpenExisting(const char *path)
{
    return ::open(path, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC);
}

int CreateOrOpen(const std::filesystem::path &path)
{
    int fd = ::open(path.c_str(), O_RDONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC, 0666);
    if (fd >= 0) {
        if (::fchmod(fd, 0666) != 0) {
            const int error = errno;
            ::close(fd);
            throw PosixError(static_cast<std::uint32_t>(error), kSource, __LINE__);
        }
        return fd;
    }
    if (errno != EEXIST)
        throw PosixError(kSource, __LINE__);
    fd = OpenExisting(path.c_str());
    if (fd < 0)
        throw PosixError(kSource, __LINE__);
    return fd;
}

// A FIFO or device planted under a lock file's name must not be used.
void RequireRegularFile(int fd)
{
    struct stat status = {};
    if (::fstat(fd, &status) == 0 && S_ISREG(status.st_mode))
        return;
    ::close(fd);
    throw PosixError(EINVAL, kSource, __LINE__);
}

} // namespace

std::string Mutex::LockFileName(std::u16string_view name)
{
    static constexpr char kHex[] = "0123456789ABCDEF";
    std::string file;
    for (const char byte : ToUtf8(name)) {
        const auto c = static_cast<unsigned char>(byte);
        if (KeepsAsIs(c)) {
            file += byte;
        } else {
            file += '%';
            file += kHex[c >> 4];
            file += kHex[c & 0xF];
        }
    }
    return file + ".lock";
}

std::filesystem::path Mutex::LockFilePath(std::u16string_view name)
{
    return MutexDirectory() / LockFileName(name);
}

Mutex::Mutex(std::u16string_view name)
{
    const std::filesystem::path path = LockFilePath(name);
    EnsureDirectory(path.parent_path());
    const int fd = CreateOrOpen(path);
    RequireRegularFile(fd);
    m_fd = fd;
}

Mutex::~Mutex()
{
    // Unlock explicitly: a forked child may still share the open file, and
    // closing only this descriptor would then keep the lock alive.
    if (m_owned)
        ::flock(m_fd, LOCK_UN);
    ::close(m_fd);
}

bool Mutex::TryAcquire()
{
    while (::flock(m_fd, LOCK_EX | LOCK_NB) != 0) {
        if (errno == EWOULDBLOCK)
            return false;
        if (errno != EINTR)
            throw PosixError(kSource, __LINE__);
    }
    m_owned = true;
    return true;
}

void Mutex::Acquire()
{
    while (::flock(m_fd, LOCK_EX) != 0) {
        if (errno != EINTR)
            throw PosixError(kSource, __LINE__);
    }
    m_owned = true;
}

void Mutex::Release()
{
    if (!m_owned)
        return;
    if (::flock(m_fd, LOCK_UN) != 0)
        throw PosixError(kSource, __LINE__);
    m_owned = false;
}

} // namespace cv::krn::osdep
