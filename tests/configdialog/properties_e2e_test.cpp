// The properties dialog with the module's own pages on the reference
// libraries and store: what the user does on the Search Areas page reaches
// the store on OK, exactly, and nothing reaches it on Cancel.

#include "configdialog/rovoconfigdlg.h"
#include "pages/configuredlg.h"
#include "pages/conmenutreectrl.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
#include "scriptedprompts.h"
#include "support/referencestore.h"
#include "uitest.h"

#include <QAbstractButton>
#include <QLineEdit>
#include <QTest>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

namespace {

using namespace cv::vek::rovo::configdialog;
using sharedsource::GetControl;
using testsupport::Lines;

class PropertiesOnTheStore : public testsupport::ReferenceStore
{
protected:
    void SetUp() override
    {
        ReferenceStore::SetUp();
        uitest::Application();
        for (const char *folder : {"a/tmp", "b", "c/cache", "m/inner/old"})
            std::filesystem::create_directories(m_data.path() / folder);
        Seed({{Path("a"), Path("a"), u"a"},
              {Path("a/tmp"), u"", u"tmp", true},
              {Path("b"), Path("b"), u"b"},
              {Path("m/inner"), Path("m/inner"), u"inner"},
              {Path("m/inner/old"), u"", u"old", true}});
        m_before = Snapshot();
    }
    void TearDown() override
    {
        m_dialog.reset();
        uitest::ExpectNoWindowsLeft();
        ReferenceStore::TearDown();
    }

    std::u16string Path(const char *relative) const { return (m_data.path() / relative).u16string(); }
    std::string Text(const char *relative) const { return (m_data.path() / relative).string(); }

    pages::CConfigureDlg &Open()
    {
        m_dialog = std::make_unique<CROVOConfigDlg>(cv::krn::WString(), 0);
        m_dialog->SetPrompts(m_prompts);
        EXPECT_EQ(m_dialog->CreateModeless(nullptr), 1);
        EXPECT_FALSE(m_dialog->IsErrorMode());
        return dynamic_cast<pages::CConfigureDlg &>(*m_dialog->Page(PageSlot::SearchAreas));
    }
    // The page's add command with the real Add Search Area dialog, given a path.
    void Add(pages::CConfigureDlg &page, const char *relative)
    {
        uitest::ModalPoller poller;
        const QString path = QString::fromStdString(Text(relative));
        poller.Expect("the add dialog", uitest::Is<QDialog>(), [path](QWidget &w) {
            GetControl<QLineEdit>(&w, resources::IDC_PATH).setText(path);
            GetControl<QAbstractButton>(&w, resources::IDOK).click();
        });
        page.OnCommand(resources::ID_ADD_SEARCH_AREA);
        EXPECT_TRUE(poller.Done());
    }
    static QTreeWidgetItem *Item(pages::CConfigureDlg &page, const QString &text)
    {
        const auto found = page.Tree().findItems(text, Qt::MatchExactly | Qt::MatchRecursive);
        return found.isEmpty() ? nullptr : found.front();
    }
    void Press(int button) { GetControl<QAbstractButton>(m_dialog.get(), button).click(); }

    testsupport::TempDir m_data;
    Lines m_before;
    uitest::ScriptedPrompts m_prompts;
    std::unique_ptr<CROVOConfigDlg> m_dialog;
};

TEST_F(PropertiesOnTheStore, WhatTheUserDidOnTheSearchAreasPageIsWhatTheStoreHoldsAfterOk)
{
    pages::CConfigureDlg &page = Open();
    Add(page, "c");
    m_prompts.folders = {QString::fromStdString(Text("c/cache"))};
    page.Tree().Select(Item(page, QStringLiteral("c")));
    page.OnCommand(resources::ID_EXCLUDE_SUBFOLDER);
    page.Tree().Select(Item(page, QStringLiteral("c")));
    page.OnCommand(resources::ID_SEARCH_AREA_UP);
    Add(page, "m"); // absorbs m/inner; its question is answered OK
    QTreeWidgetItem *b = Item(page, QStringLiteral("b"));
    ASSERT_TRUE(page.Tree().EditLabel(b));
    auto *editor = uitest::LabelEditor(page.Tree());
    ASSERT_NE(editor, nullptr) << "the label editor";
    editor->setText(QStringLiteral("Bee"));
    QTest::keyClick(editor, Qt::Key_Return);
    ASSERT_TRUE(QTest::qWaitFor([b] { return b->text(0) == QStringLiteral("Bee"); }, 5000));
    page.Tree().Select(Item(page, QStringLiteral("tmp")));
    page.OnCommand(resources::ID_REMOVE_SEARCH_AREA);
    EXPECT_EQ(Snapshot(), m_before) << "nothing reaches the store before OK";

    Press(resources::IDOK);
    EXPECT_EQ(Snapshot(), (Lines{Text("a") + " | " + Text("a") + " | a", Text("b") + " | " + Text("b") + " | Bee",
                                 Text("c") + " | " + Text("c") + " | c", "  " + Text("c/cache") + " | cache",
                                 Text("m") + " | " + Text("m") + " | m", "  " + Text("m/inner/old") + " | inner/old"}));
}

TEST_F(PropertiesOnTheStore, CancelLeavesTheStoreAsItWas)
{
    pages::CConfigureDlg &page = Open();
    Add(page, "c");
    page.Tree().Select(Item(page, QStringLiteral("a")));
    page.OnCommand(resources::ID_REMOVE_SEARCH_AREA);
    page.Tree().Select(Item(page, QStringLiteral("b")));
    page.OnCommand(resources::ID_SEARCH_AREA_UP);
    Press(resources::IDCANCEL);
    EXPECT_EQ(Snapshot(), m_before);
}

TEST_F(PropertiesOnTheStore, AnExportAfterAnEditThenCancelLeavesTheEditInTheFileOnly)
{
    pages::CConfigureDlg &page = Open();
    Add(page, "c");
    const std::string file = (m_data.path() / "edited.skc").string();
    m_prompts.files = {QString::fromStdString(file)};
    Press(resources::IDC_EXPORT);
    Press(resources::IDCANCEL);
    std::stringstream exported;
    exported << std::ifstream(file).rdbuf();
    EXPECT_NE(exported.str().find(Text("c")), std::string::npos) << "the file has the new search area";
    EXPECT_EQ(Snapshot(), m_before) << "the server does not";
}

TEST_F(PropertiesOnTheStore, AnImportShowsOnThePageAndOkCommitsIt)
{
    const std::string file = (m_data.path() / "just-b.skc").string();
    {
        pages::CConfigureDlg &page = Open();
        page.Tree().Select(Item(page, QStringLiteral("a")));
        page.OnCommand(resources::ID_REMOVE_SEARCH_AREA);
        m_prompts.files = {QString::fromStdString(file)};
        Press(resources::IDC_EXPORT);
        Press(resources::IDCANCEL);
    }
    pages::CConfigureDlg &page = Open();
    ASSERT_EQ(page.Tree().topLevelItemCount(), 3);
    m_prompts.files = {QString::fromStdString(file)};
    Press(resources::IDC_IMPORT);
    EXPECT_EQ(page.Tree().topLevelItemCount(), 2) << "the page shows what the import brought";
    EXPECT_EQ(Snapshot(), m_before);
    Press(resources::IDOK);
    EXPECT_EQ(Snapshot().size(), m_before.size() - 2) << "a and its excluded folder are gone";
}

} // namespace
