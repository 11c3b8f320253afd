#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace KVR {
namespace IO {

/// The type that a schema represents. The numbers are stored in files' schema text by name only.
enum class EType : std::uint8_t {
    Void = 0,
    Bool = 1,
    Int8 = 2,
    Int16 = 3,
    Int32 = 4,
    Int64 = 5,
    UInt8 = 6,
    UInt16 = 7,
    UInt32 = 8,
    UInt64 = 9,
    Float32 = 10,
    Float64 = 11,
    String = 12,
    Array = 13,
    List = 14,
    Tuple = 15,
    NamedTuple = 16,
    Enum8 = 17,
    Enum16 = 18,
    Enum32 = 19,
    Ref = 20, ///< stands for a named type that was moved to a dictionary; carries only its TypeName
};

/// What a type is for.
enum class ERole : std::uint8_t {
    Value = 0,
    Function = 1,
    Callback = 2,
    Input = 3,
    InputOutput = 4,
    Output = 5,
    Return = 6,
    Result = 7,
};

/// The recursive description of a value: what it is, what it is for, and how it is built from
/// parts.
///
/// A plain value that owns its whole subtree: copying copies the tree, moving is cheap. Interned
/// instances are immutable, live for the whole process and may be read from any thread.
struct ISchema
{
    using EnumValue = std::pair<std::string, std::int32_t>;
    using SubSchema = std::pair<std::string, ISchema>; ///< the name is empty but in a NamedTuple

    EType Type = EType::Void;
    ERole Role = ERole::Value;
    std::uint16_t Detail = 0;          ///< not used in equality tests
    std::uint32_t Count = 0;           ///< repetitions of the sub-schema of an Array
    std::string TypeName;              ///< qualified name of the class, enum or function, if any
    std::vector<EnumValue> EnumValues; ///< legal values of an enum
    std::vector<SubSchema> SubSchemas; ///< element of an Array or List, members of a tuple
    std::vector<std::string> Docs;     ///< the type's own text, then one per entry or member
};

} // namespace IO
} // namespace KVR
