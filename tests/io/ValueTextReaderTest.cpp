#include "io/ValueText.h"

#include "io/SchemaSamples.h"
#include "io/TextCursor.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <locale>

using namespace KVR::IO;

namespace {

using ByteVector = std::vector<unsigned char>;

struct VReading
{
    bool good;
    ByteVector bytes;
    std::string rest; ///< what was not read

    bool operator==(const VReading& other) const
    {
        return good == other.good && bytes == other.bytes && rest == other.rest;
    }
};

std::ostream& operator<<(std::ostream& output, const VReading& reading)
{
    return output << (reading.good ? "good " : "failed ") << testing::PrintToString(reading.bytes)
                  << " rest '" << reading.rest << "'";
}

VReading Read(const ISchema& schema, const std::string& text,
              SchemaTextMode mode = SchemaTextModeNamed)
{
    VReading reading{false, {9, 9, 9}, ""};
    const char* begin = text.data();
    const char* const end = begin + text.size();
    reading.good = TextToBinary(begin, end, schema, reading.bytes, mode);
    reading.rest.assign(begin, end);
    return reading;
}

VReading Good(ByteVector bytes, const std::string& rest = "")
{
    return {true, std::move(bytes), rest};
}

bool Fails(const ISchema& schema, const std::string& text,
           SchemaTextMode mode = SchemaTextModeNamed)
{
    return !Read(schema, text, mode).good;
}

template <typename T>
T ReadNumber(EType type, const std::string& text)
{
    const VReading reading = Read(Plain(type), text);
    EXPECT_TRUE(reading.good) << text;
    EXPECT_EQ("", reading.rest);
    T number{};
    EXPECT_EQ(sizeof(T), reading.bytes.size());
    if (reading.bytes.size() == sizeof(T)) {
        std::memcpy(&number, reading.bytes.data(), sizeof(T));
    }
    return number;
}

double ReadDouble(const std::string& text)
{
    return ReadNumber<double>(EType::Float64, text);
}

float ReadFloat(const std::string& text)
{
    return ReadNumber<float>(EType::Float32, text);
}

const ISchema boolean = Plain(EType::Bool);
const ISchema byte = Plain(EType::Int8);
const ISchema word = Plain(EType::String);
const ISchema colour = EnumOf(EType::Enum8, {{"Red", 5}, {"Red", 6}, {"Dark red", -1}, {"", 7}});
const ISchema pair = NamedTupleOf({{"a", byte}, {"b", byte}});

const SchemaTextMode allModes[] = {SchemaTextModePositional, SchemaTextModeNamed,
                                   SchemaTextModeBrief, SchemaTextModeRow, SchemaTextModeQuotedRow};

const double infinity = std::numeric_limits<double>::infinity();

} // namespace

TEST(ValueTextReader, ReplacesTheBytes)
{
    EXPECT_EQ(Good({1}), Read(boolean, "true"));
    EXPECT_EQ((VReading{false, {}, "x"}), Read(boolean, "x"));
    EXPECT_EQ((VReading{false, {}, ""}), Read(Plain(EType::Array), ""));
}

TEST(ValueTextReader, BoolIsABareWordInAllModesButTheQuotedRow)
{
    for (const SchemaTextMode mode : allModes) {
        const bool bare = mode != SchemaTextModeQuotedRow;
        EXPECT_EQ(bare, Read(boolean, "true", mode) == Good({1}));
        EXPECT_EQ(bare, Read(boolean, "false", mode) == Good({0}));
        EXPECT_EQ(!bare, Read(boolean, "\"true\"", mode) == Good({1}));
        EXPECT_EQ(!bare, Read(boolean, "\"false\"", mode) == Good({0}));
    }
}

TEST(ValueTextReader, OnlyTheExactWordsAreBools)
{
    EXPECT_TRUE(Fails(boolean, "True"));
    EXPECT_TRUE(Fails(boolean, "TRUE"));
    EXPECT_TRUE(Fails(boolean, "1"));
    EXPECT_TRUE(Fails(boolean, "tru"));
    EXPECT_TRUE(Fails(boolean, ""));
    EXPECT_TRUE(Fails(boolean, "\"true", SchemaTextModeQuotedRow));
    EXPECT_TRUE(Fails(boolean, "\" true\"", SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, WhatFollowsTheValueIsLeftToTheCaller)
{
    EXPECT_EQ(Good({1}, "x"), Read(boolean, "truex"));
    EXPECT_EQ(Good({5}, ",6"), Read(byte, "5 ,6"));
    EXPECT_EQ(Good({1, 2}, "]"), Read(pair, "[1,2] ]"));
}

TEST(ValueTextReader, SixBlanksAreSkippedBeforeAndAfterEveryValue)
{
    const std::string blanks = " \t\n\v\f\r";

    EXPECT_EQ(Good({1}), Read(boolean, blanks + "true" + blanks));
    EXPECT_EQ(Good({5}), Read(byte, blanks + "5" + blanks));
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "a")),
              Read(word, blanks + "\"a\"" + blanks));
    EXPECT_EQ(Good({1, 2}), Read(pair, blanks + "[" + blanks + "1" + blanks + "," + blanks + "2" +
                                           blanks + "]" + blanks));
    EXPECT_EQ(Good({1, 2}),
              Read(pair, blanks + "{" + blanks + "\"a\"" + blanks + ":" + blanks + "1" + blanks +
                             "," + blanks + "\"b\"" + blanks + ":" + blanks + "2" + blanks + "}"));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02")),
              Read(ListOf(byte), "[" + blanks + "1" + blanks + "," + blanks + "2" + blanks + "]"));
}

TEST(ValueTextReader, OtherBytesAreNoBlanks)
{
    EXPECT_TRUE(Fails(byte, "\xA0"
                            "5"));
    EXPECT_TRUE(Fails(byte, std::string("\0", 1) + "5"));
    EXPECT_TRUE(Fails(byte, "\x08"
                            "5"));
    EXPECT_TRUE(Fails(byte, "\x0E"
                            "5"));
}

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

TEST(ValueTextReader, StringsAreQuotedInAllModes)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_EQ(Good(Bytes("\x03\x00\x00\x00"
                             "a,]")),
                  Read(word, "\"a,]\"", mode));
        EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(word, "\"\"", mode));
    }
}

TEST(ValueTextReader, BackslashIntroducesOneOfSevenCharacters)
{
    EXPECT_EQ(Good(Bytes("\x07\x00\x00\x00"
                         "\t\r\n\f\b\"\\")),
              Read(word, R"("\t\r\n\f\b\"\\")"));
    EXPECT_TRUE(Fails(word, R"("\a")"));
    EXPECT_TRUE(Fails(word, R"("\/")"));
    EXPECT_TRUE(Fails(word, R"("\u0041")"));
    EXPECT_TRUE(Fails(word, std::string("\"\\\0\"", 4)));
}

TEST(ValueTextReader, OtherBytesOfAStringStandForThemselves)
{
    EXPECT_EQ(Good(Bytes("\x04\x00\x00\x00"
                         "\n\0\xC3\x01")),
              Read(word, std::string("\"\n\0\xC3\x01\"", 6)));
}

TEST(ValueTextReader, UnterminatedStringFails)
{
    EXPECT_TRUE(Fails(word, "\"a"));
    EXPECT_TRUE(Fails(word, "\""));
    EXPECT_TRUE(Fails(word, "\"a\\"));
    EXPECT_TRUE(Fails(word, "\"a\\\""));
    EXPECT_TRUE(Fails(word, ""));
    EXPECT_TRUE(Fails(word, "a"));
    EXPECT_TRUE(Fails(word, "a", SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, RowTakesABareRunUpToTheCommaOrTheEnd)
{
    EXPECT_EQ(Good(Bytes("\x03\x00\x00\x00"
                         "a b")),
              Read(word, "a b", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "a"),
                   ",b"),
              Read(word, "a,b", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x03\x00\x00\x00"
                         "\\t]")),
              Read(word, "\\t]", SchemaTextModeRow));
}

TEST(ValueTextReader, LeadingBlanksOfABareRunAreSkippedAndTheLastBelongToIt)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "a ")),
              Read(word, "  a ", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x02\x00\x00\x00"
                         "a "
                         "\x01\x00\x00\x00"
                         "b")),
              Read(ListOf(word), "a , b", SchemaTextModeRow));
}

TEST(ValueTextReader, BareRunOfNoCharactersIsAString)
{
    EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(word, "", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x00\x00\x00\x00"
                         "\x00\x00\x00\x00")),
              Read(ListOf(word), ",", SchemaTextModeRow));
}

TEST(ValueTextReader, QuoteThatIsNeverClosedBeginsABareRunInARow)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\"a"),
                   ",b"),
              Read(word, "\"a,b", SchemaTextModeRow));
}

TEST(ValueTextReader, DeliberateBareRunKnowsNoBrackets)
{
    // A row of rows of bare words therefore does not read back.
    EXPECT_TRUE(Fails(ListOf(ListOf(word)), "[a,b]", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "a")),
              Read(ListOf(ListOf(word)), "[\"a\"]", SchemaTextModeRow));
}

TEST(ValueTextReader, EnumIsTheNumberOfTheFirstEntryOfThatName)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_EQ(Good({5}), Read(colour, "\"Red\"", mode));
        EXPECT_EQ(Good({0xFF}), Read(colour, "\"Dark red\"", mode));
        EXPECT_EQ(mode == SchemaTextModeRow, Read(colour, "Dark red", mode) == Good({0xFF}));
    }
    EXPECT_EQ(Good({7}), Read(colour, "", SchemaTextModeRow));
}

TEST(ValueTextReader, EnumTakesTheWidthOfItsType)
{
    EXPECT_EQ(Good(Bytes("\xFE\xFF")), Read(EnumOf(EType::Enum16, {{"a", -2}}), "\"a\""));
    EXPECT_EQ(Good(Bytes("\x02\x01\x00\x00")), Read(EnumOf(EType::Enum32, {{"a", 258}}), "\"a\""));
    EXPECT_EQ(Good(Bytes("\x02")), Read(EnumOf(EType::Enum8, {{"a", 258}}), "\"a\""));
}

TEST(ValueTextReader, UnknownNameFails)
{
    EXPECT_TRUE(Fails(colour, "\"red\""));
    EXPECT_TRUE(Fails(colour, "\"Red \""));
    EXPECT_TRUE(Fails(colour, "5"));
    EXPECT_TRUE(Fails(colour, "Red ", SchemaTextModeRow));
}

TEST(ValueTextReader, TupleReadsByPositionOrByNameInAllModesButAtTheTopOfARow)
{
    for (const SchemaTextMode mode : allModes) {
        const bool row = mode > SchemaTextModeBrief;
        EXPECT_EQ(!row, Read(pair, "[1,2]", mode) == Good({1, 2}));
        EXPECT_EQ(!row, Read(pair, R"({"a":1,"b":2})", mode) == Good({1, 2}));
        EXPECT_EQ(row, Read(pair, "1,2", mode) == Good({1, 2}));
        EXPECT_EQ(Good({1, 2}), Read(TupleOf({pair}), row ? "[1,2]" : "[[1,2]]", mode));
        EXPECT_EQ(Good({1, 2}),
                  Read(TupleOf({pair}), row ? R"({"a":1,"b":2})" : R"([{"a":1,"b":2}])", mode));
    }
}

TEST(ValueTextReader, MembersMustStandInSchemaOrder)
{
    EXPECT_TRUE(Fails(pair, R"({"b":2,"a":1})"));
    EXPECT_TRUE(Fails(pair, R"({"a":1})"));
    EXPECT_TRUE(Fails(pair, R"({"b":2})"));
    EXPECT_TRUE(Fails(pair, R"({"a":1,"a":1})"));
    EXPECT_TRUE(Fails(pair, R"({"a":1,"b":2,"c":3})"));
    EXPECT_TRUE(Fails(pair, "{}"));
}

TEST(ValueTextReader, KeysMustEqualTheNamesExactly)
{
    EXPECT_TRUE(Fails(pair, R"({"A":1,"b":2})"));
    EXPECT_TRUE(Fails(pair, R"({"a ":1,"b":2})"));
    EXPECT_TRUE(Fails(pair, R"({a:1,b:2})"));
    EXPECT_TRUE(Fails(pair, R"({"a" 1,"b":2})"));
    EXPECT_EQ(Good({1}), Read(NamedTupleOf({{"a\t\"", byte}}), R"({"a\t\"":1})"));
    EXPECT_EQ(Good({1}), Read(TupleOf({byte}), R"({"":1})"));
    EXPECT_TRUE(Fails(TupleOf({byte}), R"({"a":1})"));
}

TEST(ValueTextReader, TupleNeedsExactlyItsMembers)
{
    EXPECT_TRUE(Fails(pair, "[1]"));
    EXPECT_TRUE(Fails(pair, "[1,2,3]"));
    EXPECT_TRUE(Fails(pair, "[1,2,]"));
    EXPECT_TRUE(Fails(pair, "[1,2}"));
    EXPECT_TRUE(Fails(pair, R"({"a":1,"b":2])"));
    EXPECT_TRUE(Fails(pair, "[1,2"));
    EXPECT_TRUE(Fails(pair, "[1 2]"));
    EXPECT_TRUE(Fails(pair, "[]"));
    EXPECT_TRUE(Fails(pair, ""));
    EXPECT_TRUE(Fails(pair, "(1,2)"));
    EXPECT_TRUE(Fails(pair, "1", SchemaTextModeRow));
    EXPECT_EQ(Good({1, 2}, ",3"), Read(pair, "1,2,3", SchemaTextModeRow));
}

TEST(ValueTextReader, TupleWithoutMembersTakesEmptyBrackets)
{
    EXPECT_EQ(Good({}), Read(TupleOf({}), "[]"));
    EXPECT_EQ(Good({}), Read(TupleOf({}), " [ \t] "));
    EXPECT_EQ(Good({}), Read(TupleOf({}), "{ }"));
    EXPECT_EQ(Good({}), Read(ArrayOf(byte, 0), "[]"));
    EXPECT_EQ(Good({}), Read(ArrayOf(byte, 0), "{}"));
    EXPECT_TRUE(Fails(TupleOf({}), "[}"));
    EXPECT_TRUE(Fails(TupleOf({}), "[1]"));
    EXPECT_TRUE(Fails(TupleOf({}), ""));
    EXPECT_EQ(Good({}), Read(TupleOf({TupleOf({})}), "{}", SchemaTextModeRow));
}

TEST(ValueTextReader, TupleWithoutMembersAtTheTopOfARowIsNothing)
{
    EXPECT_EQ(Good({}), Read(TupleOf({}), "", SchemaTextModeRow));
    EXPECT_EQ(Good({}, "[]"), Read(TupleOf({}), "[]", SchemaTextModeRow));
    EXPECT_EQ(Good({}), Read(ArrayOf(byte, 0), " ", SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, RowOfAnIntegerAndAWord)
{
    const ISchema row = TupleOf({Plain(EType::Int32), word});

    EXPECT_EQ(Good(Bytes("\x07\x00\x00\x00"
                         "\x03\x00\x00\x00"
                         "abc")),
              Read(row, "7,abc", SchemaTextModeRow));
}

TEST(ValueTextReader, ArrayTakesExactlyItsCount)
{
    const ISchema numbers = ArrayOf(byte, 3);
    const ISchema bools = ArrayOf(boolean, 3);

    EXPECT_EQ(Good({1, 2, 3}), Read(numbers, "[1,2,3]"));
    EXPECT_TRUE(Fails(numbers, "[1,2]"));
    EXPECT_TRUE(Fails(numbers, "[1,2,3,4]"));
    EXPECT_TRUE(Fails(numbers, "[1,2,]"));
    EXPECT_TRUE(Fails(numbers, "[]"));
    EXPECT_EQ(Good({1, 2, 3}), Read(numbers, "1,2,3", SchemaTextModeRow));
    EXPECT_EQ(Good({1, 2, 3}, ",4"), Read(numbers, "1,2,3,4", SchemaTextModeRow));
    EXPECT_TRUE(Fails(numbers, "1,2", SchemaTextModeRow));

    EXPECT_EQ(Good({1, 0, 1}), Read(bools, "[true,false,true]"));
    EXPECT_TRUE(Fails(bools, "[true,false]"));
    EXPECT_TRUE(Fails(bools, "[true,false,true,true]"));
}

TEST(ValueTextReader, ArrayReadsPairsWithTheNameOfItsPart)
{
    EXPECT_EQ(Good({1, 2}), Read(ArrayOf(byte, 2), R"({"":1,"":2})"));
    EXPECT_TRUE(Fails(ArrayOf(byte, 2), R"({"":1})"));
    EXPECT_TRUE(Fails(ArrayOf(byte, 2), R"({"a":1,"b":2})"));
}

TEST(ValueTextReader, ListReadsItemsInBrackets)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02")),
              Read(ListOf(byte), "[1,2]"));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x00")),
              Read(ListOf(boolean), "[true,false]"));
    EXPECT_TRUE(Fails(ListOf(byte), "[1,2"));
    EXPECT_TRUE(Fails(ListOf(byte), "[1,]"));
    EXPECT_TRUE(Fails(ListOf(byte), "[,1]"));
    EXPECT_TRUE(Fails(ListOf(byte), "[1 2]"));
    EXPECT_TRUE(Fails(ListOf(byte), "1,2"));
    EXPECT_TRUE(Fails(ListOf(byte), "{}"));
    EXPECT_TRUE(Fails(ListOf(byte), ""));
}

TEST(ValueTextReader, EmptyListIsFourZeroBytes)
{
    for (const SchemaTextMode mode :
         {SchemaTextModePositional, SchemaTextModeNamed, SchemaTextModeBrief}) {
        EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(ListOf(byte), "[]", mode));
        EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(ListOf(byte), "[ \n ]", mode));
    }
}

TEST(ValueTextReader, ListAtTheTopOfARowReadsUntilNoCommaFollows)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02")),
              Read(ListOf(byte), "1,2", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02"),
                   "]"),
              Read(ListOf(byte), "1,2]", SchemaTextModeQuotedRow));
    EXPECT_TRUE(Fails(ListOf(byte), "1,", SchemaTextModeRow));
    EXPECT_TRUE(Fails(ListOf(byte), "[1,2]", SchemaTextModeRow));
}

TEST(ValueTextReader, EmptyListAtTheTopOfARowDoesNotReadBack)
{
    EXPECT_TRUE(Fails(ListOf(byte), "", SchemaTextModeRow));
    EXPECT_TRUE(Fails(ListOf(byte), "", SchemaTextModeQuotedRow));
    // Of words it becomes a list of one empty word.
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "\x00\x00\x00\x00")),
              Read(ListOf(word), "", SchemaTextModeRow));
}

TEST(ValueTextReader, DeliberateCountOfAListIsWrittenAlsoAfterAFailedItem)
{
    EXPECT_EQ((VReading{false, Bytes("\x02\x00\x00\x00\x01\x02"), "x]"}),
              Read(ListOf(byte), "[1,2,x]"));
    EXPECT_EQ((VReading{false, Bytes("\x01\x00\x00\x00\x01"), "x]"}),
              Read(ListOf(boolean), "[true,x]"));
    EXPECT_EQ((VReading{false, Bytes("\x01\x00\x00\x00\x01"), "x"}),
              Read(ListOf(byte), "1,x", SchemaTextModeRow));
    EXPECT_EQ((VReading{false, Bytes("\x00\x00\x00\x00"), "x"}), Read(ListOf(byte), "x"));
}

TEST(ValueTextReader, CountThatWrapsAroundStopsTheItems)
{
    const std::string text = ",,,,";
    Detail::VTextCursor cursor{text.data(), text.data() + text.size()};
    std::uint32_t count = 0xFFFFFFFE;

    EXPECT_TRUE(Detail::ReadSeparated(cursor, 0, count, [] { return true; }));
    EXPECT_EQ(0u, count);
    EXPECT_EQ(text.data() + 1, cursor.Position);
}

TEST(ValueTextReader, NestedListsReadTheirBrackets)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "\x05"
                         "\x00\x00\x00\x00")),
              Read(ListOf(ListOf(byte)), "[[5],[]]"));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "\x05"
                         "\x00\x00\x00\x00")),
              Read(ListOf(ListOf(byte)), "[5],[]", SchemaTextModeRow));
}

TEST(ValueTextReader, QuotedBoolsOfARowFailInTheOrdinaryForm)
{
    std::string text;
    ASSERT_TRUE(BinaryToText({1}, boolean, text, SchemaTextModeQuotedRow));

    EXPECT_EQ("\"true\"", text);
    EXPECT_TRUE(Fails(boolean, text, SchemaTextModeNamed));
    EXPECT_EQ(Good({1}), Read(boolean, text, SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, StringWithATabSurvivesAWriteAndARead)
{
    const ByteVector bytes = Bytes("\x03\x00\x00\x00"
                                   "a\tb");
    std::string text;
    ASSERT_TRUE(BinaryToText(bytes, word, text));

    EXPECT_EQ(R"("a\tb")", text);
    EXPECT_EQ(Good(bytes), Read(word, text));
}

TEST(ValueTextReader, CountsOfTheBriefModeDoNotReadBack)
{
    std::string text;
    ASSERT_TRUE(
        BinaryToText(Bytes("\x02\x00\x00\x00\x07\x08"), ListOf(byte), text, SchemaTextModeBrief));

    EXPECT_EQ("[2]", text);
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00\x02")), Read(ListOf(byte), text, SchemaTextModeBrief));
    EXPECT_TRUE(Fails(ArrayOf(byte, 2), text, SchemaTextModeBrief));
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

TEST(ValueTextReader, VoidAndRefHaveNoText)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_TRUE(Fails(Plain(EType::Void), "", mode));
        EXPECT_TRUE(Fails(Plain(EType::Ref), "", mode));
        EXPECT_TRUE(Fails(Plain(static_cast<EType>(21)), "", mode));
        EXPECT_TRUE(Fails(ListOf(Plain(EType::Void)), "[,]", mode));
    }
}

TEST(ValueTextReader, ArrayOrListWithoutExactlyOnePartFails)
{
    const ISchema noPart = Plain(EType::List);
    const ISchema twoParts = WithParts(EType::Array, {{"", byte}, {"", byte}});

    EXPECT_TRUE(Fails(noPart, "[]"));
    EXPECT_TRUE(Fails(twoParts, "[]"));
    EXPECT_TRUE(Fails(ListOf(noPart), "[]"));
    EXPECT_TRUE(Fails(TupleOf({byte, twoParts}), "[1,[]]"));
}
