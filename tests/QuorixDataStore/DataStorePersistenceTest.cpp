#include "QuorixDataStore/DataStorePersistence.h"

#include "StoreFixture.h"
#include "io/Values.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <set>

using namespace StoreTest;
using testing::ElementsAre;
using testing::IsEmpty;
using TestSupport::VLogCapture;
using TestSupport::VLoggedMessage;
using TestSupport::VLogLevel;

namespace {

using namespace EDataCopyOptions;
using EDataValueFlags::NotSerialized;
using EDataValueFlags::ReadOnly;
using EDataValueFlags::VerifyRequired;

/// A target that refuses what it is told to refuse.
class VRefusingWriter : public VDataVerifyWriter
{
public:
    VRefusingWriter(IDataStore& store, std::set<std::string> refused)
        : VDataVerifyWriter(store), refused(std::move(refused))
    {
    }

    bool SetFlags(const VDataToken& token, std::uint32_t flags) override
    {
        return refused.count("flags") == 0 && VDataVerifyWriter::SetFlags(token, flags);
    }
    bool SetProposedValue(const VDataToken& token, const VDataValue& value) override
    {
        return refused.count("proposed") == 0 && VDataVerifyWriter::SetProposedValue(token, value);
    }
    bool SetVerifiedValue(const VDataToken& token, const VDataValue& value) override
    {
        return refused.count("verified") == 0 && VDataVerifyWriter::SetVerifiedValue(token, value);
    }
    bool Remove(const VDataToken& token) override
    {
        return refused.count("remove") == 0 && VDataVerifyWriter::Remove(token);
    }

private:
    const std::set<std::string> refused;
};

/// A source that cannot tell an item's flags.
class VFlaglessReader : public VDataVerifyReader
{
public:
    using VDataVerifyReader::VDataVerifyReader;

    bool GetFlags(const VDataToken&, std::uint32_t& flags) const override
    {
        flags = 0xFF; // left behind by a failed read
        return false;
    }
};

/// One item as a store holds it.
struct VItem
{
    bool Exists = false;
    std::uint32_t Flags = 0;
    VDataValue Proposed;
    VDataValue Verified;
};

class DataStorePersistenceTest : public testing::Test
{
protected:
    static void Put(IDataStore& store, const char* path, std::uint32_t flags,
                    const VDataValue& verified, const VDataValue& proposed = VDataValue())
    {
        VDataVerifyWriter writer(store);
        if (flags != 0) {
            EXPECT_TRUE(writer.SetFlags(Token(path), flags));
        }
        if (!verified.Empty()) {
            EXPECT_TRUE(writer.SetVerifiedValue(Token(path), verified));
        }
        if (!proposed.Empty()) {
            EXPECT_TRUE(writer.SetProposedValue(Token(path), proposed));
        }
    }

    static VItem Get(const IDataStore& store, const char* path)
    {
        const VDataVerifyReader reader(store);
        VItem item;
        item.Exists = reader.GetFlags(Token(path), item.Flags);
        reader.GetVerifiedValue(Token(path), item.Verified);
        if ((item.Flags & VerifyRequired) != 0) {
            reader.GetProposedValue(Token(path), item.Proposed);
        }
        return item;
    }

    EDataCopyResult Copy(const char* path, std::uint32_t options,
                         const std::set<std::string>& refused = {})
    {
        const VDataVerifyReader reader(source);
        VRefusingWriter writer(target, refused);
        return DataStorePersistence::CopyValue(Token(path), reader, writer, options);
    }

    EDataCopyResult CopyAllOf(const char* path, std::uint32_t options,
                              const std::set<std::string>& refused = {})
    {
        const VDataVerifyReader reader(source);
        VRefusingWriter writer(target, refused);
        return DataStorePersistence::CopyValues(VDataPath(path), reader, writer, options);
    }

    /// Returns what was logged to the store's category, each with its level.
    Texts Logged() const
    {
        Texts lines;
        for (const VLoggedMessage& message : log.Messages()) {
            if (message.Category == "DataStore") {
                lines.push_back(std::to_string(message.Level) + ": " + message.Text);
            }
        }
        return lines;
    }

    const VLogLevel level{"DataStore", 6};
    const VLogCapture log;
    VDataStore source;
    VDataStore target;
};

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

TEST_F(DataStorePersistenceTest, CopiesAWholeStoreAsOneCommit)
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

TEST_F(DataStorePersistenceTest, CopiesWhatAPathFinds)
{
    Put(source, "A.B.C", 0, Byte(1));
    Put(source, "A.D.C", 0, Byte(2));
    Put(source, "A.B.E", 0, Byte(3));

    EXPECT_EQ(CopyAllOf("A.*.C", 0), EDataCopyResult::CopyDone);

    const VDataReader reader(target);
    EXPECT_THAT(Find(reader, "*"), ElementsAre("A.B.C", "A.D.C"));
}

TEST_F(DataStorePersistenceTest, WithoutAnItemTheCopyIsSkipped)
{
    Put(source, "A", 0, Byte(1));

    EXPECT_EQ(CopyAllOf("B.*", 0), EDataCopyResult::CopySkipped);
    EXPECT_EQ(CopyAllOf("", 0), EDataCopyResult::CopySkipped);
}

TEST_F(DataStorePersistenceTest, SkippedItemsCountAsDone)
{
    Put(source, "A", ReadOnly, Byte(1));
    Put(source, "B", ReadOnly, Byte(1));

    EXPECT_EQ(CopyAllOf("*", SkipReadOnly), EDataCopyResult::CopyDone);
}

TEST_F(DataStorePersistenceTest, EveryItemIsTriedAndFailuresAreCounted)
{
    Put(source, "A", 0, Byte(1));
    Put(source, "B", VerifyRequired, VDataValue(), Byte(2));

    EXPECT_EQ(CopyAllOf("*", 0, {"verified"}), EDataCopyResult::CopyPartial);
    EXPECT_EQ(Get(target, "B").Proposed, Byte(2));
    EXPECT_EQ(CopyAllOf("*", 0, {"verified", "proposed"}), EDataCopyResult::CopyFailed);
    EXPECT_EQ(CopyAllOf("A", 0, {"verified"}), EDataCopyResult::CopyFailed);
}

TEST_F(DataStorePersistenceTest, RemovesWhatTheOptionsDoNotKeep)
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

TEST_F(DataStorePersistenceTest, RemovesEverythingWithoutOptions)
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

TEST_F(DataStorePersistenceTest, ARemovalThatIsRefusedIsLoggedAndTheNextOneTried)
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
