#include "pages/configuredlginputtester.h"

#include "pages/configuredlg.h"
#include "sorvik/wstringqt.h"

namespace pages {

using cv::krn::FromQString;
using cv::krn::ToQString;
using cv::krn::WString;

bool CConfigureDlgInputTester::IsAliasInUse(const WString &alias)
{
    return m_page.IsAliasInUse(ToQString(alias));
}

std::int32_t CConfigureDlgInputTester::TestClientPath(const WString &path, WString &alias)
{
    QString name;
    const int result = m_page.TestClientPath(ToQString(path), name);
    if (result != 0)
        alias = FromQString(name);
    return result;
}

std::int32_t CConfigureDlgInputTester::TestPath(const WString &path, WString &alias)
{
    QString name;
    const int result = m_page.TestPath(ToQString(path), name);
    if (result != 0)
        alias = FromQString(name);
    return result;
}

std::int32_t CConfigureDlgInputTester::CheckPathAllowed(const WString &serverPath, const WString &path,
                                                        const WString &alias)
{
    return m_page.CheckPathAllowed(ToQString(serverPath), ToQString(path), ToQString(alias));
}

} // namespace pages
