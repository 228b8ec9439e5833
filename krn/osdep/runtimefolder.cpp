#include "krn/osdep/runtimefolder.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

namespace cv::krn::osdep {

namespace {

std::string Quoted(const std::filesystem::path &path)
{
    return "\"" + path.string() + "\"";
}

} // namespace

std::filesystem::path RuntimeDirectory()
{
    if (const char *configured = std::getenv("CORVANE_RUNTIME_DIR"); configured && *configured)
        return configured;
    // A relative XDG_RUNTIME_DIR is invalid and would depend on the current folder.
    if (const char *session = std::getenv("XDG_RUNTIME_DIR"); session && *session == '/')
        return std::filesystem::path(session) / "corvane";
    return "/tmp/corvane-run-" + std::to_string(::geteuid());
}

std::string UntrustedReason(const std::filesystem::path &path)
{
    struct stat status = {};
    if (::lstat(path.c_str(), &status) != 0)
        return Quoted(path) + ": " + std::strerror(errno);
    if (S_ISLNK(status.st_mode))
        return Quoted(path) + " is a symbolic link";
    const uid_t me = ::geteuid();
    if (status.st_uid != me && status.st_uid != 0)
        return Quoted(path) + " belongs to user " + std::to_string(status.st_uid) + ", not to this user ("
            + std::to_string(me) + ") or root";
    if (S_ISDIR(status.st_mode) && (status.st_mode & (S_IWGRP | S_IWOTH)) && !(status.st_mode & S_ISVTX))
        return Quoted(path) + " may be changed by other users";
    return {};
}

std::string EnsureTrustedFolder(const std::filesystem::path &folder)
{
    if (::mkdir(folder.c_str(), 0700) != 0 && errno != EEXIST)
        return Quoted(folder) + ": " + std::strerror(errno);
    std::string reason = UntrustedReason(folder);
    if (reason.empty() && !std::filesystem::is_directory(folder))
        reason = Quoted(folder) + " is not a folder";
    return reason;
}

} // namespace cv::krn::osdep
