// The wait window against a real reference server that takes its time over
// a commit: never shown when it is quick, shown once however often the wait
// times out, closing from the user while the server is busy, and from the
// module when it ends.

#include "optimize/optimizecustompropswaitdlg.h"
#include "serverlibs/searchareas.h"
#include "serverlibs/sorvikcalls.h"
#include "support/referencestore.h"
#include "support/scopedenv.h"
#include "support/sorvikprocess.h"
#include "uitest.h"

#include <QPointer>
#include <QTest>

#include <gtest/gtest.h>

namespace {

using cv::vek::rovo::optimize::COptimizeCustomPropsWaitDlg;
namespace serverlibs = cv::vek::rovo::serverlibs;
using namespace std::chrono_literals;

// Counts the times a window is shown.
class ShowCounter final : public QObject
{
public:
    int shown = 0;

protected:
    bool eventFilter(QObject *, QEvent *event) override
    {
        if (event->type() == QEvent::Show)
            ++shown;
        return false;
    }
};

class WaitWindowServer : public testsupport::ReferenceStore
{
protected:
    static constexpr int kUpdateTimeoutMs = 300;

    void SetUp() override
    {
        ReferenceStore::SetUp();
        uitest::Application();
    }
    void TearDown() override
    {
        if (m_window)
            m_window->Close();
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        m_server.reset();
        uitest::ExpectNoWindowsLeft();
        ReferenceStore::TearDown();
    }

    void StartServer(int applyDelayMs)
    {
        m_server = std::make_unique<testsupport::SorvikProcess>(SORVIK_SERVER,
                                                                std::vector<std::string>{
                                                                    "--apply-delay-ms", std::to_string(applyDelayMs)});
        ASSERT_TRUE(m_server->WaitUntilServing(""));
    }
    // Commits a change and opens the wait window on the server's index manager.
    void CommitAndWait()
    {
        const auto config = Open();
        Seed({{u"/data/" + std::u16string(1, char16_t(u'a' + m_commits)), u"", u"A" + std::u16string(1, char16_t(u'a' + m_commits++))}});
        auto indexManager = serverlibs::GetIndexManager(*config.sorvik);
        ASSERT_TRUE(indexManager) << "the server runs";
        m_opened = std::chrono::steady_clock::now();
        auto *window = new COptimizeCustomPropsWaitDlg(std::move(indexManager), QStringLiteral("Configuring Sorvik..."));
        window->installEventFilter(&m_shows);
        ASSERT_EQ(window->CreateModeless(nullptr), 1);
        m_window = window;
    }
    bool WaitUntilGone(std::chrono::milliseconds within = 10s)
    {
        return QTest::qWaitFor(
            [this] {
                QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
                return m_window.isNull();
            },
            int(within.count()));
    }
    std::chrono::milliseconds SinceOpened() const
    {
        return std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - m_opened);
    }

    testsupport::TempDir m_dir;
    testsupport::ScopedEnv m_runtime{"CORVANE_RUNTIME_DIR", (m_dir.path() / "run").string()};
    testsupport::ScopedEnv m_mutexes{"CORVANE_MUTEX_DIR", (m_dir.path() / "mutex").string()};
    testsupport::ScopedEnv m_timeout{"CORVANE_SORVIK_UPDATE_TIMEOUT_MS", std::to_string(kUpdateTimeoutMs)};
    std::unique_ptr<testsupport::SorvikProcess> m_server;
    QPointer<COptimizeCustomPropsWaitDlg> m_window;
    ShowCounter m_shows;
    std::chrono::steady_clock::time_point m_opened;
    int m_commits = 0;
};

TEST_F(WaitWindowServer, AServerThatAppliesAtOnceNeverShowsIt)
{
    StartServer(0);
    CommitAndWait();
    ASSERT_TRUE(WaitUntilGone());
    EXPECT_EQ(m_shows.shown, 0);
}

TEST_F(WaitWindowServer, OneTimeOutShowsItOnce)
{
    StartServer(kUpdateTimeoutMs * 3 / 2);
    CommitAndWait();
    ASSERT_TRUE(WaitUntilGone());
    EXPECT_EQ(m_shows.shown, 1);
}

TEST_F(WaitWindowServer, ThreeTimeOutsStillShowItOnce)
{
    StartServer(3 * kUpdateTimeoutMs + 2 * 500 + 100);
    CommitAndWait();
    ASSERT_TRUE(QTest::qWaitFor([this] { return m_window && m_window->WaitCalls() >= 3; }, 10000));
    ASSERT_TRUE(WaitUntilGone());
    EXPECT_EQ(m_shows.shown, 1);
}

TEST_F(WaitWindowServer, ClosingWhileTheServerIsBusyWaitsForTheRunningCallOnly)
{
    StartServer(60000);
    CommitAndWait();
    ASSERT_TRUE(QTest::qWaitFor([this] { return m_window && m_window->WaitCalls() >= 2; }, 10000));
    const int calls = m_window->WaitCalls();
    const auto closing = std::chrono::steady_clock::now();
    m_window->close();
    EXPECT_LE(std::chrono::steady_clock::now() - closing, std::chrono::milliseconds(kUpdateTimeoutMs + 1000))
        << "no longer than the call in progress";
    EXPECT_TRUE(WaitUntilGone(1s));
    EXPECT_EQ(m_shows.shown, 1);
    EXPECT_LE(calls, 2) << "and no further call";
}

TEST_F(WaitWindowServer, TheModuleClosesItWhileTheServerIsBusy)
{
    StartServer(60000);
    CommitAndWait();
    ASSERT_TRUE(QTest::qWaitFor([this] { return m_window && m_window->IsShown(); }, 10000));
    sharedsource::OpenDialogs().CloseAll();
    EXPECT_TRUE(WaitUntilGone(1s));
}

TEST_F(WaitWindowServer, AServerThatDiesEndsTheWait)
{
    StartServer(60000);
    CommitAndWait();
    ASSERT_TRUE(QTest::qWaitFor([this] { return m_window && m_window->IsShown(); }, 10000));
    m_server->Stop(SIGKILL);
    EXPECT_TRUE(WaitUntilGone(5s)) << "the window goes without a word";
}

} // namespace
