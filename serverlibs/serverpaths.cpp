#include "serverlibs/serverpaths.h"

#include "krn/nocase.h"

namespace cv::vek::rovo::serverlibs {

namespace {

std::u16string WithSeparator(std::u16string_view path)
{
    std::u16string result(path);
    if (!IsSeparator(result.back()))
        result += SeparatorOf(path);
    return result;
}

} // namespace

char16_t SeparatorOf(std::u16string_view path)
{
    return path.find(u'\\') != path.npos ? u'\\' : u'/';
}

bool IsSeparator(char16_t c)
{
    return c == u'\\' || c == u'/';
}

std::u16string_view WithoutTrailingSeparator(std::u16string_view path)
{
    if (path.size() > 1 && IsSeparator(path.back()))
        path.remove_suffix(1);
    return path;
}

std::u16string_view WithoutLeadingSeparator(std::u16string_view path)
{
    if (!path.empty() && IsSeparator(path.front()))
        path.remove_prefix(1);
    return path;
}

bool IsFolderPrefix(std::u16string_view outer, std::u16string_view inner)
{
    if (outer.empty() || inner.empty())
        return false;
    return krn::StartsWithNoCase(WithSeparator(inner), WithSeparator(outer));
}

std::u16string_view LastComponent(std::u16string_view path)
{
    path = WithoutTrailingSeparator(path);
    const auto last = path.find_last_of(u"\\/");
    return last == path.npos ? path : path.substr(last + 1);
}

std::u16string JoinPath(std::u16string_view folder, std::u16string_view relative, char16_t separator)
{
    std::u16string joined(folder);
    relative = WithoutLeadingSeparator(relative);
    if (!joined.empty() && !relative.empty() && !IsSeparator(joined.back()))
        joined += separator;
    joined.append(relative);
    return joined;
}

} // namespace cv::vek::rovo::serverlibs
