#pragma once

#include "support/scopedenv.h"
#include "support/sorvikprocess.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <string>

namespace reftest {

// Every test of the reference server gets its own store, runtime and mutex
// folders. The process-wide registry names the reference libraries, and as
// the desktop server's folder one holding a "Sorvik" that records its pid
// before it becomes the reference server.
class ServerTest : public ::testing::Test
{
protected:
    ServerTest();

    std::unique_ptr<testsupport::SorvikProcess> Start(const std::vector<std::string> &arguments,
                                                      const std::string &portName,
                                                      const std::filesystem::path &output = {});
    // The index status file of a running instance's Sorvik.
    std::filesystem::path StatusFile() const;
    void Sql(const std::string &statement) const;

    // The pid the last server started through the registry wrote.
    static pid_t StartedServerPid();

    testsupport::TempDir m_dir;
    testsupport::ScopedEnv m_store;
    testsupport::ScopedEnv m_runtime;
    testsupport::ScopedEnv m_mutexes;
};

void InstallServerRegistry();

} // namespace reftest
