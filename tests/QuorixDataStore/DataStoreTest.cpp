#include "QuorixDataStore/DataStore.h"

#include "QuorixDataStore/DataStoreHub.h"
#include "StoreFixture.h"
#include "WorkerThread.h"
#include "notification/MakeShared.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

namespace {

using namespace StoreTest;

using DataStore = DataStoreFixture;

constexpr std::uint32_t verifyRequired = EDataValueFlags::VerifyRequired;

/// Returns the schema type that the store tells for an item, Void where it tells none.
KVR::IO::EType SchemaTypeOf(const IDataReader& reader, const char* path)
{
    const KVR::IO::ISchema* schema = nullptr;
    const bool found = reader.GetSchema(Token(path), schema);
    EXPECT_EQ(found, schema != nullptr);
    return found ? schema->Type : KVR::IO::EType::Void;
}

TEST_F(DataStore, StartsEmptyAtChangeIdZero)
{
    const VDataReader reader(store);

    EXPECT_EQ(0u, reader.GetCurrentChangeId());
    EXPECT_EQ(Texts{}, Find(reader, "*"));
    EXPECT_EQ(0u, reader.GetChildCount(VDataPath()));
}

TEST_F(DataStore, SeveralStoresFrontOneHub)
{
    const auto hub = KVR::MakeShared<VDataStoreHub>();
    VDataStore first(hub);
    const VDataStore second(hub);
    {
        VDataWriter writer(first);
        writer.SetValue(Token("A"), Byte(1));
    }

    EXPECT_EQ(1, Current(VDataReader(second), "A"));
}

TEST_F(DataStore, TokenIsResolvedOnceAndFollowsItsItem)
{
    Set("A.B", Byte(1));
    const VDataToken token(VDataPath("A.B"));
    const VDataReader reader(store);

    EXPECT_TRUE(reader.HasValue(token));

    EXPECT_NE(0u, token.GetNumbers().StoreIdentifier);
    EXPECT_EQ(1u, token.GetNumbers().ItemIdentifier);
    std::vector<VDataToken> found;
    EXPECT_TRUE(reader.FindTokens(VDataPath("A.B"), found));
    EXPECT_EQ(token.GetNumbers().StoreIdentifier, found[0].GetNumbers().StoreIdentifier);
    EXPECT_EQ(1u, found[0].GetNumbers().ItemIdentifier);
}

TEST_F(DataStore, TokenOfAnotherStoreFallsBackToItsPath)
{
    Set("A", Byte(1));
    VDataStore other;
    {
        VDataWriter writer(other);
        writer.SetValue(Token("X"), Byte(8));
        writer.SetValue(Token("A"), Byte(9));
    }
    const VDataToken token(VDataPath("A"));

    EXPECT_EQ(Byte(1), VDataReader(store).GetValue(token));
    const std::uint64_t here = token.GetNumbers().StoreIdentifier;
    EXPECT_EQ(Byte(9), VDataReader(other).GetValue(token));
    EXPECT_NE(here, token.GetNumbers().StoreIdentifier);
    EXPECT_EQ(Byte(1), VDataReader(store).GetValue(token));
}

TEST_F(DataStore, TokenThatFindsNothingLosesItsNumbers)
{
    Set("A", Byte(1));
    const VDataToken token(VDataPath("A"));
    EXPECT_TRUE(VDataReader(store).HasValue(token));
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.Remove(token));
    }

    EXPECT_FALSE(VDataReader(store).HasValue(token));

    EXPECT_EQ(0u, token.GetNumbers().StoreIdentifier);
    EXPECT_EQ(0u, token.GetNumbers().ItemIdentifier);
}

TEST_F(DataStore, TokenFindsTheNewItemOfARemovedOnesPath)
{
    Set("A", Byte(1));
    const VDataToken token(VDataPath("A"));
    EXPECT_TRUE(VDataReader(store).HasValue(token));
    {
        VDataWriter writer(store);
        writer.Remove(token);
    }
    Set("A", Byte(2));

    EXPECT_EQ(Byte(2), VDataReader(store).GetValue(token));

    EXPECT_EQ(2u, token.GetNumbers().ItemIdentifier); // identifiers are never used again
}

TEST_F(DataStore, NumbersOfATokenAreNotComparedWithItsPathIsKept)
{
    SetItems({"A", "B"});
    Set("B", Byte(2));
    const VDataToken b(VDataPath("B"));
    EXPECT_TRUE(VDataReader(store).HasValue(b));

    const VDataToken misnamed(VDataPath("A"), b.GetNumbers().StoreIdentifier,
                              b.GetNumbers().ItemIdentifier);

    EXPECT_EQ(Byte(2), VDataReader(store).GetValue(misnamed));
}

TEST_F(DataStore, WriteByAMisnamedTokenGoesToItsNumbersAndPendsUnderItsPath)
{
    SetItems({"A", "B"});
    const VDataToken b(VDataPath("B"));
    EXPECT_TRUE(VDataReader(store).HasValue(b));
    const VDataToken misnamed(VDataPath("A"), b.GetNumbers().StoreIdentifier,
                              b.GetNumbers().ItemIdentifier);
    Listen("A");
    Listen("B");
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetValue(misnamed, Byte(7)));
        EXPECT_EQ(1, Current(writer, "B"));
        EXPECT_EQ(7, Current(writer, "A"));
    }

    EXPECT_EQ(1, Current(VDataReader(store), "A"));
    EXPECT_EQ(7, Current(VDataReader(store), "B"));
    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
}

TEST_F(DataStore, MisnamedTokensPathMayBeNewToTheStore)
{
    SetItems({"B"});
    const VDataToken b(VDataPath("B"));
    EXPECT_TRUE(VDataReader(store).HasValue(b));
    {
        VDataWriter writer(store);
        const VDataToken misnamed(VDataPath("A.New"), b.GetNumbers().StoreIdentifier,
                                  b.GetNumbers().ItemIdentifier);
        EXPECT_TRUE(writer.SetValue(misnamed, Byte(7)));
        EXPECT_TRUE(writer.Remove(b));
        EXPECT_EQ(Texts{}, Find(writer, "*")) << "its record is of no new item";
    }

    // Records are folded in the order of paths: the value came before its item was removed.
    EXPECT_EQ(Texts{}, Find(VDataReader(store), "*"));
}

TEST_F(DataStore, EmptyTokenFindsAndWritesNothing)
{
    VDataWriter writer(store);
    std::uint32_t flags = 5;
    const KVR::IO::ISchema* schema = nullptr;
    for (const VDataToken& token : {VDataToken(), Token("A.*")}) {
        EXPECT_FALSE(writer.HasValue(token));
        EXPECT_TRUE(writer.GetValue(token).Empty());
        EXPECT_FALSE(writer.GetSchema(token, schema));
        EXPECT_FALSE(writer.GetFlags(token, flags));
        EXPECT_EQ(0u, writer.GetItemChangeId(token));
        EXPECT_FALSE(writer.SetValue(token, Byte(1)));
        EXPECT_FALSE(writer.SetFlags(token, 1));
        EXPECT_FALSE(writer.Remove(token));
    }
    EXPECT_EQ(0u, writer.GetCurrentChangeId()) << "nothing may be pending";
}

TEST_F(DataStore, FindTokensByNamesAndWildcards)
{
    SetItems({"A", "A.B", "A.B.C", "A.X.C", "A.Y.D", "B.Y.C", "C"});
    const VDataReader reader(store);

    EXPECT_EQ((Texts{"A"}), Find(reader, "A"));
    EXPECT_EQ((Texts{}), Find(reader, "A.Z"));
    EXPECT_EQ((Texts{}), Find(reader, "A.X"));
    EXPECT_EQ((Texts{"A.B.C", "A.X.C"}), Find(reader, "A.*.C"));
    EXPECT_EQ((Texts{"A.B", "A.B.C", "A.X.C", "A.Y.D"}), Find(reader, "A.*"));
    EXPECT_EQ((Texts{"A", "A.B", "A.B.C", "A.X.C", "A.Y.D", "B.Y.C", "C"}), Find(reader, "*"));
    EXPECT_EQ((Texts{"A.Y.D", "B.Y.C"}), Find(reader, "*.Y.*"));
    EXPECT_EQ((Texts{"A.B", "A.B.C", "A.X.C", "A.Y.D", "B.Y.C"}), Find(reader, "*.*"));
    EXPECT_EQ((Texts{"A.B.C", "A.X.C", "A.Y.D", "B.Y.C"}), Find(reader, "*.*.*"));
    EXPECT_EQ((Texts{}), Find(reader, "C.*"));
    EXPECT_EQ((Texts{}), Find(reader, ""));
}

TEST_F(DataStore, FindTokensListsPendingAfterCommittedItems)
{
    SetItems({"A.B", "A.D"});
    VDataWriter writer(store);
    writer.SetValue(Token("A.C"), Byte(1));
    writer.SetValue(Token("A.A.X"), Byte(1));
    writer.SetValue(Token("B.E"), Byte(1));
    writer.SetFlags(Token("A.F"), 1); // no value: not listed
    writer.SetValue(Token("A.B"), Byte(2));

    EXPECT_EQ((Texts{"A.B", "A.D", "A.A.X", "A.C"}), Find(writer, "A.*"));
    EXPECT_EQ((Texts{"A.A.X"}), Find(writer, "A.*.X"));
    EXPECT_EQ((Texts{"A.C"}), Find(writer, "A.C"));
    EXPECT_EQ((Texts{"A.B", "A.D", "A.A.X", "A.C", "B.E"}), Find(writer, "*"));
    EXPECT_EQ((Texts{}), Find(writer, ""));

    writer.Remove(Token("A.B"));
    writer.Remove(Token("A.C"));
    EXPECT_EQ((Texts{"A.D", "A.A.X"}), Find(writer, "A.*"));
}

TEST_F(DataStore, TokensOfPendingItemsHaveNoNumbers)
{
    VDataWriter writer(store);
    writer.SetValue(Token("A"), Byte(1));
    std::vector<VDataToken> tokens;

    EXPECT_TRUE(writer.FindTokens(VDataPath("A"), tokens));

    EXPECT_EQ(0u, tokens[0].GetNumbers().StoreIdentifier);
    EXPECT_EQ(0u, tokens[0].GetNumbers().ItemIdentifier);
}

TEST_F(DataStore, RecordOfACommittedItemIsNotListedTwiceWhateverItsToken)
{
    Set("A", Byte(1));
    VDataWriter writer(store);

    writer.SetValue(Token("A"), Byte(2)); // a token that was never resolved before

    EXPECT_EQ((Texts{"A"}), Find(writer, "*"));
}

TEST_F(DataStore, ChildCountHasTwoMeaningsIsKept)
{
    SetItems({"A.B.C", "A.B.D", "Other"});
    EXPECT_EQ(1u, VDataReader(store).GetChildCount(VDataPath("A")));
    EXPECT_EQ(2u, VDataReader(store).GetChildCount(VDataPath()));

    VDataWriter writer(store);
    EXPECT_EQ(1u, writer.GetChildCount(VDataPath("A")));
    writer.SetValue(Token("Other"), Byte(2)); // any change, anywhere

    EXPECT_EQ(2u, writer.GetChildCount(VDataPath("A")));
    EXPECT_EQ(3u, writer.GetChildCount(VDataPath()));
}

TEST_F(DataStore, ChildCountOfAWildcardOrAMissingPathIsZero)
{
    SetItems({"A.B"});
    VDataWriter writer(store);

    for (int pass = 0; pass < 2; ++pass) {
        EXPECT_EQ(0u, writer.GetChildCount(VDataPath("*")));
        EXPECT_EQ(0u, writer.GetChildCount(VDataPath("A.*")));
        EXPECT_EQ(0u, writer.GetChildCount(VDataPath("Z")));
        EXPECT_EQ(0u, writer.GetChildCount(VDataPath("A.B")));
        writer.SetValue(Token("A.B"), Byte(2));
    }
}

TEST_F(DataStore, HasChild)
{
    SetItems({"A.B.C", "A.D"});
    VDataWriter writer(store);

    for (int pass = 0; pass < 2; ++pass) {
        EXPECT_TRUE(writer.HasChild(VDataPath(), "A"));
        EXPECT_TRUE(writer.HasChild(VDataPath("A"), "B"));
        EXPECT_TRUE(writer.HasChild(VDataPath("A"), "D"));
        EXPECT_FALSE(writer.HasChild(VDataPath("A"), "C"));
        EXPECT_FALSE(writer.HasChild(VDataPath("Z"), "A"));
        writer.SetValue(Token("Pending"), Byte(2));
    }
    writer.SetValue(Token("A.E.F"), Byte(1));
    EXPECT_TRUE(writer.HasChild(VDataPath("A"), "E"));
    writer.Remove(Token("A.D"));
    EXPECT_FALSE(writer.HasChild(VDataPath("A"), "D"));
}

TEST_F(DataStore, HasChildOfAWildcardNeedsPendingChanges)
{
    SetItems({"A.B"});
    VDataWriter writer(store);
    EXPECT_FALSE(writer.HasChild(VDataPath("*"), "B"));

    writer.SetValue(Token("Pending"), Byte(2));

    EXPECT_TRUE(writer.HasChild(VDataPath("*"), "B"));
    EXPECT_FALSE(writer.HasChild(VDataPath("*"), "A"));
}

TEST_F(DataStore, GetChildrenAreUniqueAndInOrder)
{
    SetItems({"A.C.X", "A.C.Y", "A.B", "A.a", "Z"});
    VDataWriter writer(store);

    for (int pass = 0; pass < 2; ++pass) {
        EXPECT_EQ((Texts{"B", "C", "a"}), Children(writer, "A"));
        EXPECT_EQ((Texts{}), Children(writer, "A.*"));
        EXPECT_EQ((Texts{}), Children(writer, "Nowhere"));
        writer.SetValue(Token("Z"), Byte(2));
    }
    writer.SetValue(Token("A.BB.X"), Byte(1));
    writer.Remove(Token("A.B"));
    writer.Remove(Token("A.C.X"));
    EXPECT_EQ((Texts{"BB", "C", "a"}), Children(writer, "A"));
    EXPECT_EQ((Texts{"A", "Z"}), Children(writer, ""));
}

TEST_F(DataStore, ValueIsReadBackByTheWriterAndLaterByAll)
{
    {
        VDataWriter writer(store);
        EXPECT_EQ(-1, Current(writer, "A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(5)));
        EXPECT_EQ(5, Current(writer, "A"));
        EXPECT_TRUE(writer.HasValue(Token("A")));
    }
    EXPECT_EQ(5, Current(VDataReader(store), "A"));
    EXPECT_EQ(Byte(5), VDataReader(store).GetValue(Token("A")));
}

TEST_F(DataStore, GetValueOfNothingEmptiesTheBytesAndKeepsTheSchema)
{
    const VDataReader reader(store);
    VDataValue value = Byte(3);

    EXPECT_FALSE(reader.GetValue(Token("A"), value));

    EXPECT_TRUE(value.Empty());
    EXPECT_EQ(Byte(3).Schema, value.Schema);
}

TEST_F(DataStore, EmptyValueIsRefused)
{
    VDataWriter writer(store);

    EXPECT_FALSE(writer.SetValue(Token("A"), VDataValue()));
    EXPECT_FALSE(writer.SetValue(Token("A"), {Byte(1).Schema, {}}));

    EXPECT_EQ(0u, writer.GetCurrentChangeId());
}

TEST_F(DataStore, NullSchemaCountsAsVoid)
{
    const KVR::IO::ISchema* nothing = &KVR::IO::GetUniquePodSchema(KVR::IO::EType::Void);
    Set("A", {nullptr, {1}});
    VDataWriter writer(store);

    EXPECT_EQ(nothing, writer.GetValue(Token("A")).Schema);
    EXPECT_TRUE(writer.SetValue(Token("A"), {nothing, {1}}));
    EXPECT_EQ(1u, writer.GetCurrentChangeId()) << "an equal value records nothing";
    EXPECT_TRUE(writer.SetValue(Token("A"), {nothing, {2}}));
    EXPECT_FALSE(writer.SetValue(Token("A"), Byte(2)));
}

TEST_F(DataStore, SecondSchemaIsRefusedInSilence)
{
    Set("A", Byte(1));
    const TestSupport::VLogCapture log;
    VDataWriter writer(store);

    EXPECT_FALSE(writer.SetValue(Token("A"), Word(1)));

    EXPECT_EQ(1u, writer.GetCurrentChangeId());
    EXPECT_EQ(1, Current(writer, "A"));
    EXPECT_TRUE(log.Messages().empty());
}

TEST_F(DataStore, SecondSchemaIsRefusedAgainstThePendingOneToo)
{
    VDataWriter writer(store);
    EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));

    EXPECT_FALSE(writer.SetValue(Token("A"), Word(1)));

    EXPECT_EQ(Byte(1), writer.GetValue(Token("A")));
}

TEST_F(DataStore, CommittedSchemaHoldsAlsoForARemovedItem)
{
    Set("A", Byte(1));
    VDataWriter writer(store);
    writer.Remove(Token("A"));

    EXPECT_FALSE(writer.SetValue(Token("A"), Word(1)));
    EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
}

TEST_F(DataStore, ProposedSchemaIsHeldAgainstFirst)
{
    SetVerifiable("A", 1, 2);
    VDataVerifyWriter writer(store);

    EXPECT_FALSE(writer.SetVerifiedValue(Token("A"), Word(1)));
    EXPECT_FALSE(writer.SetProposedValue(Token("A"), Word(1)));
}

TEST_F(DataStore, SchemaThatDiffersInItsTypeNameOnlyIsAccepted)
{
    KVR::IO::ISchema named = *Byte(0).Schema;
    named.TypeName = "Percentage";
    const VDataValue value{&KVR::IO::GetUniqueSchema(named), {9}};
    Set("A", Byte(1));
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetValue(Token("A"), value));
    }

    EXPECT_EQ(value, VDataReader(store).GetValue(Token("A")));
}

TEST_F(DataStore, SchemaThatDiffersInTheNameOfAFunctionIsRefused)
{
    KVR::IO::ISchema first;
    first.Role = KVR::IO::ERole::Function;
    first.TypeName = "First";
    KVR::IO::ISchema second = first;
    second.TypeName = "Second";
    Set("A", {&KVR::IO::GetUniqueSchema(first), {1}});
    VDataWriter writer(store);

    EXPECT_FALSE(writer.SetValue(Token("A"), {&KVR::IO::GetUniqueSchema(second), {2}}));
}

TEST_F(DataStore, SameBytesUnderAnotherTypeNameAreAChange)
{
    KVR::IO::ISchema named = *Byte(0).Schema;
    named.TypeName = "Percentage";
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetValue(Token("A"), {&KVR::IO::GetUniqueSchema(named), {1}}));
    }

    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
}

TEST_F(DataStore, WriteOfTheVisibleValueRecordsNothing)
{
    Set("A", Byte(1));
    VDataWriter writer(store);

    EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));

    EXPECT_EQ(1u, writer.GetCurrentChangeId());
}

TEST_F(DataStore, GetSchemaPrefersTheCommittedOne)
{
    KVR::IO::ISchema named = *Byte(0).Schema;
    named.TypeName = "Percentage";
    Set("A", Byte(1));
    VDataWriter writer(store);
    EXPECT_TRUE(writer.SetValue(Token("A"), {&KVR::IO::GetUniqueSchema(named), {2}}));
    writer.SetValue(Token("B"), Word(1));
    writer.SetFlags(Token("C"), 1);

    const KVR::IO::ISchema* schema = nullptr;
    EXPECT_TRUE(writer.GetSchema(Token("A"), schema));
    EXPECT_EQ(Byte(0).Schema, schema);
    EXPECT_EQ(KVR::IO::EType::UInt16, SchemaTypeOf(writer, "B"));
    EXPECT_EQ(KVR::IO::EType::Void, SchemaTypeOf(writer, "C"));
    EXPECT_EQ(KVR::IO::EType::Void, SchemaTypeOf(writer, "Nowhere"));
}

TEST_F(DataStore, GetSchemaPrefersTheProposedOne)
{
    KVR::IO::ISchema named = *Byte(0).Schema;
    named.TypeName = "Percentage";
    const VDataValue proposed{&KVR::IO::GetUniqueSchema(named), {1}};
    const auto schemaOf = [](const IDataReader& reader) {
        const KVR::IO::ISchema* schema = nullptr;
        EXPECT_TRUE(reader.GetSchema(Token("A"), schema));
        return schema;
    };
    {
        VDataVerifyWriter writer(store);
        writer.SetFlags(Token("A"), verifyRequired);
        writer.SetVerifiedValue(Token("A"), Byte(1));
        EXPECT_EQ(Byte(1).Schema, schemaOf(writer));
        writer.SetProposedValue(Token("A"), proposed);
        EXPECT_EQ(proposed.Schema, schemaOf(writer));
    }

    EXPECT_EQ(proposed.Schema, schemaOf(VDataReader(store)));
}

TEST_F(DataStore, RemovedItemStillTellsItsSchemaIsKept)
{
    Set("A", Byte(1));
    VDataWriter writer(store);

    EXPECT_TRUE(writer.Remove(Token("A")));

    EXPECT_EQ(KVR::IO::EType::UInt8, SchemaTypeOf(writer, "A"));
}

TEST_F(DataStore, RemovedItemIsGoneForItsWriterAtOnce)
{
    Set("A", Byte(1));
    VDataWriter writer(store);

    EXPECT_TRUE(writer.Remove(Token("A")));

    EXPECT_FALSE(writer.HasValue(Token("A")));
    EXPECT_EQ(-1, Current(writer, "A"));
    EXPECT_EQ(-1, Flags(writer, "A"));
    EXPECT_EQ(0u, writer.GetItemChangeId(Token("A")));
    EXPECT_FALSE(writer.Remove(Token("A")));
}

TEST_F(DataStore, RemovingWhatDoesNotExistFails)
{
    VDataWriter writer(store);

    EXPECT_FALSE(writer.Remove(Token("A")));

    EXPECT_EQ(0u, writer.GetCurrentChangeId());
}

TEST_F(DataStore, RemovalPrunesTheNodesThatAreLeftEmpty)
{
    SetItems({"A.B.C.D", "A.X"});
    {
        VDataWriter writer(store);
        writer.Remove(Token("A.B.C.D"));
    }
    EXPECT_EQ((Texts{"X"}), Children(VDataReader(store), "A"));
    {
        VDataWriter writer(store);
        writer.Remove(Token("A.X"));
    }
    EXPECT_EQ((Texts{}), Children(VDataReader(store), ""));
}

TEST_F(DataStore, RemovalKeepsNodesWithChildrenOrItems)
{
    SetItems({"A", "A.B", "A.B.C"});
    {
        VDataWriter writer(store);
        writer.Remove(Token("A.B"));
    }
    EXPECT_EQ((Texts{"A", "A.B.C"}), Find(VDataReader(store), "*"));
    {
        VDataWriter writer(store);
        writer.Remove(Token("A.B.C"));
    }
    EXPECT_EQ((Texts{"A"}), Find(VDataReader(store), "*"));
    EXPECT_EQ(0u, VDataReader(store).GetChildCount(VDataPath("A")));
}

TEST_F(DataStore, RemoveThenSetLeavesALiveEntry)
{
    Set("A", Byte(1));
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.Remove(Token("A")));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_TRUE(writer.HasValue(Token("A")));
        EXPECT_EQ(2, Current(writer, "A"));
    }
    EXPECT_EQ(2, Current(VDataReader(store), "A"));
}

TEST_F(DataStore, RemoveThenSetTheSameValueOfAPlainRemovalIsAChange)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.Remove(Token("A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));
    }
    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
}

TEST_F(DataStore, RemoveAllTakesWhatThePathNames)
{
    SetItems({"A.B", "A.C.D", "B"});
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.RemoveAll(VDataPath("A.*")));
        EXPECT_TRUE(writer.RemoveAll(VDataPath("Nowhere.*"))) << "none is no failure";
        EXPECT_TRUE(writer.RemoveAllRestorable(VDataPath("")));
    }
    EXPECT_EQ((Texts{"B"}), Find(VDataReader(store), "*"));
}

TEST_F(DataStore, SetValuesWritesEveryItemOfThePath)
{
    SetItems({"A.B", "A.C", "B"});
    Set("A.W", Word(1));
    std::uint64_t changeId = 0;
    ASSERT_TRUE(store.AcquireWriteLock(changeId));

    EXPECT_FALSE(store.SetValues(VDataPath("A.*"), Byte(7), EDataValueTarget::Current))
        << "one has another schema";
    EXPECT_TRUE(store.SetValues(VDataPath("B"), Byte(8), EDataValueTarget::Current));
    EXPECT_TRUE(store.SetValues(VDataPath("Nowhere"), Byte(8), EDataValueTarget::Current));
    EXPECT_TRUE(store.SetValues(VDataPath(), Byte(8), EDataValueTarget::Current));
    store.ReleaseWriteLock();

    const VDataReader reader(store);
    EXPECT_EQ(7, Current(reader, "A.B"));
    EXPECT_EQ(7, Current(reader, "A.C"));
    EXPECT_EQ(8, Current(reader, "B"));
    EXPECT_EQ(Word(1), reader.GetValue(Token("A.W")));
}

TEST_F(DataStore, FlagsOfANewItemMakeItWithoutAValue)
{
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetFlags(Token("A"), 5));
        EXPECT_EQ(5, Flags(writer, "A"));
        EXPECT_FALSE(writer.HasValue(Token("A")));
        EXPECT_EQ((Texts{}), Find(writer, "*"));
    }
    const VDataReader reader(store);
    EXPECT_EQ(5, Flags(reader, "A"));
    EXPECT_FALSE(reader.HasValue(Token("A")));
    EXPECT_EQ((Texts{"A"}), Find(reader, "*"));
    EXPECT_EQ(-1, Current(reader, "A"));
}

TEST_F(DataStore, ZeroFlagsMakeAnItemToo)
{
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetFlags(Token("A"), 0));
    }
    EXPECT_EQ(0, Flags(VDataReader(store), "A"));
}

TEST_F(DataStore, FlagsOfAPendingItemWithoutFlagsAreNoneYet)
{
    VDataWriter writer(store);
    writer.SetValue(Token("A"), Byte(1));

    EXPECT_EQ(-1, Flags(writer, "A"));
    EXPECT_TRUE(writer.SetFlags(Token("A"), 0));
    EXPECT_EQ(0, Flags(writer, "A"));
}

TEST_F(DataStore, EqualFlagsRecordNothing)
{
    Set("A", Byte(1));
    VDataWriter writer(store);

    EXPECT_TRUE(writer.SetFlags(Token("A"), 0));
    EXPECT_EQ(1u, writer.GetCurrentChangeId());

    EXPECT_TRUE(writer.SetFlags(Token("A"), 1));
    EXPECT_EQ(2u, writer.GetCurrentChangeId());
    EXPECT_TRUE(writer.SetFlags(Token("A"), 0)) << "back again is a change: not restorable";
    EXPECT_EQ(2u, writer.GetCurrentChangeId());
}

TEST_F(DataStore, FlagsOnlyRecordHidesTheValueFromHasValueIsKept)
{
    Set("A", Byte(1));
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetFlags(Token("A"), 1));

        EXPECT_FALSE(writer.HasValue(Token("A")));
        EXPECT_EQ(1, Current(writer, "A"));
    }
    EXPECT_TRUE(VDataReader(store).HasValue(Token("A")));
}

TEST_F(DataStore, SettingVerifyRequiredMovesTheValueAndClearingBringsItBack)
{
    Set("A", Byte(4));
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetFlags(Token("A"), verifyRequired));
    }
    {
        const VDataVerifyReader reader(store);
        EXPECT_EQ(4, Proposed(reader, "A"));
        EXPECT_EQ(-1, Verified(reader, "A"));
        EXPECT_EQ(4, Current(reader, "A"));
    }
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetFlags(Token("A"), 0));
    }
    const TestSupport::VLogCapture log;
    const VDataVerifyReader reader(store);
    EXPECT_EQ(4, Verified(reader, "A"));
    EXPECT_EQ(4, Proposed(reader, "A")) << "reads verified, with a warning";
    EXPECT_EQ(1u, log.Messages().size());
}

TEST_F(DataStore, PendingFlagsDecideWhereAWriteLands)
{
    Set("A", Byte(4));
    {
        VDataWriter writer(store);
        writer.SetFlags(Token("A"), verifyRequired);
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(5)));
        EXPECT_EQ(5, Current(writer, "A"));
    }
    const VDataVerifyReader reader(store);
    EXPECT_EQ(5, Proposed(reader, "A"));
    EXPECT_EQ(-1, Verified(reader, "A")) << "moved to proposed by the flags, then replaced";
}

TEST_F(DataStore, PendingFlagsMoveThePendingValue)
{
    {
        VDataWriter writer(store);
        writer.SetValue(Token("A"), Byte(5));
        EXPECT_TRUE(writer.SetFlags(Token("A"), verifyRequired));
        EXPECT_EQ(5, Current(writer, "A"));
    }
    const VDataVerifyReader reader(store);
    EXPECT_EQ(5, Proposed(reader, "A"));
    EXPECT_EQ(-1, Verified(reader, "A"));
}

TEST_F(DataStore, TwoTruthsOfAnItem)
{
    SetVerifiable("A", 7, 3);

    const VDataVerifyReader reader(store);
    EXPECT_EQ(7, Current(reader, "A"));
    EXPECT_EQ(7, Proposed(reader, "A"));
    EXPECT_EQ(3, Verified(reader, "A"));
    EXPECT_EQ(2, Flags(reader, "A"));
}

TEST_F(DataStore, UnknownTargetOfAVerifiableItemReadsNothing)
{
    SetVerifiable("A", 7, 3);
    const TestSupport::VLogCapture log;
    const VDataReader reader(store);
    VDataValue value;

    EXPECT_FALSE(store.GetValue(Token("A"), value, unknownTarget));

    EXPECT_EQ((Texts{"Unknown value target while trying to read value 'A'."}),
              log.Texts("DataStore"));
}

TEST_F(DataStore, UnknownTargetOfAVerifiableItemWritesNothing)
{
    SetVerifiable("A", 7, 3);
    const TestSupport::VLogCapture log;
    VDataVerifyWriter writer(store);

    EXPECT_FALSE(store.SetValue(Token("A"), Byte(9), unknownTarget));

    EXPECT_EQ(1u, writer.GetCurrentChangeId()) << "nothing may be pending";
    EXPECT_EQ((Texts{"Unknown value target while trying to read value 'A'.",
                     "Unknown value target while trying to set value 'A'."}),
              log.Texts("DataStore"));
}

TEST_F(DataStore, UnknownTargetLeavesAnEarlierRecordAlone)
{
    SetVerifiable("A", 7, 3);
    VDataVerifyWriter writer(store);
    writer.RemoveAllRestorable(VDataPath("A"));
    const TestSupport::VLogCapture log;

    EXPECT_FALSE(store.SetValue(Token("A"), Byte(9), unknownTarget));

    EXPECT_EQ(-1, Current(writer, "A")) << "still removed";
    EXPECT_EQ((Texts{"Unknown value target while trying to set value 'A'.",
                     "Unknown value target while trying to unset value 'A'."}),
              log.Texts("DataStore"));
}

TEST_F(DataStore, UnknownTargetOfAPlainItemMeansVerified)
{
    const TestSupport::VLogCapture log;
    VDataVerifyWriter writer(store);

    EXPECT_TRUE(store.SetValue(Token("A"), Byte(9), unknownTarget));

    EXPECT_EQ(9, Verified(writer, "A"));
    EXPECT_TRUE(log.Messages().empty());
}

TEST_F(DataStore, ProposedOfAPlainItemWarnsOnceForEachLook)
{
    Set("A", Byte(1));
    const TestSupport::VLogCapture log;
    VDataVerifyWriter writer(store);

    EXPECT_TRUE(writer.SetProposedValue(Token("A"), Byte(2)));

    EXPECT_EQ((Texts{"Attempt to get Proposed value without flag EDataValueFlags::VerifyRequired "
                     "for value 'A'.",
                     "Attempt to set Proposed value without flag EDataValueFlags::VerifyRequired "
                     "for value 'A'."}),
              log.Texts("DataStore"));
    EXPECT_EQ(2, Verified(writer, "A"));
}

TEST_F(DataStore, PathChangeIds)
{
    SetItems({"A.B", "C.D"}); // change id 1
    Set("A.B", Byte(2));      // 2
    const VDataReader reader(store);

    EXPECT_EQ(2u, reader.GetPathChangeId(VDataPath("A")));
    EXPECT_EQ(2u, reader.GetPathChangeId(VDataPath("A.B")));
    EXPECT_EQ(2u, reader.GetPathChangeId(VDataPath("A.*")));
    EXPECT_EQ(1u, reader.GetPathChangeId(VDataPath("C")));
    EXPECT_EQ(2u, reader.GetPathChangeId(VDataPath()));
    EXPECT_EQ(2u, reader.GetPathChangeId(VDataPath("*")));
    EXPECT_EQ(0u, reader.GetPathChangeId(VDataPath("Nowhere")));
    EXPECT_EQ(0u, reader.GetPathChangeId(VDataPath("*.B")));
    EXPECT_EQ(0u, reader.GetPathChangeId(VDataPath("A.*.*")));
}

TEST_F(DataStore, PendingChangesCountAsTheNextChangeId)
{
    SetItems({"A.B", "C.D"});
    VDataWriter writer(store);
    EXPECT_EQ(1u, writer.GetPathChangeId(VDataPath())) << "the delta's root is no change";

    writer.SetValue(Token("A.B"), Byte(2));
    writer.SetValue(Token("A.N.M"), Byte(2));

    EXPECT_EQ(2u, writer.GetPathChangeId(VDataPath("A.B")));
    EXPECT_EQ(2u, writer.GetPathChangeId(VDataPath("A")));
    EXPECT_EQ(2u, writer.GetPathChangeId(VDataPath("A.N")));
    EXPECT_EQ(2u, writer.GetPathChangeId(VDataPath("A.N.M")));
    EXPECT_EQ(0u, writer.GetPathChangeId(VDataPath("A.N.M.O")));
    EXPECT_EQ(2u, writer.GetPathChangeId(VDataPath()));
    EXPECT_EQ(1u, writer.GetPathChangeId(VDataPath("C")));
    EXPECT_EQ(2u, writer.GetItemChangeId(Token("A.B")));
    EXPECT_EQ(2u, writer.GetItemChangeId(Token("A.N.M")));
    EXPECT_EQ(1u, writer.GetItemChangeId(Token("C.D")));
    EXPECT_EQ(0u, writer.GetItemChangeId(Token("C")));
}

TEST_F(DataStore, CancelledChangesNoLongerCountAsTheNextChangeId)
{
    SetItems({"A.B", "A.C"});
    VDataWriter writer(store);
    writer.RemoveAllRestorable(VDataPath("A.*"));
    EXPECT_EQ(2u, writer.GetPathChangeId(VDataPath("A.B")));

    writer.SetValue(Token("A.B"), Byte(1));
    EXPECT_EQ(1u, writer.GetPathChangeId(VDataPath("A.B")));
    EXPECT_EQ(2u, writer.GetPathChangeId(VDataPath("A")));

    writer.SetValue(Token("A.C"), Byte(1));
    EXPECT_EQ(1u, writer.GetPathChangeId(VDataPath("A")));
    EXPECT_EQ(1u, writer.GetCurrentChangeId());
}

TEST_F(DataStore, RemovalGivesTheChangeIdToThePathAbove)
{
    SetItems({"A.B.C", "A.D"}); // 1
    {
        VDataWriter writer(store); // 2
        writer.Remove(Token("A.B.C"));
    }
    const VDataReader reader(store);
    EXPECT_EQ(2u, reader.GetPathChangeId(VDataPath("A")));
    EXPECT_EQ(0u, reader.GetPathChangeId(VDataPath("A.B")));
    EXPECT_EQ(1u, reader.GetItemChangeId(Token("A.D")));
}

TEST_F(DataStore, FailedOperationLeavesOutParametersAsTold)
{
    const VDataReader reader(store);
    std::uint64_t changeId = 77;
    const KVR::IO::ISchema* schema = Byte(1).Schema;

    EXPECT_FALSE(store.GetPathChangeId(VDataPath("A"), changeId));
    EXPECT_FALSE(store.GetItemChangeId(Token("A"), changeId));
    EXPECT_FALSE(store.GetSchema(Token("A"), schema));

    EXPECT_EQ(77u, changeId);
    EXPECT_EQ(Byte(1).Schema, schema);
}

TEST_F(DataStore, ComponentsWithDotsAndEmptyOnesAreOrdinary)
{
    const VDataToken token(VDataPath{"Control", "10.0.0.7", ""});
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetValue(token, Byte(1)));
    }
    const VDataReader reader(store);
    EXPECT_TRUE(reader.HasValue(token));
    EXPECT_EQ((Texts{"10.0.0.7"}), Children(reader, "Control"));
    EXPECT_FALSE(reader.HasValue(Token("Control.10.0.0.7")));
}

TEST_F(DataStore, DeepAndLongPathsAreFine)
{
    VDataPath path;
    for (int depth = 0; depth < 20000; ++depth) {
        path.Append("d");
    }
    const VDataToken token(path);
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetValue(token, Byte(1)));
        EXPECT_TRUE(writer.HasValue(token));
    }
    {
        const VDataReader reader(store);
        EXPECT_TRUE(reader.HasValue(token));
        EXPECT_EQ(1u, Find(reader, "*").size());
    }
    VDataWriter writer(store);
    EXPECT_TRUE(writer.Remove(token));
}

TEST_F(DataStore, ManyItemsAreFoundByTheirTokens)
{
    std::vector<VDataToken> tokens;
    for (int device = 0; device < 40; ++device) {
        for (int item = 0; item < 50; ++item) {
            tokens.emplace_back(
                VDataPath{"Device", "qx:" + std::to_string(device), "V" + std::to_string(item)});
        }
    }
    {
        VDataWriter writer(store);
        for (std::size_t index = 0; index < tokens.size(); ++index) {
            EXPECT_TRUE(writer.SetValue(tokens[index], Byte(static_cast<unsigned char>(index))));
        }
    }
    {
        VDataWriter writer(store);
        for (std::size_t index = 0; index < tokens.size(); index += 3) {
            EXPECT_TRUE(writer.Remove(tokens[index]));
        }
    }
    const VDataReader reader(store);
    for (std::size_t index = 0; index < tokens.size(); ++index) {
        const VDataValue expected =
            index % 3 == 0 ? VDataValue() : Byte(static_cast<unsigned char>(index));
        EXPECT_EQ(expected, reader.GetValue(tokens[index])) << index;
    }
}

} // namespace
