#include "entry/serviceui.h"

#include "configdialog/rovoconfigdlg.h"
#include "entry/serverdialogsapp.h"
#include "pages/addsearchareadlg.h"
#include "resources/strings.h"
#include "sharedsource/prompts.h"
#include "sharedsource/waitcursor.h"
#include "sorvik/wstringqt.h"

namespace cv::vek::rovo {

namespace {

using resources::LoadString;
using resources::Str;
using sharedsource::MessageButtons;
using sharedsource::MessageIcon;
using sharedsource::MessageResult;

class CModuleServiceUi final : public IServiceUi
{
public:
    std::int32_t RunConfigurationDialog(const krn::WString &connection, const HostSettings &host) override
    {
        if (!TheApp().EnsureApplication())
            return kDialogNotCreated;
        configdialog::CROVOConfigDlg dialog(connection, host.waitFlag);
        dialog.SetHostSettings(host.window);
        return dialog.DoModal();
    }

    // The optimize and reset dialogs do not exist yet.
    std::int32_t RunOptimizeDialog(const krn::WString &, const HostSettings &) override { return kDialogNotCreated; }
    std::int32_t RunResetDialog(cv::rovo::ISorvik &, const HostSettings &) override { return kDialogNotCreated; }

    std::int32_t RunSearchAreaDialog(SearchAreaDialogData &data, IInputTester &tester,
                                     const HostSettings &host) override
    {
        if (!TheApp().EnsureApplication())
            return kDialogNotCreated;
        pages::CAddSearchAreaDlg dialog(krn::ToQString(data.alias), krn::ToQString(data.path),
                                        krn::ToQString(data.clientPath), tester, data.editMode);
        dialog.SetHostSettings(host.window);
        const std::int32_t result = dialog.DoModal();
        if (result == kModalOk) {
            data.alias = krn::FromQString(dialog.Name());
            data.path = krn::FromQString(dialog.ServerPath());
            data.clientPath = krn::FromQString(dialog.Path());
        }
        return result;
    }

    bool ConfirmExcludeFolder(std::u16string_view path) override
    {
        return Confirm(resources::FormatString(Str::ExcludeFolderQuestion, ToQString(path)));
    }
    bool ConfirmRemoveSearchArea(std::u16string_view path) override
    {
        return Confirm(resources::FormatString(Str::RemoveSearchAreaQuestion, ToQString(path)));
    }
    void ReportUnknownError() override
    {
        if (QApplication *app = TheApp().EnsureApplication())
            sharedsource::QtPrompts().ShowMessage(
                app->activeWindow(),
                {LoadString(Str::UnknownError), LoadString(Str::ServerError), MessageIcon::Error, MessageButtons::Ok});
    }

    void BeginWaitCursor() override { sharedsource::BeginWaitCursor(); }
    void EndWaitCursor() override { sharedsource::EndWaitCursor(); }

private:
    static QString ToQString(std::u16string_view text)
    {
        return QString::fromUtf16(text.data(), qsizetype(text.size()));
    }

    // Without a widget application nothing can be asked, and nothing changes unasked.
    static bool Confirm(const QString &question)
    {
        QApplication *app = TheApp().EnsureApplication();
        if (!app)
            return false;
        return sharedsource::QtPrompts().ShowMessage(app->activeWindow(),
                                                     {question, LoadString(Str::Warning), MessageIcon::Warning,
                                                      MessageButtons::OkCancel}) == MessageResult::Ok;
    }
};

} // namespace

IServiceUi &ModuleServiceUi()
{
    static CModuleServiceUi ui;
    return ui;
}

} // namespace cv::vek::rovo
