#pragma once

#include "io/ISchema.h"

/// Returns how many bytes a Bool, a number or an enum has where it is stored, and 0 for all else:
/// the tests' own table, against which the code's is held.
inline unsigned WidthOf(KVR::IO::EType type)
{
    using KVR::IO::EType;
    switch (type) {
    case EType::Bool:
    case EType::Int8:
    case EType::UInt8:
    case EType::Enum8:
        return 1;
    case EType::Int16:
    case EType::UInt16:
    case EType::Enum16:
        return 2;
    case EType::Int32:
    case EType::UInt32:
    case EType::Float32:
    case EType::Enum32:
        return 4;
    case EType::Int64:
    case EType::UInt64:
    case EType::Float64:
        return 8;
    default:
        return 0;
    }
}
