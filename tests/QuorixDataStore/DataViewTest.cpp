#include "StoreFixture.h"
#include "WorkerThread.h"

#include <gtest/gtest.h>

#include <memory>
#include <type_traits>
#include <utility>

namespace {

using namespace StoreTest;

using DataView = DataStoreFixture;

constexpr const char* upgrade = "Fatal attempt to acquire a write lock from within a read lock.";
constexpr const char* movedFrom = "m_pDataStore != nullptr";

template <typename View>
constexpr bool movesOnly =
    !std::is_copy_constructible<View>::value && !std::is_copy_assignable<View>::value &&
    !std::is_move_assignable<View>::value && std::is_nothrow_move_constructible<View>::value &&
    std::is_nothrow_destructible<View>::value;

static_assert(movesOnly<VDataReader>, "");
static_assert(movesOnly<VDataWriter>, "");
static_assert(movesOnly<VDataVerifyReader>, "");
static_assert(movesOnly<VDataVerifyWriter>, "");
static_assert(std::is_base_of<IDataReader, IDataVerifyWriter>::value, "");

TEST_F(DataView, TakesTheLockForItsLifetime)
{
    {
        const VDataReader reader(store);
        ASSERT_EQ(1u, store.GetLocks().size());
        EXPECT_EQ(1u, store.GetLocks()[0].ReadLocks);
    }
    {
        const VDataVerifyReader reader(store);
        EXPECT_EQ(1u, store.GetLocks()[0].ReadLocks);
    }
    {
        VDataWriter writer(store);
        EXPECT_EQ(1u, store.GetLocks()[0].WriteLocks);
    }
    {
        VDataVerifyWriter writer(store);
        EXPECT_EQ(1u, store.GetLocks()[0].WriteLocks);
    }
    EXPECT_TRUE(store.GetLocks().empty());
    EXPECT_EQ(2u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataView, IsMadeFromASharedStoreWithoutKeepingIt)
{
    const auto shared = std::make_shared<VDataStore>();
    {
        VDataWriter writer(shared);
        EXPECT_EQ(1, shared.use_count());
        EXPECT_EQ(shared.get(), &writer.GetDataStore());
        writer.SetValue(Token("A"), Byte(1));
    }
    {
        VDataVerifyWriter writer(shared);
        EXPECT_EQ(shared.get(), &writer.GetDataStore());
    }
    const VDataReader reader(shared);
    const VDataVerifyReader verifyReader(shared);
    EXPECT_EQ(shared.get(), &reader.GetDataStore());
    EXPECT_EQ(shared.get(), &verifyReader.GetDataStore());
    EXPECT_EQ(1, Current(reader, "A"));
    EXPECT_EQ(1, shared.use_count());
}

TEST_F(DataView, ConstAccessGivesAConstStore)
{
    VDataWriter writer(store);
    const VDataWriter& constant = writer;

    static_assert(std::is_same<decltype(constant.GetDataStore()), const IDataStore&>::value, "");
    static_assert(std::is_same<decltype(writer.GetDataStore()), IDataStore&>::value, "");
    EXPECT_EQ(&constant.GetDataStore(), &writer.GetDataStore());
}

TEST_F(DataView, MissingItemGivesAnEmptyValueWithoutSchemaAndChangeIdZero)
{
    Set("Other", Byte(1));
    const VDataReader reader(store);

    const VDataValue value = reader.GetValue(Token("A"));

    EXPECT_TRUE(value.Empty());
    EXPECT_EQ(nullptr, value.Schema);
    EXPECT_EQ(0u, reader.GetItemChangeId(Token("A")));
    EXPECT_EQ(0u, reader.GetPathChangeId(VDataPath("A")));
}

TEST_F(DataView, ForwardsToItsStore)
{
    SetItems({"A.B", "A.C"});
    const VDataReader reader(store);
    std::uint32_t flags = 9;
    const KVR::IO::ISchema* schema = nullptr;

    EXPECT_EQ((Texts{"A.B", "A.C"}), Find(reader, "A.*"));
    EXPECT_EQ(2u, reader.GetChildCount(VDataPath("A")));
    EXPECT_TRUE(reader.HasChild(VDataPath("A"), "B"));
    EXPECT_EQ((Texts{"B", "C"}), Children(reader, "A"));
    EXPECT_TRUE(reader.HasValue(Token("A.B")));
    EXPECT_EQ(Byte(1), reader.GetValue(Token("A.B")));
    EXPECT_TRUE(reader.GetSchema(Token("A.B"), schema));
    EXPECT_EQ(Byte(1).Schema, schema);
    EXPECT_TRUE(reader.GetFlags(Token("A.B"), flags));
    EXPECT_EQ(0u, flags);
    EXPECT_EQ(1u, reader.GetPathChangeId(VDataPath("A")));
    EXPECT_EQ(1u, reader.GetItemChangeId(Token("A.B")));
    EXPECT_EQ(1u, reader.GetCurrentChangeId());
}

TEST_F(DataView, WriterWorksOnTheCurrentValue)
{
    SetVerifiable("A", 7, 3);
    {
        VDataWriter writer(store);
        EXPECT_EQ(7, Current(writer, "A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(8)));
    }
    const VDataVerifyReader reader(store);
    EXPECT_EQ(8, Proposed(reader, "A"));
    EXPECT_EQ(3, Verified(reader, "A"));
}

TEST_F(DataView, VerifyWriterTellsTheTwoTruthsApart)
{
    SetVerifiable("A", 7, 3);
    {
        VDataVerifyWriter writer(store);
        EXPECT_TRUE(writer.SetProposedValue(Token("A"), Byte(8)));
        EXPECT_TRUE(writer.SetVerifiedValue(Token("A"), Byte(9)));
        EXPECT_EQ(8, Proposed(writer, "A"));
        EXPECT_EQ(9, Verified(writer, "A"));
        EXPECT_EQ(8, Current(writer, "A"));
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(9)));
    }
    const VDataVerifyReader reader(store);
    EXPECT_EQ(9, Proposed(reader, "A"));
    EXPECT_EQ(9, Verified(reader, "A"));
}

TEST_F(DataView, WriterRemovesAndHandsOutListeners)
{
    SetItems({"A", "B", "C.D"});
    {
        VDataWriter writer(store);
        EXPECT_TRUE(writer.Remove(Token("A")));
        EXPECT_TRUE(writer.RemoveAll(VDataPath("B")));
        EXPECT_TRUE(writer.RemoveAllRestorable(VDataPath("C.*")));
        EXPECT_EQ(&writer.GetListeners(VDataPath("A")), &writer.GetListeners(Token("A")));
    }
    EXPECT_EQ(Texts{}, Find(VDataReader(store), "*"));
}

TEST_F(DataView, RemoveOfAWriterIsNotRestorable)
{
    Set("A", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.Remove(Token("A"));
        writer.SetValue(Token("A"), Byte(1));
    }
    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());
}

TEST_F(DataView, InnerWriterCommitsNothing)
{
    {
        VDataWriter outer(store);
        {
            VDataWriter inner(store);
            inner.SetValue(Token("A"), Byte(1));
        }
        VWorkerThread().Do([this] { EXPECT_EQ(-1, Current(VDataReader(store), "A")); });
    }
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataView, WriterInsideAVerifyWriterSharesItsDelta)
{
    VDataVerifyWriter outer(store);
    outer.SetFlags(Token("A"), EDataValueFlags::VerifyRequired);
    outer.SetVerifiedValue(Token("A"), Byte(3));
    {
        VDataWriter inner(store);
        EXPECT_EQ(-1, Current(inner, "A"));
        EXPECT_TRUE(inner.SetValue(Token("A"), Byte(4)));
    }
    EXPECT_EQ(4, Proposed(outer, "A"));
}

TEST_F(DataView, ReadersInsideAWriterSeeWhatIsPending)
{
    VDataWriter writer(store);
    writer.SetValue(Token("A"), Byte(1));

    const VDataReader reader(store);
    const VDataVerifyReader verifyReader(store);

    EXPECT_EQ(1, Current(reader, "A"));
    EXPECT_EQ(1, Verified(verifyReader, "A"));
}

TEST_F(DataView, NestsInEveryLegalCombination)
{
    {
        const VDataReader outer(store);
        const VDataVerifyReader inner(store);
        const VDataReader innermost(store);
    }
    {
        VDataWriter outer(store);
        VDataVerifyWriter inner(store);
        {
            const VDataVerifyReader reading(store);
        }
        VDataWriter innermost(store);
        const VDataReader reading(store);
    }
    EXPECT_TRUE(store.GetLocks().empty());
    EXPECT_EQ(1u, VDataReader(store).GetCurrentChangeId());
}

template <typename Reader, typename Writer>
void ExpectFatal(VDataStore& store)
{
    {
        const VAssertions assertions(VAssertions::Throw);
        const Reader reader(store);
        EXPECT_THROW(Writer writer(store), std::runtime_error);
        EXPECT_EQ((Texts{upgrade}), assertions.Expressions());
        EXPECT_EQ(0u, store.GetLocks()[0].WriteLocks);
    }
    EXPECT_TRUE(store.GetLocks().empty());
    {
        const VAssertions assertions(VAssertions::Return);
        const Reader reader(store);
        {
            Writer writer(store);
            EXPECT_EQ((Texts{upgrade}), assertions.Expressions());
            EXPECT_FALSE(writer.SetValue(Token("A"), Byte(1)));
        }
        EXPECT_EQ(1u, store.GetLocks()[0].ReadLocks);
    }
    EXPECT_TRUE(store.GetLocks().empty());
}

TEST_F(DataView, WriterInsideAReaderIsFatal)
{
    ExpectFatal<VDataReader, VDataWriter>(store);
    ExpectFatal<VDataReader, VDataVerifyWriter>(store);
    ExpectFatal<VDataVerifyReader, VDataWriter>(store);
    ExpectFatal<VDataVerifyReader, VDataVerifyWriter>(store);
    EXPECT_EQ(0u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataView, FailedWriterDoesNotReleaseTheOuterWriteLock)
{
    const VAssertions assertions(VAssertions::Return);
    VDataWriter outer(store);
    {
        const VDataReader reader(store);
        VDataWriter failed(store);
    }
    EXPECT_EQ((Texts{upgrade}), assertions.Expressions());
    ASSERT_EQ(1u, store.GetLocks().size());
    EXPECT_EQ(1u, store.GetLocks()[0].WriteLocks);
    EXPECT_TRUE(outer.SetValue(Token("A"), Byte(1)));
}

TEST_F(DataView, ReaderOfAnotherStoreIsNoUpgrade)
{
    VDataStore other;
    const VDataReader reader(other);

    VDataWriter writer(store);

    EXPECT_TRUE(writer.SetValue(Token("A"), Byte(1)));
}

TEST_F(DataView, MovingTakesTheLockAlong)
{
    VDataReader reader(store);
    {
        const VDataReader moved(std::move(reader));
        EXPECT_EQ(1u, store.GetLocks()[0].ReadLocks);
        EXPECT_EQ(0u, moved.GetCurrentChangeId());
    }
    EXPECT_TRUE(store.GetLocks().empty());

    VDataVerifyWriter writer(store);
    {
        VDataVerifyWriter moved(std::move(writer));
        EXPECT_TRUE(moved.SetValue(Token("A"), Byte(1)));
    }
    EXPECT_EQ(1, Current(VDataReader(store), "A"));

    VDataWriter plain(store);
    {
        VDataWriter moved(std::move(plain));
        moved.SetValue(Token("A"), Byte(2));
    }
    EXPECT_EQ(2, Current(VDataReader(store), "A"));
    VDataVerifyReader verify(store);
    {
        const VDataVerifyReader moved(std::move(verify));
        EXPECT_EQ(2, Verified(moved, "A"));
    }
    EXPECT_TRUE(store.GetLocks().empty());
}

TEST_F(DataView, CallOnAMovedFromViewFailsTheAssertion)
{
    VDataVerifyWriter writer(store);
    const VDataVerifyWriter moved(std::move(writer));
    const VAssertions assertions(VAssertions::Return);
    std::vector<VDataToken> tokens;
    Texts names;
    VDataValue value;
    const KVR::IO::ISchema* schema = nullptr;
    std::uint32_t flags = 0;

    EXPECT_FALSE(writer.FindTokens(VDataPath("*"), tokens));
    EXPECT_EQ(0u, writer.GetChildCount(VDataPath()));
    EXPECT_FALSE(writer.HasChild(VDataPath(), "A"));
    EXPECT_FALSE(writer.GetChildren(VDataPath(), names));
    EXPECT_FALSE(writer.HasValue(Token("A")));
    EXPECT_FALSE(writer.GetValue(Token("A"), value));
    EXPECT_TRUE(writer.GetValue(Token("A")).Empty());
    EXPECT_FALSE(writer.GetSchema(Token("A"), schema));
    EXPECT_FALSE(writer.GetFlags(Token("A"), flags));
    EXPECT_EQ(0u, writer.GetPathChangeId(VDataPath("A")));
    EXPECT_EQ(0u, writer.GetItemChangeId(Token("A")));
    EXPECT_EQ(0u, writer.GetCurrentChangeId());
    EXPECT_FALSE(writer.GetProposedValue(Token("A"), value));
    EXPECT_FALSE(writer.GetVerifiedValue(Token("A"), value));
    EXPECT_FALSE(writer.SetValue(Token("A"), Byte(1)));
    EXPECT_FALSE(writer.SetProposedValue(Token("A"), Byte(1)));
    EXPECT_FALSE(writer.SetVerifiedValue(Token("A"), Byte(1)));
    EXPECT_FALSE(writer.Remove(Token("A")));
    EXPECT_FALSE(writer.RemoveAll(VDataPath("*")));
    EXPECT_FALSE(writer.RemoveAllRestorable(VDataPath("*")));
    EXPECT_FALSE(writer.SetFlags(Token("A"), 1));
    writer.GetListeners(VDataPath("A")).OnAnyChange.Add([] { FAIL(); });
    writer.GetListeners(Token("A")).OnAnyChange.Add([] { FAIL(); });

    EXPECT_EQ(Texts(23, movedFrom), assertions.Expressions());
    EXPECT_EQ(0u, std::as_const(store).GetListeners(VDataPath("A")).OnAnyChange.Count());
}

TEST_F(DataView, CallOnAMovedFromViewPassesWhatTheHandlerThrows)
{
    VDataWriter writer(store);
    const VDataWriter moved(std::move(writer));
    const VAssertions assertions(VAssertions::Throw);

    EXPECT_THROW(writer.GetDataStore(), std::runtime_error);
    EXPECT_THROW(std::as_const(writer).GetDataStore(), std::runtime_error);
    EXPECT_THROW(writer.GetValue(Token("A")), std::runtime_error);
    EXPECT_THROW(writer.SetValue(Token("A"), Byte(1)), std::runtime_error);
    EXPECT_THROW(writer.GetListeners(Token("A")), std::runtime_error);
    EXPECT_EQ(Texts(5, movedFrom), assertions.Expressions());
}

TEST_F(DataView, NullSharedStoreFailsTheAssertion)
{
    const VAssertions assertions(VAssertions::Return);
    {
        const VDataReader reader{std::shared_ptr<const IDataStore>()};
        VDataWriter writer{std::shared_ptr<IDataStore>()};
        EXPECT_EQ(2u, assertions.Expressions().size());
        EXPECT_FALSE(reader.HasValue(Token("A")));
    }
    EXPECT_EQ(Texts(3, movedFrom), assertions.Expressions());
}

TEST(DataViewDeathTest, StoreOfAMovedFromViewAborts)
{
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    EXPECT_DEATH(
        {
            VDataStore store;
            VDataReader reader(store);
            const VDataReader moved(std::move(reader));
            const VAssertions assertions(VAssertions::Return);
            static_cast<void>(reader.GetDataStore());
        },
        "");
}

} // namespace
