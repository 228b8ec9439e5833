#include "dunemere/utf8codec.h"

#include <cstdint>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace cv::vek::rovo {

namespace {

constexpr char16_t kReplacement = u'\uFFFD';

bool IsContinuation(std::uint8_t b)
{
    return (b & 0xC0) == 0x80;
}

// Bounds of the second byte, which rule out overlong forms, surrogates and
// code points above U+10FFFF.
bool SecondByteValid(std::uint8_t lead, std::uint8_t second)
{
    switch (lead) {
    case 0xE0:
        return second >= 0xA0 && second <= 0xBF;
    case 0xED:
        return second >= 0x80 && second <= 0x9F;
    case 0xF0:
        return second >= 0x90 && second <= 0xBF;
    case 0xF4:
        return second >= 0x80 && second <= 0x8F;
    default:
        return IsContinuation(second);
    }
}

std::size_t SequenceLength(std::uint8_t lead)
{
    if (lead >= 0xC2 && lead <= 0xDF)
        return 2;
    if (lead >= 0xE0 && lead <= 0xEF)
        return 3;
    if (lead >= 0xF0 && lead <= 0xF4)
        return 4;
    return 0;
}

// Copies a run of ASCII bytes; returns how many were copied.
std::size_t CopyAscii(const std::uint8_t *in, std::size_t size, char16_t *out) noexcept
{
    std::size_t i = 0;
#if defined(__SSE2__)
    const __m128i zero = _mm_setzero_si128();
    for (; i + 16 <= size; i += 16) {
        const __m128i bytes = _mm_loadu_si128(reinterpret_cast<const __m128i *>(in + i));
        if (_mm_movemask_epi8(bytes) != 0)
            break;
        _mm_storeu_si128(reinterpret_cast<__m128i *>(out + i), _mm_unpacklo_epi8(bytes, zero));
        _mm_storeu_si128(reinterpret_cast<__m128i *>(out + i + 8), _mm_unpackhi_epi8(bytes, zero));
    }
#endif
    for (; i < size && in[i] < 0x80; ++i)
        out[i] = in[i];
    return i;
}

} // namespace

Utf8Progress DecodeUtf8(std::string_view utf8, bool final, char16_t *out) noexcept
{
    const auto *in = reinterpret_cast<const std::uint8_t *>(utf8.data());
    const std::size_t size = utf8.size();
    std::size_t i = 0;
    std::size_t o = 0;
    while (i < size) {
        const std::size_t ascii = CopyAscii(in + i, size - i, out + o);
        i += ascii;
        o += ascii;
        if (i == size)
            break;

        const std::uint8_t lead = in[i];
        const std::size_t length = SequenceLength(lead);
        if (length == 0) {
            out[o++] = kReplacement;
            ++i;
            continue;
        }
        // Count the bytes that still fit a valid sequence.
        std::size_t valid = 1;
        while (valid < length && i + valid < size &&
               (valid == 1 ? SecondByteValid(lead, in[i + 1]) : IsContinuation(in[i + valid])))
            ++valid;
        if (valid < length) {
            if (i + valid == size && !final)
                break; // cut by the end of this piece: wait for the rest
            out[o++] = kReplacement;
            i += valid;
            continue;
        }
        std::uint32_t code = lead & (0x7F >> length);
        for (std::size_t k = 1; k < length; ++k)
            code = code << 6 | (in[i + k] & 0x3F);
        if (code >= 0x10000) {
            code -= 0x10000;
            out[o++] = char16_t(0xD800 | code >> 10);
            out[o++] = char16_t(0xDC00 | (code & 0x3FF));
        } else {
            out[o++] = char16_t(code);
        }
        i += length;
    }
    return {i, o};
}

std::u16string Utf8ToUtf16(std::string_view utf8)
{
    // Never more UTF-16 units than UTF-8 bytes.
    std::u16string text(utf8.size(), u'\0');
    const Utf8Progress progress = DecodeUtf8(utf8, true, text.data());
    text.resize(progress.written);
    return text;
}

std::string Utf16ToUtf8(std::u16string_view text)
{
    std::string utf8;
    AppendUtf8(text, utf8);
    return utf8;
}

void AppendUtf8(std::u16string_view text, std::string &utf8)
{
    // At most three bytes per unit: a surrogate pair is two units, four bytes.
    const std::size_t start = utf8.size();
    utf8.resize(start + 3 * text.size());
    char *out = utf8.data() + start;
    for (std::size_t i = 0; i < text.size(); ++i) {
        std::uint32_t code = text[i];
        if (code < 0x80) {
            *out++ = char(code);
            continue;
        }
        if (code >= 0xD800 && code <= 0xDFFF) {
            const bool pair = code <= 0xDBFF && i + 1 < text.size() && text[i + 1] >= 0xDC00 && text[i + 1] <= 0xDFFF;
            if (pair)
                code = 0x10000 + ((code - 0xD800) << 10) + (text[++i] - 0xDC00);
            else
                code = kReplacement;
        }
        if (code < 0x800) {
            *out++ = char(0xC0 | code >> 6);
        } else if (code < 0x10000) {
            *out++ = char(0xE0 | code >> 12);
            *out++ = char(0x80 | (code >> 6 & 0x3F));
        } else {
            *out++ = char(0xF0 | code >> 18);
            *out++ = char(0x80 | (code >> 12 & 0x3F));
            *out++ = char(0x80 | (code >> 6 & 0x3F));
        }
        *out++ = char(0x80 | (code & 0x3F));
    }
    utf8.resize(std::size_t(out - utf8.data()));
}

} // namespace cv::vek::rovo
