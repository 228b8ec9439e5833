#include "pages/configuredlg.h"

#include "entry/errors/statuscall.h"
#include "pages/addsearchareadlg.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
#include "resources/templates.h"
#include "serverlibs/serverpaths.h"
#include "serverlibs/vekexlibrary.h"
#include "sharedsource/imageset.h"
#include "sharedsource/toolbar.h"
#include "sharedsource/waitcursor.h"
#include "sorvik/wstringqt.h"

#include <QProcess>

#include <algorithm>
#include <utility>

namespace pages {

namespace serverlibs = cv::vek::rovo::serverlibs;
using cv::krn::FromQString;
using cv::krn::ToQString;
using cv::krn::ToView;
using cv::krn::WString;
using resources::FormatString;
using resources::LoadString;
using resources::Str;
using sharedsource::Message;
using sharedsource::MessageButtons;
using sharedsource::MessageIcon;
using sharedsource::MessageResult;

namespace {

QString WithoutTrailingSeparator(const QString &path)
{
    return ToQString(serverlibs::WithoutTrailingSeparator(ToView(path)));
}

QString JoinPath(const QString &folder, const QString &relative, char16_t separator)
{
    return ToQString(serverlibs::JoinPath(ToView(folder), ToView(relative), separator));
}

// The position at which a new child with text keeps the children sorted.
int SortedChildIndex(const QTreeWidgetItem &parent, const QString &text)
{
    int index = 0;
    while (index < parent.childCount() && !NoCaseLess()(text, parent.child(index)->text(0)))
        ++index;
    return index;
}

} // namespace

bool StartDetached(const QString &program, const QStringList &arguments)
{
    return QProcess::startDetached(program, arguments);
}

CConfigureDlg::CConfigureDlg(cv::krn::RefPtr<cv::rovo::IConfigurationView> view,
                             cv::krn::RefPtr<cv::rovo::IConfigurationEditor> editor, QWidget *parent)
    : CPropertyPage(resources::kSearchAreasTemplate, parent), m_view(std::move(view)), m_editor(std::move(editor))
{
    AddConstraint(resources::IDC_SEARCH_AREA_TREE, NSFlexExpandRight, NSFlexExpandDown);
    AddConstraint(resources::IDC_SEARCH_AREAS_TOOLBAR, NSFlexMoveRight, NSFlexVerticallyFixed);
    // Enter and Escape close the dialog from this page, except while a
    // search area is renamed: the rename field keeps them.
    SetDialogKeys(sharedsource::DialogKeys::ReachDialog);
}

CConfigureDlg::~CConfigureDlg()
{
    // The tree goes before the page's members do, and tells nobody.
    if (m_tree) {
        QObject::disconnect(m_tree, nullptr, this, nullptr);
        delete m_tree;
    }
}

QWidget *CConfigureDlg::CreateCustomControl(const sharedsource::ControlTemplate &control)
{
    if (control.id != resources::IDC_SEARCH_AREA_TREE)
        return CPropertyPage::CreateCustomControl(control);
    m_tree = new CConMenuCTreeCtrl(this);
    return m_tree;
}

CConMenuCTreeCtrl &CConfigureDlg::Tree() const
{
    if (!m_tree)
        sharedsource::ThrowControlError(this, resources::IDC_SEARCH_AREA_TREE, "CConMenuCTreeCtrl");
    return *m_tree;
}

bool CConfigureDlg::OnInitDialog()
{
    const QPixmap areaImage = sharedsource::LoadImage(QStringLiteral("searcharea"), logicalDpiY());
    m_searchAreaIcon = QIcon(areaImage);
    m_excludedFolderIcon = QIcon(sharedsource::LoadImage(QStringLiteral("excludedfolder"), logicalDpiY()));
    Tree().setIconSize(areaImage.size());

    CPropertyPage::OnInitDialog();

    using namespace resources;
    m_toolBar = new sharedsource::ToToolBar(QStringLiteral("searchareastoolbar"),
                                            {{ID_ADD_SEARCH_AREA, LoadString(Str::AddSearchAreaTool)},
                                             {ID_EXCLUDE_SUBFOLDER, LoadString(Str::ExcludeSubfolderTool)},
                                             {ID_REMOVE_SEARCH_AREA, LoadString(Str::RemoveTool)},
                                             {ID_SEARCH_AREA_UP, LoadString(Str::UpTool)},
                                             {ID_SEARCH_AREA_DOWN, LoadString(Str::DownTool)}},
                                            this);
    connect(m_toolBar, &sharedsource::ToToolBar::commandTriggered, this, &CConfigureDlg::OnCommand);
    PlaceToolBar(*m_toolBar, IDC_SEARCH_AREAS_TOOLBAR, sharedsource::ToolBarPlacement::RightAligned);
    m_toolBar->show();
    connect(m_tree, &QTreeWidget::itemSelectionChanged, this, &CConfigureDlg::UpdateToolBar);
    UpdateToolBar();
    return true;
}

std::int32_t CConfigureDlg::Reload()
{
    m_modified = false;
    // The old items go first, so that the old tree and the new list are
    // never in memory together.
    Tree().clear();
    std::int32_t result = 0;
    if (m_view) {
        sharedsource::CWaitCursor busy;
        result = LoadSearchAreas(*m_view, m_areas);
    } else {
        m_areas.clear();
    }
    // Also after a failure: the tree must show the list it stands for, or
    // its items would point at search areas that are no longer there.
    FillTree();
    UpdateToolBar();
    return result < 0 ? result : 0;
}

void CConfigureDlg::FillTree()
{
    CConMenuCTreeCtrl &tree = Tree();
    tree.clear();
    QList<QTreeWidgetItem *> items;
    items.reserve(qsizetype(m_areas.size()));
    for (std::size_t i = 0; i < m_areas.size(); ++i) {
        SearchAreaRecord &area = m_areas[i];
        area.item = CConMenuCTreeCtrl::NewSearchAreaItem(area.displayText, m_searchAreaIcon, int(i));
        QList<QTreeWidgetItem *> children;
        children.reserve(qsizetype(area.excluded.Size()));
        for (const ExclusionMap::Entry &entry : area.excluded)
            children.push_back(CConMenuCTreeCtrl::NewExcludedFolderItem(entry.relative, m_excludedFolderIcon));
        area.item->addChildren(children);
        items.push_back(area.item);
    }
    // One insertion for all: the view lays itself out once.
    tree.addTopLevelItems(items);
}

QTreeWidgetItem *CConfigureDlg::AddExcludedItem(QTreeWidgetItem &areaItem, const QString &relative, bool sorted)
{
    QTreeWidgetItem *item = CConMenuCTreeCtrl::NewExcludedFolderItem(relative, m_excludedFolderIcon);
    areaItem.insertChild(sorted ? SortedChildIndex(areaItem, relative) : areaItem.childCount(), item);
    return item;
}

void CConfigureDlg::UpdateToolBar()
{
    if (!m_toolBar || !m_tree)
        return;
    const QTreeWidgetItem *selected = m_tree->SelectedItem();
    const bool area = selected && CConMenuCTreeCtrl::IsSearchArea(*selected);
    const int position = area ? CConMenuCTreeCtrl::Position(*selected) : 0;
    using namespace resources;
    m_toolBar->SetButtonEnabled(ID_ADD_SEARCH_AREA, true);
    m_toolBar->SetButtonEnabled(ID_EXCLUDE_SUBFOLDER, selected);
    m_toolBar->SetButtonEnabled(ID_REMOVE_SEARCH_AREA, selected);
    m_toolBar->SetButtonEnabled(ID_SEARCH_AREA_UP, area && position != 0);
    m_toolBar->SetButtonEnabled(ID_SEARCH_AREA_DOWN, area && position != int(m_areas.size()) - 1);
}

void CConfigureDlg::Renumber(std::size_t from)
{
    for (std::size_t i = from; i < m_areas.size(); ++i)
        CConMenuCTreeCtrl::SetPosition(*m_areas[i].item, int(i));
}

void CConfigureDlg::EraseArea(std::size_t index)
{
    QTreeWidgetItem *item = m_areas[index].item;
    m_areas.erase(m_areas.begin() + std::ptrdiff_t(index));
    // Numbered before the item goes, so the selection that moves on finds
    // its neighbours at their new positions.
    Renumber(index);
    delete item;
}

template <typename Call>
bool CConfigureDlg::Record(Call &&call)
{
    if (!m_editor)
        return false;
    try {
        sharedsource::CWaitCursor busy;
        cv::vek::CallWithStatus([&](std::int32_t *status) { call(*m_editor, status); });
        return true;
    } catch (const cv::vek::Exception &) {
        return false;
    }
}

bool CConfigureDlg::IsAliasInUse(const QString &name) const
{
    return std::any_of(m_areas.begin(), m_areas.end(),
                       [&name](const SearchAreaRecord &area) { return EqualsNoCase(area.name, name); });
}

int CConfigureDlg::TestClientPath(const QString &path, QString &name) const
{
    return TestPathAgainst(m_areas, PathKind::ClientPath, path, name);
}

int CConfigureDlg::TestPath(const QString &path, QString &name) const
{
    return TestPathAgainst(m_areas, PathKind::Path, path, name);
}

int CConfigureDlg::CheckPathAllowed(const QString &path, const QString &clientPath, const QString &name)
{
    if (!m_editor)
        return 0;
    std::int32_t answer = 0;
    // The commit checks the policy again; a failed question allows the path.
    Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
        answer = editor.CheckAreaAllowed(FromQString(path), FromQString(clientPath), FromQString(name), 1, 0, status);
    });
    return answer;
}

void CConfigureDlg::InsertSearchArea(const QString &path, const QString &name, const QString &clientPath)
{
    const QString newPath = WithoutTrailingSeparator(path);
    const QString newClientPath = WithoutTrailingSeparator(clientPath);
    Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
        WString kept;
        editor.AddFolder(&kept, FromQString(newPath), FromQString(newClientPath), FromQString(name), 1, 0, WString(),
                         status);
    });

    QTreeWidgetItem *item = CConMenuCTreeCtrl::NewSearchAreaItem(name, m_searchAreaIcon, int(m_areas.size()));
    m_areas.push_back({name, newPath, newClientPath, name, {}, item});
    Tree().addTopLevelItem(item);
    Tree().Select(item);

    ExclusionMap collected;
    for (std::size_t i = 0; i + 1 < m_areas.size();) {
        const SearchAreaRecord &area = m_areas[i];
        // Two empty client paths say nothing about being the same folder.
        const bool sameFolder = EqualsNoCase(area.path, newPath) ||
                                (!newClientPath.isEmpty() && EqualsNoCase(area.clientPath, newClientPath));
        const QString below = sameFolder ? QString() : PlaceBelow(area, newPath, newClientPath);
        if (below.isEmpty())
            ++i;
        else
            Absorb(i, below, newPath, collected); // the next search area moved up to i
    }

    SearchAreaRecord &added = m_areas.back();
    added.excluded = std::move(collected);
    for (const ExclusionMap::Entry &entry : added.excluded)
        AddExcludedItem(*added.item, entry.relative, false);
    m_modified = true;
    UpdateToolBar();
}

void CConfigureDlg::Absorb(std::size_t index, const QString &relative, const QString &path, ExclusionMap &collected)
{
    const SearchAreaRecord &area = m_areas[index];
    Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
        editor.RemoveFolder(FromQString(area.path), 1, status);
    });
    // Its excluded folders stay where they are, now below the new search area;
    // its own folder simply becomes part of it.
    const char16_t separator = serverlibs::SeparatorOf(ToView(path));
    for (const ExclusionMap::Entry &entry : area.excluded) {
        const QString newRelative = JoinPath(relative, RelativeName(entry.absolute, area.path), separator);
        const QString newAbsolute = JoinPath(path, newRelative, separator);
        Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
            WString kept;
            editor.AddFolder(&kept, FromQString(newAbsolute), WString(), FromQString(newRelative), 0, 1, WString(),
                             status);
        });
        collected.Add(newRelative, newAbsolute);
    }
    EraseArea(index);
}

void CConfigureDlg::OnCommand(int command)
{
    using namespace resources;
    switch (command) {
    case ID_ADD_SEARCH_AREA:
        OnAdd();
        break;
    case ID_EXCLUDE_SUBFOLDER:
        OnExclude();
        break;
    case ID_REMOVE_SEARCH_AREA:
        OnRemove();
        break;
    case ID_SEARCH_AREA_UP:
        OnMove(-1);
        break;
    case ID_SEARCH_AREA_DOWN:
        OnMove(+1);
        break;
    case ID_RENAME_SEARCH_AREA:
        OnRename();
        break;
    case ID_EXPLORE_FOLDER:
        OnExplore();
        break;
    default:
        break;
    }
}

void CConfigureDlg::OnAdd()
{
    CAddSearchAreaDlg dialog(QString(), QString(), QString(), m_inputTester, false, this);
    if (dialog.DoModal() != sharedsource::kResultOk)
        return;
    InsertSearchArea(dialog.ServerPath(), dialog.Name(), dialog.Path());
}

void CConfigureDlg::OnExclude()
{
    QTreeWidgetItem *selected = Tree().SelectedItem();
    QTreeWidgetItem *areaItem = selected && !CConMenuCTreeCtrl::IsSearchArea(*selected) ? selected->parent() : selected;
    SearchAreaRecord *area = AreaOf(areaItem);
    if (!area)
        return;
    const std::optional<QString> chosen =
        Prompts().BrowseForFolder(this, {LoadString(Str::SelectFolderToExclude), area->path, QString()});
    if (!chosen)
        return;
    const QString folder = WithoutTrailingSeparator(*chosen);
    if (EqualsNoCase(folder, WithoutTrailingSeparator(area->path))) {
        ShowError(LoadString(Str::CannotExcludeSearchArea), LoadString(Str::ServerError));
        return;
    }
    // Typed into the browser's edit box, a folder may lie anywhere; one
    // outside the search area would make the whole commit fail.
    if (!IsInside(folder, area->path)) {
        ShowError(FormatString(Str::FolderOutsideSearchArea, {folder, area->name}),
                  LoadString(Str::IncorrectParameter));
        return;
    }
    const bool excluded =
        std::any_of(area->excluded.begin(), area->excluded.end(), [&folder](const ExclusionMap::Entry &entry) {
            return EqualsNoCase(WithoutTrailingSeparator(entry.absolute), folder);
        });
    if (excluded) {
        ShowError(FormatString(Str::FolderAlreadyExcluded, folder), LoadString(Str::IncorrectParameter));
        return;
    }

    const QString relative = RelativeName(folder, area->path);
    if (m_editor) {
        const bool recorded = Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
            WString kept;
            editor.AddFolder(&kept, FromQString(folder), WString(), FromQString(relative), 0, 1, WString(), status);
        });
        if (!recorded)
            return;
        m_modified = true;
    }
    area->excluded.Add(relative, folder);
    QTreeWidgetItem *item = AddExcludedItem(*areaItem, relative, true);
    areaItem->setExpanded(true);
    Tree().Select(item);
}

void CConfigureDlg::OnRemove()
{
    QTreeWidgetItem *selected = Tree().SelectedItem();
    SearchAreaRecord *area = AreaOf(selected);
    if (!area)
        return;
    if (CConMenuCTreeCtrl::IsSearchArea(*selected)) {
        const Message question{FormatString(Str::RemoveSearchAreaQuestion, area->name), LoadString(Str::Warning),
                               MessageIcon::Warning, MessageButtons::OkCancel};
        if (Ask(question) != MessageResult::Ok)
            return;
        const QString path = area->path;
        EraseArea(std::size_t(CConMenuCTreeCtrl::Position(*selected)));
        m_modified = true;
        Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
            editor.RemoveFolder(FromQString(path), 1, status);
        });
    } else {
        const QString absolute = area->excluded.Erase(selected->text(0));
        delete selected;
        m_modified = true;
        if (!absolute.isEmpty()) {
            Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
                editor.RemoveFolder(FromQString(absolute), 1, status);
            });
        }
    }
    UpdateToolBar();
}

void CConfigureDlg::OnMove(int step)
{
    QTreeWidgetItem *item = Tree().SelectedItem();
    if (!item || !CConMenuCTreeCtrl::IsSearchArea(*item))
        return;
    const int from = CConMenuCTreeCtrl::Position(*item);
    const int to = from + step;
    if (from < 0 || to < 0 || to >= int(m_areas.size()) || m_areas[std::size_t(from)].item != item)
        return;
    std::swap(m_areas[std::size_t(from)], m_areas[std::size_t(to)]);

    // Only the moved item changes its place; both keep whether they are open.
    CConMenuCTreeCtrl &tree = Tree();
    const bool expanded = item->isExpanded();
    tree.takeTopLevelItem(from);
    tree.insertTopLevelItem(to, item);
    item->setExpanded(expanded);
    Renumber(std::size_t(std::min(from, to)));

    m_modified = true;
    m_orderChanged = true;
    tree.setFocus(Qt::OtherFocusReason);
    tree.Select(item);
    UpdateToolBar();
}

void CConfigureDlg::OnRename()
{
    Tree().EditLabel(Tree().SelectedItem());
}

bool CConfigureDlg::OnEndLabelEdit(QTreeWidgetItem &item, const QString &text)
{
    SearchAreaRecord *area = AreaOf(&item);
    // A search area keeps a name; an emptied field leaves it as it was.
    if (!area || !CConMenuCTreeCtrl::IsSearchArea(item) || text.trimmed().isEmpty())
        return false;
    if (EqualsNoCase(text, area->name))
        return false;
    if (IsAliasInUse(text)) {
        ShowError(FormatString(Str::NameExists, text), LoadString(Str::IncorrectParameter));
        return false;
    }
    area->name = text;
    area->displayText = text;
    m_modified = true;
    Record([&](cv::rovo::IConfigurationEditor &editor, std::int32_t *status) {
        editor.UpdateFolder(FromQString(area->path), FromQString(area->clientPath), FromQString(text), 1, 0, status);
    });
    return true;
}

void CConfigureDlg::OnExplore()
{
    const QTreeWidgetItem *selected = Tree().SelectedItem();
    const SearchAreaRecord *area = AreaOf(selected);
    if (!area)
        return;
    QString folder = area->clientPath;
    if (!CConMenuCTreeCtrl::IsSearchArea(*selected)) {
        const QString *absolute = area->excluded.Find(selected->text(0));
        folder = absolute ? *absolute : QString();
    }
    if (!m_startProcess(QStringLiteral("xdg-open"), {folder}))
        Ask({LoadString(Str::ExploreError), LoadString(Str::ServerError), MessageIcon::None, MessageButtons::Ok});
}

QString CConfigureDlg::InfoTip(const QTreeWidgetItem &item) const
{
    const SearchAreaRecord *area = AreaOf(&item);
    if (!area)
        return QString();
    if (CConMenuCTreeCtrl::IsSearchArea(item))
        return area->path;
    const QString *absolute = area->excluded.Find(item.text(0));
    return absolute ? *absolute : QString();
}

bool CConfigureDlg::SavePage()
{
    if (!m_editor)
        return false;
    if (!m_modified || !m_orderChanged || m_areas.empty())
        return m_modified;
    try {
        sharedsource::CWaitCursor busy;
        std::vector<WString> paths;
        paths.reserve(m_areas.size());
        for (const SearchAreaRecord &area : m_areas)
            paths.push_back(FromQString(area.path));
        const auto container = serverlibs::Vekex().CreateContainer();
        if (!container)
            return false;
        cv::vek::CallWithStatus([&](std::int32_t *status) {
            container->AssignFromArray(paths.data(), std::uint32_t(paths.size()), status);
        });
        cv::vek::CallWithStatus([&](std::int32_t *status) { m_editor->SetSearchAreaOrder(container.get(), status); });
    } catch (const cv::vek::Exception &) {
        return false;
    }
    return m_modified;
}

SearchAreaRecord *CConfigureDlg::AreaOf(const QTreeWidgetItem *item)
{
    return const_cast<SearchAreaRecord *>(std::as_const(*this).AreaOf(item));
}

const SearchAreaRecord *CConfigureDlg::AreaOf(const QTreeWidgetItem *item) const
{
    if (!item)
        return nullptr;
    const QTreeWidgetItem *areaItem = CConMenuCTreeCtrl::IsSearchArea(*item) ? item : item->parent();
    const int position = CConMenuCTreeCtrl::Position(*areaItem);
    if (position < 0 || std::size_t(position) >= m_areas.size() || m_areas[std::size_t(position)].item != areaItem)
        return nullptr;
    return &m_areas[std::size_t(position)];
}

void CConfigureDlg::ShowError(const QString &text, const QString &caption)
{
    Ask({text, caption, MessageIcon::Error, MessageButtons::Ok});
}

} // namespace pages
