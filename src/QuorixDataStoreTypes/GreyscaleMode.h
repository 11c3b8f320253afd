#pragma once

#include "io/ISchema.h"

#include <cstdint>

/// What a camera sends beside the centres of the markers that it sees.
///
/// The store compares the names of an enum's entries, so host and plug-in must make their values
/// with the one schema below. The texts that devices see differ from these names.
enum class EGreyscaleMode : std::int32_t {
    Auto = 0,
    None = 1,
    All = 2,
    Only = 3,
    Edges = 4,
    NoEdges = 5,
};

/// Returns the interned schema of EGreyscaleMode, an Enum32 with a description of each value. [any]
const KVR::IO::ISchema& GreyscaleModeSchema();
