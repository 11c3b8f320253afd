#pragma once

#include "io/ISchema.h"

#include <cstddef>
#include <initializer_list>
#include <string>
#include <vector>

// Short ways to write down schemas and bytes in tests.

inline KVR::IO::ISchema Plain(KVR::IO::EType type)
{
    KVR::IO::ISchema schema;
    schema.Type = type;
    return schema;
}

inline KVR::IO::ISchema WithParts(KVR::IO::EType type,
                                  std::initializer_list<KVR::IO::ISchema::SubSchema> parts)
{
    KVR::IO::ISchema schema = Plain(type);
    schema.SubSchemas = parts;
    return schema;
}

inline KVR::IO::ISchema ListOf(const KVR::IO::ISchema& element)
{
    return WithParts(KVR::IO::EType::List, {{"", element}});
}

inline KVR::IO::ISchema ArrayOf(const KVR::IO::ISchema& element, std::uint32_t count)
{
    KVR::IO::ISchema schema = WithParts(KVR::IO::EType::Array, {{"", element}});
    schema.Count = count;
    return schema;
}

inline KVR::IO::ISchema TupleOf(std::initializer_list<KVR::IO::ISchema> members)
{
    KVR::IO::ISchema schema = Plain(KVR::IO::EType::Tuple);
    for (const KVR::IO::ISchema& member : members) {
        schema.SubSchemas.emplace_back("", member);
    }
    return schema;
}

inline KVR::IO::ISchema NamedTupleOf(std::initializer_list<KVR::IO::ISchema::SubSchema> members)
{
    return WithParts(KVR::IO::EType::NamedTuple, members);
}

inline KVR::IO::ISchema EnumOf(KVR::IO::EType type,
                               std::initializer_list<KVR::IO::ISchema::EnumValue> entries)
{
    KVR::IO::ISchema schema = Plain(type);
    schema.EnumValues = entries;
    return schema;
}

/// The bytes of a character literal, without its terminator.
template <std::size_t size>
std::vector<unsigned char> Bytes(const char (&literal)[size])
{
    return std::vector<unsigned char>(literal, literal + size - 1);
}
