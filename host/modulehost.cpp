#include "host/modulehost.h"

#include <dlfcn.h>

namespace host {

ModuleHost::ModuleHost(const QString &file)
{
    m_handle = ::dlopen(file.toLocal8Bit().constData(), RTLD_NOW | RTLD_LOCAL);
    if (!m_handle)
        throw std::runtime_error(std::string("cannot load the module: ") + ::dlerror());
    m_init = reinterpret_cast<PFN_ServerDialogsInit>(Symbol("Init"));
    m_cleanup = reinterpret_cast<PFN_ServerDialogsCleanup>(Symbol("Cleanup"));
    m_create = reinterpret_cast<PFN_sorvikCreateServerDialogs>(Symbol("sorvikCreateServerDialogs"));
    m_render = reinterpret_cast<PFN_sorvikRenderDialogs>(Symbol("sorvikRenderDialogs"));
    m_canUnloadNow = reinterpret_cast<PFN_DllCanUnloadNow>(Symbol("DllCanUnloadNow"));
}

ModuleHost::~ModuleHost()
{
    ::dlclose(m_handle);
}

void *ModuleHost::Symbol(const char *name)
{
    void *symbol = ::dlsym(m_handle, name);
    if (!symbol) {
        ::dlclose(m_handle);
        throw std::runtime_error(std::string("the module does not export ") + name);
    }
    return symbol;
}

IServerDialogs *ModuleHost::CreateService(const QString &connection, std::int32_t *status)
{
    return m_create(reinterpret_cast<const char16_t *>(connection.utf16()), 0, status);
}

std::int32_t ModuleHost::RenderDialogs(const QString &folder, const LOGFONTW *font)
{
    return m_render(reinterpret_cast<const char16_t *>(folder.utf16()), font);
}

} // namespace host
