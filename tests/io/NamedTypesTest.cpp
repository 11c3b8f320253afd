#include "io/NamedTypes.h"

#include "io/RandomSchema.h"
#include "io/SchemaEquality.h"
#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

using namespace KVR::IO;

namespace {

using Dictionary = std::vector<ISchema>;

ISchema Named(const std::string& name, ISchema schema)
{
    schema.TypeName = name;
    return schema;
}

ISchema RefTo(const std::string& name)
{
    return Named(name, Plain(EType::Ref));
}

/// Extracts a schema that must not be told as changed unless it moved itself.
std::size_t Extract(ISchema& schema, Dictionary& dictionary, bool expectedChange)
{
    bool changed = !expectedChange;
    const std::size_t count = ExtractNamedTypes(schema, dictionary, changed);
    EXPECT_EQ(expectedChange, changed);
    return count;
}

} // namespace

TEST(NamedTypes, LeaveAPlainSchemaAlone)
{
    ISchema schema = ListOf(Plain(EType::Int8));
    Dictionary dictionary;

    EXPECT_EQ(0u, Extract(schema, dictionary, false));
    EXPECT_TRUE(StrictlyEqual(ListOf(Plain(EType::Int8)), schema));
    EXPECT_TRUE(dictionary.empty());
}

TEST(NamedTypes, MoveANamedSchemaIntoTheDictionary)
{
    ISchema schema = Named("Kind", EnumOf(EType::Enum8, {{"A", 1}}));
    schema.Docs = {"of the kind"};
    schema.Detail = 9;
    Dictionary dictionary;

    EXPECT_EQ(1u, Extract(schema, dictionary, true));

    EXPECT_TRUE(StrictlyEqual(RefTo("Kind"), schema));
    EXPECT_TRUE(schema.Docs.empty());
    EXPECT_EQ(9, schema.Detail);
    ASSERT_EQ(1u, dictionary.size());
    EXPECT_TRUE(StrictlyEqual(Named("Kind", EnumOf(EType::Enum8, {{"A", 1}})), dictionary.front()));
    EXPECT_EQ((std::vector<std::string>{"of the kind"}), dictionary.front().Docs);
    EXPECT_EQ(9, dictionary.front().Detail);
}

TEST(NamedTypes, MoveTheInnermostFirst)
{
    const ISchema inner = Named("Inner", TupleOf({Plain(EType::Int8)}));
    ISchema schema = ListOf(Named("Outer", NamedTupleOf({{"X", inner}, {"Y", inner}})));
    Dictionary dictionary;

    EXPECT_EQ(2u, Extract(schema, dictionary, false)); // the list itself did not move

    EXPECT_TRUE(StrictlyEqual(ListOf(RefTo("Outer")), schema));
    ASSERT_EQ(2u, dictionary.size());
    EXPECT_TRUE(StrictlyEqual(inner, dictionary[0]));
    EXPECT_TRUE(
        StrictlyEqual(Named("Outer", NamedTupleOf({{"X", RefTo("Inner")}, {"Y", RefTo("Inner")}})),
                      dictionary[1]));
}

TEST(NamedTypes, ThatAreKnownBecomeReferencesWithoutAChangeWhichIsKept)
{
    ISchema schema = Named("Kind", TupleOf({Named("New", Plain(EType::Bool))}));
    Dictionary dictionary{Named("Kind", Plain(EType::Int8))};

    EXPECT_EQ(0u, Extract(schema, dictionary, false));

    EXPECT_TRUE(StrictlyEqual(RefTo("Kind"), schema));
    EXPECT_EQ(1u, dictionary.size()); // nothing below a known name is looked at
}

TEST(NamedTypes, KeepTheCountInTheReferenceAndDropItFromTheEntry)
{
    ISchema schema = Named("Three", ArrayOf(Plain(EType::Int8), 3));
    Dictionary dictionary;

    EXPECT_EQ(1u, Extract(schema, dictionary, true));

    EXPECT_EQ(3u, schema.Count);
    EXPECT_EQ(0u, dictionary.front().Count);
}

TEST(NamedTypes, DropARoleAboveCallbackFromTheEntry)
{
    for (int role = 0; role <= 7; ++role) {
        ISchema schema = Named("Type", Plain(EType::Int8));
        schema.Role = ERole(role);
        Dictionary dictionary;

        EXPECT_EQ(1u, Extract(schema, dictionary, true));

        EXPECT_EQ(ERole(role), schema.Role);
        EXPECT_EQ(ERole(role <= 2 ? role : 0), dictionary.front().Role);
    }
}

TEST(NamedTypes, LeaveAReferenceToAnUnknownNameAlone)
{
    ISchema schema = RefTo("Elsewhere");
    Dictionary dictionary;

    EXPECT_EQ(0u, Extract(schema, dictionary, false));
    EXPECT_TRUE(dictionary.empty());
}

TEST(NamedTypes, WithinATypeOfTheSameNameGiveTwoEntriesWhichIsKept)
{
    ISchema schema = Named("Same", TupleOf({Named("Same", Plain(EType::Int8))}));
    Dictionary dictionary;

    EXPECT_EQ(2u, Extract(schema, dictionary, true));
    ASSERT_EQ(2u, dictionary.size());
    EXPECT_EQ(EType::Int8, dictionary[0].Type);

    EXPECT_TRUE(ResolveNamedTypes(schema, dictionary));
    EXPECT_EQ(EType::Int8, schema.Type);
}

TEST(NamedTypes, AreResolvedAtAnyDepth)
{
    ISchema schema = ListOf(RefTo("Outer"));
    const Dictionary dictionary{Named("Inner", Plain(EType::Int8)),
                                Named("Outer", TupleOf({RefTo("Inner")}))};

    EXPECT_TRUE(ResolveNamedTypes(schema, dictionary));
    EXPECT_TRUE(StrictlyEqual(ListOf(Named("Outer", TupleOf({Named("Inner", Plain(EType::Int8))}))),
                              schema));
}

TEST(NamedTypes, KeepRoleDetailAndCountOfTheReference)
{
    ISchema schema = RefTo("Type");
    schema.Role = ERole::Input;
    schema.Detail = 5;
    schema.Count = 6;
    ISchema entry = Named("Type", ArrayOf(Plain(EType::Int8), 99));
    entry.Role = ERole::Function;
    entry.Detail = 98;
    entry.Docs = {"docs"};

    EXPECT_TRUE(ResolveNamedTypes(schema, {entry}));

    EXPECT_EQ(EType::Array, schema.Type);
    EXPECT_EQ(ERole::Input, schema.Role);
    EXPECT_EQ(5, schema.Detail);
    EXPECT_EQ(6u, schema.Count);
    EXPECT_EQ((std::vector<std::string>{"docs"}), schema.Docs);
    EXPECT_EQ(1u, schema.SubSchemas.size());
}

TEST(NamedTypes, ThatTheDictionaryLacksAreNotResolved)
{
    ISchema top = RefTo("Unknown");
    ISchema nested = TupleOf({RefTo("Known"), RefTo("Unknown"), RefTo("Known")});
    const Dictionary dictionary{Named("Known", Plain(EType::Int8))};

    EXPECT_FALSE(ResolveNamedTypes(top, dictionary));
    EXPECT_FALSE(ResolveNamedTypes(nested, dictionary));
    // It stops at the first that fails.
    EXPECT_EQ(EType::Int8, nested.SubSchemas[0].second.Type);
    EXPECT_EQ(EType::Ref, nested.SubSchemas[2].second.Type);
}

TEST(NamedTypes, ThatHoldThemselvesAreNotResolved)
{
    ISchema direct = RefTo("Self");
    ISchema indirect = RefTo("A");
    ISchema reference = RefTo("Ref");

    EXPECT_FALSE(ResolveNamedTypes(direct, {Named("Self", ListOf(RefTo("Self")))}));
    EXPECT_FALSE(ResolveNamedTypes(
        indirect, {Named("A", ListOf(RefTo("B"))), Named("B", ListOf(RefTo("A")))}));
    EXPECT_FALSE(ResolveNamedTypes(reference, {RefTo("Ref")}));
}

TEST(NamedTypes, ThatAreUsedTwiceSideBySideAreNoCircle)
{
    ISchema schema = TupleOf({RefTo("A"), RefTo("B"), RefTo("A")});

    EXPECT_TRUE(ResolveNamedTypes(
        schema, {Named("A", ListOf(RefTo("B"))), Named("B", Plain(EType::Int8))}));
}

TEST(NamedTypes, OfAShortDictionaryCannotAskForEndlessParts)
{
    Dictionary doubling{Named("0", Plain(EType::Int8))};
    for (int i = 1; i < 60; ++i) {
        const ISchema half = RefTo(std::to_string(i - 1));
        doubling.push_back(Named(std::to_string(i), TupleOf({half, half})));
    }
    ISchema schema = RefTo("59");

    EXPECT_FALSE(ResolveNamedTypes(schema, doubling));
}

TEST(NamedTypes, OfALongDictionaryCannotAskForEndlessLevels)
{
    Dictionary chain{Named("0", Plain(EType::Int8))};
    for (int i = 1; i < 300; ++i) {
        chain.push_back(Named(std::to_string(i), ListOf(RefTo(std::to_string(i - 1)))));
    }
    ISchema good = RefTo("255");
    ISchema deep = RefTo("256");

    EXPECT_TRUE(ResolveNamedTypes(good, chain));
    EXPECT_FALSE(ResolveNamedTypes(deep, chain));
}

TEST(NamedTypes, OfALargeSchemaAreResolvedWhateverItsSize)
{
    ISchema wide = Plain(EType::Tuple);
    wide.SubSchemas.assign(70000, {std::string(), Plain(EType::Bool)});
    wide.SubSchemas.emplace_back(std::string(), RefTo("A"));
    ISchema deep = ListOf(Plain(EType::Bool));
    for (int i = 0; i < 300; ++i) {
        deep = TupleOf({deep});
    }

    EXPECT_TRUE(ResolveNamedTypes(wide, {Named("A", Plain(EType::Int8))}));
    EXPECT_EQ(EType::Int8, wide.SubSchemas.back().second.Type);
    EXPECT_TRUE(ResolveNamedTypes(deep, {}));
}

TEST(NamedTypes, OfRandomSchemasComeBackWhole)
{
    VRandomSchema::Limits limits;
    limits.withoutText = false; // a reference without a name stands for nothing
    for (std::uint32_t seed = 0; seed < 2000; ++seed) {
        const ISchema inner = Named("Inner", VRandomSchema(seed).MakeSchema(3, limits));
        const ISchema original = TupleOf({inner, ListOf(inner), Named("Outer", ListOf(inner))});
        ISchema schema = original;
        Dictionary dictionary;

        EXPECT_EQ(2u, Extract(schema, dictionary, false));
        EXPECT_TRUE(ResolveNamedTypes(schema, dictionary));

        EXPECT_TRUE(StrictlyEqual(original, schema)) << "seed " << seed;
    }
}
