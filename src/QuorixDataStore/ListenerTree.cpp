#include "QuorixDataStore/ListenerTree.h"

namespace {

constexpr std::string_view wildcard = "*";

void Add(const VDataListenerNode& node, VDataListenersList& listeners)
{
    if (node.Listeners) {
        listeners.push_back(node.Listeners.get());
    }
}

} // namespace

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
        CollectFrom(root, path, 0, listeners);
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

void VListenerTree::CollectFrom(const VDataListenerNode& from, const VDataPath& path,
                                std::size_t index, VDataListenersList& listeners)
{
    for (const VDataListenerNode* node = &from;;) {
        if (index == path.Count()) {
            Add(*node, listeners);
            return;
        }
        const auto child = node->Children.find(path.Component(index));
        if (child != node->Children.end()) {
            CollectFrom(*child->second, path, index + 1, listeners);
        }
        node = node->Wildcard.get();
        if (node == nullptr) {
            return;
        }
        // A listener on "A.*" hears of every item below "A", however deep.
        Add(*node, listeners);
        if (node->Children.empty() && !node->Wildcard) {
            return;
        }
        ++index;
    }
}
