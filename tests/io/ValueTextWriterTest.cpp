#include "io/ValueText.h"

#include "io/BinaryLayout.h"
#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <limits>
#include <locale>
#include <stdexcept>
#include <type_traits>

using namespace KVR::IO;

namespace {

using ByteVector = std::vector<unsigned char>;

const SchemaTextMode allModes[] = {SchemaTextModePositional, SchemaTextModeNamed,
                                   SchemaTextModeBrief, SchemaTextModeRow, SchemaTextModeQuotedRow};

std::string Write(const ISchema& schema, const ByteVector& bytes,
                  SchemaTextMode mode = SchemaTextModeNamed)
{
    std::string text = "old";
    EXPECT_TRUE(BinaryToText(bytes, schema, text, mode));
    return text;
}

bool Fails(const ISchema& schema, const ByteVector& bytes,
           SchemaTextMode mode = SchemaTextModeNamed)
{
    std::string text;
    return !BinaryToText(bytes, schema, text, mode);
}

std::string ErrorOf(const ISchema& schema, const ByteVector& bytes,
                    SchemaTextMode mode = SchemaTextModeNamed)
{
    try {
        std::string text;
        return BinaryToText(bytes, schema, text, mode) ? "written" : "failed";
    } catch (const std::runtime_error& error) {
        return error.what();
    }
}

template <typename T>
std::string WriteNumber(EType type, T number)
{
    ByteVector bytes;
    Detail::AppendNumber(bytes, number);
    return Write(Plain(type), bytes);
}

std::string WriteFloat(float number)
{
    return WriteNumber(EType::Float32, number);
}

std::string WriteDouble(double number)
{
    return WriteNumber(EType::Float64, number);
}

/// The texts of one value in the modes 0 to 4.
std::vector<std::string> InAllModes(const ISchema& schema, const ByteVector& bytes)
{
    std::vector<std::string> texts;
    for (const SchemaTextMode mode : allModes) {
        texts.push_back(Write(schema, bytes, mode));
    }
    return texts;
}

using Texts = std::vector<std::string>;

const ISchema colour = EnumOf(EType::Enum8, {{"Red", 0}, {"Dark \"red\"", 0}, {"Blue", -1}});

/// A locale that groups digits by threes and has a comma for the point.
class VGrouping : public std::numpunct<char>
{
protected:
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

template <typename Mode, typename = void>
struct VTakesMode : std::false_type
{
};

template <typename Mode>
struct VTakesMode<Mode, std::void_t<decltype(BinaryToText(
                            std::declval<const ByteVector&>(), std::declval<const ISchema&>(),
                            std::declval<std::string&>(), std::declval<Mode>()))>> : std::true_type
{
};

} // namespace

TEST(ValueTextWriter, ReplacesWhatTheTextHeld)
{
    EXPECT_EQ("true", Write(Plain(EType::Bool), {1}));
    std::string text = "old";
    EXPECT_FALSE(BinaryToText({}, Plain(EType::Void), text));
    EXPECT_EQ("", text);
}

TEST(ValueTextWriter, RealNumbersHaveSevenAndSixteenDigitsBehindThePoint)
{
    EXPECT_EQ("0.1234568", WriteFloat(0.123456789f));
    EXPECT_EQ("1.1234568", WriteFloat(1.123456789f));
    EXPECT_EQ("0.1234567890123457", WriteDouble(0.12345678901234567));
}

TEST(ValueTextWriter, BoolInAllModes)
{
    EXPECT_EQ((Texts{"true", "true", "true", "true", "\"true\""}),
              InAllModes(Plain(EType::Bool), {1}));
    EXPECT_EQ((Texts{"false", "false", "false", "false", "\"false\""}),
              InAllModes(Plain(EType::Bool), {0}));
}

TEST(ValueTextWriter, IntegersAreDecimalWithASignOnlyIfNegative)
{
    // clang-format off
    EXPECT_EQ("-128", WriteNumber<std::int8_t>(EType::Int8, -128));
    EXPECT_EQ("127", WriteNumber<std::int8_t>(EType::Int8, 127));
    EXPECT_EQ("255", WriteNumber<std::uint8_t>(EType::UInt8, 255));
    EXPECT_EQ("-32768", WriteNumber<std::int16_t>(EType::Int16, -32768));
    EXPECT_EQ("65535", WriteNumber<std::uint16_t>(EType::UInt16, 65535));
    EXPECT_EQ("-2147483648", WriteNumber<std::int32_t>(EType::Int32, -2147483647 - 1));
    EXPECT_EQ("4294967295", WriteNumber<std::uint32_t>(EType::UInt32, 4294967295));
    EXPECT_EQ("-9223372036854775808", WriteNumber<std::int64_t>(EType::Int64, std::numeric_limits<std::int64_t>::min()));
    EXPECT_EQ("9223372036854775807", WriteNumber<std::int64_t>(EType::Int64, std::numeric_limits<std::int64_t>::max()));
    EXPECT_EQ("18446744073709551615", WriteNumber<std::uint64_t>(EType::UInt64, std::numeric_limits<std::uint64_t>::max()));
    EXPECT_EQ("0", WriteNumber<std::int32_t>(EType::Int32, 0));
    // clang-format on
}

TEST(ValueTextWriter, FloatsHaveAtMostSevenDigitsBehindThePoint)
{
    EXPECT_EQ("0.5", WriteFloat(0.5f));
    EXPECT_EQ("0.1", WriteFloat(0.1f));
    EXPECT_EQ("0.3333334", WriteFloat(1.0f / 3));
    EXPECT_EQ("99999.9921876", WriteFloat(99999.99f));
    EXPECT_EQ("42.0", WriteFloat(42.0f));
    EXPECT_EQ("-42.5", WriteFloat(-42.5f));
    EXPECT_EQ("3.4028237e38", WriteFloat(std::numeric_limits<float>::max()));
}

TEST(ValueTextWriter, DoublesHaveAtMostSixteenDigitsBehindThePoint)
{
    EXPECT_EQ("0.7", WriteDouble(0.7));
    EXPECT_EQ("0.3333333333333333", WriteDouble(1.0 / 3));
    EXPECT_EQ("42.0", WriteDouble(42));
    EXPECT_EQ("12345.6789012345670926", WriteDouble(12345.678901234567));
    EXPECT_EQ("1.23456789123e08", WriteDouble(123456789.123));
    EXPECT_EQ("1.0e300", WriteDouble(1e300));
    EXPECT_EQ("2.2250738585072014e-308", WriteDouble(std::numeric_limits<double>::min()));
    EXPECT_EQ("4.940656458412466e-324", WriteDouble(5e-324));
}

TEST(ValueTextWriter, NotationIsFixedFromOneThousandthToBelowOneHundredThousand)
{
    EXPECT_EQ("1.0e-04", WriteFloat(1e-4f));
    EXPECT_EQ("0.001", WriteFloat(0.001f));
    EXPECT_EQ("99999.5", WriteFloat(99999.5f));
    EXPECT_EQ("1.0e05", WriteFloat(100000.0f));
    EXPECT_EQ("-1.0e05", WriteFloat(-100000.0f));

    EXPECT_EQ("1.0e-04", WriteDouble(1e-4));
    EXPECT_EQ("5.0e-04", WriteDouble(0.0005));
    EXPECT_EQ("0.001", WriteDouble(0.001));
    EXPECT_EQ("99999.5", WriteDouble(99999.5));
    EXPECT_EQ("1.0e05", WriteDouble(100000));
    EXPECT_EQ("-1.0e-04", WriteDouble(-1e-4));
    EXPECT_EQ("0.0", WriteDouble(0));
}

TEST(ValueTextWriter, NegativeZeroLosesItsSign)
{
    EXPECT_EQ("0.0", WriteFloat(-0.0f));
    EXPECT_EQ("0.0", WriteDouble(-0.0));
}

TEST(ValueTextWriter, NotANumberAndInfinityKeepTheirSign)
{
    const double nan = std::numeric_limits<double>::quiet_NaN();
    const double infinity = std::numeric_limits<double>::infinity();

    EXPECT_EQ("nan", WriteDouble(nan));
    EXPECT_EQ("-nan", WriteDouble(-nan));
    EXPECT_EQ("inf", WriteDouble(infinity));
    EXPECT_EQ("-inf", WriteDouble(-infinity));
    EXPECT_EQ("nan", WriteFloat(static_cast<float>(nan)));
    EXPECT_EQ("-nan", WriteFloat(-std::numeric_limits<float>::quiet_NaN()));
    EXPECT_EQ("inf", WriteFloat(static_cast<float>(infinity)));
    EXPECT_EQ("-inf", WriteFloat(static_cast<float>(-infinity)));
}

TEST(ValueTextWriter, NumbersFollowNoLocale)
{
    const std::locale before = std::locale::global(std::locale(std::locale(), new VGrouping));
    const std::string real = WriteDouble(12345.5);
    const std::string integer = WriteNumber<std::int32_t>(EType::Int32, 1234567);
    std::locale::global(before);

    EXPECT_EQ("12345.5", real);
    EXPECT_EQ("1234567", integer);
}

TEST(ValueTextWriter, StringInAllModes)
{
    EXPECT_EQ((Texts{"\"ab\"", "\"ab\"", "\"ab\"", "ab", "\"ab\""}),
              InAllModes(Plain(EType::String), Bytes("\x02\x00\x00\x00"
                                                     "ab")));
    EXPECT_EQ((Texts{"\"\"", "\"\"", "\"\"", "", "\"\""}),
              InAllModes(Plain(EType::String), Bytes("\x00\x00\x00\x00")));
}

TEST(ValueTextWriter, SevenCharactersAreEscapedInQuotes)
{
    const ByteVector bytes = Bytes("\x0B\x00\x00\x00"
                                   "\b\t\n\f\r\"\\\x01\x7F\xC3\0");

    EXPECT_EQ(std::string("\"\\b\\t\\n\\f\\r\\\"\\\\\x01\x7F\xC3\0\"", 20),
              Write(Plain(EType::String), bytes));
}

TEST(ValueTextWriter, RowModeWritesTheBytesOfAStringAsTheyAre)
{
    const ByteVector bytes = Bytes("\x06\x00\x00\x00"
                                   "\t,\"\\]\n");

    EXPECT_EQ("\t,\"\\]\n", Write(Plain(EType::String), bytes, SchemaTextModeRow));
}

TEST(ValueTextWriter, EnumIsTheFirstNameOfItsNumber)
{
    EXPECT_EQ((Texts{"\"Red\"", "\"Red\"", "\"Red\"", "Red", "\"Red\""}),
              InAllModes(colour, Bytes("\x00")));
    EXPECT_EQ("\"Blue\"", Write(colour, Bytes("\xFF")));
}

TEST(ValueTextWriter, EnumsOfAllWidthsAreSigned)
{
    // clang-format off
    const std::initializer_list<ISchema::EnumValue> entries = {{"Minus", -2}, {"Plus", 254}, {"More", 65534}};
    EXPECT_EQ("\"Minus\"", Write(EnumOf(EType::Enum8, entries), Bytes("\xFE")));
    EXPECT_EQ("\"Minus\"", Write(EnumOf(EType::Enum16, entries), Bytes("\xFE\xFF")));
    EXPECT_EQ("\"Minus\"", Write(EnumOf(EType::Enum32, entries), Bytes("\xFE\xFF\xFF\xFF")));
    EXPECT_EQ("\"Plus\"", Write(EnumOf(EType::Enum16, entries), Bytes("\xFE\x00")));
    EXPECT_EQ("\"More\"", Write(EnumOf(EType::Enum32, entries), Bytes("\xFE\xFF\x00\x00")));
    // clang-format on
}

TEST(ValueTextWriter, NamesOfEntriesAreEscapedWhereQuoted)
{
    const ISchema odd = EnumOf(EType::Enum8, {{"a\t\"b\"", 5}});

    EXPECT_EQ(R"("a\t\"b\"")", Write(odd, Bytes("\x05")));
    EXPECT_EQ("a\t\"b\"", Write(odd, Bytes("\x05"), SchemaTextModeRow));
}

TEST(ValueTextWriter, EnumNumberWithoutAnEntryFails)
{
    EXPECT_TRUE(Fails(colour, Bytes("\x02")));
    EXPECT_TRUE(Fails(Plain(EType::Enum32), Bytes("\x00\x00\x00\x00")));
}

TEST(ValueTextWriter, DeliberateListAtTheTopOfARowHasNoBrackets)
{
    EXPECT_EQ((Texts{"[1,2]", "[1,2]", "[2]", "1,2", "1,2"}),
              InAllModes(ListOf(Plain(EType::Int8)), Bytes("\x02\x00\x00\x00"
                                                           "\x01\x02")));
    EXPECT_EQ((Texts{"[]", "[]", "[0]", "", ""}),
              InAllModes(ListOf(Plain(EType::Int8)), Bytes("\x00\x00\x00\x00")));
}

TEST(ValueTextWriter, DeliberateArrayAtTheTopOfARowHasNoBrackets)
{
    EXPECT_EQ((Texts{"[1,2]", "[1,2]", "[2]", "1,2", "1,2"}),
              InAllModes(ArrayOf(Plain(EType::Int8), 2), Bytes("\x01\x02")));
    EXPECT_EQ((Texts{"[]", "[]", "[0]", "", ""}), InAllModes(ArrayOf(Plain(EType::Int8), 0), {}));
}

TEST(ValueTextWriter, DeliberateTupleAtTheTopOfARowHasNoBrackets)
{
    const ByteVector bytes = Bytes("\x01\x00");

    EXPECT_EQ(
        (Texts{"[1,false]", R"({"":1,"":false})", R"({"":1,"":false})", "1,false", R"(1,"false")"}),
        InAllModes(TupleOf({Plain(EType::Int8), Plain(EType::Bool)}), bytes));
    EXPECT_EQ(
        (Texts{"[1,false]", R"({"a":1,"b":false})", R"({"a":1,"b":false})", "1,false",
               R"(1,"false")"}),
        InAllModes(NamedTupleOf({{"a", Plain(EType::Int8)}, {"b", Plain(EType::Bool)}}), bytes));
    EXPECT_EQ((Texts{"[]", "{}", "{}", "", ""}), InAllModes(TupleOf({}), {}));
}

TEST(ValueTextWriter, NestedPartsKeepTheirBracketsInAllModes)
{
    const ISchema schema = NamedTupleOf({
        {"l", ListOf(ArrayOf(Plain(EType::String), 1))},
        {"t", NamedTupleOf({{"x", Plain(EType::Int8)}})},
        {"e", TupleOf({})},
    });
    const ByteVector bytes = Bytes("\x02\x00\x00\x00"
                                   "\x01\x00\x00\x00"
                                   "a"
                                   "\x01\x00\x00\x00"
                                   "b"
                                   "\x07");

    EXPECT_EQ((Texts{
                  R"([[["a"],["b"]],[7],[]])",
                  R"({"l":[["a"],["b"]],"t":{"x":7},"e":{}})",
                  R"({"l":[2],"t":{"x":7},"e":{}})",
                  R"([[a],[b]],[7],[])",
                  R"([["a"],["b"]],[7],[])",
              }),
              InAllModes(schema, bytes));
}

TEST(ValueTextWriter, MemberNamesAreEscaped)
{
    EXPECT_EQ(R"({"a\t\"b":7})",
              Write(NamedTupleOf({{"a\t\"b", Plain(EType::Int8)}}), Bytes("\x07")));
}

TEST(ValueTextWriter, BriefModeStepsOverTheElementsThatItDoesNotWrite)
{
    const ISchema schema = TupleOf({
        ListOf(Plain(EType::String)),
        ArrayOf(ListOf(Plain(EType::Int16)), 2),
        Plain(EType::Int8),
    });

    EXPECT_EQ(R"({"":[1],"":[2],"":9})", Write(schema,
                                               Bytes("\x01\x00\x00\x00"
                                                     "\x02\x00\x00\x00"
                                                     "ab"
                                                     "\x00\x00\x00\x00"
                                                     "\x01\x00\x00\x00"
                                                     "\x05\x05"
                                                     "\x09"),
                                               SchemaTextModeBrief));
}

TEST(ValueTextWriter, BriefModeFailsWhereTheElementsEndTooEarly)
{
    EXPECT_EQ("failed", ErrorOf(ArrayOf(Plain(EType::Int32), 2), Bytes("\x01\x00\x00\x00"),
                                SchemaTextModeBrief));
    EXPECT_EQ("failed", ErrorOf(ListOf(Plain(EType::Int8)), Bytes("\x02\x00\x00\x00\x01"),
                                SchemaTextModeBrief));
    EXPECT_EQ("Unexpected end of binary data",
              ErrorOf(ListOf(Plain(EType::Int8)), Bytes("\x02\x00\x00"), SchemaTextModeBrief));
}

TEST(ValueTextWriter, BoolFormWritesRowsQuotedOrNot)
{
    const ISchema schema = TupleOf({Plain(EType::String), Plain(EType::Bool)});
    const ByteVector bytes = Bytes("\x01\x00\x00\x00"
                                   "a\x01");
    std::string text;

    EXPECT_TRUE(BinaryToText(bytes, schema, text, false));
    EXPECT_EQ("a,true", text);
    EXPECT_TRUE(BinaryToText(bytes, schema, text, true));
    EXPECT_EQ(R"("a","true")", text);
}

TEST(ValueTextWriter, ModeIsNamedUnlessGiven)
{
    std::string text;

    EXPECT_TRUE(BinaryToText(Bytes("\x07"), NamedTupleOf({{"a", Plain(EType::Int8)}}), text));
    EXPECT_EQ(R"({"a":7})", text);
}

TEST(ValueTextWriter, BareNumberIsNoMode)
{
    EXPECT_TRUE(VTakesMode<SchemaTextMode>::value);
    EXPECT_TRUE(VTakesMode<bool>::value);
    EXPECT_FALSE(VTakesMode<int>::value);
}

TEST(ValueTextWriter, VoidAndRefHaveNoText)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_TRUE(Fails(Plain(EType::Void), {}, mode));
        EXPECT_TRUE(Fails(Plain(EType::Ref), {}, mode));
        EXPECT_TRUE(Fails(Plain(static_cast<EType>(21)), {}, mode));
        EXPECT_TRUE(Fails(TupleOf({Plain(EType::Int8), Plain(EType::Void)}), {1}, mode));
    }
}

TEST(ValueTextWriter, TruncatedValueRaises)
{
    const std::string error = "Unexpected end of binary data";
    // clang-format off
    EXPECT_EQ(error, ErrorOf(Plain(EType::Bool), {}));
    EXPECT_EQ(error, ErrorOf(Plain(EType::Int16), Bytes("1")));
    EXPECT_EQ(error, ErrorOf(Plain(EType::Float64), Bytes("1234567")));
    EXPECT_EQ(error, ErrorOf(colour, {}));
    EXPECT_EQ(error, ErrorOf(Plain(EType::String), Bytes("\x01\x00\x00")));
    EXPECT_EQ(error, ErrorOf(ListOf(Plain(EType::Int8)), Bytes("\x01\x00\x00")));
    EXPECT_EQ(error, ErrorOf(ListOf(Plain(EType::Int8)), Bytes("\x02\x00\x00\x00" "1")));
    EXPECT_EQ(error, ErrorOf(TupleOf({Plain(EType::Int8), Plain(EType::Int8)}), Bytes("1")));
    // clang-format on
}

TEST(ValueTextWriter, StringWhoseLengthRunsPastTheEndFails)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_EQ("failed", ErrorOf(Plain(EType::String),
                                    Bytes("\x02\x00\x00\x00"
                                          "a"),
                                    mode));
    }
}

TEST(ValueTextWriter, BytesBehindTheValueAreNotLookedAt)
{
    EXPECT_EQ("1", Write(Plain(EType::Int8), Bytes("\x01rest")));
}

TEST(ValueTextWriter, ArrayOrListWithoutExactlyOnePartFails)
{
    const ISchema noPart = Plain(EType::Array);
    const ISchema twoParts =
        WithParts(EType::List, {{"", Plain(EType::Int8)}, {"", Plain(EType::Int8)}});

    for (const SchemaTextMode mode : allModes) {
        EXPECT_TRUE(Fails(noPart, {}, mode));
        EXPECT_TRUE(Fails(twoParts, Bytes("\x00\x00\x00\x00"), mode));
        EXPECT_TRUE(Fails(ListOf(noPart), Bytes("\x00\x00\x00\x00"), mode));
    }
}
