#pragma once

#include "dunemere/config.h"
#include "log/ilogimp.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace testsupport {

// A private runtime and mutex folder, the reference comm library named in
// the registry, and a log that keeps every line it is given.
class ProtocolTest : public ::testing::Test
{
protected:
    ProtocolTest();

    // Settings for the instance "P" with short time-outs, plus extra elements.
    PLUGIN::Config &Settings(const std::u16string &extra = {});
    bool Logged(std::u16string_view line) const;

    TempDir m_dir;
    ScopedEnv m_runtime;
    ScopedEnv m_mutexes;
    mutable std::mutex m_linesLock;
    std::vector<std::u16string> m_lines;
    cv::util::file::log::ILogImp m_log;
    std::unique_ptr<PLUGIN::Config> m_config;
};

// Installs the registry that names the reference comm library before any
// test asks for the library's path, which a process keeps for good.
void InstallCommRegistry();

} // namespace testsupport
