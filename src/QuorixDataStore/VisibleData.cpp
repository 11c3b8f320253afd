#include "QuorixDataStore/VisibleData.h"

#include "QuorixDataStore/DataItemUtils.h"

#include <algorithm>

namespace {

constexpr std::string_view wildcard = "*";

/// Returns the components of a path before its first wildcard.
VDataPath LeadingNames(const VDataPath& path)
{
    std::size_t count = 0;
    while (count < path.Count() && path.Component(count) != wildcard) {
        ++count;
    }
    return path.Left(count);
}

} // namespace

bool VVisibleData::FindTokens(const VDataPath& wanted, std::vector<VDataToken>& tokens) const
{
    // The path may be that of a token in the list.
    const VDataPath path(wanted); // NOLINT(performance-unnecessary-copy-initialization)
    tokens.clear();
    const bool pending = !delta.Empty(); // else another thread's changes may hang on the nodes
    committed.ForEachItem(path, [&](const VDataItem& item) {
        if (!pending || item.Node->Pending == nullptr || !item.Node->Pending->Removed) {
            tokens.emplace_back(item.Path, VDataTokenNumbers{committed.GetStoreIdentifier(),
                                                             item.ItemIdentifier, true});
        }
    });
    if (pending && !path.Empty()) {
        delta.ForEachCreated(LeadingNames(path), [&](const VDataItemDelta& record) {
            if (record.ItemIdentifier == 0 && record.HasValue() && path.Matches(record.Path)) {
                tokens.emplace_back(record.Path);
            }
        });
    }
    return !tokens.empty();
}

std::uint64_t VVisibleData::GetChildCount(const VDataPath& path) const
{
    if (path.HasWildcard()) {
        return 0;
    }
    if (!delta.Empty()) {
        // Deliberate: with changes pending, items at any depth count, not the children alone.
        return TokensBelow(path).size();
    }
    const VDataNode* node = committed.FindNode(path);
    return node == nullptr ? 0 : node->Children.size();
}

bool VVisibleData::HasChild(const VDataPath& path, const std::string& name) const
{
    if (!delta.Empty()) {
        const std::vector<VDataToken> tokens = TokensBelow(path);
        return std::any_of(tokens.begin(), tokens.end(), [&](const VDataToken& token) {
            return token.GetPath().Component(path.Count()) == name;
        });
    }
    const VDataNode* node = committed.FindNode(path);
    return node != nullptr && node->Children.find(name) != node->Children.end();
}

bool VVisibleData::GetChildren(const VDataPath& path, std::vector<std::string>& names) const
{
    names.clear();
    if (path.HasWildcard()) {
        return false;
    }
    if (!delta.Empty()) {
        for (const VDataToken& token : TokensBelow(path)) {
            names.emplace_back(token.GetPath().Component(path.Count()));
        }
        std::sort(names.begin(), names.end());
        names.erase(std::unique(names.begin(), names.end()), names.end());
    } else if (const VDataNode* node = committed.FindNode(path)) {
        names.reserve(node->Children.size());
        for (const auto& [name, child] : node->Children) {
            names.push_back(name);
        }
    }
    return !names.empty();
}

bool VVisibleData::HasValue(const VDataToken& token) const
{
    const VDataAddress address = Address(token);
    if (const VDataItemDelta* record = Pending(address)) {
        // Deliberate: the record alone answers, so one that holds only flags hides a committed
        // value.
        return !record->Removed && record->HasValue();
    }
    return address.Item != nullptr &&
           (!address.Item->Proposed.Empty() || !address.Item->Verified.Empty());
}

bool VVisibleData::GetValue(const VDataToken& token, VDataValue& value,
                            EDataValueTarget target) const
{
    value.Bytes.clear();
    const VDataAddress address = Address(token);
    const VDataItemDelta* record = Pending(address);
    if (!Exists(address, record)) {
        return false;
    }
    const VDataValue* found = FindValue(address, record, target);
    if (found == nullptr) {
        return false;
    }
    DataItemUtils::Copy(*found, value);
    return true;
}

bool VVisibleData::GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const
{
    // Deliberate: nobody asks whether the item exists, so that one which is removed in this scope
    // still tells its schema.
    const VDataAddress address = Address(token);
    const KVR::IO::ISchema* found = FindSchema(address, Pending(address));
    if (found == nullptr) {
        return false;
    }
    schema = found;
    return true;
}

bool VVisibleData::GetFlags(const VDataToken& token, std::uint32_t& flags) const
{
    flags = 0;
    const VDataAddress address = Address(token);
    const VDataItemDelta* record = Pending(address);
    if (!Exists(address, record)) {
        return false;
    }
    if (record != nullptr && record->Flags) {
        flags = *record->Flags;
        return true;
    }
    if (address.Item == nullptr) {
        return false;
    }
    flags = address.Item->Flags;
    return true;
}

bool VVisibleData::GetPathChangeId(const VDataPath& path, std::uint64_t& changeId) const
{
    if (!path.Empty() && path.Left(path.Count() - 1).HasWildcard()) {
        return false;
    }
    const VDataPath named = path.WithoutWildcards();
    const VDataNode* node = committed.FindNode(named);
    if (!delta.Empty() && delta.HasNode(named, node)) {
        changeId = committed.GetChangeId() + 1;
        return true;
    }
    if (node == nullptr) {
        return false;
    }
    changeId = node->ChangeId;
    return true;
}

bool VVisibleData::GetItemChangeId(const VDataToken& token, std::uint64_t& changeId) const
{
    const VDataAddress address = Address(token);
    const VDataItemDelta* record = Pending(address);
    if (!Exists(address, record)) {
        return false;
    }
    if (record != nullptr) {
        changeId = committed.GetChangeId() + 1;
        return true;
    }
    changeId = address.Item->Node->ChangeId;
    return true;
}

std::uint64_t VVisibleData::GetCurrentChangeId() const
{
    return committed.GetChangeId() + (delta.Empty() ? 0 : 1);
}

std::vector<VDataToken> VVisibleData::TokensBelow(const VDataPath& path) const
{
    std::vector<VDataToken> tokens;
    static_cast<void>(FindTokens(VDataPath(path, wildcard), tokens));
    return tokens;
}

VDataNode* VVisibleData::FindItemNode(const VDataPath& path) const
{
    auto* node = const_cast<VDataNode*>(committed.FindNode(path)); // the tree is the store's own
    return node != nullptr && node->Item ? node : nullptr;
}
