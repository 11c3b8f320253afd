#include "StoreFixture.h"

#include <gtest/gtest.h>

namespace {

using namespace StoreTest;

using DataStore = DataStoreFixture;

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

TEST_F(DataStore, FindTokensOfAPathInItsOwnList)
{
    SetItems({"A.B", "C"});
    const VDataReader reader(store);
    std::vector<VDataToken> tokens{VDataToken(VDataPath{"A", "B"})};

    EXPECT_TRUE(reader.FindTokens(tokens[0].GetPath(), tokens));

    EXPECT_EQ((Texts{"A.B"}), PathsOf(tokens));
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

} // namespace
