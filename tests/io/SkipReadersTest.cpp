#include "io/SkipReaders.h"

#include "io/IInputStream.h"
#include "io/InputStreamAdapter.h"
#include "io/SchemaSamples.h"
#include "io/VectorReader.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <string>
#include <typeinfo>
#include <vector>

using namespace KVR;
using namespace KVR::IO;

namespace {

constexpr std::uint64_t allBitsSet = 0xFFFFFFFFFFFFFFFFu;
constexpr std::size_t oneMebibyte = 1024 * 1024;

/// Hands out a stored count first and then as many bytes as were promised, recording each read.
class VCountingStream : public IInputStream
{
public:
    explicit VCountingStream(std::uint32_t count_, std::uint64_t length_ = allBitsSet)
        : count(count_), length(length_)
    {
    }

    bool Read(void* destination, std::size_t size) override
    {
        if (sizes.empty() && size == sizeof(count)) {
            std::memcpy(destination, &count, sizeof(count));
        }
        sizes.push_back(size);
        total += size;
        return total <= length;
    }

    bool IsPastEnd() const override { return total > length; }

    std::vector<std::size_t> sizes;
    std::uint64_t total = 0;

private:
    const std::uint32_t count;
    const std::uint64_t length;
};

struct VReaderCase
{
    const char* name;
    ISchema schema;
    const std::type_info* type;
    std::uint64_t destinationOffset;
    std::uint32_t flatSize;
};

void PrintTo(const VReaderCase& readerCase, std::ostream* output)
{
    *output << readerCase.name;
}

class SkipReaderOf : public testing::TestWithParam<VReaderCase>
{
};

std::string NameOfCase(const testing::TestParamInfo<VReaderCase>& info)
{
    return info.param.name;
}

const ISchema flatTuple = TupleOf({Plain(EType::Int32), Plain(EType::Int8)});

// clang-format off
const VReaderCase readerCases[] = {
    {"Void", Plain(EType::Void), &typeid(VReaderSkipBytes), 0, 0},
    {"Bool", Plain(EType::Bool), &typeid(VReaderSkipBytes), 0, 1},
    {"Int8", Plain(EType::Int8), &typeid(VReaderSkipBytes), 0, 1},
    {"UInt8", Plain(EType::UInt8), &typeid(VReaderSkipBytes), 0, 1},
    {"Enum8", Plain(EType::Enum8), &typeid(VReaderSkipBytes), 0, 1},
    {"Int16", Plain(EType::Int16), &typeid(VReaderSkipBytes), 0, 2},
    {"UInt16", Plain(EType::UInt16), &typeid(VReaderSkipBytes), 0, 2},
    {"Enum16", Plain(EType::Enum16), &typeid(VReaderSkipBytes), 0, 2},
    {"Int32", Plain(EType::Int32), &typeid(VReaderSkipBytes), 0, 4},
    {"UInt32", Plain(EType::UInt32), &typeid(VReaderSkipBytes), 0, 4},
    {"Float32", Plain(EType::Float32), &typeid(VReaderSkipBytes), 0, 4},
    {"Enum32", Plain(EType::Enum32), &typeid(VReaderSkipBytes), 0, 4},
    {"Int64", Plain(EType::Int64), &typeid(VReaderSkipBytes), 0, 8},
    {"UInt64", Plain(EType::UInt64), &typeid(VReaderSkipBytes), 0, 8},
    {"Float64", Plain(EType::Float64), &typeid(VReaderSkipBytes), 0, 8},
    {"String", Plain(EType::String), &typeid(VReaderSkipContiguousVector), allBitsSet, 0},
    {"ArrayOfFlat", ArrayOf(Plain(EType::Int16), 5), &typeid(VReaderSkipBytes), 0, 10},
    {"ArrayOfFlatArray", ArrayOf(ArrayOf(Plain(EType::Int16), 5), 3), &typeid(VReaderSkipBytes), 0, 30},
    {"ArrayOfNoElements", ArrayOf(Plain(EType::Int16), 0), &typeid(VReaderSkipBytes), 0, 0},
    {"ArrayOfString", ArrayOf(Plain(EType::String), 5), &typeid(VReaderSkipArray), allBitsSet, 0},
    {"ArrayOfFlatTupleStaysAnArray", ArrayOf(flatTuple, 5), &typeid(VReaderSkipArray), allBitsSet, 0},
    {"ArrayOfVoid", ArrayOf(Plain(EType::Void), 5), &typeid(VReaderSkipArray), allBitsSet, 0},
    {"ArrayOfGreatestSize", ArrayOf(Plain(EType::Int8), 0xFFFFFFFF), &typeid(VReaderSkipBytes), 0, 0xFFFFFFFF},
    {"ArrayAboveGreatestSize", ArrayOf(Plain(EType::Int16), 0x80000000), &typeid(VReaderSkipArray), allBitsSet, 0},
    {"ListOfFlat", ListOf(Plain(EType::Int32)), &typeid(VReaderSkipContiguousVector), allBitsSet, 0},
    {"ListOfFlatArray", ListOf(ArrayOf(Plain(EType::Int32), 2)), &typeid(VReaderSkipContiguousVector), allBitsSet, 0},
    {"ListOfString", ListOf(Plain(EType::String)), &typeid(VReaderSkipContainer), allBitsSet, 0},
    {"ListOfFlatTuple", ListOf(flatTuple), &typeid(VReaderSkipContainer), allBitsSet, 0},
    {"ListOfVoid", ListOf(Plain(EType::Void)), &typeid(VReaderSkipContainer), allBitsSet, 0},
    {"Tuple", flatTuple, &typeid(VReaderSkipTuple), allBitsSet, 0},
    {"NamedTuple", NamedTupleOf({{"a", Plain(EType::Int8)}}), &typeid(VReaderSkipTuple), allBitsSet, 0},
    {"Ref", Plain(EType::Ref), &typeid(VReaderSkipTuple), allBitsSet, 0},
    {"NumberAboveTheTypes", Plain(static_cast<EType>(21)), &typeid(VReaderSkipTuple), allBitsSet, 0},
    {"GreatestNumber", Plain(static_cast<EType>(255)), &typeid(VReaderSkipTuple), allBitsSet, 0},
};
// clang-format on

/// Skips a value at the start of `bytes` and returns how many bytes that took, or -1.
int SkippedBytes(const ISchema& schema, const std::vector<unsigned char>& bytes)
{
    Detail::VVectorReader reader(bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&reader);
    const bool good = BuildSkipReader(schema)->Read(stream, nullptr);
    return good ? static_cast<int>(reader.GetPosition()) : -1;
}

} // namespace

INSTANTIATE_TEST_SUITE_P(Schemas, SkipReaderOf, testing::ValuesIn(readerCases), NameOfCase);

TEST_P(SkipReaderOf, HasTheClassAndTheSizeOfItsType)
{
    const std::shared_ptr<IReaderCollapsable> reader = BuildSkipReader(GetParam().schema);

    ASSERT_NE(nullptr, reader);
    const IReaderCollapsable& object = *reader;
    EXPECT_STREQ(GetParam().type->name(), typeid(object).name());
    EXPECT_EQ(GetParam().destinationOffset, reader->DestinationOffset);
    EXPECT_EQ(GetParam().flatSize, reader->FlatSize);
}

TEST(SkipReaders, ConsumeTheirBytesAndNoMore)
{
    // clang-format off
    EXPECT_EQ(0, SkippedBytes(Plain(EType::Void), Bytes("rest")));
    EXPECT_EQ(0, SkippedBytes(Plain(EType::Void), Bytes("")));
    EXPECT_EQ(8, SkippedBytes(Plain(EType::Float64), Bytes("12345678rest")));
    EXPECT_EQ(7, SkippedBytes(Plain(EType::String), Bytes("\x03\x00\x00\x00" "abcrest")));
    EXPECT_EQ(6, SkippedBytes(ArrayOf(Plain(EType::Int16), 3), Bytes("112233rest")));
    EXPECT_EQ(11, SkippedBytes(ArrayOf(Plain(EType::String), 2), Bytes("\x01\x00\x00\x00" "a" "\x02\x00\x00\x00" "bcrest")));
    EXPECT_EQ(12, SkippedBytes(ListOf(Plain(EType::Int32)), Bytes("\x02\x00\x00\x00" "11112222rest")));
    EXPECT_EQ(9, SkippedBytes(ListOf(Plain(EType::String)), Bytes("\x01\x00\x00\x00" "\x01\x00\x00\x00" "arest")));
    EXPECT_EQ(6, SkippedBytes(TupleOf({Plain(EType::Int8), Plain(EType::String)}), Bytes("1" "\x01\x00\x00\x00" "arest")));
    EXPECT_EQ(4, SkippedBytes(WithParts(EType::Ref, {{"", Plain(EType::Int32)}}), Bytes("1111rest")));
    EXPECT_EQ(4, SkippedBytes(WithParts(static_cast<EType>(99), {{"", Plain(EType::Int32)}}), Bytes("1111rest")));
    // clang-format on
}

TEST(SkipReaders, FailWhereTheBytesEnd)
{
    // clang-format off
    EXPECT_EQ(-1, SkippedBytes(Plain(EType::Float64), Bytes("1234567")));
    EXPECT_EQ(-1, SkippedBytes(Plain(EType::String), Bytes("\x03\x00\x00\x00" "ab")));
    EXPECT_EQ(-1, SkippedBytes(Plain(EType::String), Bytes("\x03\x00\x00")));
    EXPECT_EQ(-1, SkippedBytes(ArrayOf(Plain(EType::String), 2), Bytes("\x01\x00\x00\x00" "a" "\x02\x00")));
    EXPECT_EQ(-1, SkippedBytes(ListOf(Plain(EType::Int32)), Bytes("\x02\x00\x00\x00" "1111222")));
    EXPECT_EQ(-1, SkippedBytes(ListOf(Plain(EType::String)), Bytes("\x02\x00\x00\x00" "\x01\x00\x00\x00" "a")));
    EXPECT_EQ(-1, SkippedBytes(TupleOf({Plain(EType::Int8), Plain(EType::Int8)}), Bytes("1")));
    // clang-format on
}

TEST(SkipReaders, ReadTwoValuesInARow)
{
    const auto bytes = Bytes("\x01\x00\x00\x00"
                             "a"
                             "\x02\x00\x00\x00"
                             "bc");
    Detail::VVectorReader cursor(bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    const auto reader = BuildSkipReader(Plain(EType::String));

    EXPECT_TRUE(reader->Read(stream, nullptr));
    EXPECT_EQ(5u, cursor.GetPosition());
    EXPECT_TRUE(reader->Read(stream, nullptr));
    EXPECT_EQ(11u, cursor.GetPosition());
}

TEST(SkipReaders, FlatArrayIsOneRead)
{
    VCountingStream stream(0);

    EXPECT_TRUE(BuildSkipReader(ArrayOf(Plain(EType::Float64), 1000))->Read(stream, nullptr));
    EXPECT_EQ((std::vector<std::size_t>{8000}), stream.sizes);
}

TEST(SkipReaders, FlatListIsOneReadForTheCountAndOneForTheElements)
{
    VCountingStream stream(1000);

    EXPECT_TRUE(BuildSkipReader(ListOf(Plain(EType::Int32)))->Read(stream, nullptr));
    EXPECT_EQ((std::vector<std::size_t>{4, 4000}), stream.sizes);
}

TEST(SkipReaders, RunOfOneMebibyteIsOneRead)
{
    VCountingStream stream(oneMebibyte);

    EXPECT_TRUE(BuildSkipReader(Plain(EType::String))->Read(stream, nullptr));
    EXPECT_EQ((std::vector<std::size_t>{4, oneMebibyte}), stream.sizes);
}

TEST(SkipReaders, LongerRunIsReadInBlocksOfOneMebibyte)
{
    VCountingStream stream(2 * oneMebibyte + 5);

    EXPECT_TRUE(BuildSkipReader(Plain(EType::String))->Read(stream, nullptr));
    EXPECT_EQ((std::vector<std::size_t>{4, oneMebibyte, oneMebibyte, 5}), stream.sizes);
}

TEST(SkipReaders, GreatestCountTakesNoMoreMemoryThanABlock)
{
    // 32 GiB are promised, 3 MiB are there.
    VCountingStream stream(0xFFFFFFFF, 3 * oneMebibyte);

    EXPECT_FALSE(BuildSkipReader(ListOf(Plain(EType::Float64)))->Read(stream, nullptr));
    EXPECT_EQ(oneMebibyte, *std::max_element(stream.sizes.begin(), stream.sizes.end()));
    EXPECT_LE(stream.sizes.size(), 5u);
}

TEST(SkipReaders, GreatestFlatArrayTakesNoMoreMemoryThanABlock)
{
    VCountingStream stream(0, 3 * oneMebibyte);

    EXPECT_FALSE(BuildSkipReader(ArrayOf(Plain(EType::Int8), 0xFFFFFFFF))->Read(stream, nullptr));
    EXPECT_EQ(oneMebibyte, *std::max_element(stream.sizes.begin(), stream.sizes.end()));
}

TEST(SkipReaders, CountsOfElementsWithoutBytesAreNotWaitedFor)
{
    const ISchema nothing =
        TupleOf({Plain(EType::Void), TupleOf({}), ArrayOf(Plain(EType::Bool), 0)});
    const ISchema nested = ArrayOf(ArrayOf(nothing, 0xFFFFFFFF), 0xFFFFFFFF);

    EXPECT_EQ(0, SkippedBytes(nested, Bytes("rest")));
    EXPECT_EQ(4, SkippedBytes(ListOf(nested), Bytes("\xFF\xFF\xFF\xFFrest")));
}

TEST(SkipReaders, NoCollapseReaderHidesItsSize)
{
    VReaderSkipBytesNoCollapse reader(8);
    VCountingStream stream(0);

    EXPECT_EQ(allBitsSet, reader.DestinationOffset);
    EXPECT_EQ(0u, reader.FlatSize);
    EXPECT_TRUE(reader.Read(stream, nullptr));
    EXPECT_EQ((std::vector<std::size_t>{8}), stream.sizes);
}

TEST(SkipReaders, NoCollapseReaderReturnsWhatTheStreamReturns)
{
    VReaderSkipBytesNoCollapse reader(8);
    VCountingStream stream(0, 7);

    EXPECT_FALSE(reader.Read(stream, nullptr));
}

TEST(SkipReaders, ArrayOrListWithoutExactlyOnePartHasNone)
{
    const ISchema noPart = Plain(EType::Array);
    const ISchema twoParts =
        WithParts(EType::List, {{"", Plain(EType::Int8)}, {"", Plain(EType::Int8)}});

    EXPECT_EQ(nullptr, BuildSkipReader(noPart));
    EXPECT_EQ(nullptr, BuildSkipReader(twoParts));
    EXPECT_EQ(nullptr, BuildSkipReader(TupleOf({Plain(EType::Int8), noPart})));
    EXPECT_EQ(nullptr, BuildSkipReader(ListOf(ArrayOf(twoParts, 2))));
}
