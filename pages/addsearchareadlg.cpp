#include "pages/addsearchareadlg.h"

#include "pages/defaultareaname.h"
#include "pages/pathprobe.h"
#include "resources/strings.h"
#include "resources/templates.h"
#include "serverlibs/serverpaths.h"
#include "sharedsource/imageset.h"
#include "sorvik/wstringqt.h"

#include <QAbstractButton>
#include <QLineEdit>

namespace pages {

using resources::FormatString;
using resources::LoadString;
using resources::Str;
using sharedsource::MessageButtons;
using sharedsource::MessageIcon;
using sharedsource::MessageResult;

namespace {

namespace serverlibs = cv::vek::rovo::serverlibs;

// A folder without any separator is a bare drive ("D:"), which means its root.
QString WithRootSeparator(const QString &path)
{
    const bool holdsSeparator = path.contains(u'\\') || path.contains(u'/');
    return path.isEmpty() || holdsSeparator ? path : path + u'\\';
}

QString WithoutTrailingSeparator(const QString &path)
{
    return cv::krn::ToQString(serverlibs::WithoutTrailingSeparator(cv::krn::ToView(path)));
}

} // namespace

CAddSearchAreaDlg::CAddSearchAreaDlg(const QString &name, const QString &serverPath, const QString &path,
                                     IInputTester &tester, bool editMode, QWidget *parent)
    : ToBaseDlg(resources::kAddSearchAreaTemplate, parent),
      m_name(name),
      m_initialName(name),
      m_path(path),
      m_serverPath(WithRootSeparator(serverPath)),
      m_editMode(editMode),
      m_tester(tester),
      m_inspector(&FileSystemInspector())
{
    if (m_path.isEmpty() && !m_serverPath.isEmpty())
        m_path = m_serverPath;
    else
        m_path = WithRootSeparator(m_path);

    using namespace resources;
    AddConstraint(IDC_ALIAS_LABEL, NSFlexHorizontallyFixed, NSFlexVerticallyFixed);
    AddConstraint(IDC_PATH_LABEL, NSFlexHorizontallyFixed, NSFlexVerticallyFixed);
    AddConstraint(IDC_ALIAS, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDC_PATH, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDC_BROWSE, NSFlexMoveRight, NSFlexVerticallyFixed);
    AddConstraint(IDOK, NSFlexHorizontallyFixed, NSFlexMoveDown);
    AddConstraint(IDCANCEL, NSFlexHorizontallyFixed, NSFlexMoveDown);
    AddConstraint(IDHELP, NSFlexHorizontallyFixed, NSFlexMoveDown);
}

std::u16string CAddSearchAreaDlg::HelpTopic() const
{
    return m_editMode ? kEditHelpTopic : kAddHelpTopic;
}

QLineEdit &CAddSearchAreaDlg::NameEdit() const
{
    return sharedsource::GetControl<QLineEdit>(this, resources::IDC_ALIAS);
}

QLineEdit &CAddSearchAreaDlg::PathEdit() const
{
    return sharedsource::GetControl<QLineEdit>(this, resources::IDC_PATH);
}

bool CAddSearchAreaDlg::OnInitDialog()
{
    ToBaseDlg::OnInitDialog();
    setWindowIcon(sharedsource::LoadImage(QStringLiteral("searcharea"), logicalDpiY()));
    auto &browse = sharedsource::GetControl<QAbstractButton>(this, resources::IDC_BROWSE);
    connect(&browse, &QAbstractButton::clicked, this, [this] { OnBrowse(); });
    if (!m_path.isEmpty() && m_name.isEmpty())
        m_name = DefaultAreaName(m_path, m_name, m_tester);
    if (m_editMode) {
        setWindowTitle(LoadString(Str::EditSearchAreaTitle));
        PathEdit().setReadOnly(true);
        browse.setEnabled(false);
    }
    DataExchange(false);
    return true;
}

bool CAddSearchAreaDlg::DataExchange(bool save)
{
    if (save) {
        m_name = NameEdit().text();
        m_path = PathEdit().text();
    } else {
        NameEdit().setText(m_name);
        PathEdit().setText(m_path);
    }
    return true;
}

QString CAddSearchAreaDlg::Name()
{
    return m_name.isEmpty() ? DefaultAreaName(m_path, m_name, m_tester) : m_name;
}

QString CAddSearchAreaDlg::ServerPath() const
{
    return WithoutTrailingSeparator(m_serverPath);
}

QString CAddSearchAreaDlg::Path() const
{
    return WithoutTrailingSeparator(m_path);
}

void CAddSearchAreaDlg::OnBrowse()
{
    DataExchange(true);
    const std::optional<QString> chosen = Prompts().BrowseForFolder(
        this, {LoadString(Str::SelectRepositoryPath), QString(), WithoutTrailingSeparator(m_path)});
    if (!chosen || *chosen == m_path)
        return;
    m_path = *chosen;
    if (m_name.isEmpty())
        m_name = DefaultAreaName(m_path, m_name, m_tester);
    DataExchange(false);
}

bool CAddSearchAreaDlg::OnApply(std::uintptr_t)
{
    m_path = m_path.trimmed();
    if (m_path.isEmpty()) {
        ShowInputError(LoadString(Str::EnterValidPath));
        return false;
    }
    if (!ConfirmLocation())
        return false;
    m_serverPath = m_path;

    const auto name = cv::krn::FromQString(m_name);
    const auto path = cv::krn::FromQString(m_path);
    if (m_tester.CheckPathAllowed(cv::krn::FromQString(m_serverPath), path, name) == 4) {
        ShowInputError(FormatString(Str::PathNotAllowed, m_path));
        return false;
    }
    // The unchanged-name test is exact while IsAliasInUse ignores case, so a
    // rename that changes only the letter case is refused as a duplicate.
    const bool nameUnchanged = m_editMode && m_name == m_initialName;
    if (!nameUnchanged && m_tester.IsAliasInUse(name)) {
        ShowInputError(FormatString(Str::NameExists, m_name));
        return false;
    }
    return m_editMode || ConfirmAgainstSearchAreas();
}

bool CAddSearchAreaDlg::ConfirmLocation()
{
    const bool remote = IsExistingRemoteLocation(*m_inspector, m_path);
    if (!remote && !IsExistingFolder(*m_inspector, m_path) &&
        Ask(LoadString(Str::PathNotValid), LoadString(Str::IncorrectParameter), MessageIcon::Warning,
            MessageButtons::YesNo) != MessageResult::Yes)
        return false;
    if (remote && Ask(LoadString(Str::RemoteAreaWarning), LoadString(Str::RemoteAreaCaption), MessageIcon::Warning,
                      MessageButtons::OkCancel) != MessageResult::Ok)
        return false;
    return true;
}

bool CAddSearchAreaDlg::ConfirmAgainstSearchAreas()
{
    cv::krn::WString owner;
    switch (m_tester.TestClientPath(cv::krn::FromQString(m_path), owner)) {
    case 1:
        ShowInputError(FormatString(Str::FullPathExists, m_path));
        return false;
    case 2:
        ShowInputError(FormatString(Str::FolderInSearchArea, cv::krn::ToQString(owner)));
        return false;
    case -1:
        return Ask(LoadString(Str::PathContainsSearchAreas), LoadString(Str::Information), MessageIcon::Information,
                   MessageButtons::OkCancel) == MessageResult::Ok;
    default:
        return true;
    }
}

void CAddSearchAreaDlg::ShowInputError(const QString &text)
{
    Ask(text, LoadString(Str::IncorrectParameter), MessageIcon::Error, MessageButtons::Ok);
}

MessageResult CAddSearchAreaDlg::Ask(const QString &text, const QString &caption, MessageIcon icon,
                                     MessageButtons buttons)
{
    return CNSFlexDialog::Ask(sharedsource::Message{text, caption, icon, buttons});
}

} // namespace pages
