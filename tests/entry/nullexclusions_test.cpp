// A server that answers "no list" instead of an empty list of excluded
// folders: editing the area's path must still move it, not report success
// for a move that never happened.

#include "referencesorvik.h"
#include "support/refcountedfake.h"

#include "serverlibs/opensorvik.h"

namespace cv::vek::rovo::testing {
namespace {

using cv::rovo::CalendarTime;
using cv::rovo::IConfigurationEditor;
using cv::rovo::IConfigurationView;
using cv::vekex::IStringList;
using krn::WString;

// The reference view, except that it has no lists of excluded folders.
class NoExclusionListView final : public testsupport::RefCountedFake<IConfigurationView>
{
public:
    explicit NoExclusionListView(krn::RefPtr<IConfigurationView> view) : m_view(std::move(view)) {}


    IStringList *ListExcludedFolders(const WString &, std::int32_t *) override { return nullptr; }

    IStringList *ListSearchAreas(std::int32_t *s) override { return m_view->ListSearchAreas(s); }
    void GetSearchArea(const WString &p, WString *c, WString *a, std::int32_t f, std::int32_t *s) override
    {
        m_view->GetSearchArea(p, c, a, f, s);
    }
    bool IsSearchArea(const WString &p, std::int32_t *s) override { return m_view->IsSearchArea(p, s); }
    bool IsExcludedFolder(const WString &p, std::int32_t *s) override { return m_view->IsExcludedFolder(p, s); }
    void ImportConfiguration(const WString &f, IConfigurationEditor *e, std::int32_t *s) override
    {
        m_view->ImportConfiguration(f, e, s);
    }
    void ExportConfiguration(const WString &f, IConfigurationEditor *e, std::int32_t *s) override
    {
        m_view->ExportConfiguration(f, e, s);
    }
    std::int32_t GetChangeTrigger(std::int32_t *s) override { return m_view->GetChangeTrigger(s); }
    std::uint32_t GetFileTimeout(std::int32_t *s) override { return m_view->GetFileTimeout(s); }
    std::uint32_t GetIdleTime(std::int32_t *s) override { return m_view->GetIdleTime(s); }
    void GetSchedule(std::int32_t *k, CalendarTime *w, std::int32_t *s) override { m_view->GetSchedule(k, w, s); }
    void GetTimeouts(std::uint32_t *b, std::uint32_t *q, std::int32_t *s) override { m_view->GetTimeouts(b, q, s); }
    void GetIndexPath(WString *p, std::int32_t *s) override { m_view->GetIndexPath(p, s); }
    std::int32_t IsParseletActive(const WString &n, std::int32_t *s) override { return m_view->IsParseletActive(n, s); }
    IStringList *GetExtensionParselets(const WString &e, std::int32_t *s) override
    {
        return m_view->GetExtensionParselets(e, s);
    }

private:
    krn::RefPtr<IConfigurationView> m_view;
};

// The reference Sorvik object handing out that view.
class NoExclusionListSorvik final : public testsupport::RefCountedFake<cv::rovo::ISorvik>
{
public:
    explicit NoExclusionListSorvik(krn::RefPtr<cv::rovo::ISorvik> sorvik) : m_sorvik(std::move(sorvik)) {}

    WString GetSorvikName(std::int32_t *s) override { return m_sorvik->GetSorvikName(s); }
    IConfigurationView *GetConfigurationView(std::int32_t *s) override
    {
        IConfigurationView *view = m_sorvik->GetConfigurationView(s);
        return view ? new NoExclusionListView(krn::RefPtr<IConfigurationView>::Adopt(view)) : nullptr;
    }
    IConfigurationEditor *GetConfigurationEditor(std::int32_t *s) override
    {
        return m_sorvik->GetConfigurationEditor(s);
    }
    cv::rovo::IIndexManager *GetIndexManager(std::int32_t *s) override { return m_sorvik->GetIndexManager(s); }
    void ResetSorvik(std::int32_t m, std::int32_t f, std::int32_t *s) override { m_sorvik->ResetSorvik(m, f, s); }

private:
    krn::RefPtr<cv::rovo::ISorvik> m_sorvik;
};

TEST_F(ReferenceSorvik, EditMovesAnAreaWhoseExclusionListIsNull)
{
    Seed({{u"/data/a", u"/data/a", u"A"}});
    auto *service = new CServerDialogs(WString(), 0, m_ui, [](const WString &connection) {
        return krn::RefPtr<cv::rovo::ISorvik>::Adopt(
            new NoExclusionListSorvik(serverlibs::OpenSorvik(connection).sorvik));
    });
    m_ui.entered = {true, WString(u"A"), WString(u"/data/b"), {}};
    WString path(u"/data/a");
    EXPECT_EQ(service->EditSearchArea(path, 0), 1);
    service->Release();
    EXPECT_EQ(Snapshot(), Lines{"/data/b | /data/a | A"}) << "success only when the area has moved";
}

} // namespace
} // namespace cv::vek::rovo::testing
