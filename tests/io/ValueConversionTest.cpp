#include "io/ValueConversion.h"

#include "io/RandomSchema.h"
#include "io/SchemaMutation.h"
#include "io/SchemaSamples.h"
#include "io/TextModel.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace KVR::IO;

namespace {

using ByteVector = std::vector<unsigned char>;

const ByteVector refused = Bytes("refused");

ByteVector Converted(const ISchema& stored, const ByteVector& bytes, const ISchema& current)
{
    ByteVector result = Bytes("what was there before");
    return ConvertValue(stored, bytes, current, result) ? result : refused;
}

const ISchema int8Schema = Plain(EType::Int8);
const ISchema boolSchema = Plain(EType::Bool);
const ISchema stringSchema = Plain(EType::String);

} // namespace

TEST(ValueConversion, WidensNumbersWithTheirSign)
{
    EXPECT_EQ(Bytes("\xFE\xFF\xFF\xFF"), Converted(int8Schema, Bytes("\xFE"), Plain(EType::Int32)));
    EXPECT_EQ(Bytes("\xFE\x00"),
              Converted(Plain(EType::UInt8), Bytes("\xFE"), Plain(EType::Int16)));
    EXPECT_EQ(Bytes("\xFE\xFF\xFF\xFF\x00\x00\x00\x00"),
              Converted(Plain(EType::UInt32), Bytes("\xFE\xFF\xFF\xFF"), Plain(EType::Int64)));
    EXPECT_EQ(Bytes("\x01\x00"), Converted(boolSchema, Bytes("\x07"), Plain(EType::UInt16)));
    EXPECT_EQ(Bytes("\x01"), Converted(boolSchema, Bytes("\x07"), boolSchema));
}

TEST(ValueConversion, ConvertsRealNumbersOfBothWidths)
{
    const ByteVector asFloat = Bytes("\x00\x00\xC0\x3F");
    const ByteVector asDouble = Bytes("\x00\x00\x00\x00\x00\x00\xF8\x3F");

    EXPECT_EQ(asDouble, Converted(Plain(EType::Float32), asFloat, Plain(EType::Float64)));
    EXPECT_EQ(asFloat, Converted(Plain(EType::Float64), asDouble, Plain(EType::Float32)));
}

TEST(ValueConversion, KeepsEveryBitOfANumberThatDidNotChange)
{
    const ByteVector signallingNan = Bytes("\x01\x00\x00\x00\x00\x00\xF0\x7F");

    EXPECT_EQ(signallingNan,
              Converted(Plain(EType::Float64), signallingNan, Plain(EType::Float64)));
}

TEST(ValueConversion, MapsEnumsOfEveryWidth)
{
    const ISchema stored = EnumOf(EType::Enum8, {{"A", 1}, {"B", -2}});

    EXPECT_EQ(Bytes("\x05"),
              Converted(stored, Bytes("\x01"), EnumOf(EType::Enum8, {{"A", 5}, {"B", 6}})));
    EXPECT_EQ(Bytes("\x06\x00\x00\x00"),
              Converted(stored, Bytes("\xFE"), EnumOf(EType::Enum32, {{"A", 5}, {"B", 6}})));
    EXPECT_EQ(Bytes("\x05"),
              Converted(EnumOf(EType::Enum32, {{"LEGACY_A", 1}}), Bytes("\x01\x00\x00\x00"),
                        EnumOf(EType::Enum8, {{"A", 5}})));
    EXPECT_EQ(refused,
              Converted(stored, Bytes("\x03"), EnumOf(EType::Enum8, {{"A", 5}, {"B", 6}})));
    EXPECT_EQ(refused, Converted(EnumOf(EType::Enum32, {{"A", 1}}), Bytes("\x00\x01\x00\x00"),
                                 EnumOf(EType::Enum8, {{"A", 1}})));
}

TEST(ValueConversion, MovesMembersByNameAndFillsNewOnes)
{
    const ISchema stored =
        NamedTupleOf({{"A", int8Schema}, {"Gone", ListOf(stringSchema)}, {"B", stringSchema}});
    const ISchema current =
        NamedTupleOf({{"B", stringSchema},
                      {"Number", Plain(EType::Float64)},
                      {"Text", stringSchema},
                      {"Kind", EnumOf(EType::Enum16, {{"X", 3}, {"Y", 4}})},
                      {"Empty", EnumOf(EType::Enum16, {})},
                      {"Rows", ArrayOf(TupleOf({boolSchema, ListOf(int8Schema)}), 2)},
                      {"A", Plain(EType::Int16)}});

    EXPECT_EQ(Bytes("\x02\x00\x00\x00hi"
                    "\x00\x00\x00\x00\x00\x00\x00\x00"
                    "\x00\x00\x00\x00"
                    "\x03\x00"
                    "\x00\x00"
                    "\x00\x00\x00\x00\x00\x00\x00\x00\x00\x00"
                    "\xFF\xFF"),
              Converted(stored,
                        Bytes("\xFF"
                              "\x01\x00\x00\x00\x01\x00\x00\x00x"
                              "\x02\x00\x00\x00hi"),
                        current));
}

TEST(ValueConversion, RefusesBytesThatAreNotOneValue)
{
    EXPECT_EQ(refused, Converted(stringSchema, Bytes("\x05\x00\x00\x00hi"), stringSchema));
    EXPECT_EQ(refused, Converted(stringSchema, Bytes("\x05\x00"), stringSchema));
    EXPECT_EQ(refused, Converted(int8Schema, Bytes("12"), int8Schema));
    EXPECT_EQ(refused, Converted(int8Schema, ByteVector(), int8Schema));
    EXPECT_EQ(refused, Converted(NamedTupleOf({{"Gone", stringSchema}}), Bytes("\x05\x00\x00\x00"),
                                 NamedTupleOf({})));
}

TEST(ValueConversion, RefusesSchemasWithoutALayout)
{
    EXPECT_EQ(refused,
              Converted(Plain(EType::List), Bytes("\x00\x00\x00\x00"), Plain(EType::List)));
    EXPECT_EQ(refused, Converted(Plain(EType::Void), ByteVector(), Plain(EType::Void)));
    EXPECT_EQ(refused, Converted(NamedTupleOf({{"Gone", Plain(EType::List)}}), ByteVector(),
                                 NamedTupleOf({})));
    EXPECT_EQ(refused, Converted(NamedTupleOf({}), ByteVector(),
                                 NamedTupleOf({{"New", Plain(EType::Array)}})));
}

TEST(ValueConversion, RefusesANewMemberWithoutEnd)
{
    const ISchema great = ArrayOf(ArrayOf(int8Schema, 0xFFFFFFFF), 0xFFFFFFFF);
    const ISchema nothing = ArrayOf(ArrayOf(TupleOf({}), 0xFFFFFFFF), 0xFFFFFFFF);

    EXPECT_EQ(refused, Converted(NamedTupleOf({}), ByteVector(), NamedTupleOf({{"New", great}})));
    EXPECT_EQ(ByteVector(),
              Converted(NamedTupleOf({}), ByteVector(), NamedTupleOf({{"New", nothing}})));
}

TEST(ValueConversion, RefusesElementsWithoutBytesWithoutEnd)
{
    const ISchema stored = ListOf(TupleOf({}));

    EXPECT_EQ(Bytes("\x02\x00\x00\x00"), Converted(stored, Bytes("\x02\x00\x00\x00"), stored));
    EXPECT_EQ(refused, Converted(stored, Bytes("\xFF\xFF\xFF\xFF"), stored));
}

TEST(ValueConversion, GivesWhatTheTextModelGives)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    for (std::uint32_t seed = 0; seed < 3000; ++seed) {
        VRandomSchema random(seed);
        ISchema stored = NamedTupleOf({{"", random.MakeSchema(4, limits)},
                                       {"", random.MakeSchema(4, limits)},
                                       {"", random.MakeSchema(4, limits)}});
        MakeMemberNamesUnique(stored);
        ByteVector bytes;
        random.AppendValue(bytes, stored, limits);
        ISchema current = stored;
        VSchemaMutation(seed).ChangeReadably(current);
        ByteVector expected;
        ASSERT_TRUE(ConvertThroughText(stored, bytes, current, expected));

        ASSERT_EQ(expected, Converted(stored, bytes, current)) << "seed " << seed;
        if (!bytes.empty()) {
            bytes.resize(seed % bytes.size());
            ASSERT_EQ(refused, Converted(stored, bytes, current)) << "seed " << seed;
        }
    }
}

/// Looked for one by one, so many members would not end within the test's time.
TEST(ValueConversion, FindsTheMembersOfAGreatTuple)
{
    ISchema stored = NamedTupleOf({});
    ByteVector bytes;
    for (std::size_t i = 0; i < 200000; ++i) {
        stored.SubSchemas.emplace_back("m" + std::to_string(i), int8Schema);
        bytes.push_back(static_cast<unsigned char>(i % 251));
    }
    ISchema current = stored;
    std::reverse(current.SubSchemas.begin(), current.SubSchemas.end());
    const ByteVector expected(bytes.rbegin(), bytes.rend());

    EXPECT_EQ(expected, Converted(stored, bytes, current));
}
