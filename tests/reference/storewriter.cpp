// A process that changes or reads the local Sorvik's store through the
// reference libraries, so that a test can kill it or fill its disk at a
// chosen point and look at what is left.
//
//   rovo_store_writer commit GEN COUNT [kill|full N]
//       replaces the COUNT search areas of generation GEN-1 ("/gen/<g>/<i>")
//       by those of GEN, sets the idle time to GEN and commits, in one
//       commit; with a fault, SIGKILL or a full disk at the N-th operation
//       that changes a file. Prints "operations=<n>" and then "committed"
//       (exit 0) or "failed=<status>" (exit 1).
//   rovo_store_writer check COUNT
//       prints "generation=<g>" for a store holding one whole generation
//       (0: none yet) and exits 0; "torn ..." (exit 1) for a mix, or
//       "failed=<status>" (exit 2) when it does not open.
//   rovo_store_writer export FILE LIMIT
//       exports the committed configuration to FILE with files limited to
//       LIMIT bytes, as on a disk that is full; prints "exported" or
//       "failed=<status>".

#include "faultyvfs.h"
#include "tests/reference/referencelibs.h"

#include <sys/resource.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <set>
#include <string>

using namespace reftest;

namespace {

struct Sorvik
{
    RefPtr<cv::vekex::IEnvironment> dataStore;
    RefPtr<cv::rovo::IRovoEnvironment> environment;
    RefPtr<cv::rovo::ISorvik> sorvik;
    std::int32_t status = 0;

    Sorvik()
    {
        VekexLibrary().init();
        RovoLibrary().init();
        dataStore = RefPtr<cv::vekex::IEnvironment>::Adopt(
            VekexLibrary().getEnvironment(cv::vekex::kEnvironmentDesktop, WString(), 75504568u, &status));
        if (status == 0)
            environment = RefPtr<cv::rovo::IRovoEnvironment>::Adopt(
                RovoLibrary().createEnvironment(dataStore.get(), &status));
        if (status == 0)
            sorvik = RefPtr<cv::rovo::ISorvik>::Adopt(environment->OpenSorvik(WString(), &status));
    }
    ~Sorvik()
    {
        sorvik.Reset();
        environment.Reset();
        dataStore.Reset();
        RovoLibrary().cleanup();
        VekexLibrary().cleanup();
    }
};

std::u16string AreaPath(long generation, long index)
{
    return U16("/gen/" + std::to_string(generation) + "/" + std::to_string(index));
}

int Fail(std::int32_t status)
{
    std::printf("failed=%d\n", status);
    return status == 0 ? 0 : 1;
}

int Commit(long generation, long count)
{
    Sorvik sorvik;
    if (sorvik.status != 0)
        return Fail(sorvik.status);
    std::int32_t status = 0;
    auto editor = RefPtr<cv::rovo::IConfigurationEditor>::Adopt(sorvik.sorvik->GetConfigurationEditor(&status));
    for (long i = 0; status == 0 && generation > 1 && i < count; ++i)
        editor->RemoveFolder(WString(AreaPath(generation - 1, i)), 1, &status);
    for (long i = 0; status == 0 && i < count; ++i) {
        const std::u16string alias = U16("g" + std::to_string(generation) + "-" + std::to_string(i));
        WString result;
        editor->AddFolder(&result, WString(AreaPath(generation, i)), WString(AreaPath(generation, i)),
                          WString(alias), 1, 0, WString(), &status);
    }
    if (status == 0)
        editor->SetIdleTime(std::uint32_t(generation), &status);
    if (status != 0)
        return Fail(status);
    std::printf("operations=%ld\n", FileChangingOperations());
    std::fflush(stdout);
    editor->CommitConfiguration(&status);
    std::printf("operations=%ld\n", FileChangingOperations());
    if (status != 0)
        return Fail(status);
    std::printf("committed\n");
    return 0;
}

int Check(long count)
{
    Sorvik sorvik;
    std::int32_t status = sorvik.status;
    RefPtr<cv::rovo::IConfigurationView> view;
    if (status == 0)
        view = RefPtr<cv::rovo::IConfigurationView>::Adopt(sorvik.sorvik->GetConfigurationView(&status));
    RefPtr<cv::vekex::IStringList> areas;
    if (status == 0)
        areas = RefPtr<cv::vekex::IStringList>::Adopt(view->ListSearchAreas(&status));
    const std::uint32_t idle = status == 0 ? view->GetIdleTime(&status) : 0;
    if (status != 0) {
        std::printf("failed=%d\n", status);
        return 2;
    }
    std::set<std::string> generations;
    for (std::uint32_t i = 0; i < areas->GetCount(); ++i) {
        const std::string path = Utf8(areas->GetElements()[i]);
        generations.insert(path.substr(5, path.find('/', 5) - 5));
    }
    const std::string generation = generations.empty() ? "0" : *generations.begin();
    const bool whole = generations.empty() ? idle == 60
                                           : generations.size() == 1 && areas->GetCount() == std::uint32_t(count) &&
                                                 std::to_string(idle) == generation;
    if (!whole) {
        std::printf("torn areas=%u generations=%zu idle=%u\n", areas->GetCount(), generations.size(), idle);
        return 1;
    }
    std::printf("generation=%s\n", generation.c_str());
    return 0;
}

int Export(const char *file, long limit)
{
    Sorvik sorvik;
    std::int32_t status = sorvik.status;
    RefPtr<cv::rovo::IConfigurationView> view;
    if (status == 0)
        view = RefPtr<cv::rovo::IConfigurationView>::Adopt(sorvik.sorvik->GetConfigurationView(&status));
    if (status != 0)
        return Fail(status);
    // A write past the limit fails with EFBIG instead of raising SIGXFSZ.
    std::signal(SIGXFSZ, SIG_IGN);
    rlimit unlimited{};
    getrlimit(RLIMIT_FSIZE, &unlimited);
    const rlimit size{rlim_t(limit), unlimited.rlim_max};
    setrlimit(RLIMIT_FSIZE, &size);
    view->ExportConfiguration(WString(U16(file)), nullptr, &status);
    // The disk has room again for whatever the process still writes.
    setrlimit(RLIMIT_FSIZE, &unlimited);
    if (status != 0)
        return Fail(status);
    std::printf("exported\n");
    return 0;
}

} // namespace

int main(int argc, char **argv)
{
    const std::string mode = argc > 1 ? argv[1] : "";
    if (mode == "commit" && (argc == 4 || argc == 6)) {
        if (argc == 6)
            InstallFaultyFileSystem(std::strcmp(argv[4], "kill") == 0 ? Fault::Kill : Fault::DiskFull,
                                    std::stol(argv[5]));
        else
            InstallFaultyFileSystem(Fault::None, 0);
        return Commit(std::stol(argv[2]), std::stol(argv[3]));
    }
    if (mode == "check" && argc == 3)
        return Check(std::stol(argv[2]));
    if (mode == "export" && argc == 4) {
        // Straight out: the leak checker's own tracer has been seen to crash
        // after a write was refused for size, which would hide the result.
        const int result = Export(argv[2], std::stol(argv[3]));
        std::fflush(stdout);
        std::_Exit(result);
    }
    std::fprintf(stderr, "usage: rovo_store_writer commit GEN COUNT [kill|full N] | check COUNT | export FILE LIMIT\n");
    return 2;
}
