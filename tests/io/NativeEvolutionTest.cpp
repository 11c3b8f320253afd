#include "io/CountingStream.h"
#include "io/NativeTypes.h"
#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace KVR::IO;

namespace {

using Sizes = std::vector<std::size_t>;
using ByteVector = std::vector<unsigned char>;

enum class EMode : std::int32_t { Idle = 10, Live = 20 };
enum class ESmall : std::int8_t { One = 1, Two = 2 };

struct VFour
{
    std::int32_t a = -1;
    std::int32_t b = -2;
    std::int32_t c = -3;
    std::int32_t d = -4;
};

struct VRecord
{
    std::string name = "none";
    EMode mode = EMode::Idle;
    double value = 0.5;
    std::vector<VFour> fours;
};

} // namespace

// clang-format off
template <> struct KVR::IO::NativeEnum<EMode>
{
    static constexpr const char* Name = "EMode";
    template <typename Visitor> static void Visit(Visitor&& entry)
    {
        entry("Idle", EMode::Idle);
        entry("Live", EMode::Live);
    }
};

template <> struct KVR::IO::NativeEnum<ESmall>
{
    static constexpr const char* Name = "ESmall";
    template <typename Visitor> static void Visit(Visitor&& entry)
    {
        entry("One", ESmall::One);
        entry("Two", ESmall::Two);
    }
};

template <> struct KVR::IO::NativeStruct<VFour>
{
    static constexpr const char* Name = "Four";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("A", &VFour::a);
        member("B", &VFour::b);
        member("C", &VFour::c);
        member("D", &VFour::d);
    }
};

template <> struct KVR::IO::NativeStruct<VRecord>
{
    static constexpr const char* Name = "Record";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Name", &VRecord::name);
        member("Mode", &VRecord::mode);
        member("Value", &VRecord::value);
        member("Fours", &VRecord::fours);
    }
};
// clang-format on

namespace {

const ISchema int32Schema = Plain(EType::Int32);

ByteVector Int32s(std::initializer_list<std::int32_t> numbers)
{
    ByteVector bytes;
    for (const std::int32_t number : numbers) {
        KVR::IO::Detail::AppendNumber(bytes, number);
    }
    return bytes;
}

/// Reads a value of an older schema and returns the sizes of the reads, which must consume it
/// whole.
template <typename T>
Sizes ReadOld(const ISchema& stored, const ByteVector& bytes, T& object)
{
    VNativeReader<T> reader(stored);
    EXPECT_TRUE(reader.IsReadable());
    VRecordingStream stream(bytes);
    EXPECT_TRUE(reader.Read(stream, object));
    EXPECT_EQ(bytes.size(), stream.GetPosition());
    return stream.sizes;
}

template <typename Current>
void ExpectWidened(EType storedType, const ByteVector& bytes, Current expected)
{
    Current number{};
    EXPECT_TRUE(ReadNativeValue(VDataValue{&GetUniquePodSchema(storedType), bytes}, number));
    EXPECT_EQ(expected, number);
}

} // namespace

TEST(NativeEvolution, WidensNumbersWithTheirSign)
{
    ExpectWidened<std::int64_t>(EType::Int8, Bytes("\xFE"), -2);
    ExpectWidened<std::int64_t>(EType::UInt8, Bytes("\xFE"), 254);
    ExpectWidened<std::int32_t>(EType::Int16, Bytes("\xFE\xFF"), -2);
    ExpectWidened<std::int32_t>(EType::UInt16, Bytes("\xFE\xFF"), 65534);
    ExpectWidened<std::int64_t>(EType::UInt32, Bytes("\xFE\xFF\xFF\xFF"), 4294967294);
    ExpectWidened<std::int64_t>(EType::Int32, Bytes("\xFE\xFF\xFF\xFF"), -2);
    ExpectWidened<std::uint64_t>(EType::UInt8, Bytes("\xFE"), 254);
    ExpectWidened<std::int8_t>(EType::Bool, Bytes("\x07"), 1);
    ExpectWidened<std::uint64_t>(EType::Bool, Bytes("\x00"), 0);
    ExpectWidened<double>(EType::Float32, Bytes("\x00\x00\xC0\x3F"), 1.5);
    ExpectWidened<float>(EType::Float64, Bytes("\x00\x00\x00\x00\x00\x00\xF8\xBF"), -1.5f);
}

TEST(NativeEvolution, WidensEachReadableTypeAndRefusesAnyOther)
{
    for (int stored = 0; stored <= 20; ++stored) {
        const EType type = EType(stored);
        EXPECT_EQ(IsReadableAs(type, EType::Int64),
                  VNativeReader<std::int64_t>(Plain(type)).IsReadable());
        EXPECT_EQ(IsReadableAs(type, EType::Float32),
                  VNativeReader<float>(Plain(type)).IsReadable());
        EXPECT_EQ(IsReadableAs(type, EType::Bool), VNativeReader<bool>(Plain(type)).IsReadable());
        EXPECT_EQ(IsReadableAs(type, EType::String),
                  VNativeReader<std::string>(Plain(type)).IsReadable());
    }
}

TEST(NativeEvolution, MakersRefuseWhatTheyCannotReadThemselves)
{
    // BuildEvolvingReader asks nobody whether a type is readable.
    const ISchema stored = Plain(EType::Int32);

    EXPECT_EQ(nullptr,
              BuildEvolvingReader(Plain(EType::String), NativeReaderNode<std::string>(), stored));
    EXPECT_EQ(nullptr,
              BuildEvolvingReader(Plain(EType::Int16), NativeReaderNode<std::int16_t>(), stored));
    EXPECT_EQ(nullptr, BuildEvolvingReader(NativeSchema<std::vector<std::int32_t>>(),
                                           NativeReaderNode<std::vector<std::int32_t>>(),
                                           ArrayOf(int32Schema, 2)));
    const ISchema fourNumbers = TupleOf({int32Schema, int32Schema, int32Schema, int32Schema});
    EXPECT_EQ(nullptr,
              BuildEvolvingReader(NativeSchema<VFour>(), NativeReaderNode<VFour>(), fourNumbers));
}

TEST(NativeEvolution, StepsOverARemovedMemberWithoutFoldingItsNeighbours)
{
    const ISchema stored = NamedTupleOf({{"A", int32Schema},
                                         {"B", int32Schema},
                                         {"Gone", Plain(EType::Int64)},
                                         {"C", int32Schema},
                                         {"D", int32Schema}});
    VFour four;

    // A and B are one run, C and D another, although all four are neighbours in the object.
    EXPECT_EQ((Sizes{8, 8, 8}), ReadOld(stored, Int32s({1, 2, 77, 77, 3, 4}), four));

    EXPECT_EQ(1, four.a);
    EXPECT_EQ(2, four.b);
    EXPECT_EQ(3, four.c);
    EXPECT_EQ(4, four.d);
}

TEST(NativeEvolution, ReordersMembersAndCopiesOnlyWhatStillIsARun)
{
    const ISchema stored = NamedTupleOf(
        {{"C", int32Schema}, {"D", int32Schema}, {"B", int32Schema}, {"A", int32Schema}});
    VFour four;

    EXPECT_EQ((Sizes{8, 4, 4}), ReadOld(stored, Int32s({3, 4, 2, 1}), four));

    EXPECT_EQ(1, four.a);
    EXPECT_EQ(2, four.b);
    EXPECT_EQ(3, four.c);
    EXPECT_EQ(4, four.d);
}

TEST(NativeEvolution, KeepsWhatTheObjectHoldsInAddedMembers)
{
    const ISchema stored = NamedTupleOf({{"B", int32Schema}, {"C", int32Schema}});
    VFour four;
    four.a = 70;

    EXPECT_EQ((Sizes{8}), ReadOld(stored, Int32s({2, 3}), four)); // the run is not at the front

    EXPECT_EQ(70, four.a);
    EXPECT_EQ(2, four.b);
    EXPECT_EQ(3, four.c);
    EXPECT_EQ(-4, four.d);
}

TEST(NativeEvolution, EndsARunAtAWidenedMember)
{
    const ISchema stored = NamedTupleOf(
        {{"A", int32Schema}, {"B", Plain(EType::Bool)}, {"C", int32Schema}, {"D", int32Schema}});
    VFour four;

    EXPECT_EQ((Sizes{4, 1, 8}),
              ReadOld(stored, Bytes("\x01\x00\x00\x00\x01\x03\x00\x00\x00\x04\x00\x00\x00"), four));
    EXPECT_EQ(1, four.b);
    EXPECT_EQ(4, four.d);
}

TEST(NativeEvolution, GivesNewElementsTheMembersOfANewObject)
{
    const ISchema stored = ListOf(NamedTupleOf({{"B", int32Schema}}));
    std::vector<VFour> fours(5);
    fours[0].a = 70;

    EXPECT_EQ((Sizes{4, 4, 4}), ReadOld(stored, Int32s({2, 22, 33}), fours));

    ASSERT_EQ(2u, fours.size());
    EXPECT_EQ(-1, fours[0].a); // not the 70 of an earlier value
    EXPECT_EQ(22, fours[0].b);
    EXPECT_EQ(33, fours[1].b);
    EXPECT_EQ(-4, fours[1].d);
}

TEST(NativeEvolution, LimitsElementsAllOfWhoseMembersAreNew)
{
    const ISchema stored = ListOf(NamedTupleOf({{"Gone", TupleOf({})}}));
    VNativeReader<std::vector<VFour>> reader(stored);
    std::vector<VFour> fours;

    EXPECT_TRUE(reader.Read(Bytes("\x03\x00\x00\x00"), fours));
    EXPECT_EQ(3u, fours.size());
    EXPECT_FALSE(reader.Read(Bytes("\xFF\xFF\xFF\xFF"), fours));
}

TEST(NativeEvolution, SkipsMembersOfEveryKind)
{
    const ISchema stored = NamedTupleOf(
        {{"Words", ListOf(Plain(EType::String))},
         {"Value", Plain(EType::Float32)},
         {"Nothing", Plain(EType::Void)},
         {"Flags", ArrayOf(Plain(EType::Bool), 3)},
         {"Fours", ListOf(NamedTupleOf({{"Gone", Plain(EType::String)}, {"D", int32Schema}}))},
         {"Name", Plain(EType::String)}});
    VRecord record;

    ReadOld(stored,
            Bytes("\x02\x00\x00\x00\x01\x00\x00\x00x\x00\x00\x00\x00"
                  "\x00\x00\xC0\x3F"
                  "\x01\x00\x01"
                  "\x01\x00\x00\x00\x02\x00\x00\x00yy\x09\x00\x00\x00"
                  "\x03\x00\x00\x00new"),
            record);

    EXPECT_EQ("new", record.name);
    EXPECT_EQ(EMode::Idle, record.mode);
    EXPECT_EQ(1.5, record.value);
    ASSERT_EQ(1u, record.fours.size());
    EXPECT_EQ(-1, record.fours[0].a);
    EXPECT_EQ(9, record.fours[0].d);
}

TEST(NativeEvolution, MapsRenumberedEnumsOf32Bits)
{
    const ISchema stored =
        NamedTupleOf({{"Mode", EnumOf(EType::Enum32, {{"Live", 1}, {"LEGACY_Idle", 2}})},
                      {"Value", Plain(EType::Float64)}});
    VRecord record;

    ReadOld(stored, Bytes("\x01\x00\x00\x00\x00\x00\x00\x00\x00\x00\xF8\x3F"), record);

    EXPECT_EQ(EMode::Live, record.mode);
    EXPECT_EQ(1.5, record.value);
    EXPECT_FALSE(VNativeReader<VRecord>(stored).Read(
        Bytes("\x03\x00\x00\x00\x00\x00\x00\x00\x00\x00\xF8\x3F"), record));
}

TEST(NativeEvolution, RefusesToMapEnumsOfOtherWidths)
{
    // The reader of mapped enums would take, or write, four bytes of fewer.
    const ISchema narrowStored = EnumOf(EType::Enum8, {{"Live", 1}});
    VNativeReader<EMode> fromNarrow(narrowStored);
    const ISchema named = ListOf(NamedTupleOf({{"Mode", narrowStored}, {"Gone", int32Schema}}));
    VNativeReader<std::vector<VRecord>> nested(named);
    VNativeReader<ESmall> toNarrow(EnumOf(EType::Enum32, {{"One", 5}}));

    EXPECT_FALSE(fromNarrow.IsReadable());
    EXPECT_EQ((std::vector<std::string>{": Enum was renumbered and is not stored in 32 bits"}),
              fromNarrow.GetErrors());
    EXPECT_FALSE(nested.IsReadable());
    EXPECT_EQ(
        (std::vector<std::string>{"[0].Mode: Enum was renumbered and is not stored in 32 bits"}),
        nested.GetErrors());
    EXPECT_FALSE(toNarrow.IsReadable());
}

TEST(NativeEvolution, ReadsEnumsOfOtherWidthsThatKeptTheirNumbers)
{
    EMode mode = EMode::Idle;
    ReadOld(EnumOf(EType::Enum8, {{"Live", 20}}), Bytes("\x14"), mode);
    EXPECT_EQ(EMode::Live, mode);
    ReadOld(EnumOf(EType::Enum16, {{"Live", 20}}), Bytes("\xFE\xFF"), mode);
    EXPECT_EQ(-2, static_cast<int>(mode));

    ESmall small = ESmall::One;
    const ISchema wide = EnumOf(EType::Enum32, {{"Two", 2}});
    ReadOld(wide, Int32s({2}), small);
    EXPECT_EQ(ESmall::Two, small);
    ReadOld(wide, Int32s({255}), small);
    EXPECT_EQ(-1, static_cast<int>(small));
    EXPECT_FALSE(VNativeReader<ESmall>(wide).Read(Int32s({256}), small));
    EXPECT_FALSE(VNativeReader<ESmall>(wide).Read(Int32s({-129}), small));
}

TEST(NativeEvolution, RefusesAnArrayOfAnotherLength)
{
    using Three = std::array<std::int32_t, 3>;
    Three three{};

    EXPECT_FALSE((VNativeReader<Three>(ArrayOf(int32Schema, 2)).IsReadable()));
    EXPECT_FALSE(ReadNativeValue(
        VDataValue{&GetUniqueSchema(ArrayOf(int32Schema, 2)), Int32s({1, 2})}, three));
}

TEST(NativeEvolution, WidensTheElementsOfArraysAndLists)
{
    std::array<std::int32_t, 2> array{};
    std::vector<double> list;

    ReadOld(ArrayOf(Plain(EType::Int8), 2), Bytes("\xFF\x02"), array);
    EXPECT_EQ((std::array<std::int32_t, 2>{{-1, 2}}), array);
    ReadOld(ListOf(Plain(EType::Float32)), Bytes("\x01\x00\x00\x00\x00\x00\xC0\x3F"), list);
    EXPECT_EQ((std::vector<double>{1.5}), list);
}

TEST(NativeEvolution, TellsWhatChanged)
{
    const VNativeReader<VFour> reader(
        NamedTupleOf({{"A", Plain(EType::Int16)}, {"Z", int32Schema}}));

    EXPECT_TRUE(reader.IsReadable());
    EXPECT_EQ((std::vector<std::string>{".Z member was removed.", ".B member was added.",
                                        ".C member was added.", ".D member was added.",
                                        ".A: Type changed from Int16 to Int32."}),
              reader.GetWarnings());
    EXPECT_TRUE(reader.GetErrors().empty());
}

TEST(NativeEvolution, TellsWhyAValueCannotBeRead)
{
    VNativeReader<VFour> reader(NamedTupleOf({{"A", Plain(EType::UInt32)}}));
    VFour four;

    EXPECT_FALSE(reader.IsReadable());
    EXPECT_EQ((std::vector<std::string>{".A: Type changed from UInt32 to Int32."}),
              reader.GetErrors());
    EXPECT_FALSE(reader.Read(Int32s({1}), four));
    EXPECT_EQ(-1, four.a);
}

TEST(NativeEvolution, TellsOfAStoredSchemaWithoutALayout)
{
    const VNativeReader<std::vector<std::int32_t>> list(Plain(EType::List));
    const VNativeReader<VFour> four(NamedTupleOf({{"Gone", Plain(EType::Array)}}));

    EXPECT_FALSE(list.IsReadable());
    EXPECT_EQ((std::vector<std::string>{"The stored schema has no layout"}), list.GetErrors());
    EXPECT_FALSE(four.IsReadable());
    EXPECT_EQ((std::vector<std::string>{"The stored schema has no layout"}), four.GetErrors());
}

TEST(NativeEvolution, ReadsManyValuesWithOneReader)
{
    VNativeReader<VFour> reader(NamedTupleOf({{"D", int32Schema}}));
    VFour four;
    for (std::int32_t i = 0; i < 10; ++i) {
        EXPECT_TRUE(reader.Read(Int32s({i}), four));
        EXPECT_EQ(i, four.d);
    }
}

TEST(NativeEvolution, TakesADoubleTooGreatForAFloatAsInfinity)
{
    float number = 0;

    EXPECT_TRUE(ReadNativeValue(
        VDataValue{&GetUniquePodSchema(EType::Float64), MakeNativeValue(1e300).Bytes}, number));
    EXPECT_TRUE(std::isinf(number));
}
