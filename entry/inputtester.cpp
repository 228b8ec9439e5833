#include "entry/inputtester.h"

#include "entry/errors/statuscall.h"
#include "krn/nocase.h"
#include "serverlibs/searchareas.h"
#include "serverlibs/serverpaths.h"

namespace cv::vek::rovo {

using namespace serverlibs;

CServerDialogsInputTester::CServerDialogsInputTester(krn::RefPtr<cv::rovo::IConfigurationView> view,
                                                     krn::RefPtr<cv::rovo::IConfigurationEditor> editor)
    : m_view(std::move(view)), m_editor(std::move(editor))
{
}

bool CServerDialogsInputTester::IsAliasInUse(const krn::WString &alias)
{
    const auto areas = ListSearchAreas(*m_view);
    for (const krn::WString &area : Texts(areas.get())) {
        if (krn::EqualsNoCase(GetSearchArea(*m_view, area).alias, alias))
            return true;
    }
    return false;
}

std::int32_t CServerDialogsInputTester::TestClientPath(const krn::WString &clientPath, krn::WString &alias)
{
    return Test(Compare::ClientPath, clientPath, alias);
}

std::int32_t CServerDialogsInputTester::TestPath(const krn::WString &path, krn::WString &alias)
{
    return Test(Compare::Path, path, alias);
}

std::int32_t CServerDialogsInputTester::CheckPathAllowed(const krn::WString &serverPath, const krn::WString &path,
                                                         const krn::WString &alias)
{
    return CallWithStatus(
        [&](std::int32_t *status) { return m_editor->CheckAreaAllowed(serverPath, path, alias, 1, 0, status); });
}

std::int32_t CServerDialogsInputTester::Test(Compare compare, const krn::WString &path, krn::WString &alias)
{
    const auto areas = ListSearchAreas(*m_view);
    for (const krn::WString &area : Texts(areas.get())) {
        SearchAreaNames names;
        std::u16string_view existing = area;
        if (compare == Compare::ClientPath) {
            names = GetSearchArea(*m_view, area);
            existing = names.clientPath;
        }
        std::int32_t result = 0;
        if (krn::EqualsNoCase(existing, path))
            result = 1; // the same folder
        else if (IsFolderPrefix(existing, path))
            result = 2; // path lies inside the area
        else if (IsFolderPrefix(path, existing))
            result = -1; // path contains the area
        if (result != 0) {
            alias = compare == Compare::ClientPath ? names.alias : GetSearchArea(*m_view, area).alias;
            return result;
        }
    }
    return 0;
}

} // namespace cv::vek::rovo
