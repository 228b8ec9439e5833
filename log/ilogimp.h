#pragma once

#include "log/iadditionaloutputcallback.h"
#include "log/ilogadmin.h"
#include "log/ilogglob.h"

#include <atomic>
#include <cstdint>
#include <functional>
#include <mutex>
#include <string>
#include <string_view>

namespace cv::util::file::log {

// A log writing UTF-16LE lines to a file, the console (UTF-8 on stdout) and an
// optional receiver. Debugger output (kOutputDebugger) has no channel on this
// platform and does nothing.
//
// The file is opened lazily by the first written line and is held with an
// exclusive lock, so a second writer (another log, another process) gets
// nothing instead of overwriting lines; readers are not affected. Failing file
// operations are ignored; the next line tries again.
//
// Thread-safe. Every line handle must be gone before the log is destroyed.
class ILogImp final : public ILogAdmin, public ILogGlob, public IAdditionalOutputCallBack
{
public:
    // Called under the log's lock with each written line (no line end) while
    // kOutputAdditional or kOutputAdditionalSwitch is set. The lock is
    // recursive, so the receiver may log to the same log, as long as it does
    // not recurse without end.
    using AdditionalOutput =
        std::function<void(LineKind kind, std::uint32_t verbosity, std::u16string_view text)>;

    explicit ILogImp(std::u16string_view fileName = {}, std::uint32_t infoMask = 0,
                     AdditionalOutput receiver = {});

    ILogOut FatalError(const char *sourceFile, int line) override;
    ILogOut Error(const char *sourceFile, int line) override;
    ILogOut Warning(const char *sourceFile, int line) override;
    ILogOut Info(const char *sourceFile, int line, std::uint32_t verbosity) override;
    ~ILogImp() override;
    void CloseFile() override;
    void Flush() override;
    void DeleteFile() override;
    void SetFileName(std::u16string_view fileName) override;
    void SetInfoMask(std::uint32_t mask) override;
    void SetOutputFlags(std::uint32_t flags) override;
    std::uint32_t GetInfoMask() const override;
    std::uint32_t GetOutputFlags() const override;
    std::uint64_t GetWarningCount() const override;
    std::uint64_t GetErrorCount() const override;
    void SetMaxFileSize(std::uint32_t kib) override;
    std::uint32_t GetMaxFileSize() const override;
    bool GetFileName(char16_t *buffer, std::size_t capacity) const override;

    void WriteLine(std::u16string_view text, LineKind kind, std::uint32_t verbosity) override;
    std::u16string_view LineEnd() const override;

    void SwitchOn(std::uint32_t mask) override;
    void SwitchOff() override;

private:
    ILogOut StartLine(const char *sourceFile, int line, LineKind kind, std::uint32_t verbosity,
                      std::uint32_t flags);
    bool OpenFileLocked();
    void CloseFileLocked() noexcept;
    void WriteToFileLocked(std::u16string_view text);
    void WriteToConsoleLocked(std::u16string_view text);

    std::atomic<std::uint64_t> m_errorCount{0};
    std::atomic<std::uint64_t> m_warningCount{0};
    std::u16string m_fileName;
    const std::u16string m_logName{u"DSA"};
    // The mask and the flags are changed under the lock but read without it,
    // so that filtering a line needs no lock.
    std::atomic<std::uint32_t> m_infoMask;
    int m_file = -1;
    std::uint64_t m_bytesWritten = 0;
    std::uint64_t m_maxFileSize = 0; // bytes
    std::atomic<std::uint32_t> m_outputFlags;
    const std::int64_t m_creationTime; // seconds since the epoch
    const AdditionalOutput m_receiver;
    std::string m_consoleBuffer; // reused under the lock
    mutable std::recursive_mutex m_mutex;
};

} // namespace cv::util::file::log
