#include "io/EvolvingReaders.h"
#include "io/InputStreamAdapter.h"
#include "io/NativeReaders.h"
#include "io/RandomSchema.h"
#include "io/SchemaComparison.h"
#include "io/SchemaMutation.h"
#include "io/SchemaObject.h"
#include "io/SchemaText.h"
#include "io/TextModel.h"
#include "io/VectorReader.h"

#include <gtest/gtest.h>

using namespace KVR;
using namespace KVR::IO;

namespace {

using ByteVector = std::vector<unsigned char>;
using Lines = std::vector<std::string>;

constexpr std::uint32_t seeds = 3000;
constexpr unsigned greatestDepth = 4;

/// A stored schema with a value, and the schema that followed it.
struct VPair
{
    ISchema stored;
    ISchema current;
    ByteVector bytes;
    std::string text; ///< for messages
};

VPair MakePair(std::uint32_t seed, bool readable)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    VRandomSchema random(seed);
    VPair pair;
    pair.stored.Type = EType::NamedTuple;
    for (std::uint32_t i = random.Below(5); i > 0; --i) {
        pair.stored.SubSchemas.emplace_back("", random.MakeSchema(greatestDepth, limits));
    }
    MakeMemberNamesUnique(pair.stored);
    random.AppendValue(pair.bytes, pair.stored, limits);
    pair.current = pair.stored;
    VSchemaMutation mutation(seed + 1);
    mutation.ChangeReadably(pair.current);
    if (!readable) {
        mutation.ChangeAnything(pair.current);
    }
    pair.text = "seed " + std::to_string(seed) + "\n";
    WriteSchemaText(pair.text, pair.stored, SchemaTextModeBrief);
    pair.text += "\n";
    WriteSchemaText(pair.text, pair.current, SchemaTextModeBrief);
    return pair;
}

Lines ErrorsOf(const VPair& pair)
{
    Lines warnings;
    Lines errors;
    CompareSchemas(pair.stored, pair.current, warnings, errors);
    if (errors.empty()) {
        Detail::FindUnmappableEnums(pair.stored, pair.current, errors, "");
    }
    return errors;
}

/// What reading a value came to: whether it worked, how far it went, and what the object held then.
struct VOutcome
{
    bool good = false;
    std::uint64_t position = 0;
    ByteVector bytes;
};

VOutcome Read(IReaderCollapsable& reader, const VSchemaLayout& layout, const ByteVector& bytes)
{
    VSchemaObject object(layout);
    Detail::VVectorReader cursor(bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    VOutcome outcome;
    outcome.good = reader.Read(stream, Detail::PlaceOf(object.Get(), reader));
    outcome.position = cursor.GetPosition();
    object.AppendTo(outcome.bytes);
    return outcome;
}

} // namespace

TEST(EvolutionProperties, UnchangedValueReadsAsItselfWithBothBuilders)
{
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        const VPair pair = MakePair(seed, true);
        const VSchemaLayout layout(pair.stored);
        const ReaderBuildNode node = layout.MakeNode(0);

        for (const auto& reader : {BuildReader(pair.stored, node),
                                   BuildEvolvingReader(pair.stored, node, pair.stored)}) {
            ASSERT_NE(nullptr, reader) << pair.text;
            const VOutcome outcome = Read(*reader, layout, pair.bytes);
            ASSERT_TRUE(outcome.good) << pair.text;
            ASSERT_EQ(pair.bytes, outcome.bytes) << pair.text;
            ASSERT_EQ(pair.bytes.size(), outcome.position) << pair.text;
        }
    }
}

TEST(EvolutionProperties, ReaderGivesWhatTheTextModelGivesAndConsumesEveryByte)
{
    std::size_t changed = 0;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VPair pair = MakePair(seed, true);
        ASSERT_EQ(Lines(), ErrorsOf(pair)) << pair.text;
        const VSchemaLayout layout(pair.current);
        const auto reader = BuildEvolvingReader(pair.current, layout.MakeNode(0), pair.stored);
        ASSERT_NE(nullptr, reader) << pair.text;
        ByteVector expected;
        ASSERT_TRUE(ConvertThroughText(pair.stored, pair.bytes, pair.current, expected))
            << pair.text;

        const std::size_t size = pair.bytes.size();
        pair.bytes.insert(pair.bytes.end(), 3, 0xAB);
        const VOutcome outcome = Read(*reader, layout, pair.bytes);

        ASSERT_TRUE(outcome.good) << pair.text;
        ASSERT_EQ(size, outcome.position) << pair.text;
        ASSERT_EQ(expected, outcome.bytes) << pair.text;
        pair.bytes.resize(size);
        changed += expected != pair.bytes ? 1 : 0;
    }
    EXPECT_GT(changed, seeds / 2);
}

TEST(EvolutionProperties, ReaderReadsOneValueAfterTheOther)
{
    for (std::uint32_t seed = 0; seed < seeds / 10; ++seed) {
        VPair pair = MakePair(seed, true);
        const VSchemaLayout layout(pair.current);
        const auto reader = BuildEvolvingReader(pair.current, layout.MakeNode(0), pair.stored);

        const VOutcome first = Read(*reader, layout, pair.bytes);
        const VOutcome second = Read(*reader, layout, pair.bytes);

        ASSERT_TRUE(first.good && second.good) << pair.text;
        ASSERT_EQ(first.bytes, second.bytes) << pair.text;
    }
}

TEST(EvolutionProperties, TruncatedValueFails)
{
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        VPair pair = MakePair(seed, true);
        if (pair.bytes.empty()) {
            continue;
        }
        const VSchemaLayout layout(pair.current);
        const auto reader = BuildEvolvingReader(pair.current, layout.MakeNode(0), pair.stored);
        pair.bytes.resize(seed % pair.bytes.size());

        ASSERT_FALSE(Read(*reader, layout, pair.bytes).good) << pair.text;
    }
}

TEST(EvolutionProperties, WhatTheComparisonCallsReadableReadsAndTheRestDoesNoHarm)
{
    std::size_t unreadable = 0;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        const VPair pair = MakePair(seed, false);
        const VSchemaLayout layout(pair.current);
        const auto reader = BuildEvolvingReader(pair.current, layout.MakeNode(0), pair.stored);
        if (ErrorsOf(pair).empty()) {
            ASSERT_NE(nullptr, reader) << pair.text;
            ASSERT_TRUE(Read(*reader, layout, pair.bytes).good) << pair.text;
            continue;
        }
        ++unreadable;
        if (reader != nullptr) {
            Read(*reader, layout, pair.bytes);
        }
    }
    EXPECT_GT(unreadable, seeds / 4);
    EXPECT_LT(unreadable, seeds);
}

TEST(EvolutionProperties, WayBackReadsWhereTheComparisonSaysSo)
{
    std::size_t readable = 0;
    for (std::uint32_t seed = 0; seed < seeds; ++seed) {
        const VPair forth = MakePair(seed, true);
        VPair back{forth.current, forth.stored, {}, forth.text};
        VRandomSchema::Limits limits;
        limits.withoutText = false;
        VRandomSchema(seed + 2).AppendValue(back.bytes, back.stored, limits);
        const VSchemaLayout layout(back.current);
        const auto reader = BuildEvolvingReader(back.current, layout.MakeNode(0), back.stored);
        if (!ErrorsOf(back).empty()) {
            if (reader != nullptr) {
                Read(*reader, layout, back.bytes);
            }
            continue;
        }
        ++readable;
        ASSERT_NE(nullptr, reader) << back.text;
        ByteVector expected;
        ASSERT_TRUE(ConvertThroughText(back.stored, back.bytes, back.current, expected))
            << back.text;
        const VOutcome outcome = Read(*reader, layout, back.bytes);
        ASSERT_TRUE(outcome.good) << back.text;
        ASSERT_EQ(back.bytes.size(), outcome.position) << back.text;
        ASSERT_EQ(expected, outcome.bytes) << back.text;
    }
    EXPECT_GT(readable, seeds / 10);
    EXPECT_LT(readable, seeds);
}
