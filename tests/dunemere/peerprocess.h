#pragma once

#include <sys/types.h>

#include <chrono>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace testsupport {

// A helper process whose standard output the test reads line by line. Every
// wait has a deadline; a process still running at destruction is killed.
class PeerProcess final
{
public:
    using Environment = std::vector<std::pair<std::string, std::string>>;

    PeerProcess(const std::string &program, const std::vector<std::string> &arguments,
                const Environment &overrides = {});
    ~PeerProcess();

    PeerProcess(const PeerProcess &) = delete;
    PeerProcess &operator=(const PeerProcess &) = delete;

    // The next line without its line end; nothing at end of output or when
    // the time ran out.
    std::optional<std::string> ReadLine(std::chrono::milliseconds within = std::chrono::seconds(20));

    // Waits for the end of the output and then for the process; its exit
    // code, or -1 when it did not exit normally in time.
    int Finish(std::chrono::milliseconds within = std::chrono::seconds(20));

private:
    pid_t m_pid = -1;
    int m_output = -1;
    std::string m_pending;
};

} // namespace testsupport
