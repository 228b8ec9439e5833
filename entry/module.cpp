#include "entry/module.h"

#include "entry/errors/raiseerror.h"
#include "entry/serverdialogs.h"

#include <new>

namespace cv::vek::rovo {

ModuleLifetime::ModuleLifetime(serverlibs::VekexLibrary &vekex, serverlibs::RovoApiLibrary &rovoApi,
                               OpenDialogList &dialogs, CServerDialogsApp &app)
    : m_vekex(vekex), m_rovoApi(rovoApi), m_dialogs(dialogs), m_app(app)
{
}

void ModuleLifetime::Init()
{
    if (m_starts.Value() == 0) {
        m_vekex.TakeUse();
        m_rovoApi.TakeUse();
    }
    m_starts.Start();
}

void ModuleLifetime::Cleanup()
{
    if (!m_starts.End())
        return;
    m_dialogs.CloseAll();
    m_vekex.ReleaseUse();
    m_rovoApi.ReleaseUse();
    m_app.ExitInstance();
}

ModuleLifetime &Module()
{
    static ModuleLifetime module(serverlibs::Vekex(), serverlibs::RovoApi(), OpenDialogs(), TheApp());
    return module;
}

IServerDialogs *CreateServerDialogs(const char16_t *connection, std::uint32_t serverMode, std::int32_t *status,
                                    IServiceUi &ui, const serverlibs::SorvikOpener &open)
{
    if (!status || *status < 0)
        return nullptr;
    try {
        RequireString(connection);
        try {
            return new CServerDialogs(krn::WString(connection), serverMode, ui, open);
        } catch (const std::bad_alloc &) {
            RaiseError(u"out of memory", errors::OutOfMemory, u"", __LINE__);
        }
    } catch (const Exception &e) {
        *status = e.Code();
    }
    return nullptr;
}

HRESULT CanUnloadNow()
{
    return CServerDialogs::LiveObjects() == 0 && OpenDialogs().Count() == 0 ? S_OK : S_FALSE;
}

} // namespace cv::vek::rovo
