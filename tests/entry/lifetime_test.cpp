#include "entry/module.h"
#include "entry/serverdialogsapp.h"
#include "serverlibs/testlibraries.h"
#include "sharedsource/basedlg.h"

#include <QPointer>

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace cv::vek::rovo {
namespace {

using Names = std::vector<std::string>;
using sharedsource::OpenDialogList;

// A modeless window that records its closing; it stays registered until it goes.
class Window final : public INonModalDialog
{
public:
    Window(sharedsource::OpenDialogList &list, Names &closed, std::string name)
        : m_closed(closed), m_name(std::move(name)), m_entry(*this, list)
    {
    }
    void Close() override { m_closed.push_back(m_name); }

private:
    Names &m_closed;
    std::string m_name;
    sharedsource::OpenDialogEntry m_entry;
};

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

sharedsource::DialogTemplate HiddenTemplate()
{
    sharedsource::DialogTemplate t;
    t.id = 60030;
    t.size = QSize(100, 40);
    t.visible = false;
    return t;
}

// A modeless window as the wait window is one: hidden until it shows
// itself, registered while it exists, deleting itself when closed.
class HiddenWindow final : public sharedsource::ToBaseDlg<CNSFlexDialog>, public INonModalDialog
{
public:
    HiddenWindow(sharedsource::OpenDialogList &list, bool &applicationAtDeletion)
        : ToBaseDlg({60030, &HiddenTemplate}, nullptr), m_entry(*this, list), m_applicationAtDeletion(applicationAtDeletion)
    {
    }
    ~HiddenWindow() override { m_applicationAtDeletion = QCoreApplication::instance() != nullptr; }
    void Close() override
    {
        done(sharedsource::kResultOk);
        deleteLater();
    }

private:
    sharedsource::OpenDialogEntry m_entry;
    bool &m_applicationAtDeletion;
};

TEST_F(ModuleLifetimeTest, LastCleanupClosesHiddenWindowsAndDeletesThemBeforeTheApplicationEnds)
{
    ::setenv("QT_QPA_PLATFORM", "offscreen", 0);
    m_module.Init();
    ASSERT_NE(m_app.EnsureApplication(), nullptr);
    bool applicationAtDeletion = false;
    QPointer<HiddenWindow> window = new HiddenWindow(m_dialogs, applicationAtDeletion);
    ASSERT_EQ(window->CreateModeless(nullptr), 1);
    EXPECT_FALSE(window->isVisible()) << "its template is hidden";
    EXPECT_EQ(m_dialogs.Count(), 1u);

    m_module.Cleanup();
    EXPECT_TRUE(window.isNull()) << "deleted by the last Cleanup";
    EXPECT_TRUE(applicationAtDeletion) << "while the application still existed";
    EXPECT_EQ(m_dialogs.Count(), 0u) << "it left the list on its way";
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
