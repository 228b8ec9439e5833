#include "krn/osdep/process.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

extern char **environ;

namespace cv::krn::osdep {

namespace {

// The descriptors the program gets as standard input, output and error.
// Both are above 2, so that placing one cannot overwrite the other.
struct StandardStreams
{
    int input = -1;
    int output = -1;

    StandardStreams() = default;
    StandardStreams(const StandardStreams &) = delete;
    StandardStreams &operator=(const StandardStreams &) = delete;
    ~StandardStreams()
    {
        if (output >= 0 && output != input)
            ::close(output);
        if (input >= 0)
            ::close(input);
    }
};

int AboveStandardStreams(int fd)
{
    if (fd < 0 || fd > 2)
        return fd;
    const int moved = ::fcntl(fd, F_DUPFD_CLOEXEC, 3);
    ::close(fd);
    return moved;
}

int OpenOutputFile(const std::filesystem::path &file)
{
    const int fd = ::open(file.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_NOCTTY | O_CLOEXEC, 0600);
    if (fd < 0)
        return -1;
    struct stat status = {};
    // What the program writes is for the user who started it; a file of
    // another owner, or anything but a plain file, is not used.
    if (::fstat(fd, &status) != 0 || !S_ISREG(status.st_mode) || status.st_uid != ::geteuid()
        || ((status.st_mode & 077) && ::fchmod(fd, status.st_mode & 0700) != 0)) {
        ::close(fd);
        return -1;
    }
    return AboveStandardStreams(fd);
}

bool OpenStandardStreams(const std::filesystem::path &outputFile, StandardStreams &streams)
{
    streams.input = AboveStandardStreams(::open("/dev/null", O_RDWR | O_NOCTTY | O_CLOEXEC));
    if (streams.input < 0)
        return false;
    streams.output = outputFile.empty() ? -1 : OpenOutputFile(outputFile);
    if (streams.output < 0)
        streams.output = streams.input;
    return true;
}

// Between fork and exec only async-signal-safe calls: the caller may have
// threads holding locks.
[[noreturn]] void RunGrandchild(const char *program, const StandardStreams &streams, int report)
{
    ::setsid();
    ::setpriority(PRIO_PROCESS, 0, 0);
    ::dup2(streams.input, STDIN_FILENO);
    ::dup2(streams.output, STDOUT_FILENO);
    ::dup2(streams.output, STDERR_FILENO);
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

bool StartDetachedProcess(const std::string &program, const std::filesystem::path &outputFile)
{
    StandardStreams streams;
    if (!OpenStandardStreams(outputFile, streams))
        return false;
    int report[2];
    if (::pipe2(report, O_CLOEXEC) != 0)
        return false;
    report[0] = AboveStandardStreams(report[0]);
    report[1] = AboveStandardStreams(report[1]);
    if (report[0] < 0 || report[1] < 0) {
        for (const int fd : report)
            if (fd >= 0)
                ::close(fd);
        return false;
    }

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
            RunGrandchild(program.c_str(), streams, report[1]);
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
