#include "protocolfixture.h"

#include <algorithm>
#include <fstream>

namespace testsupport {

namespace {

class CommRegistry : public ::testing::Environment
{
public:
    void SetUp() override
    {
        m_dir = std::make_unique<TempDir>();
        std::ofstream(m_dir->file("registry.ini"))
            << "[Software\\Corvane\\Common\\Sorvik]\nbinDir=" << SORVIK_COMM_LIBRARY_DIR << "\n";
        m_env = std::make_unique<ScopedEnv>("CORVANE_REGISTRY", m_dir->file("registry.ini").string());
    }
    void TearDown() override
    {
        m_env.reset();
        m_dir.reset();
    }

private:
    std::unique_ptr<TempDir> m_dir;
    std::unique_ptr<ScopedEnv> m_env;
};

} // namespace

void InstallCommRegistry()
{
    static bool installed = false;
    if (!installed)
        ::testing::AddGlobalTestEnvironment(new CommRegistry);
    installed = true;
}

ProtocolTest::ProtocolTest()
    : m_runtime("CORVANE_RUNTIME_DIR", (m_dir.path() / "run").string()),
      m_mutexes("CORVANE_MUTEX_DIR", (m_dir.path() / "mutex").string()),
      m_log({}, (1u << 5) | (1u << 2),
            [this](cv::util::file::log::LineKind, std::uint32_t, std::u16string_view text) {
                std::lock_guard lock(m_linesLock);
                m_lines.emplace_back(text);
            })
{
    m_log.SetOutputFlags(cv::util::file::log::kOutputAdditional);
}

PLUGIN::Config &ProtocolTest::Settings(const std::u16string &extra)
{
    // The first occurrence of an element counts, so extra comes first.
    m_config = std::make_unique<PLUGIN::Config>(extra + u"<server>localhost</server><portname>P</portname>"
                                                        u"<receivetimeout>3000</receivetimeout><sendtimeout>2000</sendtimeout>");
    return *m_config;
}

bool ProtocolTest::Logged(std::u16string_view line) const
{
    std::lock_guard lock(m_linesLock);
    return std::any_of(m_lines.begin(), m_lines.end(),
                       [&](const std::u16string &text) { return text.find(line) != std::u16string::npos; });
}

} // namespace testsupport
