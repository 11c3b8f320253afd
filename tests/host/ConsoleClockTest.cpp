#include "Console.h"
#include "ConsoleCommands.h"
#include "DebugServices/Clock.h"

#include <gmock/gmock.h>

#include <cstdint>
#include <string>

using testing::StartsWith;

namespace {

class ConsoleClock : public testing::Test
{
protected:
    ConsoleClock() { QuorixHost::AddClockCommand(console); }
    ~ConsoleClock() override { DebugServices::AdvanceClock(-advanced); }

    QuorixHost::VConsole console;
    std::int64_t advanced = 0;
};

} // namespace

TEST_F(ConsoleClock, MovesTheProcessesClockForward)
{
    constexpr std::int64_t day = 86400000;
    const std::int64_t before = DebugServices::SystemMilliseconds();

    EXPECT_EQ("ok", console.Answer("clock +86400000"));
    advanced = day;

    const std::int64_t passed = DebugServices::SystemMilliseconds() - before;
    EXPECT_GE(passed, day);
    EXPECT_LT(passed, day + day / 2);
}

TEST_F(ConsoleClock, TakesNothingButAPlusAndMilliseconds)
{
    constexpr std::int64_t limit = 3600000;
    const std::int64_t before = DebugServices::SystemMilliseconds();

    for (const char* const line :
         {"clock", "clock 86400000", "clock -86400000", "clock +", "clock ++86400000",
          "clock +-86400000", "clock +86400000.5", "clock +86400000x", "clock + 86400000",
          "clock +86400000 1", "clock +4294967296", "clock +99999999999999999999"}) {
        EXPECT_THAT(console.Answer(line), StartsWith("error: ")) << line;
    }
    EXPECT_LT(DebugServices::SystemMilliseconds() - before, limit);
}
