// The entry points of librovoApi.so.

#include "reference/rovoapi/objects.h"

extern "C" {

SORVIK_EXPORT void Init(void)
{
    sorvik::rovo::TakeUse();
}

SORVIK_EXPORT void Cleanup(void)
{
    sorvik::rovo::ReleaseUse();
}

SORVIK_EXPORT cv::rovo::IRovoEnvironment *rovoCreateEnvironment(cv::vekex::IEnvironment *dataStore,
                                                                std::int32_t *status)
{
    return sorvik::ref::Guarded(sorvik::rovo::kCodes, status,
                                [&] { return sorvik::rovo::NewEnvironment(dataStore); });
}

SORVIK_EXPORT void rovoGetLastErrorText(cv::krn::WString *text)
{
    if (text)
        *text = cv::krn::WString(sorvik::ref::LastErrorText());
}
}
