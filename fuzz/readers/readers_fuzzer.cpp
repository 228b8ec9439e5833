// Feeds arbitrary bytes as a file to both readers, once whole and once in
// pieces of a size taken from the first byte. Each must refuse the file or
// read it, the same way both times, and what it reads must keep its limits.

#include "reference/readers/tablereader.h"

#include <cstdlib>
#include <optional>
#include <string>

namespace {

using namespace sorvik::readers;

void Require(bool condition)
{
    if (!condition)
        std::abort();
}

struct Outcome
{
    std::optional<TableContent> content;
    std::string error;
};

Outcome Read(const char *parselet, std::string_view file, std::size_t piece)
{
    auto reader = MakeReader(parselet);
    Outcome outcome;
    try {
        for (std::size_t at = 0; at < file.size(); at += piece)
            reader->Feed(file.substr(at, piece));
        outcome.content = reader->Finish();
    } catch (const ReadError &error) {
        outcome.error = error.text;
    }
    return outcome;
}

bool SameProperties(const std::vector<Property> &a, const std::vector<Property> &b)
{
    if (a.size() != b.size())
        return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        if (a[i].name != b[i].name || a[i].value != b[i].value || a[i].type != b[i].type)
            return false;
    }
    return true;
}

void CheckLimits(const TableContent &content)
{
    std::size_t properties = content.fileProperties.size() + content.groupProperties.size();
    Require(!content.channels.empty() && content.channels.size() <= kMaxChannels);
    for (const Channel &channel : content.channels) {
        Require(!channel.name.empty());
        Require(channel.properties.size() <= kMaxElementProperties);
        properties += channel.properties.size();
    }
    Require(properties <= kMaxFileProperties);
    for (const auto *element : {&content.fileProperties, &content.groupProperties}) {
        for (const Property &property : *element)
            Require(!property.name.empty() && !property.value.empty() && Classify(property.value) == property.type);
    }
}

void Compare(const Outcome &whole, const Outcome &pieces)
{
    Require(whole.content.has_value() == pieces.content.has_value());
    Require(whole.error == pieces.error);
    if (!whole.content)
        return;
    const TableContent &a = *whole.content, &b = *pieces.content;
    Require(a.rows == b.rows && a.channels.size() == b.channels.size());
    Require(SameProperties(a.fileProperties, b.fileProperties) && SameProperties(a.groupProperties, b.groupProperties));
    for (std::size_t i = 0; i < a.channels.size(); ++i)
        Require(a.channels[i].name == b.channels[i].name &&
                SameProperties(a.channels[i].properties, b.channels[i].properties));
    CheckLimits(a);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const std::string_view file(reinterpret_cast<const char *>(data), size);
    const std::size_t piece = size == 0 ? 1 : 1 + data[0] % 97;
    for (const char *parselet : {"CSV", "TextTable"}) {
        const Outcome whole = Read(parselet, file, file.size() + 1);
        Require(whole.content.has_value() != !whole.error.empty());
        Compare(whole, Read(parselet, file, piece));
    }
    return 0;
}
