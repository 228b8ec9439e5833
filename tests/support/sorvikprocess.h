#pragma once

#include <sys/types.h>

#include <chrono>
#include <filesystem>
#include <string>
#include <vector>

namespace testsupport {

// A reference server process started by a test. It inherits the test's
// environment (registry, store, runtime and mutex folders); every wait has a
// deadline, and a process still running at destruction is killed.
class SorvikProcess final
{
public:
    // With an output file, the process's standard output goes there.
    SorvikProcess(const std::string &program, const std::vector<std::string> &arguments,
                  const std::filesystem::path &output = {});
    ~SorvikProcess();

    SorvikProcess(const SorvikProcess &) = delete;
    SorvikProcess &operator=(const SorvikProcess &) = delete;

    // The local service socket of an instance ("" for the default server).
    static std::filesystem::path SocketOf(const std::string &portName);

    // True once the instance's socket exists; false when the process ended
    // or the time ran out.
    bool WaitUntilServing(const std::string &portName, std::chrono::milliseconds within = std::chrono::seconds(10));

    // Sends the signal and waits for the end: the exit code, 128 + signal
    // for a signalled end, or -1 when the process did not end in time.
    int Stop(int signal, std::chrono::milliseconds within = std::chrono::seconds(10));
    int Wait(std::chrono::milliseconds within = std::chrono::seconds(10));

    pid_t Pid() const noexcept { return m_pid; }

private:
    pid_t m_pid = -1;
};

} // namespace testsupport
