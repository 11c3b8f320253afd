#pragma once

#include "io/ISchema.h"

#include <vector>

/// One value: an interned schema and the bytes that encode the value under it.
///
/// An empty byte list means no value; there is no other marker of absence. Threads: a plain value.
struct VDataValue
{
    const KVR::IO::ISchema* Schema = nullptr; ///< from the interning functions, or null for Void
    std::vector<unsigned char> Bytes;         ///< packed little-endian, in the order of the schema

    bool Empty() const { return Bytes.empty(); }

    /// Returns the schema, with the interned one of Void in place of null.
    const KVR::IO::ISchema* EffectiveSchema() const;
};

/// True for the same interned schema and the same bytes; a null schema equals Void.
bool operator==(const VDataValue& left, const VDataValue& right);
bool operator!=(const VDataValue& left, const VDataValue& right);
