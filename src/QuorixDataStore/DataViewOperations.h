#pragma once

#include "DebugServices/AssertFailHandler.h"
#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/IDataStore.h"
#include "QuorixDataStore/IDataWriter.h"

#include <cstdlib>
#include <utility>

/// What the four views share. Each checks its pointer first, as a view may have been moved from.
namespace DataViewDetail {

/// Raises the assertion, for the file and line of a view's own operation.
#define KVR_CHECK_DATA_STORE(otherwise)                                                            \
    do {                                                                                           \
        if (this->m_pDataStore == nullptr) {                                                       \
            DebugServices::CallAssertFailHandler("m_pDataStore != nullptr", __FILE__, __LINE__);   \
            return otherwise;                                                                      \
        }                                                                                          \
    } while (false)

/// The reading operations of a view whose interface is `Interface`, over a store that is const in
/// the reading views. Taking and releasing the lock is the view's own.
template <typename Interface, typename Store>
class VReadOperations : public Interface
{
public:
    VReadOperations(const VReadOperations&) = delete;
    VReadOperations& operator=(const VReadOperations&) = delete;

    using Interface::GetDataStore;

    const IDataStore& GetDataStore() const override { return CheckedStore(); }

    bool FindTokens(const VDataPath& path, std::vector<VDataToken>& tokens) const override
    {
        KVR_CHECK_DATA_STORE(false);
        return m_pDataStore->FindTokens(path, tokens);
    }

    std::uint64_t GetChildCount(const VDataPath& path) const override
    {
        KVR_CHECK_DATA_STORE(0);
        return m_pDataStore->GetChildCount(path);
    }

    bool HasChild(const VDataPath& path, const std::string& name) const override
    {
        KVR_CHECK_DATA_STORE(false);
        return m_pDataStore->HasChild(path, name);
    }

    bool GetChildren(const VDataPath& path, std::vector<std::string>& names) const override
    {
        KVR_CHECK_DATA_STORE(false);
        return m_pDataStore->GetChildren(path, names);
    }

    bool HasValue(const VDataToken& token) const override
    {
        KVR_CHECK_DATA_STORE(false);
        return m_pDataStore->HasValue(token);
    }

    bool GetValue(const VDataToken& token, VDataValue& value) const override
    {
        KVR_CHECK_DATA_STORE(false);
        return m_pDataStore->GetValue(token, value, EDataValueTarget::Current);
    }

    VDataValue GetValue(const VDataToken& token) const override
    {
        VDataValue value;
        KVR_CHECK_DATA_STORE(value);
        // The result is in the value: a missing item gives an empty one.
        static_cast<void>(m_pDataStore->GetValue(token, value, EDataValueTarget::Current));
        return value;
    }

    bool GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const override
    {
        KVR_CHECK_DATA_STORE(false);
        return m_pDataStore->GetSchema(token, schema);
    }

    bool GetFlags(const VDataToken& token, std::uint32_t& flags) const override
    {
        KVR_CHECK_DATA_STORE(false);
        return m_pDataStore->GetFlags(token, flags);
    }

    std::uint64_t GetPathChangeId(const VDataPath& path) const override
    {
        std::uint64_t changeId = 0;
        KVR_CHECK_DATA_STORE(changeId);
        return m_pDataStore->GetPathChangeId(path, changeId) ? changeId : 0;
    }

    std::uint64_t GetItemChangeId(const VDataToken& token) const override
    {
        std::uint64_t changeId = 0;
        KVR_CHECK_DATA_STORE(changeId);
        return m_pDataStore->GetItemChangeId(token, changeId) ? changeId : 0;
    }

    std::uint64_t GetCurrentChangeId() const override
    {
        KVR_CHECK_DATA_STORE(0);
        return m_pDataStore->GetCurrentChangeId();
    }

protected:
    explicit VReadOperations(Store* store) : m_pDataStore(store) {}

    /// Takes the pointer, and with it the duty to release; written by hand, since the interfaces
    /// have a virtual base.
    VReadOperations(VReadOperations&& other) noexcept
        : m_pDataStore(std::exchange(other.m_pDataStore, nullptr))
    {
    }

    ~VReadOperations() override = default;

    /// Returns the store, or aborts once the assertion handler has returned: there is no other
    /// store that a reference could name.
    Store& CheckedStore() const
    {
        if (m_pDataStore == nullptr) {
            DebugServices::CallAssertFailHandler("m_pDataStore != nullptr", __FILE__, __LINE__);
            std::abort();
        }
        return *m_pDataStore;
    }

    Store* m_pDataStore; // not owned; null once the view was moved from
};

/// The writing operations of a view whose interface is `Interface`, beside the reading ones.
template <typename Interface>
class VWriteOperations : public VReadOperations<Interface, IDataStore>
{
public:
    using VReadOperations<Interface, IDataStore>::GetDataStore;

    IDataStore& GetDataStore() override { return this->CheckedStore(); }

    VDataListeners& GetListeners(const VDataToken& token) override
    {
        KVR_CHECK_DATA_STORE(NoListeners());
        return this->m_pDataStore->GetListeners(token.GetPath());
    }

    VDataListeners& GetListeners(const VDataPath& path) override
    {
        KVR_CHECK_DATA_STORE(NoListeners());
        return this->m_pDataStore->GetListeners(path);
    }

    bool SetValue(const VDataToken& token, const VDataValue& value) override
    {
        KVR_CHECK_DATA_STORE(false);
        return this->m_pDataStore->SetValue(token, value, EDataValueTarget::Current);
    }

    bool Remove(const VDataToken& token) override
    {
        KVR_CHECK_DATA_STORE(false);
        return this->m_pDataStore->Remove(token, false);
    }

    bool RemoveAll(const VDataPath& path) override
    {
        KVR_CHECK_DATA_STORE(false);
        return this->m_pDataStore->RemoveAll(path);
    }

    bool RemoveAllRestorable(const VDataPath& path) override
    {
        KVR_CHECK_DATA_STORE(false);
        return this->m_pDataStore->RemoveAllRestorable(path);
    }

    bool SetFlags(const VDataToken& token, std::uint32_t flags) override
    {
        KVR_CHECK_DATA_STORE(false);
        return this->m_pDataStore->SetFlags(token, flags);
    }

protected:
    using VReadOperations<Interface, IDataStore>::VReadOperations;

    VWriteOperations(VWriteOperations&& other) noexcept = default;
    ~VWriteOperations() override = default;

private:
    /// Returns a record that nobody fires, for what is added after a failed assertion.
    static VDataListeners& NoListeners()
    {
        static VDataListeners listeners;
        return listeners;
    }
};

/// Takes a store's read lock for a view. @return the store, null if it was null
const IDataStore* LockForReading(const IDataStore* store);

/// Takes a store's write lock for a view.
///
/// @return the store, null if it was null or if this thread holds a read lock; either fails an
/// assertion
IDataStore* LockForWriting(IDataStore* store);

} // namespace DataViewDetail
