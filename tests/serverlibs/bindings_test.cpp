#include "serverlibs/opensorvik.h"
#include "serverlibs/searchareas.h"
#include "serverlibs/testlibraries.h"
#include "sorvik/vekexception.h"

#include <gtest/gtest.h>

namespace cv::vek::rovo::serverlibs {
namespace {

using testsupport::FakeStateOf;
using testsupport::IsLoaded;
using testsupport::ScopedLibraryFolders;

template <typename F>
Exception Caught(F &&f)
{
    try {
        f();
    } catch (const Exception &e) {
        return e;
    }
    return Exception(0, krn::WString(u"nothing thrown"));
}

// Both bindings count uses alike when seen from one thread.
template <typename Binding>
void ExpectCountedUses(const std::string &path)
{
    Binding binding;
    binding.TakeUse();
    binding.TakeUse();
    ASSERT_TRUE(IsLoaded(path));
    FakeState *state = FakeStateOf(path);
    EXPECT_EQ(state->initCalls.load(), 2) << "every use calls Init";
    binding.ReleaseUse();
    EXPECT_EQ(state->cleanupCalls.load(), 1);
    EXPECT_TRUE(IsLoaded(path)) << "one use is still held";
    binding.ReleaseUse();
    EXPECT_FALSE(IsLoaded(path)) << "the last release unloads";
    binding.ReleaseUse();
    EXPECT_EQ(binding.UseCount(), 0u) << "a release without a use changes nothing";
    binding.TakeUse();
    EXPECT_TRUE(IsLoaded(path)) << "a later use loads again";
    binding.ReleaseUse();
}

TEST(ServerLibraryUses, LoadOnTheFirstUseAndUnloadAfterTheLast)
{
    const ScopedLibraryFolders folders(FAKE_FULL_DIR, FAKE_FULL_DIR);
    ExpectCountedUses<VekexLibrary>(FAKE_FULL_DIR "/libvekex.so");
    ExpectCountedUses<RovoApiLibrary>(FAKE_FULL_DIR "/librovoApi.so");
}

TEST(ServerLibraryUses, MissingLibraryOrEntryPointFailsAtTheFirstCallNotBefore)
{
    testsupport::TempDir empty;
    for (const std::string &folder : {empty.path().string(), std::string(FAKE_PARTIAL_DIR)}) {
        const ScopedLibraryFolders folders(folder, folder);
        VekexLibrary vekex;
        RovoApiLibrary rovoApi;
        vekex.TakeUse();
        rovoApi.TakeUse();
        EXPECT_FALSE(IsLoaded(folder + "/librovoApi.so")) << "an incomplete library is not kept";

        const Exception vekError = Caught([&] { OpenSorvik(krn::WString(), vekex, rovoApi); });
        EXPECT_EQ(vekError.Code(), -1006);
        EXPECT_EQ(vekError.Message(), u"vek not correctly initialized");
        EXPECT_EQ(Caught([&] { vekex.CreateContainer(); }).Code(), -1006);
        const Exception rovoError = Caught([&] { rovoApi.CreateEnvironment(nullptr); });
        EXPECT_EQ(rovoError.Code(), -13001);
        EXPECT_EQ(rovoError.Message(), u"rovo not correctly initialized");
        rovoApi.ReleaseUse();
        vekex.ReleaseUse();
    }
}

TEST(KindOfConnection, OnlyTheFirstSorvikTypeElementWithExactlyValdornCounts)
{
    for (std::u16string_view text :
         {u"<SorvikType>valdorn</SorvikType>", u"<A>x</A><SorvikType>valdorn</SorvikType>",
          u"<C><SorvikType>valdorn</SorvikType></C>", u"<SorvikType a=\"1\">valdorn</SorvikType>",
          u"<SorvikType\ta>valdorn</SorvikType>", u"<SorvikType\na>valdorn</SorvikType>",
          u"<SorvikType\ra>valdorn</SorvikType>"})
        EXPECT_EQ(KindOfConnection(text), SorvikKind::Valdorn) << std::string(text.begin(), text.end());
    for (std::u16string_view text :
         {u"", u"<SorvikType>Valdorn</SorvikType>", u"<SorvikType> valdorn</SorvikType>",
          u"<sorviktype>valdorn</sorviktype>", u"<SorvikTypeX>valdorn</SorvikTypeX>",
          u"<SorvikType>x</SorvikType><SorvikType>valdorn</SorvikType>", u"<SorvikType>valdorn",
          u"<SorvikType>valdorn</SorvikType"})
        EXPECT_EQ(KindOfConnection(text), SorvikKind::Desktop) << std::string(text.begin(), text.end());
}

class OpenSorvikWithFakes : public ::testing::Test
{
protected:
    void SetUp() override
    {
        m_vekex.TakeUse();
        m_rovoApi.TakeUse();
        m_vekexState = FakeStateOf(FAKE_FULL_DIR "/libvekex.so");
        m_rovoApiState = FakeStateOf(FAKE_FULL_DIR "/librovoApi.so");
        ASSERT_TRUE(m_vekexState && m_rovoApiState);
    }
    void TearDown() override
    {
        EXPECT_EQ(m_vekexState->liveObjects, 0) << "everything created is released";
        EXPECT_EQ(m_rovoApiState->liveObjects, 0);
        m_rovoApi.ReleaseUse();
        m_vekex.ReleaseUse();
    }
    OpenedSorvik Open(const krn::WString &text) { return OpenSorvik(text, m_vekex, m_rovoApi); }

    ScopedLibraryFolders m_folders{FAKE_FULL_DIR, FAKE_FULL_DIR};
    VekexLibrary m_vekex;
    RovoApiLibrary m_rovoApi;
    FakeState *m_vekexState = nullptr;
    FakeState *m_rovoApiState = nullptr;
};

TEST_F(OpenSorvikWithFakes, EnvironmentKindFollowsTheConnectionText)
{
    const krn::WString text(u"<Server>s</Server><SorvikType>valdorn</SorvikType>");
    OpenedSorvik opened = Open(text);
    EXPECT_TRUE(opened.sorvik);
    EXPECT_EQ(opened.kind, SorvikKind::Valdorn);
    EXPECT_EQ(m_vekexState->lastKind, 84);
    EXPECT_EQ(m_vekexState->lastName, u"");
    EXPECT_EQ(m_vekexState->lastVersion, 75504568u);
    EXPECT_EQ(m_rovoApiState->dataStoreKind, 84) << "the server environment is built on that data store";
    EXPECT_EQ(m_rovoApiState->lastConnection, text.view());
    EXPECT_EQ(m_rovoApiState->liveObjects, 1) << "both environments are released";

    opened = Open(krn::WString());
    EXPECT_EQ(opened.kind, SorvikKind::Desktop);
    EXPECT_EQ(m_vekexState->lastKind, 82);
}

TEST_F(OpenSorvikWithFakes, LibraryStatusArrivesAsThatCodeAndNothingLeaks)
{
    m_vekexState->failStatus = 17;
    EXPECT_EQ(Caught([&] { Open(krn::WString()); }).Code(), 17);
    for (int pass : {0, 1}) { // the server environment, then the Sorvik object
        m_rovoApiState->passCreations = pass;
        m_rovoApiState->returnNull = true;
        EXPECT_FALSE(Open(krn::WString()).sorvik);
        m_rovoApiState->passCreations = pass;
        m_rovoApiState->failStatus = -21005;
        const Exception e = Caught([&] { Open(krn::WString()); });
        EXPECT_EQ(e.Code(), -21005);
        EXPECT_TRUE(e.Message().empty());
    }
    // The fake Sorvik object has neither view nor editor.
    const SorvikOpener open = [&](const krn::WString &text) { return Open(text).sorvik; };
    const Exception missing = Caught([&] { OpenConfiguration(open, krn::WString()); });
    EXPECT_EQ(missing.Code(), -800);
    EXPECT_TRUE(missing.Message().view().ends_with(u"): out of memory"));
}

} // namespace
} // namespace cv::vek::rovo::serverlibs
