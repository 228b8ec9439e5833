#pragma once

// The host's help: a topic key handed to the host's callback as a newly
// allocated counted string, freed again once the callback returns.

#include "sorvik/serverdialogs.h"

#include <cstdint>
#include <string_view>

namespace sharedsource {

struct HelpTarget
{
    SorvikHelpCallback callback = nullptr; // null: no help offered
    std::uintptr_t context = 0;
};

// False when there is no callback (nothing happens then).
bool ShowHelp(const HelpTarget &target, std::u16string_view topic);

} // namespace sharedsource
