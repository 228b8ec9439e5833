#include "entry/serverdialogs.h"
#include "scriptedui.h"
#include "sorvik/vekexception.h"

#include <gtest/gtest.h>

#include <cstring>

namespace cv::vek::rovo {
namespace {

using testing::ScriptedUi;

// A host object the test owns; its count shows every reference taken or given back.
struct CountedHost final : IServerDialogsHost
{
    HRESULT QueryInterface(REFIID, void **) override { return E_NOINTERFACE; }
    ULONG AddRef() override { return ++refs; }
    ULONG Release() override { return --refs; }
    std::int32_t GetState() override { return state; }
    std::int32_t Prepare() override { return ++prepared; }

    int refs = 1;
    std::int32_t state = 0;
    int prepared = 0;
};

krn::RefPtr<cv::rovo::ISorvik> NoSorvik(const krn::WString &)
{
    return {};
}

class ServiceObject : public ::testing::Test
{
protected:
    ~ServiceObject() override { EXPECT_EQ(m_service->Release(), 0u); }

    ScriptedUi m_ui;
    CServerDialogs *m_service = new CServerDialogs(krn::WString(), 1, m_ui, &NoSorvik);
};

TEST_F(ServiceObject, SettersKeepWhatTheRulesAllow)
{
    for (std::uint32_t mode : {0u, 2u, 4u, 3u, 5u}) // 3 and 5 are ignored
        m_service->SetServerMode(mode);
    EXPECT_EQ(m_service->ServerMode(), 4u);

    LOGFONTW font;
    std::memset(&font, 0xA5, sizeof font);
    const LOGFONTW sent = font;
    m_service->SetDialogFont(&font);
    font.lfHeight = -20;               // the host's memory changes afterwards
    m_service->SetDialogFont(nullptr); // ignored
    ASSERT_TRUE(m_service->Settings().window.font);
    EXPECT_EQ(std::memcmp(&*m_service->Settings().window.font, &sent, 92), 0);

    EXPECT_EQ(m_service->Settings().waitFlag, 1);
    m_service->SetWaitFlag(0);
    EXPECT_EQ(m_service->Settings().waitFlag, 0);
    EXPECT_EQ(m_service->GetInterfaceRevision(), 2);
}

TEST_F(ServiceObject, HostObjectHoldsOneReference)
{
    CountedHost first, second;
    m_service->SetHostObject(&first);
    first.Release();
    m_service->SetHostObject(&first); // the object already stored must survive
    EXPECT_EQ(first.refs, 1);
    m_service->SetHostObject(&second);
    EXPECT_EQ(first.refs, 0);
    EXPECT_EQ(second.refs, 2);

    second.state = 2;
    m_service->ShowConfigurationDialog();
    second.state = 3; // only this state asks the host to prepare
    m_service->ShowConfigurationDialog();
    EXPECT_EQ(second.prepared, 1);
    EXPECT_EQ(m_ui.calls, (std::vector<std::string>{"configuration", "configuration"}));

    auto *other = new CServerDialogs(krn::WString(), 0, m_ui, &NoSorvik);
    other->SetHostObject(&second);
    other->Release();
    m_service->SetHostObject(nullptr);
    EXPECT_EQ(second.refs, 1);
}

TEST_F(ServiceObject, WithoutASorvikObjectSearchAreasRaise800AndResetReports)
{
    krn::WString path(u"/data");
    for (auto operation : {&CServerDialogs::AddSearchArea, &CServerDialogs::EditSearchAreaEx}) {
        try {
            (m_service->*operation)(path, 0);
            ADD_FAILURE() << "no exception";
        } catch (const Exception &e) {
            EXPECT_EQ(e.Code(), -800);
        }
    }
    EXPECT_THROW(m_service->RemoveSearchArea(path), Exception);
    EXPECT_THROW(m_service->ExcludeFolder(path), Exception);
    EXPECT_EQ(m_ui.waitDepth, 0) << "every failure restores the cursor";

    EXPECT_EQ(m_service->ShowResetDialog(), kModalCancel);
    EXPECT_EQ(m_ui.calls, (std::vector<std::string>{"confirm exclude", "unknown error"}));
}

} // namespace
} // namespace cv::vek::rovo
