#pragma once

#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataPath.h"

#include <boost/container/small_vector.hpp>

#include <functional>
#include <map>
#include <memory>
#include <string>

/// One node of the tree of listener paths. A "*" of a path leads to the wildcard child.
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
/// Owns: nodes and records. Threads: guarded by its owner.
class VListenerTree
{
public:
    /// Returns the record of a path, made if there is none.
    VDataListeners& FindOrMake(const VDataPath& path);

    /// Returns the record of a path, or null.
    const VDataListeners* Find(const VDataPath& path) const;

    /// Appends the records that hear of a path, some perhaps twice. An empty path, or one with a
    /// wildcard, is nobody's.
    void Collect(const VDataPath& path, VDataListenersList& listeners) const;

    /// True until the first record is made: then nobody needs to collect.
    bool Empty() const { return empty; }

private:
    static void CollectFrom(const VDataListenerNode& node, const VDataPath& path, std::size_t index,
                            VDataListenersList& listeners);

    VDataListenerNode root;
    bool empty = true;
};
