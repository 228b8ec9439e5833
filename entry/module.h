#pragma once

// The module-wide start and end, and the logic behind the exported functions.

#include "entry/serverdialogsapp.h"
#include "entry/serviceui.h"
#include "entry/startcount.h"
#include "serverlibs/rovoapilibrary.h"
#include "serverlibs/searchareas.h"
#include "serverlibs/vekexlibrary.h"
#include "sharedsource/opendialoglist.h"
#include "sorvik/com.h"
#include "sorvik/serverdialogs.h"

#include <cstdint>

namespace cv::vek::rovo {

class ModuleLifetime final
{
public:
    ModuleLifetime(serverlibs::VekexLibrary &vekex, serverlibs::RovoApiLibrary &rovoApi,
                   sharedsource::OpenDialogList &dialogs, CServerDialogsApp &app);

    // The first Init takes a use of the data-store library, then of the
    // server API library; whether they load shows only when they are called.
    void Init();
    // The last Cleanup closes the open modeless windows and lets their
    // deletion run, releases both libraries and ends the application the
    // module made for itself (never a host's); a Cleanup without an Init
    // does nothing.
    void Cleanup();

    std::uint32_t Starts() const { return m_starts.Value(); }

private:
    serverlibs::VekexLibrary &m_vekex;
    serverlibs::RovoApiLibrary &m_rovoApi;
    sharedsource::OpenDialogList &m_dialogs;
    CServerDialogsApp &m_app;
    StartCount m_starts;
};

ModuleLifetime &Module();

// sorvikCreateServerDialogs: null without a usable status (null or already
// negative, which stays untouched); a failure stores its code and returns null.
IServerDialogs *CreateServerDialogs(const char16_t *connection, std::uint32_t serverMode, std::int32_t *status,
                                    IServiceUi &ui, const serverlibs::SorvikOpener &open);

// DllCanUnloadNow: S_OK when no service object and no modeless window of the
// module exists, else S_FALSE.
HRESULT CanUnloadNow();

} // namespace cv::vek::rovo
