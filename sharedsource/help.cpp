#include "sharedsource/help.h"

#include "sorvik/bstr.h"

namespace sharedsource {

bool ShowHelp(const HelpTarget &target, std::u16string_view topic)
{
    if (!target.callback)
        return false;
    const BSTR text = SysAllocStringLen(topic.data(), static_cast<std::uint32_t>(topic.size()));
    if (!text)
        return false;
    // The string goes even if the host's callback throws.
    struct Free
    {
        BSTR text;
        ~Free() { SysFreeString(text); }
    } owner{text};
    target.callback(text, target.context);
    return true;
}

} // namespace sharedsource
