// The ABI headers as a separately compiled host or library sees them: each
// header compiles on its own (see the generated one-header sources beside
// this test), and the fixed slot orders hold.

#include "sorvik/rovoapi.h"
#include "sorvik/serverdialogs.h"
#include "sorvik/serverdialogsexports.h"
#include "sorvik/vekex.h"

#include <gtest/gtest.h>

#include <array>
#include <cstring>

namespace {

// Index of a virtual function in its vtable under the Itanium ABI.
template <typename Method>
std::size_t SlotOf(Method method)
{
    static_assert(sizeof(method) == 2 * sizeof(std::uintptr_t));
    std::uintptr_t words[2];
    std::memcpy(words, &method, sizeof words);
    return (words[0] - 1) / sizeof(void *);
}

TEST(AbiHeaders, ServerDialogsSlotsKeepTheirOrder)
{
    const std::array<std::size_t, 19> slots = {
        SlotOf(&IServerDialogs::QueryInterface),  SlotOf(&IServerDialogs::AddRef),
        SlotOf(&IServerDialogs::Release),         SlotOf(&IServerDialogs::SetHelpCallback),
        SlotOf(&IServerDialogs::SetDialogFont),   SlotOf(&IServerDialogs::ShowConfigurationDialog),
        SlotOf(&IServerDialogs::ShowOptimizeDialog), SlotOf(&IServerDialogs::AddSearchArea),
        SlotOf(&IServerDialogs::EditSearchArea),  SlotOf(&IServerDialogs::ExcludeFolder),
        SlotOf(&IServerDialogs::RemoveSearchArea), SlotOf(&IServerDialogs::SetWaitFlag),
        SlotOf(&IServerDialogs::ShowResetDialog), SlotOf(&IServerDialogs::SetHostObject),
        SlotOf(&IServerDialogs::AddSearchAreaEx), SlotOf(&IServerDialogs::EditSearchAreaEx),
        SlotOf(&IServerDialogs::SetReserved),     SlotOf(&IServerDialogs::SetServerMode),
        SlotOf(&IServerDialogs::GetInterfaceRevision)};
    for (std::size_t i = 0; i < slots.size(); ++i)
        EXPECT_EQ(slots[i], i) << "slot " << i;

    EXPECT_EQ(SlotOf(&IInputTester::IsAliasInUse), 0u);
    EXPECT_EQ(SlotOf(&IInputTester::TestClientPath), 1u);
    EXPECT_EQ(SlotOf(&IInputTester::TestPath), 2u);
    EXPECT_EQ(SlotOf(&IInputTester::CheckPathAllowed), 3u);
    EXPECT_EQ(SlotOf(&INonModalDialog::Close), 0u);
}

TEST(AbiHeaders, LibraryObjectsCountReferencesInTheirFirstSlots)
{
    EXPECT_EQ(SlotOf(&cv::rovo::ISorvik::AddRef), 0u);
    EXPECT_EQ(SlotOf(&cv::rovo::ISorvik::Release), 1u);
    EXPECT_EQ(SlotOf(&cv::rovo::ISorvik::GetSorvikName), 2u);
    EXPECT_EQ(SlotOf(&cv::vekex::IStringList::GetCount), 2u);
    EXPECT_EQ(SlotOf(&cv::vekex::IStringList::GetElements), 3u);
    // The query interface and the configuration are COM objects.
    EXPECT_EQ(SlotOf(&cv::vekex::IVekQuery::QueryInterface), 0u);
    EXPECT_EQ(SlotOf(&cv::vekex::IVekQuery::SelectElements), 3u);
    EXPECT_EQ(SlotOf(&cv::vekex::IConfiguration::GetDataStoreManager), 4u);
}

TEST(AbiHeaders, IdentifiersAreTheKnownOnes)
{
    EXPECT_EQ(IID_IServerDialogs, MakeGuid("{ab68ecec-d36a-4054-ae3d-c3c1226c3c4b}"));
    EXPECT_EQ(cv::vekex::IID_IVekQuery.Data1, 0x9B03E039u);
    EXPECT_EQ(cv::vekex::IID_IVekQuery.Data4[7], 0x7Eu);
}

} // namespace
