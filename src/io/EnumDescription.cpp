#include "io/EnumDescription.h"

#include "io/ISchema.h"

#include <algorithm>
#include <utility>

namespace KVR {
namespace IO {

namespace {

void AddType(EnumDescription& description, EType type, const char* name)
{
    description.Add(name, static_cast<std::int32_t>(type));
}

void AddRole(EnumDescription& description, ERole role, const char* name, const char* docs)
{
    description.Add(name, static_cast<std::int32_t>(role), docs);
}

EnumDescription MakeTypeDescription()
{
    EnumDescription types("Schema.EType", "Supported types.");
    AddType(types, EType::Void, "Void");
    AddType(types, EType::Bool, "Bool");
    AddType(types, EType::Int8, "Int8");
    AddType(types, EType::Int16, "Int16");
    AddType(types, EType::Int32, "Int32");
    AddType(types, EType::Int64, "Int64");
    AddType(types, EType::UInt8, "UInt8");
    AddType(types, EType::UInt16, "UInt16");
    AddType(types, EType::UInt32, "UInt32");
    AddType(types, EType::UInt64, "UInt64");
    AddType(types, EType::Float32, "Float32");
    AddType(types, EType::Float64, "Float64");
    AddType(types, EType::String, "String");
    AddType(types, EType::Array, "Array");
    AddType(types, EType::List, "List");
    AddType(types, EType::Tuple, "Tuple");
    AddType(types, EType::NamedTuple, "NamedTuple");
    AddType(types, EType::Enum8, "Enum8");
    AddType(types, EType::Enum16, "Enum16");
    AddType(types, EType::Enum32, "Enum32");
    AddType(types, EType::Ref, "Ref");
    return types;
}

EnumDescription MakeRoleDescription()
{
    EnumDescription roles("Schema.ERole", "The role of the type represented by the schema.");
    AddRole(roles, ERole::Value, "Value", "An object or value");
    AddRole(roles, ERole::Function, "Function", "A function specification");
    AddRole(roles, ERole::Callback, "Callback", "A callback specification");
    AddRole(roles, ERole::Input, "Input", "An input parameter within a function");
    AddRole(roles, ERole::InputOutput, "InputOutput",
            "An input and output parameter within a function");
    AddRole(roles, ERole::Output, "Output", "An output parameter within a function");
    AddRole(roles, ERole::Return, "Return", "A return value from function");
    AddRole(roles, ERole::Result, "Result",
            "A return value from a function that is a result code (may be used by API generation)");
    return roles;
}

} // namespace

EnumDescription::EnumDescription(std::string name_, std::string docs_)
    : name(std::move(name_)), docs(std::move(docs_))
{
}

void EnumDescription::Add(const std::string& entryName, std::int32_t value,
                          const std::string& entryDocs)
{
    if (FindName(entryName) == nullptr) {
        entries.push_back({entryName, value, entryDocs});
    }
}

const EnumDescription::Entry* EnumDescription::FindName(const std::string& entryName) const
{
    const auto found = std::find_if(entries.begin(), entries.end(),
                                    [&](const Entry& entry) { return entry.Name == entryName; });
    return found == entries.end() ? nullptr : &*found;
}

const EnumDescription::Entry* EnumDescription::FindValue(std::int32_t value) const
{
    const auto found = std::find_if(entries.begin(), entries.end(),
                                    [&](const Entry& entry) { return entry.Value == value; });
    return found == entries.end() ? nullptr : &*found;
}

const std::string& EnumDescription::NameOf(std::int32_t value) const
{
    static const std::string unspecified("Unspecified");
    const Entry* entry = FindValue(value);
    return entry == nullptr ? unspecified : entry->Name;
}

const EnumDescription& DescribeEType()
{
    // Never destroyed, like the schemas: texts may still be read and written after main.
    static const EnumDescription& description = *new EnumDescription(MakeTypeDescription());
    return description;
}

const EnumDescription& DescribeERole()
{
    static const EnumDescription& description = *new EnumDescription(MakeRoleDescription());
    return description;
}

} // namespace IO
} // namespace KVR
