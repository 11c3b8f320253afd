#include "io/Values.h"

#include "Variant/Interning.h"
#include "io/SchemaSamples.h"
#include "io/ValueText.h"

#include <gtest/gtest.h>

#include <limits>

using namespace KVR::IO;

namespace {

VDataValue ValueOf(const ISchema& schema, std::vector<unsigned char> bytes)
{
    VDataValue value;
    value.Schema = &GetUniqueSchema(schema);
    value.Bytes = std::move(bytes);
    return value;
}

const ISchema colour = EnumOf(EType::Enum8, {{"Red", 0}, {"Green", 1}});

/// Reads into a target that holds `before`; the result is `before` if the read failed.
template <typename T>
T ReadOver(const VDataValue& value, T before, bool expected)
{
    EXPECT_EQ(expected, ReadValue(value, before));
    return before;
}

} // namespace

TEST(Values, MakeHasTheSchemaAndTheBytesOfItsName)
{
    // clang-format off
    EXPECT_EQ(ValueOf(Plain(EType::Bool), Bytes("\x01")), MakeBoolValue(true));
    EXPECT_EQ(ValueOf(Plain(EType::Bool), Bytes("\x00")), MakeBoolValue(false));
    EXPECT_EQ(ValueOf(Plain(EType::UInt32), Bytes("\xFE\xFF\xFF\xFF")), MakeUInt32Value(4294967294));
    EXPECT_EQ(ValueOf(Plain(EType::Float64), Bytes("\x00\x00\x00\x00\x00\x00\xF8\x3F")), MakeDoubleValue(1.5));
    EXPECT_EQ(ValueOf(Plain(EType::String), Bytes("\x03\x00\x00\x00" "a\0b")), MakeStringValue(std::string("a\0b", 3)));
    EXPECT_EQ(ValueOf(Plain(EType::String), Bytes("\x00\x00\x00\x00")), MakeStringValue(""));
    EXPECT_EQ(ValueOf(colour, Bytes("\x01")), MakeEnumValue(colour, 1));
    EXPECT_EQ(ValueOf(Plain(EType::Enum16), Bytes("\xFE\xFF")), MakeEnumValue(Plain(EType::Enum16), -2));
    EXPECT_EQ(ValueOf(Plain(EType::Enum32), Bytes("\x06\x00\x00\x00")), MakeEnumValue(Plain(EType::Enum32), 6));
    // clang-format on
}

TEST(Values, EnumTakesNumbersThatAreNoEntry)
{
    EXPECT_EQ(Bytes("\x06"), MakeEnumValue(colour, 6).Bytes);
}

TEST(Values, EnumNumberThatDoesNotFitGivesAnEmptyValue)
{
    EXPECT_EQ(Bytes("\x7F"), MakeEnumValue(colour, 127).Bytes);
    EXPECT_TRUE(MakeEnumValue(colour, 128).Empty());
    EXPECT_EQ(Bytes("\x80"), MakeEnumValue(colour, -128).Bytes);
    EXPECT_TRUE(MakeEnumValue(colour, -129).Empty());
    EXPECT_TRUE(MakeEnumValue(Plain(EType::Enum16), 32768).Empty());
    EXPECT_TRUE(MakeEnumValue(Plain(EType::Int32), 1).Empty());
}

TEST(Values, ReadTakesEveryPlainType)
{
    // clang-format off
    EXPECT_EQ(true, ReadOver(ValueOf(Plain(EType::Bool), Bytes("\x01")), false, true));
    EXPECT_EQ(-2, ReadOver<std::int8_t>(ValueOf(Plain(EType::Int8), Bytes("\xFE")), 0, true));
    EXPECT_EQ(-2, ReadOver<std::int16_t>(ValueOf(Plain(EType::Int16), Bytes("\xFE\xFF")), 0, true));
    EXPECT_EQ(-2, ReadOver<std::int32_t>(ValueOf(Plain(EType::Int32), Bytes("\xFE\xFF\xFF\xFF")), 0, true));
    EXPECT_EQ(-2, ReadOver<std::int64_t>(ValueOf(Plain(EType::Int64), Bytes("\xFE\xFF\xFF\xFF\xFF\xFF\xFF\xFF")), 0, true));
    EXPECT_EQ(254, ReadOver<std::uint8_t>(ValueOf(Plain(EType::UInt8), Bytes("\xFE")), 0, true));
    EXPECT_EQ(258, ReadOver<std::uint16_t>(ValueOf(Plain(EType::UInt16), Bytes("\x02\x01")), 0, true));
    EXPECT_EQ(258u, ReadOver<std::uint32_t>(ValueOf(Plain(EType::UInt32), Bytes("\x02\x01\x00\x00")), 0, true));
    EXPECT_EQ(258u, ReadOver<std::uint64_t>(ValueOf(Plain(EType::UInt64), Bytes("\x02\x01\x00\x00\x00\x00\x00\x00")), 0, true));
    EXPECT_EQ(1.0f, ReadOver(ValueOf(Plain(EType::Float32), Bytes("\x00\x00\x80\x3F")), 0.0f, true));
    EXPECT_EQ(1.5, ReadOver(ValueOf(Plain(EType::Float64), Bytes("\x00\x00\x00\x00\x00\x00\xF8\x3F")), 0.0, true));
    EXPECT_EQ("ab", ReadOver<std::string>(ValueOf(Plain(EType::String), Bytes("\x02\x00\x00\x00" "ab")), "", true));
    // clang-format on
}

TEST(Values, ReadLeavesTheTargetOfAnotherType)
{
    EXPECT_EQ(7, ReadOver<std::int32_t>(MakeUInt32Value(1), 7, false));
    EXPECT_EQ(7.0, ReadOver(MakeUInt32Value(1), 7.0, false));
    EXPECT_EQ(7u, ReadOver<std::uint32_t>(MakeDoubleValue(1), 7, false));
    EXPECT_EQ(true, ReadOver(MakeEnumValue(colour, 0), true, false));
    EXPECT_EQ("before", ReadOver<std::string>(MakeUInt32Value(0), "before", false));
    EXPECT_EQ(7.0, ReadOver(VDataValue(), 7.0, false));
}

TEST(Values, ReadLeavesTheTargetForAnotherLength)
{
    // clang-format off
    EXPECT_EQ(7u, ReadOver<std::uint32_t>(ValueOf(Plain(EType::UInt32), Bytes("\x01\x00\x00")), 7, false));
    EXPECT_EQ(7u, ReadOver<std::uint32_t>(ValueOf(Plain(EType::UInt32), Bytes("\x01\x00\x00\x00\x00")), 7, false));
    EXPECT_EQ(true, ReadOver(ValueOf(Plain(EType::Bool), {}), true, false));
    EXPECT_EQ("before", ReadOver<std::string>(ValueOf(Plain(EType::String), Bytes("\x02\x00\x00")), "before", false));
    EXPECT_EQ("before", ReadOver<std::string>(ValueOf(Plain(EType::String), Bytes("\x02\x00\x00\x00" "a")), "before", false));
    EXPECT_EQ("before", ReadOver<std::string>(ValueOf(Plain(EType::String), Bytes("\x02\x00\x00\x00" "abc")), "before", false));
    // clang-format on
}

TEST(Values, ReadComparesTheTypeAndNotTheSchema)
{
    ISchema named = Plain(EType::Float64);
    named.TypeName = "Metres";

    EXPECT_EQ(1.5, ReadOver(ValueOf(named, MakeDoubleValue(1.5).Bytes), 0.0, true));
}

TEST(Values, LenientBoolIsWhetherTheFirstByteIsNotZero)
{
    EXPECT_TRUE(ReadBool(MakeBoolValue(true)));
    EXPECT_FALSE(ReadBool(MakeBoolValue(false)));
    EXPECT_TRUE(ReadBool(ValueOf(Plain(EType::UInt32), Bytes("\x02\x00\x00\x00"))));
    EXPECT_FALSE(ReadBool(ValueOf(Plain(EType::UInt32), Bytes("\x00\x01\x00\x00"))));
    EXPECT_FALSE(ReadBool(VDataValue()));
}

TEST(Values, LenientNumberIsTheFirstFourBytesOrZero)
{
    EXPECT_EQ(258u, ReadUInt32OrZero(MakeUInt32Value(258)));
    EXPECT_EQ(6u, ReadUInt32OrZero(MakeEnumValue(Plain(EType::Enum32), 6)));
    EXPECT_EQ(0x3FF80000u,
              ReadUInt32OrZero(ValueOf(Plain(EType::String), Bytes("\x00\x00\xF8\x3F!"))));
    EXPECT_EQ(0u, ReadUInt32OrZero(ValueOf(Plain(EType::UInt16), Bytes("\x02\x01\x01"))));
    EXPECT_EQ(0u, ReadUInt32OrZero(VDataValue()));
}

TEST(Values, LenientStringIsEmptyForAnotherTypeOrTruncatedBytes)
{
    // clang-format off
    EXPECT_EQ("ab", ReadString(MakeStringValue("ab")));
    EXPECT_EQ("ab", ReadString(ValueOf(Plain(EType::String), Bytes("\x02\x00\x00\x00" "abc"))));
    EXPECT_EQ("", ReadString(ValueOf(Plain(EType::String), Bytes("\x02\x00\x00\x00" "a"))));
    EXPECT_EQ("", ReadString(ValueOf(Plain(EType::String), Bytes("\x02\x00\x00"))));
    EXPECT_EQ("", ReadString(ValueOf(Plain(EType::UInt32), Bytes("\x00\x00\x00\x00"))));
    EXPECT_EQ("", ReadString(VDataValue()));
    // clang-format on
}

TEST(ValueToText, WritesTheBareRow)
{
    const ISchema row = TupleOf({Plain(EType::Int32), Plain(EType::String), Plain(EType::Bool)});

    EXPECT_EQ("99999.5", ValueToText(MakeDoubleValue(99999.5)));
    EXPECT_EQ("a \"b\"", ValueToText(MakeStringValue("a \"b\"")));
    EXPECT_EQ("Green", ValueToText(MakeEnumValue(colour, 1)));
    EXPECT_EQ("true", ValueToText(MakeBoolValue(true)));
    EXPECT_EQ("5,ab,false", ValueToText(ValueOf(row, Bytes("\x05\x00\x00\x00"
                                                           "\x02\x00\x00\x00"
                                                           "ab\x00"))));
}

TEST(ValueToText, IsEmptyForAValueWithoutText)
{
    EXPECT_EQ("", ValueToText(VDataValue()));
    EXPECT_EQ("", ValueToText(MakeEnumValue(colour, 6)));
    EXPECT_EQ("", ValueToText(ValueOf(Plain(EType::Array), {})));
}

TEST(ValueToText, NeverShowsHalfAValue)
{
    const ISchema row = TupleOf({Plain(EType::Int32), Plain(EType::Int32), Plain(EType::String)});

    // Cut off within a number, which raises, and within a string, which fails.
    EXPECT_EQ("", ValueToText(ValueOf(row, Bytes("\x05\x00\x00\x00\x01"))));
    EXPECT_EQ("", ValueToText(ValueOf(row, Bytes("\x05\x00\x00\x00\x05\x00\x00\x00"
                                                 "\x02\x00\x00\x00"
                                                 "a"))));
}
