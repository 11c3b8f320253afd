#pragma once

#include "QuorixDataStore/IDataReader.h"

struct VDataListeners;

/// A view that also changes: what it records is committed as a whole once nobody holds the state
/// any more. See `IDataReader` for threads and failures.
class IDataWriter : public virtual IDataReader
{
public:
    using IDataReader::GetDataStore;

    /// Returns the store of this view; on a view that was moved from the process is aborted.
    virtual IDataStore& GetDataStore() = 0;

    /// Returns the listeners of the token's path, at an address that outlives the view.
    virtual VDataListeners& GetListeners(const VDataToken& token) = 0;
    virtual VDataListeners& GetListeners(const VDataPath& path) = 0;

    virtual bool SetValue(const VDataToken& token, const VDataValue& value) = 0;
    virtual bool Remove(const VDataToken& token) = 0;
    virtual bool RemoveAll(const VDataPath& path) = 0;
    virtual bool RemoveAllRestorable(const VDataPath& path) = 0;
    virtual bool SetFlags(const VDataToken& token, std::uint32_t flags) = 0;
};
