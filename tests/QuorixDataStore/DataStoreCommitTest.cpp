#include "StoreFixture.h"

#include <gtest/gtest.h>

namespace {

using namespace StoreTest;

using DataStoreCommit = DataStoreFixture;

constexpr std::uint32_t verifyRequired = EDataValueFlags::VerifyRequired;

TEST_F(DataStoreCommit, EmptyWriteScopeAdvancesTheChangeIdAndFiresNothing)
{
    Listen("*");
    const std::uint64_t before = VDataReader(store).GetCurrentChangeId();

    VDataWriter(static_cast<IDataStore&>(store));

    EXPECT_EQ(before + 1, VDataReader(store).GetCurrentChangeId());
    EXPECT_EQ(Texts{}, Fired());
}

TEST_F(DataStoreCommit, ChangesCountOnceHoweverMany)
{
    SetItems({"A", "B", "C"});

    EXPECT_EQ(1u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreCommit, SettingThereAndBackWithoutARemovalStaysAChange)
{
    Set("A", Byte(0));
    Listen("A");
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(0)));
    }

    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
}

TEST_F(DataStoreCommit, ItemWrittenTwiceFiresOnce)
{
    Listen("A");
    {
        VDataWriter writer(store);
        writer.SetValue(Token("A"), Byte(1));
        writer.SetValue(Token("A"), Byte(2));
    }

    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
    EXPECT_EQ(2, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, RestoringAllThatWasThereFiresNothing)
{
    SetItems({"A.B", "A.C"});
    SetVerifiable("A.V", 7, 3);
    Listen("*");
    const std::uint64_t before = VDataReader(store).GetCurrentChangeId();
    {
        VDataVerifyWriter writer(store);
        EXPECT_TRUE(writer.RemoveAllRestorable(VDataPath("*")));
        EXPECT_TRUE(writer.SetValue(Token("A.B"), Byte(1)));
        EXPECT_TRUE(writer.SetValue(Token("A.C"), Byte(1)));
        EXPECT_TRUE(writer.SetFlags(Token("A.V"), verifyRequired));
        EXPECT_EQ(before, writer.GetCurrentChangeId()) << "the delta is empty again";
    }

    EXPECT_EQ(Texts{}, Fired());
    const VDataVerifyReader reader(store);
    EXPECT_EQ(before + 1, reader.GetCurrentChangeId());
    EXPECT_EQ(1, Current(reader, "A.B"));
    EXPECT_EQ(7, Proposed(reader, "A.V"));
    EXPECT_EQ(3, Verified(reader, "A.V"));
}

TEST_F(DataStoreCommit, RestoringAllButOneFiresForThatOne)
{
    SetItems({"A.B", "A.C"});
    Listen("A.B");
    Listen("A.C");
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("*"));
        EXPECT_TRUE(writer.SetValue(Token("A.B"), Byte(1)));
        EXPECT_TRUE(writer.SetValue(Token("A.C"), Byte(9)));
    }

    EXPECT_EQ((Texts{"A.C verified", "A.C any"}), Fired());
    EXPECT_EQ(9, Current(VDataReader(store), "A.C"));
}

TEST_F(DataStoreCommit, WhatIsNotRestoredIsRemoved)
{
    SetItems({"A.B", "A.C"});
    Listen("A.B");
    Listen("A.C");
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A.*"));
        writer.SetValue(Token("A.B"), Byte(1));
    }

    EXPECT_EQ((Texts{"A.C removed", "A.C any"}), Fired());
    EXPECT_EQ((Texts{"A.B"}), Find(VDataReader(store), "*"));
}

TEST_F(DataStoreCommit, SecondWriteAfterARestorableRemovalIsDroppedIsKept)
{
    Set("A", Byte(1));
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(3)));
        EXPECT_EQ(2, Current(writer, "A"));
    }

    EXPECT_EQ(2, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, SecondWriteOfTheCommittedValueStillRestores)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));
        EXPECT_EQ(1u, writer.GetPathChangeId(VDataPath("A")));
    }

    EXPECT_EQ(Texts{}, Fired());
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, RestorableStaysAfterAWriteAndEndsWithAPlainRemoval)
{
    Set("A", Byte(1));
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.Remove(Token("A")) == false) << "it is gone already";
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_TRUE(writer.Remove(Token("A")));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));
        EXPECT_EQ(2u, writer.GetCurrentChangeId()) << "no longer restorable";
    }
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, RestoringTheFlagsOfARemovedItemBringsItBackWhole)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetFlags(Token("A"), 0));
        EXPECT_EQ(1, Current(writer, "A"));
    }

    EXPECT_EQ(Texts{}, Fired());
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, OtherFlagsOfARestorableItemAreRecorded)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetFlags(Token("A"), 4));
        EXPECT_EQ(4, Flags(writer, "A"));
    }

    EXPECT_EQ((Texts{"A flags", "A any"}), Fired());
    EXPECT_EQ(4, Flags(VDataReader(store), "A"));
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, RestoringFlagsMovesTheRecordedValueBack)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        writer.SetValue(Token("A"), Byte(2));
        writer.SetFlags(Token("A"), verifyRequired); // makes the recorded value a proposal
        EXPECT_TRUE(writer.SetFlags(Token("A"), 0));
        EXPECT_EQ(2, Current(writer, "A"));
    }
    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
    const VDataVerifyReader reader(store);
    EXPECT_EQ(2, Verified(reader, "A"));
}

TEST_F(DataStoreCommit, RestoreGoesByThePendingFlags)
{
    SetVerifiable("A", 7, 3);
    {
        VDataVerifyWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(8)));
        EXPECT_TRUE(writer.SetFlags(Token("A"), 0)); // makes the recorded value a verified one
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(7)));
        EXPECT_EQ(8, Current(writer, "A")) << "dropped: the committed verified value is another";
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(3)));
        EXPECT_EQ(7, Current(writer, "A")) << "restored, and read by the committed flags";
    }
    EXPECT_EQ(7, Verified(VDataVerifyReader(store), "A"));
}

TEST_F(DataStoreCommit, RemovalForgetsTheFlagsThatWereRecorded)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.SetFlags(Token("A"), 4);
        EXPECT_TRUE(writer.Remove(Token("A")));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_EQ(0, Flags(writer, "A"));
    }
    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
    EXPECT_EQ(0, Flags(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, RecordedFlagsOutliveARestoredValue)
{
    Set("A", Byte(1));
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_TRUE(writer.SetFlags(Token("A"), 4));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));
        EXPECT_EQ(4, Flags(writer, "A")) << "the record stays for its flags";
    }
    EXPECT_EQ(4, Flags(VDataReader(store), "A"));
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, RestoreOfOneOfTwoValuesKeepsTheOther)
{
    SetVerifiable("A", 7, 3);
    Listen("A");
    {
        VDataVerifyWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetVerifiedValue(Token("A"), Byte(4)));
        EXPECT_TRUE(writer.SetProposedValue(Token("A"), Byte(7)));
        EXPECT_EQ(4, Verified(writer, "A"));
        EXPECT_EQ(7, Proposed(writer, "A"));
    }
    EXPECT_EQ((Texts{"A pending", "A verified", "A any"}), Fired());
}

TEST_F(DataStoreCommit, RestoredVerifiedValueKeepsTheProposedRecord)
{
    SetVerifiable("A", 7, 3);
    {
        VDataVerifyWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("A"));
        EXPECT_TRUE(writer.SetProposedValue(Token("A"), Byte(8)));
        EXPECT_TRUE(writer.SetVerifiedValue(Token("A"), Byte(3)));
    }
    const VDataVerifyReader reader(store);
    EXPECT_EQ(8, Proposed(reader, "A"));
    EXPECT_EQ(3, Verified(reader, "A"));
}

TEST_F(DataStoreCommit, RestorableRemovalOfAPendingItemIsPlain)
{
    {
        VDataWriter writer(store);
        writer.SetValue(Token("A"), Byte(1));
        EXPECT_TRUE(writer.RemoveAllRestorable(VDataPath("A")));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_EQ(2, Current(writer, "A")) << "with nothing committed there is nothing to restore";
    }
    EXPECT_EQ(2, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreCommit, RemovingANeverCommittedItemFiresRemovedIsKept)
{
    Listen("A");
    {
        VDataWriter writer(store);
        writer.SetValue(Token("A"), Byte(1));
        EXPECT_TRUE(writer.Remove(Token("A")));
    }

    EXPECT_EQ((Texts{"A removed", "A any"}), Fired());
    EXPECT_EQ(Texts{}, Find(VDataReader(store), "*"));
}

TEST_F(DataStoreCommit, ItemIdentifiersFollowTheOrderOfPaths)
{
    {
        VDataWriter writer(store);
        for (const char* path : {"C", "A.B", "A", "B"}) {
            writer.SetValue(Token(path), Byte(1));
        }
    }
    std::vector<VDataToken> tokens;
    EXPECT_TRUE(VDataReader(store).FindTokens(VDataPath("*"), tokens));
    EXPECT_EQ((Texts{"A", "A.B", "B", "C"}), PathsOf(tokens));
    for (std::size_t index = 0; index < tokens.size(); ++index) {
        EXPECT_EQ(index + 1, tokens[index].GetNumbers().ItemIdentifier);
    }
}

TEST_F(DataStoreCommit, LargeAndSmallValuesReplaceEachOther)
{
    const VDataValue large{Byte(0).Schema, std::vector<unsigned char>(100000, 7)};
    Set("A", Byte(1));
    Set("A", large);
    EXPECT_EQ(large, VDataReader(store).GetValue(Token("A")));
    Set("A", Byte(2));
    EXPECT_EQ(Byte(2), VDataReader(store).GetValue(Token("A")));
}

} // namespace
