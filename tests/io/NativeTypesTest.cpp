#include "io/NativeTypes.h"

#include "Variant/Interning.h"
#include "io/NativePoint.h"
#include "io/SchemaSamples.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace KVR::IO;

namespace {

enum class EColour : std::int32_t { Red = 1, Green = -2 };
enum ENarrow : std::int8_t { NarrowLow = -128, NarrowHigh = 127 };
enum class EShort : std::int16_t { Only = 300 };
enum class EWide : std::uint32_t { Zero };

struct VNumbers
{
    bool flag = false;
    std::int8_t i8 = 0;
    std::int16_t i16 = 0;
    std::int32_t i32 = 0;
    std::int64_t i64 = 0;
    std::uint8_t u8 = 0;
    std::uint16_t u16 = 0;
    std::uint32_t u32 = 0;
    std::uint64_t u64 = 0;
    float f32 = 0;
    double f64 = 0;
};

struct VBase
{
    virtual ~VBase() = default;
    std::int32_t id = 0;
};

struct VMarker : VBase
{
    std::string label;
    EColour colour = EColour::Red;
    VPoint position;
    std::vector<VPoint> track;
    std::vector<std::string> words;
    std::vector<bool> seen;
    std::array<std::int16_t, 3> triple{};
    ENarrow narrow[2] = {NarrowLow, NarrowHigh};
    std::vector<std::vector<EShort>> nested;
    std::array<std::string, 2> pair;
};

template <typename T>
T ReadBack(const T& object)
{
    T read;
    EXPECT_TRUE(ReadNativeValue(MakeNativeValue(object), read));
    return read;
}

VMarker MakeMarker()
{
    VMarker marker;
    marker.id = -7;
    marker.label = std::string("a\0b", 3);
    marker.colour = EColour::Green;
    marker.position = {1.5, -2.5};
    marker.track = {{1, 2}, {3, 4}, {5, 6}};
    marker.words = {"", "word"};
    marker.seen = {true, false, true};
    marker.triple = {{1, -2, 3}};
    marker.narrow[0] = NarrowHigh;
    marker.nested = {{}, {EShort::Only, EShort::Only}};
    marker.pair = {{"left", "right"}};
    return marker;
}

} // namespace

// clang-format off
template <> struct KVR::IO::NativeEnum<EColour>
{
    static constexpr const char* Name = "EColour";
    template <typename Visitor> static void Visit(Visitor&& entry)
    {
        entry("Red", EColour::Red);
        entry("Green", EColour::Green);
    }
};

template <> struct KVR::IO::NativeEnum<ENarrow>
{
    static constexpr const char* Name = "ENarrow";
    template <typename Visitor> static void Visit(Visitor&& entry)
    {
        entry("Low", NarrowLow);
        entry("High", NarrowHigh);
    }
};

template <> struct KVR::IO::NativeEnum<EShort>
{
    static constexpr const char* Name = "EShort";
    template <typename Visitor> static void Visit(Visitor&& entry) { entry("Only", EShort::Only); }
};

template <> struct KVR::IO::NativeEnum<EWide>
{
    static constexpr const char* Name = "EWide";
    template <typename Visitor> static void Visit(Visitor&& entry) { entry("Zero", EWide::Zero); }
};

template <> struct KVR::IO::NativeStruct<VNumbers>
{
    static constexpr const char* Name = "Numbers";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Flag", &VNumbers::flag);
        member("I8", &VNumbers::i8);
        member("I16", &VNumbers::i16);
        member("I32", &VNumbers::i32);
        member("I64", &VNumbers::i64);
        member("U8", &VNumbers::u8);
        member("U16", &VNumbers::u16);
        member("U32", &VNumbers::u32);
        member("U64", &VNumbers::u64);
        member("F32", &VNumbers::f32);
        member("F64", &VNumbers::f64);
    }
};

template <> struct KVR::IO::NativeStruct<VMarker>
{
    static constexpr const char* Name = "Marker";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Id", &VMarker::id);
        member("Label", &VMarker::label);
        member("Colour", &VMarker::colour);
        member("Position", &VMarker::position);
        member("Track", &VMarker::track);
        member("Words", &VMarker::words);
        member("Seen", &VMarker::seen);
        member("Triple", &VMarker::triple);
        member("Narrow", &VMarker::narrow);
        member("Nested", &VMarker::nested);
        member("Pair", &VMarker::pair);
    }
};

// clang-format on

TEST(NativeTypes, HaveTheSchemaOfTheirMembers)
{
    std::string text;
    EXPECT_TRUE(WriteSchemaText(text, NativeSchema<VMarker>(), SchemaTextModeBrief));

    EXPECT_EQ(
        "{\"Type\":\"NamedTuple\",\"TypeName\":\"Marker\",\"SubSchemas\":["
        "[\"Id\",{\"Type\":\"Int32\"}],[\"Label\",{\"Type\":\"String\"}],"
        "[\"Colour\",{\"Type\":\"Enum32\",\"TypeName\":\"EColour\","
        "\"EnumValues\":[[\"Red\",1],[\"Green\",-2]]}],"
        "[\"Position\",{\"Type\":\"NamedTuple\",\"TypeName\":\"Point\",\"SubSchemas\":["
        "[\"X\",{\"Type\":\"Float64\"}],[\"Y\",{\"Type\":\"Float64\"}]]}],"
        "[\"Track\",{\"Type\":\"List\",\"SubSchemas\":[[\"\",{\"Type\":\"NamedTuple\","
        "\"TypeName\":\"Point\",\"SubSchemas\":["
        "[\"X\",{\"Type\":\"Float64\"}],[\"Y\",{\"Type\":\"Float64\"}]]}]]}],"
        "[\"Words\",{\"Type\":\"List\",\"SubSchemas\":[[\"\",{\"Type\":\"String\"}]]}],"
        "[\"Seen\",{\"Type\":\"List\",\"SubSchemas\":[[\"\",{\"Type\":\"Bool\"}]]}],"
        "[\"Triple\",{\"Type\":\"Array\",\"Count\":3,\"SubSchemas\":[[\"\",{\"Type\":\"Int16\"}]]}]"
        ","
        "[\"Narrow\",{\"Type\":\"Array\",\"Count\":2,\"SubSchemas\":[[\"\",{\"Type\":\"Enum8\","
        "\"TypeName\":\"ENarrow\",\"EnumValues\":[[\"Low\",-128],[\"High\",127]]}]]}],"
        "[\"Nested\",{\"Type\":\"List\",\"SubSchemas\":[[\"\",{\"Type\":\"List\",\"SubSchemas\":"
        "[[\"\",{\"Type\":\"Enum16\",\"TypeName\":\"EShort\",\"EnumValues\":[[\"Only\",300]]}]]}]]}"
        "],"
        "[\"Pair\",{\"Type\":\"Array\",\"Count\":2,\"SubSchemas\":[[\"\",{\"Type\":\"String\"}]]}]"
        "]}",
        text);
}

TEST(NativeTypes, HaveAnInternedSchema)
{
    EXPECT_EQ(&GetUniqueSchema(NativeSchema<VPoint>()), &NativeSchema<VPoint>());
    EXPECT_EQ(&GetUniquePodSchema(EType::UInt16), &NativeSchema<std::uint16_t>());
    EXPECT_EQ(EType::Enum32, NativeSchema<EWide>().Type);
}

TEST(NativeTypes, AreWrittenAsTheirValueTextReads)
{
    const VDataValue value = MakeNativeValue(MakeMarker());

    std::string text;
    EXPECT_TRUE(BinaryToText(value.Bytes, *value.Schema, text));

    using namespace std::string_literals;
    EXPECT_EQ("{\"Id\":-7,\"Label\":\"a\0b\",\"Colour\":\"Green\","
              "\"Position\":{\"X\":1.5,\"Y\":-2.5},"
              "\"Track\":[{\"X\":1.0,\"Y\":2.0},{\"X\":3.0,\"Y\":4.0},{\"X\":5.0,\"Y\":6.0}],"
              "\"Words\":[\"\",\"word\"],\"Seen\":[true,false,true],\"Triple\":[1,-2,3],"
              "\"Narrow\":[\"High\",\"High\"],\"Nested\":[[],[\"Only\",\"Only\"]],"
              "\"Pair\":[\"left\",\"right\"]}"s,
              text);
}

TEST(NativeTypes, ReadBackWhatTheyWrote)
{
    const VMarker read = ReadBack(MakeMarker());

    EXPECT_EQ(-7, read.id);
    EXPECT_EQ(std::string("a\0b", 3), read.label);
    EXPECT_EQ(EColour::Green, read.colour);
    EXPECT_EQ((VPoint{1.5, -2.5}), read.position);
    EXPECT_EQ((std::vector<VPoint>{{1, 2}, {3, 4}, {5, 6}}), read.track);
    EXPECT_EQ((std::vector<std::string>{"", "word"}), read.words);
    EXPECT_EQ((std::vector<bool>{true, false, true}), read.seen);
    EXPECT_EQ((std::array<std::int16_t, 3>{{1, -2, 3}}), read.triple);
    EXPECT_EQ(NarrowHigh, read.narrow[0]);
    EXPECT_EQ(NarrowHigh, read.narrow[1]);
    EXPECT_EQ((std::vector<std::vector<EShort>>{{}, {EShort::Only, EShort::Only}}), read.nested);
    EXPECT_EQ((std::array<std::string, 2>{{"left", "right"}}), read.pair);
}

TEST(NativeTypes, KeepEveryNumberAtItsLimits)
{
    VNumbers numbers;
    numbers.flag = true;
    numbers.i8 = std::numeric_limits<std::int8_t>::min();
    numbers.i16 = std::numeric_limits<std::int16_t>::min();
    numbers.i32 = std::numeric_limits<std::int32_t>::min();
    numbers.i64 = std::numeric_limits<std::int64_t>::min();
    numbers.u8 = std::numeric_limits<std::uint8_t>::max();
    numbers.u16 = std::numeric_limits<std::uint16_t>::max();
    numbers.u32 = std::numeric_limits<std::uint32_t>::max();
    numbers.u64 = std::numeric_limits<std::uint64_t>::max();
    numbers.f32 = std::numeric_limits<float>::denorm_min();
    numbers.f64 = std::numeric_limits<double>::infinity();

    const VNumbers read = ReadBack(numbers);

    EXPECT_TRUE(read.flag);
    EXPECT_EQ(numbers.i8, read.i8);
    EXPECT_EQ(numbers.i16, read.i16);
    EXPECT_EQ(numbers.i32, read.i32);
    EXPECT_EQ(numbers.i64, read.i64);
    EXPECT_EQ(numbers.u8, read.u8);
    EXPECT_EQ(numbers.u16, read.u16);
    EXPECT_EQ(numbers.u32, read.u32);
    EXPECT_EQ(numbers.u64, read.u64);
    EXPECT_EQ(numbers.f32, read.f32);
    EXPECT_EQ(numbers.f64, read.f64);
}

TEST(NativeTypes, ReadEveryTruncationAsAFailure)
{
    const std::vector<unsigned char> bytes = MakeNativeValue(MakeMarker()).Bytes;
    for (std::size_t size = 0; size < bytes.size(); ++size) {
        VDataValue value{&NativeSchema<VMarker>(), {bytes.begin(), bytes.begin() + size}};
        VMarker read;
        read.label = "untouched";

        EXPECT_FALSE(ReadNativeValue(value, read)) << size;
        EXPECT_EQ("untouched", read.label);
    }
}

TEST(NativeTypes, RefuseBytesBehindTheValue)
{
    VDataValue value = MakeNativeValue(VPoint{1, 2});
    value.Bytes.push_back(0);
    VPoint read{7, 7};

    EXPECT_FALSE(ReadNativeValue(value, read));
    EXPECT_EQ((VPoint{7, 7}), read);
}

TEST(NativeTypes, RefuseAValueWithoutASchema)
{
    VPoint read{7, 7};

    EXPECT_FALSE(ReadNativeValue(VDataValue(), read));
    EXPECT_EQ((VPoint{7, 7}), read);
}

TEST(NativeTypes, ReadAnyStoredByteAsAGoodBool)
{
    VDataValue value{&NativeSchema<std::vector<bool>>(), Bytes("\x03\x00\x00\x00\x00\x02\xFF")};
    std::vector<bool> read;
    VDataValue array{&NativeSchema<std::array<bool, 2>>(), Bytes("\x80\x00")};
    std::array<bool, 2> pair{{false, true}};

    EXPECT_TRUE(ReadNativeValue(value, read));
    EXPECT_EQ((std::vector<bool>{false, true, true}), read);
    EXPECT_TRUE(ReadNativeValue(array, pair));
    EXPECT_EQ((std::array<bool, 2>{{true, false}}), pair);
}

TEST(NativeTypes, KeepAnEnumNumberWithoutAnEntry)
{
    VDataValue value{&NativeSchema<EColour>(), Bytes("\x63\x00\x00\x00")};
    EColour read = EColour::Red;

    EXPECT_TRUE(ReadNativeValue(value, read));
    EXPECT_EQ(99, static_cast<int>(read));
}
