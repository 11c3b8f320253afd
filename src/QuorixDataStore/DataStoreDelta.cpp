#include "QuorixDataStore/DataStoreDelta.h"

#include "QuorixDataStore/DataItemUtils.h"
#include "QuorixDataStore/DataValueFlags.h"
#include "utils/LogStatement.h"

#include <algorithm>
#include <utility>

namespace {

constexpr std::size_t maximumSpareRecords = 1024;

} // namespace

bool DataStoreDelta::HasNode(const VDataPath& path, const VDataNode* node) const
{
    if (path.Empty()) {
        return !Empty(); // the root is always there, and else everybody would see a change
    }
    if (node != nullptr && node->PendingCount > 0) {
        return true;
    }
    const auto next = created.lower_bound(path);
    return next != created.end() && next->first.StartsWith(path);
}

bool DataStoreDelta::RecordValue(const VDataAddress& address, EDataValueTarget target,
                                 const VDataValue& value)
{
    VDataItemDelta& record = FindOrMake(address);
    const std::uint32_t committedFlags = address.Item != nullptr ? address.Item->Flags : 0;
    if (!DataItemUtils::Write(address.Path, target, record.Flags.value_or(committedFlags), value,
                              record.Proposed, record.Verified)) {
        EraseIfEmpty(record); // only one that was made here holds nothing
        return false;
    }
    record.Removed = false;
    return true;
}

void DataStoreDelta::RecordRemoval(const VDataAddress& address, bool restorable)
{
    VDataItemDelta& record = FindOrMake(address);
    VDataItemDelta::Empty(record.Proposed);
    VDataItemDelta::Empty(record.Verified);
    record.Removed = true;
    record.Restorable = restorable;
    record.Flags.reset();
}

void DataStoreDelta::RecordFlags(const VDataAddress& address, std::uint32_t flags)
{
    VDataItemDelta& record = FindOrMake(address);
    const std::uint32_t committedFlags = address.Item != nullptr ? address.Item->Flags : 0;
    DataItemUtils::MoveForFlags(record.Flags.value_or(committedFlags), flags, record.Proposed,
                                record.Verified);
    record.Flags = flags;
    record.Removed = false;
}

bool DataStoreDelta::RestoreRecord(VDataItemDelta& record, const VDataAddress& address,
                                   EDataValueTarget target, const VDataValue& value)
{
    const std::uint32_t flags = record.Flags.value_or(address.Item->Flags);
    // Deliberate: a value that differs from the committed one is told as done without a trace.
    // After a restorable removal the first write is recorded before it comes here, so that only a
    // second one is dropped; loads, which write each item once, rely on the first.
    if (target == EDataValueTarget::Verified || (flags & EDataValueFlags::VerifyRequired) == 0) {
        if (value != address.Item->Verified) {
            return true;
        }
        VDataItemDelta::Empty(record.Verified);
    } else if (target == EDataValueTarget::Proposed || target == EDataValueTarget::Current) {
        if (value != address.Item->Proposed) {
            return true;
        }
        VDataItemDelta::Empty(record.Proposed);
    } else {
        KVR_LOG("DataStore", 2, "Unknown value target while trying to unset value '%1%'.",
                address.Path.Text());
        return true;
    }
    EraseIfEmpty(record);
    return true;
}

bool DataStoreDelta::RestoreFlags(const VDataAddress& address, std::uint32_t flags)
{
    VDataItemDelta* record = FindRecord(address);
    if (record == nullptr || !record->Restorable || flags != address.Item->Flags) {
        return false;
    }
    if (record->Flags) {
        DataItemUtils::MoveForFlags(*record->Flags, address.Item->Flags, record->Proposed,
                                    record->Verified);
        record->Flags.reset();
    }
    EraseIfEmpty(*record);
    return true;
}

const VDataItemDelta* DataStoreDelta::FindCreated(const VDataPath& path) const
{
    const auto found = created.find(path);
    return found == created.end() ? nullptr : found->second.get();
}

VDataItemDelta& DataStoreDelta::Make(const VDataAddress& address)
{
    const std::uint64_t itemIdentifier = address.Item != nullptr ? address.Item->ItemIdentifier : 0;
    foreign = foreign || (address.Item != nullptr && address.Item->Node != address.Node);

    if (address.Node == nullptr) {
        auto owned = std::make_unique<VDataItemDelta>();
        VDataItemDelta& record = *owned;
        record.Path = address.Path;
        record.ItemIdentifier = itemIdentifier;
        created.emplace(address.Path, std::move(owned));
        return record;
    }
    if (attachedCount == attached.size()) {
        attached.push_back(std::make_unique<VDataItemDelta>());
    }
    VDataItemDelta& record = *attached[attachedCount];
    record.ItemIdentifier = itemIdentifier;
    record.Position = attachedCount++;
    record.Node = address.Node;
    record.Node->Pending = &record;
    for (VDataNode* node = record.Node; node != nullptr && node->PendingCount++ == 0;) {
        node = node->Parent;
    }
    return record;
}

void DataStoreDelta::EraseIfEmpty(VDataItemDelta& record)
{
    if (!record.HasValue() && !record.Removed && !record.Flags) {
        Erase(record);
    }
}

void DataStoreDelta::Erase(VDataItemDelta& record)
{
    if (record.Node == nullptr) {
        created.erase(VDataPath(record.Path)); // a copy: the record goes first
        return;
    }
    Detach(record);
    record.Renew();
    // The last one takes its place, and it becomes the first to be used again.
    const std::size_t position = record.Position;
    --attachedCount;
    attached[attachedCount]->Position = position;
    std::swap(attached[position], attached[attachedCount]);
}

std::vector<VDataItemDelta*> DataStoreDelta::InPathOrder() const
{
    std::vector<VDataItemDelta*> records;
    for (std::size_t position = 0; position < attachedCount; ++position) {
        records.push_back(attached[position].get());
    }
    for (const auto& [path, record] : created) {
        records.push_back(record.get());
    }
    std::sort(records.begin(), records.end(),
              [](const VDataItemDelta* left, const VDataItemDelta* right) {
                  return left->GetPath() < right->GetPath();
              });
    return records;
}

/// Lets go of the records, all of which are as new, and of most of their memory.
void DataStoreDelta::Clear()
{
    attachedCount = 0;
    if (attached.size() > maximumSpareRecords) {
        attached.resize(maximumSpareRecords);
        attached.shrink_to_fit();
    }
    created.clear();
    foreign = false;
}
