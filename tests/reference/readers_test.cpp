// The CSV and TextTable readers and the data types of property values:
// what a file holds, whatever pieces its bytes arrive in, and every kind of
// malformed file refused with the line that is to blame.

#include "reference/readers/tablereader.h"

#include <gtest/gtest.h>

#include <optional>
#include <string>

namespace {

using namespace sorvik::readers;

struct Outcome
{
    std::optional<TableContent> content;
    std::string error;
};

// Reads text with a reader, fed in pieces of the given size (0: at once).
Outcome Read(const char *parselet, std::string_view text, std::size_t piece = 0)
{
    auto reader = MakeReader(parselet);
    Outcome outcome;
    try {
        if (piece == 0) {
            reader->Feed(text);
        } else {
            for (std::size_t at = 0; at < text.size(); at += piece)
                reader->Feed(text.substr(at, piece));
        }
        outcome.content = reader->Finish();
    } catch (const ReadError &error) {
        outcome.error = error.text;
    }
    return outcome;
}

std::string Describe(const std::vector<Property> &properties)
{
    std::string text;
    for (const Property &property : properties)
        text += property.name + "=" + property.value + ":" + std::to_string(int(property.type)) + ";";
    return text;
}

std::string Channels(const TableContent &content)
{
    std::string text;
    for (const Channel &channel : content.channels)
        text += channel.name + "[" + Describe(channel.properties) + "]";
    return text;
}

TEST(DataType, ValuesAreIntegerNumericTimeOrString)
{
    const std::pair<const char *, DataType> rows[] = {
        {"42", DataType::Integer},
        {"-7", DataType::Integer},
        {"+7", DataType::Integer},
        {"9223372036854775807", DataType::Integer},
        {"9223372036854775808", DataType::Numeric},
        {"12.5", DataType::Numeric},
        {"-.5", DataType::Numeric},
        {"5.", DataType::Numeric},
        {"1e3", DataType::Numeric},
        {"6.02E+23", DataType::Numeric},
        {"2024-03-01T10:00", DataType::Time},
        {"2024-03-01T10:00:59Z", DataType::Time},
        {"2024-02-29T23:59:59.125+01:00", DataType::Time},
        {"2024-03-01T10:00:00-0530", DataType::Time},
        {"2023-02-29T10:00:00", DataType::String},
        {"2024-03-01T24:00", DataType::String},
        {"2024-03-01", DataType::String},
        {"2024-03-01 10:00", DataType::String},
        {"", DataType::String},
        {"e3", DataType::String},
        {"1e", DataType::String},
        {".", DataType::String},
        {"inf", DataType::String},
        {"nan", DataType::String},
        {"0x10", DataType::String},
        {"km/h", DataType::String},
    };
    for (const auto &[value, type] : rows)
        EXPECT_EQ(Classify(value), type) << value;
}

TEST(DataType, AMixtureOfNumbersIsNumericAnyOtherAString)
{
    EXPECT_EQ(Combine(DataType::Integer, DataType::Integer), DataType::Integer);
    EXPECT_EQ(Combine(DataType::Integer, DataType::Numeric), DataType::Numeric);
    EXPECT_EQ(Combine(DataType::Numeric, DataType::Integer), DataType::Numeric);
    EXPECT_EQ(Combine(DataType::Time, DataType::Time), DataType::Time);
    EXPECT_EQ(Combine(DataType::Time, DataType::Integer), DataType::String);
    EXPECT_EQ(Combine(DataType::Numeric, DataType::String), DataType::String);
}

constexpr std::string_view kCsv = "# title = Run 12\r\n"
                                   "## rate = 100\n"
                                   "# a comment without a value\n"
                                   "# started = 2024-03-01T10:00:00Z\n"
                                   "\n"
                                   "time, \"speed, measured\",temp\n"
                                   "#unit,s,km/h,\n"
                                   "#gain,1,2.5,3\n"
                                   "0,12.5,20\n"
                                   "\n"
                                   "1,\"13\",20.5";

TEST(CsvReader, ReadsPropertiesHeaderChannelPropertiesAndRows)
{
    const Outcome outcome = Read("CSV", kCsv);
    ASSERT_TRUE(outcome.content) << outcome.error;
    const TableContent &content = *outcome.content;
    EXPECT_EQ(Describe(content.fileProperties), "title=Run 12:3;started=2024-03-01T10:00:00Z:2;");
    EXPECT_EQ(Describe(content.groupProperties), "rate=100:0;");
    EXPECT_EQ(Channels(content), "time[unit=s:3;gain=1:0;]speed, measured[unit=km/h:3;gain=2.5:1;]temp[gain=3:0;]");
    EXPECT_EQ(content.rows, 2u);
}

TEST(CsvReader, WhatItReadsDoesNotDependOnHowTheBytesArrive)
{
    const Outcome whole = Read("csv", kCsv);
    ASSERT_TRUE(whole.content);
    for (std::size_t piece : {1, 2, 3, 7, 64}) {
        const Outcome pieces = Read("csv", kCsv, piece);
        ASSERT_TRUE(pieces.content) << piece << ": " << pieces.error;
        EXPECT_EQ(Channels(*pieces.content), Channels(*whole.content));
        EXPECT_EQ(Describe(pieces.content->fileProperties), Describe(whole.content->fileProperties));
        EXPECT_EQ(pieces.content->rows, whole.content->rows);
    }
}

TEST(CsvReader, HeaderOnlyIsAGroupWithoutRowsAndALaterValueReplacesAnEarlierOne)
{
    const Outcome outcome = Read("CSV", "\xEF\xBB\xBF# a = 1\n# a = x\n# b =   \na,b\n");
    ASSERT_TRUE(outcome.content) << outcome.error;
    EXPECT_EQ(Describe(outcome.content->fileProperties), "a=x:3;") << "b has no value, so it is not carried";
    EXPECT_EQ(Channels(*outcome.content), "a[]b[]");
    EXPECT_EQ(outcome.content->rows, 0u);
}

TEST(CsvReader, MalformedFilesAreRefusedWithTheLineToBlame)
{
    const std::pair<std::string, std::string> rows[] = {
        {"", "the file is empty"},
        {"# only = properties\n\n", "there is no header line"},
        {"a,b\n1,2\n3\n", "line 3: the row has 1 values, the header names 2 channels"},
        {"a,b\n1,2,3\n", "line 2: the row has 3 values"},
        {"a,,c\n", "line 1: channel 2 has no name"},
        {"a,b\n#unit,s,m,x\n", "line 2: the channel property line has more values than there are channels"},
        {"a,b\n#,s,m\n", "line 2: a channel property line without a property name"},
        {"a,b\n1,2\n#unit,s,m\n", "line 3: a property line after the data rows"},
        {"a,\"b\n", "line 1: a quoted field does not end on its line"},
        {"a,\"b\"c\n", "line 1: text follows the closing quote"},
        {"# = nameless\na\n", "line 1: a property without a name"},
        {std::string("a,b\n1,\0\n", 8), "line 2: binary data"},
        {"# t = caf\xC3\n", "line 1: the text is not UTF-8"},
        {"# t = \xED\xA0\x80\n", "line 1: the text is not UTF-8"},
        {"# t = \xC0\xAF\n", "line 1: the text is not UTF-8"},
        {"a\n" + std::string(kMaxLineBytes + 2, '1') + "\n", "line 2: the line is longer than 1048576 bytes"},
    };
    for (const auto &[text, error] : rows) {
        for (std::size_t piece : {std::size_t(0), std::size_t(5)}) {
            const Outcome outcome = Read("CSV", text, piece);
            EXPECT_FALSE(outcome.content) << text.substr(0, 40);
            EXPECT_EQ(outcome.error.substr(0, error.size()), error) << text.substr(0, 40);
        }
    }
}

TEST(CsvReader, AHostileFileCostsNoMoreThanItsLimits)
{
    std::string manyChannels = "c";
    for (std::size_t i = 0; i < kMaxChannels; ++i)
        manyChannels += ",c";
    Outcome outcome = Read("CSV", manyChannels + "\n");
    EXPECT_EQ(outcome.error, "line 1: more than 65536 channels");

    std::string manyProperties;
    for (std::size_t i = 0; i <= kMaxElementProperties; ++i)
        manyProperties += "# p" + std::to_string(i) + " = 1\n";
    outcome = Read("CSV", manyProperties + "a\n");
    EXPECT_EQ(outcome.error, "line 1025: more than 1024 properties of one element");
}

constexpr std::string_view kTextTable = "title: Run 12\n"
                                        "date: 2024-03-01T10:00:00\n"
                                        "gain:\t2.5\n"
                                        "\n"
                                        "\n"
                                        "time speed\ttemp\n"
                                        "0 12.5  20\n"
                                        "\n"
                                        "1\t13 20.5\r\n";

TEST(TextTableReader, ReadsTheHeaderBlockChannelNamesAndRows)
{
    for (std::size_t piece : {0, 1, 4}) {
        const Outcome outcome = Read("TextTable", kTextTable, piece);
        ASSERT_TRUE(outcome.content) << outcome.error;
        EXPECT_EQ(Describe(outcome.content->fileProperties), "title=Run 12:3;date=2024-03-01T10:00:00:2;gain=2.5:1;");
        EXPECT_TRUE(outcome.content->groupProperties.empty());
        EXPECT_EQ(Channels(*outcome.content), "time[]speed[]temp[]");
        EXPECT_EQ(outcome.content->rows, 2u);
    }
    const Outcome bare = Read("texttable", "\nx y\n");
    ASSERT_TRUE(bare.content) << "no properties, no rows: " << bare.error;
    EXPECT_EQ(Channels(*bare.content), "x[]y[]");
}

TEST(TextTableReader, MalformedFilesAreRefusedWithTheLineToBlame)
{
    const std::pair<std::string, std::string> rows[] = {
        {"", "the file is empty"},
        {"title: x\n", "the header block does not end with a blank line"},
        {"title: x\n\n\n", "there is no line of channel names"},
        {"time speed\n0 1\n", "line 1: a header line must read \"key: value\""},
        {": x\n\na\n", "line 1: a property without a name"},
        {"\na b\n1 2 3\n", "line 3: the row has 3 values, the channel line names 2 channels"},
        {std::string("\na\n\0\n", 5), "line 3: binary data"},
        {"t: \xFF\n\na\n", "line 1: the text is not UTF-8"},
    };
    for (const auto &[text, error] : rows) {
        const Outcome outcome = Read("TextTable", text);
        EXPECT_FALSE(outcome.content) << text;
        EXPECT_EQ(outcome.error.substr(0, error.size()), error) << text;
    }
}

TEST(Readers, OnlyCsvAndTextTableHaveOne)
{
    EXPECT_TRUE(HasReader("CSV"));
    EXPECT_TRUE(HasReader("texttable"));
    EXPECT_FALSE(HasReader("HDF5"));
    EXPECT_EQ(MakeReader("qdm"), nullptr);
}

} // namespace
