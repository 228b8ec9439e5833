#include "reference/libsupport/refobject.h"

namespace sorvik::ref {

namespace {
thread_local std::u16string t_lastError;
}

void Fail(std::int32_t code, std::u16string text)
{
    throw Failure{code, std::move(text)};
}

void SetLastErrorText(std::u16string text)
{
    t_lastError = std::move(text);
}

const std::u16string &LastErrorText()
{
    return t_lastError;
}

} // namespace sorvik::ref
