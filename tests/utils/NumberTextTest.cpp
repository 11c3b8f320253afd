#include "utils/NumberText.h"

#include "utils/CommaLocale.h"
#include "utils/GroupingLocale.h"

#include <gtest/gtest.h>

#include <locale.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <limits>
#include <sstream>
#include <thread>
#include <vector>

using KVR::DeviceTextToDouble;
using KVR::DeviceTextToUInt32;
using KVR::TextToDouble;
using KVR::TextToFloat;

namespace {

std::uint32_t BitsOf(float number)
{
    std::uint32_t bits = 0;
    std::memcpy(&bits, &number, sizeof bits);
    return bits;
}

std::uint64_t BitsOf(double number)
{
    std::uint64_t bits = 0;
    std::memcpy(&bits, &number, sizeof bits);
    return bits;
}

struct VSpecialCase
{
    const char* Name;
    const char* Text;
    std::uint32_t FloatBits;
    std::uint64_t DoubleBits;
};

// clang-format off
const VSpecialCase specialCases[] = {
    {"Infinity",              "1.#INF",         0x7F800000, 0x7FF0000000000000},
    {"NegativeInfinity",      "-1.#INF",        0xFF800000, 0xFFF0000000000000},
    {"Indefinite",            "1.#IND",         0x7FC00000, 0x7FF8000000000000},
    {"NegativeIndefinite",    "-1.#IND",        0xFFC00000, 0xFFF8000000000000},
    {"QuietNan",              "1.#QNAN",        0x7FC00000, 0x7FF8000000000000},
    {"NegativeQuietNan",      "-1.#QNAN",       0xFFC00000, 0xFFF8000000000000},
    {"PaddedInfinity",        "1.#INF00",       0x7F800000, 0x7FF0000000000000},
    {"PaddedOnce",            "-1.#INF0",       0xFF800000, 0xFFF0000000000000},
    {"PaddedLong",            "1.#QNAN000000000000000000000000", 0x7FC00000, 0x7FF8000000000000},
    {"PaddedIndefinite",      "-1.#IND00",      0xFFC00000, 0xFFF8000000000000},
};

const char* const noNumbers[] = {
    "", " ", "x", "1x", "1 ", "1,5", "--1", "+-1", ".", "1e+x", "0", "00",
    "1.#INFx", "1.#INF0x", "1.#INF ", " 1.#INF", "+1.#INF", "1.#inf", "1.#INF1", "1.#IN", "1.#",
    "1.#NAN", "1.#QNAN1", "-1.#", "1.#SNAN", "01.#INF",
};
// clang-format on

class TextToNumberSpecial : public testing::TestWithParam<VSpecialCase>
{
};

/// What is done under every locale alike.
void ExpectPlainNumbers()
{
    EXPECT_EQ(1.5, TextToDouble("1.5"));
    EXPECT_EQ(1.5f, TextToFloat("1.5"));
    EXPECT_FALSE(TextToDouble("1,5"));
    EXPECT_FALSE(TextToDouble("1.234.567"));
    EXPECT_EQ(1.234, TextToDouble("1.234"));
    EXPECT_EQ(1.5, DeviceTextToDouble("1.5"));
    EXPECT_EQ(1.234, DeviceTextToDouble("1.234"));
    EXPECT_FALSE(DeviceTextToDouble("1,5"));
    EXPECT_EQ(1234u, DeviceTextToUInt32("1234"));
    EXPECT_FALSE(DeviceTextToUInt32("1.234"));
}

} // namespace

TEST_P(TextToNumberSpecial, GivesTheBitsOfTheTable)
{
    const auto asFloat = TextToFloat(GetParam().Text);
    const auto asDouble = TextToDouble(GetParam().Text);

    ASSERT_TRUE(asFloat && asDouble);
    EXPECT_EQ(GetParam().FloatBits, BitsOf(*asFloat));
    EXPECT_EQ(GetParam().DoubleBits, BitsOf(*asDouble));
}

INSTANTIATE_TEST_SUITE_P(NumberText, TextToNumberSpecial, testing::ValuesIn(specialCases),
                         [](const auto& information) { return information.param.Name; });

TEST(NumberText, ReadsFloats)
{
    EXPECT_EQ(0.0f, TextToFloat("0"));
    EXPECT_EQ(1.0f, TextToFloat("1"));
    EXPECT_EQ(0.5f, TextToFloat("+.5"));
    EXPECT_EQ(5.0f, TextToFloat("5."));
    EXPECT_EQ(-1.5e10f, TextToFloat("-1.5e10"));
    EXPECT_EQ(3.40282347e+38f, TextToFloat("3.40282347e+38"));
    EXPECT_EQ(1.40129846e-45f, TextToFloat("1.40129846e-45"));
    EXPECT_EQ(0x80000000u, BitsOf(*TextToFloat("-0")));
}

TEST(NumberText, ReadsDoubles)
{
    EXPECT_EQ(0.1, TextToDouble("0.1"));
    EXPECT_EQ(0.1, TextToDouble("0.100000"));
    EXPECT_EQ(100.0, TextToDouble("100"));
    EXPECT_EQ(1e300, TextToDouble("1E300"));
    EXPECT_EQ(1.7976931348623157e308, TextToDouble("1.7976931348623157e308"));
    EXPECT_EQ(5e-324, TextToDouble("4.9406564584124654e-324"));
    EXPECT_EQ(0x8000000000000000u, BitsOf(*TextToDouble("-0.0")));
}

TEST(NumberText, TakesWhatTheRuntimeLibraryTakes)
{
    EXPECT_EQ(16.0, TextToDouble("0x10"));
    EXPECT_EQ(1.5, TextToDouble("0x1.8p0"));
    EXPECT_EQ(1.0, TextToDouble(" \t\n1"));
    EXPECT_EQ(std::numeric_limits<double>::infinity(), TextToDouble("inf"));
    EXPECT_EQ(-std::numeric_limits<double>::infinity(), TextToDouble("-INFINITY"));
    EXPECT_TRUE(std::isnan(*TextToDouble("nan")));
    EXPECT_EQ(std::numeric_limits<float>::infinity(), TextToFloat("1e39"));
    EXPECT_EQ(std::numeric_limits<double>::infinity(), TextToDouble("1e400"));
    EXPECT_EQ(0.0, TextToDouble("1e-400"));
}

TEST(NumberText, TakesAnExponentWithoutDigits)
{
    EXPECT_EQ(1.0, TextToDouble("1e"));
}

TEST(NumberText, RefusesWhatIsNoNumberAsAWhole)
{
    for (const char* const text : noNumbers) {
        const bool zero =
            text[0] == '0' && std::string(text).find_first_not_of('0') == std::string::npos;
        EXPECT_EQ(zero, TextToFloat(text).has_value()) << text;
        EXPECT_EQ(zero, TextToDouble(text).has_value()) << text;
    }
}

TEST(NumberText, DropsTrailingZerosOnlyOnTheWayToTheTable)
{
    EXPECT_EQ(100.0, TextToDouble("100"));
    EXPECT_EQ(0.0, TextToDouble("000"));
    EXPECT_FALSE(TextToDouble("x000"));
}

TEST(NumberText, RefusesWhatFollowsAZeroCharacter)
{
    EXPECT_FALSE(TextToDouble(std::string("1\0", 2)));
    EXPECT_FALSE(TextToDouble(std::string("1.#INF\0", 7)));
    EXPECT_FALSE(TextToDouble(std::string("\0", 1)));
    EXPECT_FALSE(DeviceTextToUInt32(std::string("1\0", 2)));
    EXPECT_FALSE(DeviceTextToDouble(std::string("1\0", 2)));
}

TEST(NumberText, ReadsVeryLongTexts)
{
    EXPECT_EQ(std::numeric_limits<double>::infinity(), TextToDouble(std::string(100000, '9')));
    EXPECT_EQ(1.0, TextToDouble("1." + std::string(100000, '0')));
    EXPECT_FALSE(TextToDouble(std::string(100000, 'x')));
}

TEST(NumberText, HasFormatsThatReadBackToTheSameNumber)
{
    EXPECT_STREQ("%.9g", KVR::FloatFormat);
    EXPECT_STREQ("%.17g", KVR::DoubleFormat);

    for (const double number : {0.1, 1.0 / 3, 1e300, 1.7976931348623157e308, 5e-324, -0.0}) {
        char text[40] = "";
        std::snprintf(text, sizeof text, KVR::DoubleFormat, number);
        EXPECT_EQ(BitsOf(number), BitsOf(*TextToDouble(text))) << text;
        std::snprintf(text, sizeof text, KVR::FloatFormat, static_cast<float>(number));
        EXPECT_EQ(BitsOf(static_cast<float>(number)), BitsOf(*TextToFloat(text))) << text;
    }
}

TEST(NumberText, ReadsUnsignedNumbersOfDevices)
{
    EXPECT_EQ(0u, DeviceTextToUInt32("0"));
    EXPECT_EQ(7u, DeviceTextToUInt32("007"));
    EXPECT_EQ(7u, DeviceTextToUInt32("+7"));
    EXPECT_EQ(4294967295u, DeviceTextToUInt32("4294967295"));
}

TEST(NumberText, NeverTurnsANegativeNumberOfADeviceIntoAGreatOne)
{
    EXPECT_FALSE(DeviceTextToUInt32("-1"));
    EXPECT_FALSE(DeviceTextToUInt32("-0"));
    EXPECT_FALSE(DeviceTextToUInt32("+-1"));
    EXPECT_FALSE(DeviceTextToUInt32("-4294967295"));
}

TEST(NumberText, RefusesOtherUnsignedTextsOfDevices)
{
    for (const char* const text :
         {"", "+", "++1", " 1", "1 ", "\t1", "1\n", "4294967296", "99999999999999999999", "0x10",
          "1.0", "1e1", "qx:1", "a", "\xD9\xA1", "1,2"}) {
        EXPECT_FALSE(DeviceTextToUInt32(text)) << text;
    }
}

TEST(NumberText, ReadsRealNumbersOfDevices)
{
    EXPECT_EQ(0.0, DeviceTextToDouble("0"));
    EXPECT_EQ(0.5, DeviceTextToDouble("0.5"));
    EXPECT_EQ(0.5, DeviceTextToDouble("+0.5"));
    EXPECT_EQ(-0.5, DeviceTextToDouble("-.5"));
    EXPECT_EQ(5.0, DeviceTextToDouble("5."));
    EXPECT_EQ(150.0, DeviceTextToDouble("1.5e2"));
    EXPECT_EQ(150.0, DeviceTextToDouble("1.5E+2"));
    EXPECT_EQ(1.7976931348623157e308, DeviceTextToDouble("1.7976931348623157e308"));
    EXPECT_EQ(std::numeric_limits<double>::infinity(), DeviceTextToDouble("inf"));
    EXPECT_EQ(std::numeric_limits<double>::infinity(), DeviceTextToDouble("+inf"));
    EXPECT_EQ(-std::numeric_limits<double>::infinity(), DeviceTextToDouble("-Infinity"));
    EXPECT_TRUE(std::isnan(*DeviceTextToDouble("nan")));
}

TEST(NumberText, RefusesOtherRealTextsOfDevices)
{
    for (const char* const text :
         {"",    "+", "-",   "+-1",  "-+1",    "++1",   "--1",    " 1",     "1 ", "0x10", "1e",
          "1e+", ".", "1,5", "1.5x", "1.#INF", "1e400", "1e-400", "-1e400", "e5", "1.2.3"}) {
        EXPECT_FALSE(DeviceTextToDouble(text)) << text;
    }
}

TEST(NumberText, FollowsNoGlobalLocaleOfCPlusPlus)
{
    const VGroupingLocale locale;
    std::ostringstream witness; // proves that the locale is in force
    witness << 1234.5;
    ASSERT_EQ("1.234,5", witness.str());

    ExpectPlainNumbers();
}

TEST(NumberText, FollowsNoLocaleOfC)
{
    const VCommaLocale locale;
    if (!locale.IsInForce()) {
        GTEST_SKIP() << "this machine cannot make a locale with a decimal comma";
    }
    char witness[10] = ""; // proves that the locale is in force
    std::snprintf(witness, sizeof witness, "%.1f", 1.5);
    ASSERT_STREQ("1,5", witness);

    ExpectPlainNumbers();

    std::snprintf(witness, sizeof witness, "%.1f", 1.5);
    EXPECT_STREQ("1,5", witness) << "the process's locale must be left as it was";
}

TEST(NumberText, LeavesTheThreadsOwnLocale)
{
    const locale_t own = newlocale(LC_ALL_MASK, "C.UTF-8", nullptr);
    const locale_t previous = uselocale(own);

    (void)TextToDouble("1.5");
    (void)TextToFloat("no number");

    EXPECT_EQ(own, uselocale(previous));
    freelocale(own);
}

TEST(NumberText, IsReadByManyThreadsAtOnce)
{
    constexpr int threadCount = 4;
    std::vector<std::thread> threads;
    threads.reserve(threadCount);
    for (int i = 0; i < threadCount; ++i) {
        threads.emplace_back([] {
            for (int round = 0; round < 1000; ++round) {
                EXPECT_EQ(1.5, TextToDouble("1.5"));
                EXPECT_TRUE(TextToFloat("1.#INF"));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}
