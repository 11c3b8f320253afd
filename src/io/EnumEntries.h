#pragma once

#include "io/ISchema.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>

namespace KVR {
namespace IO {
namespace Detail {

/// Finds entries of enums while one value is converted; of equal ones the first.
///
/// A few are looked for one by one. From then on there is an index, since a file may hold a great
/// list of a great enum, in which each value would look at every entry. The schemas must outlive
/// it and not change. Threads: one thread.
class VEnumEntries
{
public:
    /// Returns the entry of this name, null if there is none.
    const ISchema::EnumValue* FindName(const ISchema& schema, const std::string& name);

    /// Returns the entry of this number, null if there is none.
    const ISchema::EnumValue* FindNumber(const ISchema& schema, std::int32_t number);

private:
    template <typename Key>
    using VIndex = std::unordered_map<Key, const ISchema::EnumValue*>;

    bool IsFew(const ISchema& schema);

    std::size_t compared = 0; // entries, while there was no index
    std::unordered_map<const ISchema*, VIndex<std::string_view>> names;
    std::unordered_map<const ISchema*, VIndex<std::int32_t>> numbers;
};

} // namespace Detail
} // namespace IO
} // namespace KVR
