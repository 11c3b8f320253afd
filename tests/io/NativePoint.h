#pragma once

#include "io/NativeTypes.h"

/// A small flat type that several tests store.
struct VPoint
{
    double x = 0;
    double y = 0;

    bool operator==(const VPoint& other) const { return x == other.x && y == other.y; }
};

// clang-format off
template <> struct KVR::IO::NativeStruct<VPoint>
{
    static constexpr const char* Name = "Point";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("X", &VPoint::x);
        member("Y", &VPoint::y);
    }
};
// clang-format on
