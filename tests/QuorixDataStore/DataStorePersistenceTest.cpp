#include "PersistenceFixture.h"

#include <gmock/gmock.h>

using namespace StoreTest;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

using namespace EDataCopyOptions;
using EDataValueFlags::NotSerialized;
using EDataValueFlags::ReadOnly;
using EDataValueFlags::VerifyRequired;

using DataStorePersistenceTest = PersistenceFixture;

TEST_F(DataStorePersistenceTest, NumbersOfOptionsAndResultsAreFixed)
{
    EXPECT_EQ(SkipReadOnly | CopyAll, 3U);
    EXPECT_EQ(SkipExisting, 4U);
    EXPECT_EQ(SkipNotSerialized, 16U);
    EXPECT_EQ(static_cast<std::int32_t>(EDataCopyResult::CopyDone), 0);
    EXPECT_EQ(static_cast<std::int32_t>(EDataCopyResult::CopySkipped), 1);
    EXPECT_EQ(static_cast<std::int32_t>(EDataCopyResult::CopyPartial), 2);
    EXPECT_EQ(static_cast<std::uint32_t>(EDataCopyResult::CopyFailed), 0x80000000U);
    EXPECT_EQ(static_cast<std::uint32_t>(EDataCopyResult::CopyWriteFailed), 0x80000009U);
    EXPECT_EQ(static_cast<std::uint32_t>(EDataCopyResult::CopyReadFailed), 0x8000000AU);
}

TEST_F(DataStorePersistenceTest, CopiesAVerifiedValue)
{
    Put(source, "A.B", ReadOnly, Byte(1));

    EXPECT_EQ(Copy("A.B", 0), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A.B").Verified, Byte(1));
    EXPECT_EQ(Get(target, "A.B").Flags, 0U);
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(DataStorePersistenceTest, CopiesAProposedValueWithItsFlag)
{
    Put(source, "A", VerifyRequired, Byte(1), Byte(2));

    EXPECT_EQ(Copy("A", 0), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Proposed, Byte(2));
    EXPECT_TRUE(Get(target, "A").Verified.Empty());
    EXPECT_EQ(Get(target, "A").Flags, VerifyRequired);
    EXPECT_THAT(Logged(), ElementsAre("6: VerifyRequired flag missing in 'A' target value, setting "
                                      "flag."));
}

TEST_F(DataStorePersistenceTest, AVerifiedValueAloneIsCopiedAsAProposedOne)
{
    Put(source, "A", VerifyRequired, Byte(1));
    Put(target, "A", VerifyRequired | ReadOnly, VDataValue(), Byte(9));

    EXPECT_EQ(Copy("A", 0), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Proposed, Byte(1));
    EXPECT_TRUE(Get(target, "A").Verified.Empty());
    EXPECT_EQ(Get(target, "A").Flags, VerifyRequired | ReadOnly);
    EXPECT_THAT(Logged(), ElementsAre("6: Could not read 'A' proposed value"));
}

TEST_F(DataStorePersistenceTest, TheTargetsOtherFlagsStayWhenItsFlagIsSet)
{
    Put(source, "A", VerifyRequired, VDataValue(), Byte(2));
    Put(target, "A", NotSerialized, Byte(1));

    EXPECT_EQ(Copy("A", 0), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Flags, NotSerialized | VerifyRequired);
    EXPECT_EQ(Get(target, "A").Proposed, Byte(2));
}

TEST_F(DataStorePersistenceTest, WithoutTheFlagTheTargetsVerifiedValueIsWritten)
{
    Put(source, "A", 0, Byte(1));
    Put(target, "A", VerifyRequired, Byte(7), Byte(8));

    EXPECT_EQ(Copy("A", 0), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
    EXPECT_EQ(Get(target, "A").Proposed, Byte(8));
}

TEST_F(DataStorePersistenceTest, AMissingItemCannotBeRead)
{
    EXPECT_EQ(Copy("A", 0), EDataCopyResult::CopyReadFailed);
    EXPECT_THAT(Logged(), ElementsAre("6: Could not read 'A' verified value"));
}

TEST_F(DataStorePersistenceTest, AnItemOfFlagsAloneCannotBeRead)
{
    Put(source, "A", VerifyRequired, VDataValue());

    EXPECT_EQ(Copy("A", 0), EDataCopyResult::CopyReadFailed);
    EXPECT_THAT(Logged(), ElementsAre("6: Could not read 'A' proposed value",
                                      "6: Could not read 'A' verified value"));
    EXPECT_FALSE(Get(target, "A").Exists);
}

TEST_F(DataStorePersistenceTest, AVerifiedValueThatIsRefusedIsCalledProposed)
{
    Put(source, "A", 0, Byte(1));

    EXPECT_EQ(Copy("A", 0, {"verified"}), EDataCopyResult::CopyWriteFailed);
    EXPECT_THAT(Logged(), ElementsAre("2: Error writing 'A' proposed value"));
}

TEST_F(DataStorePersistenceTest, AValueOfAnotherSchemaIsRefused)
{
    Put(source, "A", 0, Byte(1));
    Put(target, "A", 0, Word(2));

    EXPECT_EQ(Copy("A", 0), EDataCopyResult::CopyWriteFailed);
    EXPECT_EQ(Get(target, "A").Verified, Word(2));
}

TEST_F(DataStorePersistenceTest, AProposedValueThatIsRefusedFails)
{
    Put(source, "A", VerifyRequired, VDataValue(), Byte(2));

    EXPECT_EQ(Copy("A", 0, {"proposed", "flags"}), EDataCopyResult::CopyWriteFailed);
    EXPECT_THAT(Logged(), ElementsAre("6: VerifyRequired flag missing in 'A' target value, setting "
                                      "flag.",
                                      "6: Setting VerifyRequired flag 'A' failed.",
                                      "2: Error writing 'A' proposed value"));
}

TEST_F(DataStorePersistenceTest, AFlagThatCannotBeSetDoesNotStopTheValue)
{
    Put(source, "A", VerifyRequired, VDataValue(), Byte(2));

    EXPECT_EQ(Copy("A", 0, {"flags"}), EDataCopyResult::CopyDone);
    EXPECT_EQ(Get(target, "A").Verified, Byte(2));
}

TEST_F(DataStorePersistenceTest, CopyAllCarriesFlagsAndBothValues)
{
    Put(source, "A", VerifyRequired | ReadOnly | NotSerialized, Byte(1), Byte(2));

    EXPECT_EQ(Copy("A", CopyAll), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Flags, VerifyRequired | ReadOnly | NotSerialized);
    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
    EXPECT_EQ(Get(target, "A").Proposed, Byte(2));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(DataStorePersistenceTest, CopyAllAsksNoProposedValueOfAnItemWithoutTheFlag)
{
    Put(source, "A", ReadOnly, Byte(1));
    Put(target, "A", VerifyRequired, VDataValue(), Byte(9));

    EXPECT_EQ(Copy("A", CopyAll), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Flags, ReadOnly);
    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(DataStorePersistenceTest, CopyAllCarriesAProposedValueAlone)
{
    Put(source, "A", VerifyRequired, VDataValue(), Byte(2));

    EXPECT_EQ(Copy("A", CopyAll), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Flags, VerifyRequired);
    EXPECT_EQ(Get(target, "A").Proposed, Byte(2));
    EXPECT_TRUE(Get(target, "A").Verified.Empty());
    EXPECT_THAT(Logged(), ElementsAre("6: Could not read 'A' verified value."));
}

TEST_F(DataStorePersistenceTest, CopyAllSkipsFlagsWithoutAValue)
{
    Put(source, "A", VerifyRequired, VDataValue());

    EXPECT_EQ(Copy("A", CopyAll), EDataCopyResult::CopySkipped);

    EXPECT_FALSE(Get(target, "A").Exists);
    EXPECT_THAT(Logged(), ElementsAre("6: Could not read 'A' verified value.",
                                      "6: Could not read 'A' proposed value."));
}

TEST_F(DataStorePersistenceTest, CopyAllTriesAProposedValueThatIsNotThere)
{
    Put(source, "A", VerifyRequired, Byte(1));

    EXPECT_EQ(Copy("A", CopyAll), EDataCopyResult::CopyDone);

    EXPECT_EQ(Get(target, "A").Flags, VerifyRequired);
    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
    EXPECT_TRUE(Get(target, "A").Proposed.Empty());
    EXPECT_THAT(Logged(), ElementsAre("6: Could not read 'A' proposed value.",
                                      "2: Error writing 'A' proposed value"));
}

TEST_F(DataStorePersistenceTest, CopyAllGoesOnWithoutFlags)
{
    Put(source, "A", VerifyRequired, Byte(1), Byte(2));
    {
        const VFlaglessReader reader(source);
        VDataVerifyWriter writer(target);

        EXPECT_EQ(DataStorePersistence::CopyValue(Token("A"), reader, writer, CopyAll),
                  EDataCopyResult::CopyDone);
    }

    EXPECT_EQ(Get(target, "A").Flags, 0U);
    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
    EXPECT_THAT(Logged(), ElementsAre("6: Could not read 'A' flags."));
}

TEST_F(DataStorePersistenceTest, FlagsThatCannotBeReadCountAsNone)
{
    Put(source, "A", VerifyRequired | ReadOnly | NotSerialized, Byte(1), Byte(2));
    {
        const VFlaglessReader reader(source);
        VDataVerifyWriter writer(target);

        EXPECT_EQ(DataStorePersistence::CopyValue(Token("A"), reader, writer,
                                                  SkipReadOnly | SkipNotSerialized),
                  EDataCopyResult::CopyDone);
    }

    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
}

TEST_F(DataStorePersistenceTest, FlagsOfTheTargetThatCannotBeReadCountAsNone)
{
    Put(source, "A", VerifyRequired, VDataValue(), Byte(2));
    {
        const VDataVerifyReader reader(source);
        VFlaglessWriter writer(target);

        EXPECT_EQ(DataStorePersistence::CopyValue(Token("A"), reader, writer, 0),
                  EDataCopyResult::CopyDone);
    }

    EXPECT_EQ(Get(target, "A").Flags, VerifyRequired);
    EXPECT_EQ(Get(target, "A").Proposed, Byte(2));
}

struct VRefusal
{
    std::set<std::string> Refused;
    EDataCopyResult Result;
    Texts Log;
};

TEST_F(DataStorePersistenceTest, CopyAllIsDoneIfOneWriteSucceeds)
{
    const std::string flags = "2: Error writing 'A' value flags";
    const std::string verified = "2: Error writing 'A' verified value";
    const std::string proposed = "2: Error writing 'A' proposed value";
    // clang-format off
    const VRefusal refusals[] = {
        {{"flags"},                         EDataCopyResult::CopyDone,        {flags}},
        {{"flags", "verified"},             EDataCopyResult::CopyDone,        {flags, verified}},
        {{"flags", "proposed"},             EDataCopyResult::CopyDone,        {flags, proposed}},
        {{"verified", "proposed"},          EDataCopyResult::CopyDone,        {verified, proposed}},
        {{"flags", "verified", "proposed"}, EDataCopyResult::CopyWriteFailed, {flags, verified, proposed}},
    };
    // clang-format on
    Put(source, "A", VerifyRequired, Byte(1), Byte(2));

    Texts expected;
    for (const VRefusal& refusal : refusals) {
        EXPECT_EQ(Copy("A", CopyAll, refusal.Refused), refusal.Result);
        expected.insert(expected.end(), refusal.Log.begin(), refusal.Log.end());
    }

    Texts errors = Logged(); // beside the store's own warnings of a value without its flag
    errors.erase(std::remove_if(errors.begin(), errors.end(),
                                [](const std::string& line) { return line[0] != '2'; }),
                 errors.end());
    EXPECT_EQ(errors, expected);
}

TEST_F(DataStorePersistenceTest, SkipsWhatTheOptionsLeaveOut)
{
    Put(source, "A", ReadOnly, Byte(1));
    Put(source, "B", NotSerialized, Byte(2));
    Put(source, "C", 0, Byte(3));
    Put(target, "C", 0, Byte(4));

    EXPECT_EQ(Copy("A", SkipReadOnly), EDataCopyResult::CopySkipped);
    EXPECT_EQ(Copy("B", SkipNotSerialized), EDataCopyResult::CopySkipped);
    EXPECT_EQ(Copy("C", SkipExisting), EDataCopyResult::CopySkipped);

    EXPECT_FALSE(Get(target, "A").Exists);
    EXPECT_FALSE(Get(target, "B").Exists);
    EXPECT_EQ(Get(target, "C").Verified, Byte(4));
    EXPECT_THAT(Logged(), ElementsAre("6: Skipping read only value 'A'.",
                                      "6: Skipping not serialized value 'B'.",
                                      "6: Skipping value 'C' that already exists in "
                                      "i_rDataWriter."));
}

TEST_F(DataStorePersistenceTest, TheFirstTestThatAppliesSkips)
{
    Put(source, "A", ReadOnly | NotSerialized, Byte(1));
    Put(target, "A", 0, Byte(2));

    Copy("A", SkipExisting | SkipReadOnly | SkipNotSerialized);
    Copy("A", SkipReadOnly | SkipNotSerialized);

    EXPECT_THAT(Logged(), ElementsAre("6: Skipping value 'A' that already exists in "
                                      "i_rDataWriter.",
                                      "6: Skipping read only value 'A'."));
}

TEST_F(DataStorePersistenceTest, OptionsThatDoNotApplyLeaveNothingOut)
{
    Put(source, "A", ReadOnly, Byte(1));
    Put(source, "B", NotSerialized, Byte(2));

    EXPECT_EQ(Copy("A", SkipNotSerialized | SkipExisting | 8), EDataCopyResult::CopyDone);
    EXPECT_EQ(Copy("B", SkipReadOnly | SkipExisting | 8), EDataCopyResult::CopyDone);
}

TEST_F(DataStorePersistenceTest, AnItemRemovedInTheSameLockCountsAsNotExisting)
{
    Put(source, "A", 0, Byte(1));
    Put(target, "A", 0, Byte(2));
    {
        const VDataVerifyReader reader(source);
        VDataVerifyWriter writer(target);
        EXPECT_TRUE(writer.Remove(Token("A")));

        EXPECT_EQ(DataStorePersistence::CopyValue(Token("A"), reader, writer, SkipExisting),
                  EDataCopyResult::CopyDone);
    }

    EXPECT_EQ(Get(target, "A").Verified, Byte(1));
}

} // namespace
