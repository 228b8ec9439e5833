#pragma once

// The host's dialog font in place of a template's font.

#include "sharedsource/dialogtemplate.h"
#include "sorvik/logfont.h"

namespace sharedsource {

// The face a template gets when the dialog supplies no font.
inline constexpr char16_t kFallbackFace[] = u"MS Sans Serif";

// Point size of a font height in pixels at dotsPerInch: -(height x 72 / dpi),
// rounded to nearest (halves away from zero).
int PointSizeOf(std::int32_t height, int dotsPerInch);

// Sets the template's face and point size from font; without a font the
// face becomes the fallback face and the template keeps its point size.
void SubstituteFont(DialogTemplate &dialogTemplate, const LOGFONTW *font, int dotsPerInch);

// The font description of a Qt font at dotsPerInch, as a host passes it.
LOGFONTW ToLogFont(const QFont &font, int dotsPerInch);

} // namespace sharedsource
