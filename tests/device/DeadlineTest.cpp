#include "ControlStreamClient/Deadline.h"

#include "ControlStreamClient/Client.h"

#include <limits>

#include <gmock/gmock.h>

namespace {

using ControlStream::VDeadline;
using namespace std::chrono_literals;

TEST(Deadline, OfNothingOrLessIsOverAtOnce)
{
    EXPECT_TRUE(VDeadline(0ms).IsOver());
    EXPECT_TRUE(VDeadline(-5ms).IsOver());
    EXPECT_EQ(0, VDeadline(0ms).PollMilliseconds());
    EXPECT_EQ(0, VDeadline(std::chrono::milliseconds::min()).PollMilliseconds());
}

TEST(Deadline, WithoutLimitIsNeverOver)
{
    const VDeadline deadline(ControlStream::NoLimit);

    EXPECT_FALSE(deadline.IsOver());
    EXPECT_EQ(-1, deadline.PollMilliseconds());
    EXPECT_EQ(-1, deadline.Part(3).PollMilliseconds());
}

TEST(Deadline, CountsDownFromItsLimit)
{
    const VDeadline deadline(1h);

    EXPECT_FALSE(deadline.IsOver());
    EXPECT_LE(deadline.PollMilliseconds(), 3600000);
    EXPECT_GT(deadline.PollMilliseconds(), 3000000);
}

TEST(Deadline, OfManyYearsDoesNotOverflow)
{
    const VDeadline deadline(std::chrono::hours(24 * 365 * 90));

    EXPECT_FALSE(deadline.IsOver());
    EXPECT_EQ(std::numeric_limits<int>::max(), deadline.PollMilliseconds());
}

TEST(Deadline, PartIsAnEqualShareOfWhatIsLeft)
{
    const VDeadline deadline(1h);

    EXPECT_LE(deadline.Part(4).PollMilliseconds(), 900000);
    EXPECT_GT(deadline.Part(4).PollMilliseconds(), 800000);
    EXPECT_LE(deadline.Part(1).PollMilliseconds(), deadline.PollMilliseconds());
}

TEST(Deadline, LimitReadsInSeconds)
{
    EXPECT_EQ("5 s", VDeadline(5s).LimitText());
    EXPECT_EQ("0.05 s", VDeadline(50ms).LimitText());
    EXPECT_EQ("2.5 s", VDeadline(2500ms).LimitText());
    EXPECT_EQ("1.001 s", VDeadline(1001ms).LimitText());
    EXPECT_EQ("0 s", VDeadline(-1ms).LimitText());
}

} // namespace
