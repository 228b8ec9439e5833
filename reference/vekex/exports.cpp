// The entry points of libvekex.so.

#include "reference/vekex/objects.h"

extern "C" {

SORVIK_EXPORT void Init(void)
{
    sorvik::vekex::TakeUse();
}

SORVIK_EXPORT void Cleanup(void)
{
    sorvik::vekex::ReleaseUse();
}

SORVIK_EXPORT cv::vekex::IEnvironment *vekGetEnvironment(std::int32_t kind, const cv::krn::WString &name,
                                                         std::uint32_t, std::int32_t *status)
{
    return sorvik::ref::Guarded(sorvik::vekex::kCodes, status, [&]() -> cv::vekex::IEnvironment * {
        if (kind != cv::vekex::kEnvironmentDesktop && kind != cv::vekex::kEnvironmentValdorn)
            sorvik::ref::Fail(cv::vekex::status::InvalidArgument, u"unknown environment kind");
        if (!name.empty())
            sorvik::ref::Fail(cv::vekex::status::NotFound, u"only the default (unnamed) environment exists");
        return sorvik::vekex::NewEnvironment(kind);
    });
}

SORVIK_EXPORT cv::vekex::IContainer *vekCreateContainer(std::int32_t *status)
{
    return sorvik::ref::Guarded(sorvik::vekex::kCodes, status, [] { return sorvik::vekex::NewContainer(); });
}

SORVIK_EXPORT cv::vekex::IInstList *vekCreateInstList(std::int32_t *status)
{
    return sorvik::ref::Guarded(sorvik::vekex::kCodes, status, [] { return sorvik::vekex::NewInstList(); });
}

SORVIK_EXPORT cv::vekex::IContainerList *vekCreateContainerList(std::int32_t *status)
{
    return sorvik::ref::Guarded(sorvik::vekex::kCodes, status, [] { return sorvik::vekex::NewContainerList(); });
}

SORVIK_EXPORT void vekGetLastErrorText(cv::krn::WString *text)
{
    if (text)
        *text = cv::krn::WString(sorvik::ref::LastErrorText());
}
}
