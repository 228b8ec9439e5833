#include "pages/propertypage.h"

namespace pages {

CPropertyPage::CPropertyPage(sharedsource::TemplateRef pageTemplate, QWidget *parent) : ToBaseDlg(pageTemplate, parent)
{}

bool CPropertyPage::SavePage()
{
    return false;
}

bool CPropertyPage::IsModified() const
{
    return false;
}

std::int32_t CPropertyPage::Reload()
{
    return 0;
}

bool CPropertyPage::CanLeavePage()
{
    return true;
}

void CPropertyPage::AfterCommit(cv::rovo::ISorvik *) {}

void CPropertyPage::SetFileExtensionsPage(IFileExtensionsPage *) {}

bool CPropertyPage::OnInitDialog()
{
    ToBaseDlg::OnInitDialog();
    m_loadResult = Reload();
    return true;
}

} // namespace pages
