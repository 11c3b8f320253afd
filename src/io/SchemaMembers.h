#pragma once

#include <array>
#include <cstddef>

namespace KVR {
namespace IO {

/// The members of ISchema in the order of the record, which is also the order in which its text is
/// written and looked up.
enum class ESchemaMember : std::size_t {
    Type = 0,
    Role = 1,
    Detail = 2,
    Count = 3,
    TypeName = 4,
    EnumValues = 5,
    SubSchemas = 6,
    Docs = 7,
};

constexpr std::size_t SchemaMemberCount = 8;

/// One member of ISchema, with the description that the record carries of itself.
struct SchemaMember
{
    const char* Name;
    const char* Description;
};

/// Returns the members of ISchema, indexed by ESchemaMember. [any]
const std::array<SchemaMember, SchemaMemberCount>& DescribeSchemaMembers();

} // namespace IO
} // namespace KVR
