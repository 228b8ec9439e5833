#include "entry/errors/raiseerror.h"

#include <string>

namespace cv::vek {

void RaiseError(std::u16string_view message, std::int32_t code, std::u16string_view source, int line)
{
    krn::WString text(source);
    const std::string number = std::to_string(line);
    text += u'(';
    text += std::u16string(number.begin(), number.end());
    text += u"): ";
    text += message;
    throw Exception(code, std::move(text));
}

const char16_t *RequireString(const char16_t *text)
{
    if (!text)
        RaiseError(u"string parameter must not be NULL", errors::InvalidParameter, u"", 42);
    return text;
}

} // namespace cv::vek
