#include "serverlibs/opensorvik.h"

#include "serverlibs/objectcall.h"

namespace cv::vek::rovo::serverlibs {

namespace {

constexpr std::u16string_view kTypeTag = u"SorvikType";
constexpr std::u16string_view kValdorn = u"valdorn";

bool EndsTag(char16_t c)
{
    return c == u' ' || c == u'\t' || c == u'\n' || c == u'\r' || c == u'>';
}

} // namespace

SorvikKind KindOfConnection(std::u16string_view text)
{
    using size_type = std::u16string_view::size_type;
    size_type pos = 0;
    while ((pos = text.find(u'<', pos)) != text.npos) {
        size_type tagEnd = pos + 1;
        while (tagEnd < text.size() && !EndsTag(text[tagEnd]))
            ++tagEnd;
        const std::u16string_view tag = text.substr(pos + 1, tagEnd - pos - 1);
        const size_type open = text.find(u'>', tagEnd);
        if (open == text.npos)
            return SorvikKind::Desktop;
        if (tag == kTypeTag) {
            const size_type valueStart = open + 1;
            std::u16string closing = u"</";
            closing.append(kTypeTag);
            closing += u'>';
            const size_type valueEnd = text.find(closing, valueStart);
            if (valueEnd != text.npos && text.substr(valueStart, valueEnd - valueStart) == kValdorn)
                return SorvikKind::Valdorn;
            return SorvikKind::Desktop;
        }
        // Continue inside the element, so elements nested in others are seen too.
        pos = open + 1;
    }
    return SorvikKind::Desktop;
}

OpenedSorvik OpenSorvik(const krn::WString &connection, VekexLibrary &vekex, RovoApiLibrary &rovoApi)
{
    OpenedSorvik result;
    if (!connection.empty())
        result.kind = KindOfConnection(connection.view());
    const std::int32_t environmentKind = result.kind == SorvikKind::Valdorn ? cv::vekex::kEnvironmentValdorn
                                                                            : cv::vekex::kEnvironmentDesktop;
    const auto dataStore = vekex.GetEnvironment(environmentKind, krn::WString(), kModuleVersion);
    const auto server = rovoApi.CreateEnvironment(dataStore.get());
    if (!server)
        return result;
    result.sorvik = AdoptWithStatus([&](std::int32_t *status) { return server->OpenSorvik(connection, status); });
    return result;
}

OpenedSorvik OpenSorvik(const krn::WString &connection)
{
    return OpenSorvik(connection, Vekex(), RovoApi());
}

} // namespace cv::vek::rovo::serverlibs
