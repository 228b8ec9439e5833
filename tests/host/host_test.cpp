// A host that knows the module only through the public headers and dlopen.

#include "sorvik/serverdialogsexports.h"
#include "sorvik/serverdialogsextras.h"
#include "sorvik/vekexception.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <string>

namespace {

bool IsLoaded(const char *file)
{
    void *handle = ::dlopen((std::string(REFERENCE_LIB_DIR "/") + file).c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (handle)
        ::dlclose(handle);
    return handle != nullptr;
}

class Host : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { s_module = ::dlopen(SERVERDIALOGS_PATH, RTLD_NOW | RTLD_LOCAL); }
    static void TearDownTestSuite() { ::dlclose(s_module); }
    void SetUp() override { ASSERT_NE(s_module, nullptr) << ::dlerror(); }

    template <typename Function>
    static Function Export(const char *name)
    {
        const auto function = reinterpret_cast<Function>(::dlsym(s_module, name));
        EXPECT_NE(function, nullptr) << name;
        return function;
    }
    static IServerDialogs *Create(const char16_t *connection, std::int32_t *status)
    {
        return Export<PFN_sorvikCreateServerDialogs>("sorvikCreateServerDialogs")(connection, 0, status);
    }
    static void Init() { Export<PFN_ServerDialogsInit>("Init")(); }
    static void Cleanup() { Export<PFN_ServerDialogsCleanup>("Cleanup")(); }

    testsupport::TempDir m_store;
    testsupport::ScopedEnv m_storeEnv{"CORVANE_SORVIK_STORE", m_store.path().string()};
    static inline void *s_module = nullptr;
};

TEST_F(Host, FixedExportsAnswerWhateverTheState)
{
    for (int started = 0; started < 2; ++started, Init()) {
        EXPECT_EQ(Export<PFN_GetVersionNumber>("GetVersionNumber")(), 75504568u);
        for (const char *name : {"InitESK", "InitESK2", "InitESKWithAdaptor", "InitESKWithAdaptor2"})
            EXPECT_EQ(Export<PFN_InitESK>(name)(), 2) << name;
    }
    Cleanup();
    Cleanup();
    Export<PFN_ExportLocalSorvik>("ExportLocalSorvik")();
    Export<PFN_ExportLocalSorvik>("ExportLocalFederation")();
    Export<PFN_ExportLocalSorvikFromASAMDlg>("ExportLocalSorvikFromASAMDlg")(
        nullptr, nullptr, nullptr, nullptr, cv::krn::WString(u"a text with storage of its own"));
    void *object = &object;
    EXPECT_EQ(Export<PFN_DllGetClassObject>("DllGetClassObject")(IID_IServerDialogs, IID_IClassFactory, &object),
              CLASS_E_CLASSNOTAVAILABLE);
    EXPECT_EQ(object, nullptr);
}

TEST_F(Host, CreationAndTheServiceInterface)
{
    EXPECT_EQ(Create(u"", nullptr), nullptr);
    std::int32_t status = -3;
    EXPECT_EQ(Create(u"", &status), nullptr);
    EXPECT_EQ(status, -3) << "a negative status stays untouched";
    status = 0;
    EXPECT_EQ(Create(nullptr, &status), nullptr);
    EXPECT_EQ(status, -1007);

    const auto canUnload = Export<PFN_DllCanUnloadNow>("DllCanUnloadNow");
    EXPECT_EQ(canUnload(), S_OK);
    status = 0;
    IServerDialogs *service = Create(u"", &status);
    ASSERT_NE(service, nullptr);
    EXPECT_EQ(status, 0);
    EXPECT_EQ(canUnload(), S_FALSE) << "a service object is alive";

    void *object = &object;
    EXPECT_EQ(service->QueryInterface(IID_IUnknown, &object), E_NOINTERFACE);
    EXPECT_EQ(object, nullptr);
    ASSERT_EQ(service->QueryInterface(IID_IServerDialogs, &object), S_OK);
    EXPECT_EQ(object, service);
    EXPECT_EQ(service->Release(), 1u) << "QueryInterface took a reference";
    EXPECT_EQ(service->GetInterfaceRevision(), 2);
    EXPECT_EQ(service->Release(), 0u);
    EXPECT_EQ(canUnload(), S_OK);
}

TEST_F(Host, InitAndCleanupBalanceTheLibraryLoads)
{
    ASSERT_FALSE(IsLoaded("libvekex.so") || IsLoaded("librovoApi.so"));
    Init();
    Init();
    Cleanup();
    EXPECT_TRUE(IsLoaded("libvekex.so") && IsLoaded("librovoApi.so")) << "one Init is still open";
    Cleanup();
    EXPECT_FALSE(IsLoaded("libvekex.so"));
    EXPECT_FALSE(IsLoaded("librovoApi.so"));

    Cleanup(); // unmatched: must not make the next Init look like a later one
    Init();
    EXPECT_TRUE(IsLoaded("librovoApi.so"));
    Cleanup();
    EXPECT_FALSE(IsLoaded("librovoApi.so"));
}

TEST_F(Host, ModuleExceptionsArriveAsTheSharedExceptionType)
{
    std::int32_t status = 0;
    IServerDialogs *local = Create(u"", &status);
    IServerDialogs *broken = Create(u"<Name>unclosed", &status);
    cv::krn::WString path(u"/data");
    try {
        local->RemoveSearchArea(path);
        ADD_FAILURE() << "no exception";
    } catch (const cv::vek::Exception &e) {
        EXPECT_EQ(e.Code(), -1006) << "without Init there is no data-store library";
    }
    Init();
    try {
        broken->EditSearchArea(path, 0);
        ADD_FAILURE() << "no exception";
    } catch (const cv::vek::Exception &e) {
        EXPECT_EQ(e.Code(), -21005) << "the library's status, unchanged";
    }
    Cleanup();
    broken->Release();
    local->Release();
}

TEST_F(Host, FilesCarriedForTheHost)
{
    const auto get = Export<PFN_sorvikGetHostResource>("sorvikGetHostResource");
    std::uint32_t size = 7;
    EXPECT_EQ(get("../secret.xml", &size), nullptr);
    EXPECT_EQ(size, 0u);
    for (const char *name : {"unitcatalogue.xml", "queryproxy-files.xml", "queryproxy-measurements.xml"}) {
        const auto *bytes = static_cast<const char *>(get(name, &size));
        ASSERT_NE(bytes, nullptr) << name;
        const std::string text(bytes, size);
        EXPECT_EQ(text.rfind("<?xml", 0), 0u) << name;
        EXPECT_EQ(get(name, nullptr), bytes) << "the same bytes for the module's life";
    }
    const auto *catalogue = static_cast<const char *>(get("unitcatalogue.xml", &size));
    const std::string units(catalogue, size);
    EXPECT_NE(units.find("<unit name=\"degC\" factor=\"1\" offset=\"273.15\"/>"), std::string::npos);
    EXPECT_NE(units.find("<unitset name=\"SI\">"), std::string::npos);
}

} // namespace
