#include "sharedsource/dialogfont.h"

#include <QFont>

#include <algorithm>
#include <cmath>
#include <cstring>

namespace sharedsource {

int PointSizeOf(std::int32_t height, int dotsPerInch)
{
    if (dotsPerInch <= 0)
        dotsPerInch = 96;
    return static_cast<int>(std::lround(-static_cast<double>(height) * 72.0 / dotsPerInch));
}

void SubstituteFont(DialogTemplate &dialogTemplate, const LOGFONTW *font, int dotsPerInch)
{
    if (!font) {
        dialogTemplate.fontFace = QString::fromUtf16(kFallbackFace);
        return;
    }
    const auto face = std::u16string_view(font->lfFaceName,
                                          std::find(font->lfFaceName, font->lfFaceName + LF_FACESIZE, u'\0') -
                                              font->lfFaceName);
    dialogTemplate.fontFace = QString::fromUtf16(face.data(), qsizetype(face.size()));
    // A height of 0 asks for the default size; a non-negative size means the
    // host gave a cell height, which Qt cannot use as such: keep the template's.
    const int points = PointSizeOf(font->lfHeight, dotsPerInch);
    if (points > 0)
        dialogTemplate.pointSize = points;
}

LOGFONTW ToLogFont(const QFont &font, int dotsPerInch)
{
    LOGFONTW result;
    std::memset(&result, 0, sizeof result);
    const double points = font.pointSizeF() > 0 ? font.pointSizeF() : 9.0;
    result.lfHeight = -static_cast<std::int32_t>(std::lround(points * dotsPerInch / 72.0));
    result.lfWeight = font.bold() ? 700 : 400;
    result.lfItalic = font.italic() ? 1 : 0;
    const QString family = font.family().left(LF_FACESIZE - 1);
    std::memcpy(result.lfFaceName, family.utf16(), sizeof(char16_t) * std::size_t(family.size()));
    return result;
}

} // namespace sharedsource
