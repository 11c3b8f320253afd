#include "QuorixDataStore/ChangeLocks.h"

#include "QuorixDataStore/StoreThread.h"

#include <algorithm>

std::uint64_t VChangeLocks::AddReader(std::uint64_t thread, std::uint64_t currentChangeId)
{
    VThreadLocks& locks = FindOrMakeThread(thread);
    if (locks.ReadLocks > 0) {
        ++locks.ReadLocks;
        return currentChangeId;
    }
    if (entries.empty()) {
        entries.push_back({currentChangeId, 0, 0});
    }
    VChangeLockEntry& smallest = entries.front();
    ++locks.ReadLocks;
    ++smallest.Holders;
    locks.ChangeId = smallest.ChangeId;
    return smallest.ChangeId;
}

bool VChangeLocks::AddWriter(std::uint64_t thread, std::uint64_t currentChangeId,
                             std::uint64_t& changeId)
{
    // A thread that holds the write lock too is refused all the same: there is no upgrading.
    VThreadLocks* existing = FindThread(thread);
    if (existing != nullptr && existing->ReadLocks > 0) {
        return false;
    }
    if (existing != nullptr) {
        ++existing->WriteLocks;
        changeId = currentChangeId;
        return true;
    }
    threads.push_back({thread, 0, 0, 0});
    VThreadLocks& locks = threads.back();
    if (entries.empty()) {
        entries.push_back({currentChangeId, 0, 0});
    } else if (entries.back().Writer != 0) {
        entries.push_back({entries.back().ChangeId + 1, 0, 0});
    }
    VChangeLockEntry& largest = entries.back(); // readers may hold it, a writer does not
    largest.Writer = thread;
    ++largest.Holders;
    ++locks.WriteLocks;
    locks.ChangeId = largest.ChangeId;
    changeId = largest.ChangeId;
    return true;
}

bool VChangeLocks::RemoveReader(std::uint64_t thread)
{
    VThreadLocks* locks = FindThread(thread);
    if (locks == nullptr || locks->ReadLocks == 0) {
        return false;
    }
    return --locks->ReadLocks == 0 && RemoveHolder(*locks);
}

bool VChangeLocks::RemoveWriter(std::uint64_t thread)
{
    VThreadLocks* locks = FindThread(thread);
    if (locks == nullptr || locks->WriteLocks == 0) {
        return false;
    }
    return --locks->WriteLocks == 0 && RemoveHolder(*locks);
}

std::uint64_t VChangeLocks::ActiveWriter() const
{
    return entries.empty() ? 0 : entries.front().Writer;
}

std::vector<VDataStoreLock> VChangeLocks::List(std::uint64_t currentChangeId) const
{
    std::vector<VDataStoreLock> list;
    for (const VThreadLocks& locks : threads) {
        VDataStoreLock lock;
        lock.ThreadName = StoreThread::NameOf(locks.Thread);
        lock.ChangeId = locks.ChangeId;
        lock.ReadLocks = locks.ReadLocks;
        lock.WriteLocks = locks.WriteLocks;
        lock.Waiting = locks.ChangeId != currentChangeId;
        lock.WriterMark = locks.WriteLocks > 0 ||
                          (ActiveWriter() == locks.Thread && locks.ChangeId == currentChangeId);
        list.push_back(std::move(lock));
    }
    // A writer that has let go while readers still keep his changes from being committed.
    const std::uint64_t writer = ActiveWriter();
    const bool listed = std::any_of(threads.begin(), threads.end(), [&](const VThreadLocks& locks) {
        return locks.Thread == writer && locks.ChangeId == currentChangeId;
    });
    if (writer != 0 && !listed) {
        VDataStoreLock lock;
        lock.ThreadName = StoreThread::NameOf(writer);
        lock.ChangeId = currentChangeId;
        lock.WriterMark = true;
        list.push_back(std::move(lock));
    }
    std::stable_sort(list.begin(), list.end(),
                     [](const VDataStoreLock& left, const VDataStoreLock& right) {
                         return left.ChangeId < right.ChangeId;
                     });
    return list;
}

VChangeLocks::VThreadLocks& VChangeLocks::FindOrMakeThread(std::uint64_t thread)
{
    if (VThreadLocks* locks = FindThread(thread)) {
        return *locks;
    }
    threads.push_back({thread, 0, 0, 0});
    return threads.back();
}

VChangeLocks::VThreadLocks* VChangeLocks::FindThread(std::uint64_t thread)
{
    const auto found = std::find_if(threads.begin(), threads.end(), [&](const VThreadLocks& locks) {
        return locks.Thread == thread;
    });
    return found == threads.end() ? nullptr : &*found;
}

/// Takes one holder off the smallest entry, on which all holders are: the others wait.
///
/// @return true if that was the last one, and the entry had a writer
bool VChangeLocks::RemoveHolder(VThreadLocks& locks)
{
    if (locks.ReadLocks == 0 && locks.WriteLocks == 0) {
        locks = threads.back();
        threads.pop_back();
    }
    VChangeLockEntry& smallest = entries.front();
    if (--smallest.Holders > 0) {
        return false;
    }
    const bool hadWriter = smallest.Writer != 0;
    entries.erase(entries.begin());
    return hadWriter;
}
