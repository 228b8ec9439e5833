#pragma once

// A Sorvik over a fresh store folder, opened through the loaded libraries.

#include "tests/reference/referencelibs.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace reftest {

class RovoTest : public ::testing::Test
{
protected:
    RovoTest();
    ~RovoTest() override;
    void SetUp() override { ASSERT_TRUE(m_sorvik) << LastError(); }

    RefPtr<cv::rovo::ISorvik> Open(const char16_t *connection = u"");
    RefPtr<cv::rovo::IConfigurationView> View(cv::rovo::ISorvik *sorvik = nullptr);
    RefPtr<cv::rovo::IConfigurationEditor> Editor(cv::rovo::ISorvik *sorvik = nullptr);

    // Records a search area (isArea 1) or an excluded folder.
    static void AddArea(cv::rovo::IConfigurationEditor *editor, const char16_t *path, const char16_t *alias);
    static void AddExcluded(cv::rovo::IConfigurationEditor *editor, const char16_t *path, const char16_t *alias);
    static void Commit(cv::rovo::IConfigurationEditor *editor);

    // The committed search areas as "path|client|alias" with their excluded
    // folders as "  path" lines, in order.
    std::vector<std::string> Areas(cv::rovo::IConfigurationView *view = nullptr);
    std::string File(const std::string &name) const { return m_folder.file(name).string(); }
    std::string Slurp(const std::string &file) const;
    std::string StoreFile(const std::string &name = "local.sorvikdb") const { return File(name); }
    std::string LastError() const;

    testsupport::TempDir m_folder;
    testsupport::ScopedEnv m_store;
    RefPtr<cv::rovo::IRovoEnvironment> m_environment;
    RefPtr<cv::rovo::ISorvik> m_sorvik;
};

} // namespace reftest
