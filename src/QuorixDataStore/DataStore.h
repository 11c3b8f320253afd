#pragma once

#include "QuorixDataStore/ChangeLocks.h"
#include "QuorixDataStore/IDataStore.h"

#include <memory>
#include <vector>

class DataStoreDelta;
class VDataStoreHub;

/// A store: the front of a hub, which several stores may share. See `IDataStore`.
///
/// Owns: a share of the hub, and with it of the data. Threads: every operation [any].
class VDataStore : public IDataStore
{
public:
    /// Makes an empty store.
    VDataStore();

    /// Fronts the data of an existing hub, which must not be null.
    explicit VDataStore(std::shared_ptr<VDataStoreHub> sharedHub);

    ~VDataStore() override;

    void AcquireReadLock(std::uint64_t& changeId) const override;
    void ReleaseReadLock() const override;
    bool AcquireWriteLock(std::uint64_t& changeId) override;
    void ReleaseWriteLock() override;
    VDataListeners& GetListeners(const VDataPath& path) override;
    const VDataListeners& GetListeners(const VDataPath& path) const override;
    bool FindTokens(const VDataPath& path, std::vector<VDataToken>& tokens) const override;
    std::uint64_t GetChildCount(const VDataPath& path) const override;
    bool HasChild(const VDataPath& path, const std::string& name) const override;
    bool GetChildren(const VDataPath& path, std::vector<std::string>& names) const override;
    bool HasValue(const VDataToken& token) const override;
    bool GetValue(const VDataToken& token, VDataValue& value,
                  EDataValueTarget target) const override;
    bool GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const override;
    bool GetFlags(const VDataToken& token, std::uint32_t& flags) const override;
    bool GetPathChangeId(const VDataPath& path, std::uint64_t& changeId) const override;
    bool GetItemChangeId(const VDataToken& token, std::uint64_t& changeId) const override;
    std::uint64_t GetCurrentChangeId() const override;
    bool SetValue(const VDataToken& token, const VDataValue& value,
                  EDataValueTarget target) override;
    bool SetValues(const VDataPath& path, const VDataValue& value,
                   EDataValueTarget target) override;
    bool Remove(const VDataToken& token, bool restorable) override;
    bool RemoveAll(const VDataPath& path) override;
    bool RemoveAllRestorable(const VDataPath& path) override;
    bool SetFlags(const VDataToken& token, std::uint32_t flags) override;

    /// Returns who holds and who waits for the store at this moment, for diagnosis. It may be
    /// called without a lock, and while others are stuck. [any]
    std::vector<VDataStoreLock> GetLocks() const;

private:
    const std::shared_ptr<VDataStoreHub> hub;
};
