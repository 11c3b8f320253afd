#include "io/BinaryLayout.h"

#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

using namespace KVR::IO;
using namespace KVR::IO::Detail;

namespace {

using ByteVector = std::vector<unsigned char>;

} // namespace

TEST(BinaryLayout, NumbersArePackedLittleEndian)
{
    ByteVector bytes;

    AppendNumber<std::uint8_t>(bytes, 1);
    AppendNumber<std::int16_t>(bytes, -2);
    AppendNumber<std::uint32_t>(bytes, 0x01020304);
    AppendNumber<std::int64_t>(bytes, -1);
    AppendNumber(bytes, 1.0f);
    AppendNumber(bytes, 1.5);

    EXPECT_EQ(Bytes("\x01"
                    "\xFE\xFF"
                    "\x04\x03\x02\x01"
                    "\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFF"
                    "\x00\x00\x80\x3F"
                    "\x00\x00\x00\x00\x00\x00\xF8\x3F"),
              bytes);
}

TEST(BinaryLayout, StringIsLengthAndBytesWithoutATerminator)
{
    ByteVector bytes;

    EXPECT_TRUE(AppendString(bytes, std::string("a\0b", 3)));
    EXPECT_TRUE(AppendString(bytes, ""));

    EXPECT_EQ(Bytes("\x03\x00\x00\x00"
                    "a\0b"
                    "\x00\x00\x00\x00"),
              bytes);
}

TEST(BinaryLayout, EnumsTakeTheWidthOfTheirType)
{
    ByteVector bytes;

    EXPECT_TRUE(AppendEnum(bytes, EType::Enum8, -1));
    EXPECT_TRUE(AppendEnum(bytes, EType::Enum16, 258));
    EXPECT_TRUE(AppendEnum(bytes, EType::Enum32, -2));
    EXPECT_FALSE(AppendEnum(bytes, EType::Int32, 1));

    EXPECT_EQ(Bytes("\xFF"
                    "\x02\x01"
                    "\xFE\xFF\xFF\xFF"),
              bytes);
}
