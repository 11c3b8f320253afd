#include "io/RandomSchema.h"

#include "io/InputStreamAdapter.h"
#include "io/SchemaEquality.h"
#include "io/SchemaText.h"
#include "io/SkipReaders.h"
#include "io/ValueText.h"
#include "io/VectorReader.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <stdexcept>

using namespace KVR;
using namespace KVR::IO;

namespace {

using ByteVector = std::vector<unsigned char>;

constexpr unsigned greatestDepth = 6;
constexpr std::uint32_t seeds = 2000;

std::string DescriptionOf(const ISchema& schema, std::uint32_t seed)
{
    std::string text = "seed " + std::to_string(seed) + ": ";
    WriteSchemaText(text, schema, SchemaTextModeBrief);
    return text;
}

bool IsWord(EType type)
{
    return type == EType::String || (type >= EType::Enum8 && type <= EType::Enum32);
}

bool HoldsType(const ISchema& schema, EType type)
{
    return schema.Type == type || std::any_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                                              [type](const ISchema::SubSchema& part) {
                                                  return HoldsType(part.second, type);
                                              });
}

bool HoldsWord(const ISchema& schema)
{
    return IsWord(schema.Type) ||
           std::any_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                       [](const ISchema::SubSchema& part) { return HoldsWord(part.second); });
}

/// True if a bare word stands next to a bracket somewhere, which then becomes part of the word.
bool HasWordInBrackets(const ISchema& schema)
{
    return std::any_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                       [](const ISchema::SubSchema& part) {
                           return !IsWord(part.second.Type) && HoldsWord(part.second);
                       });
}

/// Makes every name plain, as a bare row keeps no others.
void MakeNamesPlain(ISchema& schema)
{
    for (std::size_t i = 0; i < schema.EnumValues.size(); ++i) {
        schema.EnumValues[i].first = std::string("Entry") + static_cast<char>('A' + i);
    }
    for (ISchema::SubSchema& part : schema.SubSchemas) {
        MakeNamesPlain(part.second);
    }
}

bool IsEmptyList(const ISchema& schema, const ByteVector& bytes)
{
    return schema.Type == EType::List && bytes == ByteVector(4, 0);
}

/// Writes and reads a value, and expects the same bytes and the whole text read.
void ExpectRoundTrip(const ISchema& schema, const ByteVector& bytes, SchemaTextMode mode,
                     std::uint32_t seed)
{
    std::string text;
    ASSERT_TRUE(BinaryToText(bytes, schema, text, mode)) << DescriptionOf(schema, seed);

    ByteVector readBack;
    const char* begin = text.data();
    const char* const end = begin + text.size();
    EXPECT_TRUE(TextToBinary(begin, end, schema, readBack, mode))
        << DescriptionOf(schema, seed) << "\nmode " << mode << ": " << text;
    EXPECT_EQ(end, begin) << DescriptionOf(schema, seed) << "\nmode " << mode << ": " << text;
    EXPECT_EQ(bytes, readBack) << DescriptionOf(schema, seed) << "\nmode " << mode << ": " << text;
}

/// Strict equality and the two members that it leaves out.
bool IsSameRecord(const ISchema& left, const ISchema& right)
{
    if (!StrictlyEqual(left, right) || left.Detail != right.Detail || left.Docs != right.Docs) {
        return false;
    }
    for (std::size_t i = 0; i < left.SubSchemas.size(); ++i) {
        if (!IsSameRecord(left.SubSchemas[i].second, right.SubSchemas[i].second)) {
            return false;
        }
    }
    return true;
}

void CollectTypes(const ISchema& schema, std::set<EType>& types)
{
    types.insert(schema.Type);
    for (const ISchema::SubSchema& part : schema.SubSchemas) {
        CollectTypes(part.second, types);
    }
}

std::size_t DepthOf(const ISchema& schema)
{
    std::size_t depth = 0;
    for (const ISchema::SubSchema& part : schema.SubSchemas) {
        depth = std::max(depth, DepthOf(part.second));
    }
    return depth + 1;
}

} // namespace

TEST(RandomSchemas, MeetEveryTypeAndEveryDepth)
{
    std::set<EType> types;
    std::set<std::size_t> depths;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        const ISchema schema = VRandomSchema(seed).MakeSchema(greatestDepth, {});
        CollectTypes(schema, types);
        depths.insert(DepthOf(schema));
    }

    EXPECT_EQ(21u, types.size());
    EXPECT_EQ((std::set<std::size_t>{1, 2, 3, 4, 5, 6}), depths);
}

TEST(RandomSchemas, SkipReaderConsumesExactlyTheValue)
{
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VRandomSchema random(seed);
        const ISchema schema = random.MakeSchema(greatestDepth, {});
        ByteVector bytes;
        random.AppendValue(bytes, schema, {});
        const std::size_t size = bytes.size();
        bytes.insert(bytes.end(), 3, 0xAB);

        Detail::VVectorReader reader(bytes);
        IInputStreamAdapter<Detail::VVectorReader> stream(&reader);

        EXPECT_TRUE(BuildSkipReader(schema)->Read(stream, nullptr)) << DescriptionOf(schema, seed);
        EXPECT_EQ(size, reader.GetPosition()) << DescriptionOf(schema, seed);
    }
}

TEST(RandomSchemas, SkipReaderFailsForEveryTruncation)
{
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VRandomSchema random(seed);
        const ISchema schema = random.MakeSchema(greatestDepth, {});
        ByteVector bytes;
        random.AppendValue(bytes, schema, {});
        if (bytes.empty()) {
            continue;
        }
        bytes.resize(random.Below(static_cast<std::uint32_t>(bytes.size())));

        Detail::VVectorReader reader(bytes);
        IInputStreamAdapter<Detail::VVectorReader> stream(&reader);

        EXPECT_FALSE(BuildSkipReader(schema)->Read(stream, nullptr)) << DescriptionOf(schema, seed);
    }
}

TEST(RandomSchemas, ValuesReadBackFromTheBracketedModes)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VRandomSchema random(seed);
        const ISchema schema = random.MakeSchema(greatestDepth, limits);
        ByteVector bytes;
        random.AppendValue(bytes, schema, limits);

        ExpectRoundTrip(schema, bytes, SchemaTextModePositional, seed);
        ExpectRoundTrip(schema, bytes, SchemaTextModeNamed, seed);
    }
}

TEST(RandomSchemas, ValuesReadBackFromTheQuotedRowUnlessTheyAreAnEmptyList)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VRandomSchema random(seed);
        const ISchema schema = random.MakeSchema(greatestDepth, limits);
        ByteVector bytes;
        random.AppendValue(bytes, schema, limits);

        if (!IsEmptyList(schema, bytes)) {
            ExpectRoundTrip(schema, bytes, SchemaTextModeQuotedRow, seed);
        }
    }
}

TEST(RandomSchemas, ValuesReadBackFromTheBareRowIfTheirWordsStandFree)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    limits.plainWords = true;
    std::size_t tried = 0;
    for (std::uint32_t seed = 0; seed < 2 * seeds; ++seed) {
        VRandomSchema random(seed);
        ISchema schema = random.MakeSchema(greatestDepth, limits);
        MakeNamesPlain(schema);
        ByteVector bytes;
        random.AppendValue(bytes, schema, limits);

        if (!IsEmptyList(schema, bytes) && !HasWordInBrackets(schema)) {
            ExpectRoundTrip(schema, bytes, SchemaTextModeRow, seed);
            ++tried;
        }
    }
    EXPECT_GT(tried, seeds);
}

TEST(RandomSchemas, TruncatedValuesFailOrRaiseInEveryMode)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VRandomSchema random(seed);
        const ISchema schema = random.MakeSchema(greatestDepth, limits);
        ByteVector bytes;
        random.AppendValue(bytes, schema, limits);
        if (bytes.empty()) {
            continue;
        }
        bytes.resize(random.Below(static_cast<std::uint32_t>(bytes.size())));

        for (int mode = 0; mode <= 4; ++mode) {
            std::string text;
            try {
                EXPECT_FALSE(BinaryToText(bytes, schema, text, SchemaTextMode(mode)))
                    << DescriptionOf(schema, seed);
            } catch (const std::runtime_error& error) {
                EXPECT_STREQ("Unexpected end of binary data", error.what());
            }
        }
    }
}

TEST(RandomSchemas, BriefModeIsWrittenForEveryValue)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VRandomSchema random(seed);
        // A number behind it shows that the elements before were stepped over to the byte.
        ISchema schema;
        schema.Type = EType::Tuple;
        schema.SubSchemas.emplace_back("", random.MakeSchema(greatestDepth - 1, limits));
        schema.SubSchemas.emplace_back("", ISchema());
        schema.SubSchemas.back().second.Type = EType::UInt16;
        ByteVector bytes;
        random.AppendValue(bytes, schema.SubSchemas.front().second, limits);
        bytes.push_back(0x39);
        bytes.push_back(0x30);

        std::string text;
        EXPECT_TRUE(BinaryToText(bytes, schema, text, SchemaTextModeBrief));
        const std::string expectedEnd = ",\"\":12345}";
        ASSERT_GE(text.size(), expectedEnd.size());
        EXPECT_EQ(expectedEnd, text.substr(text.size() - expectedEnd.size()))
            << DescriptionOf(schema, seed);
    }
}

TEST(RandomSchemas, PartsWithoutTextMakeTheConversionFail)
{
    std::size_t tried = 0;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VRandomSchema random(seed);
        ISchema schema;
        schema.Type = EType::Tuple;
        schema.SubSchemas.emplace_back("", random.MakeSchema(1, {}));
        schema.SubSchemas.emplace_back("", random.MakeSchema(1, {}));
        if (!HoldsType(schema, EType::Void) && !HoldsType(schema, EType::Ref)) {
            continue;
        }
        ByteVector bytes;
        random.AppendValue(bytes, schema, {});
        ++tried;

        std::string text;
        EXPECT_FALSE(BinaryToText(bytes, schema, text)) << DescriptionOf(schema, seed);
    }
    EXPECT_GT(tried, 100u);
}

TEST(RandomSchemas, SchemaTextReadsBackWithAllMembers)
{
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        const ISchema schema = VRandomSchema(seed).MakeFullSchema(greatestDepth);
        for (const SchemaTextMode mode :
             {SchemaTextModePositional, SchemaTextModeNamed, SchemaTextModeBrief}) {
            std::string text;
            ASSERT_TRUE(WriteSchemaText(text, schema, mode));

            ISchema readBack;
            const char* cursor = text.c_str();
            EXPECT_TRUE(ReadSchemaText(readBack, cursor)) << "seed " << seed << ": " << text;
            EXPECT_EQ(text.c_str() + text.size(), cursor) << "seed " << seed << ": " << text;
            EXPECT_TRUE(IsSameRecord(schema, readBack)) << "seed " << seed << ": " << text;
        }
    }
}
