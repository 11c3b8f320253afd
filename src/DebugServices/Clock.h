#pragma once

#include "DebugServices/Export.h"

#include <cstdint>

namespace DebugServices {

/// Returns the time since the Unix epoch in milliseconds, by the system clock and what
/// `AdvanceClock` has added. It is not monotonic: the system's time may be set back. [any]
KVR_DEBUG_SERVICES_EXPORT std::int64_t SystemMilliseconds();

/// Moves what `SystemMilliseconds` returns to the whole process, so that hours of waiting can be
/// tried at once. Calls add up; sums that do not fit stay at the end of the range.
///
/// @param milliseconds  may be negative, which moves back [any]
KVR_DEBUG_SERVICES_EXPORT void AdvanceClock(std::int64_t milliseconds);

} // namespace DebugServices
