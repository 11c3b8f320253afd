#include "QuorixDataStore/DataViewOperations.h"

namespace DataViewDetail {

const IDataStore* LockForReading(const IDataStore* store)
{
    if (store == nullptr) {
        DebugServices::CallAssertFailHandler("m_pDataStore != nullptr", __FILE__, __LINE__);
        return nullptr;
    }
    std::uint64_t changeId = 0;
    store->AcquireReadLock(changeId);
    return store;
}

IDataStore* LockForWriting(IDataStore* store)
{
    if (store == nullptr) {
        DebugServices::CallAssertFailHandler("m_pDataStore != nullptr", __FILE__, __LINE__);
        return nullptr;
    }
    std::uint64_t changeId = 0;
    if (!store->AcquireWriteLock(changeId)) {
        DebugServices::CallAssertFailHandler(
            "Fatal attempt to acquire a write lock from within a read lock.", __FILE__, __LINE__);
        // Without the lock the view must not release one: it could be an outer view's.
        return nullptr;
    }
    return store;
}

} // namespace DataViewDetail
