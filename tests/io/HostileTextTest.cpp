#include "io/SchemaSamples.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"

#include "io/DataValue.h"

#include <gtest/gtest.h>

#include <cstring>
#include <stdexcept>
#include <string>

using namespace KVR::IO;

namespace {

using ByteVector = std::vector<unsigned char>;

constexpr std::uint32_t greatestCount = 0xFFFFFFFF;
constexpr std::uint32_t mostWithoutBytes = 1 << 20;

std::string Repeated(const std::string& text, std::size_t count)
{
    std::string result;
    result.reserve(text.size() * count);
    for (std::size_t i = 0; i < count; ++i) {
        result += text;
    }
    return result;
}

bool ParsesAsSchema(const std::string& text)
{
    VDataValue value;
    return ParseSchemaText(value, text.c_str());
}

bool Writes(const ISchema& schema, const ByteVector& bytes, SchemaTextMode mode, std::string& text)
{
    return BinaryToText(bytes, schema, text, mode);
}

bool Reads(const ISchema& schema, const std::string& text, SchemaTextMode mode)
{
    ByteVector bytes;
    const char* begin = text.data();
    return TextToBinary(begin, begin + text.size(), schema, bytes, mode);
}

const ByteVector greatestCountBytes = Bytes("\xFF\xFF\xFF\xFF");
const ISchema nothing = TupleOf({});

} // namespace

TEST(HostileSchemaText, HundredThousandLevelsFail)
{
    constexpr std::size_t levels = 100000;

    EXPECT_FALSE(ParsesAsSchema(Repeated("[", levels)));
    EXPECT_FALSE(ParsesAsSchema(Repeated("{", levels)));
    EXPECT_FALSE(ParsesAsSchema(Repeated(R"({"SubSchemas":[["",)", levels)));
    EXPECT_FALSE(ParsesAsSchema(Repeated(R"({"SubSchemas":[["",)", levels) + "{}" +
                                Repeated("]]}", levels)));
    EXPECT_FALSE(ParsesAsSchema(Repeated(R"(["Tuple","Value",0,0,"",[],[["",)", levels)));
    EXPECT_FALSE(ParsesAsSchema(Repeated(R"(["Tuple","Value",0,0,"",[],[["",)", levels) + "{}" +
                                Repeated("]],[]]", levels)));
}

TEST(HostileSchemaText, HundredThousandBracketsInASkippedValuePass)
{
    EXPECT_TRUE(ParsesAsSchema("{\"x\":" + Repeated("[{", 50000) + Repeated("}]", 50000) + "}"));
}

TEST(HostileSchemaText, HundredThousandDuplicatedKeysCountOnce)
{
    std::string text = R"({"Detail":1)" + Repeated(R"(,"Detail":65536)", 100000) + "}";
    ISchema schema;
    const char* cursor = text.c_str();

    EXPECT_TRUE(ReadSchemaText(schema, cursor));
    EXPECT_EQ(1u, schema.Detail);
}

TEST(HostileValueText, GreatestCountOfAListRaisesWhereItsBytesEnd)
{
    for (const ISchema& element : {Plain(EType::Int32), Plain(EType::String), Plain(EType::Bool),
                                   TupleOf({Plain(EType::Float64)}), ListOf(nothing)}) {
        for (const SchemaTextMode mode : {SchemaTextModePositional, SchemaTextModeNamed,
                                          SchemaTextModeRow, SchemaTextModeQuotedRow}) {
            std::string text;
            EXPECT_THROW(Writes(ListOf(element), greatestCountBytes, mode, text),
                         std::runtime_error);
            EXPECT_LT(text.capacity(), 1024u);
        }
    }
}

TEST(HostileValueText, GreatestCountOfAListFailsInTheBriefMode)
{
    for (const ISchema& element : {Plain(EType::Int32), Plain(EType::String),
                                   TupleOf({Plain(EType::Float64)}), ListOf(nothing)}) {
        std::string text;
        EXPECT_FALSE(Writes(ListOf(element), greatestCountBytes, SchemaTextModeBrief, text));
    }
}

TEST(HostileValueText, GreatestCountOfAnArrayFailsOrRaises)
{
    std::string text;

    EXPECT_THROW(
        Writes(ArrayOf(Plain(EType::Int8), greatestCount), {1, 2, 3}, SchemaTextModeNamed, text),
        std::runtime_error);
    EXPECT_LT(text.capacity(), 1024u);
    EXPECT_FALSE(
        Writes(ArrayOf(Plain(EType::Int8), greatestCount), {1, 2, 3}, SchemaTextModeBrief, text));
    EXPECT_FALSE(Reads(ArrayOf(Plain(EType::Int8), greatestCount), "[1,2,3]", SchemaTextModeNamed));
    EXPECT_FALSE(Reads(ArrayOf(Plain(EType::Int8), greatestCount), "1,2,3", SchemaTextModeRow));
}

TEST(HostileValueText, ElementsWithoutBytesAreWrittenUpToALimit)
{
    std::string text;

    EXPECT_TRUE(Writes(ArrayOf(nothing, mostWithoutBytes), {}, SchemaTextModeNamed, text));
    EXPECT_EQ(3 * mostWithoutBytes + 1, text.size());
    for (const SchemaTextMode mode :
         {SchemaTextModePositional, SchemaTextModeNamed, SchemaTextModeBrief, SchemaTextModeRow,
          SchemaTextModeQuotedRow}) {
        EXPECT_FALSE(Writes(ArrayOf(nothing, mostWithoutBytes + 1), {}, mode, text));
        EXPECT_FALSE(Writes(ListOf(nothing), greatestCountBytes, mode, text));
    }
}

TEST(HostileValueText, TextOfElementsWithoutBytesIsLimitedAsAWhole)
{
    const ISchema many = ArrayOf(nothing, mostWithoutBytes);
    const ISchema longName = NamedTupleOf({{std::string(5000, 'x'), nothing}});
    constexpr std::size_t mostText = 7 * 1024 * 1024;
    std::string text;

    EXPECT_TRUE(Writes(TupleOf({many, many}), {}, SchemaTextModeRow, text));

    EXPECT_FALSE(Writes(ArrayOf(many, mostWithoutBytes), {}, SchemaTextModeNamed, text));
    EXPECT_LT(text.size(), mostText);
    EXPECT_FALSE(Writes(ArrayOf(longName, mostWithoutBytes), {}, SchemaTextModeNamed, text));
    EXPECT_LT(text.size(), mostText);
    EXPECT_FALSE(Writes(TupleOf({many, many, many, many, many, many, many, many, many}), {},
                        SchemaTextModeNamed, text));
    EXPECT_LT(text.size(), 2 * mostText);
}

TEST(HostileValueText, ElementsWithoutBytesAreReadUpToALimit)
{
    const std::string items = Repeated("[],", mostWithoutBytes - 1) + "[]";

    EXPECT_TRUE(Reads(ArrayOf(nothing, mostWithoutBytes), items, SchemaTextModeRow));
    EXPECT_FALSE(Reads(ArrayOf(nothing, mostWithoutBytes + 1), items + ",[]", SchemaTextModeRow));
    EXPECT_FALSE(Reads(ArrayOf(nothing, greatestCount), "[[]]", SchemaTextModeNamed));
}

TEST(HostileValueText, LongStringLengthFailsWithoutItsMemory)
{
    std::string text;

    EXPECT_FALSE(Writes(Plain(EType::String), greatestCountBytes, SchemaTextModeNamed, text));
    EXPECT_LT(text.capacity(), 1024u);
}

/// Looked at one by one for each value, so many entries would not end within the test's time.
TEST(HostileValueText, GreatListOfAGreatEnumIsReadAndWritten)
{
    constexpr std::int32_t count = 200000;
    ISchema names = Plain(EType::Enum32);
    ByteVector values(4 + 4 * std::size_t{count});
    std::memcpy(values.data(), &count, sizeof count);
    for (std::int32_t number = 0; number < count; ++number) {
        const std::int32_t value = count - 1 - number;
        names.EnumValues.emplace_back("e" + std::to_string(number), number);
        std::memcpy(values.data() + 4 + 4 * std::size_t(number), &value, sizeof value);
    }
    names.EnumValues.emplace_back("e5", -1); // of equal names and numbers the first counts
    names.EnumValues.emplace_back("late", 5);
    const ISchema schema = ListOf(names);
    std::string text;
    ByteVector bytes;

    ASSERT_TRUE(BinaryToText(values, schema, text, SchemaTextModeNamed));
    const char* begin = text.data();
    ASSERT_TRUE(TextToBinary(begin, begin + text.size(), schema, bytes, SchemaTextModeNamed));

    EXPECT_EQ(values, bytes);
    EXPECT_NE(std::string::npos, text.find("\"e6\",\"e5\",\"e4\""));
    text.replace(text.size() - 3, 1, "x"); // of the last name
    EXPECT_FALSE(Reads(schema, text, SchemaTextModeNamed));
    values.back() = 0x7F;
    EXPECT_FALSE(BinaryToText(values, schema, text, SchemaTextModeNamed));
}
