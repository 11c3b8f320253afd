#include "io/EnumMapping.h"

#include "io/ISchema.h"

#include <algorithm>
#include <string_view>
#include <unordered_map>

namespace KVR {
namespace IO {

namespace {

using NamesOfValues = std::map<std::int32_t, std::vector<std::string>>;
using NumbersOfNames = std::unordered_map<std::string, std::int32_t>;

constexpr std::int32_t mostOf8Bits = 0xFF;
constexpr std::int32_t mostOf16Bits = 0xFFFF;

/// Deliberate: the prefix goes once, so that a name with two of them keeps one and matches only a
/// name that has it as well.
std::string WithoutLegacyPrefix(const std::string& name)
{
    constexpr std::string_view prefix = "LEGACY_";
    return name.compare(0, prefix.size(), prefix) == 0 ? name.substr(prefix.size()) : name;
}

NamesOfValues NamesByValue(const ISchema& schema)
{
    NamesOfValues names;
    for (const ISchema::EnumValue& entry : schema.EnumValues) {
        names[entry.second].push_back(WithoutLegacyPrefix(entry.first));
    }
    return names;
}

/// Returns the number of each cleaned name, the first of equal ones.
NumbersOfNames NumbersByName(const ISchema& schema)
{
    NumbersOfNames numbers;
    for (const ISchema::EnumValue& entry : schema.EnumValues) {
        numbers.emplace(WithoutLegacyPrefix(entry.first), entry.second);
    }
    return numbers;
}

/// Deliberate: the limits are those of unsigned numbers, and a negative number passes. Old files
/// hold such enums, and it is for the reader to say what a number of 255 in 8 bits is.
bool IsTooLarge(std::int32_t value, EType type)
{
    return (value > mostOf16Bits && type < EType::Enum32) ||
           (value > mostOf8Bits && type < EType::Enum16);
}

void AddLines(const std::vector<std::string>& names, const char* what,
              std::vector<std::string>& errors)
{
    for (const std::string& name : names) {
        errors.push_back("Enum value " + name + what);
    }
}

/// Finds the number of the first of the names that has one.
const std::int32_t* FindNumber(const NumbersOfNames& numbers, const std::vector<std::string>& names)
{
    for (const std::string& name : names) {
        const auto found = numbers.find(name);
        if (found != numbers.end()) {
            return &found->second;
        }
    }
    return nullptr;
}

bool IsIdentity(const EnumMapping& mapping)
{
    return std::all_of(mapping.begin(), mapping.end(), [](const EnumMapping::value_type& entry) {
        return entry.first == entry.second;
    });
}

} // namespace

bool BuildEnumMapping(const ISchema& stored, const ISchema& current, EnumMapping& mapping,
                      std::vector<std::string>& errors)
{
    mapping.clear();
    const std::size_t errorsBefore = errors.size();

    const NamesOfValues storedNames = NamesByValue(stored);
    for (const NamesOfValues::value_type& entry : storedNames) {
        if (IsTooLarge(entry.first, current.Type)) {
            AddLines(entry.second, " too large for enum storage type", errors);
        }
    }

    const NumbersOfNames currentNumbers = NumbersByName(current);
    for (const NamesOfValues::value_type& entry : storedNames) {
        const std::int32_t* const found = FindNumber(currentNumbers, entry.second);
        if (found != nullptr) {
            mapping[entry.first] = *found;
        } else {
            AddLines(entry.second, " could not be mapped", errors);
        }
    }

    if (IsIdentity(mapping)) {
        mapping.clear();
    }
    return errors.size() == errorsBefore;
}

} // namespace IO
} // namespace KVR
