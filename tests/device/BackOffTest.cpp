#include "ControlStreamClient/BackOff.h"

#include <gmock/gmock.h>

#include <vector>

namespace {

using ControlStream::VBackOff;
using ControlStream::VBackOffOptions;
using namespace std::chrono_literals;
using testing::ElementsAre;

std::vector<std::chrono::milliseconds> Take(VBackOff& backOff, int count)
{
    std::vector<std::chrono::milliseconds> waits;
    while (count-- > 0) {
        waits.push_back(backOff.Next());
    }
    return waits;
}

TEST(BackOff, DoublesUpToTheLongest)
{
    VBackOff backOff(VBackOffOptions{100ms, 1000ms, 0.0});

    EXPECT_THAT(Take(backOff, 6), ElementsAre(100ms, 200ms, 400ms, 800ms, 1000ms, 1000ms));
}

TEST(BackOff, BeginsAnewAfterASuccess)
{
    VBackOff backOff(VBackOffOptions{100ms, 1000ms, 0.0});
    Take(backOff, 3);

    backOff.Reset();

    EXPECT_THAT(Take(backOff, 2), ElementsAre(100ms, 200ms));
}

TEST(BackOff, TakesOffAShareByChance)
{
    double chance = 0.5;
    VBackOff backOff(VBackOffOptions{100ms, 1000ms, 0.2}, [&] { return chance; });

    EXPECT_EQ(90ms, backOff.Next());
    chance = 0.0;
    EXPECT_EQ(200ms, backOff.Next());
}

TEST(BackOff, NeverSpins)
{
    VBackOff backOff(VBackOffOptions{0ms, 0ms, 5.0}, [] { return 0.999; });

    EXPECT_THAT(Take(backOff, 3), ElementsAre(1ms, 1ms, 1ms));
}

} // namespace
