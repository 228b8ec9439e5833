#include "reference/readers/tablereader.h"

#include <QByteArrayView>
#include <QStringDecoder>

#include <cstring>

namespace sorvik::readers {

namespace {

constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";

bool IsAscii(std::string_view text)
{
    std::size_t at = 0;
    for (; at + 8 <= text.size(); at += 8) {
        std::uint64_t word;
        std::memcpy(&word, text.data() + at, sizeof word);
        if (word & 0x8080808080808080ull)
            return false;
    }
    for (; at < text.size(); ++at) {
        if (static_cast<unsigned char>(text[at]) >= 0x80)
            return false;
    }
    return true;
}

bool IsUtf8(std::string_view text)
{
    if (IsAscii(text))
        return true;
    QStringDecoder decoder(QStringDecoder::Utf8, QStringDecoder::Flag::Stateless);
    [[maybe_unused]] const QString decoded = decoder.decode(QByteArrayView(text.data(), qsizetype(text.size())));
    return !decoder.hasError();
}

bool EqualsIgnoringCase(std::string_view a, std::string_view b)
{
    if (a.size() != b.size())
        return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? char(c - 'A' + 'a') : c; };
        if (lower(a[i]) != lower(b[i]))
            return false;
    }
    return true;
}

} // namespace

std::string_view Trim(std::string_view text)
{
    const auto blank = [](char c) { return c == ' ' || c == '\t'; };
    while (!text.empty() && blank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && blank(text.back()))
        text.remove_suffix(1);
    return text;
}

bool IsBlank(std::string_view text)
{
    return Trim(text).empty();
}

void TableReader::Feed(std::string_view bytes)
{
    while (!bytes.empty()) {
        const auto *end = static_cast<const char *>(std::memchr(bytes.data(), '\n', bytes.size()));
        if (!end) {
            if (m_partial.size() + bytes.size() > kMaxLineBytes + 1)
                FailLongLine();
            m_partial.append(bytes);
            return;
        }
        const std::string_view piece(bytes.data(), std::size_t(end - bytes.data()));
        if (m_partial.empty()) {
            Process(piece);
        } else {
            if (m_partial.size() + piece.size() > kMaxLineBytes + 1)
                FailLongLine();
            m_partial.append(piece);
            Process(m_partial);
            m_partial.clear();
        }
        bytes.remove_prefix(piece.size() + 1);
    }
}

TableContent TableReader::Finish()
{
    if (!m_partial.empty()) {
        Process(m_partial);
        m_partial.clear();
    }
    End();
    return std::move(m_content);
}

void TableReader::Process(std::string_view line)
{
    ++m_line;
    if (!line.empty() && line.back() == '\r')
        line.remove_suffix(1);
    if (line.size() > kMaxLineBytes)
        Fail("the line is longer than " + std::to_string(kMaxLineBytes) + " bytes");
    if (m_line == 1 && line.substr(0, kByteOrderMark.size()) == kByteOrderMark)
        line.remove_prefix(kByteOrderMark.size());
    if (std::memchr(line.data(), '\0', line.size()))
        Fail("binary data (a NUL byte)");
    if (!IsUtf8(line))
        Fail("the text is not UTF-8");
    Line(line);
}

void TableReader::Fail(std::string_view what) const
{
    throw ReadError{"line " + std::to_string(m_line) + ": " + std::string(what)};
}

// Refused before the line is whole, so before it is counted.
void TableReader::FailLongLine() const
{
    throw ReadError{"line " + std::to_string(m_line + 1) + ": the line is longer than " +
                    std::to_string(kMaxLineBytes) + " bytes"};
}

void TableReader::FailFile(std::string_view what)
{
    throw ReadError{std::string(what)};
}

void TableReader::SetProperty(std::vector<Property> &element, std::string_view name, std::string_view value)
{
    name = Trim(name);
    value = Trim(value);
    if (name.empty())
        Fail("a property without a name");
    if (value.empty())
        return;
    for (Property &property : element) {
        if (property.name == name) {
            property.value = std::string(value);
            property.type = Classify(value);
            return;
        }
    }
    if (element.size() >= kMaxElementProperties)
        Fail("more than " + std::to_string(kMaxElementProperties) + " properties of one element");
    if (m_properties >= kMaxFileProperties)
        Fail("more than " + std::to_string(kMaxFileProperties) + " properties in one file");
    ++m_properties;
    if (element.empty())
        element.reserve(4);
    element.push_back({std::string(name), std::string(value), Classify(value)});
}

void TableReader::AddChannel(std::string_view name)
{
    name = Trim(name);
    if (name.empty())
        Fail("channel " + std::to_string(m_content.channels.size() + 1) + " has no name");
    if (m_content.channels.size() >= kMaxChannels)
        Fail("more than " + std::to_string(kMaxChannels) + " channels");
    m_content.channels.push_back({std::string(name), {}});
}

std::unique_ptr<TableReader> MakeReader(std::string_view parselet)
{
    if (EqualsIgnoringCase(parselet, "CSV"))
        return NewCsvReader();
    if (EqualsIgnoringCase(parselet, "TextTable"))
        return NewTextTableReader();
    return nullptr;
}

bool HasReader(std::string_view parselet)
{
    return EqualsIgnoringCase(parselet, "CSV") || EqualsIgnoringCase(parselet, "TextTable");
}

} // namespace sorvik::readers
