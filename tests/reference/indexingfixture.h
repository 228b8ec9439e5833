#pragma once

// Real Sorvik processes indexing folders a test generates, reached through
// librovoApi (configuration, index manager) and the protocol client
// (statistics).

#include "serverfixture.h"
#include "tests/reference/referencelibs.h"

#include <chrono>
#include <cstdint>
#include <filesystem>
#include <functional>
#include <string>

namespace reftest {

// What the server's manager channel says of its indexer.
struct IndexerProgress
{
    std::int64_t done = -1;
    std::int64_t total = -1;
    std::int64_t passes = -1;
    bool running = false;
    bool pending = false;
};

struct ElementCounts
{
    std::uint32_t files = 0;
    std::uint32_t groups = 0;
    std::uint32_t channels = 0;

    bool operator==(const ElementCounts &) const = default;
};

std::ostream &operator<<(std::ostream &out, const ElementCounts &counts);

class IndexingTest : public ServerTest
{
protected:
    static constexpr const char *kPort = "P";

    IndexingTest();
    ~IndexingTest() override;

    // The Sorvik served by the instance P.
    RefPtr<cv::rovo::ISorvik> Sorvik();
    // Commits what edit records.
    void Configure(const std::function<void(cv::rovo::IConfigurationEditor *)> &edit);
    // A search area over data/ (or a folder below it), indexed without idle time.
    void IndexData(const std::string &below = {});

    // Starts the instance and waits until its first indexing has ended.
    std::unique_ptr<testsupport::SorvikProcess> StartIndexing(std::vector<std::string> extra = {});
    RefPtr<cv::rovo::IIndexManager> Manager();
    // Waits until the server has taken up every commit and no indexing runs
    // or waits.
    void WaitUntilIndexed();

    IndexerProgress Progress() const;
    ElementCounts Counts() const;
    std::uint32_t Timeouts() const;
    std::int64_t Failures() const;
    std::int64_t StatusValue(const std::string &sql) const;

    // A file below data/, with its folders.
    std::filesystem::path Write(const std::string &relative, const std::string &content) const;
    std::filesystem::path Data(const std::string &relative = {}) const;

    template <typename Condition>
    static bool WaitFor(Condition condition, std::chrono::milliseconds within = std::chrono::seconds(30))
    {
        const auto deadline = std::chrono::steady_clock::now() + within;
        while (!condition()) {
            if (std::chrono::steady_clock::now() >= deadline)
                return false;
            Pause();
        }
        return true;
    }

    RefPtr<cv::rovo::IRovoEnvironment> m_environment;

private:
    static void Pause();
};

// A CSV file with the given file properties, channels, one channel property
// line per entry of channelProperties ("unit,s,km/h" style) and rows rows.
std::string CsvText(const std::vector<std::string> &fileProperties, const std::vector<std::string> &channels,
                    const std::vector<std::string> &channelProperties = {}, int rows = 2,
                    const std::vector<std::string> &groupProperties = {});
// A TextTable file: header lines "key: value", channels, rows rows.
std::string TextTableText(const std::vector<std::string> &header, const std::vector<std::string> &channels, int rows = 2);

} // namespace reftest
