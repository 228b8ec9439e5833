#pragma once

// libServerDialogs.so as a host application sees it: loaded with dlopen,
// used through its exported functions only.

#include "sorvik/serverdialogsexports.h"
#include "sorvik/serverdialogsextras.h"

#include <QString>

#include <stdexcept>

namespace host {

class ModuleHost final
{
public:
    // Throws std::runtime_error when the library or one of its exports is missing.
    explicit ModuleHost(const QString &file);
    ~ModuleHost();
    ModuleHost(const ModuleHost &) = delete;
    ModuleHost &operator=(const ModuleHost &) = delete;

    void Init() { m_init(); }
    void Cleanup() { m_cleanup(); }
    // A service object with one reference, or null with *status set.
    IServerDialogs *CreateService(const QString &connection, std::int32_t *status);
    std::int32_t RenderDialogs(const QString &folder, const LOGFONTW *font);
    // True while a service object or a modeless window of the module exists.
    bool InUse() { return m_canUnloadNow() != S_OK; }

private:
    void *Symbol(const char *name);

    void *m_handle = nullptr;
    PFN_ServerDialogsInit m_init = nullptr;
    PFN_ServerDialogsCleanup m_cleanup = nullptr;
    PFN_sorvikCreateServerDialogs m_create = nullptr;
    PFN_sorvikRenderDialogs m_render = nullptr;
    PFN_DllCanUnloadNow m_canUnloadNow = nullptr;
};

// Init on construction, Cleanup on destruction.
class ModuleStart final
{
public:
    explicit ModuleStart(ModuleHost &module) : m_module(module) { m_module.Init(); }
    ~ModuleStart() { m_module.Cleanup(); }
    ModuleStart(const ModuleStart &) = delete;
    ModuleStart &operator=(const ModuleStart &) = delete;

private:
    ModuleHost &m_module;
};

} // namespace host
