// Commits one change from a process of its own, as another client of the
// same Sorvik would: rovo_commit_tool CONNECTION IDLE-SECONDS sets the idle
// time and commits; exit code 0 on success.

#include "tests/reference/referencelibs.h"

#include <cstdio>
#include <cstdlib>

using namespace reftest;

int main(int argc, char **argv)
{
    if (argc != 3) {
        std::fprintf(stderr, "usage: rovo_commit_tool CONNECTION IDLE-SECONDS\n");
        return 2;
    }
    VekexLibrary().init();
    RovoLibrary().init();
    std::int32_t status = 0;
    {
        auto dataStore = DataStoreEnvironment();
        auto environment = RefPtr<cv::rovo::IRovoEnvironment>::Adopt(
            RovoLibrary().createEnvironment(dataStore.get(), &status));
        auto sorvik = RefPtr<cv::rovo::ISorvik>::Adopt(
            status ? nullptr : environment->OpenSorvik(WString(U16(argv[1])), &status));
        auto editor = RefPtr<cv::rovo::IConfigurationEditor>::Adopt(
            status ? nullptr : sorvik->GetConfigurationEditor(&status));
        if (!status)
            editor->SetIdleTime(std::uint32_t(std::atoi(argv[2])), &status);
        if (!status)
            editor->CommitConfiguration(&status);
    }
    RovoLibrary().cleanup();
    VekexLibrary().cleanup();
    if (status != 0)
        std::fprintf(stderr, "rovo_commit_tool: failed with %d\n", status);
    return status == 0 ? 0 : 1;
}
