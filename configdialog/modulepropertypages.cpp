#include "configdialog/propertypagefactory.h"

#include "pages/configuredlg.h"

namespace cv::vek::rovo::configdialog {

namespace {

// The pages that exist so far; the other slots stay empty and show no tab.
class CModulePropertyPages final : public IPropertyPageFactory
{
public:
    std::unique_ptr<pages::CPropertyPage> Create(PageSlot slot, const PageServices &services,
                                                 QWidget *parent) const override
    {
        switch (slot) {
        case PageSlot::SearchAreas:
            return std::make_unique<pages::CConfigureDlg>(services.view, services.editor, parent);
        case PageSlot::Parselets:
        case PageSlot::FileExtensions:
        case PageSlot::Indexer:
        case PageSlot::Advanced:
            break;
        }
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
