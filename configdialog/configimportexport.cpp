// The properties dialog's Import and Export: a whole configuration between
// the editor and a configuration file the user chooses.

#include "configdialog/rovoconfigdlg.h"

#include "resources/strings.h"
#include "serverlibs/sorvikcalls.h"
#include "sharedsource/waitcursor.h"
#include "sorvik/vekexception.h"
#include "sorvik/wstringqt.h"

namespace cv::vek::rovo::configdialog {

namespace {

using resources::LoadString;
using resources::Str;
using sharedsource::Message;
using sharedsource::MessageButtons;
using sharedsource::MessageIcon;

constexpr char kExtension[] = "skc";

sharedsource::FileRequest ConfigurationFile(bool save, const QString &defaultName)
{
    sharedsource::FileRequest request;
    request.save = save;
    request.defaultName = defaultName;
    request.defaultExtension = QString::fromLatin1(kExtension);
    request.filter = LoadString(Str::ConfigurationFileFilter);
    return request;
}

Message ServerError(Str text)
{
    return Message{LoadString(text), LoadString(Str::ServerError), MessageIcon::Error, MessageButtons::Ok};
}

} // namespace

QString CROVOConfigDlg::DefaultFileName() const
{
    QString name;
    try {
        name = DisplayName();
    } catch (const Exception &) {
        name = LoadString(Str::MySorvik);
    }
    return name + u'.' + QString::fromLatin1(kExtension);
}

void CROVOConfigDlg::OnImport()
{
    if (Ask(Message{LoadString(Str::ImportQuestion), LoadString(Str::Warning), MessageIcon::Warning,
                    MessageButtons::OkCancel}) != sharedsource::MessageResult::Ok)
        return;
    const std::optional<QString> file = Prompts().ChooseFile(this, ConfigurationFile(false, DefaultFileName()));
    if (!file)
        return;
    try {
        sharedsource::CWaitCursor busy;
        serverlibs::ImportConfiguration(*m_view, krn::FromQString(*file), *m_editor);
        for (PageSlot slot : kPageSlots) {
            if (pages::CPropertyPage *page = Page(slot))
                page->Reload();
        }
        m_imported = true;
    } catch (const Exception &) {
        Ask(ServerError(Str::ImportError));
    }
}

void CROVOConfigDlg::OnExport()
{
    const std::optional<QString> file = Prompts().ChooseFile(this, ConfigurationFile(true, DefaultFileName()));
    if (!file)
        return;
    try {
        // The File Extensions page writes its changes as they are made.
        for (PageSlot slot : {PageSlot::SearchAreas, PageSlot::Parselets, PageSlot::Indexer, PageSlot::Advanced}) {
            if (pages::CPropertyPage *page = Page(slot))
                page->SavePage();
        }
        sharedsource::CWaitCursor busy;
        serverlibs::ExportConfiguration(*m_view, krn::FromQString(*file), *m_editor);
    } catch (const com::cErrCode &) {
        // A page refused its input and said why; nothing is written.
    } catch (const Exception &) {
        Ask(ServerError(Str::ExportError));
    }
}

} // namespace cv::vek::rovo::configdialog
