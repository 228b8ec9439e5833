#include "entry/module.h"

#include "entry/errors/raiseerror.h"
#include "entry/serverdialogs.h"

#include <QCoreApplication>

#include <new>

namespace cv::vek::rovo {

ModuleLifetime::ModuleLifetime(serverlibs::VekexLibrary &vekex, serverlibs::RovoApiLibrary &rovoApi,
                               sharedsource::OpenDialogList &dialogs, CServerDialogsApp &app)
    : m_vekex(vekex), m_rovoApi(rovoApi), m_dialogs(dialogs), m_app(app)
{}

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
    // Closed windows delete themselves later; they must go while the
    // application and the libraries they hold are still there.
    if (QCoreApplication::instance())
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    m_vekex.ReleaseUse();
    m_rovoApi.ReleaseUse();
    m_app.ExitInstance();
}

ModuleLifetime &Module()
{
    static ModuleLifetime module(serverlibs::Vekex(), serverlibs::RovoApi(), sharedsource::OpenDialogs(), TheApp());
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
    return CServerDialogs::LiveObjects() == 0 && sharedsource::OpenDialogs().Count() == 0 ? S_OK : S_FALSE;
}

} // namespace cv::vek::rovo
