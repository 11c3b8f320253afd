#include "io/RandomSchema.h"

#include "io/SchemaComparison.h"
#include "io/TypeWidth.h"

#include <cstring>
#include <limits>

using namespace KVR::IO;

namespace {

bool IsNested(EType type)
{
    return type >= EType::Array && type <= EType::NamedTuple;
}

} // namespace

ISchema VRandomSchema::MakeSchema(unsigned depth, const Limits& limits)
{
    ISchema schema;
    do {
        schema.Type = static_cast<EType>(Below(21));
    } while ((depth <= 1 && IsNested(schema.Type)) ||
             (!limits.withoutText && (schema.Type == EType::Void || schema.Type == EType::Ref)));

    if (IsEnumType(schema.Type)) {
        const std::uint32_t count = 1 + Below(4);
        for (std::uint32_t i = 0; i < count; ++i) {
            // Different names and numbers, all within 8 bits.
            const std::string name = static_cast<char>('A' + i) + MakeName();
            schema.EnumValues.emplace_back(name, static_cast<std::int32_t>(i * 50) - 100);
        }
    } else if (schema.Type == EType::Array || schema.Type == EType::List) {
        schema.Count = schema.Type == EType::Array ? Below(5) : 0;
        schema.SubSchemas.emplace_back("", MakeSchema(depth - 1, limits));
    } else if (IsNested(schema.Type)) {
        const std::uint32_t count = Below(5);
        for (std::uint32_t i = 0; i < count; ++i) {
            schema.SubSchemas.emplace_back(schema.Type == EType::Tuple ? "" : MakeName(),
                                           MakeSchema(depth - 1, limits));
        }
    }
    return schema;
}

ISchema VRandomSchema::MakeFullSchema(unsigned depth)
{
    ISchema schema;
    schema.Type = static_cast<EType>(Below(21));
    schema.Role = static_cast<ERole>(Below(8));
    schema.Detail = static_cast<std::uint16_t>(Below(4) == 0 ? engine() : 0);
    schema.Count = Below(4) == 0 ? static_cast<std::uint32_t>(engine()) : 0;
    schema.TypeName = MakeName();
    for (std::uint32_t i = Below(3); i > 0; --i) {
        schema.EnumValues.emplace_back(MakeName(), static_cast<std::int32_t>(engine()));
    }
    for (std::uint32_t i = depth > 1 ? Below(4) : 0; i > 0; --i) {
        schema.SubSchemas.emplace_back(MakeName(), MakeFullSchema(depth - 1));
    }
    for (std::uint32_t i = Below(3); i > 0; --i) {
        schema.Docs.push_back(MakeName());
    }
    return schema;
}

void VRandomSchema::AppendValue(std::vector<unsigned char>& bytes, const ISchema& schema,
                                const Limits& limits)
{
    switch (schema.Type) {
    case EType::Void:
    case EType::Ref:
        return;
    case EType::Bool:
        AppendBytes(bytes, Below(2), 1);
        return;
    case EType::Float32: {
        const auto number = static_cast<float>(MakeReal());
        std::uint32_t bits = 0;
        std::memcpy(&bits, &number, sizeof(bits));
        AppendBytes(bytes, bits, sizeof(bits));
        return;
    }
    case EType::Float64: {
        const double number = MakeReal();
        std::uint64_t bits = 0;
        std::memcpy(&bits, &number, sizeof(bits));
        AppendBytes(bytes, bits, sizeof(bits));
        return;
    }
    case EType::String: {
        const std::string text = MakeText(limits);
        AppendBytes(bytes, text.size(), 4);
        bytes.insert(bytes.end(), text.begin(), text.end());
        return;
    }
    case EType::Enum8:
    case EType::Enum16:
    case EType::Enum32: {
        const auto entry = Below(static_cast<std::uint32_t>(schema.EnumValues.size()));
        const std::int64_t number = schema.EnumValues[entry].second;
        AppendBytes(bytes, static_cast<std::uint64_t>(number), WidthOf(schema.Type));
        return;
    }
    case EType::Array:
    case EType::List: {
        const std::uint32_t count = schema.Type == EType::Array ? schema.Count : Below(5);
        if (schema.Type == EType::List) {
            AppendBytes(bytes, count, 4);
        }
        for (std::uint32_t i = 0; i < count; ++i) {
            AppendValue(bytes, schema.SubSchemas.front().second, limits);
        }
        return;
    }
    case EType::Tuple:
    case EType::NamedTuple:
        for (const ISchema::SubSchema& member : schema.SubSchemas) {
            AppendValue(bytes, member.second, limits);
        }
        return;
    default:
        AppendBytes(bytes, std::uint64_t{engine()} << 32 | engine(), WidthOf(schema.Type));
    }
}

/// A name of any bytes that schema text can keep: no tab and no zero.
std::string VRandomSchema::MakeName()
{
    constexpr char characters[] = "abcXYZ \n\r\"\\,:[]{}/.\b\x01\xC3\xA9\xFF";
    std::string name;
    for (std::uint32_t i = Below(6); i > 0; --i) {
        name += characters[Below(sizeof(characters) - 1)];
    }
    return name;
}

std::string VRandomSchema::MakeText(const Limits& limits)
{
    std::string text;
    for (std::uint32_t i = Below(8); i > 0; --i) {
        text += limits.plainWords
                    ? static_cast<char>('a' + Below(26))
                    : static_cast<char>(Below(2) == 0 ? Below(256) : "\t\b\\\""[Below(4)]);
    }
    return text;
}

void VRandomSchema::AppendBytes(std::vector<unsigned char>& bytes, std::uint64_t number,
                                unsigned width)
{
    for (unsigned i = 0; i < width; ++i) {
        bytes.push_back(static_cast<unsigned char>(number >> (8 * i)));
    }
}

double VRandomSchema::MakeReal()
{
    switch (Below(10)) {
    case 0:
        return std::numeric_limits<double>::infinity();
    case 1:
        return -std::numeric_limits<double>::infinity();
    case 2:
        return 0;
    default:
        return (static_cast<double>(Below(40001)) - 20000) / 2; // few enough digits for a float
    }
}
