#include "log/ilogimp.h"

#include "log/iloglineimp.h"
#include "log/logtext.h"

#include <bit>
#include <cerrno>
#include <cstdio>
#include <ctime>
#include <utility>

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/file.h>
#include <sys/uio.h>
#include <unistd.h>

namespace cv::util::file::log {

// The file is the host's UTF-16 written as bytes.
static_assert(std::endian::native == std::endian::little, "log files are UTF-16LE: add a byte swap here");

namespace {

constexpr std::u16string_view kLineEnd = u"\r\n";
constexpr std::u16string_view kBanner = u"***************** New logfile section *******************";
constexpr unsigned char kByteOrderMark[] = {0xFF, 0xFE};
// Room for the prefixes and a typical message, so most lines allocate once.
constexpr std::size_t kLineReserve = 120;

iovec Bytes(std::u16string_view text)
{
    return {const_cast<char16_t *>(text.data()), text.size() * sizeof(char16_t)};
}

// Writes all parts unless the file fails; returns the bytes written.
std::uint64_t WriteAll(int fd, iovec *parts, int count)
{
    std::uint64_t total = 0;
    while (count > 0) {
        const ssize_t written = ::writev(fd, parts, count);
        if (written < 0 && errno == EINTR)
            continue;
        if (written <= 0)
            break;
        total += static_cast<std::uint64_t>(written);
        auto left = static_cast<std::size_t>(written);
        while (count > 0 && left >= parts->iov_len) {
            left -= parts->iov_len;
            ++parts;
            --count;
        }
        if (count > 0) {
            parts->iov_base = static_cast<char *>(parts->iov_base) + left;
            parts->iov_len -= left;
        }
    }
    return total;
}

std::string FilePath(std::u16string_view fileName)
{
    std::string path;
    text::AppendAsUtf8(path, fileName);
    return path;
}

} // namespace

ILogImp::ILogImp(std::u16string_view fileName, std::uint32_t infoMask, AdditionalOutput receiver)
    : m_fileName(fileName),
      m_infoMask(infoMask),
      m_outputFlags(fileName.empty() ? 0u : kOutputFile),
      m_creationTime(static_cast<std::int64_t>(std::time(nullptr))),
      m_receiver(std::move(receiver))
{
}

ILogOut ILogImp::FatalError(const char *sourceFile, int line)
{
    m_errorCount.fetch_add(1, std::memory_order_relaxed);
    const std::uint32_t flags = m_outputFlags.load(std::memory_order_relaxed);
    if ((flags & kOutputChannels) == 0)
        return {};
    return StartLine(sourceFile, line, LineKind::FatalError, 0, flags);
}

ILogOut ILogImp::Error(const char *sourceFile, int line)
{
    m_errorCount.fetch_add(1, std::memory_order_relaxed);
    const std::uint32_t flags = m_outputFlags.load(std::memory_order_relaxed);
    if ((flags & kOutputChannels) == 0)
        return {};
    return StartLine(sourceFile, line, LineKind::Error, 0, flags);
}

ILogOut ILogImp::Warning(const char *sourceFile, int line)
{
    m_warningCount.fetch_add(1, std::memory_order_relaxed);
    const std::uint32_t flags = m_outputFlags.load(std::memory_order_relaxed);
    if ((flags & kOutputChannels) == 0)
        return {};
    return StartLine(sourceFile, line, LineKind::Warning, 0, flags);
}

ILogOut ILogImp::Info(const char *sourceFile, int line, std::uint32_t verbosity)
{
    const std::uint32_t flags = m_outputFlags.load(std::memory_order_relaxed);
    if ((flags & kOutputChannels) == 0 ||
        (m_infoMask.load(std::memory_order_relaxed) & (1u << (verbosity % 32))) == 0)
        return {};
    return StartLine(sourceFile, line, LineKind::Info, verbosity, flags);
}

ILogImp::~ILogImp()
{
    CloseFileLocked();
}

void ILogImp::CloseFile()
{
    std::lock_guard lock(m_mutex);
    CloseFileLocked();
}

void ILogImp::Flush()
{
    std::lock_guard lock(m_mutex);
    if (m_file >= 0)
        ::fdatasync(m_file);
    if (m_outputFlags.load(std::memory_order_relaxed) & kOutputConsole)
        std::fflush(stdout);
}

void ILogImp::DeleteFile()
{
    std::lock_guard lock(m_mutex);
    CloseFileLocked();
    if (!m_fileName.empty())
        ::unlink(FilePath(m_fileName).c_str());
}

void ILogImp::SetFileName(std::u16string_view fileName)
{
    std::lock_guard lock(m_mutex);
    if (fileName != m_fileName) {
        CloseFileLocked();
        m_fileName = fileName;
    }
    const std::uint32_t flags = m_outputFlags.load(std::memory_order_relaxed);
    m_outputFlags.store(m_fileName.empty() ? flags & ~kOutputFile : flags | kOutputFile, std::memory_order_relaxed);
}

void ILogImp::SetInfoMask(std::uint32_t mask)
{
    std::lock_guard lock(m_mutex);
    m_infoMask.store(mask, std::memory_order_relaxed);
}

void ILogImp::SetOutputFlags(std::uint32_t flags)
{
    std::lock_guard lock(m_mutex);
    const std::uint32_t kept = m_outputFlags.load(std::memory_order_relaxed) & kOutputAdditionalSwitch;
    m_outputFlags.store((flags & ~kOutputAdditionalSwitch) | kept, std::memory_order_relaxed);
}

std::uint32_t ILogImp::GetInfoMask() const
{
    return m_infoMask.load(std::memory_order_relaxed);
}

std::uint32_t ILogImp::GetOutputFlags() const
{
    return m_outputFlags.load(std::memory_order_relaxed);
}

std::uint64_t ILogImp::GetWarningCount() const
{
    return m_warningCount.load(std::memory_order_relaxed);
}

std::uint64_t ILogImp::GetErrorCount() const
{
    return m_errorCount.load(std::memory_order_relaxed);
}

void ILogImp::SetMaxFileSize(std::uint32_t kib)
{
    std::lock_guard lock(m_mutex);
    m_maxFileSize = std::uint64_t{kib} * 1024;
}

std::uint32_t ILogImp::GetMaxFileSize() const
{
    std::lock_guard lock(m_mutex);
    return static_cast<std::uint32_t>(m_maxFileSize / 1024);
}

bool ILogImp::GetFileName(char16_t *buffer, std::size_t capacity) const
{
    if (!buffer || capacity == 0)
        return false;
    std::lock_guard lock(m_mutex);
    if (m_fileName.size() >= capacity) {
        buffer[0] = u'\0';
        return false;
    }
    buffer[m_fileName.copy(buffer, m_fileName.size())] = u'\0';
    return true;
}

void ILogImp::WriteLine(std::u16string_view text, LineKind kind, std::uint32_t verbosity)
{
    std::lock_guard lock(m_mutex);
    const std::uint32_t flags = m_outputFlags.load(std::memory_order_relaxed);
    if (flags & kOutputFile)
        WriteToFileLocked(text);
    // kOutputDebugger: no debugger channel on this platform.
    if (flags & kOutputConsole)
        WriteToConsoleLocked(text);
    if (m_receiver && (flags & (kOutputAdditional | kOutputAdditionalSwitch)))
        m_receiver(kind, verbosity, text);
}

std::u16string_view ILogImp::LineEnd() const
{
    return kLineEnd;
}

void ILogImp::SwitchOn(std::uint32_t mask)
{
    std::lock_guard lock(m_mutex);
    m_infoMask.store(mask, std::memory_order_relaxed);
    m_outputFlags.fetch_or(kOutputAdditionalSwitch, std::memory_order_relaxed);
}

void ILogImp::SwitchOff()
{
    std::lock_guard lock(m_mutex);
    m_infoMask.store(0, std::memory_order_relaxed);
    m_outputFlags.fetch_and(~kOutputAdditionalSwitch, std::memory_order_relaxed);
}

ILogOut ILogImp::StartLine(const char *sourceFile, int line, LineKind kind, std::uint32_t verbosity,
                           std::uint32_t flags)
{
    std::u16string text;
    text.reserve(kLineReserve);
    if (flags & kOutputElapsedTime) {
        text::AppendAscii(text, "T=");
        text::AppendDecimal(text, static_cast<std::int64_t>(std::time(nullptr)) - m_creationTime);
        text::AppendAscii(text, "s: ");
    }
    if ((flags & kOutputSourcePosition) && sourceFile && *sourceFile) {
        text::AppendUtf8(text, text::BaseName(sourceFile));
        text += u'(';
        text::AppendDecimal(text, line);
        text::AppendAscii(text, "): ");
    }
    text += m_logName;
    switch (kind) {
    case LineKind::FatalError:
        text::AppendAscii(text, ": FATALERROR: ");
        break;
    case LineKind::Error:
        text::AppendAscii(text, ": ERROR: ");
        break;
    case LineKind::Warning:
        text::AppendAscii(text, ": Warning: ");
        break;
    case LineKind::Info:
        text::AppendAscii(text, verbosity < 10 ? ": Info(0" : ": Info(");
        text::AppendDecimal(text, verbosity);
        text::AppendAscii(text, "): ");
        break;
    }
    return ILogOut(new ILogLineImp(*this, kind, verbosity, std::move(text)));
}

bool ILogImp::OpenFileLocked()
{
    // A log tells what was asked of whom: for its owner's eyes only.
    const int fd = ::open(FilePath(m_fileName).c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    if (fd < 0)
        return false;
    struct stat status = {};
    if (::fstat(fd, &status) == 0 && status.st_uid == ::geteuid() && (status.st_mode & 077))
        ::fchmod(fd, status.st_mode & 0700);
    // Stands in for a share mode that lets others read but not write.
    const off_t end = ::flock(fd, LOCK_EX | LOCK_NB) == 0 ? ::lseek(fd, 0, SEEK_END) : -1;
    if (end < 0) {
        ::close(fd);
        return false;
    }
    // An empty file gets the mark too, so the file never holds UTF-16 without one.
    iovec parts[3];
    int count = 0;
    if (end == 0)
        parts[count++] = {const_cast<unsigned char *>(kByteOrderMark), sizeof kByteOrderMark};
    parts[count++] = Bytes(kBanner);
    parts[count++] = Bytes(kLineEnd);
    WriteAll(fd, parts, count);
    const off_t size = ::lseek(fd, 0, SEEK_END);
    m_file = fd;
    m_bytesWritten = size < 0 ? 0 : static_cast<std::uint64_t>(size);
    return true;
}

void ILogImp::CloseFileLocked() noexcept
{
    if (m_file >= 0) {
        ::close(m_file);
        m_file = -1;
    }
}

void ILogImp::WriteToFileLocked(std::u16string_view text)
{
    if (m_file < 0 && (m_fileName.empty() || !OpenFileLocked()))
        return;
    if (m_maxFileSize != 0 && m_bytesWritten > m_maxFileSize && ::lseek(m_file, 2, SEEK_SET) == 2)
        m_bytesWritten = 2;
    iovec parts[] = {Bytes(text), Bytes(kLineEnd)};
    // The line end counts too: the count is the write position.
    m_bytesWritten += WriteAll(m_file, parts, 2);
}

void ILogImp::WriteToConsoleLocked(std::u16string_view text)
{
    m_consoleBuffer.clear();
    text::AppendAsUtf8(m_consoleBuffer, text);
    // The console takes this platform's line end; CRLF belongs to the file format.
    m_consoleBuffer += '\n';
    std::fwrite(m_consoleBuffer.data(), 1, m_consoleBuffer.size(), stdout);
}

} // namespace cv::util::file::log
