#include "ValueTextReading.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <locale>

using namespace ValueTextReading;

TEST(ValueTextReader, IntegersReadUpToTheLimitsOfTheirType)
{
    // clang-format off
    EXPECT_EQ(-128, ReadNumber<std::int8_t>(EType::Int8, "-128"));
    EXPECT_EQ(127, ReadNumber<std::int8_t>(EType::Int8, "127"));
    EXPECT_EQ(255, ReadNumber<std::uint8_t>(EType::UInt8, "255"));
    EXPECT_EQ(-32768, ReadNumber<std::int16_t>(EType::Int16, "-32768"));
    EXPECT_EQ(65535, ReadNumber<std::uint16_t>(EType::UInt16, "65535"));
    EXPECT_EQ(-2147483647 - 1, ReadNumber<std::int32_t>(EType::Int32, "-2147483648"));
    EXPECT_EQ(4294967295u, ReadNumber<std::uint32_t>(EType::UInt32, "4294967295"));
    EXPECT_EQ(std::numeric_limits<std::int64_t>::min(), ReadNumber<std::int64_t>(EType::Int64, "-9223372036854775808"));
    EXPECT_EQ(std::numeric_limits<std::int64_t>::max(), ReadNumber<std::int64_t>(EType::Int64, "9223372036854775807"));
    EXPECT_EQ(std::numeric_limits<std::uint64_t>::max(), ReadNumber<std::uint64_t>(EType::UInt64, "18446744073709551615"));
    EXPECT_EQ(5, ReadNumber<std::int32_t>(EType::Int32, "+5"));
    EXPECT_EQ(7, ReadNumber<std::uint8_t>(EType::UInt8, "0000007"));
    // clang-format on
}

TEST(ValueTextReader, IntegersOutOfRangeFail)
{
    // clang-format off
    EXPECT_TRUE(Fails(Plain(EType::UInt8), "256"));
    EXPECT_TRUE(Fails(Plain(EType::UInt8), "65535"));
    EXPECT_TRUE(Fails(Plain(EType::UInt8), "65536"));
    EXPECT_TRUE(Fails(Plain(EType::Int8), "-129"));
    EXPECT_TRUE(Fails(Plain(EType::Int8), "128"));
    EXPECT_TRUE(Fails(Plain(EType::UInt16), "65536"));
    EXPECT_TRUE(Fails(Plain(EType::Int16), "32768"));
    EXPECT_TRUE(Fails(Plain(EType::Int16), "-32769"));
    EXPECT_TRUE(Fails(Plain(EType::UInt32), "4294967296"));
    EXPECT_TRUE(Fails(Plain(EType::Int32), "2147483648"));
    EXPECT_TRUE(Fails(Plain(EType::Int32), "-2147483649"));
    EXPECT_TRUE(Fails(Plain(EType::UInt64), "18446744073709551616"));
    EXPECT_TRUE(Fails(Plain(EType::Int64), "9223372036854775808"));
    EXPECT_TRUE(Fails(Plain(EType::Int64), "-9223372036854775809"));
    // clang-format on
}

TEST(ValueTextReader, FailedNumberAppendsNothing)
{
    EXPECT_EQ((VReading{false, {}, "256"}), Read(Plain(EType::UInt8), "256"));
    EXPECT_EQ((VReading{false, {}, "129"}), Read(byte, "129"));
    EXPECT_EQ((VReading{false, {}, "1e400"}), Read(Plain(EType::Float64), "1e400"));
}

TEST(ValueTextReader, UnsignedTypesTakeNoSign)
{
    for (const EType type : {EType::UInt8, EType::UInt16, EType::UInt32, EType::UInt64}) {
        EXPECT_TRUE(Fails(Plain(type), "-1"));
        EXPECT_TRUE(Fails(Plain(type), "+1"));
    }
}

TEST(ValueTextReader, IntegersNeedDigits)
{
    for (const EType type : {EType::Int8, EType::UInt8, EType::Int64, EType::UInt64}) {
        EXPECT_TRUE(Fails(Plain(type), ""));
        EXPECT_TRUE(Fails(Plain(type), "-"));
        EXPECT_TRUE(Fails(Plain(type), "x"));
        EXPECT_TRUE(Fails(Plain(type), "\"5\""));
    }
    EXPECT_EQ(Good({5}, ".5"), Read(byte, "5.5"));
    EXPECT_EQ(Good({0}, "x10"), Read(byte, "0x10"));
}

TEST(ValueTextReader, RealNumbersTakeTheFormsOfTheWriter)
{
    EXPECT_EQ(0.5, ReadDouble("0.5"));
    EXPECT_EQ(42.0, ReadDouble("42.0"));
    EXPECT_EQ(-1.0e-04, ReadDouble("-1.0e-04"));
    EXPECT_EQ(1.23456789123e08, ReadDouble("1.23456789123e08"));
    EXPECT_EQ(1e300, ReadDouble("1.0e300"));
    EXPECT_EQ(infinity, ReadDouble("inf"));
    EXPECT_EQ(-infinity, ReadDouble("-inf"));
    EXPECT_TRUE(ReadDouble("nan") != ReadDouble("nan"));
    EXPECT_TRUE(std::signbit(ReadDouble("-nan")));
    EXPECT_EQ(99999.5f, ReadFloat("99999.5"));
    EXPECT_EQ(1e-4f, ReadFloat("1.0e-04"));
    EXPECT_EQ(std::numeric_limits<float>::infinity(), ReadFloat("inf"));
    EXPECT_TRUE(std::isnan(ReadFloat("nan")));
}

TEST(ValueTextReader, RealNumbersTakeOtherForms)
{
    EXPECT_EQ(5.0, ReadDouble("5"));
    EXPECT_EQ(0.5, ReadDouble(".5"));
    EXPECT_EQ(5.0, ReadDouble("5."));
    EXPECT_EQ(5000.0, ReadDouble("5.e3"));
    EXPECT_EQ(1.0, ReadDouble("+1"));
    EXPECT_EQ(infinity, ReadDouble("Infinity"));
}

TEST(ValueTextReader, RealNumbersThatAreTooGreatFail)
{
    EXPECT_TRUE(Fails(Plain(EType::Float64), "1e400"));
    EXPECT_TRUE(Fails(Plain(EType::Float64), std::string(400, '9')));
    EXPECT_TRUE(Fails(Plain(EType::Float32), "1e39"));
    EXPECT_TRUE(Fails(Plain(EType::Float64), "e5"));
    EXPECT_TRUE(Fails(Plain(EType::Float64), "."));
    EXPECT_TRUE(Fails(Plain(EType::Float64), ""));
}

TEST(ValueTextReader, RealNumbersTakeAnyCountOfDigits)
{
    const std::string zeros(5000, '0');

    EXPECT_EQ(0.0f, ReadFloat("0." + std::string(80, '0') + "8"));
    EXPECT_EQ(0.0, ReadDouble("0." + zeros + "8"));
    EXPECT_TRUE(std::signbit(ReadDouble("-0." + zeros + "8")));
    EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00\x00\x00\x00\x00"), "e"),
              Read(Plain(EType::Float64), "0." + zeros + "8e"));
    EXPECT_EQ(8.0f, ReadFloat("0." + zeros + "8e5001"));
    EXPECT_EQ(5.0, ReadDouble("5." + zeros));
    EXPECT_EQ(0.0f, ReadFloat("0." + std::string(69, '0') + "1"));
}

TEST(ValueTextReader, ExponentsOfAnySizeReadOrFail)
{
    for (const char* digits :
         {"1", "0.1", "99999999999999999999999999", "0.00000000000000000001"}) {
        for (const char* exponent : {"e2147483647", "e-2147483648", "e99999999999", "e-99999999999",
                                     "e2147483600", "e-2147483600"}) {
            const std::string text = std::string(digits) + exponent;
            for (const EType type : {EType::Float32, EType::Float64}) {
                const VReading reading = Read(Plain(type), text);
                // Digits that no exponent can hold do not belong to the number.
                EXPECT_TRUE(!reading.good || reading.rest == exponent) << text;
            }
        }
    }
}

TEST(ValueTextReader, NumbersFollowNoLocale)
{
    class VGrouping : public std::numpunct<char>
    {
        char do_decimal_point() const override { return ','; }
        char do_thousands_sep() const override { return '.'; }
        std::string do_grouping() const override { return "\3"; }
    };
    const std::locale before = std::locale::global(std::locale(std::locale(), new VGrouping));
    const VReading real = Read(Plain(EType::Float64), "1.5");
    const VReading integer = Read(byte, "1.234");
    std::locale::global(before);

    EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00\x00\x00\xF8\x3F")), real);
    EXPECT_EQ(Good({1}, ".234"), integer);
}

TEST(ValueTextReader, LastDigitsOfADoubleDoNotReadBack)
{
    const double numbers[] = {0.30000000000000004, std::numeric_limits<double>::max()};
    const double readBack[] = {0.3000000000000001, infinity};

    for (std::size_t i = 0; i < 2; ++i) {
        ByteVector bytes(sizeof(double));
        std::memcpy(bytes.data(), &numbers[i], sizeof(double));
        std::string text;
        ASSERT_TRUE(BinaryToText(bytes, Plain(EType::Float64), text));

        EXPECT_EQ(readBack[i], ReadDouble(text)) << text;
    }
}
