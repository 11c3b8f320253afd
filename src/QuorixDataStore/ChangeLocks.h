#pragma once

#include <cstdint>
#include <string>
#include <vector>

/// One thread that holds or waits for a store, for diagnosis.
struct VDataStoreLock
{
    std::string ThreadName;
    std::uint64_t ChangeId = 0;   ///< the state that it holds or waits for
    std::uint64_t ReadLocks = 0;  ///< how deep its read locks are nested
    std::uint64_t WriteLocks = 0; ///< how deep its write locks are nested
    bool Waiting = false;         ///< for the commits before that state
    bool WriterMark = false; ///< that state's changes are this thread's, also after its release
};

/// The tables of who holds which change id.
///
/// Every holder is on the smallest id in use, which is the current one; an id above it has a writer
/// that waits for the commits before.
/// Owns: nothing else. Threads: guarded by its owner. Threads are known by `StoreThread` keys.
class VChangeLocks
{
public:
    /// Counts a read lock. @return the change id that the thread joins
    std::uint64_t AddReader(std::uint64_t thread, std::uint64_t currentChangeId);

    /// Counts a write lock.
    ///
    /// @param changeId  receives the id that the thread will write; it is to wait until that is the
    /// current one
    /// @return false, with nothing changed, if the thread holds a read lock
    bool AddWriter(std::uint64_t thread, std::uint64_t currentChangeId, std::uint64_t& changeId);

    /// Uncounts a read lock. @return true if a writer's changes are to be committed now
    bool RemoveReader(std::uint64_t thread);

    /// Uncounts a write lock. @return true if a writer's changes are to be committed now
    bool RemoveWriter(std::uint64_t thread);

    /// Returns the writer of the current change id, 0 for none.
    std::uint64_t ActiveWriter() const;

    /// Returns who holds and who waits, those with the smaller id first.
    std::vector<VDataStoreLock> List(std::uint64_t currentChangeId) const;

private:
    /// One change id in use.
    struct VChangeLockEntry
    {
        std::uint64_t ChangeId;
        std::uint64_t Holders; // readers and the writer together
        std::uint64_t Writer;  // 0 for none; stays after his release
    };

    /// One thread that holds or waits. Few are there at a time, so that looking through all is the
    /// quickest way to find one.
    struct VThreadLocks
    {
        std::uint64_t Thread;
        std::uint64_t ChangeId;
        std::uint64_t ReadLocks;
        std::uint64_t WriteLocks;
    };

    VThreadLocks& FindOrMakeThread(std::uint64_t thread);
    VThreadLocks* FindThread(std::uint64_t thread);
    bool RemoveHolder(VThreadLocks& locks);

    std::vector<VThreadLocks> threads;
    std::vector<VChangeLockEntry> entries; // by change id, ascending and without gaps
};
