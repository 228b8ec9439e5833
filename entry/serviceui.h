#pragma once

// What the service object needs of the user interface: its modal dialogs,
// its two questions, one error box and the wait cursor. The service logic
// stays testable with a scripted implementation.

#include "entry/hostsettings.h"
#include "sorvik/rovoapi.h"
#include "sorvik/serverdialogs.h"
#include "sorvik/wstring.h"

#include <cstdint>
#include <string_view>

namespace cv::vek::rovo {

constexpr std::int32_t kModalOk = 1;
constexpr std::int32_t kModalCancel = 2;
constexpr std::int32_t kDialogNotCreated = -1;

// The values of the Add/Edit Search Area dialog: the initial ones going in,
// what the user entered coming out after OK.
struct SearchAreaDialogData
{
    bool editMode = false;
    krn::WString alias;
    krn::WString path;
    krn::WString clientPath;
};

class IServiceUi
{
public:
    // Each Run returns the modal result: kModalOk, kModalCancel or kDialogNotCreated.
    virtual std::int32_t RunConfigurationDialog(const krn::WString &connection, const HostSettings &host) = 0;
    virtual std::int32_t RunOptimizeDialog(const krn::WString &connection, const HostSettings &host) = 0;
    virtual std::int32_t RunResetDialog(cv::rovo::ISorvik &sorvik, const HostSettings &host) = 0;
    virtual std::int32_t RunSearchAreaDialog(SearchAreaDialogData &data, IInputTester &tester,
                                             const HostSettings &host) = 0;

    // The warnings with OK and Cancel; true only for OK.
    virtual bool ConfirmExcludeFolder(std::u16string_view path) = 0;
    virtual bool ConfirmRemoveSearchArea(std::u16string_view path) = 0;
    // The "Server Error" box saying "Unknown error.".
    virtual void ReportUnknownError() = 0;

    virtual void BeginWaitCursor() = 0;
    virtual void EndWaitCursor() = 0;

protected:
    ~IServiceUi() = default;
};

// Shows the wait cursor until Restore or the end of the scope, whichever
// comes first, so an exception never leaves it on.
class WaitCursor final
{
public:
    explicit WaitCursor(IServiceUi &ui) : m_ui(&ui) { m_ui->BeginWaitCursor(); }
    WaitCursor(const WaitCursor &) = delete;
    WaitCursor &operator=(const WaitCursor &) = delete;
    ~WaitCursor() { Restore(); }

    void Restore()
    {
        if (m_ui)
            m_ui->EndWaitCursor();
        m_ui = nullptr;
    }

private:
    IServiceUi *m_ui;
};

// The user interface that service objects of this module use: the real
// search-area dialog and questions, in the host's widget application or in
// one the module creates. Dialogs that do not exist yet, and every dialog
// when no widget application can exist, are reported as not created; a
// question that cannot be asked counts as not confirmed.
IServiceUi &ModuleServiceUi();

} // namespace cv::vek::rovo
