#include "utils/FormatMessage.h"

#include "utils/GroupingLocale.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <sstream>
#include <stdexcept>

using KVR::FormatMessage;

namespace {

struct VPoint
{
    int X;
    int Y;
};

std::ostream& operator<<(std::ostream& stream, const VPoint& point)
{
    return stream << point.X << "/" << point.Y;
}

/// Leaves the stream in another state than it found it.
struct VHexadecimal
{
    int Number;
};

std::ostream& operator<<(std::ostream& stream, const VHexadecimal& hexadecimal)
{
    return stream << std::hex << hexadecimal.Number;
}

/// An argument that cannot be printed.
struct VRaising
{
};

std::ostream& operator<<(std::ostream&, const VRaising&)
{
    throw std::runtime_error("not printable");
}

struct VRaisingNumber
{
};

std::ostream& operator<<(std::ostream&, const VRaisingNumber&)
{
    throw 5;
}

} // namespace

TEST(FormatMessage, PutsArgumentsAtTheirPlaceholders)
{
    EXPECT_EQ("Took 12ms to acquire read-lock on change id 7",
              FormatMessage("Took %1%ms to acquire read-lock on change id %2%", 12, 7u));
    EXPECT_EQ("b a b", FormatMessage("%2% %1% %2%", "a", std::string("b")));
    EXPECT_EQ("plain", FormatMessage("plain"));
    EXPECT_EQ("", FormatMessage(""));
    EXPECT_EQ("100%", FormatMessage("100%%"));
}

TEST(FormatMessage, PrintsWhateverHasAnOperator)
{
    char array[] = "array";
    const char* const pointer = "pointer";
    const std::string embedded("a\0b", 3);

    EXPECT_EQ("3/-4", FormatMessage("%1%", VPoint{3, -4}));
    EXPECT_EQ("array pointer", FormatMessage("%1% %2%", array, pointer));
    EXPECT_EQ("x 1 0.5 18446744073709551615 -9223372036854775808",
              FormatMessage("%1% %2% %3% %4% %5%", 'x', true, 0.5, 18446744073709551615ull,
                            std::numeric_limits<std::int64_t>::min()));
    EXPECT_EQ(embedded, FormatMessage("%1%", embedded));
}

TEST(FormatMessage, TakesBoostFormatsDirectives)
{
    EXPECT_EQ("[00042] [ff] [ 1.50]", FormatMessage("[%1$05d] [%2$x] [%3$5.2f]", 42, 255, 1.5));
    EXPECT_EQ("[ab   ]", FormatMessage("[%|1$-5s|]", "ab"));
}

TEST(FormatMessage, DoesNotCarryManipulatorsToTheNextArgument)
{
    EXPECT_EQ("ff 255 1e", FormatMessage("%1% %2% %3$x", VHexadecimal{255}, 255, 30));
}

TEST(FormatMessage, TellsOfAWrongNumberOfArguments)
{
    EXPECT_EQ("Cannot Format Log Message \"a %2%\"", FormatMessage("a %2%", 1));
    EXPECT_EQ("Cannot Format Log Message \"%1%\"", FormatMessage("%1%"));
    EXPECT_EQ("Cannot Format Log Message \"%1%\"", FormatMessage("%1%", 1, 2));
    EXPECT_EQ("Cannot Format Log Message \"plain\"", FormatMessage("plain", 1));
}

TEST(FormatMessage, TellsOfAWrongFormat)
{
    EXPECT_EQ("Cannot Format Log Message \"100%\"", FormatMessage("100%"));
    EXPECT_EQ("Cannot Format Log Message \"%s %1%\"", FormatMessage("%s %1%", 1));
}

TEST(FormatMessage, TellsOfAnArgumentThatCannotBePrinted)
{
    EXPECT_EQ("Cannot Format Log Message \"%1%\"", FormatMessage("%1%", VRaising()));
    EXPECT_EQ("Cannot Format Log Message \"%1%\"", FormatMessage("%1%", VRaisingNumber()));
}

TEST(FormatMessage, SaysWhetherItSucceeded)
{
    const int number = 1;
    const KVR::VFormatArgument one[] = {KVR::VFormatArgument(number)};
    std::string text = "before";

    EXPECT_TRUE(KVR::TryFormatMessage(text, "%1%", one, 1));
    EXPECT_EQ("1", text);
    EXPECT_FALSE(KVR::TryFormatMessage(text, "%1%", one, 0));
    EXPECT_EQ("Cannot Format Log Message \"%1%\"", text);
    EXPECT_TRUE(KVR::TryFormatMessage(text, "none", nullptr, 0));
    EXPECT_EQ("none", text);
}

TEST(FormatMessage, FollowsNoGlobalLocale)
{
    const VGroupingLocale locale;
    std::ostringstream witness; // proves that the locale is in force
    witness << 1234567;
    ASSERT_EQ("1.234.567", witness.str());

    EXPECT_EQ("1234567 1.5 1234567/8",
              FormatMessage("%1% %2% %3%", 1234567, 1.5, VPoint{1234567, 8}));
}
