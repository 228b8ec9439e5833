// The functions libServerDialogs.so exports; everything else stays hidden.

#include "entry/dialoggallery.h"
#include "entry/module.h"
#include "entry/serverdialogsapp.h"
#include "resources/hostresources.h"
#include "serverlibs/opensorvik.h"
#include "sorvik/serverdialogsexports.h"
#include "sorvik/serverdialogsextras.h"

#include <QByteArray>
#include <QString>

#include <map>
#include <mutex>

#include <utility>

namespace {

using namespace cv::vek::rovo;

// Starts the application object when the module is loaded and ends it when
// the module is unloaded.
struct ModuleInstance
{
    ModuleInstance() { TheApp().InitInstance(); }
    ~ModuleInstance() { TheApp().ExitInstance(); }
    ModuleInstance(const ModuleInstance &) = delete;
    ModuleInstance &operator=(const ModuleInstance &) = delete;
} g_moduleInstance;

constexpr std::int32_t kInitEskResult = 2;

} // namespace

extern "C" {

IServerDialogs *sorvikCreateServerDialogs(const char16_t *connection, std::uint32_t serverMode,
                                          std::int32_t *status)
{
    return CreateServerDialogs(connection, serverMode, status, ModuleServiceUi(), serverlibs::ModuleSorvikOpener());
}

void Init(void)
{
    Module().Init();
}

void Cleanup(void)
{
    Module().Cleanup();
}

std::uint32_t GetVersionNumber(void)
{
    return serverlibs::kModuleVersion;
}

std::int32_t InitESK(void)
{
    return kInitEskResult;
}

std::int32_t InitESK2(void)
{
    return kInitEskResult;
}

std::int32_t InitESKWithAdaptor(void)
{
    return kInitEskResult;
}

std::int32_t InitESKWithAdaptor2(void)
{
    return kInitEskResult;
}

void ExportLocalSorvik(void) {}

void ExportLocalFederation(void) {}

void ExportLocalSorvikFromASAMDlg(void *, void *, void *, void *, cv::krn::WString text)
{
    // The storage goes now; the caller still destroys the (then empty) argument.
    const cv::krn::WString released(std::move(text));
}

HRESULT DllCanUnloadNow(void)
{
    return CanUnloadNow();
}

HRESULT DllGetClassObject(REFCLSID, REFIID, void **object)
{
    if (object)
        *object = nullptr;
    return CLASS_E_CLASSNOTAVAILABLE;
}

const void *sorvikGetHostResource(const char *name, std::uint32_t *size)
{
    if (size)
        *size = 0;
    if (!name)
        return nullptr;
    // Kept for the module's life: the host holds on to the pointer.
    static std::mutex lock;
    static std::map<QString, QByteArray> loaded;
    const std::lock_guard<std::mutex> guard(lock);
    const QString key = QString::fromUtf8(name);
    auto found = loaded.find(key);
    if (found == loaded.end()) {
        QByteArray bytes = resources::HostResource(key);
        if (bytes.isEmpty())
            return nullptr;
        found = loaded.emplace(key, std::move(bytes)).first;
    }
    if (size)
        *size = std::uint32_t(found->second.size());
    return found->second.constData();
}

std::int32_t sorvikRenderDialogs(const char16_t *folder, const LOGFONTW *font)
{
    if (!folder || !TheApp().EnsureApplication())
        return -1;
    const QStringList written = RenderDialogGallery(QString::fromUtf16(folder), font);
    return written.isEmpty() ? -1 : std::int32_t(written.size());
}

} // extern "C"
