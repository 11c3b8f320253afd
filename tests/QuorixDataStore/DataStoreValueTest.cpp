#include "StoreFixture.h"
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

TEST_F(DataStore, RemoveAllIsNotRestorable)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.RemoveAll(VDataPath("A"));
        writer.SetValue(Token("A"), Byte(1));
    }

    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
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

} // namespace
