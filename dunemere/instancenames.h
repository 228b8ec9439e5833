#pragma once

#include "krn/osdep/mutex.h"

#include <filesystem>
#include <memory>
#include <string>
#include <string_view>

namespace cv::vek::rovo::dunemere {

// The names a running server and its clients agree on, so that a client can
// tell whether a server runs without asking it.

// Held by the local server for its whole life.
inline constexpr std::u16string_view kGlobalServerMutexName = u"cv_vek_rovo_global_mutex";
// Followed by the port name; held by the instance serving that port name.
inline constexpr std::u16string_view kInstanceMutexPrefix = u"cv_vek_rovo_valdorn_instance_";

inline constexpr std::u16string_view kServerDesktopKey = u"Software\\Corvane\\Common\\SorvikDesktop";
inline constexpr std::u16string_view kServerExecutable = u"Sorvik";

std::u16string InstanceMutexName(std::u16string_view portName);

// Created or opened, not owned. Raise cv::krn::osdep::PosixError.
std::unique_ptr<krn::osdep::Mutex> OpenGlobalServerMutex();
std::unique_ptr<krn::osdep::Mutex> OpenInstanceMutex(std::u16string_view portName);

// The folder of the server executable: the "binDir" value of the desktop
// key (32-bit view), empty when the key or value is missing.
std::u16string ServerFolder();

// ServerFolder() joined with the executable's name; the bare name when the
// folder is unknown, so that the system's search path applies.
std::u16string ServerExecutablePath();

// Where the output of a local server that a client started goes:
// "Sorvik.log" in the runtime folder of the sockets (created for this user
// when missing). Empty when that folder cannot be trusted: the output is
// then thrown away.
std::filesystem::path StartedServerLogPath();

} // namespace cv::vek::rovo::dunemere
