#pragma once

#include "QuorixDataStore/ChangeLocks.h"
#include "QuorixDataStore/CommittedData.h"
#include "QuorixDataStore/DataChanges.h"
#include "QuorixDataStore/DataStoreDelta.h"
#include "QuorixDataStore/ListenerTree.h"
#include "QuorixDataStore/StoreThread.h"
#include "QuorixDataStore/VisibleData.h"
#include "notification/Shared.h"
#include "utils/Mutex.h"

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <unordered_set>
#include <vector>

/// What stores that front the same data share: the committed tree, the pending changes, the locks
/// by change id and the listeners.
///
/// Owns: all of that; it must be destroyed with no lock held.
/// Threads: every operation [any]. The state mutex guards the lock tables, the listeners and the
/// commit. Reads need no mutex: the committed tree only changes when nobody holds a lock on the
/// current change id, and the pending changes are the writer's until then.
/// Failure: a listener that throws is logged, and the listeners after it are called all the same.
class VDataStoreHub : public KVR::VShared
{
public:
    VDataStoreHub();
    ~VDataStoreHub() override;

    VDataStoreHub(const VDataStoreHub&) = delete;
    VDataStoreHub& operator=(const VDataStoreHub&) = delete;

    /// See `IDataStore` for these four.
    void AcquireReadLock(std::uint64_t& changeId);
    void ReleaseReadLock();
    bool AcquireWriteLock(std::uint64_t& changeId);
    void ReleaseWriteLock();

    /// Returns the listeners of a path, which stay at their address as long as this object.
    VDataListeners& MakeListeners(const VDataPath& path);
    const VDataListeners& FindListeners(const VDataPath& path) const;

    /// Returns what the calling thread sees; it must hold a lock.
    VVisibleData Visible() const { return VVisibleData(committed, IsWriter() ? delta : noChanges); }

    /// Returns the pending changes if the calling thread is the writer, also after its release and
    /// until the commit; else null.
    DataStoreDelta* WriterDelta() { return IsWriter() ? &delta : nullptr; }

    /// Returns the means to change what is pending.
    VDataChanges Changes(DataStoreDelta& pending) const { return VDataChanges(committed, pending); }

    /// Returns who holds and who waits at this moment, for diagnosis.
    std::vector<VDataStoreLock> GetLocks() const;

private:
    bool IsWriter() const
    {
        return activeWriter.load(std::memory_order_relaxed) == StoreThread::Key();
    }

    void Release(bool (VChangeLocks::*remove)(std::uint64_t));

    mutable KVR::VMutex stateMutex;       // only that of the threads' names is taken under it
    std::condition_variable changeSignal; // to all, when the change id has advanced
    VChangeLocks changeLocks KVR_GUARDED_BY(stateMutex);

    // The writer of the smallest change id in use, 0 for none; changed together with the tables.
    // A thread compares it with its own key, which only it can have put there by taking the lock,
    // so that reading needs no mutex.
    std::atomic<std::uint64_t> activeWriter{0};

    VCommittedData committed; // see the class for what guards these two
    DataStoreDelta delta;

    const DataStoreDelta& noChanges; // always empty: what everybody but the writer has pending

    VListenerTree listenerTree KVR_GUARDED_BY(stateMutex);
    std::unordered_set<VDataPath, VDataPathQuickHash> pendingPaths KVR_GUARDED_BY(stateMutex);
};
