#pragma once

#include "QuorixDataStore/DataNode.h"
#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataValueTarget.h"
#include "io/DataValue.h"

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <utility>
#include <vector>

/// What a token stands for: its path, the committed item that was found, and the node at that path
/// if it has an item. Item and node belong together but for a token whose numbers name another
/// item.
struct VDataAddress
{
    const VDataPath& Path;
    VDataItem* Item = nullptr;
    VDataNode* Node = nullptr;
};

/// One pending change of one item.
struct VDataItemDelta
{
    VDataPath Path;                   ///< of a new item; a committed one has its own
    std::uint64_t ItemIdentifier = 0; ///< of the item when the record was made, 0 for a new item
    VDataValue Proposed;              ///< empty means no change
    VDataValue Verified;              ///< empty means no change
    bool Removed = false;
    bool Restorable = false; ///< a later write of the committed value cancels this record
    std::optional<std::uint32_t> Flags;

    VDataNode* Node = nullptr; ///< the committed node that points here, or null
    std::size_t Position = 0;  ///< among the records of committed items

    const VDataPath& GetPath() const { return Node != nullptr ? Node->Item->Path : Path; }
    bool HasValue() const { return !Proposed.Empty() || !Verified.Empty(); }

    /// Empties a value, and keeps its memory if that is little.
    static void Empty(VDataValue& value)
    {
        value.Schema = nullptr;
        if (!value.Bytes.empty()) {
            value.Bytes.clear();
            if (value.Bytes.capacity() > 64) {
                value.Bytes.shrink_to_fit();
            }
        }
    }

    /// Makes the record as new, but for the memory of its values.
    void Renew()
    {
        Empty(Proposed);
        Empty(Verified);
        Removed = false;
        Restorable = false;
        Flags.reset();
    }
};

/// The pending changes of the one writer: a record for each path that he touched.
///
/// Records of committed items hang on their nodes, so that they are found without a search; those
/// of new items are ordered by path, which is the order of a tree with the same shape.
/// Owns: the records. Threads: the writer's, until the commit, which nobody else can be beside.
/// Failure: an unknown target is logged, as `DataItemUtils` does.
class DataStoreDelta
{
public:
    DataStoreDelta() = default;
    ~DataStoreDelta() = default;

    DataStoreDelta(const DataStoreDelta&) = delete;
    DataStoreDelta& operator=(const DataStoreDelta&) = delete;

    bool Empty() const { return attachedCount == 0 && created.empty(); }

    /// Returns the record of a path, or null.
    const VDataItemDelta* Find(const VDataAddress& address) const
    {
        return address.Node != nullptr ? address.Node->Pending : FindCreated(address.Path);
    }

    /// True if there is a record at a path or below it.
    ///
    /// @param node  the committed node at the path, or null
    bool HasNode(const VDataPath& path, const VDataNode* node) const;

    /// Calls `visitor` for each record of a path without a committed item that is at a path or
    /// below it, in the order of paths.
    template <typename Visitor>
    void ForEachCreated(const VDataPath& path, Visitor visitor) const
    {
        for (auto at = created.lower_bound(path); at != created.end() && at->first.StartsWith(path);
             ++at) {
            visitor(*at->second);
        }
    }

    /// Records a value under the target, by the record's flags or else the committed ones; the item
    /// is then no longer removed.
    ///
    /// @return false, with nothing changed, for an unknown target of an item with VerifyRequired
    bool RecordValue(const VDataAddress& address, EDataValueTarget target, const VDataValue& value);

    /// Records that the item goes; values and flags that were recorded for it are forgotten.
    void RecordRemoval(const VDataAddress& address, bool restorable);

    /// Records flags, and moves the recorded values as VerifyRequired asks for; the item is then no
    /// longer removed.
    void RecordFlags(const VDataAddress& address, std::uint32_t flags);

    /// Cancels the pending change of a restorable record by a write of the committed value.
    ///
    /// Deliberate: a write that differs from the committed value is dropped in silence and still
    /// counts as done; see the source.
    /// @return false if there is nothing to restore, and the value is to be recorded
    bool RestoreValue(const VDataAddress& address, EDataValueTarget target, const VDataValue& value)
    {
        VDataItemDelta* record = FindRecord(address);
        return record != nullptr && record->Restorable &&
               RestoreRecord(*record, address, target, value);
    }

    /// Cancels the pending flags of a restorable record by a write of the committed flags.
    ///
    /// @return false if there is nothing to restore, and the flags are to be recorded
    bool RestoreFlags(const VDataAddress& address, std::uint32_t flags);

    /// Calls `visitor` for each record, its path and the node that it hung on, if any: those of
    /// committed items first, then the new ones in the order of paths. Each is taken off its node
    /// before, and the delta is left empty. The path may be the item's own.
    template <typename Visitor>
    void Consume(Visitor visitor)
    {
        const auto visit = [&](VDataItemDelta& record) {
            const VDataPath& path = record.GetPath();
            visitor(record, path, Detach(record));
            record.Renew(); // at once, while the processor still has it at hand
        };
        if (foreign) {
            for (VDataItemDelta* record : InPathOrder()) {
                visit(*record);
            }
        } else {
            for (std::size_t position = 0; position < attachedCount; ++position) {
                visit(*attached[position]);
            }
            for (const auto& [path, record] : created) {
                visit(*record);
            }
        }
        Clear();
    }

private:
    const VDataItemDelta* FindCreated(const VDataPath& path) const;
    VDataItemDelta* FindRecord(const VDataAddress& address)
    {
        return const_cast<VDataItemDelta*>(std::as_const(*this).Find(address));
    }
    bool RestoreRecord(VDataItemDelta& record, const VDataAddress& address, EDataValueTarget target,
                       const VDataValue& value);
    VDataItemDelta& Make(const VDataAddress& address);
    VDataItemDelta& FindOrMake(const VDataAddress& address)
    {
        VDataItemDelta* record = FindRecord(address);
        return record != nullptr ? *record : Make(address);
    }
    void EraseIfEmpty(VDataItemDelta& record);
    void Erase(VDataItemDelta& record);
    std::vector<VDataItemDelta*> InPathOrder() const;
    void Clear();

    /// Takes a record off its node. @return the node, or null if it hung on none
    static VDataNode* Detach(VDataItemDelta& record)
    {
        VDataNode* node = record.Node;
        record.Node = nullptr;
        if (node != nullptr) {
            node->Pending = nullptr;
            for (VDataNode* above = node; above != nullptr && --above->PendingCount == 0;) {
                above = above->Parent;
            }
        }
        return node;
    }

    // The records of committed items by `Position`, and behind them some to be used again, with the
    // memory of their values.
    std::vector<std::unique_ptr<VDataItemDelta>> attached;
    std::size_t attachedCount = 0;

    std::map<VDataPath, std::unique_ptr<VDataItemDelta>> created; // where no item is committed
    bool foreign = false; // a token's numbers named another item than its path: order matters
};
