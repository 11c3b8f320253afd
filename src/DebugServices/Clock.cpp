#include "DebugServices/Clock.h"

#include <atomic>
#include <chrono>
#include <limits>

namespace DebugServices {

namespace {

std::atomic<std::int64_t> advance{0};

/// Adds, and stays at the end of the range where the sum does not fit.
std::int64_t SaturatedSum(std::int64_t left, std::int64_t right)
{
    std::int64_t sum = 0;
    if (!__builtin_add_overflow(left, right, &sum)) {
        return sum;
    }
    return right > 0 ? std::numeric_limits<std::int64_t>::max()
                     : std::numeric_limits<std::int64_t>::min();
}

} // namespace

std::int64_t SystemMilliseconds()
{
    const auto sinceEpoch = std::chrono::system_clock::now().time_since_epoch();
    const auto milliseconds = std::chrono::duration_cast<std::chrono::milliseconds>(sinceEpoch);
    return SaturatedSum(milliseconds.count(), advance.load());
}

void AdvanceClock(std::int64_t milliseconds)
{
    std::int64_t before = advance.load();
    while (!advance.compare_exchange_weak(before, SaturatedSum(before, milliseconds))) {
        // Another thread moved the clock; `before` now holds its sum.
    }
}

} // namespace DebugServices
