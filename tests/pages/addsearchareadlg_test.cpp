// The Add/Edit Search Area dialog with real widgets: its confirm sequence
// message by message, edit mode, browsing, help and its layout.

#include "fakes.h"
#include "pages/addsearchareadlg.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
#include "scriptedprompts.h"
#include "sharedsource/imageset.h"
#include "uitest.h"

#include <QAbstractButton>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QTest>

#include <gtest/gtest.h>

#include <memory>

namespace {

using namespace pagestest;
using pages::CAddSearchAreaDlg;
using sharedsource::FindControl;
using sharedsource::GetControl;
using sharedsource::MessageResult;
using Lines = std::vector<std::string>;

using resources::FormatString;
using resources::LoadString;
using resources::Str;
using uitest::BoxLine;

std::string InputError(Str text, const QString &argument = {})
{
    return BoxLine(LoadString(Str::IncorrectParameter), FormatString(text, argument), "error", "ok");
}

const std::string kNotValid =
    BoxLine(LoadString(Str::IncorrectParameter), LoadString(Str::PathNotValid), "warning", "yes-no");
const std::string kRemote =
    BoxLine(LoadString(Str::RemoteAreaCaption), LoadString(Str::RemoteAreaWarning), "warning", "ok-cancel");
const std::string kContains =
    BoxLine(LoadString(Str::Information), LoadString(Str::PathContainsSearchAreas), "information", "ok-cancel");

class AddSearchArea : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { uitest::Application(); }
    void SetUp() override
    {
        m_inspector.paths[QStringLiteral("/data")] = {};
        m_inspector.paths[QStringLiteral("/data/Proj")] = {};
    }
    void TearDown() override
    {
        m_dialog.reset();
        uitest::ExpectNoWindowsLeft();
    }

    CAddSearchAreaDlg &Open(const QString &name, const QString &serverPath, const QString &path, bool edit = false)
    {
        m_dialog = std::make_unique<CAddSearchAreaDlg>(name, serverPath, path, m_tester, edit);
        m_dialog->SetHelpTarget(m_help.Target(7));
        m_dialog->SetPrompts(m_prompts);
        m_dialog->SetPathInspector(m_inspector);
        EXPECT_EQ(m_dialog->CreateModeless(nullptr), 1);
        return *m_dialog;
    }
    QLineEdit &Edit(int id) { return GetControl<QLineEdit>(m_dialog.get(), id); }
    QString NameShown() { return Edit(resources::IDC_ALIAS).text(); }
    // Types the values and presses OK; true when the dialog closed with OK.
    bool Confirm(const QString &name, const QString &path)
    {
        Edit(resources::IDC_ALIAS).setText(name);
        Edit(resources::IDC_PATH).setText(path);
        QTest::mouseClick(&GetControl<QPushButton>(m_dialog.get(), resources::IDOK), Qt::LeftButton);
        return !m_dialog->isVisible() && m_dialog->result() == sharedsource::kResultOk;
    }

    FakeTester m_tester;
    FakeInspector m_inspector;
    uitest::ScriptedPrompts m_prompts;
    uitest::HelpRecorder m_help;
    std::unique_ptr<CAddSearchAreaDlg> m_dialog;
};

TEST_F(AddSearchArea, APathOfSpacesIsEmpty)
{
    Open({}, {}, {});
    EXPECT_FALSE(Confirm(QStringLiteral("A"), QStringLiteral("   ")));
    EXPECT_EQ(m_prompts.Lines(), Lines{InputError(Str::EnterValidPath)});
    EXPECT_TRUE(m_tester.allowedAsked.empty()) << "stops at the first refusal";
}

TEST_F(AddSearchArea, AMissingFolderIsUsedOnlyAfterYes)
{
    Open({}, {}, {});
    m_prompts.answers = {MessageResult::No};
    EXPECT_FALSE(Confirm(QStringLiteral("New"), QStringLiteral(" /nowhere/new/ ")));
    EXPECT_TRUE(m_dialog->isVisible());
    m_prompts.answers = {MessageResult::Yes};
    EXPECT_TRUE(Confirm(QStringLiteral("New"), QStringLiteral(" /nowhere/new/ ")));
    EXPECT_EQ(m_prompts.Lines(), (Lines{kNotValid, kNotValid}));
    EXPECT_EQ(m_dialog->Path(), QStringLiteral("/nowhere/new")) << "trimmed, one trailing separator dropped";
    EXPECT_EQ(m_dialog->ServerPath(), QStringLiteral("/nowhere/new"));
    EXPECT_EQ(m_tester.allowedAsked.back(),
              (QStringList{QStringLiteral("/nowhere/new/"), QStringLiteral("/nowhere/new/"), QStringLiteral("New")}));
}

TEST_F(AddSearchArea, NetworkLocationsAreWarnedAbout)
{
    m_inspector.paths[QStringLiteral("//server/share/data")] = {true, "ext4"};
    m_inspector.paths[QStringLiteral("\\\\server\\share")] = {true, ""};
    m_inspector.paths[QStringLiteral("/mnt/nfs/data")] = {true, "nfs4"};
    Open({}, {}, {});
    m_prompts.answers = {MessageResult::Cancel};
    EXPECT_FALSE(Confirm(QStringLiteral("S"), QStringLiteral("//server/share/data")));
    EXPECT_TRUE(Confirm(QStringLiteral("S"), QStringLiteral("\\\\server\\share")));
    EXPECT_EQ(m_prompts.Lines(), (Lines{kRemote, kRemote}));

    m_prompts.shown.clear();
    Open({}, {}, {});
    EXPECT_TRUE(Confirm(QStringLiteral("N"), QStringLiteral("/mnt/nfs/data")));
    EXPECT_EQ(m_prompts.Lines(), Lines{kRemote}) << "a folder on a network file system";

    m_prompts.shown.clear();
    Open({}, {}, {});
    EXPECT_TRUE(Confirm(QStringLiteral("L"), QStringLiteral("/data")));
    EXPECT_TRUE(m_prompts.shown.empty()) << "a local folder passes without a question";
}

TEST_F(AddSearchArea, PolicyAndNameRefusals)
{
    Open({}, {}, {});
    m_tester.allowedAnswer = 4;
    EXPECT_FALSE(Confirm(QStringLiteral("P"), QStringLiteral("/data")));
    m_tester.allowedAnswer = 0;
    m_tester.aliases = {QStringLiteral("proj")};
    EXPECT_FALSE(Confirm(QStringLiteral("Proj"), QStringLiteral("/data")));
    EXPECT_EQ(m_prompts.Lines(), (Lines{InputError(Str::PathNotAllowed, QStringLiteral("/data")),
                                        InputError(Str::NameExists, QStringLiteral("Proj"))}));
    EXPECT_EQ(m_tester.clientPathTests, 0);
}

TEST_F(AddSearchArea, ExistingSearchAreasDecide)
{
    Open({}, {}, {});
    m_tester.clientPathAnswer = 1;
    EXPECT_FALSE(Confirm(QStringLiteral("A"), QStringLiteral("/data")));
    m_tester.clientPathAnswer = 2;
    m_tester.clientPathOwner = QStringLiteral("Everything");
    EXPECT_FALSE(Confirm(QStringLiteral("A"), QStringLiteral("/data/Proj")));
    m_tester.clientPathAnswer = -1;
    m_prompts.answers = {MessageResult::Cancel};
    EXPECT_FALSE(Confirm(QStringLiteral("A"), QStringLiteral("/data")));
    EXPECT_TRUE(Confirm(QStringLiteral("A"), QStringLiteral("/data")));
    EXPECT_EQ(m_prompts.Lines(),
              (Lines{InputError(Str::FullPathExists, QStringLiteral("/data")),
                     InputError(Str::FolderInSearchArea, QStringLiteral("Everything")), kContains, kContains}));
}

TEST_F(AddSearchArea, EditModeRefusesACaseOnlyRenameAndKeepsThePath)
{
    m_tester.aliases = {QStringLiteral("Proj")};
    m_tester.clientPathAnswer = 1; // never asked in edit mode
    Open(QStringLiteral("Proj"), QStringLiteral("/data/Proj"), QStringLiteral("/data/Proj"), true);
    EXPECT_EQ(m_dialog->windowTitle(), LoadString(Str::EditSearchAreaTitle));
    EXPECT_TRUE(Edit(resources::IDC_PATH).isReadOnly());
    EXPECT_FALSE(FindControl(m_dialog.get(), resources::IDC_BROWSE)->isEnabled());

    EXPECT_FALSE(Confirm(QStringLiteral("proj"), QStringLiteral("/data/Proj")));
    EXPECT_EQ(m_prompts.Lines(), Lines{InputError(Str::NameExists, QStringLiteral("proj"))});
    EXPECT_TRUE(Confirm(QStringLiteral("Proj"), QStringLiteral("/data/Proj"))) << "the unchanged name is no duplicate";
    EXPECT_EQ(m_tester.clientPathTests, 0);
}

TEST_F(AddSearchArea, DefaultNamesGrowFromTheRightUntilFree)
{
    Open({}, QStringLiteral("/srv/Data/Proj//"), {});
    EXPECT_EQ(NameShown(), QStringLiteral("Proj"));
    m_tester.aliases = {QStringLiteral("Proj")};
    Open({}, QStringLiteral("/srv/Data/Proj"), {});
    EXPECT_EQ(NameShown(), QStringLiteral("Data/Proj"));
    Open({}, QStringLiteral("C:\\Data\\Proj"), {});
    EXPECT_EQ(NameShown(), QStringLiteral("Data\\Proj"));
    m_tester.aliases << QStringLiteral("Data\\Proj");
    Open({}, QStringLiteral("C:\\Data\\Proj\\"), {});
    EXPECT_EQ(NameShown(), QStringLiteral("C:\\Data\\Proj")) << "the whole path once nothing shorter is free";
    Open(QStringLiteral("Given"), QStringLiteral("/srv/Data/Proj"), {});
    EXPECT_EQ(NameShown(), QStringLiteral("Given"));

    EXPECT_TRUE(Confirm(QString(), QStringLiteral("/data/Proj")));
    EXPECT_EQ(m_dialog->Name(), QStringLiteral("/data/Proj"))
        << "an empty name gets the default after OK; the next separator is the first character";
}

TEST_F(AddSearchArea, BareDrivesMeanTheirRoot)
{
    Open({}, QStringLiteral("D:"), {});
    EXPECT_EQ(Edit(resources::IDC_PATH).text(), QStringLiteral("D:\\"));
    m_prompts.answers = {MessageResult::Yes};
    EXPECT_TRUE(Confirm(QStringLiteral("D"), QStringLiteral("C:\\")));
    EXPECT_EQ(m_dialog->Path(), QStringLiteral("C:"));
    EXPECT_EQ(m_dialog->ServerPath(), QStringLiteral("C:"));
}

TEST_F(AddSearchArea, BrowseFillsThePathAndAnEmptyName)
{
    Open({}, {}, QStringLiteral("/data/"));
    Edit(resources::IDC_ALIAS).clear();
    m_prompts.folders = {QStringLiteral("/data/Proj")};
    GetControl<QAbstractButton>(m_dialog.get(), resources::IDC_BROWSE).click();
    EXPECT_EQ(m_prompts.BrowseLines(), Lines{LoadString(Str::SelectRepositoryPath).toStdString() + " |  | /data"});
    EXPECT_EQ(Edit(resources::IDC_PATH).text(), QStringLiteral("/data/Proj"));
    EXPECT_EQ(NameShown(), QStringLiteral("Proj"));
    GetControl<QAbstractButton>(m_dialog.get(), resources::IDC_BROWSE).click();
    EXPECT_EQ(Edit(resources::IDC_PATH).text(), QStringLiteral("/data/Proj")) << "cancelled browse changes nothing";
    EXPECT_EQ(FindControl(m_dialog.get(), resources::IDC_BROWSE)->toolTip(), LoadString(Str::ChooseFolder));
}

TEST_F(AddSearchArea, HelpTopicsByMode)
{
    Open({}, {}, {}, false);
    GetControl<QAbstractButton>(m_dialog.get(), resources::IDHELP).click();
    Open(QStringLiteral("A"), QStringLiteral("/data"), {}, true);
    QTest::keyClick(m_dialog.get(), Qt::Key_F1);
    EXPECT_EQ(m_help.calls, (Lines{"ROAM_SEARCH_ADD_SEARCHAREA_DIALOG@7", "ROAM_SEARCH_EDIT_SEARCHAREA_DIALOG@7"}));
}

TEST_F(AddSearchArea, LayoutFollowsTheWindow)
{
    Open({}, {}, {});
    using namespace resources;
    uitest::ExpectLayout(*m_dialog, QSize(100, 50),
                         {{IDC_PATH_LABEL},
                          {IDC_ALIAS, 0, 0, 100, 0},
                          {IDC_PATH, 0, 0, 100, 0},
                          {IDC_BROWSE, 100, 0, 100, 0},
                          {IDOK, 0, 50, 0, 50},
                          {IDHELP, 0, 50, 0, 50}});
    EXPECT_FALSE(sharedsource::LoadImage(QStringLiteral("browse"), 96).isNull());
    EXPECT_EQ(sharedsource::LoadImage(QStringLiteral("browse"), 200).width(), 32);
}

// The modal run with Qt's own message boxes, answered as a user would.
TEST_F(AddSearchArea, ModalRunWithRealMessageBoxes)
{
    CAddSearchAreaDlg dialog({}, {}, {}, m_tester, false);
    dialog.SetPathInspector(m_inspector);
    uitest::ModalPoller poller;
    poller.Expect("the dialog", uitest::Is<CAddSearchAreaDlg>(), [](QWidget &w) {
        EXPECT_EQ(w.windowTitle(), LoadString(Str::AddSearchAreaTitle));
        GetControl<QLineEdit>(&w, resources::IDC_PATH).setText(QStringLiteral("  "));
        GetControl<QPushButton>(&w, resources::IDOK).click();
    });
    poller.Expect("the empty-path box", uitest::Is<QMessageBox>(), [](QWidget &w) {
        auto &box = static_cast<QMessageBox &>(w);
        EXPECT_EQ(box.windowTitle(), LoadString(Str::IncorrectParameter));
        EXPECT_EQ(box.text(), LoadString(Str::EnterValidPath));
        EXPECT_EQ(box.icon(), QMessageBox::Critical);
        EXPECT_EQ(box.standardButtons(), QMessageBox::Ok);
        box.button(QMessageBox::Ok)->click();
    });
    poller.Expect("the dialog again", uitest::Is<CAddSearchAreaDlg>(),
                  [](QWidget &w) { QTest::keyClick(&w, Qt::Key_Escape); });
    EXPECT_EQ(dialog.DoModal(), sharedsource::kResultCancel);
    EXPECT_TRUE(poller.Done());
}

} // namespace
