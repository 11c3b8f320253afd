#include "StoreFixture.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

namespace {

using namespace StoreTest;

using DataStore = DataStoreFixture;

constexpr std::uint32_t verifyRequired = EDataValueFlags::VerifyRequired;

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

TEST_F(DataStore, CommittedValueIsReadByTheCommittedFlags)
{
    SetVerifiable("A", 7, 3);
    {
        VDataVerifyWriter writer(store);
        EXPECT_TRUE(writer.SetFlags(Token("A"), 0));
        EXPECT_EQ(7, Current(writer, "A"));
        EXPECT_EQ(3, Verified(writer, "A"));
    }
    EXPECT_EQ(7, Current(VDataReader(store), "A")) << "the value moves at the commit";
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

} // namespace
