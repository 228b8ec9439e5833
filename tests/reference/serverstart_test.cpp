// The client starts the local server itself when it is not running. The
// reference server stands behind a script that notes each start, and the
// comm library behind one that notes what the client asks of its socket.

#include "serverfixture.h"

#include "dunemere/config.h"
#include "dunemere/instancenames.h"
#include "dunemere/requestorbase.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferdata.h"
#include "krn/osdep/mutex.h"
#include "log/ilogimp.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <dlfcn.h>
#include <signal.h>

#include <fstream>
#include <sstream>
#include <thread>

namespace {

using cv::vek::rovo::RequestorBase;
using cv::vek::rovo::dunemere::kGlobalServerMutexName;
using ::testing::ElementsAre;

bool GlobalServerMutexHeld()
{
    cv::krn::osdep::Mutex mutex(kGlobalServerMutexName);
    if (!mutex.TryAcquire())
        return true;
    mutex.Release();
    return false;
}

class ServerStart : public reftest::ServerTest
{
protected:
    ServerStart()
    {
        const auto desktop = m_dir.path() / "desktop";
        std::filesystem::create_directories(desktop);
        std::ofstream(desktop / "Sorvik") << "#!/bin/sh\necho $$ >> '" << StartsFile().string() << "'\nexec '"
                                          << SORVIK_SERVER << "' \"$@\"\n";
        std::filesystem::permissions(desktop / "Sorvik", std::filesystem::perms::owner_all);
        std::ofstream(m_dir.file("registry.ini"))
            << "[Software\\Corvane\\Common\\Sorvik]\nbinDir=" << SORVIK_REFERENCE_LIB_DIR << "\n\n"
            << "[Software\\Corvane\\Common\\Sorvik\\ConfigItems]\nrovoCommDllClient=" << RECORDING_COMM_LIBRARY
            << "\n\n"
            << "[Software\\Corvane\\Common\\VEK]\nbinDir=" << SORVIK_REFERENCE_LIB_DIR << "\n\n"
            << "[Software\\Corvane\\Common\\SorvikDesktop]\nbinDir=" << desktop.string() << "\n";
        m_registry.emplace("CORVANE_REGISTRY", m_dir.file("registry.ini").string());

        // Kept loaded here, the recorder keeps its notes while the client
        // loads and unloads it.
        m_recorder = ::dlopen(RECORDING_COMM_LIBRARY, RTLD_NOW | RTLD_LOCAL);
        if (m_recorder)
            m_takeNotes = reinterpret_cast<void (*)(std::string *)>(::dlsym(m_recorder, "TakeRecordedCommCalls"));
    }

    ~ServerStart() override
    {
        for (const pid_t pid : Starts())
            ::kill(pid, SIGTERM);
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
        while (GlobalServerMutexHeld() && std::chrono::steady_clock::now() < deadline)
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        EXPECT_FALSE(GlobalServerMutexHeld()) << "a started server outlived the test";
        if (m_recorder)
            ::dlclose(m_recorder);
    }

    void SetUp() override { ASSERT_NE(m_takeNotes, nullptr) << ::dlerror(); }

    std::filesystem::path StartsFile() const { return m_dir.file("starts"); }

    // The processes the client started, in order.
    std::vector<pid_t> Starts() const
    {
        std::vector<pid_t> pids;
        std::ifstream in(StartsFile());
        for (pid_t pid = 0; in >> pid;)
            pids.push_back(pid);
        return pids;
    }

    // The records sent since the last call, as "Send CATEGORY/CODE TIMEOUT".
    std::vector<std::string> Sends()
    {
        std::string notes;
        m_takeNotes(&notes);
        std::vector<std::string> sends;
        std::istringstream lines(notes);
        for (std::string line; std::getline(lines, line);)
            if (line.starts_with("Send "))
                sends.push_back(line);
        return sends;
    }

    static std::uint32_t ElementCount(RequestorBase &requestor, PLUGIN::Config &config)
    {
        cv::vek::rovo::tRequestTransferData request(config.GetServerVersion(), 5, 4002);
        request.Arguments()[2] = 8;
        return cv::vek::rovo::tResponseTransferData(requestor.Exchange(config.GetReceiveTimeout(), request)).Value();
    }

    std::optional<testsupport::ScopedEnv> m_registry;
    void *m_recorder = nullptr;
    void (*m_takeNotes)(std::string *) = nullptr;
    cv::util::file::log::ILogImp m_log;
};

TEST_F(ServerStart, TheFirstExchangeStartsTheServerOnceAndGivesItsRequestTheStartAllowance)
{
    ASSERT_FALSE(GlobalServerMutexHeld());
    PLUGIN::Config config(u"<server>localhost</server><sendtimeout>2000</sendtimeout>");
    RequestorBase requestor(config, m_log);

    EXPECT_EQ(ElementCount(requestor, config), 0u);
    EXPECT_EQ(Starts().size(), 1u) << "one start, though the exchange, the connection and the log-on each ask";
    const std::string allowed = "Send 5/4002 " + std::to_string(2000 + RequestorBase::kServerStartAllowance);
    EXPECT_THAT(Sends(), ElementsAre("Send 4/3001 2000", allowed));

    EXPECT_EQ(ElementCount(requestor, config), 0u);
    EXPECT_THAT(Sends(), ElementsAre("Send 5/4002 2000")) << "the server runs: no allowance";

    // Another client finds the server running by its mutex.
    PLUGIN::Config otherConfig(u"<server>localhost</server><sendtimeout>2000</sendtimeout>");
    RequestorBase other(otherConfig, m_log);
    EXPECT_EQ(ElementCount(other, otherConfig), 0u);
    EXPECT_THAT(Sends(), ElementsAre("Send 4/3001 2000", "Send 5/4002 2000"));
    EXPECT_EQ(Starts().size(), 1u);
}

} // namespace
