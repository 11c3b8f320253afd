#pragma once

#include <cstdint>

namespace KVR {
namespace IO {

struct ISchema;

/// True if two schemas have the same type, role, count, type name, enum entries and parts, the
/// parts by their names and by this same equality. The order of entries and of parts counts;
/// `Detail` and `Docs` never do. Interned schemas are folded by it. [any]
bool StrictlyEqual(const ISchema& left, const ISchema& right);

/// As StrictlyEqual, but the type name counts only where the role is not `Value`. The data store
/// refuses a write by it, so that renaming the type of a stored value does not lock out its old
/// writers, while two functions of different names stay different. [any]
bool RoleAwareEqual(const ISchema& left, const ISchema& right);

/// Returns a hash over exactly the members that StrictlyEqual compares. It is stable for the
/// life of the process only: never store it. [any]
std::uint64_t StrictHash(const ISchema& schema);

} // namespace IO
} // namespace KVR
