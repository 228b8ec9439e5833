#pragma once

#include <filesystem>

namespace cv::krn::osdep {

// Where this platform keeps what Windows keeps in the registry and in the
// system folder. Each is read from the environment on every call, so a
// process (or a test) can redirect it.

// The registry file: $CORVANE_REGISTRY, else /etc/corvane/registry.ini.
std::filesystem::path RegistryFilePath();

// The network adapter settings file "velos.ini": $CORVANE_VELOS_INI, else
// /etc/corvane/velos.ini.
std::filesystem::path VelosIniPath();

// The folder of named-mutex lock files: $CORVANE_MUTEX_DIR, else
// /tmp/corvane-mutex.
std::filesystem::path MutexDirectory();

} // namespace cv::krn::osdep
