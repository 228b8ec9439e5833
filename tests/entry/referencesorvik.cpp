#include "referencesorvik.h"

#include "serverlibs/opensorvik.h"

namespace cv::vek::rovo::testing {

void ReferenceSorvik::SetUp()
{
    ReferenceStore::SetUp();
    Module().Init();
}

void ReferenceSorvik::TearDown()
{
    if (m_service)
        m_service->Release();
    EXPECT_EQ(m_ui.waitDepth, 0) << "the wait cursor was left on";
    Module().Cleanup();
    ReferenceStore::TearDown();
}

CServerDialogs &ReferenceSorvik::Service()
{
    if (!m_service) {
        m_service = new CServerDialogs(krn::WString(), 0, m_ui, [this](const krn::WString &connection) {
            ++m_opened;
            return serverlibs::OpenSorvik(connection).sorvik;
        });
    }
    return *m_service;
}

} // namespace cv::vek::rovo::testing
