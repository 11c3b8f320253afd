#pragma once

#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataPath.h"

#include <boost/container/small_vector.hpp>

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <unordered_map>

/// One node of the tree of listener paths with wildcards. A "*" leads to the wildcard child.
struct VDataListenerNode
{
    std::map<std::string, std::unique_ptr<VDataListenerNode>, std::less<>> Children;
    std::unique_ptr<VDataListeners> Listeners;
    std::unique_ptr<VDataListenerNode> Wildcard;
};

/// Some records; in most commits there are few.
using VDataListenersList = boost::container::small_vector<VDataListeners*, 8>;

/// The listeners of every path that somebody asked for. Nothing is ever removed, so that each
/// record stays at its address.
///
/// Most listeners name one item, and a commit finds these without a walk through the tree.
/// Owns: nodes and records. Threads: guarded by its owner.
class VListenerTree
{
public:
    VListenerTree() = default;
    ~VListenerTree();

    VListenerTree(const VListenerTree&) = delete;
    VListenerTree& operator=(const VListenerTree&) = delete;

    /// Returns the record of a path, made if there is none.
    VDataListeners& FindOrMake(const VDataPath& path);

    /// Returns the record of a path, or null.
    const VDataListeners* Find(const VDataPath& path) const;

    /// Appends the records that hear of a path, some perhaps twice. An empty path, or one with a
    /// wildcard, is nobody's.
    void Collect(const VDataPath& path, VDataListenersList& listeners);

    /// True until the first record is made: then nobody needs to collect.
    bool Empty() const { return named.empty() && !hasWildcards; }

private:
    VDataListeners& FindOrMakeWildcard(const VDataPath& path);
    const VDataListeners* FindWildcard(const VDataPath& path) const;
    void CollectByWildcards(const VDataPath& path, VDataListenersList& listeners) const;

    std::unordered_map<VDataPath, VDataListeners, VDataPathQuickHash>
        named;              // those without a wildcard
    VDataListenerNode root; // of those with one
    bool hasWildcards = false;
};
