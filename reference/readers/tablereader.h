#pragma once

// What the indexer learns from one file of a table format, and the readers
// that learn it. A reader is fed the file's bytes as they arrive and told
// when the file ends; anything it cannot accept raises ReadError, so a
// malformed file costs the reader and nothing else.

#include "reference/readers/datatype.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace sorvik::readers {

// Names and values are UTF-8, trimmed of blanks and tabs; a property with an
// empty value is not carried at all.
struct Property
{
    std::string name;
    std::string value;
    DataType type = DataType::String;
};

struct Channel
{
    std::string name;
    std::vector<Property> properties;
};

// One file holds one channel group.
struct TableContent
{
    std::vector<Property> fileProperties;
    std::vector<Property> groupProperties;
    std::vector<Channel> channels;
    std::uint64_t rows = 0;
};

struct ReadError
{
    std::string text; // "line 7: ..." when a line is to blame
};

// Limits that keep a hostile file from costing more than a normal one.
inline constexpr std::size_t kMaxLineBytes = std::size_t(1) << 20;
inline constexpr std::size_t kMaxChannels = 65536;
inline constexpr std::size_t kMaxElementProperties = 1024; // of one file, group or channel
inline constexpr std::size_t kMaxFileProperties = 65536;   // of all elements of one file together

class TableReader
{
public:
    virtual ~TableReader() = default;
    TableReader(const TableReader &) = delete;
    TableReader &operator=(const TableReader &) = delete;

    // The next bytes of the file, in any pieces. Raises ReadError.
    void Feed(std::string_view bytes);
    // The file has ended: what it holds. Raises ReadError.
    TableContent Finish();

protected:
    TableReader() = default;

    // One line without its line end, checked: at most kMaxLineBytes, valid
    // UTF-8 (a byte-order mark at the start removed), no NUL byte.
    virtual void Line(std::string_view line) = 0;
    // After the last line.
    virtual void End() = 0;

    [[noreturn]] void Fail(std::string_view what) const; // names the current line
    [[noreturn]] static void FailFile(std::string_view what);
    std::uint64_t LineNumber() const { return m_line; }

    // Sets (or replaces) a property of one element; an empty value is left out.
    void SetProperty(std::vector<Property> &element, std::string_view name, std::string_view value);
    void AddChannel(std::string_view name);

    TableContent m_content;

private:
    void Process(std::string_view line);
    [[noreturn]] void FailLongLine() const;

    std::string m_partial; // a line whose end has not arrived
    std::uint64_t m_line = 0;
    std::size_t m_properties = 0;
};

// Blanks and tabs.
std::string_view Trim(std::string_view text);
bool IsBlank(std::string_view text);

// The reader of a Parselet ("CSV" or "TextTable", case ignored); null for a
// Parselet this server has no reader for.
std::unique_ptr<TableReader> MakeReader(std::string_view parselet);
bool HasReader(std::string_view parselet);

std::unique_ptr<TableReader> NewCsvReader();
std::unique_ptr<TableReader> NewTextTableReader();

} // namespace sorvik::readers
