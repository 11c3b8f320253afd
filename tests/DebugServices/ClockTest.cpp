#include "DebugServices/Clock.h"

#include <gtest/gtest.h>

#include <ctime>
#include <limits>
#include <thread>

namespace {

/// Reads the system's clock without the code under test.
std::int64_t KernelMilliseconds()
{
    timespec now = {};
    clock_gettime(CLOCK_REALTIME, &now);
    return static_cast<std::int64_t>(now.tv_sec) * 1000 + now.tv_nsec / 1000000;
}

constexpr std::int64_t most = std::numeric_limits<std::int64_t>::max();
constexpr std::int64_t least = std::numeric_limits<std::int64_t>::min();

} // namespace

TEST(Clock, CountsMillisecondsSinceTheEpoch)
{
    const std::int64_t before = KernelMilliseconds();
    const std::int64_t now = DebugServices::SystemMilliseconds();
    const std::int64_t after = KernelMilliseconds();

    EXPECT_LE(before, now);
    EXPECT_LE(now, after);
}

TEST(Clock, IsMovedForwardAndBack)
{
    DebugServices::AdvanceClock(7200000);
    DebugServices::AdvanceClock(1);
    const std::int64_t before = KernelMilliseconds();
    const std::int64_t now = DebugServices::SystemMilliseconds();
    const std::int64_t after = KernelMilliseconds();
    DebugServices::AdvanceClock(-7200001);

    EXPECT_LE(before + 7200001, now);
    EXPECT_LE(now, after + 7200001);
    EXPECT_LE(DebugServices::SystemMilliseconds(), KernelMilliseconds());
}

TEST(Clock, StaysAtTheEndOfItsRange)
{
    DebugServices::AdvanceClock(most);
    EXPECT_EQ(most, DebugServices::SystemMilliseconds());
    DebugServices::AdvanceClock(most);
    EXPECT_EQ(most, DebugServices::SystemMilliseconds());

    DebugServices::AdvanceClock(-most); // back at what the system says
    const std::int64_t now = DebugServices::SystemMilliseconds();
    EXPECT_LE(now, KernelMilliseconds());

    DebugServices::AdvanceClock(least);
    DebugServices::AdvanceClock(least);
    EXPECT_LE(DebugServices::SystemMilliseconds(), least + KernelMilliseconds());
    DebugServices::AdvanceClock(most);
    DebugServices::AdvanceClock(1);
    EXPECT_GE(DebugServices::SystemMilliseconds(), now);
}

TEST(Clock, AddsUpWhatSeveralThreadsAdd)
{
    constexpr int movesPerThread = 1000;
    const auto move = [] {
        for (int i = 0; i < movesPerThread; ++i) {
            DebugServices::AdvanceClock(1000000);
        }
    };

    std::thread first(move);
    std::thread second(move);
    first.join();
    second.join();
    const std::int64_t now = DebugServices::SystemMilliseconds();
    const std::int64_t after = KernelMilliseconds();
    DebugServices::AdvanceClock(-2LL * movesPerThread * 1000000);

    EXPECT_LE(now, after + 2LL * movesPerThread * 1000000);
    EXPECT_GT(now, after + (2LL * movesPerThread - 1) * 1000000);
}
