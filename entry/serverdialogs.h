#pragma once

// The service object a host receives from sorvikCreateServerDialogs: it keeps
// the host's settings and runs the module's dialogs and search-area
// operations for the Sorvik named by its connection text. Nothing
// server-related is kept between calls. Used on the host's user-interface
// thread only.

#include "entry/hostsettings.h"
#include "entry/serviceui.h"
#include "serverlibs/searchareas.h"
#include "sorvik/serverdialogs.h"
#include "sorvik/wstring.h"

#include <atomic>
#include <cstdint>

namespace cv::vek::rovo {

class CServerDialogs final : public IServerDialogs
{
public:
    // One reference, the caller's.
    CServerDialogs(krn::WString connection, std::uint32_t serverMode, IServiceUi &ui,
                   serverlibs::SorvikOpener open);
    CServerDialogs(const CServerDialogs &) = delete;
    CServerDialogs &operator=(const CServerDialogs &) = delete;

    HRESULT QueryInterface(REFIID iid, void **object) override;
    ULONG AddRef() override;
    ULONG Release() override;

    void SetHelpCallback(SorvikHelpCallback callback, std::uintptr_t context) override;
    void SetDialogFont(const LOGFONTW *font) override;
    std::int32_t ShowConfigurationDialog() override;
    std::int32_t ShowOptimizeDialog() override;
    std::int32_t AddSearchArea(krn::WString &path, std::int32_t ignored) override;
    std::int32_t EditSearchArea(krn::WString &path, std::int32_t ignored) override;
    std::int32_t ExcludeFolder(krn::WString &path) override;
    std::int32_t RemoveSearchArea(krn::WString &path) override;
    void SetWaitFlag(std::int32_t flag) override;
    std::int32_t ShowResetDialog() override;
    void SetHostObject(IServerDialogsHost *host) override;
    std::int32_t AddSearchAreaEx(krn::WString &path, std::int32_t ignored) override;
    std::int32_t EditSearchAreaEx(krn::WString &path, std::int32_t ignored) override;
    void SetReserved(std::int32_t value) override;
    void SetServerMode(std::uint32_t mode) override;
    std::int32_t GetInterfaceRevision() override;

    const krn::WString &Connection() const { return m_connection; }
    const HostSettings &Settings() const { return m_settings; }
    std::uint32_t ServerMode() const { return m_serverMode; }
    IServerDialogsHost *HostObject() const { return m_host; }
    std::int32_t Reserved() const { return m_reserved; }

    // Service objects alive in this module.
    static std::uint32_t LiveObjects() { return s_live.load(); }

    // Results of the search-area operations besides the modal results.
    static constexpr std::int32_t kDone = 1;
    static constexpr std::int32_t kDeclined = 2;
    static constexpr std::int32_t kNotFound = 3;

protected:
    virtual ~CServerDialogs();

private:
    std::int32_t m_refs = 1;
    HostSettings m_settings;
    krn::WString m_connection;
    std::uint32_t m_serverMode;
    IServerDialogsHost *m_host = nullptr;
    std::int32_t m_reserved = 0;
    IServiceUi &m_ui;
    serverlibs::SorvikOpener m_open;

    static std::atomic<std::uint32_t> s_live;
};

} // namespace cv::vek::rovo
