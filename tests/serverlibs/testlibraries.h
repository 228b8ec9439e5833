#pragma once

// Test helpers around the product libraries: a registry file that names
// their folders, and a look at whether (and in what state) one is loaded.

#include "fakes/fakestate.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <string>

namespace testsupport {

// For the life of the object the registry names vekexFolder as the data-store
// library's folder and rovoApiFolder as the server API library's; an empty
// folder leaves its value out.
class ScopedLibraryFolders final
{
public:
    ScopedLibraryFolders(const std::string &vekexFolder, const std::string &rovoApiFolder);

private:
    TempDir m_dir;
    ScopedEnv m_registry;
};

// Whether the library at path is loaded in this process (without loading it).
bool IsLoaded(const std::string &path);

// The state a fake library exports, or null when it is not loaded. Valid while
// the library stays loaded.
FakeState *FakeStateOf(const std::string &path);

} // namespace testsupport
