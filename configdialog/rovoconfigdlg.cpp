#include "configdialog/rovoconfigdlg.h"

#include "optimize/optimizecustompropswaitdlg.h"
#include "resources/strings.h"
#include "resources/templates.h"
#include "serverlibs/sorvikcalls.h"
#include "sharedsource/imageset.h"
#include "sharedsource/waitcursor.h"
#include "sorvik/vekexception.h"
#include "sorvik/wstringqt.h"

#include <QPushButton>

namespace cv::vek::rovo::configdialog {

namespace {

using resources::FormatString;
using resources::LoadString;
using resources::Str;
using sharedsource::Message;
using sharedsource::MessageButtons;
using sharedsource::MessageIcon;

Str TitleOf(PageSlot slot)
{
    switch (slot) {
    case PageSlot::SearchAreas:
        return Str::SearchAreasTab;
    case PageSlot::Parselets:
        return Str::ParseletsTab;
    case PageSlot::FileExtensions:
        return Str::FileExtensionsTab;
    case PageSlot::Indexer:
        return Str::IndexerTab;
    case PageSlot::Advanced:
        break;
    }
    return Str::AdvancedTab;
}

std::size_t IndexOf(PageSlot slot)
{
    return std::size_t(slot);
}

} // namespace

CROVOConfigDlg::CROVOConfigDlg(const krn::WString &connection, std::int32_t waitFlag, QWidget *parent,
                               const IPropertyPageFactory &pages, serverlibs::SorvikOpener open)
    : ToBaseDlg(resources::kSorvikPropertiesTemplate, parent), m_pageFactory(pages), m_waitFlag(waitFlag)
{
    using namespace resources;
    AddConstraint(IDC_PROPERTY_TABS, NSFlexExpandRight, NSFlexExpandDown, true);
    AddConstraint(IDC_IMPORT, NSFlexMoveRight, NSFlexVerticallyFixed, true);
    AddConstraint(IDC_EXPORT, NSFlexMoveRight, NSFlexVerticallyFixed, true);
    AddConstraint(IDOK, NSFlexHorizontallyFixed, NSFlexMoveDown, true);
    AddConstraint(IDCANCEL, NSFlexHorizontallyFixed, NSFlexMoveDown, true);
    AddConstraint(IDHELP, NSFlexHorizontallyFixed, NSFlexMoveDown, true);
    AddConstraint(IDC_CONFIG_ERROR_TEXT, NSFlexExpandRight, NSFlexVerticallyFixed, true);
    AddConstraint(IDC_CONFIG_ERROR_ICON, NSFlexHorizontallyFixed, NSFlexVerticallyFixed, true);

    // Whatever cannot be had stays absent; the dialog then shows its error panel.
    try {
        m_sorvik = open(connection);
        if (m_sorvik) {
            m_view = serverlibs::GetConfigurationView(*m_sorvik);
            m_editor = serverlibs::GetConfigurationEditor(*m_sorvik);
        }
    } catch (const Exception &) {
    }
}

CROVOConfigDlg::~CROVOConfigDlg()
{
    for (PageSlot slot :
         {PageSlot::Indexer, PageSlot::Advanced, PageSlot::SearchAreas, PageSlot::Parselets, PageSlot::FileExtensions})
        m_pages[IndexOf(slot)].reset();
    m_sorvik.Reset();
    m_editor.Reset();
    m_view.Reset();
}

QWidget *CROVOConfigDlg::CreateCustomControl(const sharedsource::ControlTemplate &control)
{
    return control.id == resources::IDC_PROPERTY_TABS ? &m_tabs : nullptr;
}

pages::CPropertyPage *CROVOConfigDlg::Page(PageSlot slot) const
{
    return m_pages[IndexOf(slot)].get();
}

bool CROVOConfigDlg::OnInitDialog()
{
    ToBaseDlg::OnInitDialog();
    connect(&sharedsource::GetControl<QPushButton>(this, resources::IDC_IMPORT), &QPushButton::clicked, this,
            &CROVOConfigDlg::OnImport);
    connect(&sharedsource::GetControl<QPushButton>(this, resources::IDC_EXPORT), &QPushButton::clicked, this,
            &CROVOConfigDlg::OnExport);
    m_tabs.SetLeaveCheck([this](int index) { return CanLeave(index); });
    if (m_waitFlag == 0)
        setWindowIcon(sharedsource::LoadImage(QStringLiteral("application"), logicalDpiY()));
    try {
        setWindowTitle(FormatString(Str::ConfigureTitle, DisplayName()));
        if (!m_view || !m_editor || !m_sorvik) {
            EnterErrorMode();
            return true;
        }
        AddPages();
    } catch (const Exception &) {
        // The dialog stays open with what was built.
    }
    return true;
}

QString CROVOConfigDlg::DisplayName() const
{
    const QString name = m_sorvik ? krn::ToQString(serverlibs::SorvikName(*m_sorvik)) : QString();
    return name.isEmpty() ? LoadString(Str::MySorvik) : name;
}

void CROVOConfigDlg::AddPages()
{
    PageServices services{m_view, m_editor, {}};
    for (PageSlot slot : kPageSlots) {
        if (slot == PageSlot::Advanced) {
            // No running server is no reason to go without the page.
            try {
                services.indexManager = serverlibs::GetIndexManager(*m_sorvik);
            } catch (const Exception &) {
            }
        }
        std::unique_ptr<pages::CPropertyPage> page = m_pageFactory.Create(slot, services, &m_tabs);
        services.indexManager.Reset();
        if (!page)
            continue;
        if (sharedsource::AddTabPage(m_tabs, *page, LoadString(TitleOf(slot))) < 0)
            continue;
        m_pages[IndexOf(slot)] = std::move(page);
        if (slot == PageSlot::FileExtensions) {
            if (pages::CPropertyPage *parselets = Page(PageSlot::Parselets))
                parselets->SetFileExtensionsPage(dynamic_cast<pages::IFileExtensionsPage *>(Page(slot)));
        }
    }
    for (const auto &page : m_pages) {
        if (page && page->LoadFailed()) {
            EnterErrorMode();
            return;
        }
    }
}

void CROVOConfigDlg::EnterErrorMode()
{
    using namespace resources;
    m_errorMode = true;
    sharedsource::GetControl<QWidget>(this, IDC_CONFIG_ERROR_TEXT).show();
    sharedsource::GetControl<QWidget>(this, IDC_CONFIG_ERROR_ICON).show();
    m_tabs.hide();
    sharedsource::GetControl<QWidget>(this, IDC_IMPORT).hide();
    sharedsource::GetControl<QWidget>(this, IDC_EXPORT).hide();

    QWidget &ok = sharedsource::GetControl<QWidget>(this, IDOK);
    QWidget &cancel = sharedsource::GetControl<QWidget>(this, IDCANCEL);
    QWidget &help = sharedsource::GetControl<QWidget>(this, IDHELP);
    const int bottomMargin = height() - (cancel.y() + cancel.height());
    help.move(cancel.x(), cancel.y() + cancel.height() + 10);

    // Half the height; the buttons move up with the bottom edge so that they stay in the window.
    const QSize half(width(), height() / 2);
    const int shift = help.y() + help.height() + bottomMargin - half.height();
    for (QWidget *button : {&ok, &cancel, &help})
        button->move(button->x(), button->y() - shift);
    RebaseLayout(half);
}

std::u16string CROVOConfigDlg::HelpTopicOf(PageSlot slot)
{
    switch (slot) {
    case PageSlot::SearchAreas:
        return u"ROAM_SEARCH_CONFIGURE_SEARCHAREAS_DIALOG";
    case PageSlot::Parselets:
        return u"ROAM_SEARCH_PLUGIN_OVERVIEW_DIALOG";
    case PageSlot::FileExtensions:
        return u"ROAM_SEARCH_FILEFILTERS_DIALOG";
    case PageSlot::Indexer:
        return u"ROAM_SEARCH_CRAWLER_DIALOG";
    case PageSlot::Advanced:
        break;
    }
    return u"ROAM_SEARCH_ADV_SORVIK_SETTINGS_DIALOG";
}

PageSlot CROVOConfigDlg::SlotAt(int index) const
{
    const QWidget *shown = m_tabs.widget(index);
    for (PageSlot slot : kPageSlots) {
        if (shown && Page(slot) == shown)
            return slot;
    }
    return PageSlot(-1);
}

std::u16string CROVOConfigDlg::HelpTopic() const
{
    if (m_errorMode)
        return kErrorHelpTopic;
    const PageSlot slot = SlotAt(m_tabs.currentIndex());
    return IndexOf(slot) < std::size(kPageSlots) ? HelpTopicOf(slot) : std::u16string();
}

bool CROVOConfigDlg::CanLeave(int index)
{
    const PageSlot slot = SlotAt(index);
    return IndexOf(slot) >= std::size(kPageSlots) || Page(slot)->CanLeavePage();
}

void CROVOConfigDlg::accept()
{
    if (!m_errorMode) {
        try {
            SaveAndCommit();
        } catch (const com::cErrCode &code) {
            if (code == com::errInputRejected)
                return; // the page told the user; its values stay for correcting
        } catch (const Exception &e) {
            Ask(Message{
                LoadString(e.Code() == errors::UpdateTimedOut ? Str::UpdateTimedOut : Str::ConfigurationWriteError),
                LoadString(Str::ServerError), MessageIcon::Error, MessageButtons::Ok});
        }
    }
    done(sharedsource::kResultOk);
    FollowTheServer();
}

void CROVOConfigDlg::SaveAndCommit()
{
    // Every page that exists saves, in this order, even after one reported changes.
    bool changed = false;
    for (PageSlot slot : {PageSlot::SearchAreas, PageSlot::Indexer, PageSlot::Advanced, PageSlot::Parselets}) {
        if (pages::CPropertyPage *page = Page(slot))
            changed = page->SavePage() || changed;
    }
    if (pages::CPropertyPage *extensions = Page(PageSlot::FileExtensions))
        changed = extensions->IsModified() || changed;
    if (changed || m_imported) {
        sharedsource::CWaitCursor busy;
        serverlibs::Commit(*m_editor);
    }
    if (pages::CPropertyPage *advanced = Page(PageSlot::Advanced))
        advanced->AfterCommit(m_sorvik.get());
}

void CROVOConfigDlg::FollowTheServer()
{
    if (!m_sorvik || m_waitFlag == 0)
        return;
    krn::RefPtr<cv::rovo::IIndexManager> indexManager;
    try {
        indexManager = serverlibs::GetIndexManager(*m_sorvik);
    } catch (const Exception &) {
    }
    if (!indexManager)
        return;
    sharedsource::HostSettings host;
    host.font = HostFont();
    optimize::COptimizeCustomPropsWaitDlg::Open(std::move(indexManager), LoadString(Str::ConfiguringSorvik), host);
}

} // namespace cv::vek::rovo::configdialog
