#include "configdialog/propertypagefactory.h"

namespace cv::vek::rovo::configdialog {

namespace {

class CModulePropertyPages final : public IPropertyPageFactory
{
public:
    std::unique_ptr<pages::CPropertyPage> Create(PageSlot, const PageServices &, QWidget *) const override
    {
        return nullptr;
    }
};

} // namespace

const IPropertyPageFactory &ModulePropertyPages()
{
    static const CModulePropertyPages pages;
    return pages;
}

} // namespace cv::vek::rovo::configdialog
