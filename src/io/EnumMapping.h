#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace KVR {
namespace IO {

struct ISchema;

/// The number under which each stored number of an enum is known today.
using EnumMapping = std::map<std::int32_t, std::int32_t>;

/// Replaces `mapping` by one from the numbers of a stored enum to those of the current one. Entries
/// are matched by name, so that numbers may change freely; "LEGACY_" at the front of a name marks
/// one that is kept for old data only, and does not count.
///
/// An empty mapping means that every number stays as it is.
///
/// @param errors  receives a line for each stored name that has no current number, and for each
///                whose number the current type cannot store; what it held before does not matter
/// @return true if no line was added [any]
bool BuildEnumMapping(const ISchema& stored, const ISchema& current, EnumMapping& mapping,
                      std::vector<std::string>& errors);

} // namespace IO
} // namespace KVR
