#include "io/EnumMapping.h"

#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

using namespace KVR::IO;

namespace {

using Lines = std::vector<std::string>;

struct Outcome
{
    bool good = false;
    EnumMapping mapping;
    Lines errors;
};

Outcome MappingOf(const ISchema& stored, const ISchema& current)
{
    Outcome outcome;
    outcome.mapping[77] = 78; // what was in it before must not stay
    outcome.good = BuildEnumMapping(stored, current, outcome.mapping, outcome.errors);
    return outcome;
}

ISchema Enum32Of(std::initializer_list<ISchema::EnumValue> entries)
{
    return EnumOf(EType::Enum32, entries);
}

} // namespace

TEST(EnumMapping, OfAnUnchangedEnumIsEmpty)
{
    const ISchema schema = Enum32Of({{"A", 1}, {"B", -2}});

    const Outcome outcome = MappingOf(schema, schema);

    EXPECT_TRUE(outcome.good);
    EXPECT_TRUE(outcome.mapping.empty());
    EXPECT_TRUE(outcome.errors.empty());
}

TEST(EnumMapping, OfAnEnumThatGainedANameIsEmpty)
{
    const Outcome outcome = MappingOf(Enum32Of({{"A", 1}}), Enum32Of({{"A", 1}, {"B", 2}}));

    EXPECT_TRUE(outcome.good);
    EXPECT_TRUE(outcome.mapping.empty());
}

TEST(EnumMapping, FollowsTheNamesOfRenumberedEntries)
{
    const Outcome outcome =
        MappingOf(Enum32Of({{"A", 1}, {"B", 5}}), Enum32Of({{"B", 5}, {"A", 2}}));

    EXPECT_TRUE(outcome.good);
    // With one number moved, those that stayed are in the mapping too.
    EXPECT_EQ((EnumMapping{{1, 2}, {5, 5}}), outcome.mapping);
}

TEST(EnumMapping, MatchesAStoredLegacyNameWithTheCleanOne)
{
    const Outcome outcome = MappingOf(Enum32Of({{"LEGACY_A", 1}}), Enum32Of({{"A", 2}}));

    EXPECT_TRUE(outcome.good);
    EXPECT_EQ((EnumMapping{{1, 2}}), outcome.mapping);
}

TEST(EnumMapping, MatchesACurrentLegacyNameWithTheCleanOne)
{
    const Outcome outcome = MappingOf(Enum32Of({{"A", 1}}), Enum32Of({{"LEGACY_A", 2}}));

    EXPECT_TRUE(outcome.good);
    EXPECT_EQ((EnumMapping{{1, 2}}), outcome.mapping);
}

TEST(EnumMapping, TakesTheLegacyPrefixAwayOnce)
{
    const Outcome twice = MappingOf(Enum32Of({{"LEGACY_LEGACY_A", 1}}), Enum32Of({{"A", 2}}));
    const Outcome both =
        MappingOf(Enum32Of({{"LEGACY_LEGACY_A", 1}}), Enum32Of({{"LEGACY_LEGACY_A", 2}}));

    EXPECT_EQ((Lines{"Enum value LEGACY_A could not be mapped"}), twice.errors);
    EXPECT_EQ((EnumMapping{{1, 2}}), both.mapping);
}

TEST(EnumMapping, KeepsTheLegacyWordInsideAName)
{
    const Outcome outcome = MappingOf(Enum32Of({{"NOLEGACY_A", 1}}), Enum32Of({{"NOA", 1}}));

    EXPECT_EQ((Lines{"Enum value NOLEGACY_A could not be mapped"}), outcome.errors);
}

TEST(EnumMapping, TakesTheFirstCurrentEntryOfTwoCleanNames)
{
    const Outcome outcome = MappingOf(Enum32Of({{"A", 1}}), Enum32Of({{"LEGACY_A", 2}, {"A", 3}}));

    EXPECT_EQ((EnumMapping{{1, 2}}), outcome.mapping);
}

TEST(EnumMapping, TriesTheNamesOfOneNumberInStoredOrder)
{
    const ISchema stored = Enum32Of({{"Gone", 1}, {"Second", 1}, {"First", 1}});

    const Outcome outcome = MappingOf(stored, Enum32Of({{"First", 8}, {"Second", 9}}));

    EXPECT_TRUE(outcome.good);
    EXPECT_EQ((EnumMapping{{1, 9}}), outcome.mapping);
}

TEST(EnumMapping, NamesEveryNameOfALostNumberInAscendingOrderOfNumbers)
{
    const ISchema stored = Enum32Of({{"Z", 9}, {"LEGACY_Y", 2}, {"X", 2}, {"Kept", 3}});

    const Outcome outcome = MappingOf(stored, Enum32Of({{"Kept", 4}}));

    EXPECT_FALSE(outcome.good);
    EXPECT_EQ((Lines{"Enum value Y could not be mapped", "Enum value X could not be mapped",
                     "Enum value Z could not be mapped"}),
              outcome.errors);
}

TEST(EnumMapping, RefusesANumberAboveTheCurrentStorageEvenOfAKnownName)
{
    const ISchema stored = EnumOf(EType::Enum32, {{"LEGACY_A", 300}, {"B", 300}});

    const Outcome outcome = MappingOf(stored, EnumOf(EType::Enum8, {{"A", 1}, {"B", 2}}));

    EXPECT_FALSE(outcome.good);
    EXPECT_EQ((Lines{"Enum value A too large for enum storage type",
                     "Enum value B too large for enum storage type"}),
              outcome.errors);
}

TEST(EnumMapping, TellsOfStorageBeforeItTellsOfNames)
{
    const ISchema stored = EnumOf(EType::Enum32, {{"Gone", 1}, {"Great", 256}});

    const Outcome outcome = MappingOf(stored, EnumOf(EType::Enum8, {{"Great", 1}}));

    EXPECT_EQ((Lines{"Enum value Great too large for enum storage type",
                     "Enum value Gone could not be mapped"}),
              outcome.errors);
}

namespace {

struct VStorageCase
{
    std::int32_t number;
    EType current;
    bool good;
};

} // namespace

TEST(EnumMapping, ComparesNumbersWithUnsignedLimitsAndLetsNegativeOnesPass)
{
    const VStorageCase cases[] = {
        {255, EType::Enum8, true},         {256, EType::Enum8, false},
        {65536, EType::Enum8, false},      {256, EType::Enum16, true},
        {65535, EType::Enum16, true},      {65536, EType::Enum16, false},
        {65536, EType::Enum32, true},      {0x7FFFFFFF, EType::Enum32, true},
        {-2000000000, EType::Enum8, true}, {-1, EType::Enum16, true},
    };
    for (const VStorageCase& one : cases) {
        const Outcome outcome =
            MappingOf(EnumOf(EType::Enum32, {{"A", one.number}}), EnumOf(one.current, {{"A", 1}}));

        EXPECT_EQ(one.good, outcome.good) << one.number;
        EXPECT_EQ(one.good ? 0u : 1u, outcome.errors.size()) << one.number;
    }
}

TEST(EnumMapping, LooksAtTheCurrentStorageNotAtTheStoredOne)
{
    const Outcome outcome =
        MappingOf(EnumOf(EType::Enum8, {{"A", 300}}), EnumOf(EType::Enum32, {{"A", 300}}));

    EXPECT_TRUE(outcome.good);
}

TEST(EnumMapping, IsGoodWhenItAddedNoLineWhateverTheVectorHeld)
{
    EnumMapping mapping;
    Lines errors{"of another enum"};

    EXPECT_TRUE(BuildEnumMapping(Enum32Of({{"A", 1}}), Enum32Of({{"A", 2}}), mapping, errors));
    EXPECT_EQ((Lines{"of another enum"}), errors);
    EXPECT_FALSE(BuildEnumMapping(Enum32Of({{"A", 1}}), Enum32Of({}), mapping, errors));
    EXPECT_EQ((Lines{"of another enum", "Enum value A could not be mapped"}), errors);
}

TEST(EnumMapping, OfNoEntriesIsEmptyAndGood)
{
    const Outcome outcome = MappingOf(Enum32Of({}), Enum32Of({{"A", 1}}));

    EXPECT_TRUE(outcome.good);
    EXPECT_TRUE(outcome.mapping.empty());
}
