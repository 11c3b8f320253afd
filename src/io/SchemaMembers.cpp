#include "io/SchemaMembers.h"

namespace KVR {
namespace IO {

const std::array<SchemaMember, SchemaMemberCount>& DescribeSchemaMembers()
{
    static constexpr std::array<SchemaMember, SchemaMemberCount> members{{
        {"Type", "Type represented by this ISchema"},
        {"Role", "Role of the type represented by this schema"},
        {"Detail", "For future use. May store extra info useful for code generation or "
                   "interpretation. Not used in equality tests."},
        {"Count", "Repetition of sub schema if type is a fixed size array"},
        {"TypeName",
         "Qualified name of the Class, Enum or Function (if applicable) - not currently "
         "used in schema comparison or equality tests."},
        {"EnumValues", "legal enum values if type is an enum."},
        {"SubSchemas", "Schemas for any sub types. (e.g. type in list, types in tuple etc.)"},
        {"Docs",
         "Documentation strings associated with the schema. First entry is the type "
         "documentation. Remaining entries are the enum value or named tuple member docs in "
         "the order they appear in m_EnumValues or m_SubSchemas."},
    }};
    return members;
}

} // namespace IO
} // namespace KVR
