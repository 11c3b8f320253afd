#include "io/SchemaShape.h"

#include "io/ISchema.h"

#include <algorithm>

namespace KVR {
namespace IO {
namespace Detail {

bool IsWellFormed(const ISchema& schema)
{
    const bool needsOnePart = schema.Type == EType::Array || schema.Type == EType::List;
    if (needsOnePart && schema.SubSchemas.size() != 1) {
        return false;
    }
    return std::all_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                       [](const ISchema::SubSchema& part) { return IsWellFormed(part.second); });
}

bool TakesNoBytes(const ISchema& schema)
{
    if (schema.Type == EType::Void || (schema.Type == EType::Array && schema.Count == 0)) {
        return true;
    }
    const bool ownBytes = schema.Type < EType::Array || schema.Type == EType::List ||
                          (schema.Type >= EType::Enum8 && schema.Type <= EType::Enum32);
    return !ownBytes &&
           std::all_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                       [](const ISchema::SubSchema& part) { return TakesNoBytes(part.second); });
}

} // namespace Detail
} // namespace IO
} // namespace KVR
