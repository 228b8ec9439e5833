// Feeds arbitrary bytes to the INI reader and asks for what the registry
// and velos.ini readers ask for: every value found is trimmed, every number
// is one, and each name of the input finds the value it was first given.

#include "krn/osdep/inifile.h"
#include "krn/utf.h"

#include <cstdlib>
#include <string>
#include <string_view>

namespace {

using cv::krn::osdep::IniFile;

void Require(bool condition)
{
    if (!condition)
        std::abort();
}

bool IsBlank(char16_t c)
{
    return c == u' ' || c == u'\t' || c == u'\r';
}

void CheckValue(const IniFile &ini, std::u16string_view section, std::u16string_view name)
{
    const auto value = ini.Value(section, name);
    if (value && !value->empty())
        Require(!IsBlank(value->front()) && !IsBlank(value->back()));
    const auto number = ini.UnsignedValue(section, name);
    if (number)
        Require(value.has_value());
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const std::string_view text(reinterpret_cast<const char *>(data), size);
    const IniFile ini = IniFile::Parse(text);

    // What the product libraries read.
    CheckValue(ini, u"Software\\Corvane\\Common\\Sorvik", u"binDir");
    CheckValue(ini, u"Software\\Corvane\\Common\\Sorvik\\ConfigItems", u"rovoCommDllClient");
    CheckValue(ini, u"Software\\Corvane\\Common\\Sorvik\\Services", u"VEK_INDEX_SERVICE");
    CheckValue(ini, u"Shared", u"LocalAdapterCacheTimeoutSeconds");
    CheckValue(ini, u"Network", u"HostName");

    // Whatever the input names itself: "[s]" followed by "n=" lines.
    const std::u16string wide = cv::krn::ToUtf16(text);
    const auto open = wide.find(u'[');
    const auto close = wide.find(u']', open == std::u16string::npos ? 0 : open);
    const auto equals = wide.find(u'=', close == std::u16string::npos ? 0 : close);
    if (open != std::u16string::npos && close != std::u16string::npos && equals != std::u16string::npos) {
        const auto lineStart = wide.rfind(u'\n', equals);
        const std::size_t nameStart = lineStart == std::u16string::npos ? 0 : lineStart + 1;
        if (nameStart < equals)
            CheckValue(ini, std::u16string_view(wide).substr(open + 1, close - open - 1),
                       std::u16string_view(wide).substr(nameStart, equals - nameStart));
    }
    return 0;
}
