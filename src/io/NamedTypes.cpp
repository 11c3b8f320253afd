#include "io/NamedTypes.h"

#include "io/ISchema.h"

#include <algorithm>
#include <string>

namespace KVR {
namespace IO {

namespace {

constexpr std::size_t mostLevels = 256;
constexpr std::size_t mostParts = std::size_t{1} << 16;

const ISchema* FindType(const std::vector<ISchema>& dictionary, const std::string& name)
{
    const auto found = std::find_if(dictionary.begin(), dictionary.end(),
                                    [&](const ISchema& type) { return type.TypeName == name; });
    return found == dictionary.end() ? nullptr : &*found;
}

void BecomeReference(ISchema& schema)
{
    schema.Type = EType::Ref;
    schema.EnumValues.clear();
    schema.SubSchemas.clear();
    schema.Docs.clear();
}

ISchema MakeEntry(const ISchema& schema)
{
    ISchema entry = schema;
    entry.Count = 0;
    if (entry.Role > ERole::Callback) {
        entry.Role = ERole::Value;
    }
    return entry;
}

/// Resolves one schema, and knows the names that it is in the middle of.
class VResolution
{
public:
    explicit VResolution(const std::vector<ISchema>& dictionary_) : dictionary(dictionary_) {}

    bool Resolve(ISchema& schema, std::size_t level)
    {
        if (!openNames.empty() && (level > mostLevels || ++partsOfTypes > mostParts)) {
            return false;
        }
        if (schema.Type != EType::Ref) {
            return ResolveParts(schema, level);
        }
        const std::string name = schema.TypeName;
        if (!Replace(schema)) {
            return false;
        }
        openNames.push_back(name);
        const bool resolved = ResolveParts(schema, level);
        openNames.pop_back();
        return resolved;
    }

private:
    bool Replace(ISchema& schema)
    {
        const ISchema* const type = FindType(dictionary, schema.TypeName);
        const bool holdsItself =
            std::find(openNames.begin(), openNames.end(), schema.TypeName) != openNames.end();
        if (type == nullptr || type->Type == EType::Ref || holdsItself) {
            return false;
        }
        schema.Type = type->Type;
        schema.EnumValues = type->EnumValues;
        schema.SubSchemas = type->SubSchemas;
        schema.Docs = type->Docs;
        return true;
    }

    bool ResolveParts(ISchema& schema, std::size_t level)
    {
        for (ISchema::SubSchema& part : schema.SubSchemas) {
            if (!Resolve(part.second, level + 1)) {
                return false;
            }
        }
        return true;
    }

    const std::vector<ISchema>& dictionary;
    std::vector<std::string> openNames;
    std::size_t partsOfTypes = 0; // what is written out in the schema itself is not counted
};

} // namespace

std::size_t ExtractNamedTypes(ISchema& schema, std::vector<ISchema>& dictionary, bool& changed)
{
    changed = false;
    const bool isNamed = !schema.TypeName.empty();
    if (isNamed && FindType(dictionary, schema.TypeName) != nullptr) {
        BecomeReference(schema);
        return 0;
    }

    std::size_t count = 0;
    for (ISchema::SubSchema& part : schema.SubSchemas) {
        bool partChanged = false;
        count += ExtractNamedTypes(part.second, dictionary, partChanged);
    }

    // Deliberate: the dictionary is not searched again. A type within a type of the same name gives
    // two entries of that name, of which the inner one is found.
    if (isNamed && schema.Type != EType::Ref) {
        dictionary.push_back(MakeEntry(schema));
        BecomeReference(schema);
        changed = true;
        ++count;
    }
    return count;
}

bool ResolveNamedTypes(ISchema& schema, const std::vector<ISchema>& dictionary)
{
    return VResolution(dictionary).Resolve(schema, 1);
}

} // namespace IO
} // namespace KVR
