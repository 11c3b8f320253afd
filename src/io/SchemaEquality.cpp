#include "io/SchemaEquality.h"

#include "io/ISchema.h"

#include <functional>
#include <string_view>

namespace KVR {
namespace IO {

namespace {

using SchemaComparison = bool (*)(const ISchema&, const ISchema&);

bool SamePlainMembers(const ISchema& left, const ISchema& right)
{
    return left.Type == right.Type && left.Role == right.Role && left.Count == right.Count;
}

bool SameSubSchemas(const ISchema& left, const ISchema& right, SchemaComparison same)
{
    if (left.SubSchemas.size() != right.SubSchemas.size()) {
        return false;
    }
    for (std::size_t i = 0; i < left.SubSchemas.size(); ++i) {
        const ISchema::SubSchema& leftPart = left.SubSchemas[i];
        const ISchema::SubSchema& rightPart = right.SubSchemas[i];
        if (leftPart.first != rightPart.first || !same(leftPart.second, rightPart.second)) {
            return false;
        }
    }
    return true;
}

class VHash
{
public:
    void Add(std::uint64_t number)
    {
        // Multiplying mixes upwards only and the table looks at the low bits, hence the shift.
        state = (state ^ number) * 0x9E3779B97F4A7C15u;
        state ^= state >> 32;
    }

    void Add(const std::string& text)
    {
        // Most names of a schema are empty, and the library's hash is a call.
        Add(text.empty() ? 0 : std::hash<std::string_view>()(text));
    }

    std::uint64_t Result() const { return state; }

private:
    std::uint64_t state = 0;
};

} // namespace

bool StrictlyEqual(const ISchema& left, const ISchema& right)
{
    return SamePlainMembers(left, right) && left.TypeName == right.TypeName &&
           left.EnumValues == right.EnumValues && SameSubSchemas(left, right, &StrictlyEqual);
}

bool RoleAwareEqual(const ISchema& left, const ISchema& right)
{
    if (!SamePlainMembers(left, right)) {
        return false;
    }
    // Deliberate: the type name of a value is not compared. Stores hold values whose type was
    // renamed between releases, and writers under the new name must still reach them.
    if (left.Role != ERole::Value && left.TypeName != right.TypeName) {
        return false;
    }
    return left.EnumValues == right.EnumValues && SameSubSchemas(left, right, &RoleAwareEqual);
}

std::uint64_t StrictHash(const ISchema& schema)
{
    VHash hash;
    hash.Add(static_cast<std::uint64_t>(schema.Type) |
             static_cast<std::uint64_t>(schema.Role) << 8 |
             static_cast<std::uint64_t>(schema.Count) << 16);
    hash.Add(schema.TypeName);
    // The lengths keep apart what would else run together, such as an entry and a part.
    hash.Add(schema.EnumValues.size() << 32 | schema.SubSchemas.size());
    for (const ISchema::EnumValue& entry : schema.EnumValues) {
        hash.Add(entry.first);
        hash.Add(static_cast<std::uint32_t>(entry.second));
    }
    for (const ISchema::SubSchema& part : schema.SubSchemas) {
        hash.Add(part.first);
        hash.Add(StrictHash(part.second));
    }
    return hash.Result();
}

} // namespace IO
} // namespace KVR
