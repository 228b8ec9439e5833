#pragma once

#include <chrono>
#include <string>
#include <vector>

#include <sys/types.h>

namespace krntest {

// This test binary started again as a helper process: the extra environment
// entries tell it what to do (see mutex_test.cpp). Its standard output comes
// back through a pipe; its standard input is a pipe that closes when this
// object goes, so a helper never outlives its test.
class ChildProcess final
{
public:
    explicit ChildProcess(const std::vector<std::string> &extraEnvironment);
    ~ChildProcess();
    ChildProcess(const ChildProcess &) = delete;
    ChildProcess &operator=(const ChildProcess &) = delete;

    // Waits until the child has printed the line, or the deadline passed.
    bool WaitForLine(const std::string &line, std::chrono::milliseconds deadline);

    void Kill();

private:
    pid_t m_pid = -1;
    int m_output = -1;
    int m_input = -1;
    std::string m_received;
};

} // namespace krntest
