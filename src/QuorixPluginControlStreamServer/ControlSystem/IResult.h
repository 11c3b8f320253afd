#pragma once

#include <cstdint>

namespace ControlSystem {

/// The outcome of a command: one code, passed by value. Only its text goes on the wire.
struct IResult
{
    std::int32_t Code =
        0; ///< 1 is success; 0 is what a fresh result holds before a provider sets it
};

} // namespace ControlSystem
