#include "serverlibs/sorvikcalls.h"

#include "entry/errors/statuscall.h"
#include "serverlibs/objectcall.h"

namespace cv::vek::rovo::serverlibs {

using krn::RefPtr;
using krn::WString;

WString SorvikName(cv::rovo::ISorvik &sorvik)
{
    return CallWithStatus([&](std::int32_t *status) { return sorvik.GetSorvikName(status); });
}

RefPtr<cv::rovo::IConfigurationView> GetConfigurationView(cv::rovo::ISorvik &sorvik)
{
    return AdoptWithStatus([&](std::int32_t *status) { return sorvik.GetConfigurationView(status); });
}

RefPtr<cv::rovo::IConfigurationEditor> GetConfigurationEditor(cv::rovo::ISorvik &sorvik)
{
    return AdoptWithStatus([&](std::int32_t *status) { return sorvik.GetConfigurationEditor(status); });
}

RefPtr<cv::rovo::IIndexManager> GetIndexManager(cv::rovo::ISorvik &sorvik)
{
    return AdoptWithStatus([&](std::int32_t *status) { return sorvik.GetIndexManager(status); });
}

void ImportConfiguration(cv::rovo::IConfigurationView &view, const WString &file,
                         cv::rovo::IConfigurationEditor &editor)
{
    CallWithStatus([&](std::int32_t *status) { view.ImportConfiguration(file, &editor, status); });
}

void ExportConfiguration(cv::rovo::IConfigurationView &view, const WString &file,
                         cv::rovo::IConfigurationEditor &editor)
{
    CallWithStatus([&](std::int32_t *status) { view.ExportConfiguration(file, &editor, status); });
}

void WaitForUpdate(cv::rovo::IIndexManager &indexManager)
{
    CallWithStatus([&](std::int32_t *status) { indexManager.WaitForUpdate(status); });
}

} // namespace cv::vek::rovo::serverlibs
