#include "io/EnumEntries.h"

#include <algorithm>

namespace KVR {
namespace IO {
namespace Detail {

namespace {

using VEntries = std::vector<ISchema::EnumValue>;

template <typename IsSought>
const ISchema::EnumValue* FindOneByOne(const VEntries& entries, IsSought isSought)
{
    const auto found = std::find_if(entries.begin(), entries.end(), isSought);
    return found == entries.end() ? nullptr : &*found;
}

/// Looks a key up in the index of a schema, which is made where there is none.
template <typename Indices, typename Key, typename KeyOf>
const ISchema::EnumValue* FindIndexed(Indices& indices, const ISchema& schema, const Key& key,
                                      KeyOf keyOf)
{
    const auto inserted = indices.try_emplace(&schema);
    auto& index = inserted.first->second;
    if (inserted.second) {
        for (const ISchema::EnumValue& entry : schema.EnumValues) {
            index.emplace(keyOf(entry), &entry); // keeps the first
        }
    }
    const auto found = index.find(key);
    return found == index.end() ? nullptr : found->second;
}

} // namespace

bool VEnumEntries::IsFew(const ISchema& schema)
{
    constexpr std::size_t mostCompared = 1000;
    compared += compared > mostCompared ? 0 : schema.EnumValues.size();
    return compared <= mostCompared;
}

const ISchema::EnumValue* VEnumEntries::FindName(const ISchema& schema, const std::string& name)
{
    if (IsFew(schema)) {
        return FindOneByOne(schema.EnumValues,
                            [&](const ISchema::EnumValue& entry) { return entry.first == name; });
    }
    return FindIndexed(names, schema, std::string_view(name), [](const ISchema::EnumValue& entry) {
        return std::string_view(entry.first);
    });
}

const ISchema::EnumValue* VEnumEntries::FindNumber(const ISchema& schema, std::int32_t number)
{
    if (IsFew(schema)) {
        return FindOneByOne(schema.EnumValues, [&](const ISchema::EnumValue& entry) {
            return entry.second == number;
        });
    }
    return FindIndexed(numbers, schema, number,
                       [](const ISchema::EnumValue& entry) { return entry.second; });
}

} // namespace Detail
} // namespace IO
} // namespace KVR
