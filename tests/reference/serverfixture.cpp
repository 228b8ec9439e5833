#include "serverfixture.h"

#include <sqlite3.h>

#include <fstream>

namespace reftest {

namespace {

std::filesystem::path PidFile(const testsupport::TempDir &dir)
{
    return dir.file("started.pid");
}

class ServerRegistry : public ::testing::Environment
{
public:
    void SetUp() override
    {
        s_dir = std::make_unique<testsupport::TempDir>();
        const auto wrapperDir = s_dir->path() / "desktop";
        std::filesystem::create_directories(wrapperDir);
        const auto wrapper = wrapperDir / "Sorvik";
        std::ofstream(wrapper) << "#!/bin/sh\necho $$ > '" << PidFile(*s_dir).string() << "'\nexec '"
                               << SORVIK_SERVER << "' \"$@\"\n";
        std::filesystem::permissions(wrapper, std::filesystem::perms::owner_all);
        std::ofstream(s_dir->file("registry.ini"))
            << "[Software\\Corvane\\Common\\Sorvik]\nbinDir=" << SORVIK_REFERENCE_LIB_DIR << "\n\n"
            << "[Software\\Corvane\\Common\\VEK]\nbinDir=" << SORVIK_REFERENCE_LIB_DIR << "\n\n"
            << "[Software\\Corvane\\Common\\SorvikDesktop]\nbinDir=" << wrapperDir.string() << "\n";
        m_env = std::make_unique<testsupport::ScopedEnv>("CORVANE_REGISTRY", s_dir->file("registry.ini").string());
    }
    void TearDown() override
    {
        m_env.reset();
        s_dir.reset();
    }

    static std::unique_ptr<testsupport::TempDir> s_dir;

private:
    std::unique_ptr<testsupport::ScopedEnv> m_env;
};

std::unique_ptr<testsupport::TempDir> ServerRegistry::s_dir;

} // namespace

void InstallServerRegistry()
{
    static bool installed = false;
    if (!installed)
        ::testing::AddGlobalTestEnvironment(new ServerRegistry);
    installed = true;
}

pid_t ServerTest::StartedServerPid()
{
    pid_t pid = -1;
    std::ifstream(PidFile(*ServerRegistry::s_dir)) >> pid;
    return pid;
}

ServerTest::ServerTest()
    : m_store("CORVANE_SORVIK_STORE", (m_dir.path() / "store").string()),
      m_runtime("CORVANE_RUNTIME_DIR", (m_dir.path() / "run").string()),
      m_mutexes("CORVANE_MUTEX_DIR", (m_dir.path() / "mutex").string())
{
}

std::unique_ptr<testsupport::SorvikProcess> ServerTest::Start(const std::vector<std::string> &arguments,
                                                              const std::string &portName,
                                                              const std::filesystem::path &output)
{
    auto server = std::make_unique<testsupport::SorvikProcess>(SORVIK_SERVER, arguments, output);
    if (!server->WaitUntilServing(portName))
        ADD_FAILURE() << "the server did not come up";
    return server;
}

std::filesystem::path ServerTest::StatusFile() const
{
    for (const auto &entry : std::filesystem::recursive_directory_iterator(m_dir.path() / "store"))
        if (entry.path().filename() == "status.sqlite")
            return entry.path();
    ADD_FAILURE() << "no status file below the store";
    return {};
}

void ServerTest::Sql(const std::string &statement) const
{
    sqlite3 *db = nullptr;
    ASSERT_EQ(sqlite3_open(StatusFile().c_str(), &db), SQLITE_OK);
    sqlite3_busy_timeout(db, 5000);
    char *error = nullptr;
    EXPECT_EQ(sqlite3_exec(db, statement.c_str(), nullptr, nullptr, &error), SQLITE_OK) << (error ? error : "");
    sqlite3_free(error);
    sqlite3_close(db);
}

} // namespace reftest
