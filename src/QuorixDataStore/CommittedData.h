#pragma once

#include "QuorixDataStore/DataNode.h"
#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataToken.h"
#include "QuorixDataStore/ItemFinder.h"
#include "QuorixDataStore/ItemIndex.h"

#include <cstdint>

/// The committed tree: what every reader sees.
///
/// Owns: nodes and items. Threads: read under a lock of the store; changed only by the commit, when
/// nobody holds a lock on the current change id, which is why it needs no mutex of its own.
class VCommittedData
{
public:
    VCommittedData();
    ~VCommittedData();

    VCommittedData(const VCommittedData&) = delete;
    VCommittedData& operator=(const VCommittedData&) = delete;

    /// Returns the random number by which tokens recognise this store.
    std::uint64_t GetStoreIdentifier() const { return storeIdentifier; }

    std::uint64_t GetChangeId() const { return changeId; }

    /// Counts one commit. @return the new change id
    std::uint64_t AdvanceChangeId() { return ++changeId; }

    /// Finds the item of a token, by its numbers where they are this store's, else by its path, and
    /// leaves in the token what was found.
    ///
    /// @param ofPath  receives whether the item is known to be the one at the token's path
    /// @return null if there is none
    VDataItem* Resolve(const VDataToken& token, bool& ofPath) const
    {
        ofPath = false;
        if (!token.IsValid()) {
            return nullptr;
        }
        const VDataTokenNumbers numbers = token.GetNumbers();
        if (numbers.StoreIdentifier == storeIdentifier && numbers.ItemIdentifier != 0) {
            if (VDataItem* item = index.Find(numbers.ItemIdentifier)) {
                ofPath = numbers.OfPath;
                return item;
            }
        }
        ofPath = true;
        return ResolveByPath(token);
    }

    VDataItem* FindItem(std::uint64_t itemIdentifier) const { return index.Find(itemIdentifier); }

    /// Returns the node at a path, the root for the empty one, or null.
    const VDataNode* FindNode(const VDataPath& path) const;
    VDataNode* FindNode(const VDataPath& path);

    /// Calls `visitor` for each item that a path with or without wildcards names, in the order of
    /// the tree.
    template <typename Visitor>
    void ForEachItem(const VDataPath& path, Visitor visitor) const
    {
        VItemFinder<Visitor>(path, visitor).Run(root);
    }

    /// Returns the item at a path; where there is none, one is made with the next identifier.
    VDataItem& FindOrMakeItem(const VDataPath& path);

    /// Destroys a node's item, with the nodes that have become empty by that, and gives the change
    /// id to those above.
    ///
    /// @param path  the node's; the node may be gone afterwards
    void RemoveItem(VDataNode& node, const VDataPath& path);

    /// Gives the change id to a node and those above, up to the first that has it.
    void Touch(VDataNode& node)
    {
        for (VDataNode* above = &node; above != nullptr && above->ChangeId < changeId;
             above = above->Parent) {
            above->ChangeId = changeId;
        }
    }

private:
    VDataItem* ResolveByPath(const VDataToken& token) const;

    VDataNode root{nullptr};
    const std::uint64_t storeIdentifier;
    std::uint64_t changeId = 0;
    std::uint64_t nextItemIdentifier = 1;
    VItemIndex index;
};
