#pragma once

#include "QuorixDataStore/DataStore.h"
#include "WorkerThread.h"

#include <cstddef>

namespace StoreTest {

/// Waits until as many threads as told wait for the store.
inline bool WaitForWaiting(const VDataStore& store, std::size_t count)
{
    return Eventually([&] {
        std::size_t waiting = 0;
        for (const VDataStoreLock& lock : store.GetLocks()) {
            waiting += lock.Waiting ? 1 : 0;
        }
        return waiting == count;
    });
}

} // namespace StoreTest
