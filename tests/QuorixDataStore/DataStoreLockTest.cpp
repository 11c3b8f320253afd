#include "DebugServices/ThreadName.h"
#include "LockWaiting.h"
#include "StoreFixture.h"
#include "WorkerThread.h"

#include <gtest/gtest.h>

namespace {

using namespace StoreTest;

using DataStoreLock = DataStoreFixture;

TEST_F(DataStoreLock, ReadLocksGiveTheCurrentChangeIdAndDoNotAdvanceIt)
{
    std::uint64_t first = 99;
    std::uint64_t nested = 99;
    store.AcquireReadLock(first);
    store.AcquireReadLock(nested);
    store.ReleaseReadLock();
    store.ReleaseReadLock();

    EXPECT_EQ(0u, first);
    EXPECT_EQ(0u, nested);
    EXPECT_EQ(0u, VDataReader(store).GetCurrentChangeId());
    EXPECT_TRUE(store.GetLocks().empty());
}

TEST_F(DataStoreLock, ReleaseWithoutALockChangesNothing)
{
    store.ReleaseReadLock();
    store.ReleaseWriteLock();
    EXPECT_EQ(0u, VDataReader(store).GetCurrentChangeId());

    std::uint64_t changeId = 0;
    store.AcquireReadLock(changeId);
    store.ReleaseWriteLock();
    EXPECT_EQ(1u, store.GetLocks().size()) << "another kind of lock is not released";
    VWorkerThread().Do([this] { store.ReleaseReadLock(); });
    EXPECT_EQ(1u, store.GetLocks().size()) << "nor is another thread's";
    store.ReleaseReadLock();
    EXPECT_TRUE(store.GetLocks().empty());

    VDataWriter writer(store);
    store.ReleaseReadLock();
    ASSERT_EQ(1u, store.GetLocks().size());
    EXPECT_EQ(0u, store.GetLocks()[0].ReadLocks);
    EXPECT_EQ(1u, store.GetLocks()[0].WriteLocks);
}

TEST_F(DataStoreLock, ReadLockIsNeverUpgraded)
{
    std::uint64_t read = 0;
    std::uint64_t write = 55;
    store.AcquireReadLock(read);

    EXPECT_FALSE(store.AcquireWriteLock(write));

    EXPECT_EQ(55u, write);
    EXPECT_EQ(0u, store.GetLocks()[0].WriteLocks);
    store.ReleaseReadLock();
    EXPECT_EQ(0u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreLock, ReadLockIsNotUpgradedInsideAWriteLockEither)
{
    std::uint64_t changeId = 0;
    ASSERT_TRUE(store.AcquireWriteLock(changeId));
    store.AcquireReadLock(changeId);

    EXPECT_FALSE(store.AcquireWriteLock(changeId));

    store.ReleaseReadLock();
    EXPECT_TRUE(store.AcquireWriteLock(changeId)) << "nesting write locks is fine";
    store.ReleaseWriteLock();
    store.ReleaseWriteLock();
    EXPECT_EQ(1u, VDataReader(store).GetCurrentChangeId()) << "one outermost write lock";
}

TEST_F(DataStoreLock, ReadLockMayOutliveTheWriteLockOfItsThread)
{
    std::uint64_t changeId = 0;
    ASSERT_TRUE(store.AcquireWriteLock(changeId));
    EXPECT_TRUE(store.SetValue(Token("A"), Byte(1), EDataValueTarget::Current));
    store.AcquireReadLock(changeId);
    store.ReleaseWriteLock();
    VDataValue value;
    EXPECT_TRUE(store.GetValue(Token("A"), value, EDataValueTarget::Current)) << "still visible";
    EXPECT_EQ(1u, store.GetCurrentChangeId());
    VWorkerThread().Do([this] { EXPECT_EQ(-1, Current(VDataReader(store), "A")); });

    store.ReleaseReadLock();

    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreLock, WriterStartsBesideReadersAndTheyKeepTheirState)
{
    Set("A", Byte(1));
    VWorkerThread readers;
    std::unique_ptr<VDataReader> before;
    std::unique_ptr<VDataReader> during;
    readers.Do([&] { before = std::make_unique<VDataReader>(store); });
    VWorkerThread other;
    {
        VDataWriter writer(store);
        EXPECT_EQ(1u, writer.GetCurrentChangeId());
        EXPECT_TRUE(writer.SetValue(Token("A"), Byte(2)));
        EXPECT_EQ(2u, writer.GetCurrentChangeId());
        other.Do([&] {
            during = std::make_unique<VDataReader>(store); // joins the writer's id, without waiting
            EXPECT_EQ(1, Current(*during, "A"));
            EXPECT_EQ(1u, during->GetCurrentChangeId());
        });
    }
    VWorkerThread().Do([&] {
        EXPECT_EQ(1, Current(VDataReader(store), "A")) << "still the state of the other readers";
    });
    other.Do([&] { during.reset(); });
    readers.Do([&] {
        EXPECT_EQ(1, Current(*before, "A"));
        before.reset();
    });

    EXPECT_EQ(2, Current(VDataReader(store), "A"));
    EXPECT_EQ(2u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreLock, SecondWriterWaitsForTheFirstCommit)
{
    VWorkerThread second;
    std::uint64_t secondId = 0;
    {
        VDataWriter writer(store);
        writer.SetValue(Token("A"), Byte(1));
        second.Start([&] {
            ASSERT_TRUE(store.AcquireWriteLock(secondId));
            VDataValue value;
            EXPECT_TRUE(store.GetValue(Token("A"), value, EDataValueTarget::Current));
            EXPECT_TRUE(store.SetValue(Token("B"), Byte(2), EDataValueTarget::Current));
            store.ReleaseWriteLock();
        });
        ASSERT_TRUE(WaitForWaiting(store, 1));
        EXPECT_TRUE(second.Busy());
    }
    ASSERT_TRUE(second.Finish());

    EXPECT_EQ(1u, secondId);
    EXPECT_EQ(2u, VDataReader(store).GetCurrentChangeId());
    EXPECT_EQ(2, Current(VDataReader(store), "B"));
}

TEST_F(DataStoreLock, WritersQueueEachOnItsOwnId)
{
    VWorkerThread workers[3];
    std::uint64_t ids[3] = {0, 0, 0};
    {
        VDataWriter writer(store);
        for (int index = 0; index < 3; ++index) {
            workers[index].Start([this, &ids, index] {
                ASSERT_TRUE(store.AcquireWriteLock(ids[index]));
                store.ReleaseWriteLock();
            });
            ASSERT_TRUE(WaitForWaiting(store, static_cast<std::size_t>(index) + 1));
        }
    }
    for (VWorkerThread& worker : workers) {
        ASSERT_TRUE(worker.Finish());
    }

    EXPECT_EQ(1u, ids[0]);
    EXPECT_EQ(2u, ids[1]);
    EXPECT_EQ(3u, ids[2]);
    EXPECT_EQ(4u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreLock, ReaderJoinsTheSmallestIdWhileAWriterQueues)
{
    VWorkerThread first;
    VWorkerThread second;
    std::unique_ptr<VDataWriter> writer;
    first.Do([&] { writer = std::make_unique<VDataWriter>(store); });
    second.Start([this] { VDataWriter(store).SetValue(Token("B"), Byte(2)); });
    ASSERT_TRUE(WaitForWaiting(store, 1));

    std::uint64_t changeId = 99;
    store.AcquireReadLock(changeId); // does not wait for the one in the queue
    EXPECT_EQ(0u, changeId);
    first.Do([&] { writer.reset(); });
    EXPECT_TRUE(second.Busy()) << "the reader postpones the first commit";
    store.ReleaseReadLock();

    ASSERT_TRUE(second.Finish());
    EXPECT_EQ(2u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreLock, WriterThatComesBackBeforeItsCommitQueues)
{
    VWorkerThread reader;
    reader.Do([this] {
        std::uint64_t changeId = 0;
        store.AcquireReadLock(changeId);
    });
    VWorkerThread writer;
    writer.Do([this] { VDataWriter(store).SetValue(Token("A"), Byte(1)); });
    writer.Start([this] { VDataWriter(store).SetValue(Token("A"), Byte(2)); });
    ASSERT_TRUE(WaitForWaiting(store, 1)) << "its mark is still on the first id";

    reader.Do([this] { store.ReleaseReadLock(); });

    ASSERT_TRUE(writer.Finish());
    EXPECT_EQ(2, Current(VDataReader(store), "A"));
    EXPECT_EQ(2u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreLock, NestedWriteScopesCommitAtTheOutermostEnd)
{
    {
        VDataWriter outer(store);
        {
            VDataWriter inner(store);
            inner.SetValue(Token("A"), Byte(1));
        }
        VWorkerThread().Do([this] { EXPECT_EQ(-1, Current(VDataReader(store), "A")); });
        EXPECT_EQ(1, Current(outer, "A"));
    }
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
    EXPECT_EQ(1u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreLock, MarkOfAnEndedWriterIsNoOtherThreads)
{
    std::uint64_t changeId = 0;
    store.AcquireReadLock(changeId);
    VWorkerThread().Do([this] { VDataWriter(store).SetValue(Token("A"), Byte(1)); });

    // The system likes to give the identifier of an ended thread to the next one.
    const VAssertions assertions(VAssertions::Return);
    for (int round = 0; round < 20; ++round) {
        VWorkerThread().Do([this] {
            const VDataReader reader(store);
            EXPECT_EQ(-1, Current(reader, "A"));
            EXPECT_FALSE(store.SetValue(Token("B"), Byte(1), EDataValueTarget::Current));
        });
    }
    EXPECT_EQ(20u, assertions.Expressions().size());
    store.ReleaseReadLock();
    EXPECT_EQ((Texts{"A"}), Find(VDataReader(store), "*"));
}

TEST_F(DataStoreLock, WriteWithoutTheWriteLockFailsTheAssertionAndChangesNothing)
{
    Set("A", Byte(1));
    std::uint64_t changeId = 0;
    store.AcquireReadLock(changeId);
    VWorkerThread other;
    other.Do([this] {
        std::uint64_t id = 0;
        ASSERT_TRUE(store.AcquireWriteLock(id)); // another thread's lock is no help
    });
    const VAssertions assertions(VAssertions::Return);

    EXPECT_FALSE(store.SetValue(Token("A"), Byte(2), EDataValueTarget::Current));
    EXPECT_FALSE(store.SetValues(VDataPath("A"), Byte(2), EDataValueTarget::Current));
    EXPECT_FALSE(store.Remove(Token("A"), true));
    EXPECT_FALSE(store.RemoveAll(VDataPath("*")));
    EXPECT_FALSE(store.RemoveAllRestorable(VDataPath("*")));
    EXPECT_FALSE(store.SetFlags(Token("A"), 1));
    store.GetListeners(VDataPath("A")).OnAnyChange.Add([] { FAIL(); });
    EXPECT_EQ(0u, std::as_const(store).GetListeners(VDataPath("A")).OnAnyChange.Count());

    EXPECT_EQ(Texts(7, "pDataStoreDelta"), assertions.Expressions());
    for (const std::string& file : assertions.Files()) {
        EXPECT_NE(std::string::npos, file.find("QuorixDataStore/DataStore.cpp"));
    }
    other.Do([this] { store.ReleaseWriteLock(); });
    store.ReleaseReadLock();
    const VDataReader reader(store);
    EXPECT_EQ(1, Current(reader, "A"));
    EXPECT_EQ(0, Flags(reader, "A"));
}

TEST_F(DataStoreLock, ThrowingAssertionHandlerLeavesTheStoreUsable)
{
    {
        const VAssertions assertions(VAssertions::Throw);
        EXPECT_THROW(store.SetValue(Token("A"), Byte(2), EDataValueTarget::Current),
                     std::runtime_error);
        EXPECT_THROW(store.GetListeners(VDataPath("A")), std::runtime_error);
    }
    Set("A", Byte(1));
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreLock, WriterThreadMayChangeUntilItsCommit)
{
    VWorkerThread reader;
    reader.Do([this] {
        std::uint64_t changeId = 0;
        store.AcquireReadLock(changeId);
    });
    VDataWriter(store).SetValue(Token("A"), Byte(1));
    const VAssertions assertions(VAssertions::Return);

    EXPECT_TRUE(store.SetValue(Token("B"), Byte(2), EDataValueTarget::Current));

    reader.Do([this] { store.ReleaseReadLock(); });
    EXPECT_FALSE(store.SetValue(Token("C"), Byte(2), EDataValueTarget::Current));
    EXPECT_EQ((Texts{"pDataStoreDelta"}), assertions.Expressions());
    EXPECT_EQ((Texts{"A", "B"}), Find(VDataReader(store), "*"));
}

TEST_F(DataStoreLock, LocksTellWhoHoldsAndWhoWaits)
{
    VWorkerThread reader;
    reader.Do([this] {
        DebugServices::SetThreadName("Panel Refresh");
        std::uint64_t changeId = 0;
        store.AcquireReadLock(changeId);
        store.AcquireReadLock(changeId);
    });
    VWorkerThread writer;
    writer.Do([this] {
        DebugServices::SetThreadName("Control Heartbeat Monitor0");
        std::uint64_t changeId = 0;
        ASSERT_TRUE(store.AcquireWriteLock(changeId));
        ASSERT_TRUE(store.AcquireWriteLock(changeId));
        store.AcquireReadLock(changeId);
    });
    VWorkerThread waiter;
    waiter.Start([this] {
        DebugServices::SetThreadName("Waiter");
        VDataWriter(static_cast<IDataStore&>(store));
    });
    ASSERT_TRUE(WaitForWaiting(store, 1));

    const std::vector<VDataStoreLock> locks = store.GetLocks();
    ASSERT_EQ(3u, locks.size());
    EXPECT_EQ("Panel Refresh", locks[0].ThreadName);
    EXPECT_EQ(0u, locks[0].ChangeId);
    EXPECT_EQ(2u, locks[0].ReadLocks);
    EXPECT_FALSE(locks[0].WriterMark);
    EXPECT_FALSE(locks[0].Waiting);
    EXPECT_EQ("Control Heartbeat Monitor0", locks[1].ThreadName);
    EXPECT_EQ(1u, locks[1].ReadLocks);
    EXPECT_EQ(2u, locks[1].WriteLocks);
    EXPECT_TRUE(locks[1].WriterMark);
    EXPECT_EQ("Waiter", locks[2].ThreadName);
    EXPECT_EQ(1u, locks[2].ChangeId);
    EXPECT_TRUE(locks[2].Waiting);
    EXPECT_TRUE(locks[2].WriterMark);

    writer.Do([this] {
        store.ReleaseReadLock();
        store.ReleaseWriteLock();
        store.ReleaseWriteLock();
    });
    const std::vector<VDataStoreLock> marked = store.GetLocks();
    ASSERT_EQ(3u, marked.size());
    EXPECT_EQ("Control Heartbeat Monitor0", marked[1].ThreadName);
    EXPECT_EQ(0u, marked[1].WriteLocks);
    EXPECT_TRUE(marked[1].WriterMark) << "its changes wait for the reader";

    reader.Do([this] {
        store.ReleaseReadLock();
        store.ReleaseReadLock();
    });
    ASSERT_TRUE(waiter.Finish());
    EXPECT_TRUE(store.GetLocks().empty());
}

TEST_F(DataStoreLock, LockOfAnEndedThreadIsToldAsSuch)
{
    VWorkerThread().Do([this] {
        std::uint64_t changeId = 0;
        store.AcquireReadLock(changeId); // lost for ever: the fault that the list is to show
    });

    ASSERT_EQ(1u, store.GetLocks().size());
    EXPECT_EQ("(a thread that has ended)", store.GetLocks()[0].ThreadName);
}

TEST_F(DataStoreLock, ManyThreadsKeepCountsOfTheirOwn)
{
    constexpr int threadCount = 8;
    VWorkerThread workers[threadCount];
    for (VWorkerThread& worker : workers) {
        worker.Do([this] {
            std::uint64_t changeId = 0;
            store.AcquireReadLock(changeId);
            store.AcquireReadLock(changeId);
        });
    }
    VDataWriter(store).SetValue(Token("A"), Byte(1));
    for (int index = threadCount - 1; index >= 0; --index) {
        EXPECT_EQ(static_cast<std::size_t>(index) + 2, store.GetLocks().size()) << "with the mark";
        workers[index].Do([this] {
            store.ReleaseReadLock();
            store.ReleaseReadLock();
        });
    }
    EXPECT_TRUE(store.GetLocks().empty());
    EXPECT_EQ(1u, VDataReader(store).GetCurrentChangeId());
}

} // namespace
