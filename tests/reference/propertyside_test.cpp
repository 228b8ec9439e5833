// librovoApi's property side against a real Sorvik that has indexed
// generated files: the property model and its translator, the level
// property lists with their occurrences, the index status and the
// optimization editor.

#include "indexingfixture.h"

#include "sorvik/wstringqt.h"

#include <gtest/gtest.h>

#include <map>

namespace {

using namespace reftest;
namespace status = cv::rovo::status;

[[maybe_unused]] const bool g_registry = (InstallServerRegistry(), true);

class PropertySideTest : public IndexingTest
{
protected:
    // file level:    operator 3 (string), run 3 (integers and a number), recorded 1 (time)
    // group level:   rate 2 (integer), start 1 (time)
    // channel level: unit 5 (string), gain 2 (an integer and a number)
    void WriteProperties()
    {
        Write("a.csv", CsvText({"operator = Ada", "run = 12"}, {"time", "speed"}, {"unit,s,km/h", "gain,1,2.5"}, 1,
                               {"rate = 100"}));
        Write("b.csv", CsvText({"operator = Bob", "run = 12.5"}, {"time", "speed", "temp"}, {"unit,s,km/h,degC"}, 1,
                               {"rate = 50", "start = 2024-03-01T10:00:00Z"}));
        Write("c.asc", TextTableText({"operator: Cy", "run: 7", "recorded: 2024-03-02T08:00:00"}, {"x", "y"}));
    }

    RefPtr<cv::rovo::ILevelPropertyList> List(cv::rovo::IIndexManager *manager, const char16_t *level)
    {
        return RefPtr<cv::rovo::ILevelPropertyList>::Adopt(
            Ok([&](std::int32_t *status) { return manager->GetLevelProperties(WString(level), status); }));
    }

    // name -> occurrences, after a Fetch.
    static std::map<std::string, std::uint32_t> Occurrences(cv::rovo::ILevelPropertyList *list)
    {
        OkVoid([&](std::int32_t *status) { list->Fetch(status); });
        std::map<std::string, std::uint32_t> occurrences;
        const std::uint32_t count = Ok([&](std::int32_t *status) { return list->GetCount(status); });
        for (std::uint32_t i = 0; i < count; ++i) {
            WString name;
            std::uint32_t times = 0;
            OkVoid([&](std::int32_t *status) { list->GetProperty(i, &name, &times, status); });
            occurrences[Utf8(name)] = times;
        }
        return occurrences;
    }

    static std::uint32_t State(cv::rovo::IIndexStatus *index, const char16_t *level, const char16_t *name)
    {
        std::uint32_t state = 0;
        OkVoid([&](std::int32_t *status) { index->GetOptimizationState(WString(level), WString(name), &state, status); });
        return state;
    }

    // name -> state, as ListOptimizedProperties hands them over.
    static std::map<std::string, std::int16_t> Optimized(cv::rovo::IIndexStatus *index, const char16_t *level)
    {
        auto states = Container({});
        auto names = RefPtr<cv::vekex::IStringList>::Adopt(
            Ok([&](std::int32_t *status) { return index->ListOptimizedProperties(WString(level), states.get(), status); }));
        std::map<std::string, std::int16_t> optimized;
        EXPECT_EQ(names->GetCount(), states->GetValueCount());
        for (std::uint32_t i = 0; i < names->GetCount() && i < states->GetValueCount(); ++i)
            optimized[Utf8(names->GetElements()[i])] = states->GetValues()[i];
        return optimized;
    }

    static cv::rovo::PropertyRecord Record(const char16_t *name)
    {
        return cv::rovo::PropertyRecord{WString(name), 0, cv::rovo::kNotOptimized, cv::rovo::kNotOptimized, 0};
    }
};

TEST_F(PropertySideTest, OccurrencesAreExactForTheGeneratedFiles)
{
    WriteProperties();
    IndexData();
    auto server = StartIndexing();
    auto manager = Manager();
    using Map = std::map<std::string, std::uint32_t>;
    EXPECT_EQ(Occurrences(List(manager.get(), u"sorvik_root").get()), (Map{{"operator", 3}, {"recorded", 1}, {"run", 3}}));
    EXPECT_EQ(Occurrences(List(manager.get(), u"qdm_channelgroup").get()), (Map{{"rate", 2}, {"start", 1}}));
    EXPECT_EQ(Occurrences(List(manager.get(), u"QDM_Channel").get()), (Map{{"gain", 2}, {"unit", 5}}))
        << "level keys ignore case";

    auto list = List(manager.get(), u"qdm_channel");
    WString name;
    std::uint32_t times = 0;
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { list->GetProperty(0, &name, &times, status); }),
              status::InvalidArgument)
        << "nothing before a Fetch";
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { manager->GetLevelProperties(WString(u"file"), status); }),
              status::NotFound)
        << "\"file\" names the level in the property model, its key is sorvik_root";
}

TEST_F(PropertySideTest, TheOccurrenceCountRunsInTheServerAndCountsFromTheIndex)
{
    WriteProperties();
    IndexData();
    auto server = StartIndexing();
    // What the summary says, spoilt: the count sets it right from the elements.
    Sql("UPDATE level_properties SET occurrences = 99 WHERE name = 'unit'");
    auto list = List(Manager().get(), u"qdm_channel");
    EXPECT_EQ(Occurrences(list.get())["unit"], 99u);

    OkVoid([&](std::int32_t *status) { list->StartOccurrenceCount(status); });
    ASSERT_TRUE(WaitFor([&] { return !Ok([&](std::int32_t *status) { return list->IsCountingOccurrences(status); }); }));
    EXPECT_EQ(Occurrences(list.get())["unit"], 5u);
    EXPECT_EQ(Occurrences(List(Manager().get(), u"sorvik_root").get())["run"], 3u);
}

TEST_F(PropertySideTest, OptimizingThenCommittingShowsTheDataTypesOnceTheServerHasTakenItUp)
{
    WriteProperties();
    IndexData();
    auto server = StartIndexing();
    auto manager = Manager();
    auto index = RefPtr<cv::rovo::IIndexStatus>::Adopt(Ok([&](std::int32_t *status) { return manager->GetIndexStatus(status); }));
    auto editor = RefPtr<cv::rovo::IOptimizationEditor>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetOptimizationEditor(status); }));
    EXPECT_EQ(State(index.get(), u"sorvik_root", u"run"), cv::rovo::kNotOptimized);

    const std::pair<const char16_t *, std::vector<const char16_t *>> levels[] = {
        {u"sorvik_root", {u"operator", u"run", u"recorded"}},
        {u"qdm_channelgroup", {u"rate", u"start"}},
        {u"qdm_channel", {u"unit", u"gain"}},
    };
    for (const auto &[level, names] : levels) {
        for (const char16_t *name : names) {
            const cv::rovo::PropertyRecord record = Record(name);
            OkVoid([&](std::int32_t *status) { editor->OptimizeProperty(WString(level), &record, 0, status); });
        }
    }
    const cv::rovo::PropertyRecord gain = Record(u"gain");
    OkVoid([&](std::int32_t *status) { editor->UnoptimizeProperty(WString(u"qdm_channel"), &gain, status); });
    EXPECT_EQ(State(index.get(), u"sorvik_root", u"run"), cv::rovo::kNotOptimized) << "nothing before the commit";
    OkVoid([&](std::int32_t *status) { editor->Commit(status); });
    ASSERT_EQ(StatusOf([&](std::int32_t *status) { manager->WaitForUpdate(status); }), 0);

    EXPECT_EQ(State(index.get(), u"sorvik_root", u"operator"), 23u);
    EXPECT_EQ(State(index.get(), u"sorvik_root", u"run"), 10u);
    EXPECT_EQ(State(index.get(), u"sorvik_root", u"recorded"), 30u);
    EXPECT_EQ(State(index.get(), u"qdm_channelgroup", u"rate"), 3u);
    EXPECT_EQ(State(index.get(), u"qdm_channelgroup", u"start"), 30u);
    EXPECT_EQ(State(index.get(), u"qdm_channel", u"unit"), 23u);
    EXPECT_EQ(State(index.get(), u"qdm_channel", u"gain"), cv::rovo::kNotOptimized) << "the last change counts";
    using States = std::map<std::string, std::int16_t>;
    EXPECT_EQ(Optimized(index.get(), u"sorvik_root"), (States{{"operator", 23}, {"recorded", 30}, {"run", 10}}));
    EXPECT_EQ(Optimized(index.get(), u"qdm_channel"), (States{{"unit", 23}}));

    const cv::rovo::PropertyRecord unit = Record(u"unit");
    OkVoid([&](std::int32_t *status) { editor->UnoptimizeProperty(WString(u"qdm_channel"), &unit, status); });
    OkVoid([&](std::int32_t *status) { editor->Commit(status); });
    ASSERT_EQ(StatusOf([&](std::int32_t *status) { manager->WaitForUpdate(status); }), 0);
    EXPECT_TRUE(Optimized(index.get(), u"qdm_channel").empty());

    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->OptimizeProperty(WString(u"qdm_channel"), &unit, 7, status); }),
              status::InvalidArgument);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->OptimizeProperty(WString(u"channel"), &unit, 0, status); }),
              status::NotFound);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->OptimizeProperty(WString(u"qdm_channel"), nullptr, 0, status); }),
              status::InvalidArgument);
}

TEST_F(PropertySideTest, APropertyWhoseFilesWereDeletedStaysOptimizedWithNoOccurrences)
{
    WriteProperties();
    IndexData();
    auto server = StartIndexing();
    auto manager = Manager();
    auto editor = RefPtr<cv::rovo::IOptimizationEditor>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetOptimizationEditor(status); }));
    const cv::rovo::PropertyRecord recorded = Record(u"recorded");
    OkVoid([&](std::int32_t *status) { editor->OptimizeProperty(WString(u"sorvik_root"), &recorded, 0, status); });
    OkVoid([&](std::int32_t *status) { editor->Commit(status); });
    ASSERT_EQ(StatusOf([&](std::int32_t *status) { manager->WaitForUpdate(status); }), 0);

    std::filesystem::remove(Data("c.asc"));
    Configure([](cv::rovo::IConfigurationEditor *configuration) {
        OkVoid([&](std::int32_t *status) { configuration->StartIndexingNow(0, status); });
    });
    WaitUntilIndexed();

    const auto occurrences = Occurrences(List(manager.get(), u"sorvik_root").get());
    EXPECT_EQ(occurrences.count("recorded"), 0u);
    EXPECT_EQ(occurrences.at("run"), 2u);
    auto index = RefPtr<cv::rovo::IIndexStatus>::Adopt(Ok([&](std::int32_t *status) { return manager->GetIndexStatus(status); }));
    EXPECT_EQ((Optimized(index.get(), u"sorvik_root")), (std::map<std::string, std::int16_t>{{"recorded", 30}}));
}

TEST_F(PropertySideTest, AnOptimizedPropertyThatIsNotYetIndexedGetsItsTypeWhenItIs)
{
    IndexData();
    auto server = StartIndexing();
    auto manager = Manager();
    auto editor = RefPtr<cv::rovo::IOptimizationEditor>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetOptimizationEditor(status); }));
    const cv::rovo::PropertyRecord rate = Record(u"rate");
    OkVoid([&](std::int32_t *status) { editor->OptimizeProperty(WString(u"qdm_channelgroup"), &rate, 0, status); });
    OkVoid([&](std::int32_t *status) { editor->Commit(status); });
    WaitUntilIndexed();
    auto index = RefPtr<cv::rovo::IIndexStatus>::Adopt(Ok([&](std::int32_t *status) { return manager->GetIndexStatus(status); }));
    EXPECT_EQ(State(index.get(), u"qdm_channelgroup", u"rate"), cv::rovo::kOptimizedDefault);

    WriteProperties();
    Configure([](cv::rovo::IConfigurationEditor *configuration) {
        OkVoid([&](std::int32_t *status) { configuration->StartIndexingNow(0, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(State(index.get(), u"qdm_channelgroup", u"rate"), 3u);
}

TEST_F(PropertySideTest, TheModelNamesItsLevelsAndTheStatusTellsTheProgress)
{
    IndexData();
    auto server = StartIndexing();
    auto manager = Manager();
    auto context = RefPtr<cv::rovo::IServerContext>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetServerContext(status); }));
    WString port;
    OkVoid([&](std::int32_t *status) { context->GetPortName(&port, status); });
    EXPECT_EQ(Utf8(port), "P");
    EXPECT_TRUE(Ok([&](std::int32_t *status) { return manager->GetServerFlag(status); }));

    auto model = RefPtr<cv::rovo::IPropertyModel>::Adopt(Ok([&](std::int32_t *status) { return context->GetPropertyModel(status); }));
    auto english = RefPtr<cv::rovo::ITranslator>::Adopt(
        Ok([&](std::int32_t *status) { return model->GetTranslator(WString(u"eng"), status); }));
    const std::pair<const char16_t *, const char *> names[] = {
        {u"file", "File"}, {u"qdm_channelgroup", "Channel Group"}, {u"qdm_channel", "Channel"}};
    for (const auto &[name, display] : names) {
        auto level = RefPtr<cv::rovo::ILevelDescription>::Adopt(
            Ok([&](std::int32_t *status) { return model->GetLevel(WString(name), status); }));
        ASSERT_TRUE(level);
        EXPECT_EQ(Utf8(Ok([&](std::int32_t *status) { return english->GetDisplayName(level.get(), status); })), display);
    }
    EXPECT_FALSE(Ok([&](std::int32_t *status) { return model->GetLevel(WString(u"sorvik_root"), status); }))
        << "levels are described by name, not by key";
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { model->GetTranslator(WString(u"tlh"), status); }), status::NotFound);

    auto index = RefPtr<cv::rovo::IIndexStatus>::Adopt(Ok([&](std::int32_t *status) { return manager->GetIndexStatus(status); }));
    std::uint32_t done = 7, total = 9;
    cv::rovo::ProgressTime time{{0, 0, 0, 0x80000000}};
    OkVoid([&](std::int32_t *status) { index->GetIndexingProgress(&done, &total, &time, status); });
    EXPECT_EQ(done, total);
    const std::uint64_t ms = std::uint64_t(time.words[1]) << 32 | time.words[0];
    EXPECT_GT(ms, 1600000000000ull) << "the time of the last progress";
    EXPECT_EQ(time.words[3], 0u);
}

} // namespace
