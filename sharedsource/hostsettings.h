#pragma once

// What the host gives the module's windows: its dialog font and its help.

#include "sharedsource/help.h"
#include "sorvik/logfont.h"

#include <optional>

namespace sharedsource {

struct HostSettings
{
    std::optional<LOGFONTW> font; // none: a template keeps its size in the fallback face
    HelpTarget help;
};

} // namespace sharedsource
