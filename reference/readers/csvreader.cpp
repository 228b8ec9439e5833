// The CSV reader (Parselet "CSV"):
//
//   # key = value          properties of the file      } before the header,
//   ## key = value         properties of the group     } in any order
//   time,speed             the header: one channel per field
//   #unit,s,km/h           right after the header: a property of each channel
//   0,12.5                 data rows, as many fields as channels
//
// Fields may be quoted ("a, b" with "" for a quote); blank lines are
// skipped anywhere; a '#' line before the header without '=' is a comment.

#include "reference/readers/tablereader.h"

#include <cstring>

namespace sorvik::readers {

namespace {

enum class SplitError
{
    None,
    Unterminated,
    TextAfterQuote,
};

const char *Describe(SplitError error)
{
    return error == SplitError::Unterminated ? "a quoted field does not end on its line"
                                             : "text follows the closing quote of a field";
}

bool IsFieldBlank(char c)
{
    return c == ' ' || c == '\t';
}

// Walks the fields of a line, handing each to onField (unquoted fields as
// they stand, quoted ones without their quotes and with "" made ").
template <typename OnField>
SplitError SplitFields(std::string_view line, OnField &&onField)
{
    std::size_t at = 0;
    std::string quoted;
    for (;;) {
        while (at < line.size() && IsFieldBlank(line[at]))
            ++at;
        if (at < line.size() && line[at] == '"') {
            quoted.clear();
            ++at;
            for (;;) {
                const std::size_t quote = line.find('"', at);
                if (quote == std::string_view::npos)
                    return SplitError::Unterminated;
                quoted.append(line.substr(at, quote - at));
                at = quote + 1;
                if (at < line.size() && line[at] == '"') {
                    quoted.push_back('"');
                    ++at;
                    continue;
                }
                break;
            }
            while (at < line.size() && IsFieldBlank(line[at]))
                ++at;
            if (at < line.size() && line[at] != ',')
                return SplitError::TextAfterQuote;
            onField(std::string_view(quoted));
        } else {
            const std::size_t comma = std::min(line.find(',', at), line.size());
            onField(line.substr(at, comma - at));
            at = comma;
        }
        if (at >= line.size())
            return SplitError::None;
        ++at; // the comma
        if (at == line.size()) {
            onField(std::string_view());
            return SplitError::None;
        }
    }
}

class CsvReader final : public TableReader
{
protected:
    void Line(std::string_view line) override
    {
        if (IsBlank(line))
            return;
        switch (m_part) {
        case Part::Preamble:
            Preamble(line);
            break;
        case Part::ChannelProperties:
            if (line.front() == '#') {
                ChannelProperties(line.substr(1));
                break;
            }
            m_part = Part::Rows;
            [[fallthrough]];
        case Part::Rows:
            Row(line);
            break;
        }
    }

    void End() override
    {
        if (m_part == Part::Preamble)
            FailFile(LineNumber() == 0 ? "the file is empty" : "there is no header line");
    }

private:
    enum class Part
    {
        Preamble,
        ChannelProperties,
        Rows,
    };

    void Preamble(std::string_view line)
    {
        if (line.front() != '#') {
            Header(line);
            return;
        }
        const bool group = line.size() > 1 && line[1] == '#';
        const std::string_view assignment = line.substr(group ? 2 : 1);
        const std::size_t equals = assignment.find('=');
        if (equals == std::string_view::npos)
            return; // a comment
        SetProperty(group ? m_content.groupProperties : m_content.fileProperties, assignment.substr(0, equals),
                    assignment.substr(equals + 1));
    }

    void Header(std::string_view line)
    {
        Check(SplitFields(line, [this](std::string_view name) { AddChannel(name); }));
        m_part = Part::ChannelProperties;
    }

    void ChannelProperties(std::string_view line)
    {
        std::string key;
        std::size_t field = 0;
        Check(SplitFields(line, [&](std::string_view value) {
            if (field == 0) {
                key = std::string(Trim(value));
                if (key.empty())
                    Fail("a channel property line without a property name");
            } else if (field > m_content.channels.size()) {
                Fail("the channel property line has more values than there are channels");
            } else {
                SetProperty(m_content.channels[field - 1].properties, key, value);
            }
            ++field;
        }));
    }

    void Row(std::string_view line)
    {
        if (line.front() == '#')
            Fail("a property line after the data rows");
        std::size_t fields = 0;
        if (!std::memchr(line.data(), '"', line.size())) {
            fields = 1;
            for (const char *at = line.data(), *end = line.data() + line.size();
                 (at = static_cast<const char *>(std::memchr(at, ',', std::size_t(end - at)))) != nullptr; ++at)
                ++fields;
        } else {
            Check(SplitFields(line, [&fields](std::string_view) { ++fields; }));
        }
        if (fields != m_content.channels.size())
            Fail("the row has " + std::to_string(fields) + " values, the header names " +
                 std::to_string(m_content.channels.size()) + " channels");
        ++m_content.rows;
    }

    void Check(SplitError error) const
    {
        if (error != SplitError::None)
            Fail(Describe(error));
    }

    Part m_part = Part::Preamble;
};

} // namespace

std::unique_ptr<TableReader> NewCsvReader()
{
    return std::make_unique<CsvReader>();
}

} // namespace sorvik::readers
