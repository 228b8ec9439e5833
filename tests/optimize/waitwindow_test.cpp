// The wait window and its worker with real widgets and a scripted index
// manager: hidden while the server is quick, shown once when it is slow,
// a pause between tries, closing by itself, by the user and by the module.

#include "optimize/optimizecustompropswaitdlg.h"
#include "sharedsource/animation.h"
#include "resources/resourceids.h"
#include "support/fakeindexmanager.h"
#include "uitest.h"

#include <QPointer>
#include <QTest>

#include <gtest/gtest.h>

namespace {

using cv::vek::rovo::optimize::COptimizeCustomPropsWaitDlg;
using testsupport::FakeIndexManager;
using namespace std::chrono_literals;

constexpr std::int32_t kTimedOut = cv::rovo::status::UpdateTimedOut;

class WaitWindow : public ::testing::Test
{
protected:
    void SetUp() override
    {
        uitest::Application();
        m_indexManager = FakeIndexManager::Create();
    }
    void TearDown() override
    {
        if (m_window)
            m_window->Close();
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        EXPECT_EQ(m_indexManager->References(), 1u) << "the window and its worker let go";
        m_indexManager->Release();
        uitest::ExpectNoWindowsLeft();
    }

    void Open()
    {
        m_indexManager->AddRef();
        auto *window = new COptimizeCustomPropsWaitDlg(cv::krn::RefPtr<cv::rovo::IIndexManager>::Adopt(m_indexManager),
                                                       QStringLiteral("Configuring Sorvik..."));
        ASSERT_EQ(window->CreateModeless(nullptr), 1);
        m_window = window;
    }
    bool WaitUntilGone(std::chrono::milliseconds within = 5s)
    {
        return QTest::qWaitFor(
            [this] {
                QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
                return m_window.isNull();
            },
            int(within.count()));
    }

    FakeIndexManager *m_indexManager = nullptr;
    QPointer<COptimizeCustomPropsWaitDlg> m_window;
};

TEST_F(WaitWindow, AQuickServerNeverShowsIt)
{
    const auto opened = std::chrono::steady_clock::now();
    Open();
    EXPECT_FALSE(m_window->isVisible());
    EXPECT_EQ(sharedsource::OpenDialogs().Count(), 1u);
    ASSERT_TRUE(WaitUntilGone());
    EXPECT_LT(std::chrono::steady_clock::now() - opened, 2s) << "gone within a poll or two";
    EXPECT_EQ(m_indexManager->Calls(), 1);
    EXPECT_EQ(sharedsource::OpenDialogs().Count(), 0u);
}

TEST_F(WaitWindow, ASlowServerShowsItOnceAndItGoesWhenTheServerIsDone)
{
    m_indexManager->Script({{kTimedOut}, {kTimedOut}, {0}});
    Open();
    ASSERT_TRUE(QTest::qWaitFor([this] { return m_window && m_window->isVisible(); }, 5000));
    EXPECT_TRUE(m_window->IsShown());
    EXPECT_EQ(m_window->windowTitle(), QStringLiteral("Configuring Sorvik..."));
    auto &animation =
        sharedsource::GetControl<sharedsource::ToAnimation>(m_window.data(), resources::IDC_WAIT_ANIMATION);
    EXPECT_TRUE(animation.IsPlaying());
    EXPECT_TRUE(QTest::qWaitFor([&animation] { return animation.FramesShown() > 3; }, 5000)) << "it moves";

    ASSERT_TRUE(WaitUntilGone());
    const auto starts = m_indexManager->CallStarts();
    const auto ends = m_indexManager->CallEnds();
    ASSERT_EQ(starts.size(), 3u);
    EXPECT_GE(starts[1] - ends[0], 500ms) << "a pause between tries";
    EXPECT_GE(starts[2] - ends[1], 500ms);
}

TEST_F(WaitWindow, OtherFailuresEndTheWaitWithoutAWord)
{
    m_indexManager->Script({{-21006}});
    Open();
    ASSERT_TRUE(WaitUntilGone());
    EXPECT_EQ(m_indexManager->Calls(), 1);
}

TEST_F(WaitWindow, TheUserClosingItWaitsForTheRunningCallOnly)
{
    m_indexManager->Script({{kTimedOut}, {0, true}});
    Open();
    ASSERT_TRUE(QTest::qWaitFor([this] { return m_window && m_window->isVisible(); }, 5000));
    ASSERT_TRUE(m_indexManager->WaitForCalls(2));
    std::thread server([this] {
        std::this_thread::sleep_for(300ms); // the server still busy when the user closes
        m_indexManager->Release1();
    });
    const auto closing = std::chrono::steady_clock::now();
    m_window->close();
    EXPECT_GE(std::chrono::steady_clock::now() - closing, 250ms) << "it waited for the call in progress";
    server.join();
    EXPECT_TRUE(WaitUntilGone(1s));
    EXPECT_EQ(m_indexManager->Calls(), 2) << "no further call";
}

TEST_F(WaitWindow, TheModuleClosesItWhenItEnds)
{
    m_indexManager->Script({{kTimedOut}, {kTimedOut}, {kTimedOut}, {kTimedOut}});
    Open();
    ASSERT_TRUE(m_indexManager->WaitForCalls(1));
    sharedsource::OpenDialogs().CloseAll();
    EXPECT_TRUE(WaitUntilGone(1s));
    EXPECT_LE(m_indexManager->Calls(), 2);
}

} // namespace
