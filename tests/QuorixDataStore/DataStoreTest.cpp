#include "QuorixDataStore/DataStore.h"

#include "QuorixDataStore/DataStoreHub.h"
#include "StoreFixture.h"
#include "notification/MakeShared.h"

#include <gtest/gtest.h>

namespace {

using namespace StoreTest;

using DataStore = DataStoreFixture;

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
