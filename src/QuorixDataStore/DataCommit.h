#pragma once

#include "QuorixDataStore/CommittedData.h"
#include "QuorixDataStore/DataStoreDelta.h"
#include "QuorixDataStore/ListenerTree.h"

#include <boost/container/small_vector.hpp>

#include <unordered_set>

/// What a commit has to call once no mutex is held: each record at most once per kind.
///
/// Owns: nothing. Threads: the one that let go last.
class VDataFirings
{
public:
    /// Which callback of a record, in the order of firing.
    enum EKind { Removed, ProposalPending, VerifiedChanged, FlagsChanged };

    void Add(EKind kind, VDataListeners* listeners) { firings.push_back({kind, listeners}); }

    bool Empty() const { return firings.empty(); }

    /// Drops what was added twice and puts the rest in order.
    void Sort();

    /// Calls everything, and then `OnAnyChange` of each record. What a listener throws is logged.
    void Fire() const noexcept;

private:
    struct VFiring
    {
        EKind Kind;
        VDataListeners* Listeners;
    };

    boost::container::small_vector<VFiring, 8> firings;
};

/// Folds what is pending into the committed tree. Folding cannot fail.
///
/// Owns: nothing; made for one commit. Threads: whoever let go last, with the state mutex held.
class VDataCommit
{
public:
    /// @param unverified  the paths whose proposed values await verification, kept up to date
    VDataCommit(VCommittedData& tree, VListenerTree& listeners,
                std::unordered_set<VDataPath, VDataPathQuickHash>& unverified)
        : committed(tree), listenerTree(listeners), pendingPaths(unverified)
    {
    }

    /// Counts the change id up and leaves the delta empty.
    void Run(DataStoreDelta& delta);

    /// Returns what to fire once the mutex is released.
    const VDataFirings& Firings() const { return firings; }

private:
    void Fold(VDataItemDelta& record, const VDataPath& path, VDataNode* node);
    void FoldRemoval(const VDataPath& path, VDataNode* node);
    VDataItem& FindItem(const VDataItemDelta& record, const VDataPath& path, VDataNode* node);
    void CollectForRecord(const VDataItemDelta& record, const VDataPath& path);
    void Collect(const VDataPath& path, VDataFirings::EKind kind);

    VCommittedData& committed;
    VListenerTree& listenerTree;
    std::unordered_set<VDataPath, VDataPathQuickHash>& pendingPaths;
    VDataFirings firings;
    VDataListenersList collected; // for one path at a time
};
