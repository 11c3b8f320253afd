#include "QuorixDataStore/DataStore.h"

#include "DebugServices/AssertFailHandler.h"
#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataStoreHub.h"
#include "notification/MakeShared.h"

#include <utility>

namespace {

/// Finds the pending changes for a write, or fails the assertion and gives null: the calling thread
/// is not the writer.
DataStoreDelta* CheckedDelta(VDataStoreHub& hub)
{
    DataStoreDelta* pDataStoreDelta = hub.WriterDelta();
    if (pDataStoreDelta == nullptr) {
        DebugServices::CallAssertFailHandler("pDataStoreDelta", __FILE__, __LINE__);
    }
    return pDataStoreDelta;
}

/// Returns a record that nobody fires, for what is added after a failed assertion.
VDataListeners& ThrowAwayListeners()
{
    static VDataListeners& listeners = *new VDataListeners; // for threads that outlive main
    return listeners;
}

} // namespace

VDataStore::VDataStore() : VDataStore(KVR::MakeShared<VDataStoreHub>()) {}

VDataStore::VDataStore(std::shared_ptr<VDataStoreHub> sharedHub) : hub(std::move(sharedHub)) {}

VDataStore::~VDataStore() = default;

void VDataStore::AcquireReadLock(std::uint64_t& changeId) const
{
    hub->AcquireReadLock(changeId);
}

void VDataStore::ReleaseReadLock() const
{
    hub->ReleaseReadLock();
}

bool VDataStore::AcquireWriteLock(std::uint64_t& changeId)
{
    return hub->AcquireWriteLock(changeId);
}

void VDataStore::ReleaseWriteLock()
{
    hub->ReleaseWriteLock();
}

VDataListeners& VDataStore::GetListeners(const VDataPath& path)
{
    return CheckedDelta(*hub) != nullptr ? hub->MakeListeners(path) : ThrowAwayListeners();
}

const VDataListeners& VDataStore::GetListeners(const VDataPath& path) const
{
    return hub->FindListeners(path);
}

bool VDataStore::FindTokens(const VDataPath& path, std::vector<VDataToken>& tokens) const
{
    return hub->Visible().FindTokens(path, tokens);
}

std::uint64_t VDataStore::GetChildCount(const VDataPath& path) const
{
    return hub->Visible().GetChildCount(path);
}

bool VDataStore::HasChild(const VDataPath& path, const std::string& name) const
{
    return hub->Visible().HasChild(path, name);
}

bool VDataStore::GetChildren(const VDataPath& path, std::vector<std::string>& names) const
{
    return hub->Visible().GetChildren(path, names);
}

bool VDataStore::HasValue(const VDataToken& token) const
{
    return hub->Visible().HasValue(token);
}

bool VDataStore::GetValue(const VDataToken& token, VDataValue& value, EDataValueTarget target) const
{
    return hub->Visible().GetValue(token, value, target);
}

bool VDataStore::GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const
{
    return hub->Visible().GetSchema(token, schema);
}

bool VDataStore::GetFlags(const VDataToken& token, std::uint32_t& flags) const
{
    return hub->Visible().GetFlags(token, flags);
}

bool VDataStore::GetPathChangeId(const VDataPath& path, std::uint64_t& changeId) const
{
    return hub->Visible().GetPathChangeId(path, changeId);
}

bool VDataStore::GetItemChangeId(const VDataToken& token, std::uint64_t& changeId) const
{
    return hub->Visible().GetItemChangeId(token, changeId);
}

std::uint64_t VDataStore::GetCurrentChangeId() const
{
    return hub->Visible().GetCurrentChangeId();
}

bool VDataStore::SetValue(const VDataToken& token, const VDataValue& value, EDataValueTarget target)
{
    DataStoreDelta* pending = CheckedDelta(*hub);
    return pending != nullptr && hub->Changes(*pending).SetValue(token, value, target);
}

bool VDataStore::SetValues(const VDataPath& path, const VDataValue& value, EDataValueTarget target)
{
    DataStoreDelta* pending = CheckedDelta(*hub);
    return pending != nullptr && hub->Changes(*pending).SetValues(path, value, target);
}

bool VDataStore::Remove(const VDataToken& token, bool restorable)
{
    DataStoreDelta* pending = CheckedDelta(*hub);
    return pending != nullptr && hub->Changes(*pending).Remove(token, restorable);
}

bool VDataStore::RemoveAll(const VDataPath& path)
{
    DataStoreDelta* pending = CheckedDelta(*hub);
    return pending != nullptr && hub->Changes(*pending).RemoveEach(path, false);
}

bool VDataStore::RemoveAllRestorable(const VDataPath& path)
{
    DataStoreDelta* pending = CheckedDelta(*hub);
    return pending != nullptr && hub->Changes(*pending).RemoveEach(path, true);
}

bool VDataStore::SetFlags(const VDataToken& token, std::uint32_t flags)
{
    DataStoreDelta* pending = CheckedDelta(*hub);
    return pending != nullptr && hub->Changes(*pending).SetFlags(token, flags);
}

std::vector<VDataStoreLock> VDataStore::GetLocks() const
{
    return hub->GetLocks();
}
