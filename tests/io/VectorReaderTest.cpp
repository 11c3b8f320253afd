#include "io/VectorReader.h"

#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <limits>
#include <stdexcept>

using KVR::IO::Detail::VVectorReader;

namespace {

template <typename T>
std::string ErrorOfRead(VVectorReader& reader)
{
    try {
        reader.Read<T>();
    } catch (const std::runtime_error& error) {
        return error.what();
    }
    return "no error";
}

} // namespace

TEST(VectorReader, ReadsNumbersOfEveryWidthLittleEndian)
{
    const auto bytes = Bytes("\x01\x02\x03\x04\x05\x06\x07\x08\x09\x0A\x0B\x0C\x0D\x0E\x0F");
    VVectorReader reader(bytes);

    EXPECT_EQ(0x01, reader.Read<std::uint8_t>());
    EXPECT_EQ(0x0302, reader.Read<std::uint16_t>());
    EXPECT_EQ(0x07060504u, reader.Read<std::uint32_t>());
    EXPECT_EQ(0x0F0E0D0C0B0A0908u, reader.Read<std::uint64_t>());
    EXPECT_EQ(15u, reader.GetPosition());
}

TEST(VectorReader, ReadsSignedAndRealNumbers)
{
    const auto bytes = Bytes("\xFF\xFE\xFF\x00\x00\x80\xBF\x00\x00\x00\x00\x00\x00\xF8\x3F");
    VVectorReader reader(bytes);

    EXPECT_EQ(-1, reader.Read<std::int8_t>());
    EXPECT_EQ(-2, reader.Read<std::int16_t>());
    EXPECT_EQ(-1.0f, reader.Read<float>());
    EXPECT_EQ(1.5, reader.Read<double>());
}

TEST(VectorReader, ReadPastTheEndRaisesAndLeavesThePositionBeyond)
{
    const auto bytes = Bytes("\x01\x02\x03");
    VVectorReader reader(bytes);

    EXPECT_EQ("Unexpected end of binary data", ErrorOfRead<std::uint32_t>(reader));
    EXPECT_EQ(4u, reader.GetPosition());

    // Even what would have fitted fails from now on.
    EXPECT_EQ("Unexpected end of binary data", ErrorOfRead<std::uint8_t>(reader));
}

TEST(VectorReader, IsNotPastItsEndWhileExactlyThere)
{
    const auto bytes = Bytes("\x01");
    VVectorReader reader(bytes);
    reader.Read<std::uint8_t>();

    EXPECT_FALSE(reader.IsPastEnd());
    EXPECT_EQ("Unexpected end of binary data", ErrorOfRead<std::uint8_t>(reader));
    EXPECT_TRUE(reader.IsPastEnd());
}

TEST(VectorReader, ReadsStringsWithZeroBytes)
{
    const auto bytes = Bytes("\x03\x00\x00\x00"
                             "a\0b"
                             "\x00\x00\x00\x00");
    VVectorReader reader(bytes);
    std::string text;

    EXPECT_TRUE(reader.ReadString(text));
    EXPECT_EQ(std::string("a\0b", 3), text);
    EXPECT_TRUE(reader.ReadString(text));
    EXPECT_EQ("", text);
}

TEST(VectorReader, StringThatRunsPastTheEndIsAFailureAndNoException)
{
    const auto bytes = Bytes("\x04\x00\x00\x00"
                             "abc");
    VVectorReader reader(bytes);
    std::string text = "untouched";

    EXPECT_FALSE(reader.ReadString(text));
    EXPECT_EQ("untouched", text);
    EXPECT_EQ(8u, reader.GetPosition());
}

TEST(VectorReader, LengthOfAStringThatIsCutOffRaises)
{
    const auto bytes = Bytes("\x04\x00\x00");
    VVectorReader reader(bytes);
    std::string text;

    EXPECT_THROW(reader.ReadString(text), std::runtime_error);
}

TEST(VectorReader, PositionNeverWrapsAround)
{
    const auto bytes = Bytes("\x01\x02");
    VVectorReader reader(bytes);
    reader.Read<std::uint8_t>();

    EXPECT_FALSE(reader.Advance(std::numeric_limits<std::uint64_t>::max()));
    EXPECT_FALSE(reader.Advance(2));
    EXPECT_TRUE(reader.IsPastEnd());
}
