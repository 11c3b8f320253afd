#pragma once

#include "QuorixDataStore/DataPath.h"
#include "Variant/Interning.h"
#include "io/DataValue.h"

#include <cstdint>
#include <random>
#include <string>
#include <vector>

namespace StoreTest {

/// Makes schemas, values and names of every kind that a configuration file can carry.
class VRandomItems
{
public:
    explicit VRandomItems(std::uint64_t seed) : random(seed) {}

    std::uint64_t Below(std::uint64_t limit) { return random() % limit; }
    bool Sometimes() { return Below(2) == 0; }

    /// Returns a name of printable characters, control characters or bytes that are no UTF-8.
    std::string Name()
    {
        std::string name;
        const std::uint64_t size = 1 + Below(8);
        const std::uint64_t kind = Below(4);
        while (name.size() < size) {
            const auto byte = static_cast<char>(kind < 3 ? 0x20 + Below(0x5F) : 1 + Below(255));
            name += byte;
        }
        return name == "*" ? "**" : name;
    }

    VDataPath Path()
    {
        VDataPath path;
        for (std::uint64_t count = 2 + Below(3); count > 0; --count) {
            // Few names at each level, so that nodes are shared and items lie beside nodes.
            path.Append(Sometimes() ? std::string(1, static_cast<char>('A' + Below(4))) : Name());
        }
        return path;
    }

    const KVR::IO::ISchema& Schema() { return KVR::IO::GetUniqueSchema(MakeSchema(3)); }

    VDataValue Value(const KVR::IO::ISchema& schema)
    {
        VDataValue value{&schema, {}};
        Fill(schema, value.Bytes);
        return value;
    }

private:
    using ISchema = KVR::IO::ISchema;
    using EType = KVR::IO::EType;

    /// A name that schema text carries: it does not carry tabs.
    std::string SchemaName()
    {
        std::string name = Name();
        for (char& character : name) {
            character = character == '\t' ? ' ' : character;
        }
        return name;
    }

    ISchema MakeSchema(int depth)
    {
        ISchema schema;
        schema.Type = static_cast<EType>(1 + Below(depth > 0 ? 19 : 12));
        if (depth == 0 && Sometimes()) {
            schema.Type = static_cast<EType>(17 + Below(3));
        }
        if (Below(8) == 0) {
            schema.TypeName = SchemaName();
            schema.Role = static_cast<KVR::IO::ERole>(Below(8));
        }
        AddParts(schema, depth);
        return schema;
    }

    void AddParts(ISchema& schema, int depth)
    {
        switch (schema.Type) {
        case EType::Array:
            schema.Count = static_cast<std::uint32_t>(1 + Below(3));
            schema.SubSchemas.emplace_back("", MakeSchema(depth - 1));
            break;
        case EType::List:
            schema.SubSchemas.emplace_back("", MakeSchema(depth - 1));
            break;
        case EType::Tuple:
        case EType::NamedTuple:
            for (std::uint64_t count = 1 + Below(3); count > 0; --count) {
                schema.SubSchemas.emplace_back(schema.Type == EType::Tuple ? std::string()
                                                                           : SchemaName(),
                                               MakeSchema(depth - 1));
            }
            break;
        case EType::Enum8:
        case EType::Enum16:
        case EType::Enum32:
            for (std::int32_t number = 0; number < 3; ++number) {
                schema.EnumValues.emplace_back(std::to_string(number) + SchemaName(), number * 40);
            }
            break;
        default:
            break;
        }
    }

    void Fill(const ISchema& schema, std::vector<unsigned char>& bytes)
    {
        switch (schema.Type) {
        case EType::Bool:
            return Append(bytes, Below(2), 1);
        case EType::Float32:
            return AppendReal<float>(bytes);
        case EType::Float64:
            return AppendReal<double>(bytes);
        case EType::String:
            return AppendText(bytes);
        case EType::Enum8:
            return Append(bytes, 40 * Below(3), 1);
        case EType::Enum16:
            return Append(bytes, 40 * Below(3), 2);
        case EType::Enum32:
            return Append(bytes, 40 * Below(3), 4);
        case EType::Array:
            return FillAll(schema, schema.Count, bytes);
        case EType::List: {
            const std::uint64_t count = Below(4);
            Append(bytes, count, 4);
            return FillAll(schema, count, bytes);
        }
        case EType::Tuple:
        case EType::NamedTuple:
            return FillAll(schema, 1, bytes);
        default:
            return Append(bytes, random(), WidthOf(schema.Type));
        }
    }

    void FillAll(const ISchema& schema, std::uint64_t times, std::vector<unsigned char>& bytes)
    {
        for (; times > 0; --times) {
            for (const ISchema::SubSchema& part : schema.SubSchemas) {
                Fill(part.second, bytes);
            }
        }
    }

    static std::size_t WidthOf(EType type)
    {
        switch (type) {
        case EType::Int16:
        case EType::UInt16:
            return 2;
        case EType::Int32:
        case EType::UInt32:
            return 4;
        case EType::Int64:
        case EType::UInt64:
            return 8;
        default:
            return 1;
        }
    }

    static void Append(std::vector<unsigned char>& bytes, std::uint64_t number, std::size_t width)
    {
        for (; width > 0; --width, number >>= 8) {
            bytes.push_back(static_cast<unsigned char>(number));
        }
    }

    /// A number whose text reads back: a few binary digits on either side of the point.
    template <typename T>
    void AppendReal(std::vector<unsigned char>& bytes)
    {
        const T number = (static_cast<T>(Below(2000)) - T(1000)) / T(8);
        const auto* begin = reinterpret_cast<const unsigned char*>(&number);
        bytes.insert(bytes.end(), begin, begin + sizeof number);
    }

    void AppendText(std::vector<unsigned char>& bytes)
    {
        const std::string text = Sometimes() ? Name() : std::string();
        Append(bytes, text.size(), 4);
        bytes.insert(bytes.end(), text.begin(), text.end());
    }

    std::mt19937_64 random;
};

} // namespace StoreTest
