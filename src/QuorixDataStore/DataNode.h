#pragma once

#include "QuorixDataStore/DataItem.h"

#include <boost/container/map.hpp>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>

struct VDataItemDelta;

/// One node of the committed tree.
///
/// Threads: read under a lock of the store and changed by its commit. The two pending fields belong
/// to the writer's thread alone: a pending change is found from its node without a search, while
/// readers look at the other fields.
struct VDataNode
{
    /// By the bytes of the names, as paths are ordered. The nodes lie in the map itself, which,
    /// unlike the standard's, allows for a type that is not complete yet.
    using VChildren = boost::container::map<std::string, VDataNode, std::less<>>;

    explicit VDataNode(VDataNode* parent) : Parent(parent) {}

    VDataNode(const VDataNode&) = delete;
    VDataNode& operator=(const VDataNode&) = delete;

    VChildren Children;

    // What a write and its commit touch lies beside the item.
    VDataNode* Parent;                 ///< null at the root
    std::uint64_t ChangeId = 0;        ///< of the last commit that changed something here or below
    VDataItemDelta* Pending = nullptr; ///< the pending change of this node's item
    std::size_t PendingCount = 0;      ///< that one, and the children that have a count themselves
    std::optional<VDataItem> Item;
};
