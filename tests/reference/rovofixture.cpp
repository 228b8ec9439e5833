#include "tests/reference/rovofixture.h"

#include <fstream>
#include <sstream>

namespace reftest {

RovoTest::RovoTest() : m_store("CORVANE_SORVIK_STORE", m_folder.path().string())
{
    VekexLibrary().init();
    RovoLibrary().init();
    auto dataStore = DataStoreEnvironment();
    m_environment = RefPtr<cv::rovo::IRovoEnvironment>::Adopt(
        Ok([&](std::int32_t *status) { return RovoLibrary().createEnvironment(dataStore.get(), status); }));
    m_sorvik = Open();
}

RovoTest::~RovoTest()
{
    m_sorvik.Reset();
    m_environment.Reset();
    RovoLibrary().cleanup();
    VekexLibrary().cleanup();
}

RefPtr<cv::rovo::ISorvik> RovoTest::Open(const char16_t *connection)
{
    return RefPtr<cv::rovo::ISorvik>::Adopt(
        Ok([&](std::int32_t *status) { return m_environment->OpenSorvik(WString(connection), status); }));
}

RefPtr<cv::rovo::IConfigurationView> RovoTest::View(cv::rovo::ISorvik *sorvik)
{
    cv::rovo::ISorvik *target = sorvik ? sorvik : m_sorvik.get();
    return RefPtr<cv::rovo::IConfigurationView>::Adopt(
        Ok([&](std::int32_t *status) { return target->GetConfigurationView(status); }));
}

RefPtr<cv::rovo::IConfigurationEditor> RovoTest::Editor(cv::rovo::ISorvik *sorvik)
{
    cv::rovo::ISorvik *target = sorvik ? sorvik : m_sorvik.get();
    return RefPtr<cv::rovo::IConfigurationEditor>::Adopt(
        Ok([&](std::int32_t *status) { return target->GetConfigurationEditor(status); }));
}

void RovoTest::AddArea(cv::rovo::IConfigurationEditor *editor, const char16_t *path, const char16_t *alias)
{
    WString result;
    OkVoid([&](std::int32_t *status) {
        editor->AddFolder(&result, WString(path), WString(path), WString(alias), 1, 0, WString(), status);
    });
}

void RovoTest::AddExcluded(cv::rovo::IConfigurationEditor *editor, const char16_t *path, const char16_t *alias)
{
    WString result;
    OkVoid([&](std::int32_t *status) {
        editor->AddFolder(&result, WString(path), WString(), WString(alias), 0, 1, WString(), status);
    });
}

void RovoTest::Commit(cv::rovo::IConfigurationEditor *editor)
{
    OkVoid([&](std::int32_t *status) { editor->CommitConfiguration(status); });
}

std::vector<std::string> RovoTest::Areas(cv::rovo::IConfigurationView *view)
{
    RefPtr<cv::rovo::IConfigurationView> own;
    if (!view) {
        own = View();
        view = own.get();
    }
    std::vector<std::string> lines;
    auto areas = RefPtr<cv::vekex::IStringList>::Adopt(Ok([&](std::int32_t *status) { return view->ListSearchAreas(status); }));
    for (std::uint32_t i = 0; areas && i < areas->GetCount(); ++i) {
        const WString &path = areas->GetElements()[i];
        WString client, alias;
        OkVoid([&](std::int32_t *status) { view->GetSearchArea(path, &client, &alias, 0, status); });
        lines.push_back(Utf8(path) + "|" + Utf8(client) + "|" + Utf8(alias));
        auto excluded = RefPtr<cv::vekex::IStringList>::Adopt(
            Ok([&](std::int32_t *status) { return view->ListExcludedFolders(path, status); }));
        EXPECT_TRUE(excluded) << "a search area always has a list of excluded folders";
        for (std::uint32_t k = 0; excluded && k < excluded->GetCount(); ++k)
            lines.push_back("  " + Utf8(excluded->GetElements()[k]));
    }
    return lines;
}

std::string RovoTest::Slurp(const std::string &file) const
{
    std::ifstream input(file, std::ios::binary);
    std::ostringstream content;
    content << input.rdbuf();
    return content.str();
}

std::string RovoTest::LastError() const
{
    WString text;
    RovoLibrary().lastError(&text);
    return Utf8(text);
}

} // namespace reftest
