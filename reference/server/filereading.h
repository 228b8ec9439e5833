#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace sorvik::server {

enum class ReadOutcome
{
    Complete,   // every byte up to the end was handed on
    TimedOut,   // the deadline passed first
    Unreadable, // the file cannot be opened or read (why says why)
    Stopped,    // the stop check asked to stop
};

struct ReadResult
{
    ReadOutcome outcome = ReadOutcome::Complete;
    std::string why;
    // Of the file as opened; -1 when it could not be.
    std::int64_t size = -1;
    std::int64_t modifiedNs = -1;
};

// Interrupts a read that waits: when wakeFd becomes readable, stopRequested
// is asked (it may drain wakeFd) whether to give up.
struct ReadInterruption
{
    int wakeFd = -1;
    std::function<bool()> stopRequested;
};

// Reads a file to its end within the deadline, handing the bytes to consume
// as they come. Nothing blocks: the file is opened without waiting (a named
// pipe without a writer opens at once), and a pipe or device is read only
// after poll() says there is something, waiting at most until the deadline.
// Regular files are read straight away, the deadline looked at between
// pieces. Exceptions of consume pass through.
ReadResult ReadWithDeadline(const std::string &path, std::chrono::steady_clock::time_point deadline,
                            const ReadInterruption &interruption, std::vector<char> &buffer,
                            const std::function<void(std::string_view)> &consume);

} // namespace sorvik::server
