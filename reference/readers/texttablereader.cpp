// The TextTable reader (Parselet "TextTable"):
//
//   title: Run 12          the header block: properties of the file
//   operator: Ada
//                          a blank line ends the header block
//   time speed temp        the channel names, separated by blanks or tabs
//   0    12.5  20.1        data rows, as many values as channels
//
// A file without properties starts with the blank line. Blank lines after
// the header block are skipped.

#include "reference/readers/tablereader.h"

namespace sorvik::readers {

namespace {

bool IsSeparator(char c)
{
    return c == ' ' || c == '\t';
}

template <typename OnField>
void SplitWords(std::string_view line, OnField &&onField)
{
    std::size_t at = 0;
    for (;;) {
        while (at < line.size() && IsSeparator(line[at]))
            ++at;
        if (at == line.size())
            return;
        const std::size_t start = at;
        while (at < line.size() && !IsSeparator(line[at]))
            ++at;
        onField(line.substr(start, at - start));
    }
}

class TextTableReader final : public TableReader
{
protected:
    void Line(std::string_view line) override
    {
        switch (m_part) {
        case Part::HeaderBlock:
            HeaderLine(line);
            break;
        case Part::ChannelNames:
            if (!IsBlank(line)) {
                SplitWords(line, [this](std::string_view name) { AddChannel(name); });
                m_part = Part::Rows;
            }
            break;
        case Part::Rows:
            if (!IsBlank(line))
                Row(line);
            break;
        }
    }

    void End() override
    {
        if (LineNumber() == 0)
            FailFile("the file is empty");
        if (m_part == Part::HeaderBlock)
            FailFile("the header block does not end with a blank line");
        if (m_part == Part::ChannelNames)
            FailFile("there is no line of channel names");
    }

private:
    enum class Part
    {
        HeaderBlock,
        ChannelNames,
        Rows,
    };

    void HeaderLine(std::string_view line)
    {
        if (IsBlank(line)) {
            m_part = Part::ChannelNames;
            return;
        }
        const std::size_t colon = line.find(':');
        if (colon == std::string_view::npos)
            Fail("a header line must read \"key: value\"");
        SetProperty(m_content.fileProperties, line.substr(0, colon), line.substr(colon + 1));
    }

    void Row(std::string_view line)
    {
        std::size_t fields = 0;
        SplitWords(line, [&fields](std::string_view) { ++fields; });
        if (fields != m_content.channels.size())
            Fail("the row has " + std::to_string(fields) + " values, the channel line names " +
                 std::to_string(m_content.channels.size()) + " channels");
        ++m_content.rows;
    }

    Part m_part = Part::HeaderBlock;
};

} // namespace

std::unique_ptr<TableReader> NewTextTableReader()
{
    return std::make_unique<TextTableReader>();
}

} // namespace sorvik::readers
