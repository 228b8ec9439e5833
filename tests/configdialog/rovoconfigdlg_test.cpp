// The properties dialog's frame with real widgets over the reference store:
// its pages reached through the page contract only (the test hands it its
// own), the OK sequence with one commit, the error panel, help, the leave
// check, import and export, and the wait window that follows the server.

#include "configdialog/rovoconfigdlg.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
#include "scriptedprompts.h"
#include "serverlibs/opensorvik.h"
#include "sharedsource/opendialoglist.h"
#include "sorvik/vekexception.h"
#include "support/fakeindexmanager.h"
#include "support/referencestore.h"
#include "support/spysorvik.h"
#include "uitest.h"

#include <QAbstractButton>
#include <QLineEdit>
#include <QTest>

#include <gtest/gtest.h>

#include <fstream>
#include <map>

namespace {

using namespace cv::vek::rovo::configdialog;
using cv::krn::WString;
using resources::FormatString;
using resources::LoadString;
using resources::Str;
using sharedsource::GetControl;
using sharedsource::MessageResult;
using uitest::BoxLine;
using Lines = std::vector<std::string>;

constexpr int kPageEdit = 500;

sharedsource::DialogTemplate TestPageTemplate()
{
    sharedsource::DialogTemplate t;
    t.id = 60100;
    t.size = QSize(300, 120);
    t.controls = {{kPageEdit, sharedsource::ControlKind::Edit, {}, QRect(10, 10, 100, 12)}};
    return t;
}

const char *Name(PageSlot slot)
{
    static const char *names[] = {"SearchAreas", "Parselets", "FileExtensions", "Indexer", "Advanced"};
    return names[int(slot)];
}

// What a page does when the frame calls it.
struct Behaviour
{
    bool saves = false;     // SavePage and IsModified report changes
    bool rejects = false;   // SavePage throws cErrCode 21
    std::int32_t fails = 0; // SavePage throws this library code
    bool refusesLeave = false;
    std::int32_t loads = 0; // Reload's answer
};

class TestPage final : public pages::CPropertyPage, public pages::IFileExtensionsPage
{
public:
    TestPage(PageSlot slot, Behaviour behaviour, Lines &log, QWidget *parent)
        : CPropertyPage({60100, &TestPageTemplate}, parent), m_slot(slot), m_behaviour(behaviour), m_log(log)
    {}
    ~TestPage() override { Log("~"); }

    bool SavePage() override
    {
        Log("SavePage ");
        if (m_behaviour.rejects)
            throw cv::vek::com::errInputRejected;
        if (m_behaviour.fails)
            throw cv::vek::Exception(m_behaviour.fails, {});
        return m_behaviour.saves;
    }
    bool IsModified() const override
    {
        Log("IsModified ");
        return m_behaviour.saves;
    }
    std::int32_t Reload() override
    {
        Log("Reload ");
        return m_behaviour.loads;
    }
    bool CanLeavePage() override
    {
        Log("CanLeavePage ");
        return !m_behaviour.refusesLeave;
    }
    void AfterCommit(cv::rovo::ISorvik *sorvik) override { Log(sorvik ? "AfterCommit " : "AfterCommit(null) "); }
    void SetFileExtensionsPage(pages::IFileExtensionsPage *page) override
    {
        Log(page ? "SetFileExtensionsPage " : "SetFileExtensionsPage(null) ");
    }
    void ParseletDeactivated(const QString &, const QStringList &) override {}
    void ParseletActivated(const QString &, const QStringList &) override {}

    QLineEdit &Edit() { return GetControl<QLineEdit>(this, kPageEdit); }

private:
    void Log(const char *what) const { m_log.push_back(std::string(what) + Name(m_slot)); }

    PageSlot m_slot;
    Behaviour m_behaviour;
    Lines &m_log;
};

class TestPages final : public IPropertyPageFactory
{
public:
    explicit TestPages(Lines &log) : m_log(log) {}

    std::map<PageSlot, Behaviour> behaviours;
    std::vector<PageSlot> missing;
    bool advancedGotIndexManager = false;
    int throwsAt = -1; // a library failure while making this slot's page

    std::unique_ptr<pages::CPropertyPage> Create(PageSlot slot, const PageServices &services,
                                                 QWidget *parent) const override
    {
        EXPECT_TRUE(services.view && services.editor);
        if (int(slot) == throwsAt)
            throw cv::vek::Exception(-5, {});
        if (std::find(missing.begin(), missing.end(), slot) != missing.end())
            return nullptr;
        if (slot == PageSlot::Advanced)
            const_cast<TestPages *>(this)->advancedGotIndexManager = bool(services.indexManager);
        const auto found = behaviours.find(slot);
        return std::make_unique<TestPage>(slot, found == behaviours.end() ? Behaviour{} : found->second, m_log, parent);
    }

private:
    Lines &m_log;
};

class PropertiesFrame : public testsupport::ReferenceStore
{
protected:
    void SetUp() override
    {
        ReferenceStore::SetUp();
        uitest::Application();
        m_calls = std::make_shared<testsupport::CallLog>();
    }
    void TearDown() override
    {
        m_dialog.reset();
        WaitUntilNoWaitWindow();
        uitest::ExpectNoWindowsLeft();
        ReferenceStore::TearDown();
    }

    CROVOConfigDlg &Open(std::int32_t waitFlag = 1, const WString &connection = {})
    {
        auto log = m_calls;
        m_dialog = std::make_unique<CROVOConfigDlg>(connection, waitFlag, nullptr, m_pages, [log](const WString &text) {
            return testsupport::SpyOn(cv::vek::rovo::serverlibs::OpenSorvik(text).sorvik, log);
        });
        m_dialog->SetPrompts(m_prompts);
        m_dialog->SetHelpTarget(m_help.Target(3));
        EXPECT_EQ(m_dialog->CreateModeless(nullptr), 1);
        m_log.clear();
        return *m_dialog;
    }
    void Press(int button) { GetControl<QAbstractButton>(m_dialog.get(), button).click(); }
    bool Closed() const { return !m_dialog->isVisible(); }
    TestPage &PageOf(PageSlot slot) { return static_cast<TestPage &>(*m_dialog->Page(slot)); }
    int Commits() const { return m_calls->Count("CommitConfiguration"); }
    static void WaitUntilNoWaitWindow()
    {
        EXPECT_TRUE(QTest::qWaitFor([] { return sharedsource::OpenDialogs().Count() == 0; }, 5000));
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    }
    std::string ServerErrorBox(Str text) const
    {
        return BoxLine(LoadString(Str::ServerError), LoadString(text), "error", "ok");
    }

    Lines m_log;
    TestPages m_pages{m_log};
    std::shared_ptr<testsupport::CallLog> m_calls;
    uitest::ScriptedPrompts m_prompts;
    uitest::HelpRecorder m_help;
    std::unique_ptr<CROVOConfigDlg> m_dialog;
};

TEST_F(PropertiesFrame, BuildsItsPagesInOrderWithTheirTitles)
{
    m_calls->noIndexManager = true;
    Open();
    EXPECT_EQ(m_dialog->windowTitle(), FormatString(Str::ConfigureTitle, LoadString(Str::MySorvik)));
    ASSERT_EQ(m_dialog->Tabs().count(), 5);
    EXPECT_EQ(m_dialog->Tabs().tabText(0), LoadString(Str::SearchAreasTab));
    EXPECT_EQ(m_dialog->Tabs().tabText(4), LoadString(Str::AdvancedTab));
    EXPECT_FALSE(m_pages.advancedGotIndexManager) << "no server runs";
    EXPECT_FALSE(m_dialog->IsErrorMode());
    EXPECT_TRUE(m_dialog->windowIcon().isNull()) << "a host that waits shows its own icon";
}

TEST_F(PropertiesFrame, OkWithoutChangesCommitsNothingButTellsTheAdvancedPage)
{
    Open(0);
    Press(resources::IDOK);
    EXPECT_TRUE(Closed());
    EXPECT_EQ(m_dialog->result(), sharedsource::kResultOk);
    EXPECT_EQ(m_log, (Lines{"SavePage SearchAreas", "SavePage Indexer", "SavePage Advanced", "SavePage Parselets",
                            "IsModified FileExtensions", "AfterCommit Advanced"}));
    EXPECT_EQ(Commits(), 0);
    EXPECT_EQ(sharedsource::OpenDialogs().Count(), 0u) << "no wait window with the wait flag 0";
}

TEST_F(PropertiesFrame, OneChangeAnywhereCommitsOnceAfterEveryPageSaved)
{
    m_pages.behaviours[PageSlot::SearchAreas].saves = true;
    m_pages.behaviours[PageSlot::FileExtensions].saves = true;
    Open(0);
    Press(resources::IDOK);
    EXPECT_EQ(m_log.size(), 6u) << "every page is asked even after one reported changes";
    EXPECT_EQ(Commits(), 1);
    EXPECT_TRUE(Closed());
}

TEST_F(PropertiesFrame, ARejectingPageKeepsTheDialogOpenWithItsValues)
{
    m_pages.behaviours[PageSlot::Indexer].rejects = true;
    Open(0);
    PageOf(PageSlot::Indexer).Edit().setText(QStringLiteral("10000"));
    Press(resources::IDOK);
    EXPECT_FALSE(Closed());
    EXPECT_EQ(Commits(), 0);
    EXPECT_EQ(m_log, (Lines{"SavePage SearchAreas", "SavePage Indexer"})) << "nothing after the rejection";
    EXPECT_EQ(PageOf(PageSlot::Indexer).Edit().text(), QStringLiteral("10000"));
    EXPECT_TRUE(m_prompts.shown.empty()) << "the page told the user itself";
}

TEST_F(PropertiesFrame, CommitFailuresAreReportedAndTheDialogStillCloses)
{
    m_pages.behaviours[PageSlot::Advanced].saves = true;
    m_calls->failures["CommitConfiguration"] = cv::rovo::status::UpdateTimedOut;
    Open(0);
    Press(resources::IDOK);
    EXPECT_TRUE(Closed());
    EXPECT_EQ(m_prompts.Lines(), Lines{ServerErrorBox(Str::UpdateTimedOut)});
    EXPECT_EQ(std::count(m_log.begin(), m_log.end(), "AfterCommit Advanced"), 0) << "the failure ends the steps";

    m_prompts.shown.clear();
    m_calls->failures["CommitConfiguration"] = cv::rovo::status::StoreUnavailable;
    Open(0);
    Press(resources::IDOK);
    EXPECT_TRUE(Closed());
    EXPECT_EQ(m_prompts.Lines(), Lines{ServerErrorBox(Str::ConfigurationWriteError)});

    m_prompts.shown.clear();
    m_pages.behaviours[PageSlot::Advanced].fails = -33;
    Open(0);
    Press(resources::IDOK);
    EXPECT_TRUE(Closed()) << "a page's library failure is a writing failure too";
    EXPECT_EQ(m_prompts.Lines(), Lines{ServerErrorBox(Str::ConfigurationWriteError)});
}

TEST_F(PropertiesFrame, PagesThatWereBuiltAreSavedWhenTheSetUpEndedEarly)
{
    m_pages.throwsAt = int(PageSlot::Indexer);
    m_pages.behaviours[PageSlot::Parselets].saves = true;
    Open(0);
    EXPECT_EQ(m_dialog->Tabs().count(), 3) << "the set-up ended at the Indexer page";
    Press(resources::IDOK);
    EXPECT_EQ(m_log, (Lines{"SavePage SearchAreas", "SavePage Parselets", "IsModified FileExtensions"}));
    EXPECT_EQ(Commits(), 1) << "the user's changes on the pages that exist are not dropped";
}

TEST_F(PropertiesFrame, ErrorModeWhenTheConfigurationCannotBeRead)
{
    const std::filesystem::path store = m_store.path() / "local.sorvikdb";
    std::ofstream(store) << "not a store";
    Open(1);
    EXPECT_TRUE(m_dialog->IsErrorMode());
    EXPECT_FALSE(m_dialog->Tabs().isVisible());
    EXPECT_TRUE(GetControl<QWidget>(m_dialog.get(), resources::IDC_CONFIG_ERROR_TEXT).isVisible());
    EXPECT_TRUE(GetControl<QWidget>(m_dialog.get(), resources::IDC_CONFIG_ERROR_ICON).isVisible());
    EXPECT_FALSE(GetControl<QWidget>(m_dialog.get(), resources::IDC_IMPORT).isVisible());
    EXPECT_FALSE(GetControl<QWidget>(m_dialog.get(), resources::IDC_EXPORT).isVisible());

    const QRect cancel = GetControl<QWidget>(m_dialog.get(), resources::IDCANCEL).geometry();
    const QRect help = GetControl<QWidget>(m_dialog.get(), resources::IDHELP).geometry();
    EXPECT_EQ(help.left(), cancel.left());
    EXPECT_EQ(help.top(), cancel.top() + cancel.height() + 10);
    EXPECT_LE(help.bottom(), m_dialog->height()) << "the buttons stay in the smaller window";
    EXPECT_EQ(m_dialog->height(), m_dialog->MinimumSize().height());

    QTest::keyClick(m_dialog.get(), Qt::Key_F1);
    EXPECT_EQ(m_help.calls, Lines{"ROAM_SEARCH_CONFIGURE_ERROR_DIALOG@3"});
    Press(resources::IDOK);
    EXPECT_TRUE(Closed());
    EXPECT_TRUE(m_log.empty());
    EXPECT_EQ(sharedsource::OpenDialogs().Count(), 0u) << "no server, no waiting";
}

TEST_F(PropertiesFrame, APageThatCannotLoadShowsTheErrorPanel)
{
    m_pages.behaviours[PageSlot::Parselets].loads = pages::kLoadFailed;
    Open(0);
    EXPECT_TRUE(m_dialog->IsErrorMode());
}

TEST_F(PropertiesFrame, HelpFollowsTheCurrentPage)
{
    Open(0);
    Press(resources::IDHELP);
    ASSERT_TRUE(m_dialog->Tabs().RequestPage(3));
    PageOf(PageSlot::Indexer).Edit().setFocus();
    QTest::keyClick(&PageOf(PageSlot::Indexer).Edit(), Qt::Key_F1);
    EXPECT_EQ(m_help.calls, (Lines{"ROAM_SEARCH_CONFIGURE_SEARCHAREAS_DIALOG@3", "ROAM_SEARCH_CRAWLER_DIALOG@3"}));
    m_pages.missing = {PageSlot::Parselets};
    Open(0);
    m_dialog->Tabs().RequestPage(1);
    Press(resources::IDHELP);
    EXPECT_EQ(m_help.calls.back(), "ROAM_SEARCH_FILEFILTERS_DIALOG@3") << "by page, not by position";
}

TEST_F(PropertiesFrame, APageThatRefusesToBeLeftKeepsItsTab)
{
    m_pages.behaviours[PageSlot::Indexer].refusesLeave = true;
    Open(0);
    ASSERT_TRUE(m_dialog->Tabs().RequestPage(3));
    m_log.clear();
    EXPECT_FALSE(m_dialog->Tabs().RequestPage(4));
    EXPECT_EQ(m_dialog->Tabs().currentIndex(), 3);
    EXPECT_EQ(m_log, Lines{"CanLeavePage Indexer"});
}

TEST_F(PropertiesFrame, PagesGoInTheirOrderThenTheServerObjects)
{
    Open(0);
    m_dialog.reset();
    EXPECT_EQ(m_log, (Lines{"~Indexer", "~Advanced", "~SearchAreas", "~Parselets", "~FileExtensions"}));
}

TEST_F(PropertiesFrame, AfterOkTheWaitWindowFollowsTheServer)
{
    auto *indexManager = testsupport::FakeIndexManager::Create();
    m_calls->indexManager = cv::krn::RefPtr<cv::rovo::IIndexManager>::Adopt(indexManager);
    Open(1);
    EXPECT_TRUE(m_pages.advancedGotIndexManager);
    Press(resources::IDOK);
    EXPECT_EQ(sharedsource::OpenDialogs().Count(), 1u) << "the wait window, hidden";
    WaitUntilNoWaitWindow();
    EXPECT_GE(indexManager->Calls(), 1);
}

// Import and export through the reference library's files.
class PropertiesTransfer : public PropertiesFrame
{
protected:
    std::string File(const char *name) const { return (m_store.path() / name).string(); }
};

TEST_F(PropertiesTransfer, DecliningTheImportQuestionOpensNoFileDialog)
{
    Open(0);
    m_prompts.answers = {MessageResult::Cancel};
    Press(resources::IDC_IMPORT);
    EXPECT_EQ(m_prompts.Lines(),
              Lines{BoxLine(LoadString(Str::Warning), LoadString(Str::ImportQuestion), "warning", "ok-cancel")});
    EXPECT_TRUE(m_prompts.chosen.empty());
    EXPECT_FALSE(m_dialog->HasImported());
}

TEST_F(PropertiesTransfer, AnImportReloadsEveryPageAndOkCommitsIt)
{
    Seed({{u"/data", u"/data", u"Data"}});
    const QString file = QString::fromStdString(File("saved.skc"));
    {
        Open(0);
        m_prompts.files = {file};
        Press(resources::IDC_EXPORT);
        Press(resources::IDCANCEL);
    }
    Seed({{u"/other", u"/other", u"Other"}});
    m_prompts.chosen.clear();

    Open(0);
    m_prompts.files = {file};
    Press(resources::IDC_IMPORT);
    ASSERT_EQ(m_prompts.chosen.size(), 1u);
    const sharedsource::FileRequest &asked = m_prompts.chosen.front();
    EXPECT_FALSE(asked.save);
    EXPECT_EQ(asked.defaultName, LoadString(Str::MySorvik) + QStringLiteral(".skc"));
    EXPECT_EQ(asked.defaultExtension, QStringLiteral("skc"));
    EXPECT_EQ(asked.filter, LoadString(Str::ConfigurationFileFilter));
    EXPECT_EQ(m_log, (Lines{"Reload SearchAreas", "Reload Parselets", "Reload FileExtensions", "Reload Indexer",
                            "Reload Advanced"}));
    EXPECT_TRUE(m_dialog->HasImported());
    EXPECT_EQ(Snapshot(), (Lines{"/data | /data | Data", "/other | /other | Other"})) << "nothing committed yet";

    Press(resources::IDOK);
    EXPECT_EQ(Commits(), 1) << "the import commits although no page changed";
    EXPECT_EQ(Snapshot(), Lines{"/data | /data | Data"});
}

TEST_F(PropertiesTransfer, AnImportThatFailsOrIsCancelledChangesNothing)
{
    Seed({{u"/data", u"/data", u"Data"}});
    std::ofstream(File("broken.skc")) << "<sorvikconfiguration format=\"1\"><searchareas>";
    Open(0);
    m_prompts.files = {QString::fromStdString(File("broken.skc"))};
    Press(resources::IDC_IMPORT);
    EXPECT_EQ(m_prompts.Lines().back(), ServerErrorBox(Str::ImportError));
    EXPECT_FALSE(m_dialog->HasImported());
    EXPECT_FALSE(Closed());
    Press(resources::IDCANCEL);
    EXPECT_EQ(Snapshot(), Lines{"/data | /data | Data"});
}

TEST_F(PropertiesTransfer, ExportSavesThePagesFirstAndCommitsNothing)
{
    m_pages.behaviours[PageSlot::Indexer].saves = true;
    Open(0, WString(u"<Name>Lab</Name>"));
    EXPECT_EQ(m_dialog->windowTitle(), FormatString(Str::ConfigureTitle, QStringLiteral("Lab")));
    m_prompts.files = {QString::fromStdString(File("lab.skc"))};
    Press(resources::IDC_EXPORT);
    ASSERT_EQ(m_prompts.chosen.size(), 1u);
    EXPECT_TRUE(m_prompts.chosen.front().save);
    EXPECT_EQ(m_prompts.chosen.front().defaultName, QStringLiteral("Lab.skc"));
    EXPECT_EQ(m_log, (Lines{"SavePage SearchAreas", "SavePage Parselets", "SavePage Indexer", "SavePage Advanced"}));
    EXPECT_TRUE(std::filesystem::exists(File("lab.skc")));
    EXPECT_EQ(Commits(), 0);
}

TEST_F(PropertiesTransfer, AnExportAPageRefusesOrTheLibraryCannotWriteLeavesNoFile)
{
    m_pages.behaviours[PageSlot::Parselets].rejects = true;
    Open(0);
    m_prompts.files = {QString::fromStdString(File("refused.skc"))};
    Press(resources::IDC_EXPORT);
    EXPECT_FALSE(std::filesystem::exists(File("refused.skc")));
    EXPECT_TRUE(m_prompts.shown.empty());

    m_pages.behaviours.clear();
    Open(0);
    m_prompts.files = {QString::fromStdString(File("no/such/folder/x.skc"))};
    Press(resources::IDC_EXPORT);
    EXPECT_EQ(m_prompts.Lines(), Lines{ServerErrorBox(Str::ExportError)});
    EXPECT_FALSE(Closed());
}

} // namespace
