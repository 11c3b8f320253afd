#include "QuorixDataStore/ListenerTree.h"

#include <utility>
#include <vector>

namespace {

constexpr std::string_view wildcard = "*";

void Add(const VDataListenerNode& node, VDataListenersList& listeners)
{
    if (node.Listeners) {
        listeners.push_back(node.Listeners.get());
    }
}

} // namespace

VListenerTree::~VListenerTree()
{
    // Without recursion: a path may have any length.
    std::vector<std::unique_ptr<VDataListenerNode>> nodes;
    const auto takeBelow = [&nodes](VDataListenerNode& node) {
        for (auto& [name, child] : node.Children) {
            nodes.push_back(std::move(child));
        }
        if (node.Wildcard) {
            nodes.push_back(std::move(node.Wildcard));
        }
    };
    takeBelow(root);
    while (!nodes.empty()) {
        const std::unique_ptr<VDataListenerNode> node = std::move(nodes.back());
        nodes.pop_back();
        takeBelow(*node);
    }
}

VDataListeners& VListenerTree::FindOrMake(const VDataPath& path)
{
    return path.HasWildcard() ? FindOrMakeWildcard(path) : named[path];
}

const VDataListeners* VListenerTree::Find(const VDataPath& path) const
{
    if (path.HasWildcard()) {
        return FindWildcard(path);
    }
    const auto found = named.find(path);
    return found == named.end() ? nullptr : &found->second;
}

void VListenerTree::Collect(const VDataPath& path, VDataListenersList& listeners)
{
    if (path.Empty() || path.HasWildcard()) {
        return;
    }
    const auto found = named.find(path);
    if (found != named.end()) {
        listeners.push_back(&found->second);
    }
    if (hasWildcards) {
        CollectByWildcards(path, listeners);
    }
}

VDataListeners& VListenerTree::FindOrMakeWildcard(const VDataPath& path)
{
    VDataListenerNode* node = &root;
    for (std::size_t index = 0; index < path.Count(); ++index) {
        const std::string_view name = path.Component(index);
        std::unique_ptr<VDataListenerNode>& child =
            name == wildcard ? node->Wildcard : node->Children[std::string(name)];
        if (!child) {
            child = std::make_unique<VDataListenerNode>();
        }
        node = child.get();
    }
    if (!node->Listeners) {
        node->Listeners = std::make_unique<VDataListeners>();
        hasWildcards = true;
    }
    return *node->Listeners;
}

const VDataListeners* VListenerTree::FindWildcard(const VDataPath& path) const
{
    const VDataListenerNode* node = &root;
    for (std::size_t index = 0; index < path.Count() && node != nullptr; ++index) {
        const std::string_view name = path.Component(index);
        if (name == wildcard) {
            node = node->Wildcard.get();
        } else {
            const auto child = node->Children.find(name);
            node = child == node->Children.end() ? nullptr : child->second.get();
        }
    }
    return node == nullptr ? nullptr : node->Listeners.get();
}

void VListenerTree::CollectByWildcards(const VDataPath& path, VDataListenersList& listeners) const
{
    struct VPlace
    {
        const VDataListenerNode* Node;
        std::size_t Index; // of the component that comes next
    };
    boost::container::small_vector<VPlace, 8> places{{&root, 0}};
    while (!places.empty()) {
        const VPlace place = places.back();
        places.pop_back();
        if (place.Index == path.Count()) {
            Add(*place.Node, listeners);
            continue;
        }
        const auto child = place.Node->Children.find(path.Component(place.Index));
        if (child != place.Node->Children.end()) {
            places.push_back({child->second.get(), place.Index + 1});
        }
        if (const VDataListenerNode* any = place.Node->Wildcard.get()) {
            // A listener on "A.*" hears of every item below "A", however deep.
            Add(*any, listeners);
            places.push_back({any, place.Index + 1});
        }
    }
}
