#include "Variant/Interning.h"

#include "Variant/InterningTable.h"

#include <array>

namespace KVR {
namespace IO {

namespace {

constexpr std::size_t typeCount = static_cast<std::size_t>(EType::Ref) + 1;

using PlainSchemas = std::array<ISchema, typeCount>;

const PlainSchemas* MakePlainSchemas()
{
    auto schemas = std::make_unique<PlainSchemas>();
    for (std::size_t i = 0; i < schemas->size(); ++i) {
        (*schemas)[i].Type = static_cast<EType>(i);
    }
    return schemas.release();
}

// Neither table is ever destroyed: values live in static objects and in threads that outlive main.

const ISchema& PlainSchema(EType type)
{
    static const PlainSchemas& schemas = *MakePlainSchemas();
    return schemas[static_cast<std::size_t>(type)];
}

VInterningTable& Table()
{
    static VInterningTable& table = *new VInterningTable;
    return table;
}

bool IsPlain(const ISchema& schema)
{
    return schema.Type <= EType::Ref && schema.Role == ERole::Value && schema.Count == 0 &&
           schema.TypeName.empty() && schema.EnumValues.empty() && schema.SubSchemas.empty();
}

} // namespace

const ISchema& GetUniqueSchema(const ISchema& schema)
{
    return IsPlain(schema) ? PlainSchema(schema.Type) : Table().Intern(schema);
}

const ISchema& GetUniquePodSchema(EType type)
{
    if (type <= EType::Ref) {
        return PlainSchema(type);
    }
    ISchema schema;
    schema.Type = type;
    return Table().Intern(schema);
}

} // namespace IO
} // namespace KVR
