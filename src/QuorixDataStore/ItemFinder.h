#pragma once

#include "QuorixDataStore/DataNode.h"
#include "QuorixDataStore/DataPath.h"

#include <boost/container/small_vector.hpp>

#include <cstddef>

/// Visits the items that a path with or without wildcards names, in the order of the tree.
///
/// Owns: where it stands. It does not recurse, as a path may have any length.
template <typename Visitor>
class VItemFinder
{
public:
    VItemFinder(const VDataPath& wanted, Visitor called)
        : path(wanted), count(wanted.Count()), wholeSubtree(wanted.Last() == "*"), visitor(called)
    {
    }

    /// An empty path names nothing.
    void Run(const VDataNode& root)
    {
        if (count == 0) {
            return;
        }
        Descend(root, 0);
        while (!levels.empty()) {
            VLevel& level = levels.back();
            if (level.Next == level.End) {
                levels.pop_back();
            } else {
                const std::size_t position = level.Position;
                const VDataNode& child = (level.Next++)->second;
                Descend(child, position);
            }
        }
    }

private:
    /// The children of one node that are still to be visited, and which component comes next.
    struct VLevel
    {
        VDataNode::VChildren::const_iterator Next;
        VDataNode::VChildren::const_iterator End;
        std::size_t Position;
    };

    /// Follows the named components from a node, up to the next wildcard or the end of the path.
    void Descend(const VDataNode& from, std::size_t position)
    {
        const VDataNode* node = &from;
        for (; position < count && path.Component(position) != "*"; ++position) {
            const auto child = node->Children.find(path.Component(position));
            if (child == node->Children.end()) {
                return;
            }
            node = &child->second;
        }
        const bool atEnd = position == count;
        if (atEnd && node->Item) {
            visitor(*node->Item);
        }
        if ((!atEnd || wholeSubtree) && !node->Children.empty()) {
            levels.push_back(
                {node->Children.begin(), node->Children.end(), atEnd ? position : position + 1});
        }
    }

    const VDataPath& path;
    const std::size_t count;
    const bool wholeSubtree;
    Visitor visitor;
    boost::container::small_vector<VLevel, 16> levels;
};
