#include "io/InputStreamAdapter.h"

#include "io/IReader.h"
#include "io/SchemaSamples.h"
#include "support/VirtualSlot.h"

#include <gtest/gtest.h>

#include <limits>
#include <string>

using KVR::IInputStream;
using KVR::IO::Detail::VVectorReader;
using VAdapter = KVR::IInputStreamAdapter<VVectorReader>;

namespace {

/// A stream whose reads are recorded and fail from the given one on.
class VRecordingStream : public IInputStream
{
public:
    explicit VRecordingStream(std::size_t goodReads_) : goodReads(goodReads_) {}

    bool Read(void*, std::size_t count) override
    {
        sizes.push_back(count);
        return sizes.size() <= goodReads;
    }

    bool IsPastEnd() const override { return false; }

    std::vector<std::size_t> sizes;

private:
    const std::size_t goodReads;
};

} // namespace

TEST(InputStream, SlotsAreInOrder)
{
    using TestSupport::destructorSlots;
    using TestSupport::SlotOf;

    EXPECT_EQ(destructorSlots + 0, SlotOf(&IInputStream::Read));
    EXPECT_EQ(destructorSlots + 1, SlotOf(&IInputStream::IsPastEnd));
    EXPECT_EQ(destructorSlots + 2, SlotOf(&IInputStream::ReadParts));
    EXPECT_EQ(destructorSlots + 3, SlotOf(&IInputStream::IsSeekable));
    EXPECT_EQ(0u, SlotOf(&KVR::IReader::Read)); // in front of its destructor
}

TEST(InputStream, GatheredReadCallsReadForEachPartInOrder)
{
    VRecordingStream stream(10);
    char buffer[8];

    EXPECT_TRUE(stream.ReadParts({{buffer, 1}, {buffer, 4}, {buffer, 2}}));
    EXPECT_EQ((std::vector<std::size_t>{1, 4, 2}), stream.sizes);
}

TEST(InputStream, GatheredReadStopsAtTheFirstFailure)
{
    VRecordingStream stream(1);
    char buffer[8];

    EXPECT_FALSE(stream.ReadParts({{buffer, 1}, {buffer, 4}, {buffer, 2}}));
    EXPECT_EQ((std::vector<std::size_t>{1, 4}), stream.sizes);
}

TEST(InputStream, GatheredReadOfNothingSucceeds)
{
    VRecordingStream stream(0);

    EXPECT_TRUE(stream.ReadParts({}));
}

TEST(InputStream, AnswersTheLastQueryWithFalse)
{
    const auto bytes = Bytes("ab");
    VVectorReader reader(bytes);
    VRecordingStream stream(0);
    VAdapter adapter(&reader);

    EXPECT_FALSE(stream.IsSeekable());
    EXPECT_FALSE(static_cast<IInputStream&>(adapter).IsSeekable());
}

TEST(InputStreamAdapter, CopiesAndMovesTheCursor)
{
    const auto bytes = Bytes("abcd");
    VVectorReader reader(bytes);
    VAdapter adapter(&reader);
    std::string text(3, '.');

    EXPECT_TRUE(adapter.Read(&text[0], 3));
    EXPECT_EQ("abc", text);
    EXPECT_EQ(3u, reader.GetPosition());
}

TEST(InputStreamAdapter, ReadPastTheEndReturnsFalseAndCopiesNothing)
{
    const auto bytes = Bytes("abcd");
    VVectorReader reader(bytes);
    VAdapter adapter(&reader);
    std::string text(5, '.');

    EXPECT_FALSE(adapter.Read(&text[0], 5));
    EXPECT_EQ(".....", text);
    EXPECT_EQ(5u, reader.GetPosition());
}

TEST(InputStreamAdapter, ExactlyAtItsEndItIsNotPastIt)
{
    const auto bytes = Bytes("ab");
    VVectorReader reader(bytes);
    VAdapter adapter(&reader);
    char buffer[2];

    EXPECT_TRUE(adapter.Read(buffer, 2));
    EXPECT_FALSE(adapter.IsPastEnd());
    EXPECT_FALSE(adapter.Read(buffer, 1));
    EXPECT_TRUE(adapter.IsPastEnd());
}

TEST(InputStreamAdapter, ReadOfNothingNeedsNoDestination)
{
    const std::vector<unsigned char> noBytes;
    VVectorReader reader(noBytes);
    VAdapter adapter(&reader);

    EXPECT_TRUE(adapter.Read(nullptr, 0));
    EXPECT_FALSE(adapter.IsPastEnd());
}

TEST(InputStreamAdapter, GreatestCountFails)
{
    const auto bytes = Bytes("ab");
    VVectorReader reader(bytes);
    VAdapter adapter(&reader);
    char buffer[2];
    ASSERT_TRUE(adapter.Read(buffer, 1));

    EXPECT_FALSE(adapter.Read(buffer, std::numeric_limits<std::size_t>::max()));
    EXPECT_TRUE(adapter.IsPastEnd());
}

TEST(InputStreamAdapter, GatheredReadFillsPartsUntilTheFirstFailure)
{
    const auto bytes = Bytes("abcde");
    VVectorReader reader(bytes);
    VAdapter adapter(&reader);
    std::string first(2, '.');
    std::string second(2, '.');
    std::string third(2, '.');

    EXPECT_FALSE(adapter.ReadParts({{&first[0], 2}, {&second[0], 2}, {&third[0], 2}}));
    EXPECT_EQ("ab", first);
    EXPECT_EQ("cd", second);
    EXPECT_EQ("..", third);
}

TEST(InputStreamAdapter, GatheredReadOfAllBytesSucceeds)
{
    const auto bytes = Bytes("abcd");
    VVectorReader reader(bytes);
    VAdapter adapter(&reader);
    std::string first(3, '.');
    std::string second(1, '.');

    EXPECT_TRUE(adapter.ReadParts({{&first[0], 3}, {&second[0], 1}}));
    EXPECT_EQ("abc", first);
    EXPECT_EQ("d", second);
}
