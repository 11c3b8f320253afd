#include "QuorixDataStore/DataStoreHub.h"

#include "QuorixDataStore/DataCommit.h"
#include "QuorixDataStore/StoreThread.h"
#include "QuorixDataStore/TimedLock.h"
#include "utils/LogStatement.h"

#include <memory>

namespace {

constexpr double longWaitMilliseconds = 10.0; // shorter waits are everyday and silent

const DataStoreDelta& NoChanges()
{
    static const DataStoreDelta& none = *new DataStoreDelta; // for threads that outlive main
    return none;
}

const VDataListeners& NoListeners()
{
    static const VDataListeners& none = *new VDataListeners; // as above
    return none;
}

} // namespace

VDataStoreHub::VDataStoreHub() : noChanges(NoChanges()) {}
VDataStoreHub::~VDataStoreHub() = default;

void VDataStoreHub::AcquireReadLock(std::uint64_t& changeId)
{
    const std::uint64_t thread = StoreThread::Key();
    VTimedLock lock(stateMutex);
    changeId = changeLocks.AddReader(thread, committed.GetChangeId());
    while (committed.GetChangeId() != changeId) {
        StoreThread::RefreshName();
        lock.Wait(changeSignal);
    }
    lock.Unlock();

    const double waited = lock.Waited();
    if (waited >= longWaitMilliseconds) {
        KVR_LOG("DataStore", 3, "Took %1%ms to acquire read-lock on change id %2%", waited,
                changeId);
    }
}

void VDataStoreHub::ReleaseReadLock()
{
    Release(&VChangeLocks::RemoveReader);
}

bool VDataStoreHub::AcquireWriteLock(std::uint64_t& changeId)
{
    const std::uint64_t thread = StoreThread::Key();
    std::uint64_t result = 0;
    VTimedLock lock(stateMutex);
    if (!changeLocks.AddWriter(thread, committed.GetChangeId(), result)) {
        return false;
    }
    activeWriter.store(changeLocks.ActiveWriter(), std::memory_order_relaxed);
    while (committed.GetChangeId() != result) {
        StoreThread::RefreshName();
        lock.Wait(changeSignal);
    }
    lock.Unlock();

    changeId = result;
    const double waited = lock.Waited();
    if (waited >= longWaitMilliseconds) {
        KVR_LOG("DataStore", 3, "Took %1%ms to acquire write-lock on change id %2%", waited,
                changeId);
    }
    return true;
}

void VDataStoreHub::ReleaseWriteLock()
{
    Release(&VChangeLocks::RemoveWriter);
}

VDataListeners& VDataStoreHub::MakeListeners(const VDataPath& path)
{
    const KVR::VMutexLock lock(stateMutex);
    return listenerTree.FindOrMake(path);
}

const VDataListeners& VDataStoreHub::FindListeners(const VDataPath& path) const
{
    const KVR::VMutexLock lock(stateMutex);
    const VDataListeners* found = listenerTree.Find(path);
    return found != nullptr ? *found : NoListeners();
}

std::vector<VDataStoreLock> VDataStoreHub::GetLocks() const
{
    const KVR::VMutexLock lock(stateMutex);
    return changeLocks.List(committed.GetChangeId());
}

void VDataStoreHub::Release(bool (VChangeLocks::*remove)(std::uint64_t))
{
    const std::uint64_t thread = StoreThread::Key();
    // From the last holder's leaving to the end of the commit nobody may come in between: he would
    // read a tree that changes.
    VTimedLock lock(stateMutex);
    if (!(changeLocks.*remove)(thread)) {
        return;
    }
    VDataCommit commit(committed, listenerTree, pendingPaths);
    commit.Run(delta);
    activeWriter.store(changeLocks.ActiveWriter(), std::memory_order_relaxed);
    std::shared_ptr<const KVR::VShared> self;
    if (!commit.Firings().Empty()) {
        self = shared_from_this(); // a listener may let go of the store
    }
    lock.Unlock();

    changeSignal.notify_all();
    commit.Firings().Fire();
}
