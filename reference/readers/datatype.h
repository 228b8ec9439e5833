#pragma once

// The data type of a property, found from its values.

#include <cstdint>
#include <string_view>

namespace sorvik::readers {

enum class DataType : std::uint8_t
{
    Integer = 0, // [+-]digits that fit 64 bits
    Numeric = 1, // a decimal number with a fraction or an exponent (or an integer too large for 64 bits)
    Time = 2,    // an ISO 8601 date-time: YYYY-MM-DDTHH:MM[:SS[.fraction]][Z|+HH:MM|-HH:MM]
    String = 3,  // anything else
};

// The type of one value (already trimmed).
DataType Classify(std::string_view value);

// The type of a property whose values have the types a and b: integers and
// numbers are numeric together; any other mixture is a string.
DataType Combine(DataType a, DataType b);

} // namespace sorvik::readers
