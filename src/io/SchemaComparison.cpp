#include "io/SchemaComparison.h"

#include "io/EnumDescription.h"
#include "io/EnumMapping.h"

#include <algorithm>
#include <initializer_list>

namespace KVR {
namespace IO {

namespace {

using TypeList = std::initializer_list<EType>;

bool Holds(EType type, TypeList types)
{
    return std::find(types.begin(), types.end(), type) != types.end();
}

std::string NameOf(EType type)
{
    return DescribeEType().NameOf(static_cast<std::int32_t>(type));
}

/// Walks two schemas together; a step of the walk has a path of its own.
class VSchemaComparison
{
public:
    VSchemaComparison(std::vector<std::string>& warnings_, std::vector<std::string>& errors_)
        : warnings(warnings_), errors(errors_)
    {
    }

    void Compare(const ISchema& stored, const ISchema& current, const std::string& outerPath)
    {
        const std::string path =
            stored.TypeName.empty() ? outerPath : outerPath + "<" + stored.TypeName + ">";
        const std::string typeChange =
            ": Type changed from " + NameOf(stored.Type) + " to " + NameOf(current.Type) + ".";

        if (!IsReadableAs(stored.Type, current.Type)) {
            errors.push_back(path + typeChange);
        } else if (IsEnumType(stored.Type) && IsEnumType(current.Type)) {
            CompareEnums(stored, current, path);
        } else if (stored.Type != current.Type) {
            warnings.push_back(path + typeChange);
        } else if (stored.Type == EType::NamedTuple) {
            CompareMembers(stored, current, path);
        } else if (HasSameLength(stored, current, path)) {
            CompareParts(stored, current, path);
        }
    }

private:
    /// Deliberate: the width of an enum may change without a line, since its names count.
    void CompareEnums(const ISchema& stored, const ISchema& current, const std::string& path)
    {
        EnumMapping mapping;
        std::vector<std::string> lines;
        if (!BuildEnumMapping(stored, current, mapping, lines)) {
            const std::string place = path + ": ";
            for (const std::string& line : lines) {
                errors.push_back(place);
                errors.back() += line;
            }
        } else if (stored.EnumValues != current.EnumValues) {
            warnings.push_back(path + ": Enum was modified");
        }
    }

    bool HasSameLength(const ISchema& stored, const ISchema& current, const std::string& path)
    {
        if (stored.Type == EType::Tuple) {
            return IsSameLength(path + ": Tuple size", stored.SubSchemas.size(),
                                current.SubSchemas.size());
        }
        if (stored.Type == EType::Array) {
            return IsSameLength(path + ": Array length", stored.Count, current.Count);
        }
        return true;
    }

    bool IsSameLength(const std::string& what, std::size_t stored, std::size_t current)
    {
        if (stored != current) {
            errors.push_back(what + " changed from " + std::to_string(stored) + " to " +
                             std::to_string(current) + ".");
        }
        return stored == current;
    }

    void CompareParts(const ISchema& stored, const ISchema& current, const std::string& path)
    {
        const std::size_t count = std::min(stored.SubSchemas.size(), current.SubSchemas.size());
        for (std::size_t i = 0; i < count; ++i) {
            Compare(stored.SubSchemas[i].second, current.SubSchemas[i].second,
                    path + "[" + std::to_string(i) + "]");
        }
    }

    void CompareMembers(const ISchema& stored, const ISchema& current, const std::string& path)
    {
        const Detail::VMemberIndex storedMembers(stored);
        TellRemovedMembers(stored, current, path);
        TellAddedAndMovedMembers(storedMembers, current, path);
        for (const ISchema::SubSchema& member : current.SubSchemas) {
            const std::size_t index = storedMembers.Find(member.first);
            if (index != Detail::NoMember) {
                Compare(stored.SubSchemas[index].second, member.second,
                        member.first.empty() ? path : path + "." + member.first);
            }
        }
    }

    void TellRemovedMembers(const ISchema& stored, const ISchema& current, const std::string& path)
    {
        const Detail::VMemberIndex currentMembers(current);
        for (const ISchema::SubSchema& member : stored.SubSchemas) {
            if (currentMembers.Find(member.first) == Detail::NoMember) {
                warnings.push_back(path + "." + member.first + " member was removed.");
            }
        }
    }

    void TellAddedAndMovedMembers(const Detail::VMemberIndex& stored, const ISchema& current,
                                  const std::string& path)
    {
        bool toldOrder = false;
        std::size_t lastIndex = 0;
        for (const ISchema::SubSchema& member : current.SubSchemas) {
            const std::size_t index = stored.Find(member.first);
            if (index == Detail::NoMember) {
                warnings.push_back(path + "." + member.first + " member was added.");
                continue;
            }
            if (!toldOrder && index < lastIndex) {
                warnings.push_back(path + ": members were re-ordered");
                toldOrder = true;
            }
            lastIndex = index;
        }
    }

    std::vector<std::string>& warnings;
    std::vector<std::string>& errors;
};

} // namespace

// clang-format off
bool IsReadableAs(EType storedType, EType currentType)
{
    using T = EType;
    switch (currentType) {
    case T::Bool: return storedType == T::Bool;
    case T::Int8: return Holds(storedType, {T::Int8, T::Bool});
    case T::Int16: return Holds(storedType, {T::Int16, T::Int8, T::UInt8, T::Bool});
    case T::Int32: return Holds(storedType, {T::Int32, T::Int16, T::UInt16, T::Int8, T::UInt8, T::Bool});
    case T::Int64: return Holds(storedType, {T::Int64, T::Int32, T::UInt32, T::Int16, T::UInt16, T::Int8, T::UInt8, T::Bool});
    case T::UInt8: return Holds(storedType, {T::UInt8, T::Bool});
    case T::UInt16: return Holds(storedType, {T::UInt16, T::UInt8, T::Bool});
    case T::UInt32: return Holds(storedType, {T::UInt32, T::UInt16, T::UInt8, T::Bool});
    case T::UInt64: return Holds(storedType, {T::UInt64, T::UInt32, T::UInt16, T::UInt8, T::Bool});
    case T::Float32: return Holds(storedType, {T::Float32, T::Float64});
    case T::Float64: return Holds(storedType, {T::Float64, T::Float32});
    case T::String:
    case T::Array:
    case T::List:
    case T::Tuple:
    case T::NamedTuple: return storedType == currentType;
    case T::Enum8:
    case T::Enum16:
    case T::Enum32: return IsEnumType(storedType);
    case T::Void:
    case T::Ref: break;
    }
    return false;
}
// clang-format on

void CompareSchemas(const ISchema& stored, const ISchema& current,
                    std::vector<std::string>& warnings, std::vector<std::string>& errors,
                    const std::string& path)
{
    VSchemaComparison(warnings, errors).Compare(stored, current, path);
}

namespace Detail {

VMemberIndex::VMemberIndex(const ISchema& schema)
{
    for (std::size_t i = 0; i < schema.SubSchemas.size(); ++i) {
        indices.emplace(schema.SubSchemas[i].first, i); // keeps the first
    }
}

std::size_t VMemberIndex::Find(const std::string& name) const
{
    const auto found = indices.find(name);
    return found == indices.end() ? NoMember : found->second;
}

} // namespace Detail
} // namespace IO
} // namespace KVR
