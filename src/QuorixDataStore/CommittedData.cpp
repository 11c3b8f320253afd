#include "QuorixDataStore/CommittedData.h"

#include <boost/uuid/random_generator.hpp>

#include <utility>

namespace {

/// Folds a random UUID into one number: its first half, big-endian, exclusive-or its second.
std::uint64_t MakeStoreIdentifier()
{
    // By name, since the plain generator is no Mersenne Twister.
    const boost::uuids::uuid uuid = boost::uuids::random_generator_mt19937()();
    std::uint64_t halves[2] = {0, 0};
    for (std::size_t position = 0; position < uuid.size(); ++position) {
        std::uint64_t& half = halves[position / 8];
        half = (half << 8) | uuid.data[position];
    }
    return halves[0] ^ halves[1];
}

} // namespace

VCommittedData::VCommittedData() : storeIdentifier(MakeStoreIdentifier()) {}

VCommittedData::~VCommittedData()
{
    // From the leaves up and without recursion: a path may have any length.
    VDataNode* node = &root;
    for (;;) {
        if (!node->Children.empty()) {
            node = &node->Children.begin()->second;
        } else if (node->Parent != nullptr) {
            node = node->Parent;
            node->Children.erase(node->Children.begin());
        } else {
            return;
        }
    }
}

VDataItem* VCommittedData::ResolveByPath(const VDataToken& token) const
{
    VDataNode* node = const_cast<VCommittedData*>(this)->FindNode(token.GetPath());
    if (node != nullptr && node->Item) {
        token.SetNumbers({storeIdentifier, node->Item->ItemIdentifier, true});
        return &*node->Item;
    }
    if (!(token.GetNumbers() == VDataTokenNumbers())) {
        token.SetNumbers(VDataTokenNumbers());
    }
    return nullptr;
}

const VDataNode* VCommittedData::FindNode(const VDataPath& path) const
{
    const VDataNode* node = &root;
    const std::size_t count = path.Count();
    for (std::size_t position = 0; position < count; ++position) {
        const auto child = node->Children.find(path.Component(position));
        if (child == node->Children.end()) {
            return nullptr;
        }
        node = &child->second;
    }
    return node;
}

VDataNode* VCommittedData::FindNode(const VDataPath& path)
{
    return const_cast<VDataNode*>(std::as_const(*this).FindNode(path));
}

VDataItem& VCommittedData::FindOrMakeItem(const VDataPath& path)
{
    VDataNode* node = &root;
    for (std::size_t position = 0; position < path.Count(); ++position) {
        const std::string_view name = path.Component(position);
        auto child = node->Children.find(name);
        if (child == node->Children.end()) {
            child = node->Children.try_emplace(std::string(name), node).first;
        }
        node = &child->second;
    }
    if (node->Item) {
        return *node->Item;
    }
    VDataItem& item = node->Item.emplace();
    item.Path = path;
    item.Path.ShrinkToFit();
    item.Node = node;
    item.ItemIdentifier = nextItemIdentifier++;
    index.Insert(item.ItemIdentifier, &item);
    return item;
}

void VCommittedData::RemoveItem(VDataNode& node, const VDataPath& path)
{
    index.Erase(node.Item->ItemIdentifier);
    node.Item.reset();

    VDataNode* left = &node;
    for (std::size_t depth = path.Count();
         left->Parent != nullptr && left->Children.empty() && !left->Item; --depth) {
        VDataNode* parent = left->Parent;
        parent->Children.erase(parent->Children.find(path.Component(depth - 1)));
        left = parent;
    }
    Touch(*left);
}
