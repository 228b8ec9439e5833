#pragma once

// Which pages the properties dialog shows, and who makes them: the module's
// own pages, or a test's.

#include "pages/propertypage.h"
#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"

#include <memory>

namespace cv::vek::rovo::configdialog {

// The pages in the order they are made and shown.
enum class PageSlot
{
    SearchAreas,
    Parselets,
    FileExtensions,
    Indexer,
    Advanced,
};
inline constexpr PageSlot kPageSlots[] = {PageSlot::SearchAreas, PageSlot::Parselets, PageSlot::FileExtensions,
                                          PageSlot::Indexer, PageSlot::Advanced};

// The server objects a page is made with.
struct PageServices
{
    krn::RefPtr<cv::rovo::IConfigurationView> view;
    krn::RefPtr<cv::rovo::IConfigurationEditor> editor;
    krn::RefPtr<cv::rovo::IIndexManager> indexManager; // the Advanced page's; may be null
};

class IPropertyPageFactory
{
public:
    // The page of slot as a child of parent (the tab control), not yet built
    // from its template; null for a slot this factory has no page for.
    virtual std::unique_ptr<pages::CPropertyPage> Create(PageSlot slot, const PageServices &services,
                                                         QWidget *parent) const = 0;

protected:
    ~IPropertyPageFactory() = default;
};

// The module's pages.
const IPropertyPageFactory &ModulePropertyPages();

} // namespace cv::vek::rovo::configdialog
