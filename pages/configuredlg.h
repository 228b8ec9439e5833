#pragma once

// The Search Areas page of the properties dialog: the server's search areas
// with their excluded folders, in a tree with a toolbar and a context menu.
// Adds, renames, removals and exclusions go to the configuration editor at
// once; the order of the search areas when the dialog saves its pages.

#include "pages/conmenutreectrl.h"
#include "pages/configuredlginputtester.h"
#include "pages/propertypage.h"
#include "pages/searchareamodel.h"
#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"

#include <QIcon>
#include <QPointer>

#include <functional>
#include <optional>

namespace sharedsource {
class ToToolBar;
}

namespace pages {

// Starts program with arguments as a process of its own (no shell); false
// when it could not be started.
using ProcessStarter = std::function<bool(const QString &program, const QStringList &arguments)>;
// QProcess::startDetached.
bool StartDetached(const QString &program, const QStringList &arguments);

class CConfigureDlg final : public CPropertyPage, public ISearchAreaTreeOwner
{
    Q_OBJECT

public:
    // Font, help and prompts come from the window around the page.
    CConfigureDlg(cv::krn::RefPtr<cv::rovo::IConfigurationView> view,
                  cv::krn::RefPtr<cv::rovo::IConfigurationEditor> editor, QWidget *parent = nullptr);
    ~CConfigureDlg() override;

    // What the Add Search Area dialog asks about the search areas shown here.
    bool IsAliasInUse(const QString &name) const;
    int TestClientPath(const QString &path, QString &name) const;
    int TestPath(const QString &path, QString &name) const;
    // 4 when the server's policy forbids a search area there; 0 without an editor.
    int CheckPathAllowed(const QString &path, const QString &clientPath, const QString &name);
    // Adds the search area confirmed in the Add Search Area dialog; search
    // areas inside it are absorbed, their excluded folders kept at their places.
    void InsertSearchArea(const QString &path, const QString &name, const QString &clientPath);

    std::int32_t Reload() override;
    // Writes the order of the search areas when it changed; true when the
    // page recorded changes in the editor.
    bool SavePage() override;
    bool IsModified() const override { return m_modified; }

    // Toolbar, context menu and key commands (resources ID_*).
    void OnCommand(int command);

    IInputTester &InputTester() { return m_inputTester; }
    const SearchAreaList &SearchAreas() const { return m_areas; }
    CConMenuCTreeCtrl &Tree() const;
    sharedsource::ToToolBar *ToolBar() const { return m_toolBar; }
    void SetProcessStarter(ProcessStarter starter) { m_startProcess = std::move(starter); }

    bool OnInitDialog() override;
    QWidget *CreateCustomControl(const sharedsource::ControlTemplate &control) override;

    void OnTreeCommand(int command) override { OnCommand(command); }
    bool OnEndLabelEdit(QTreeWidgetItem &item, const QString &text) override;
    QString InfoTip(const QTreeWidgetItem &item) const override;

private:
    void FillTree();
    QTreeWidgetItem *AddExcludedItem(QTreeWidgetItem &areaItem, const QString &relative, bool sorted);
    void UpdateToolBar();
    void Renumber(std::size_t from);
    void EraseArea(std::size_t index);
    void Absorb(std::size_t index, const QString &relative, const QString &path, ExclusionMap &collected);

    void OnAdd();
    void OnExclude();
    void OnRemove();
    void OnMove(int step);
    void OnRename();
    void OnExplore();

    SearchAreaRecord *AreaOf(const QTreeWidgetItem *item);
    const SearchAreaRecord *AreaOf(const QTreeWidgetItem *item) const;
    void ShowError(const QString &text, const QString &caption);
    // Runs one editor call; a server failure is swallowed, false then.
    template <typename Call>
    bool Record(Call &&call);

    cv::krn::RefPtr<cv::rovo::IConfigurationView> m_view;
    cv::krn::RefPtr<cv::rovo::IConfigurationEditor> m_editor;
    CConfigureDlgInputTester m_inputTester{*this};
    SearchAreaList m_areas;
    bool m_modified = false;
    bool m_orderChanged = false;
    QIcon m_searchAreaIcon;
    QIcon m_excludedFolderIcon;
    CConMenuCTreeCtrl *m_tree = nullptr;
    QPointer<sharedsource::ToToolBar> m_toolBar;
    ProcessStarter m_startProcess = &StartDetached;
};

} // namespace pages
