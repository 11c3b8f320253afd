#pragma once

#include "Variant/Interning.h"
#include "io/BinaryLayout.h"
#include "io/DataValue.h"
#include "io/EvolvingReaders.h"
#include "io/InputStreamAdapter.h"
#include "io/NativeReaders.h"
#include "io/SchemaComparison.h"
#include "io/VectorReader.h"

#include <boost/bind/bind.hpp>

#include <algorithm>
#include <array>
#include <cstdint>
#include <limits>
#include <memory>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

// Stores C++ objects as values and reads them back, also those of older releases. A struct names
// its members once, in the order in which they are stored:
//
//     template <>
//     struct KVR::IO::NativeStruct<Marker>
//     {
//         static constexpr const char* Name = "Marker";
//
//         template <typename Visitor>
//         static void Visit(Visitor&& member)
//         {
//             member("Label", &Marker::label);
//             member("Position", &Marker::position);
//         }
//     };
//
// and an enum its entries, in a NativeEnum with calls such as entry("Red", EColour::Red). Members
// may be bool, numbers of fixed width, float, double, std::string, enums, std::vector, std::array,
// arrays and other such structs, but no struct can hold itself. Members of base classes may be
// named too.

namespace KVR {
namespace IO {

/// What a struct is made of; specialised by its owner. The struct needs a default constructor.
template <typename T>
struct NativeStruct;

/// What an enum is made of; specialised by its owner. The enum must have a fixed underlying type:
/// any other must not hold numbers without an entry, and a stored number is anything.
template <typename T>
struct NativeEnum;

namespace Detail {

/// What is known of each type: its schema, its tree of nodes, and how it is written.
template <typename T, typename = void>
struct VNative
{
    static_assert(!std::is_same<T, T>::value,
                  "not a storable type: a number of fixed width, a string, a vector, an array, or "
                  "what has a NativeStruct or a NativeEnum");
};

template <typename T, EType type>
struct VNativeNumber
{
    static constexpr bool IsOneRun = true;

    static ISchema MakeSchema()
    {
        ISchema schema;
        schema.Type = type;
        return schema;
    }

    static ReaderBuildNode MakeNode(std::uint64_t offset)
    {
        ReaderBuildNode node;
        node.Offset = offset;
        node.MakeReader = boost::bind(&MakeNumberReader, type, boost::placeholders::_1);
        return node;
    }

    static bool Append(std::vector<unsigned char>& bytes, T number)
    {
        AppendNumber(bytes, number);
        return true;
    }
};

// clang-format off
template <> struct VNative<std::int8_t> : VNativeNumber<std::int8_t, EType::Int8> {};
template <> struct VNative<std::int16_t> : VNativeNumber<std::int16_t, EType::Int16> {};
template <> struct VNative<std::int32_t> : VNativeNumber<std::int32_t, EType::Int32> {};
template <> struct VNative<std::int64_t> : VNativeNumber<std::int64_t, EType::Int64> {};
template <> struct VNative<std::uint8_t> : VNativeNumber<std::uint8_t, EType::UInt8> {};
template <> struct VNative<std::uint16_t> : VNativeNumber<std::uint16_t, EType::UInt16> {};
template <> struct VNative<std::uint32_t> : VNativeNumber<std::uint32_t, EType::UInt32> {};
template <> struct VNative<std::uint64_t> : VNativeNumber<std::uint64_t, EType::UInt64> {};
template <> struct VNative<float> : VNativeNumber<float, EType::Float32> {};
template <> struct VNative<double> : VNativeNumber<double, EType::Float64> {};
// clang-format on

template <>
struct VNative<bool> : VNativeNumber<bool, EType::Bool>
{
    static constexpr bool IsOneRun = false; // std::vector<bool> has none

    static bool Append(std::vector<unsigned char>& bytes, bool value)
    {
        bytes.push_back(value ? 1 : 0);
        return true;
    }
};

template <>
struct VNative<std::string>
{
    static constexpr bool IsOneRun = false;

    static ISchema MakeSchema() { return VNativeNumber<bool, EType::String>::MakeSchema(); }

    static ReaderBuildNode MakeNode(std::uint64_t offset)
    {
        ReaderBuildNode node;
        node.Offset = offset;
        node.MakeReader = &MakeStringReader;
        return node;
    }

    static bool Append(std::vector<unsigned char>& bytes, const std::string& text)
    {
        return AppendString(bytes, text);
    }
};

template <typename T, typename = void>
struct HasFixedUnderlyingType : std::false_type
{
};

template <typename T>
struct HasFixedUnderlyingType<T, std::void_t<decltype(T{0})>> : std::true_type
{
};

template <typename T>
struct VNative<T, std::enable_if_t<std::is_enum<T>::value>>
{
    using Number = std::underlying_type_t<T>;

    static_assert(HasFixedUnderlyingType<T>::value,
                  "a stored enum needs a fixed underlying type, as in 'enum E : std::int32_t'");
    static_assert(sizeof(Number) == 4 || (sizeof(Number) < 4 && std::is_signed<Number>::value),
                  "an enum is stored as a signed number of 8, 16 or 32 bits");

    static constexpr bool IsOneRun = true;
    static constexpr EType Type = sizeof(Number) == 1   ? EType::Enum8
                                  : sizeof(Number) == 2 ? EType::Enum16
                                                        : EType::Enum32;

    static ISchema MakeSchema()
    {
        ISchema schema;
        schema.Type = Type;
        schema.TypeName = NativeEnum<T>::Name;
        NativeEnum<T>::Visit([&schema](const char* name, T value) {
            schema.EnumValues.emplace_back(name, static_cast<std::int32_t>(value));
        });
        return schema;
    }

    static ReaderBuildNode MakeNode(std::uint64_t offset)
    {
        return VNativeNumber<Number, Type>::MakeNode(offset);
    }

    static bool Append(std::vector<unsigned char>& bytes, T value)
    {
        AppendNumber(bytes, static_cast<Number>(value));
        return true;
    }
};

template <typename T>
bool AppendElements(std::vector<unsigned char>& bytes, const T* elements, std::size_t count)
{
    if constexpr (VNative<T>::IsOneRun) {
        const auto* const begin = reinterpret_cast<const unsigned char*>(elements);
        bytes.insert(bytes.end(), begin, begin + count * sizeof(T));
        return true;
    } else {
        return std::all_of(elements, elements + count, [&bytes](const T& element) {
            return VNative<T>::Append(bytes, element);
        });
    }
}

/// The node of an Array or a List: its one part is the element.
template <typename T>
ReaderBuildNode MakeSequenceNode(
    std::uint64_t offset,
    boost::function<std::shared_ptr<IReaderCollapsable>(const ReaderBuildContext&)> makeReader)
{
    ReaderBuildNode node;
    node.Offset = offset;
    node.MakeReader = std::move(makeReader);
    node.Children.push_back(VNative<T>::MakeNode(0));
    return node;
}

template <typename T>
ISchema MakeSequenceSchema(EType type, std::uint32_t count)
{
    ISchema schema;
    schema.Type = type;
    schema.Count = count;
    schema.SubSchemas.emplace_back(std::string(), VNative<T>::MakeSchema());
    return schema;
}

template <typename T>
struct VNative<std::vector<T>>
{
    static constexpr bool IsOneRun = false;

    static ISchema MakeSchema() { return MakeSequenceSchema<T>(EType::List, 0); }

    static ReaderBuildNode MakeNode(std::uint64_t offset)
    {
        return MakeSequenceNode<T>(offset, &MakeVectorReader<T>);
    }

    static bool Append(std::vector<unsigned char>& bytes, const std::vector<T>& elements)
    {
        if (elements.size() > std::numeric_limits<std::uint32_t>::max()) {
            return false;
        }
        AppendNumber(bytes, static_cast<std::uint32_t>(elements.size()));
        if constexpr (std::is_same<T, bool>::value) {
            bytes.insert(bytes.end(), elements.begin(), elements.end());
            return true;
        } else {
            return AppendElements(bytes, elements.data(), elements.size());
        }
    }
};

template <typename T, std::size_t count>
struct VNativeArray
{
    static_assert(count <= std::numeric_limits<std::uint32_t>::max(), "too long to be stored");

    static constexpr bool IsOneRun = false;

    static ISchema MakeSchema()
    {
        return MakeSequenceSchema<T>(EType::Array, static_cast<std::uint32_t>(count));
    }

    static ReaderBuildNode MakeNode(std::uint64_t offset)
    {
        return MakeSequenceNode<T>(offset, boost::bind(&MakeArrayReader, std::uint64_t{sizeof(T)},
                                                       static_cast<std::uint32_t>(count),
                                                       boost::placeholders::_1));
    }
};

template <typename T, std::size_t count>
struct VNative<std::array<T, count>> : VNativeArray<T, count>
{
    static bool Append(std::vector<unsigned char>& bytes, const std::array<T, count>& elements)
    {
        return AppendElements(bytes, elements.data(), count);
    }
};

template <typename T, std::size_t count>
struct VNative<T[count]> : VNativeArray<T, count>
{
    static bool Append(std::vector<unsigned char>& bytes, const T (&elements)[count])
    {
        return AppendElements(bytes, elements, count);
    }
};

template <typename T>
struct VNative<T, std::void_t<decltype(NativeStruct<T>::Name)>>
{
    static constexpr bool IsOneRun = false;

    static ISchema MakeSchema()
    {
        ISchema schema;
        schema.Type = EType::NamedTuple;
        schema.TypeName = NativeStruct<T>::Name;
        NativeStruct<T>::Visit([&schema](const char* name, auto member) {
            using Member = std::remove_reference_t<decltype(std::declval<T&>().*member)>;
            schema.SubSchemas.emplace_back(name, VNative<Member>::MakeSchema());
        });
        return schema;
    }

    static ReaderBuildNode MakeNode(std::uint64_t offset)
    {
        ReaderBuildNode node;
        node.Offset = offset;
        node.MakeReader = boost::bind(&MakeTupleReader, EType::NamedTuple, boost::placeholders::_1);
        // An object tells where its members are, also in a class for which offsetof does not; too
        // large a one would not fit the stack.
        const auto object = std::make_unique<T>();
        const auto* const begin = reinterpret_cast<const unsigned char*>(object.get());
        NativeStruct<T>::Visit([&](const char*, auto member) {
            using Member = std::remove_reference_t<decltype(std::declval<T&>().*member)>;
            const auto* const place =
                reinterpret_cast<const unsigned char*>(std::addressof((*object).*member));
            node.Children.push_back(
                VNative<Member>::MakeNode(static_cast<std::uint64_t>(place - begin)));
        });
        return node;
    }

    static bool Append(std::vector<unsigned char>& bytes, const T& object)
    {
        bool good = true;
        NativeStruct<T>::Visit([&](const char*, auto member) {
            using Member = std::remove_reference_t<decltype(std::declval<T&>().*member)>;
            good = good && VNative<Member>::Append(bytes, object.*member);
        });
        return good;
    }
};

} // namespace Detail

/// Returns the interned schema of a registered type. [any]
template <typename T>
const ISchema& NativeSchema()
{
    static const ISchema& schema = GetUniqueSchema(Detail::VNative<T>::MakeSchema());
    return schema;
}

/// Returns the tree of nodes that says how to read a registered type. [any]
template <typename T>
ReaderBuildNode NativeReaderNode()
{
    return Detail::VNative<T>::MakeNode(0);
}

/// Appends the binary form of an object.
///
/// @return false, with `bytes` in whatever state they reached, if a text or a vector has 2^32 or
/// more
///         elements [any]
template <typename T>
bool AppendNative(std::vector<unsigned char>& bytes, const T& object)
{
    return Detail::VNative<T>::Append(bytes, object);
}

/// Returns the value of an object, or an empty one where AppendNative fails. [any]
template <typename T>
VDataValue MakeNativeValue(const T& object)
{
    VDataValue value;
    value.Schema = &NativeSchema<T>();
    if (!AppendNative(value.Bytes, object)) {
        value.Bytes.clear();
    }
    return value;
}

/// Reads objects of a registered type from values that were stored under one schema. Built once, it
/// reads any number of values.
///
/// Threads: one at a time. Failure: a value that does not read leaves the object partly written.
template <typename T>
class VNativeReader
{
public:
    /// Reads what is stored under the current schema.
    VNativeReader() : reader(BuildReader(NativeSchema<T>(), NativeReaderNode<T>())) {}

    /// Reads what was stored under any schema from which every value can be carried over; whether
    /// this is one is told by IsReadable.
    explicit VNativeReader(const ISchema& stored)
    {
        CompareSchemas(stored, NativeSchema<T>(), warnings, errors);
        if (errors.empty()) {
            Detail::FindUnmappableEnums(stored, NativeSchema<T>(), errors, std::string());
        }
        if (errors.empty()) {
            reader = BuildEvolvingReader(NativeSchema<T>(), NativeReaderNode<T>(), stored);
            if (reader == nullptr) {
                errors.emplace_back("The stored schema has no layout");
            }
        }
    }

    bool IsReadable() const { return reader != nullptr; }

    /// What changed since the value was stored, in words.
    const std::vector<std::string>& GetWarnings() const { return warnings; }

    /// Why values cannot be read.
    const std::vector<std::string>& GetErrors() const { return errors; }

    /// Reads one value. Members that it lacks keep what `object` holds.
    bool Read(IInputStream& stream, T& object)
    {
        return reader != nullptr &&
               reader->Read(stream, Detail::PlaceOf(std::addressof(object), *reader));
    }

    /// Reads one value that takes exactly these bytes.
    bool Read(const std::vector<unsigned char>& bytes, T& object)
    {
        Detail::VVectorReader cursor(bytes);
        IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
        return Read(stream, object) && cursor.GetPosition() == bytes.size();
    }

private:
    std::vector<std::string> warnings;
    std::vector<std::string> errors;
    std::shared_ptr<IReaderCollapsable> reader;
};

/// Reads a value, stored under the current schema or an older one, as an object of a registered
/// type. Members that it lacks are those of a new object. Whoever reads many keeps a VNativeReader.
///
/// @return false, with `object` untouched, if the value cannot be read [any]
template <typename T>
bool ReadNativeValue(const VDataValue& value, T& object)
{
    const auto read = std::make_unique<T>();
    if (!VNativeReader<T>(*value.EffectiveSchema()).Read(value.Bytes, *read)) {
        return false;
    }
    object = std::move(*read);
    return true;
}

} // namespace IO
} // namespace KVR
