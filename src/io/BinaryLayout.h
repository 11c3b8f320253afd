#pragma once

#include "io/ISchema.h"

#include <cstdint>
#include <cstring>
#include <string>
#include <type_traits>
#include <vector>

namespace KVR {
namespace IO {
namespace Detail {

// Values are packed with no padding, all numbers in the machine's order. Files move between
// machines, so that order must be the one that they hold.
static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "values are stored little-endian");

/// Appends the bytes of a number at its own width.
template <typename T>
void AppendNumber(std::vector<unsigned char>& bytes, T number)
{
    static_assert(std::is_arithmetic<T>::value && !std::is_same<T, bool>::value,
                  "a bool is appended as an std::uint8_t of 0 or 1");
    unsigned char packed[sizeof(T)];
    std::memcpy(packed, &number, sizeof(T));
    bytes.insert(bytes.end(), packed, packed + sizeof(T));
}

/// Appends a text as length and characters, without a terminator.
///
/// @return false, with nothing appended, if the length does not fit 32 bits
bool AppendString(std::vector<unsigned char>& bytes, const std::string& text);

/// Appends the number of an enum at the width of its type, of which it keeps the low bits.
///
/// @return false, with nothing appended, if `type` is no enum
bool AppendEnum(std::vector<unsigned char>& bytes, EType type, std::int32_t number);

} // namespace Detail
} // namespace IO
} // namespace KVR
