#pragma once

#include "io/ISchema.h"
#include "io/SchemaText.h"

#include <algorithm>
#include <cstdint>
#include <string>

/// An input of three parts: a byte for the mode, schema text up to a zero byte, and the rest.
struct VSchemaThenBytes
{
    bool good = false; ///< false if the schema text is none
    KVR::IO::SchemaTextMode mode = KVR::IO::SchemaTextModeNamed;
    KVR::IO::ISchema schema;
    const std::uint8_t* rest = nullptr;
    const std::uint8_t* end = nullptr;
};

inline VSchemaThenBytes SplitInput(const std::uint8_t* data, std::size_t size)
{
    VSchemaThenBytes input;
    const std::uint8_t* const end = data + size;
    const std::uint8_t* const zero = std::find(data, end, std::uint8_t{0});
    if (zero == data || zero == end) {
        return input;
    }
    const std::string schemaText(data + 1, zero);
    const char* cursor = schemaText.c_str();
    input.mode = KVR::IO::SchemaTextMode(*data % 5);
    input.good = KVR::IO::ReadSchemaText(input.schema, cursor);
    input.rest = zero + 1;
    input.end = end;
    return input;
}
