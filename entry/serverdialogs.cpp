#include "entry/serverdialogs.h"

#include "entry/inputtester.h"
#include "serverlibs/serverpaths.h"

#include <cstring>
#include <utility>

namespace cv::vek::rovo {

namespace {

constexpr std::int32_t kHostNeedsPreparation = 3;

} // namespace

std::atomic<std::uint32_t> CServerDialogs::s_live{0};

CServerDialogs::CServerDialogs(krn::WString connection, std::uint32_t serverMode, IServiceUi &ui,
                               serverlibs::SorvikOpener open)
    : m_connection(std::move(connection)), m_serverMode(serverMode), m_ui(ui), m_open(std::move(open))
{
    ++s_live;
}

CServerDialogs::~CServerDialogs()
{
    if (m_host)
        m_host->Release();
    --s_live;
}

HRESULT CServerDialogs::QueryInterface(REFIID iid, void **object)
{
    if (!object)
        return E_POINTER;
    if (iid == IID_IServerDialogs) {
        *object = static_cast<IServerDialogs *>(this);
        AddRef();
        return S_OK;
    }
    *object = nullptr;
    return E_NOINTERFACE;
}

ULONG CServerDialogs::AddRef()
{
    return ULONG(++m_refs);
}

ULONG CServerDialogs::Release()
{
    const std::int32_t left = --m_refs;
    if (left > 0)
        return ULONG(left);
    delete this;
    return 0;
}

void CServerDialogs::SetHelpCallback(SorvikHelpCallback callback, std::uintptr_t context)
{
    m_settings.window.help = {callback, context};
}

void CServerDialogs::SetDialogFont(const LOGFONTW *font)
{
    if (!font)
        return;
    LOGFONTW copy;
    std::memcpy(&copy, font, sizeof(LOGFONTW));
    m_settings.window.font = copy;
}

std::int32_t CServerDialogs::ShowConfigurationDialog()
{
    if (m_host && m_host->GetState() == kHostNeedsPreparation)
        m_host->Prepare();
    return m_ui.RunConfigurationDialog(m_connection, m_settings);
}

std::int32_t CServerDialogs::ShowOptimizeDialog()
{
    return m_ui.RunOptimizeDialog(m_connection, m_settings);
}

std::int32_t CServerDialogs::AddSearchArea(krn::WString &path, std::int32_t)
{
    WaitCursor preparing(m_ui);
    serverlibs::SorvikConfiguration config = serverlibs::OpenConfiguration(m_open, m_connection);
    config.sorvik.Reset();
    preparing.Restore();

    CServerDialogsInputTester tester(config.view, config.editor);
    SearchAreaDialogData data;
    data.path = path;
    const std::int32_t result = m_ui.RunSearchAreaDialog(data, tester, m_settings);
    if (result != kModalOk)
        return result;

    WaitCursor busy(m_ui);
    serverlibs::AddSearchArea(*config.editor, *config.view, serverlibs::WithoutTrailingSeparator(data.path),
                              data.alias, data.clientPath);
    serverlibs::Commit(*config.editor);
    return kDone;
}

std::int32_t CServerDialogs::EditSearchArea(krn::WString &path, std::int32_t)
{
    WaitCursor preparing(m_ui);
    serverlibs::SorvikConfiguration config = serverlibs::OpenConfiguration(m_open, m_connection);
    config.sorvik.Reset();
    if (!serverlibs::IsSearchArea(*config.view, path))
        return kNotFound;
    const serverlibs::SearchAreaNames names = serverlibs::GetSearchArea(*config.view, path);
    preparing.Restore();

    CServerDialogsInputTester tester(config.view, config.editor);
    SearchAreaDialogData data;
    data.editMode = true;
    data.alias = names.alias;
    data.path = path;
    data.clientPath = names.clientPath;
    const std::int32_t result = m_ui.RunSearchAreaDialog(data, tester, m_settings);
    if (result != kModalOk)
        return result;

    WaitCursor busy(m_ui);
    serverlibs::EditSearchArea(*config.editor, *config.view, path, names.clientPath, names.alias, data.path,
                               data.alias);
    serverlibs::Commit(*config.editor);
    return kDone;
}

std::int32_t CServerDialogs::ExcludeFolder(krn::WString &path)
{
    if (!m_ui.ConfirmExcludeFolder(path))
        return kDeclined;
    WaitCursor busy(m_ui);
    const serverlibs::SorvikConfiguration config = serverlibs::OpenConfigurationEditor(m_open, m_connection);
    serverlibs::ExcludeFolder(*config.editor, path);
    serverlibs::Commit(*config.editor);
    return kDone;
}

std::int32_t CServerDialogs::RemoveSearchArea(krn::WString &path)
{
    WaitCursor preparing(m_ui);
    serverlibs::SorvikConfiguration config = serverlibs::OpenConfiguration(m_open, m_connection);
    const bool isArea = serverlibs::IsSearchArea(*config.view, path);
    const bool isExcluded = serverlibs::IsExcludedFolder(*config.view, path);
    config.view.Reset();
    config.sorvik.Reset();
    preparing.Restore();

    if (!isArea && !isExcluded)
        return kNotFound;
    // An excluded folder goes without a question: removing it adds data to the search.
    if (!isExcluded && !m_ui.ConfirmRemoveSearchArea(path))
        return kDeclined;
    WaitCursor busy(m_ui);
    serverlibs::RemoveFolder(*config.editor, path);
    serverlibs::Commit(*config.editor);
    return kDone;
}

void CServerDialogs::SetWaitFlag(std::int32_t flag)
{
    m_settings.waitFlag = flag;
}

std::int32_t CServerDialogs::ShowResetDialog()
{
    const krn::RefPtr<cv::rovo::ISorvik> sorvik = m_open(m_connection);
    if (!sorvik) {
        m_ui.ReportUnknownError();
        return kModalCancel;
    }
    return m_ui.RunResetDialog(*sorvik, m_settings);
}

void CServerDialogs::SetHostObject(IServerDialogsHost *host)
{
    // The new reference first: the host may hand in the object already stored.
    if (host)
        host->AddRef();
    if (m_host)
        m_host->Release();
    m_host = host;
}

std::int32_t CServerDialogs::AddSearchAreaEx(krn::WString &path, std::int32_t ignored)
{
    return AddSearchArea(path, ignored);
}

std::int32_t CServerDialogs::EditSearchAreaEx(krn::WString &path, std::int32_t ignored)
{
    return EditSearchArea(path, ignored);
}

void CServerDialogs::SetReserved(std::int32_t value)
{
    m_reserved = value;
}

void CServerDialogs::SetServerMode(std::uint32_t mode)
{
    if (mode == 0 || mode == 1 || mode == 2 || mode == 4)
        m_serverMode = mode;
}

std::int32_t CServerDialogs::GetInterfaceRevision()
{
    return 2;
}

} // namespace cv::vek::rovo
