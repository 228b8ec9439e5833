// Indexing 10,000 small CSV files (walk, read, parse, record in the index)
// beside the baseline of walking the same folders and reading every file
// whole without parsing it. Both run over files the page cache holds.

#include "reference/server/indexpass.h"
#include "reference/server/indexplan.h"
#include "reference/server/indexrecords.h"
#include "reference/server/indexstatus.h"
#include "support/tempdir.h"

#include <benchmark/benchmark.h>

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <fstream>
#include <memory>
#include <vector>

namespace {

constexpr int kFolders = 100;
constexpr int kFilesPerFolder = 100;
constexpr int kFiles = kFolders * kFilesPerFolder;

// 10,000 files of about 250 bytes: two file properties, a group property,
// three channels with units, five rows.
struct Sample
{
    Sample()
    {
        for (int folder = 0; folder < kFolders; ++folder) {
            const auto path = dir.path() / "data" / ("f" + std::to_string(folder));
            std::filesystem::create_directories(path);
            for (int file = 0; file < kFilesPerFolder; ++file) {
                std::ofstream out(path / ("run" + std::to_string(file) + ".csv"));
                out << "# operator = Ada\n# run = " << folder * kFilesPerFolder + file << "\n## rate = 100\n"
                    << "time,speed,temp\n#unit,s,km/h,degC\n";
                for (int row = 0; row < 5; ++row)
                    out << row << "," << 12.5 + row << "," << 20 + row << "\n";
            }
        }
    }

    testsupport::TempDir dir;
};

Sample &TheSample()
{
    static Sample sample;
    return sample;
}

// The baseline: the same walk, and every file read whole.
std::size_t ReadWhole(const std::string &folder, std::vector<char> &buffer)
{
    std::size_t files = 0;
    DIR *dir = ::opendir(folder.c_str());
    while (dirent *entry = ::readdir(dir)) {
        const std::string name = entry->d_name;
        if (name == "." || name == "..")
            continue;
        const std::string path = folder + "/" + name;
        if (entry->d_type == DT_DIR) {
            files += ReadWhole(path, buffer);
            continue;
        }
        const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
        while (::read(fd, buffer.data(), buffer.size()) > 0) {
        }
        ::close(fd);
        ++files;
    }
    ::closedir(dir);
    return files;
}

void BM_ReadFilesWhole(benchmark::State &state)
{
    const std::string data = (TheSample().dir.path() / "data").string();
    std::vector<char> buffer(64 * 1024);
    for (auto _ : state) {
        if (ReadWhole(data, buffer) != kFiles)
            state.SkipWithError("files missing");
    }
    state.SetItemsProcessed(state.iterations() * kFiles);
}
BENCHMARK(BM_ReadFilesWhole)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_IndexFiles(benchmark::State &state)
{
    Sample &sample = TheSample();
    testsupport::TempDir indexFolder;
    sorvik::server::IndexStatus status(QString::fromStdString(indexFolder.path().string()));
    sorvik::server::IndexRecords records(status);
    sorvik::server::IndexPlan plan;
    plan.areas.push_back({(sample.dir.path() / "data").string(), {}});
    plan.parselets["csv"] = "CSV";
    sorvik::server::IndexProgress progress;
    for (auto _ : state) {
        state.PauseTiming();
        status.ResetIndex();
        state.ResumeTiming();
        const auto summary =
            sorvik::server::IndexPass(records, plan, std::chrono::seconds(60), {}, progress).Run();
        if (!summary.completed || summary.indexed != kFiles)
            state.SkipWithError("not every file was indexed");
    }
    state.SetItemsProcessed(state.iterations() * kFiles);
    state.counters["channels"] = double(status.ElementCount(32));
}
BENCHMARK(BM_IndexFiles)->Unit(benchmark::kMillisecond)->UseRealTime();

} // namespace

BENCHMARK_MAIN();
