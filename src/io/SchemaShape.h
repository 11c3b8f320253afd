#pragma once

#include <cstdint>

namespace KVR {
namespace IO {

struct ISchema;

namespace Detail {

/// True if every Array and List in the schema, at any depth, has exactly one part. A value of any
/// other schema has no layout.
bool IsWellFormed(const ISchema& schema);

/// True if a value takes no bytes at all, such as that of a tuple without members. Only for such
/// parts does a count promise more elements than the bytes can hold.
bool TakesNoBytes(const ISchema& schema);

/// How many elements without bytes an Array or a List may have where each costs text.
constexpr std::uint32_t MostElementsWithoutBytes = std::uint32_t{1} << 20;

} // namespace Detail
} // namespace IO
} // namespace KVR
