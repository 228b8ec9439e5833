// Our log beside spdlog doing the same: a line filtered out by its level, and
// a line written to a file.

#include "log/ilogimp.h"

#include <benchmark/benchmark.h>
#include <spdlog/sinks/basic_file_sink.h>
#include <spdlog/spdlog.h>

#include <filesystem>
#include <memory>
#include <string>

#include <unistd.h>

namespace {

using namespace cv::util::file::log;

class BenchDir
{
public:
    BenchDir()
        : m_path(std::filesystem::temp_directory_path() / ("sorvik-log-bench-" + std::to_string(::getpid())))
    {
        std::filesystem::create_directories(m_path);
    }
    ~BenchDir() { std::filesystem::remove_all(m_path); }
    std::filesystem::path File(const char *name) const { return m_path / name; }

private:
    std::filesystem::path m_path;
};

// Callers reach the log through its interface; keep the compiler from
// devirtualising the calls.
ILog *Opaque(ILog &log)
{
    ILog *pointer = &log;
    benchmark::DoNotOptimize(pointer);
    return pointer;
}

std::shared_ptr<spdlog::logger> SpdlogFileLogger(const std::filesystem::path &file)
{
    auto logger = std::make_shared<spdlog::logger>(
        "bench", std::make_shared<spdlog::sinks::basic_file_sink_mt>(file.string(), true));
    logger->set_pattern("%v");
    return logger;
}

void FilteredInfo_Ours(benchmark::State &state)
{
    BenchDir dir;
    ILogImp log(dir.File("ours.log").u16string(), 0x1);
    ILog *out = Opaque(log);
    int count = 0;
    for (auto _ : state)
        out->Info(__FILE__, __LINE__, 3) << "SKCP: connected " << ++count;
}
BENCHMARK(FilteredInfo_Ours);

void FilteredInfo_Spdlog(benchmark::State &state)
{
    BenchDir dir;
    auto logger = SpdlogFileLogger(dir.File("spdlog.log"));
    logger->set_level(spdlog::level::warn);
    int count = 0;
    for (auto _ : state)
        logger->info("SKCP: connected {}", ++count);
}
BENCHMARK(FilteredInfo_Spdlog);

void WrittenLine_Ours(benchmark::State &state)
{
    BenchDir dir;
    ILogImp log(dir.File("ours.log").u16string());
    ILog *out = Opaque(log);
    int count = 0;
    for (auto _ : state)
        out->Warning(nullptr, 0) << "SKCP: connected " << ++count;
}
BENCHMARK(WrittenLine_Ours);

// spdlog's file sink buffers in the C library and writes when its buffer is
// full; ours hands every line to the system at once.
void WrittenLine_Spdlog(benchmark::State &state)
{
    BenchDir dir;
    auto logger = SpdlogFileLogger(dir.File("spdlog.log"));
    int count = 0;
    for (auto _ : state)
        logger->warn("DSA: Warning: SKCP: connected {}", ++count);
}
BENCHMARK(WrittenLine_Spdlog);

// The same with the buffer flushed after each line, as ours behaves.
void WrittenLine_SpdlogFlushEachLine(benchmark::State &state)
{
    BenchDir dir;
    auto logger = SpdlogFileLogger(dir.File("spdlog.log"));
    logger->flush_on(spdlog::level::trace);
    int count = 0;
    for (auto _ : state)
        logger->warn("DSA: Warning: SKCP: connected {}", ++count);
}
BENCHMARK(WrittenLine_SpdlogFlushEachLine);

} // namespace

BENCHMARK_MAIN();
