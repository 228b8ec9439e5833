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
using sharedsource::FindControlAs;
using sharedsource::MessageResult;
using Lines = std::vector<std::string>;

const std::string kIncorrect = "Incorrect parameter value.";
const std::string kNotValid =
    kIncorrect + " | The path to the specified folder is not valid.\nDo you really want to use this path? | warning | yes-no";
const std::string kRemote =
    "Remote Search Area selected | Indexing a network folder or file share can increase network traffic and file "
    "server load.\nIf a network folder is indexed by several Sorviks, you should consider instead sharing one "
    "search index by using the Sorvik Server Edition.\nRefer to the Help pages under topic Sorvik Server Edition "
    "for more information. | warning | ok-cancel";
const std::string kContains =
    "Information | The specified path contains search areas. These search areas will automatically be removed if "
    "you add the specified folder to the search areas. The settings for the excluded folders will be replaced by "
    "this folder if you turn it into a search area. Excluded folders will become part of the new search area. Do "
    "you want to add this folder to the search areas? | information | ok-cancel";

std::vector<std::u16string> g_help;

void RecordHelp(BSTR topic, std::uintptr_t context)
{
    g_help.emplace_back(std::u16string(topic, SysStringLen(topic)) + u"@" +
                        std::u16string(1, char16_t(u'0' + context)));
}

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

    CAddSearchAreaDlg &Open(const QString &name, const QString &serverPath, const QString &path, bool edit = false,
                            SorvikHelpCallback help = nullptr)
    {
        m_dialog = std::make_unique<CAddSearchAreaDlg>(name, serverPath, path, m_tester, edit, help, 7, nullptr);
        m_dialog->SetPrompts(m_prompts);
        m_dialog->SetPathInspector(m_inspector);
        EXPECT_EQ(m_dialog->CreateModeless(nullptr), 1);
        return *m_dialog;
    }
    QLineEdit &Edit(int id) { return *FindControlAs<QLineEdit>(m_dialog.get(), id); }
    QString NameShown() { return Edit(resources::IDC_ALIAS).text(); }
    // Types the values and presses OK; true when the dialog closed with OK.
    bool Confirm(const QString &name, const QString &path)
    {
        Edit(resources::IDC_ALIAS).setText(name);
        Edit(resources::IDC_PATH).setText(path);
        QTest::mouseClick(FindControlAs<QPushButton>(m_dialog.get(), resources::IDOK), Qt::LeftButton);
        return !m_dialog->isVisible() && m_dialog->result() == sharedsource::kResultOk;
    }

    FakeTester m_tester;
    FakeInspector m_inspector;
    uitest::ScriptedPrompts m_prompts;
    std::unique_ptr<CAddSearchAreaDlg> m_dialog;
};

TEST_F(AddSearchArea, APathOfSpacesIsEmpty)
{
    Open({}, {}, {});
    EXPECT_FALSE(Confirm(QStringLiteral("A"), QStringLiteral("   ")));
    EXPECT_EQ(m_prompts.Lines(), Lines{kIncorrect + " | Enter a valid search area path. | error | ok"});
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
    EXPECT_EQ(m_prompts.Lines(),
              (Lines{kIncorrect +
                         " | Creating a search area using the path /data is not allowed. Contact your system's "
                         "administrator for more information. | error | ok",
                     kIncorrect + " | An element with the name Proj already exists. | error | ok"}));
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
              (Lines{kIncorrect + " | A search area with the full path /data already exists. | error | ok",
                     kIncorrect + " | The specified folder is in the search area Everything. | error | ok", kContains,
                     kContains}));
}

TEST_F(AddSearchArea, EditModeRefusesACaseOnlyRenameAndKeepsThePath)
{
    m_tester.aliases = {QStringLiteral("Proj")};
    m_tester.clientPathAnswer = 1; // never asked in edit mode
    Open(QStringLiteral("Proj"), QStringLiteral("/data/Proj"), QStringLiteral("/data/Proj"), true);
    EXPECT_EQ(m_dialog->windowTitle(), QStringLiteral("Edit Search Area"));
    EXPECT_TRUE(Edit(resources::IDC_PATH).isReadOnly());
    EXPECT_FALSE(FindControl(m_dialog.get(), resources::IDC_BROWSE)->isEnabled());

    EXPECT_FALSE(Confirm(QStringLiteral("proj"), QStringLiteral("/data/Proj")));
    EXPECT_EQ(m_prompts.Lines(), Lines{kIncorrect + " | An element with the name proj already exists. | error | ok"});
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
    FindControlAs<QAbstractButton>(m_dialog.get(), resources::IDC_BROWSE)->click();
    EXPECT_EQ(m_prompts.browsedFrom, std::vector<QString>{QStringLiteral("Select data repository path:|/data")});
    EXPECT_EQ(Edit(resources::IDC_PATH).text(), QStringLiteral("/data/Proj"));
    EXPECT_EQ(NameShown(), QStringLiteral("Proj"));
    FindControlAs<QAbstractButton>(m_dialog.get(), resources::IDC_BROWSE)->click();
    EXPECT_EQ(Edit(resources::IDC_PATH).text(), QStringLiteral("/data/Proj")) << "cancelled browse changes nothing";
    EXPECT_EQ(FindControl(m_dialog.get(), resources::IDC_BROWSE)->toolTip(), QStringLiteral("Choose a Folder"));
}

TEST_F(AddSearchArea, HelpTopicsByMode)
{
    g_help.clear();
    Open({}, {}, {}, false, &RecordHelp);
    FindControlAs<QAbstractButton>(m_dialog.get(), resources::IDHELP)->click();
    Open(QStringLiteral("A"), QStringLiteral("/data"), {}, true, &RecordHelp);
    QTest::keyClick(m_dialog.get(), Qt::Key_F1);
    EXPECT_EQ(g_help, (std::vector<std::u16string>{u"ROAM_SEARCH_ADD_SEARCHAREA_DIALOG@7",
                                                   u"ROAM_SEARCH_EDIT_SEARCHAREA_DIALOG@7"}));
}

TEST_F(AddSearchArea, LayoutFollowsTheWindow)
{
    Open({}, {}, {});
    const auto rect = [this](int id) { return FindControl(m_dialog.get(), id)->geometry(); };
    const QRect label = rect(resources::IDC_PATH_LABEL), path = rect(resources::IDC_PATH),
                browse = rect(resources::IDC_BROWSE), help = rect(resources::IDHELP);
    m_dialog->resize(m_dialog->size() + QSize(100, 50));
    EXPECT_EQ(rect(resources::IDC_PATH_LABEL), label);
    EXPECT_EQ(rect(resources::IDC_PATH), path.adjusted(0, 0, 100, 0));
    EXPECT_EQ(rect(resources::IDC_BROWSE), browse.translated(100, 0));
    EXPECT_EQ(rect(resources::IDHELP), help.translated(0, 50));
    EXPECT_FALSE(sharedsource::LoadImage(QStringLiteral("browse"), 96).isNull());
    EXPECT_EQ(sharedsource::LoadImage(QStringLiteral("browse"), 200).width(), 32);
}

// The modal run with Qt's own message boxes, answered as a user would.
TEST_F(AddSearchArea, ModalRunWithRealMessageBoxes)
{
    CAddSearchAreaDlg dialog({}, {}, {}, m_tester, false, nullptr, 0, nullptr);
    dialog.SetPathInspector(m_inspector);
    uitest::ModalPoller poller;
    poller.Expect("the dialog", uitest::Is<CAddSearchAreaDlg>(), [](QWidget &w) {
        EXPECT_EQ(w.windowTitle(), QStringLiteral("Add Search Area"));
        FindControlAs<QLineEdit>(&w, resources::IDC_PATH)->setText(QStringLiteral("  "));
        FindControlAs<QPushButton>(&w, resources::IDOK)->click();
    });
    poller.Expect("the empty-path box", uitest::Is<QMessageBox>(), [](QWidget &w) {
        auto &box = static_cast<QMessageBox &>(w);
        EXPECT_EQ(box.windowTitle(), QStringLiteral("Incorrect parameter value."));
        EXPECT_EQ(box.text(), QStringLiteral("Enter a valid search area path."));
        EXPECT_EQ(box.icon(), QMessageBox::Critical);
        EXPECT_EQ(box.standardButtons(), QMessageBox::Ok);
        box.button(QMessageBox::Ok)->click();
    });
    poller.Expect("the dialog again", uitest::Is<CAddSearchAreaDlg>(), [](QWidget &w) {
        QTest::keyClick(&w, Qt::Key_Escape);
    });
    EXPECT_EQ(dialog.DoModal(), sharedsource::kResultCancel);
    EXPECT_TRUE(poller.Done());
}

} // namespace
