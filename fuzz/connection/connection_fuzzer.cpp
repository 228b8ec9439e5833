// Feeds arbitrary text (UTF-8, or UTF-16LE after the mark FF FE) to both
// readers of connection texts. Each either reads it or, for the reference
// library, refuses it with InvalidConnection and a text saying where.

#include "reference/libsupport/refobject.h"
#include "reference/rovoapi/connection.h"
#include "serverlibs/opensorvik.h"
#include "sorvik/rovoapi.h"

#include <QString>

#include <cstdlib>
#include <cstring>
#include <string>

namespace {

std::u16string Decode(const std::uint8_t *data, std::size_t size)
{
    if (size >= 2 && data[0] == 0xFF && data[1] == 0xFE) {
        std::u16string text((size - 2) / 2, u'\0');
        std::memcpy(text.data(), data + 2, text.size() * sizeof(char16_t));
        return text;
    }
    return QString::fromUtf8(reinterpret_cast<const char *>(data), qsizetype(size)).toStdU16String();
}

void Require(bool condition)
{
    if (!condition)
        std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const std::u16string text = Decode(data, size);
    using cv::vek::rovo::serverlibs::SorvikKind;
    const SorvikKind kind = cv::vek::rovo::serverlibs::KindOfConnection(text);
    Require(kind == SorvikKind::Desktop || kind == SorvikKind::Valdorn);
    Require(kind == SorvikKind::Desktop || text.find(u"valdorn") != std::u16string::npos);

    try {
        const sorvik::rovo::Connection connection = sorvik::rovo::ParseConnection(QString::fromStdU16String(text));
        // Every value comes from inside an element.
        Require(!text.empty() || connection.SorvikName().isEmpty());
        Require(connection.SorvikName().size() <= qsizetype(text.size()));
    } catch (const sorvik::ref::Failure &failure) {
        Require(failure.code == cv::rovo::status::InvalidConnection && !failure.text.empty());
    }
    return 0;
}
