#pragma once

#include <vector>

namespace KVR {
namespace IO {

struct ISchema;

/// Replaces `result` by the value that `bytes` hold under `stored`, as a value of the current
/// schema. For tools that move values of types they do not have; who has the type reads it with an
/// evolving reader. Unlike that one, this maps enums of every width.
///
/// The schemas must have passed CompareSchemas without an error. A new member becomes 0 or empty, a
/// new enum its first entry.
///
/// @return false, with `result` in whatever state it reached, if the bytes are not exactly one
/// value,
///         if an enum holds a number that has no place in the current one, if a schema has no
///         layout, and for a value of more than 256 MiB [any]
bool ConvertValue(const ISchema& stored, const std::vector<unsigned char>& bytes,
                  const ISchema& current, std::vector<unsigned char>& result);

} // namespace IO
} // namespace KVR
