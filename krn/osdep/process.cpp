#include "krn/osdep/process.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

extern char **environ;

namespace cv::krn::osdep {

namespace {

// Between fork and exec only async-signal-safe calls: the caller may have
// threads holding locks.
[[noreturn]] void RunGrandchild(const char *program, int report)
{
    ::setsid();
    ::setpriority(PRIO_PROCESS, 0, 0);
    char *const argv[] = {const_cast<char *>(program), nullptr};
    // Everything but standard input, output, error and the report pipe
    // (which closes itself on a successful exec).
    ::close_range(3, unsigned(report) - 1, 0);
    ::close_range(unsigned(report) + 1, ~0u, 0);
    // A bare name is looked for along the search path.
    if (std::strchr(program, '/'))
        ::execve(program, argv, environ);
    else
        ::execvp(program, argv);
    const int error = errno;
    [[maybe_unused]] const ssize_t written = ::write(report, &error, sizeof error);
    ::_exit(127);
}

} // namespace

bool StartDetachedProcess(const std::string &program)
{
    int report[2];
    if (::pipe2(report, O_CLOEXEC) != 0)
        return false;

    const pid_t child = ::fork();
    if (child < 0) {
        ::close(report[0]);
        ::close(report[1]);
        return false;
    }
    if (child == 0) {
        ::close(report[0]);
        // A second fork leaves the server to init, so nobody has to wait for it.
        const pid_t grandchild = ::fork();
        if (grandchild == 0)
            RunGrandchild(program.c_str(), report[1]);
        if (grandchild < 0) {
            const int error = errno;
            [[maybe_unused]] const ssize_t written = ::write(report[1], &error, sizeof error);
        }
        ::_exit(0);
    }

    ::close(report[1]);
    int status = 0;
    while (::waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    // The write end closes on exec (nothing to read) or carries the errno.
    int error = 0;
    ssize_t got;
    do {
        got = ::read(report[0], &error, sizeof error);
    } while (got < 0 && errno == EINTR);
    ::close(report[0]);
    return got == 0;
}

} // namespace cv::krn::osdep
