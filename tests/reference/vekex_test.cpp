// The data-store library through its entry points: the shipped catalogue,
// the selections the Parselets and File Extensions pages make, containers,
// and the refusal of broken catalogues.

#include "tests/reference/referencelibs.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <fstream>
#include <vector>

namespace {

using namespace reftest;
using cv::vekex::IVekQuery;

class Vekex : public ::testing::Test
{
protected:
    void SetUp() override { VekexLibrary().init(); }
    void TearDown() override { VekexLibrary().cleanup(); }

    static RefPtr<cv::vekex::IConfiguration> Configuration()
    {
        auto environment = DataStoreEnvironment();
        return RefPtr<cv::vekex::IConfiguration>::Adopt(Ok([&](std::int32_t *status) {
            return environment->GetConfiguration(WString(u"cv.vek.config.datastore"), 0, status);
        }));
    }

    static RefPtr<IVekQuery> Query(IUnknown *object)
    {
        void *query = nullptr;
        EXPECT_EQ(object->QueryInterface(cv::vekex::IID_IVekQuery, &query), S_OK);
        return RefPtr<IVekQuery>::Adopt(static_cast<IVekQuery *>(query));
    }

    static std::string Text(IVekQuery *node, const char16_t *attribute)
    {
        return Utf8(Ok([&](std::int32_t *status) { return node->GetTextAttribute(WString(attribute), status); }));
    }

    static std::vector<std::string> Names(cv::vekex::IStringList *list)
    {
        std::vector<std::string> names;
        for (std::uint32_t i = 0; i < list->GetCount(); ++i)
            names.push_back(Utf8(list->GetElements()[i]));
        return names;
    }

    static std::string LastError()
    {
        WString text;
        VekexLibrary().lastError(&text);
        return Utf8(text);
    }
};

TEST_F(Vekex, TheShippedCatalogueDescribesADozenParselets)
{
    auto configuration = Configuration();
    auto manager = RefPtr<cv::vekex::IDataStoreManager>::Adopt(
        Ok([&](std::int32_t *status) { return configuration->GetDataStoreManager(status); }));
    auto catalogue = RefPtr<cv::vekex::IStoreTypeCatalogue>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetStoreTypes(status); }));
    auto all = RefPtr<cv::vekex::IStringList>::Adopt(
        Ok([&](std::int32_t *status) { return catalogue->ListStoreTypes(WString(), WString(), status); }));
    EXPECT_EQ(Names(all.get()),
              (std::vector<std::string>{"qdm", "qdms", "SQL", "CSV", "TextTable", "WaveAudio", "Spreadsheet", "HDF5",
                                        "BusLogger", "MatrixStore", "LegacyBinary", "IndexJournal"}));

    // Two Parselets read text files, one of them declaring the extension in capitals.
    auto txt = RefPtr<cv::vekex::IStringList>::Adopt(
        Ok([&](std::int32_t *status) { return catalogue->ListStoreTypes(WString(), WString(u"txt"), status); }));
    EXPECT_EQ(Names(txt.get()), (std::vector<std::string>{"CSV", "TextTable"}));

    auto textTable = RefPtr<cv::vekex::IStoreTypeDescription>::Adopt(
        Ok([&](std::int32_t *status) { return catalogue->GetStoreType(WString(u"texttable"), status); }));
    auto patterns = RefPtr<cv::vekex::IStringList>::Adopt(
        Ok([&](std::int32_t *status) { return textTable->GetFilePatterns(status); }));
    EXPECT_EQ(Names(patterns.get()), (std::vector<std::string>{"*.TXT", "*.asc", "*.prn"}));

    auto sql = RefPtr<cv::vekex::IStoreTypeDescription>::Adopt(
        Ok([&](std::int32_t *status) { return catalogue->GetStoreType(WString(u"SQL"), status); }));
    auto none = RefPtr<cv::vekex::IStringList>::Adopt(Ok([&](std::int32_t *status) { return sql->GetFilePatterns(status); }));
    EXPECT_EQ(none->GetCount(), 0u);
    EXPECT_EQ(none->GetElements(), nullptr);

    EXPECT_EQ(StatusOf([&](std::int32_t *status) { return catalogue->GetStoreType(WString(u"nope"), status); }),
              cv::vekex::status::NotFound);
}

TEST_F(Vekex, SelectionsAnswerWhatTheParseletPagesAsk)
{
    auto configuration = Configuration();
    auto root = Query(configuration.get());

    auto listed = RefPtr<cv::vekex::IInstList>::Adopt(Ok([&](std::int32_t *status) {
        return root->SelectElements(WString(u"/#data_store_manager.storetypes(system=0 importsupported=1)"), status);
    }));
    std::vector<std::string> names;
    for (std::uint32_t i = 0; i < listed->GetCount(); ++i) {
        auto element = RefPtr<IUnknown>::Adopt(Ok([&](std::int32_t *status) { return listed->GetAt(i, status); }));
        auto query = Query(element.get());
        names.push_back(Text(query.get(), u"name"));
        if (names.back() == "LegacyBinary") {
            EXPECT_EQ(Text(query.get(), u"model").find("QDM_1_"), std::string::npos);
        }
        if (names.back() == "TextTable") {
            auto filters = RefPtr<cv::vekex::IInstList>::Adopt(
                Ok([&](std::int32_t *status) { return query->SelectElements(WString(u"filefilters"), status); }));
            ASSERT_EQ(filters->GetCount(), 3u);
            auto last = RefPtr<IUnknown>::Adopt(Ok([&](std::int32_t *status) { return filters->GetAt(2, status); }));
            auto filter = Query(last.get());
            EXPECT_EQ(Text(filter.get(), u"extension"), "prn");
            EXPECT_EQ(Text(filter.get(), u"userdefined"), "1");
        }
    }
    // The system journal and the store without import support are left out.
    EXPECT_EQ(names, (std::vector<std::string>{"qdm", "qdms", "SQL", "CSV", "TextTable", "WaveAudio", "Spreadsheet",
                                               "HDF5", "BusLogger", "LegacyBinary"}));
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { return listed->GetAt(10, status); }), cv::vekex::status::OutOfRange);

    // The File Extensions page fetches icons by name.
    auto qdm = RefPtr<IUnknown>::Adopt(Ok([&](std::int32_t *status) {
        return root->SelectElement(WString(u"/#data_store_manager.storetypes(name='qdm')"), status);
    }));
    ASSERT_TRUE(qdm);
    auto icon = RefPtr<cv::vekex::IByteValue>::Adopt(
        Ok([&](std::int32_t *status) { return Query(qdm.get())->GetAttribute(WString(u"icon"), status); }));
    ASSERT_GT(icon->GetSize(), 8u);
    EXPECT_EQ(std::string(reinterpret_cast<const char *>(icon->GetData()) + 1, 3), "PNG");

    auto sql = RefPtr<IUnknown>::Adopt(Ok([&](std::int32_t *status) {
        return root->SelectElement(WString(u"/#data_store_manager.storetypes(name='SQL')"), status);
    }));
    auto noIcon = RefPtr<cv::vekex::IByteValue>::Adopt(
        Ok([&](std::int32_t *status) { return Query(sql.get())->GetAttribute(WString(u"icon"), status); }));
    EXPECT_EQ(noIcon->GetSize(), 0u);

    EXPECT_EQ(Ok([&](std::int32_t *status) {
                  return root->SelectElement(WString(u"/#data_store_manager.storetypes(name='absent')"), status);
              }),
              nullptr);
}

TEST_F(Vekex, BadSelectionPathsAndAttributesAreRefused)
{
    auto root = Query(Configuration().get());
    for (const char16_t *path : {u"/#data_store_manager.storetypes(name='qdm'", u"/#other.storetypes",
                                 u"/#data_store_manager.storetypes(colour=red)", u"filefilters",
                                 u"/#data_store_manager.storetypes(system=maybe)", u"/#data_store_manager.storetypes)"}) {
        EXPECT_EQ(StatusOf([&](std::int32_t *status) { return root->SelectElements(WString(path), status); }),
                  cv::vekex::status::InvalidQuery)
            << Utf8(WString(path));
    }
    EXPECT_NE(LastError().find("position"), std::string::npos);

    auto qdm = RefPtr<IUnknown>::Adopt(Ok([&](std::int32_t *status) {
        return root->SelectElement(WString(u"/#data_store_manager.storetypes(name=qdm)"), status);
    }));
    EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                  return Query(qdm.get())->GetTextAttribute(WString(u"colour"), status);
              }),
              cv::vekex::status::NotFound);
}

TEST_F(Vekex, ContainersHoldTextsAndValuesApart)
{
    auto container = Container({u"a", u"b"});
    const WString replacement[] = {WString(u"x"), WString(u"y"), WString(u"z")};
    OkVoid([&](std::int32_t *status) { container->AssignFromArray(replacement, 3, status); });
    const std::int16_t values[] = {101, -3};
    OkVoid([&](std::int32_t *status) { container->AssignValues(values, 2, status); });
    EXPECT_EQ(Names(container.get()), (std::vector<std::string>{"x", "y", "z"}));
    ASSERT_EQ(container->GetValueCount(), 2u);
    EXPECT_EQ(container->GetValues()[1], -3);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { container->AssignFromArray(nullptr, 1, status); }),
              cv::vekex::status::InvalidArgument);
    container->Clear();
    EXPECT_EQ(container->GetCount() + container->GetValueCount(), 0u);

    auto lists = RefPtr<cv::vekex::IContainerList>::Adopt(
        Ok([](std::int32_t *status) { return VekexLibrary().createContainerList(status); }));
    OkVoid([&](std::int32_t *status) { lists->Append(container.get(), status); });
    auto back = RefPtr<cv::vekex::IContainer>::Adopt(Ok([&](std::int32_t *status) { return lists->GetAt(0, status); }));
    EXPECT_EQ(back.get(), container.get());
    auto objects = RefPtr<cv::vekex::IInstList>::Adopt(
        Ok([](std::int32_t *status) { return VekexLibrary().createInstList(status); }));
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { objects->Append(nullptr, status); }), cv::vekex::status::InvalidArgument);
}

TEST_F(Vekex, EnvironmentsOtherThanTheDefaultAreRefused)
{
    EXPECT_EQ(StatusOf([](std::int32_t *status) { return VekexLibrary().getEnvironment(83, WString(), 0, status); }),
              cv::vekex::status::InvalidArgument);
    EXPECT_EQ(StatusOf([](std::int32_t *status) {
                  return VekexLibrary().getEnvironment(84, WString(u"other"), 0, status);
              }),
              cv::vekex::status::NotFound);
    auto environment = DataStoreEnvironment();
    EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                  return environment->GetConfiguration(WString(u"cv.vek.config.units"), 0, status);
              }),
              cv::vekex::status::NotFound);
}

struct BrokenCatalogue
{
    const char *name;
    std::string content;
    std::int32_t status;
};

TEST_F(Vekex, BrokenCataloguesGiveAClearErrorAndNoConfiguration)
{
    testsupport::TempDir folder;
    const std::string good = "<parselets format=\"1\"><parselet name=\"a\" model=\"QDM_1_A\"/></parselets>";
    const BrokenCatalogue cases[] = {
        {"not xml", "this is not a catalogue", cv::vekex::status::CatalogueMalformed},
        {"truncated", good.substr(0, good.size() - 8), cv::vekex::status::CatalogueMalformed},
        {"wrong root", "<catalogue format=\"1\"/>", cv::vekex::status::CatalogueMalformed},
        {"unknown format", "<parselets format=\"2\"/>", cv::vekex::status::CatalogueMalformed},
        {"misspelt attribute",
         "<parselets format=\"1\">\n<parselet name=\"a\" model=\"m\"><filefilter extention=\"x\"/></parselet></parselets>",
         cv::vekex::status::CatalogueMalformed},
        {"duplicate name",
         "<parselets format=\"1\"><parselet name=\"a\" model=\"m\"/><parselet name=\"A\" model=\"m\"/></parselets>",
         cv::vekex::status::CatalogueMalformed},
        {"pattern in extension",
         "<parselets format=\"1\"><parselet name=\"a\" model=\"m\"><filefilter extension=\"*.x\"/></parselet></parselets>",
         cv::vekex::status::CatalogueMalformed},
        {"missing icon",
         "<parselets format=\"1\"><parselet name=\"a\" model=\"m\" icon=\"gone.png\"/></parselets>",
         cv::vekex::status::CatalogueUnreadable},
    };
    const std::string path = folder.file("catalogue.xml").string();
    testsupport::ScopedEnv override("CORVANE_VEKEX_CATALOGUE", path);
    auto environment = DataStoreEnvironment();
    for (const BrokenCatalogue &broken : cases) {
        std::ofstream(path, std::ios::trunc) << broken.content;
        std::int32_t status = 0;
        auto *configuration = environment->GetConfiguration(WString(u"cv.vek.config.datastore"), 0, &status);
        EXPECT_EQ(status, broken.status) << broken.name;
        EXPECT_EQ(configuration, nullptr) << broken.name;
        EXPECT_NE(LastError().find("catalogue.xml"), std::string::npos) << broken.name << ": " << LastError();
    }
    // Line and column say where it breaks.
    std::ofstream(path, std::ios::trunc) << cases[4].content;
    StatusOf([&](std::int32_t *status) {
        return environment->GetConfiguration(WString(u"cv.vek.config.datastore"), 0, status);
    });
    EXPECT_NE(LastError().find("catalogue.xml:2:"), std::string::npos) << LastError();

    // Once repaired, the same environment reads it.
    std::ofstream(path, std::ios::trunc) << good;
    auto configuration = RefPtr<cv::vekex::IConfiguration>::Adopt(Ok([&](std::int32_t *status) {
        return environment->GetConfiguration(WString(u"cv.vek.config.datastore"), 0, status);
    }));
    EXPECT_TRUE(configuration);
}

} // namespace
