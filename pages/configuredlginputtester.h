#pragma once

// Hands the Add Search Area dialog's questions to the Search Areas page.

#include "sorvik/serverdialogs.h"

namespace pages {

class CConfigureDlg;

class CConfigureDlgInputTester final : public IInputTester
{
public:
    explicit CConfigureDlgInputTester(CConfigureDlg &page) : m_page(page) {}

    bool IsAliasInUse(const cv::krn::WString &alias) override;
    std::int32_t TestClientPath(const cv::krn::WString &path, cv::krn::WString &alias) override;
    std::int32_t TestPath(const cv::krn::WString &path, cv::krn::WString &alias) override;
    std::int32_t CheckPathAllowed(const cv::krn::WString &serverPath, const cv::krn::WString &path,
                                  const cv::krn::WString &alias) override;

private:
    CConfigureDlg &m_page;
};

} // namespace pages
