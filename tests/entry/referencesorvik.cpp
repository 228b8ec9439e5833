#include "referencesorvik.h"

#include "entry/errors/statuscall.h"
#include "serverlibs/opensorvik.h"

namespace cv::vek::rovo::testing {

std::string Narrow(std::u16string_view text)
{
    return std::string(text.begin(), text.end()); // the tests use ASCII only
}

void ReferenceSorvik::TearDown()
{
    if (m_service)
        m_service->Release();
    EXPECT_EQ(m_ui.waitDepth, 0) << "the wait cursor was left on";
    Module().Cleanup();
}

serverlibs::SorvikConfiguration ReferenceSorvik::Open()
{
    return serverlibs::OpenConfiguration(serverlibs::ModuleSorvikOpener(), krn::WString());
}

void ReferenceSorvik::Seed(const std::vector<Folder> &folders)
{
    const auto config = Open();
    for (const Folder &f : folders) {
        krn::WString kept;
        CallWithStatus([&](std::int32_t *status) {
            config.editor->AddFolder(&kept, krn::WString(f.path), krn::WString(f.clientPath), krn::WString(f.alias),
                                     !f.excluded, f.excluded, krn::WString(), status);
        });
    }
    serverlibs::Commit(*config.editor);
}

Lines ReferenceSorvik::Snapshot()
{
    const auto config = Open();
    Lines lines;
    const auto areas = serverlibs::ListSearchAreas(*config.view);
    for (const krn::WString &area : serverlibs::Texts(areas.get())) {
        const auto names = serverlibs::GetSearchArea(*config.view, area);
        lines.push_back(Narrow(area) + " | " + Narrow(names.clientPath) + " | " + Narrow(names.alias));
        const auto excluded = serverlibs::ListExcludedFolders(*config.view, area);
        for (const krn::WString &folder : serverlibs::Texts(excluded.get()))
            lines.push_back("  " + Narrow(folder) + " | " + Narrow(serverlibs::GetSearchArea(*config.view, folder).alias));
    }
    return lines;
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
