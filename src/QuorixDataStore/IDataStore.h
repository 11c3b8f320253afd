#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataToken.h"
#include "QuorixDataStore/DataValueFlags.h"
#include "QuorixDataStore/DataValueTarget.h"
#include "io/DataValue.h"

#include <cstdint>
#include <string>
#include <vector>

struct VDataListeners;

/// A tree of typed items with many readers and one writer at a time. Application code does not call
/// it but through the views, which take and release the locks.
///
/// A lock belongs to a change id, the number of the committed state. Nothing of that state changes
/// while anybody holds a lock on it: what a writer does stays with his thread until the last holder
/// has left, and is then committed as a whole under the next id.
///
/// Threads: every operation [any], under a lock of the calling thread: a read or write lock for
/// what reads, the write lock for what changes and for making listeners. The store does not check
/// for a read lock. A change from a thread that is not the writer fails the assertion
/// "pDataStoreDelta"; where the handler returns, the result is false and nothing is changed.
/// Failure: false, with store and pending changes as they were; lists are empty then, flags 0, the
/// bytes of values empty, and other results untouched.
class IDataStore
{
public:
    virtual ~IDataStore() = default;

    /// Takes a read lock on the oldest state that is in use. Counted: a thread may nest it, also
    /// inside a write lock, and releases each on the same thread.
    ///
    /// @param changeId  receives the id of the state that the thread now reads
    virtual void AcquireReadLock(std::uint64_t& changeId) const = 0;

    /// Lets go of one read lock; a thread that holds none changes nothing. The last one to go
    /// commits what the writer of the same state has left, and calls the listeners.
    virtual void ReleaseReadLock() const = 0;

    /// Takes the write lock, after every earlier writer's changes have been committed, without
    /// limit of time. Readers of the same state do not hinder it. Counted, as the read lock.
    ///
    /// @param changeId  receives the id of the state that the thread now reads and changes
    /// @return false, with nothing acquired, if this thread holds a read lock: no upgrading
    virtual bool AcquireWriteLock(std::uint64_t& changeId) = 0;

    /// Lets go of one write lock, as `ReleaseReadLock` does. While readers hold the same state, the
    /// changes wait for the last of them, and this thread goes on seeing them.
    virtual void ReleaseWriteLock() = 0;

    /// Returns the listeners of a path, made at first use, at an address that stays as long as the
    /// store's data. A "*" stands for one component, a last one for any number of further ones.
    virtual VDataListeners& GetListeners(const VDataPath& path) = 0;

    /// As above without making any: a path without listeners gives an empty record. [any], no lock
    virtual const VDataListeners& GetListeners(const VDataPath& path) const = 0;

    /// Finds the visible items of a path: committed ones in the order of the tree, then those that
    /// this thread's pending changes add. "A.*.C" finds C below each child of A, "A.*" everything
    /// below A, but not A itself.
    ///
    /// @return whether there are any
    virtual bool FindTokens(const VDataPath& path, std::vector<VDataToken>& tokens) const = 0;

    /// Returns the number of child nodes; with pending changes the number of all items below, at
    /// any depth. 0 for a path with a wildcard.
    virtual std::uint64_t GetChildCount(const VDataPath& path) const = 0;

    virtual bool HasChild(const VDataPath& path, const std::string& name) const = 0;

    /// Finds the names of the children, in order. @return whether there are any
    virtual bool GetChildren(const VDataPath& path, std::vector<std::string>& names) const = 0;

    /// True if the item has a proposed or a verified value. An item of whose pending change only
    /// the flags are known says false.
    virtual bool HasValue(const VDataToken& token) const = 0;

    /// Reads the value that the target means; see `DataItemUtils`.
    virtual bool GetValue(const VDataToken& token, VDataValue& value,
                          EDataValueTarget target) const = 0;

    /// Reads the schema that the item's values have, also of an item that is removed in this scope.
    virtual bool GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const = 0;

    virtual bool GetFlags(const VDataToken& token, std::uint32_t& flags) const = 0;

    /// Reads the change id at which something at or below a path last changed; a "*" is allowed at
    /// its end. What is still pending counts as the next id.
    virtual bool GetPathChangeId(const VDataPath& path, std::uint64_t& changeId) const = 0;

    /// As above for one item.
    virtual bool GetItemChangeId(const VDataToken& token, std::uint64_t& changeId) const = 0;

    /// Returns the change id, plus 1 if this thread has pending changes.
    virtual std::uint64_t GetCurrentChangeId() const = 0;

    /// Records a value. An item keeps the schema that it first got, but for the name of a type.
    ///
    /// @return false for an empty token or value, another schema, or an unknown target of an item
    /// with VerifyRequired; true also where the value is the visible one, which records nothing
    virtual bool SetValue(const VDataToken& token, const VDataValue& value,
                          EDataValueTarget target) = 0;

    /// Records the value for every item that `FindTokens` gives. @return false if any was refused
    virtual bool SetValues(const VDataPath& path, const VDataValue& value,
                           EDataValueTarget target) = 0;

    /// Records that the item goes.
    ///
    /// @param restorable  a later write of the committed value cancels the removal
    virtual bool Remove(const VDataToken& token, bool restorable) = 0;

    /// Records that every item goes that `FindTokens` gives. @return false if any did not exist
    virtual bool RemoveAll(const VDataPath& path) = 0;

    /// As `RemoveAll`, restorable: a load that then writes mostly what was there changes little.
    virtual bool RemoveAllRestorable(const VDataPath& path) = 0;

    /// Records flags, for an item that does not exist too, which is then made without a value.
    virtual bool SetFlags(const VDataToken& token, std::uint32_t flags) = 0;
};
