#include "support/referencestore.h"

#include "entry/errors/statuscall.h"
#include "serverlibs/opensorvik.h"
#include "serverlibs/rovoapilibrary.h"
#include "serverlibs/vekexlibrary.h"

namespace testsupport {

namespace serverlibs = cv::vek::rovo::serverlibs;
using cv::krn::WString;

std::string Narrow(std::u16string_view text)
{
    return std::string(text.begin(), text.end()); // the tests use ASCII only
}

void ReferenceStore::SetUp()
{
    serverlibs::Vekex().TakeUse();
    serverlibs::RovoApi().TakeUse();
}

void ReferenceStore::TearDown()
{
    serverlibs::Vekex().ReleaseUse();
    serverlibs::RovoApi().ReleaseUse();
}

serverlibs::SorvikConfiguration ReferenceStore::Open()
{
    return serverlibs::OpenConfiguration(serverlibs::ModuleSorvikOpener(), WString());
}

void ReferenceStore::Seed(const std::vector<Folder> &folders)
{
    const auto config = Open();
    for (const Folder &f : folders) {
        WString kept;
        cv::vek::CallWithStatus([&](std::int32_t *status) {
            config.editor->AddFolder(&kept, WString(f.path), WString(f.clientPath), WString(f.alias), !f.excluded,
                                     f.excluded, WString(), status);
        });
    }
    serverlibs::Commit(*config.editor);
}

Lines ReferenceStore::Snapshot()
{
    const auto config = Open();
    Lines lines;
    const auto areas = serverlibs::ListSearchAreas(*config.view);
    for (const WString &area : serverlibs::Texts(areas.get())) {
        const auto names = serverlibs::GetSearchArea(*config.view, area);
        lines.push_back(Narrow(area) + " | " + Narrow(names.clientPath) + " | " + Narrow(names.alias));
        const auto excluded = serverlibs::ListExcludedFolders(*config.view, area);
        for (const WString &folder : serverlibs::Texts(excluded.get()))
            lines.push_back("  " + Narrow(folder) + " | " +
                            Narrow(serverlibs::GetSearchArea(*config.view, folder).alias));
    }
    return lines;
}

} // namespace testsupport
