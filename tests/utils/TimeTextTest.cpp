#include "utils/TimeText.h"

#include "DebugServices/Clock.h"
#include "utils/CommaLocale.h"
#include "utils/GroupingLocale.h"

#include <gmock/gmock.h>

#include <cstdlib>
#include <cstring>
#include <ctime>
#include <limits>
#include <thread>
#include <vector>

using KVR::FormatFileTime;
using KVR::FormatTime;
using KVR::JoinTime;
using KVR::ParseTime;
using KVR::SplitTime;
using KVR::VTimeFields;

namespace {

/// Puts the process into a time zone for its own lifetime.
class VZone
{
public:
    explicit VZone(const char* zone)
    {
        const char* const present = std::getenv("TZ");
        hadZone = present != nullptr;
        previous = hadZone ? present : "";
        setenv("TZ", zone, 1);
        tzset();
    }
    ~VZone()
    {
        if (hadZone) {
            setenv("TZ", previous.c_str(), 1);
        } else {
            unsetenv("TZ");
        }
        tzset();
    }

    VZone(const VZone&) = delete;
    VZone& operator=(const VZone&) = delete;

private:
    bool hadZone = false;
    std::string previous;
};

// Rules in the variable itself, so that the tests need no data base of zones.
constexpr char universal[] = "UTC0";
constexpr char middleEurope[] = "CET-1CEST,M3.5.0,M10.5.0/3";
constexpr char newYork[] = "EST5EDT,M3.2.0,M11.1.0";
constexpr char india[] = "IST-5:30";

constexpr std::uint64_t newYear2024 = 1704067200000; // 2024-01-01 00:00:00 UTC
constexpr std::uint64_t july2024 = 1722449109000;    // 2024-07-31 18:05:09 UTC

/// Parses a whole text, and gives 0 where that fails: no test below asks for the epoch itself.
std::uint64_t Parsed(const std::string& text, bool requireDate = false)
{
    std::uint64_t result = 12345;
    if (ParseTime(text.data(), text.size(), requireDate, result)) {
        return result;
    }
    EXPECT_EQ(12345u, result) << "a failure must leave the result alone";
    return 0;
}

/// Sets what `SystemMilliseconds` returns, to within the run time of a test, for its own lifetime.
class VClockAt
{
public:
    explicit VClockAt(std::uint64_t time)
        : moved(static_cast<std::int64_t>(time) - DebugServices::SystemMilliseconds())
    {
        DebugServices::AdvanceClock(moved);
    }
    ~VClockAt() { DebugServices::AdvanceClock(-moved); }

    VClockAt(const VClockAt&) = delete;
    VClockAt& operator=(const VClockAt&) = delete;

private:
    const std::int64_t moved;
};

} // namespace

TEST(FormatTime, HasADateIfItIsWanted)
{
    const VZone zone(universal);

    EXPECT_EQ("2024-07-31 18:05:09", FormatTime(july2024, false, true, false));
    EXPECT_EQ("18:05:09", FormatTime(july2024, false, false, false));
    EXPECT_EQ("1970-01-01 00:00:00", FormatTime(0, false, true, false));
}

TEST(FormatTime, EndsInAPointAndThreeDigitsOfMilliseconds)
{
    const VZone zone(universal);

    EXPECT_EQ("2024-07-31 18:05:10.500", FormatTime(july2024 + 1500, true, true, false));
    EXPECT_EQ("18:05:10.500", FormatTime(july2024 + 1500, true, false, false));
    EXPECT_EQ("18:05:09.000", FormatTime(july2024, true, false, false));
    EXPECT_EQ("18:05:09.007", FormatTime(july2024 + 7, true, false, false));
    EXPECT_EQ("18:05:09.999", FormatTime(july2024 + 999, true, false, false));
}

TEST(FormatTime, CutsMillisecondsThatAreNotWanted)
{
    const VZone zone(universal);

    EXPECT_EQ("18:05:09", FormatTime(july2024 + 999, false, false, false));
}

TEST(FormatTime, TellsDaylightFromStandardTime)
{
    const VZone zone(middleEurope);

    EXPECT_EQ("2024-01-01 01:00:00 ST", FormatTime(newYear2024, false, true, true));
    EXPECT_EQ("2024-07-31 20:05:09 DST", FormatTime(july2024, false, true, true));
    EXPECT_EQ("20:05:09.250 DST", FormatTime(july2024 + 250, true, false, true));
    EXPECT_EQ("2024-07-31 20:05:09", FormatTime(july2024, false, true, false));
}

TEST(FormatTime, FollowsTheZone)
{
    {
        const VZone zone(newYork);
        EXPECT_EQ("2023-12-31 19:00:00 ST", FormatTime(newYear2024, false, true, true));
        EXPECT_EQ("2024-07-31 14:05:09 DST", FormatTime(july2024, false, true, true));
    }
    {
        const VZone zone(india);
        EXPECT_EQ("2024-07-31 23:35:09 ST", FormatTime(july2024, false, true, true));
    }
}

TEST(FormatTime, FollowsAZoneThatChangesMeanwhile)
{
    const VZone zone(universal);
    EXPECT_EQ("18:05:09", FormatTime(july2024, false, false, false));

    setenv("TZ", india, 1);

    EXPECT_EQ("23:35:09", FormatTime(july2024, false, false, false));
}

TEST(FormatTime, ChangesFromStandardToDaylightTimeInTheRightSecond)
{
    const VZone zone(middleEurope);
    constexpr std::uint64_t change = 1711846800000; // 2024-03-31 01:00:00 UTC

    EXPECT_EQ("2024-03-31 01:59:59 ST", FormatTime(change - 1000, false, true, true));
    EXPECT_EQ("2024-03-31 03:00:00 DST", FormatTime(change, false, true, true));
}

TEST(FormatTime, PrintsTheGreatestTime)
{
    const VZone zone(universal);
    const std::string text =
        FormatTime(std::numeric_limits<std::uint64_t>::max(), true, true, true);

    EXPECT_THAT(text, testing::MatchesRegex("58455[0-9]{4}-[0-9]{2}-[0-9]{2} "
                                            "[0-9]{2}:[0-9]{2}:[0-9]{2}\\.615 ST"));
}

TEST(FormatTime, FollowsNoLocale)
{
    const VZone zone(universal);
    const VGroupingLocale grouping;
    const VCommaLocale comma;

    EXPECT_EQ("2024-07-31 18:05:10.500 ST", FormatTime(july2024 + 1500, true, true, true));
}

TEST(FormatTime, IsCalledByManyThreadsAtOnce)
{
    const VZone zone(middleEurope);
    constexpr int threadCount = 4;
    std::vector<std::thread> threads;
    threads.reserve(threadCount);
    for (int i = 0; i < threadCount; ++i) {
        threads.emplace_back([i] {
            const std::uint64_t time = newYear2024 + static_cast<std::uint64_t>(i) * 3600000;
            const std::string expected = "2024-01-01 0" + std::to_string(i + 1) + ":00:00 ST";
            for (int round = 0; round < 500; ++round) {
                ASSERT_EQ(expected, FormatTime(time, false, true, true));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

TEST(FormatFileTime, CanStandInAFileName)
{
    const VZone zone(middleEurope);

    EXPECT_EQ("2024-07-31 20.05.09", FormatFileTime(july2024, false));
    EXPECT_EQ("2024-07-31 20.05.09", FormatFileTime(july2024 + 999, false));
    EXPECT_EQ("2024-07-31 20.05.10.500", FormatFileTime(july2024 + 1500, true));
}

TEST(ParseTime, ReadsEveryFormWithADate)
{
    const VZone zone(middleEurope);

    EXPECT_EQ(july2024, Parsed("2024-07-31 20:05:09"));
    EXPECT_EQ(newYear2024, Parsed("2024-01-01 01:00:00 ST"));
    EXPECT_EQ(july2024, Parsed("2024-07-31 20:05:09 DST"));
    EXPECT_EQ(july2024 + 500, Parsed("2024-07-31 20:05:09.500"));
    EXPECT_EQ(newYear2024 + 7, Parsed("2024-01-01 01:00:00.007 ST"));
    EXPECT_EQ(july2024 + 999, Parsed("2024-07-31 20:05:09.999 DST"));
    EXPECT_EQ(july2024, Parsed("2024-07-31 20:05:09", true));
}

TEST(ParseTime, ReadsEveryFormWithoutADateAsToday)
{
    const VZone zone(middleEurope);
    const VClockAt summer(july2024);

    EXPECT_EQ(july2024, Parsed("20:05:09 DST"));
    EXPECT_EQ(july2024 + 500, Parsed("20:05:09.500"));
    EXPECT_EQ(july2024 + 500, Parsed("20:05:09.500 DST"));

    const VClockAt winter(newYear2024);
    EXPECT_EQ(newYear2024, Parsed("01:00:00 ST"));
    EXPECT_EQ(newYear2024 + 1, Parsed("01:00:00.001 ST"));
}

TEST(ParseTime, TakesTheLocalDateForToday)
{
    const VZone zone(india);
    const VClockAt clock(newYear2024 - 3600000); // 04:30 of the new year there

    EXPECT_EQ(newYear2024 - 3600000, Parsed("04:30:00.000"));
}

TEST(ParseTime, RefusesAMissingDateThatIsRequired)
{
    for (const char* text :
         {"20:05:09 ST", "20:05:09 DST", "20:05:09.500", "20:05:09.500 ST", "20:05:09.500 DST"}) {
        EXPECT_NE(0u, Parsed(text, false)) << text;
        EXPECT_EQ(0u, Parsed(text, true)) << text;
    }
}

TEST(ParseTime, RefusesLengthsBelowTenAndAboveTwentySeven)
{
    EXPECT_EQ(0u, Parsed("20:05:09."));
    EXPECT_EQ(0u, Parsed("20:05:09"));
    EXPECT_EQ(0u, Parsed(""));
    EXPECT_EQ(0u, Parsed("2024-07-31 20:05:09.500 DST "));
    EXPECT_EQ(0u, Parsed("2024-07-31 20:05:09.5000 DST"));
    EXPECT_EQ(0u, Parsed(std::string(100000, '1')));

    std::uint64_t result = 1;
    EXPECT_FALSE(ParseTime(nullptr, 19, false, result));
    EXPECT_EQ(1u, result);
}

TEST(ParseTime, RefusesEveryLengthBetweenTheForms)
{
    const VZone zone(universal);
    const std::string longest = "2024-07-31 20:05:09.500 DST";
    for (std::size_t length = 0; length <= longest.size(); ++length) {
        const bool isForm = length == 19 || length == 23 || length == 27;
        EXPECT_EQ(isForm, Parsed(longest.substr(0, length)) != 0) << length;
    }

    const std::string timeOfDay = "20:05:09.500 DST";
    for (std::size_t length = 0; length <= timeOfDay.size(); ++length) {
        const bool isForm = length == 12 || length == 16;
        EXPECT_EQ(isForm, Parsed(timeOfDay.substr(0, length)) != 0) << length;
    }
}

TEST(ParseTime, ReadsNoFurtherThanItsLength)
{
    const VZone zone(universal);
    std::uint64_t result = 0;

    EXPECT_TRUE(ParseTime("2024-07-31 18:05:09.500 ST", 19, true, result));
    EXPECT_EQ(july2024, result);
}

TEST(ParseTime, RefusesOtherPunctuation)
{
    const VZone zone(universal);
    const std::string good = "2024-07-31 18:05:09.500 ST";
    ASSERT_NE(0u, Parsed(good));
    for (const std::size_t position : {4u, 7u, 10u, 13u, 16u, 19u, 23u}) {
        for (const char other : {'x', '/', '0', '\0'}) {
            std::string text = good;
            text[position] = other;
            EXPECT_EQ(0u, Parsed(text)) << text;
        }
    }

    const std::string goodTime = "18:05:09.500 ST";
    ASSERT_NE(0u, Parsed(goodTime));
    for (const std::size_t position : {2u, 5u, 8u, 12u}) {
        std::string text = goodTime;
        text[position] = 'x';
        EXPECT_EQ(0u, Parsed(text)) << text;
    }
}

TEST(ParseTime, RefusesFieldsThatAreNotAllDigits)
{
    const VZone zone(universal);
    const std::string good = "2024-07-31 18:05:09.500";
    for (const std::size_t position :
         {0u, 1u, 2u, 3u, 5u, 6u, 8u, 9u, 11u, 12u, 14u, 15u, 17u, 18u, 20u, 21u, 22u}) {
        for (const char other : {'+', '-', ' ', 'a', '\0'}) {
            std::string text = good;
            text[position] = other;
            EXPECT_EQ(0u, Parsed(text)) << text;
        }
    }
}

TEST(ParseTime, RefusesOtherZones)
{
    for (const char* text :
         {"2024-07-31 18:05:09 XST", "2024-07-31 18:05:09 dst", "2024-07-31 18:05:09 UT",
          "2024-07-31 18:05:09 st", "2024-07-31 18:05:09.500 XST", "2024-07-31 18:05:09.500 SD",
          "2024-07-31 18:05:09DST.", "18:05:09 CET", "18:05:09 XX"}) {
        EXPECT_EQ(0u, Parsed(text)) << text;
    }
}

TEST(ParseTime, TellsTheTwoHoursOfAutumnApartByTheZone)
{
    const VZone zone(middleEurope);
    constexpr std::uint64_t first = 1729989000000; // 2024-10-27 00:30:00 UTC

    EXPECT_EQ(first, Parsed("2024-10-27 02:30:00 DST"));
    EXPECT_EQ(first + 3600000, Parsed("2024-10-27 02:30:00 ST"));
}

TEST(ParseTime, RollsFieldsOutsideTheirRangeOver)
{
    const VZone zone(universal);

    EXPECT_EQ(Parsed("2024-07-01 00:00:00"), Parsed("2024-06-31 00:00:00"));
    EXPECT_EQ(Parsed("2024-03-01 00:00:00"), Parsed("2024-02-30 00:00:00"));
    EXPECT_EQ(Parsed("2025-01-01 00:00:00"), Parsed("2024-13-01 00:00:00"));
    EXPECT_EQ(Parsed("2024-07-02 01:00:59"), Parsed("2024-07-01 24:60:59"));
}

TEST(ParseTime, RefusesTimesBeforeTheEpoch)
{
    const VZone zone(universal);
    std::uint64_t result = 1;

    EXPECT_EQ(0u, Parsed("1969-12-31 23:59:59"));
    EXPECT_EQ(0u, Parsed("1900-01-01 00:00:00"));
    EXPECT_EQ(0u, Parsed("0000-01-01 00:00:00"));
    EXPECT_TRUE(ParseTime("1970-01-01 00:00:00", 19, true, result));
    EXPECT_EQ(0u, result);
}

TEST(ParseTime, ReadsBackWhatFormatTimeMakes)
{
    for (const char* name : {universal, middleEurope, newYork, india}) {
        const VZone zone(name);
        for (std::uint64_t time = 86400000; time < july2024; time += 86400000ull * 97 + 12345678) {
            EXPECT_EQ(time, Parsed(FormatTime(time, true, true, true)));
            EXPECT_EQ(time / 1000 * 1000, Parsed(FormatTime(time, false, true, true)));
        }
    }
}

TEST(SplitTime, GivesLocalFieldsWithFullYearAndMonthsFromOne)
{
    const VZone zone(middleEurope);
    const std::optional<VTimeFields> fields = SplitTime(july2024 + 123);

    ASSERT_TRUE(fields);
    EXPECT_EQ(2024, fields->Year);
    EXPECT_EQ(7, fields->Month);
    EXPECT_EQ(31, fields->Day);
    EXPECT_EQ(20, fields->Hour);
    EXPECT_EQ(5, fields->Minute);
    EXPECT_EQ(9, fields->Second);
    EXPECT_EQ(123, fields->Millisecond);
    EXPECT_EQ(1, fields->Daylight);
    EXPECT_EQ(0, SplitTime(newYear2024)->Daylight);
    EXPECT_EQ(1, SplitTime(newYear2024)->Month);
}

TEST(JoinTime, IsTheReverseOfSplitTime)
{
    for (const char* name : {universal, middleEurope, newYork, india}) {
        const VZone zone(name);
        for (std::uint64_t time = 86400000; time < july2024; time += 86400000ull * 31 + 1234567) {
            ASSERT_EQ(time, JoinTime(*SplitTime(time)));
        }
    }
}

TEST(JoinTime, FindsAnUnknownDaylightFlagOut)
{
    const VZone zone(middleEurope);
    VTimeFields fields = *SplitTime(july2024);
    fields.Daylight = -1;

    EXPECT_EQ(july2024, JoinTime(fields));
}

TEST(JoinTime, RefusesWhatHasNoCount)
{
    const VZone zone(universal);
    const VTimeFields good = *SplitTime(july2024);
    ASSERT_TRUE(JoinTime(good));

    const auto changed = [&good](int VTimeFields::*field, int value) {
        VTimeFields fields = good;
        fields.*field = value;
        return JoinTime(fields);
    };
    EXPECT_FALSE(changed(&VTimeFields::Millisecond, -1));
    EXPECT_FALSE(changed(&VTimeFields::Millisecond, 1000));
    EXPECT_FALSE(changed(&VTimeFields::Year, 1969));
    EXPECT_FALSE(changed(&VTimeFields::Year, std::numeric_limits<int>::min()));
    EXPECT_FALSE(changed(&VTimeFields::Year, std::numeric_limits<int>::max()));
    EXPECT_FALSE(changed(&VTimeFields::Month, std::numeric_limits<int>::min()));
    EXPECT_FALSE(changed(&VTimeFields::Day, std::numeric_limits<int>::min()));
}
