#include "entry/module.h"
#include "entry/serverdialogsapp.h"
#include "serverlibs/testlibraries.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace cv::vek::rovo {
namespace {

using Names = std::vector<std::string>;

// A modeless window that unregisters itself, and if told another one, when it closes.
class Window final : public INonModalDialog
{
public:
    Window(OpenDialogList &list, Names &closed, std::string name) : m_list(list), m_closed(closed), m_name(name)
    {
        m_list.Register(this, &m_position);
    }
    ~Window() { Unregister(); }
    void Close() override
    {
        m_closed.push_back(m_name);
        if (alsoCloses)
            alsoCloses->Unregister();
        if (unregistersOnClose)
            Unregister();
    }
    void Unregister()
    {
        if (std::exchange(m_registered, false))
            m_list.Unregister(m_position);
    }

    Window *alsoCloses = nullptr;
    bool unregistersOnClose = true;

private:
    OpenDialogList &m_list;
    Names &m_closed;
    std::string m_name;
    OpenDialogList::Position m_position;
    bool m_registered = true;
};

TEST(OpenDialogList, ClosesTheNewestFirstAndSurvivesWindowsThatRemoveEntries)
{
    OpenDialogList list;
    Names closed;
    OpenDialogList::Position unused;
    list.Register(nullptr, &unused);
    Window a(list, closed, "a"), b(list, closed, "b"), c(list, closed, "c"), d(list, closed, "d");
    list.Register(&a, nullptr);
    EXPECT_EQ(list.Count(), 4u) << "null arguments register nothing";

    d.alsoCloses = &c; // the entry after the one being closed goes too
    b.unregistersOnClose = false;
    list.CloseAll();
    EXPECT_EQ(closed, (Names{"d", "b", "a"}));
    EXPECT_EQ(list.Count(), 1u) << "b is still open";
    b.Unregister();
    EXPECT_EQ(list.Count(), 0u);
}

class ModuleLifetimeTest : public ::testing::Test
{
protected:
    bool Loaded() { return testsupport::IsLoaded(FAKE_FULL_DIR "/libvekex.so"); }

    testsupport::ScopedLibraryFolders m_folders{FAKE_FULL_DIR, FAKE_FULL_DIR};
    serverlibs::VekexLibrary m_vekex;
    serverlibs::RovoApiLibrary m_rovoApi;
    OpenDialogList m_dialogs;
    CServerDialogsApp m_app;
    ModuleLifetime m_module{m_vekex, m_rovoApi, m_dialogs, m_app};
    Names m_closed;
};

TEST_F(ModuleLifetimeTest, FirstInitLoadsAndLastCleanupClosesWindowsAndReleases)
{
    m_module.Init();
    m_module.Init();
    EXPECT_EQ(m_vekex.UseCount(), 1u) << "only the first Init takes uses";
    EXPECT_EQ(m_rovoApi.UseCount(), 1u);
    Window older(m_dialogs, m_closed, "older"), newer(m_dialogs, m_closed, "newer");
    m_module.Cleanup();
    EXPECT_TRUE(m_closed.empty());
    EXPECT_TRUE(Loaded());
    m_module.Cleanup();
    EXPECT_EQ(m_closed, (Names{"newer", "older"}));
    EXPECT_EQ(m_rovoApi.UseCount(), 0u);
    EXPECT_FALSE(Loaded());
}

TEST_F(ModuleLifetimeTest, LastCleanupEndsTheApplicationTheModuleMade)
{
    ::setenv("QT_QPA_PLATFORM", "offscreen", 0);
    m_module.Init();
    ASSERT_NE(m_app.EnsureApplication(), nullptr);
    m_module.Init();
    m_module.Cleanup();
    EXPECT_NE(QCoreApplication::instance(), nullptr);
    m_module.Cleanup();
    EXPECT_EQ(QCoreApplication::instance(), nullptr);
}

TEST_F(ModuleLifetimeTest, CleanupWithoutInitDoesNothing)
{
    Window open(m_dialogs, m_closed, "open");
    m_module.Cleanup();
    EXPECT_TRUE(m_closed.empty());
    EXPECT_EQ(m_module.Starts(), 0u) << "the count does not wrap";
    m_module.Init();
    EXPECT_TRUE(Loaded()) << "so the next Init is still the first";
    m_module.Cleanup();
    EXPECT_FALSE(Loaded());
}

} // namespace
} // namespace cv::vek::rovo
