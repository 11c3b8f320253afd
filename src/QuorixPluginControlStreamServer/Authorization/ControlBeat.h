#pragma once

#include <cstdint>

/// How long a device's place is kept after its last beat.
namespace ControlBeat {

constexpr std::int64_t freshMilliseconds = 3500;

/// Returns whether a beat still counts. Both times are milliseconds since the epoch; one that lies
/// ahead, since the system's time was set back, counts.
inline bool IsFresh(std::int64_t now, std::int64_t lastBeat)
{
    return now - lastBeat < freshMilliseconds;
}

} // namespace ControlBeat
