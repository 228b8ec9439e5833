// Feeds arbitrary text to the settings parser: UTF-8, or UTF-16LE when the
// input starts with the byte-order mark FF FE. The parser configures a log
// (which writes nothing here, as no line is logged) and must leave settings
// that agree with themselves.

#include "dunemere/config.h"
#include "dunemere/taggedtext.h"
#include "krn/utf.h"
#include "log/ilogimp.h"

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
    return cv::krn::ToUtf16(std::string_view(reinterpret_cast<const char *>(data), size));
}

// Nothing may be looked up while fuzzing.
bool OnlyThisHost(std::u16string_view host)
{
    return host == u"thishost";
}

void Require(bool condition)
{
    if (!condition)
        std::abort();
}

bool HasOuterBlank(const std::u16string &text)
{
    const auto blank = [](char16_t c) { return c == u' ' || c == u'\t'; };
    return !text.empty() && (blank(text.front()) || blank(text.back()));
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const std::u16string text = Decode(data, size);

    cv::util::file::log::ILogImp log;
    const PLUGIN::Config config(text, &log, OnlyThisHost);
    const PLUGIN::Config again(text, nullptr, OnlyThisHost);

    Require(config.GetSettings() == text);
    Require(config.GetServer() == again.GetServer() && config.GetPortName() == again.GetPortName());
    Require(config.GetQueryTimeout() == again.GetQueryTimeout());
    Require(!config.IsLocalServer() || config.GetPortName().empty());
    Require(!config.CanStartEngine() || (config.IsLocalServer() && config.GetStartEngine()));
    Require(!HasOuterBlank(config.GetServer()) && !HasOuterBlank(config.GetPortName()));
    Require((log.GetOutputFlags() & cv::util::file::log::kOutputAdditionalSwitch) == 0);

    PLUGIN::TaggedText tagged(text);
    for (const char16_t *name : {u"server", u"logfile", u""}) {
        if (const auto element = tagged.Find(name))
            Require(!HasOuterBlank(element->content));
    }
    return 0;
}
