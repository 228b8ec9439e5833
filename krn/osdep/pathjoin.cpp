#include "krn/osdep/pathjoin.h"

namespace cv::krn::osdep {

namespace {

template<typename Char>
bool IsSeparator(Char c)
{
    return c == Char('/') || c == Char('\\');
}

template<typename Char>
bool IsAbsolute(std::basic_string_view<Char> file)
{
    if (!file.empty() && IsSeparator(file.front()))
        return true;
    if (file.size() < 2 || file[1] != Char(':'))
        return false;
    const Char drive = file[0];
    return (drive >= Char('A') && drive <= Char('Z')) || (drive >= Char('a') && drive <= Char('z'));
}

template<typename Char>
std::basic_string<Char> Join(std::basic_string_view<Char> folder, std::basic_string_view<Char> file)
{
    if (folder.empty() || IsAbsolute(file))
        return std::basic_string<Char>(file);
    std::basic_string<Char> joined(folder);
    if (!IsSeparator(folder.back()))
        joined += folder.find(Char('\\')) != folder.npos ? Char('\\') : Char('/');
    joined += file;
    return joined;
}

} // namespace

std::u16string PathJoin(std::u16string_view folder, std::u16string_view file)
{
    return Join(folder, file);
}

std::string PathJoin(std::string_view folder, std::string_view file)
{
    return Join(folder, file);
}

} // namespace cv::krn::osdep
