#include "PersistenceFixture.h"

#include <gmock/gmock.h>

// Copying and removing what a path finds.

using namespace StoreTest;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

using namespace EDataCopyOptions;
using EDataValueFlags::NotSerialized;
using EDataValueFlags::ReadOnly;
using EDataValueFlags::VerifyRequired;

using DataStoreCopyTest = PersistenceFixture;

TEST_F(DataStoreCopyTest, CopiesAWholeStoreAsOneCommit)
{
    Put(source, "A", 0, Byte(1));
    Put(source, "B.C", VerifyRequired, Byte(2), Byte(3));
    std::uint64_t before = 0;
    {
        before = VDataReader(target).GetCurrentChangeId();
    }

    EXPECT_EQ(CopyAllOf("*", CopyAll), EDataCopyResult::CopyDone);

    EXPECT_EQ(VDataReader(target).GetCurrentChangeId(), before + 1);
    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
    EXPECT_EQ(Get(target, "B.C").Proposed, Byte(3));
}

TEST_F(DataStoreCopyTest, CopiesWhatAPathFinds)
{
    Put(source, "A.B.C", 0, Byte(1));
    Put(source, "A.D.C", 0, Byte(2));
    Put(source, "A.B.E", 0, Byte(3));

    EXPECT_EQ(CopyAllOf("A.*.C", 0), EDataCopyResult::CopyDone);

    const VDataReader reader(target);
    EXPECT_THAT(Find(reader, "*"), ElementsAre("A.B.C", "A.D.C"));
}

TEST_F(DataStoreCopyTest, WithoutAnItemTheCopyIsSkipped)
{
    Put(source, "A", 0, Byte(1));

    EXPECT_EQ(CopyAllOf("B.*", 0), EDataCopyResult::CopySkipped);
    EXPECT_EQ(CopyAllOf("", 0), EDataCopyResult::CopySkipped);
}

TEST_F(DataStoreCopyTest, SkippedItemsCountAsDone)
{
    Put(source, "A", ReadOnly, Byte(1));
    Put(source, "B", ReadOnly, Byte(1));

    EXPECT_EQ(CopyAllOf("*", SkipReadOnly), EDataCopyResult::CopyDone);
}

TEST_F(DataStoreCopyTest, EveryItemIsTriedAndFailuresAreCounted)
{
    Put(source, "A", 0, Byte(1));
    Put(source, "B", VerifyRequired, VDataValue(), Byte(2));

    EXPECT_EQ(CopyAllOf("*", 0, {"verified"}), EDataCopyResult::CopyPartial);
    EXPECT_EQ(Get(target, "B").Proposed, Byte(2));
    EXPECT_EQ(CopyAllOf("*", 0, {"verified", "proposed"}), EDataCopyResult::CopyFailed);
    EXPECT_EQ(CopyAllOf("A", 0, {"verified"}), EDataCopyResult::CopyFailed);
}

TEST_F(DataStoreCopyTest, RemovesWhatTheOptionsDoNotKeep)
{
    Put(target, "A.A", 0, Byte(1));
    Put(target, "A.B", ReadOnly, Byte(1));
    Put(target, "A.C", NotSerialized, Byte(1));
    Put(target, "B", 0, Byte(1));
    {
        VDataVerifyWriter writer(target);
        DataStorePersistence::RemoveValues(VDataPath("A.*"), writer,
                                           SkipReadOnly | SkipNotSerialized);
    }
    const VDataReader reader(target);

    EXPECT_THAT(Find(reader, "*"), ElementsAre("A.B", "A.C", "B"));
    EXPECT_THAT(Logged(), ElementsAre("6: skipping read only parameter 'A.B'",
                                      "6: skipping not serialized value 'A.C'."));
}

TEST_F(DataStoreCopyTest, RemovesEverythingWithoutOptions)
{
    Put(target, "A", ReadOnly, Byte(1));
    Put(target, "B", NotSerialized, Byte(1));
    {
        VDataVerifyWriter writer(target);
        DataStorePersistence::RemoveValues(VDataPath("*"), writer, CopyAll | SkipExisting);
        DataStorePersistence::RemoveValues(VDataPath("None"), writer, 0);
    }
    const VDataReader reader(target);

    EXPECT_THAT(Find(reader, "*"), IsEmpty());
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(DataStoreCopyTest, ARemovalThatIsRefusedIsLoggedAndTheNextOneTried)
{
    Put(target, "A", 0, Byte(1));
    Put(target, "B", 0, Byte(1));
    {
        VRefusingWriter writer(target, {"remove"});
        DataStorePersistence::RemoveValues(VDataPath("*"), writer, 0);
    }

    EXPECT_THAT(Logged(), ElementsAre("2: Error removing 'A' parameter value",
                                      "2: Error removing 'B' parameter value"));
}

} // namespace
