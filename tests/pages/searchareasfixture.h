#pragma once

// The Search Areas page on the reference libraries' local Sorvik, inside a
// dialog that stands in for the properties dialog (a tab control and a
// default OK button), with spies that log what reaches the server.

#include "pages/configuredlg.h"
#include "scriptedprompts.h"
#include "support/referencestore.h"
#include "support/spysorvik.h"
#include "uitest.h"

#include <QPushButton>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace sharedsource {
class ToTabCtrl;
}

namespace pagestest {

using testsupport::Folder;
using testsupport::Lines;

// What a context menu showed: where it opened and its entries, each as
// "text" or "text (off)", separators as "-".
struct MenuSeen
{
    QPoint position;
    std::vector<std::string> entries;
};

// Runs open, which must show a context menu and wait in it; reads the menu,
// then chooses the entry with the text choose, or closes the menu.
MenuSeen WithMenu(const std::function<void()> &open, const QString &choose = {});

class SearchAreasPage : public testsupport::ReferenceStore
{
protected:
    void SetUp() override;
    void TearDown() override;

    // Seeds the store, then opens the page on it, its host dialog shown.
    // With scripted false the page asks through Qt's own message boxes.
    pages::CConfigureDlg &Open(const std::vector<Folder> &folders = {}, bool scripted = true);
    // Commits what the page recorded in the editor.
    void Commit();

    pages::CConMenuCTreeCtrl &Tree() const { return m_page->Tree(); }
    QTreeWidgetItem *Area(int index) const;
    QTreeWidgetItem *Child(int area, int index) const;
    void Select(QTreeWidgetItem *item);
    // Each top-level item as "text", its children as "  text".
    Lines TreeLines() const;
    // The toolbar's buttons Add, Exclude, Remove, Up, Down as 1 (on) or 0.
    std::string Buttons() const;
    // The search-area calls that reached the editor.
    Lines EditorCalls() const;

    std::shared_ptr<testsupport::CallLog> m_log = std::make_shared<testsupport::CallLog>();
    cv::vek::rovo::serverlibs::SorvikConfiguration m_config;
    uitest::ScriptedPrompts m_prompts;
    std::unique_ptr<CNSFlexDialog> m_host;
    sharedsource::ToTabCtrl *m_tabs = nullptr;
    QPushButton *m_ok = nullptr;
    pages::CConfigureDlg *m_page = nullptr;
};

} // namespace pagestest
