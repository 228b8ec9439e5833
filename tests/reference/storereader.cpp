// A second process that reads the local Sorvik's search areas over and over
// while the test commits, and reports whether it ever saw a half-applied
// commit. Every commit of the test replaces all areas by those of one
// generation ("/gen/<k>/<i>", a fixed count), so a consistent read holds
// either no areas or exactly that count, all of one generation.
//
// stdout: "ready" after the first read, "seen <generation>" whenever a read
// shows another generation than the read before it ("none" for no areas),
// and at the end "reads=<n> generations=<g> torn=<t>". It stops when stdin
// closes.

#include "tests/reference/referencelibs.h"

#include <poll.h>
#include <unistd.h>

#include <cstdio>
#include <set>
#include <string>

using namespace reftest;

int main(int argc, char **argv)
{
    const std::uint32_t perGeneration = argc > 1 ? std::uint32_t(std::stoul(argv[1])) : 0;
    VekexLibrary().init();
    RovoLibrary().init();
    std::int32_t status = 0;
    auto dataStore = RefPtr<cv::vekex::IEnvironment>::Adopt(
        VekexLibrary().getEnvironment(cv::vekex::kEnvironmentDesktop, WString(), 75504568u, &status));
    auto environment = RefPtr<cv::rovo::IRovoEnvironment>::Adopt(RovoLibrary().createEnvironment(dataStore.get(), &status));
    auto sorvik = RefPtr<cv::rovo::ISorvik>::Adopt(environment->OpenSorvik(WString(), &status));
    auto view = RefPtr<cv::rovo::IConfigurationView>::Adopt(sorvik->GetConfigurationView(&status));
    if (status != 0) {
        std::printf("failed=%d\n", status);
        return 2;
    }

    long reads = 0, torn = 0;
    std::set<std::string> generations;
    std::string last;
    for (bool first = true;; first = false) {
        auto areas = RefPtr<cv::vekex::IStringList>::Adopt(view->ListSearchAreas(&status));
        if (status != 0 || !areas) {
            std::printf("failed=%d\n", status);
            return 2;
        }
        std::set<std::string> seen;
        for (std::uint32_t i = 0; i < areas->GetCount(); ++i) {
            const std::string path = Utf8(areas->GetElements()[i]);
            seen.insert(path.substr(0, path.find('/', 5)));
        }
        ++reads;
        if (areas->GetCount() != 0 && (areas->GetCount() != perGeneration || seen.size() != 1))
            ++torn;
        const std::string generation = seen.empty() ? std::string("none") : *seen.begin();
        generations.insert(generation);
        if (first)
            std::printf("ready\n");
        if (generation != last)
            std::printf("seen %s\n", generation.c_str());
        std::fflush(stdout);
        last = generation;
        pollfd input{STDIN_FILENO, POLLIN, 0};
        if (poll(&input, 1, 0) > 0) {
            char byte;
            if (read(STDIN_FILENO, &byte, 1) <= 0)
                break;
        }
    }
    std::printf("reads=%ld generations=%zu torn=%ld\n", reads, generations.size(), torn);
    view.Reset();
    sorvik.Reset();
    environment.Reset();
    dataStore.Reset();
    RovoLibrary().cleanup();
    VekexLibrary().cleanup();
    return torn == 0 ? 0 : 1;
}
