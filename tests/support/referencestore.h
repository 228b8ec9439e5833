#pragma once

// A fixture over the reference product libraries with a configuration store
// of its own: the libraries are loaded as the module loads them, and the
// local Sorvik's configuration can be seeded and read back.

#include "serverlibs/searchareas.h"
#include "serverlibs/testlibraries.h"

#include <gtest/gtest.h>

#include <string>
#include <string_view>
#include <vector>

namespace testsupport {

struct Folder
{
    std::u16string path, clientPath, alias;
    bool excluded = false;
};
using Lines = std::vector<std::string>;

class ReferenceStore : public ::testing::Test
{
protected:
    void SetUp() override;
    void TearDown() override;

    // The local Sorvik with its view and editor.
    static cv::vek::rovo::serverlibs::SorvikConfiguration Open();
    // Adds the folders in order and commits them.
    static void Seed(const std::vector<Folder> &folders);
    // Each search area as "path | client path | alias", followed by its
    // excluded folders as "  path | alias".
    static Lines Snapshot();

    ScopedLibraryFolders m_folders{REFERENCE_LIB_DIR, REFERENCE_LIB_DIR};
    TempDir m_store;
    ScopedEnv m_storeEnv{"CORVANE_SORVIK_STORE", m_store.path().string()};
};

// ASCII text of a UTF-16 string, for assertions.
std::string Narrow(std::u16string_view text);

} // namespace testsupport
