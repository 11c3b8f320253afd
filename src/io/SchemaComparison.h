#pragma once

#include "io/ISchema.h"

#include <cstddef>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace KVR {
namespace IO {

/// True for the three types that store an enum.
constexpr bool IsEnumType(EType type)
{
    return type >= EType::Enum8 && type <= EType::Enum32;
}

/// True if a value stored as the one type can be read as the other: as the same, or where the
/// current number holds every stored one; and a `Float64` as a `Float32`, with its loss.
///
/// Deliberate: `Void` and `Ref` are not readable as themselves, since neither stores anything.
/// [any]
bool IsReadableAs(EType storedType, EType currentType);

/// Says in words what changed between the schema of a stored value and the current one. The value
/// can be read if no error was added.
///
/// @param warnings  receives a line for each change that does not hinder reading
/// @param errors    receives a line for each change that does
/// @param path      names the place in the value, in front of each line; empty at the top [any]
void CompareSchemas(const ISchema& stored, const ISchema& current,
                    std::vector<std::string>& warnings, std::vector<std::string>& errors,
                    const std::string& path = std::string());

namespace Detail {

constexpr std::size_t NoMember = ~std::size_t{0};

/// Finds the members of a tuple, by the exact name and of equal ones the first.
///
/// The schema must outlive it and not change. Threads: a plain value.
class VMemberIndex
{
public:
    explicit VMemberIndex(const ISchema& schema);

    /// Returns the index of the member, or NoMember.
    std::size_t Find(const std::string& name) const;

private:
    std::unordered_map<std::string_view, std::size_t> indices;
};

} // namespace Detail
} // namespace IO
} // namespace KVR
