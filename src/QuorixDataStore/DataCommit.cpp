#include "QuorixDataStore/DataCommit.h"

#include "QuorixDataStore/DataItemUtils.h"
#include "utils/LogStatement.h"

#include <algorithm>
#include <exception>
#include <functional>
#include <utility>

namespace {

/// Calls the functions of one record and kind. It runs in a view's destructor, from which nothing
/// may leave, and the store is consistent already.
void CallListeners(NotificationSystem::VMultiCallback<void()>& callback)
{
    try {
        callback();
    } catch (const std::exception& error) {
        KVR_LOG("DataStore", 2, "A listener has thrown: %1%", error.what());
    } catch (...) {
        KVR_LOG("DataStore", 2, "A listener has thrown what is no exception of the library.");
    }
}

/// Gives a pending value to an item; the record keeps the old memory, to use it again.
void Take(VDataValue& item, VDataValue& pending)
{
    std::swap(item.Schema, pending.Schema);
    item.Bytes.swap(pending.Bytes);
}

NotificationSystem::VMultiCallback<void()>& Callback(VDataListeners& listeners,
                                                     VDataFirings::EKind kind)
{
    switch (kind) {
    case VDataFirings::Removed:
        return listeners.OnRemoved;
    case VDataFirings::ProposalPending:
        return listeners.OnProposalPending;
    case VDataFirings::VerifiedChanged:
        return listeners.OnVerifiedChanged;
    case VDataFirings::FlagsChanged:
        break;
    }
    return listeners.OnFlagsChanged;
}

} // namespace

void VDataFirings::Sort()
{
    if (firings.size() < 2) {
        return;
    }
    std::sort(firings.begin(), firings.end(), [](const VFiring& left, const VFiring& right) {
        return left.Kind != right.Kind
                   ? left.Kind < right.Kind
                   : std::less<VDataListeners*>()(left.Listeners, right.Listeners);
    });
    const auto same = [](const VFiring& left, const VFiring& right) {
        return left.Kind == right.Kind && left.Listeners == right.Listeners;
    };
    firings.erase(std::unique(firings.begin(), firings.end(), same), firings.end());
}

void VDataFirings::Fire() const noexcept
{
    VDataListenersList fired;
    for (const VFiring& firing : firings) {
        CallListeners(Callback(*firing.Listeners, firing.Kind));
        fired.push_back(firing.Listeners);
    }
    if (fired.size() > 1) {
        std::sort(fired.begin(), fired.end(), std::less<VDataListeners*>());
        fired.erase(std::unique(fired.begin(), fired.end()), fired.end());
    }
    for (VDataListeners* listeners : fired) {
        CallListeners(listeners->OnAnyChange);
    }
}

void VDataCommit::Run(DataStoreDelta& delta)
{
    committed.AdvanceChangeId(); // for no change too: the id counts write locks
    if (delta.Empty()) {
        return;
    }
    delta.Consume([&](VDataItemDelta& record, const VDataPath& path, VDataNode* node) {
        CollectForRecord(record, path);
        if (record.Removed) {
            FoldRemoval(path, node);
        } else {
            Fold(record, path, node);
        }
    });
    // Deliberate: every path that awaits verification is told again at each commit with changes,
    // whatever that was about. So the hardware's side is reminded of what it has missed.
    if (!listenerTree.Empty()) {
        for (const VDataPath& path : pendingPaths) {
            Collect(path, VDataFirings::ProposalPending);
        }
    }
    firings.Sort();
}

void VDataCommit::Fold(VDataItemDelta& record, const VDataPath& path, VDataNode* node)
{
    VDataItem& item = FindItem(record, path, node);
    committed.Touch(*item.Node);
    if (record.Flags) {
        DataItemUtils::MoveForFlags(item.Flags, *record.Flags, item.Proposed, item.Verified);
        item.Flags = *record.Flags;
    }
    if (!record.Proposed.Empty()) {
        Take(item.Proposed, record.Proposed);
    }
    if (!record.Verified.Empty()) {
        Take(item.Verified, record.Verified);
    }
    if (!item.Proposed.Empty()) {
        if (DataItemUtils::Equal(item.Proposed, item.Verified)) {
            pendingPaths.erase(path);
        } else {
            pendingPaths.insert(path);
        }
    }
}

void VDataCommit::FoldRemoval(const VDataPath& path, VDataNode* node)
{
    // The item's own path goes with it.
    const VDataPath kept(path); // NOLINT(performance-unnecessary-copy-initialization)
    if (node == nullptr) {
        node = committed.FindNode(kept);
    }
    if (node != nullptr && node->Item) {
        committed.RemoveItem(*node, kept);
    }
    pendingPaths.erase(kept);
}

VDataItem& VDataCommit::FindItem(const VDataItemDelta& record, const VDataPath& path,
                                 VDataNode* node)
{
    if (node != nullptr && node->Item && node->Item->ItemIdentifier == record.ItemIdentifier) {
        return *node->Item;
    }
    if (record.ItemIdentifier != 0) {
        if (VDataItem* item = committed.FindItem(record.ItemIdentifier)) {
            return *item;
        }
    }
    return committed.FindOrMakeItem(path);
}

void VDataCommit::CollectForRecord(const VDataItemDelta& record, const VDataPath& path)
{
    if (listenerTree.Empty()) {
        return;
    }
    if (record.Removed) {
        Collect(path, VDataFirings::Removed);
        return;
    }
    if (!record.Verified.Empty()) {
        Collect(path, VDataFirings::VerifiedChanged);
    }
    if (record.Flags) {
        Collect(path, VDataFirings::FlagsChanged);
    }
}

void VDataCommit::Collect(const VDataPath& path, VDataFirings::EKind kind)
{
    collected.clear();
    listenerTree.Collect(path, collected);
    for (VDataListeners* listeners : collected) {
        firings.Add(kind, listeners);
    }
}
