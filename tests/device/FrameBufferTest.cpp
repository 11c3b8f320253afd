#include "ControlStreamClient/FrameBuffer.h"

#include "ControlStreamClient/Error.h"

#include <cstring>

#include <gmock/gmock.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VError;
using ControlStream::VFrameBuffer;
using namespace std::string_literals;

/// Puts bytes into the buffer in pieces of at most `step` bytes.
void Arrive(VFrameBuffer& buffer, const std::string& bytes, std::size_t step)
{
    for (std::size_t sent = 0; sent < bytes.size();) {
        const VFrameBuffer::VSpace space = buffer.GetSpace();
        const std::size_t count = std::min({step, space.Size, bytes.size() - sent});
        std::memcpy(space.Data, bytes.data() + sent, count);
        buffer.Commit(count);
        sent += count;
    }
}

std::vector<std::string> TakeAll(VFrameBuffer& buffer)
{
    std::vector<std::string> texts;
    for (std::string text; buffer.Take(text);) {
        texts.push_back(text);
    }
    return texts;
}

struct VFrameCase
{
    const char* Name;
    std::string Stream;
    std::vector<std::string> Texts;
    std::string Rest;
};

class FrameBufferStream : public testing::TestWithParam<VFrameCase>
{
};

TEST_P(FrameBufferStream, IsCutIntoTextsWhereverItIsSplit)
{
    const std::string& stream = GetParam().Stream;
    for (std::size_t step = 1; step <= stream.size() + 1; ++step) {
        VFrameBuffer buffer(100);
        Arrive(buffer, stream, step);

        EXPECT_EQ(GetParam().Texts, TakeAll(buffer)) << "in pieces of " << step;
        EXPECT_EQ(GetParam().Rest, buffer.DescribeRest()) << "in pieces of " << step;
    }
}

// Header and text are separate literals: in one, "\x00A" would be read as a single escape.
// clang-format off
const VFrameCase frameCases[] = {
    {"Nothing", "", {}, ""},
    {"EmptyFrame", "\x00\x00\x00\x00"s, {""}, ""},
    {"OneFrame", "\x03\x00\x00\x00" "abc"s, {"abc"}, ""},
    {"TwoFramesInOneSegment", "\x01\x00\x00\x00" "A" "\x01\x00\x00\x00" "B"s, {"A", "B"}, ""},
    {"LengthCountsBytes", "\x02\x00\x00\x00" "\xC3\xA9"s, {"\xC3\xA9"}, ""},
    {"ZerosBelongToTheText", "\x03\x00\x00\x00" "a\x00" "b"s, {"a\0b"s}, ""},
    {"InvalidUtf8Passes", "\x02\x00\x00\x00" "\xFF\xFE"s, {"\xFF\xFE"}, ""},
    {"HalfHeader", "\x01\x00\x00\x00" "A" "\x01\x00"s, {"A"}, "2 of the 4 bytes of its header"},
    {"HeaderAlone", "\x05\x00\x00\x00"s, {}, "0 of its 5 bytes"},
    {"HalfText", "\x05\x00\x00\x00" "ab"s, {}, "2 of its 5 bytes"},
    {"AtTheLimit", "\x64\x00\x00\x00"s + std::string(100, 'x'), {std::string(100, 'x')}, ""},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, FrameBufferStream, testing::ValuesIn(frameCases),
                         [](const auto& test) { return test.param.Name; });

struct VLengthCase
{
    const char* Name;
    std::string Header;
    const char* Announced;
};

class FrameBufferLimit : public testing::TestWithParam<VLengthCase>
{
};

TEST_P(FrameBufferLimit, IsKeptByTheHeaderAloneAndForEver)
{
    VFrameBuffer buffer(100);
    Arrive(buffer,
           "\x01\x00\x00\x00"
           "A"s +
               GetParam().Header,
           100);
    std::string text;
    ASSERT_TRUE(buffer.Take(text));

    for (int attempt = 0; attempt < 2; ++attempt) {
        try {
            buffer.Take(text);
            FAIL() << "the frame was not refused";
        } catch (const VError& error) {
            EXPECT_EQ(EErrorKind::Protocol, error.Kind());
            EXPECT_EQ("the host announced a frame of "s + GetParam().Announced +
                          " bytes, but the limit is 100",
                      error.what());
        }
    }
}

// clang-format off
const VLengthCase lengthCases[] = {
    {"OneMore", "\x65\x00\x00\x00"s, "101"},
    {"SecondByteCounts", "\x00\x01\x00\x00"s, "256"},
    {"FourthByteCounts", "\x00\x00\x00\x01"s, "16777216"},
    {"GreatestLength", "\xFF\xFF\xFF\xFF"s, "4294967295"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, FrameBufferLimit, testing::ValuesIn(lengthCases),
                         [](const auto& test) { return test.param.Name; });

TEST(FrameBuffer, TakesMemoryAsBytesArriveAndNotAsTheyAreAnnounced)
{
    VFrameBuffer buffer(0xFFFFFFFF);
    Arrive(buffer, "\xFF\xFF\xFF\xFF"s, 4);
    std::string text;
    ASSERT_FALSE(buffer.Take(text));

    EXPECT_LE(buffer.GetSpace().Size, 64U << 10U);
}

TEST(FrameBuffer, CarriesAFrameOfManyMegabytes)
{
    const std::string big(20U << 20U, 'x');
    VFrameBuffer buffer(64U << 20U);
    Arrive(buffer, "\x00\x00\x40\x01"s + big, 1000000);
    std::string text;

    ASSERT_TRUE(buffer.Take(text));
    EXPECT_TRUE(text == big);
    EXPECT_LE(buffer.GetSpace().Size, 64U << 10U) << "the memory of the big frame is kept";
}

TEST(FrameBuffer, IsFullOnceMoreThanTheLongestFrameWaits)
{
    VFrameBuffer buffer(100);
    Arrive(buffer, "\x64\x00\x00\x00"s + std::string(100, 'x'), 104);
    EXPECT_FALSE(buffer.IsFull());

    Arrive(buffer, "\x01"s, 1);
    EXPECT_TRUE(buffer.IsFull());

    std::string text;
    buffer.Take(text);
    EXPECT_FALSE(buffer.IsFull());
}

TEST(FrameBuffer, ForgetsEverythingWhenCleared)
{
    VFrameBuffer buffer(100);
    Arrive(buffer,
           "\xFF\xFF\xFF\xFF"
           "abc"s,
           7);

    buffer.Clear();
    Arrive(buffer,
           "\x01\x00\x00\x00"
           "A"s,
           5);

    EXPECT_EQ(std::vector<std::string>{"A"}, TakeAll(buffer));
}

struct VHeaderCase
{
    const char* Name;
    std::uint32_t Length;
    std::string Header;
};

class FrameHeader : public testing::TestWithParam<VHeaderCase>
{
};

TEST_P(FrameHeader, IsLeastSignificantByteFirst)
{
    unsigned char header[4];
    ControlStream::WriteFrameHeader(GetParam().Length, header);

    EXPECT_EQ(GetParam().Header, std::string(header, header + 4));
}

// clang-format off
const VHeaderCase headerCases[] = {
    {"Zero", 0, "\x00\x00\x00\x00"s},
    {"One", 1, "\x01\x00\x00\x00"s},
    {"Mixed", 0x12345678, "\x78\x56\x34\x12"s},
    {"Greatest", 0xFFFFFFFF, "\xFF\xFF\xFF\xFF"s},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, FrameHeader, testing::ValuesIn(headerCases),
                         [](const auto& test) { return test.param.Name; });

} // namespace
