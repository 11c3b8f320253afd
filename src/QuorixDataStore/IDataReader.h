#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataToken.h"
#include "QuorixDataStore/DataValueFlags.h"
#include "io/DataValue.h"

#include <cstdint>
#include <string>
#include <vector>

class IDataStore;

/// The reading side of a view: a lock of the store, held as long as the view lives.
///
/// The value of an item is always the one that its user asked for last, confirmed or not.
/// Threads: the one that made the view. Failure: as `IDataStore` tells. A view that was moved from
/// fails the assertion "m_pDataStore != nullptr", and where the handler returns gives false, 0 or
/// nothing.
class IDataReader
{
public:
    virtual ~IDataReader() = default;

    /// Returns the store of this view; on a view that was moved from the process is aborted.
    virtual const IDataStore& GetDataStore() const = 0;

    virtual bool FindTokens(const VDataPath& path, std::vector<VDataToken>& tokens) const = 0;
    virtual std::uint64_t GetChildCount(const VDataPath& path) const = 0;
    virtual bool HasChild(const VDataPath& path, const std::string& name) const = 0;
    virtual bool GetChildren(const VDataPath& path, std::vector<std::string>& names) const = 0;
    virtual bool HasValue(const VDataToken& token) const = 0;
    virtual bool GetValue(const VDataToken& token, VDataValue& value) const = 0;

    /// Returns the value, or an empty one with a null schema where there is none.
    virtual VDataValue GetValue(const VDataToken& token) const = 0;

    virtual bool GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const = 0;
    virtual bool GetFlags(const VDataToken& token, std::uint32_t& flags) const = 0;

    /// Returns the id, or 0 where nothing is found.
    virtual std::uint64_t GetPathChangeId(const VDataPath& path) const = 0;

    /// Returns the id, or 0 where nothing is found.
    virtual std::uint64_t GetItemChangeId(const VDataToken& token) const = 0;

    virtual std::uint64_t GetCurrentChangeId() const = 0;
};
