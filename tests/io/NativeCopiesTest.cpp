#include "io/CountingStream.h"
#include "io/NativePoint.h"
#include "io/NativeTypes.h"
#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <cstring>

using namespace KVR::IO;

namespace {

using Sizes = std::vector<std::size_t>;

struct VNothing
{
};

/// Flat members first, then lists, then flat ones again.
struct VBulk
{
    std::array<double, 500000> samples{};
    std::int32_t rows = 0;
    std::int32_t columns = 0;
    std::vector<VPoint> points;
    std::string note;
    VPoint origin;
    VPoint scale;
};

/// Its two members leave a gap in memory, and none in the stream.
struct VGap
{
    std::int32_t small = 0;
    double great = 0;
};

struct VInner
{
    double first = 0;
    std::string text;
    double last = 0;
};

/// Its numbers are neighbours of those within its part.
struct VOuter
{
    double before = 0;
    VInner inner;
    double behind = 0;
};

/// The gap is behind the members, where it parts the elements of a list.
struct VTail
{
    double great = 0;
    std::int32_t small = 0;
};

template <typename T>
Sizes CopiesOf(const std::vector<unsigned char>& bytes, T& object)
{
    VRecordingStream stream(bytes);
    EXPECT_TRUE(VNativeReader<T>().Read(stream, object));
    EXPECT_EQ(bytes.size(), stream.GetPosition());
    return stream.sizes;
}

} // namespace

// clang-format off
template <> struct KVR::IO::NativeStruct<VNothing>
{
    static constexpr const char* Name = "Nothing";
    template <typename Visitor> static void Visit(Visitor&&) {}
};

template <> struct KVR::IO::NativeStruct<VBulk>
{
    static constexpr const char* Name = "Bulk";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Samples", &VBulk::samples);
        member("Rows", &VBulk::rows);
        member("Columns", &VBulk::columns);
        member("Points", &VBulk::points);
        member("Note", &VBulk::note);
        member("Origin", &VBulk::origin);
        member("Scale", &VBulk::scale);
    }
};

template <> struct KVR::IO::NativeStruct<VGap>
{
    static constexpr const char* Name = "Gap";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Small", &VGap::small);
        member("Great", &VGap::great);
    }
};

template <> struct KVR::IO::NativeStruct<VInner>
{
    static constexpr const char* Name = "Inner";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("First", &VInner::first);
        member("Text", &VInner::text);
        member("Last", &VInner::last);
    }
};

template <> struct KVR::IO::NativeStruct<VOuter>
{
    static constexpr const char* Name = "Outer";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Before", &VOuter::before);
        member("Inner", &VOuter::inner);
        member("Behind", &VOuter::behind);
    }
};

template <> struct KVR::IO::NativeStruct<VTail>
{
    static constexpr const char* Name = "Tail";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Great", &VTail::great);
        member("Small", &VTail::small);
    }
};
// clang-format on

TEST(NativeCopies, AreAsManyAsThereAreRuns)
{
    const auto bulk = std::make_unique<VBulk>();
    bulk->samples.back() = 1.25;
    bulk->rows = 3;
    bulk->columns = 4;
    bulk->points.assign(375000, VPoint{1, 2});
    bulk->note = "note";
    bulk->origin = {5, 6};
    bulk->scale = {7, 8};
    const std::vector<unsigned char> bytes = MakeNativeValue(*bulk).Bytes;
    ASSERT_GT(bytes.size(), 10000000u);
    const auto read = std::make_unique<VBulk>();

    const Sizes sizes = CopiesOf(bytes, *read);

    // One run of the array and both numbers, the list's count and elements, the text's length and
    // characters, and one run of both points.
    EXPECT_EQ((Sizes{500000 * 8 + 8, 4, 375000 * 16, 4, 4, 32}), sizes);
    EXPECT_EQ(1.25, read->samples.back());
    EXPECT_EQ(3, read->rows);
    EXPECT_EQ(4, read->columns);
    EXPECT_EQ(bulk->points, read->points);
    EXPECT_EQ((VPoint{7, 8}), read->scale);
}

TEST(NativeCopies, EndAtAGapInMemory)
{
    VGap gap;
    EXPECT_EQ((Sizes{4, 8}), CopiesOf(MakeNativeValue(VGap{1, 2}).Bytes, gap));
    EXPECT_EQ(1, gap.small);
    EXPECT_EQ(2, gap.great);
}

TEST(NativeCopies, JoinAcrossTheEndsOfANestedStruct)
{
    VOuter outer;

    EXPECT_EQ((Sizes{16, 4, 4, 16}),
              CopiesOf(MakeNativeValue(VOuter{1, {2, "text", 3}, 4}).Bytes, outer));
    EXPECT_EQ(1, outer.before);
    EXPECT_EQ(2, outer.inner.first);
    EXPECT_EQ("text", outer.inner.text);
    EXPECT_EQ(3, outer.inner.last);
    EXPECT_EQ(4, outer.behind);
}

TEST(NativeCopies, DoNotJoinOverWhatIsSteppedOverInANestedStruct)
{
    const ISchema number = Plain(EType::Float64);
    const ISchema stored =
        NamedTupleOf({{"Before", number},
                      {"Inner", NamedTupleOf({{"Gone", Plain(EType::Int16)}, {"First", number}})},
                      {"Behind", number}});
    VNativeReader<VOuter> reader(stored);
    const std::vector<unsigned char> bytes(26, 0);
    VRecordingStream stream(bytes);
    VOuter outer{1, {2, "kept", 3}, 4};

    EXPECT_TRUE(reader.Read(stream, outer));

    EXPECT_EQ((Sizes{8, 2, 8, 8}), stream.sizes);
    EXPECT_EQ("kept", outer.inner.text);
    EXPECT_EQ(3, outer.inner.last);
    EXPECT_EQ(0, outer.behind);
}

TEST(NativeCopies, OfElementsWithAGapBehindThemAreOneEach)
{
    std::vector<VTail> list;
    const std::vector<VTail> tails{{1, 2}, {3, 4}};
    std::array<VTail, 2> array;

    EXPECT_EQ((Sizes{4, 12, 12}), CopiesOf(MakeNativeValue(tails).Bytes, list));
    EXPECT_EQ(4, list[1].small);
    EXPECT_EQ((Sizes{12, 12}),
              CopiesOf(MakeNativeValue(std::array<VTail, 2>{{{1, 2}, {3, 4}}}).Bytes, array));
    EXPECT_EQ(3, array[1].great);
}

TEST(NativeCopies, OfNestedFlatPartsAreOne)
{
    using Matrix = std::array<std::array<VPoint, 3>, 2>;
    Matrix matrix{};
    Matrix read{};
    matrix[1][2] = {8, 9};

    EXPECT_EQ((Sizes{96}), CopiesOf(MakeNativeValue(matrix).Bytes, read));
    EXPECT_EQ((VPoint{8, 9}), read[1][2]);
}

TEST(NativeLists, GrowAsTheirBytesArrive)
{
    // 64 GiB are promised and 20 MiB are there.
    std::vector<unsigned char> bytes(20 * 1024 * 1024, 1);
    const std::uint32_t promised = 0xFFFFFFFF;
    std::memcpy(bytes.data(), &promised, sizeof(promised));
    std::vector<VPoint> points;
    std::string text;

    EXPECT_FALSE(VNativeReader<std::vector<VPoint>>().Read(bytes, points));
    EXPECT_LE(points.capacity() * sizeof(VPoint), 64u * 1024 * 1024);
    EXPECT_FALSE(VNativeReader<std::string>().Read(bytes, text));
    EXPECT_LE(text.capacity(), 64u * 1024 * 1024);
}

TEST(NativeLists, LongerThanWhatIsTakenUnseenAreReadWhole)
{
    std::vector<std::uint32_t> numbers(9 * 1024 * 1024 + 3);
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        numbers[i] = static_cast<std::uint32_t>(i);
    }
    std::vector<std::uint32_t> read(5);
    const std::string text(40 * 1024 * 1024 + 1, 'x');
    std::string readText;

    EXPECT_EQ((Sizes{4, 16777216, 16777216, 4194316}),
              CopiesOf(MakeNativeValue(numbers).Bytes, read));
    EXPECT_TRUE(numbers == read);
    EXPECT_EQ((Sizes{4, 16777216, 16777216, 8388609}),
              CopiesOf(MakeNativeValue(text).Bytes, readText));
    EXPECT_TRUE(text == readText);
}

TEST(NativeLists, OfNothingHaveALimit)
{
    const std::vector<unsigned char> most = Bytes("\x00\x00\x01\x00");
    const std::vector<unsigned char> more = Bytes("\x01\x00\x01\x00");
    std::vector<VNothing> list;

    EXPECT_TRUE(VNativeReader<std::vector<VNothing>>().Read(most, list));
    EXPECT_EQ(65536u, list.size());
    EXPECT_FALSE(VNativeReader<std::vector<VNothing>>().Read(more, list));
}

TEST(NativeLists, LoseTheElementsThatTheyHeld)
{
    VNativeReader<std::vector<std::string>> reader;
    std::vector<std::string> words{"old", "older", "oldest"};

    EXPECT_TRUE(reader.Read(MakeNativeValue(std::vector<std::string>{"new"}).Bytes, words));
    EXPECT_EQ((std::vector<std::string>{"new"}), words);
    std::vector<double> numbers{1, 2, 3};
    EXPECT_TRUE(VNativeReader<std::vector<double>>().Read(Bytes("\x00\x00\x00\x00"), numbers));
    EXPECT_TRUE(numbers.empty());
}
