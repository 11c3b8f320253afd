#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace KVR {
namespace IO {

/// The names and numbers of an enumeration, with what it says of itself.
///
/// Threads: the two shared instances below are immutable and may be read from any thread.
class EnumDescription
{
public:
    struct Entry
    {
        std::string Name;
        std::int32_t Value = 0;
        std::string Docs; ///< empty where the enumeration documents no entries
    };

    EnumDescription(std::string name, std::string docs);

    /// Appends an entry; a name that is already present changes nothing.
    void Add(const std::string& name, std::int32_t value, const std::string& docs = std::string());

    const std::string& GetName() const { return name; }
    const std::string& GetDocs() const { return docs; }
    const std::vector<Entry>& GetEntries() const { return entries; }

    /// Returns the first entry of that name, compared exactly, or null.
    const Entry* FindName(const std::string& entryName) const;

    /// Returns the first entry of that number, or null.
    const Entry* FindValue(std::int32_t value) const;

    /// Returns the name of the first entry of that number, or "Unspecified".
    const std::string& NameOf(std::int32_t value) const;

private:
    std::string name;
    std::string docs;
    std::vector<Entry> entries;
};

/// Returns the description of EType, "Schema.EType". Built at first use. [any]
const EnumDescription& DescribeEType();

/// Returns the description of ERole, "Schema.ERole". Built at first use. [any]
const EnumDescription& DescribeERole();

} // namespace IO
} // namespace KVR
