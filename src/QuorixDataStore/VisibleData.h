#pragma once

#include "QuorixDataStore/CommittedData.h"
#include "QuorixDataStore/DataItemUtils.h"
#include "QuorixDataStore/DataStoreDelta.h"

#include <cstdint>
#include <string>
#include <vector>

/// What a thread sees: the committed data, overlaid with its pending changes, which are empty
/// unless it is the writer. The operations are those of `IDataStore`, which tells what they do.
///
/// Owns: nothing; made for one call. Threads: as `IDataStore`.
class VVisibleData
{
public:
    VVisibleData(const VCommittedData& committedData, const DataStoreDelta& changes)
        : committed(committedData), delta(changes)
    {
    }

    bool FindTokens(const VDataPath& wanted, std::vector<VDataToken>& tokens) const;
    std::uint64_t GetChildCount(const VDataPath& path) const;
    bool HasChild(const VDataPath& path, const std::string& name) const;
    bool GetChildren(const VDataPath& path, std::vector<std::string>& names) const;
    bool HasValue(const VDataToken& token) const;
    bool GetValue(const VDataToken& token, VDataValue& value, EDataValueTarget target) const;
    bool GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const;
    bool GetFlags(const VDataToken& token, std::uint32_t& flags) const;
    bool GetPathChangeId(const VDataPath& path, std::uint64_t& changeId) const;
    bool GetItemChangeId(const VDataToken& token, std::uint64_t& changeId) const;
    std::uint64_t GetCurrentChangeId() const;

    /// Finds the committed item of a token, and the node of its path.
    VDataAddress Address(const VDataToken& token) const
    {
        bool ofPath = false;
        VDataAddress address{token.GetPath()};
        address.Item = committed.Resolve(token, ofPath);
        if (address.Item == nullptr) {
            return address;
        }
        // Numbers may name another item than the path; what is pending goes by the path.
        address.Node = ofPath || address.Item->Path == address.Path ? address.Item->Node
                                                                    : FindItemNode(address.Path);
        return address;
    }

    /// Returns the record of pending changes, or null.
    const VDataItemDelta* Pending(const VDataAddress& address) const
    {
        return delta.Empty() ? nullptr : delta.Find(address);
    }

    /// True if there is an item, or will be, by what is pending.
    static bool Exists(const VDataAddress& address, const VDataItemDelta* record)
    {
        return record != nullptr ? !record->Removed : address.Item != nullptr;
    }

    /// Returns the value that is seen under a target, or null; logs as `DataItemUtils` does.
    static const VDataValue* FindValue(const VDataAddress& address, const VDataItemDelta* record,
                                       EDataValueTarget target)
    {
        const VDataItem* item = address.Item;
        const VDataValue* found = nullptr;
        if (item != nullptr) {
            found = DataItemUtils::ChooseForRead(address.Path, target, item->Flags, item->Proposed,
                                                 item->Verified);
        }
        if (record != nullptr) {
            const std::uint32_t flags = record->Flags.value_or(item != nullptr ? item->Flags : 0);
            const VDataValue* pending = DataItemUtils::ChooseForRead(
                address.Path, target, flags, record->Proposed, record->Verified);
            if (pending != nullptr && !pending->Empty()) {
                found = pending; // an empty one leaves the committed value in place
            }
        }
        return found != nullptr && !found->Empty() ? found : nullptr;
    }

    /// Returns the schema that a value of the item must have, or null if any will do.
    static const KVR::IO::ISchema* FindSchema(const VDataAddress& address,
                                              const VDataItemDelta* record)
    {
        const KVR::IO::ISchema* schema = nullptr;
        if (address.Item != nullptr) {
            schema = SchemaOf(address.Item->Proposed, address.Item->Verified);
        }
        if (schema == nullptr && record != nullptr) {
            schema = SchemaOf(record->Proposed, record->Verified);
        }
        return schema;
    }

private:
    /// Returns the schema of the first of two values that is not empty, or null.
    static const KVR::IO::ISchema* SchemaOf(const VDataValue& proposed, const VDataValue& verified)
    {
        const VDataValue& value = proposed.Empty() ? verified : proposed;
        if (value.Empty()) {
            return nullptr;
        }
        return value.Schema != nullptr ? value.Schema : value.EffectiveSchema();
    }

    VDataNode* FindItemNode(const VDataPath& path) const;
    std::vector<VDataToken> TokensBelow(const VDataPath& path) const;

    const VCommittedData& committed;
    const DataStoreDelta& delta;
};
