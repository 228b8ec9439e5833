#pragma once

// A fixture over the reference product libraries with a store of its own:
// the module is started as a host starts it, and the local Sorvik's
// configuration can be seeded and read back.

#include "entry/module.h"
#include "entry/serverdialogs.h"
#include "scriptedui.h"
#include "serverlibs/testlibraries.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace cv::vek::rovo::testing {

struct Folder
{
    std::u16string path, clientPath, alias;
    bool excluded = false;
};
using Lines = std::vector<std::string>;

class ReferenceSorvik : public ::testing::Test
{
protected:
    void SetUp() override { Module().Init(); }
    void TearDown() override;

    serverlibs::SorvikConfiguration Open();
    void Seed(const std::vector<Folder> &folders);
    // Each search area as "path | client path | alias", followed by its
    // excluded folders as "  path | alias".
    Lines Snapshot();
    // A service object for the local Sorvik using m_ui, counting the Sorvik objects it opens.
    CServerDialogs &Service();

    testsupport::ScopedLibraryFolders m_folders{REFERENCE_LIB_DIR, REFERENCE_LIB_DIR};
    testsupport::TempDir m_store;
    testsupport::ScopedEnv m_storeEnv{"CORVANE_SORVIK_STORE", m_store.path().string()};
    ScriptedUi m_ui;
    int m_opened = 0;

private:
    CServerDialogs *m_service = nullptr;
};

std::string Narrow(std::u16string_view text);

} // namespace cv::vek::rovo::testing
