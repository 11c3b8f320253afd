#include "ReferenceStore.h"

#include "ReferencePaths.h"

#include <algorithm>

namespace StoreTest {

namespace {

constexpr std::uint32_t verifyRequired = 2;

bool HasWildcard(const Names& path)
{
    return std::count(path.begin(), path.end(), "*") > 0;
}

/// Schemas 0 and 2 differ in the name of their type only.
bool Agree(int left, int right)
{
    return left % 2 == right % 2;
}

std::string Result(bool result, const std::string& rest = std::string())
{
    return (result ? "true " : "false ") + rest;
}

std::string ValueText(const MaybeValue& value)
{
    return value ? std::to_string(value->Schema) + ":" + std::to_string(value->Number) : "none";
}

Names Below(Names path)
{
    path.push_back("*");
    return path;
}

} // namespace

std::string Join(const Names& names)
{
    std::string text;
    for (const std::string& name : names) {
        text += (text.empty() ? "" : ".") + name;
    }
    return text;
}

std::string VStoreStep::Text() const
{
    static const char* const kinds[] = {"FindTokens",
                                        "GetChildCount",
                                        "HasChild",
                                        "GetChildren",
                                        "HasValue",
                                        "GetValue",
                                        "GetSchema",
                                        "GetFlags",
                                        "GetPathChangeId",
                                        "GetItemChangeId",
                                        "GetCurrentChangeId",
                                        "SetValue",
                                        "SetValues",
                                        "Remove",
                                        "RemoveRestorable",
                                        "RemoveAll",
                                        "RemoveAllRestorable",
                                        "SetFlags"};
    static const char* const tokens[] = {"", " kept", " shared"};
    return std::string(kinds[Kind]) + "(" + Join(Path) + ") name=" + Name +
           " value=" + ValueText(Value) + " target=" + std::to_string(Target) +
           " flags=" + std::to_string(Flags) + tokens[Token] + (Elsewhere ? " elsewhere" : "");
}

std::string VReferenceStore::Perform(const VStoreStep& step, bool isWriter)
{
    seesRecords = isWriter;
    const bool wildcardToken = step.Path.empty() || HasWildcard(step.Path);
    bool all = true;
    switch (step.Kind) {
    case VStoreStep::SetValue:
        return Result(!wildcardToken && SetValue(step.Path, step.Target, step.Value));
    case VStoreStep::SetValues:
        for (const Names& path : Find(step.Path)) {
            all = SetValue(path, step.Target, step.Value) && all;
        }
        return Result(all);
    case VStoreStep::Remove:
    case VStoreStep::RemoveRestorable:
        return Result(!wildcardToken &&
                      Remove(step.Path, step.Kind == VStoreStep::RemoveRestorable));
    case VStoreStep::RemoveAll:
    case VStoreStep::RemoveAllRestorable:
        for (const Names& path : Find(step.Path)) {
            all = Remove(path, step.Kind == VStoreStep::RemoveAllRestorable) && all;
        }
        return Result(all);
    case VStoreStep::SetFlags:
        if (!wildcardToken) {
            SetFlags(step.Path, step.Flags);
        }
        return Result(!wildcardToken);
    default:
        return Read(step);
    }
}

std::string VReferenceStore::Read(const VStoreStep& step) const
{
    const Names token = HasWildcard(step.Path) ? Names() : step.Path;
    const bool anyPending = seesRecords && !records.empty();
    std::string text;
    switch (step.Kind) {
    case VStoreStep::FindTokens: {
        const std::vector<Names> found = Find(step.Path);
        for (const Names& path : found) {
            text += Join(path) + ",";
        }
        return Result(!found.empty(), text);
    }
    case VStoreStep::GetChildCount: {
        if (HasWildcard(step.Path)) {
            return "0";
        }
        if (anyPending) {
            return std::to_string(Find(Below(step.Path)).size());
        }
        return std::to_string(std::count_if(nodes.begin(), nodes.end(), [&](const auto& node) {
            return node.first.size() == step.Path.size() + 1 && StartsWith(node.first, step.Path);
        }));
    }
    case VStoreStep::HasChild: {
        if (anyPending) {
            for (const Names& path : Find(Below(step.Path))) {
                if (path[step.Path.size()] == step.Name) {
                    return Result(true);
                }
            }
            return Result(false);
        }
        Names child = step.Path;
        child.push_back(step.Name);
        return Result(nodes.count(child) > 0);
    }
    case VStoreStep::GetChildren: {
        if (HasWildcard(step.Path)) {
            return Result(false);
        }
        std::set<std::string> names;
        if (anyPending) {
            for (const Names& path : Find(Below(step.Path))) {
                names.insert(path[step.Path.size()]);
            }
        } else {
            for (const auto& [path, id] : nodes) {
                if (path.size() == step.Path.size() + 1 && StartsWith(path, step.Path)) {
                    names.insert(path.back());
                }
            }
        }
        for (const std::string& name : names) {
            text += name + ",";
        }
        return Result(!names.empty(), text);
    }
    case VStoreStep::HasValue: {
        if (const VRecord* record = Record(token)) {
            return Result(!record->Removed && (record->Proposed || record->Verified));
        }
        const VItem* item = Item(token);
        return Result(item != nullptr && (item->Proposed || item->Verified));
    }
    case VStoreStep::GetValue: {
        const MaybeValue value = Visible(token, step.Target);
        return Result(value.has_value(), ValueText(value));
    }
    case VStoreStep::GetSchema: {
        const std::optional<int> schema = Schema(token);
        return Result(schema.has_value(), schema ? std::to_string(*schema) : "untouched");
    }
    case VStoreStep::GetFlags: {
        const std::optional<std::uint32_t> flags = VisibleFlags(token);
        return Result(flags.has_value(), std::to_string(flags.value_or(0)));
    }
    case VStoreStep::GetPathChangeId: {
        const std::optional<std::uint64_t> id = PathChangeId(step.Path);
        return Result(id.has_value(), id ? std::to_string(*id) : "untouched");
    }
    case VStoreStep::GetItemChangeId:
        if (!Exists(token)) {
            return Result(false, "untouched");
        }
        return Result(true,
                      std::to_string(Record(token) != nullptr ? changeId + 1 : nodes.at(token)));
    default:
        return std::to_string(changeId + (anyPending ? 1 : 0));
    }
}

VReferenceStore::VReading VReferenceStore::Choose(std::uint32_t target, std::uint32_t flags,
                                                  const MaybeValue& proposed,
                                                  const MaybeValue& verified)
{
    const bool required = (flags & verifyRequired) != 0;
    if (target == 3) {
        return {true, required ? proposed : verified};
    }
    if (target == 2 || !required) {
        return {true, verified};
    }
    return target == 1 ? VReading{true, proposed} : VReading{false, {}};
}

void VReferenceStore::MoveForFlags(std::uint32_t from, std::uint32_t to, MaybeValue& proposed,
                                   MaybeValue& verified)
{
    if (((from ^ to) & verifyRequired) == 0) {
        return;
    }
    MaybeValue& source = (to & verifyRequired) != 0 ? verified : proposed;
    MaybeValue& target = (to & verifyRequired) != 0 ? proposed : verified;
    if (source) {
        target = source;
        source.reset();
    }
}

const VReferenceStore::VItem* VReferenceStore::Item(const Names& path) const
{
    const auto found = items.find(path);
    return found == items.end() ? nullptr : &found->second;
}

const VReferenceStore::VRecord* VReferenceStore::Record(const Names& path) const
{
    const auto found = seesRecords ? records.find(path) : records.end();
    return found == records.end() ? nullptr : &found->second;
}

bool VReferenceStore::Exists(const Names& path) const
{
    const VRecord* record = Record(path);
    return record != nullptr ? !record->Removed : Item(path) != nullptr;
}

MaybeValue VReferenceStore::Visible(const Names& path, std::uint32_t target) const
{
    if (!Exists(path)) {
        return {};
    }
    const VItem* item = Item(path);
    const VRecord* record = Record(path);
    std::uint32_t flags = item != nullptr ? item->Flags : 0;
    MaybeValue seen;
    if (item != nullptr) {
        seen = Choose(target, flags, item->Proposed, item->Verified).Value;
    }
    if (record != nullptr) {
        flags = record->Flags.value_or(flags);
        const MaybeValue pending = Choose(target, flags, record->Proposed, record->Verified).Value;
        if (pending) {
            seen = pending;
        }
    }
    return seen;
}

std::optional<std::uint32_t> VReferenceStore::VisibleFlags(const Names& path) const
{
    if (!Exists(path)) {
        return {};
    }
    const VRecord* record = Record(path);
    if (record != nullptr && record->Flags) {
        return record->Flags;
    }
    const VItem* item = Item(path);
    return item != nullptr ? std::optional<std::uint32_t>(item->Flags) : std::nullopt;
}

std::optional<int> VReferenceStore::Schema(const Names& path) const
{
    const VItem* item = Item(path);
    const VRecord* record = Record(path);
    for (const MaybeValue* value :
         {item != nullptr ? &item->Proposed : nullptr, item != nullptr ? &item->Verified : nullptr,
          record != nullptr ? &record->Proposed : nullptr,
          record != nullptr ? &record->Verified : nullptr}) {
        if (value != nullptr && *value) {
            return (*value)->Schema;
        }
    }
    return {};
}

std::vector<Names> VReferenceStore::Find(const Names& pattern) const
{
    std::vector<Names> found;
    for (const auto& [path, item] : items) {
        const VRecord* record = Record(path);
        if (NamesPath(pattern, path) && (record == nullptr || !record->Removed)) {
            found.push_back(path);
        }
    }
    for (const auto& [path, record] : records) {
        if (seesRecords && !record.OfItem && (record.Proposed || record.Verified) &&
            NamesPath(pattern, path)) {
            found.push_back(path);
        }
    }
    return found;
}

std::optional<std::uint64_t> VReferenceStore::PathChangeId(Names path) const
{
    if (!path.empty() && path.back() == "*") {
        path.pop_back();
    }
    if (HasWildcard(path)) {
        return {};
    }
    for (const auto& [pending, record] : records) {
        if (seesRecords && StartsWith(pending, path)) {
            return changeId + 1;
        }
    }
    const auto node = nodes.find(path);
    return node == nodes.end() ? std::nullopt : std::optional<std::uint64_t>(node->second);
}

VReferenceStore::VRecord& VReferenceStore::MakeRecord(const Names& path)
{
    const auto found = records.find(path);
    if (found != records.end()) {
        return found->second;
    }
    VRecord& record = records[path];
    record.OfItem = Item(path) != nullptr;
    return record;
}

bool VReferenceStore::Write(const Names& path, std::uint32_t target, const VReferenceValue& value)
{
    const bool made = records.count(path) == 0;
    VRecord& record = MakeRecord(path);
    const VItem* item = Item(path);
    const std::uint32_t flags = record.Flags.value_or(item != nullptr ? item->Flags : 0);
    const bool required = (flags & verifyRequired) != 0;
    if (required && target != 1 && target != 2 && target != 3) {
        if (made) {
            records.erase(path);
        }
        return false;
    }
    (required && target != 2 ? record.Proposed : record.Verified) = value;
    record.Removed = false;
    return true;
}

bool VReferenceStore::RestoreValue(const Names& path, std::uint32_t target,
                                   const VReferenceValue& value)
{
    const auto found = records.find(path);
    if (found == records.end() || !found->second.Restorable) {
        return false;
    }
    VRecord& record = found->second;
    const VItem& item = items.at(path);
    const std::uint32_t flags = record.Flags.value_or(item.Flags);
    if (target == 2 || (flags & verifyRequired) == 0) {
        if (!(item.Verified == value)) {
            return true;
        }
        record.Verified.reset();
    } else if (target == 1 || target == 3) {
        if (!(item.Proposed == value)) {
            return true;
        }
        record.Proposed.reset();
    } else {
        return true;
    }
    EraseIfEmpty(path);
    return true;
}

bool VReferenceStore::RestoreFlags(const Names& path, std::uint32_t flags)
{
    const auto found = records.find(path);
    const VItem& item = items.at(path);
    if (found == records.end() || !found->second.Restorable || flags != item.Flags) {
        return false;
    }
    VRecord& record = found->second;
    if (record.Flags) {
        MoveForFlags(*record.Flags, item.Flags, record.Proposed, record.Verified);
        record.Flags.reset();
    }
    EraseIfEmpty(path);
    return true;
}

void VReferenceStore::EraseIfEmpty(const Names& path)
{
    const VRecord& record = records.at(path);
    if (!record.Proposed && !record.Verified && !record.Removed && !record.Flags) {
        records.erase(path);
    }
}

bool VReferenceStore::SetValue(const Names& path, std::uint32_t target,
                               const VReferenceValue& value)
{
    const std::optional<int> held = Schema(path);
    if (held && !Agree(*held, value.Schema)) {
        return false;
    }
    const bool committed = Item(path) != nullptr;
    const MaybeValue seen = Visible(path, target);
    if (!seen) {
        const bool written = Write(path, target, value);
        if (committed) {
            RestoreValue(path, target, value);
        }
        return written;
    }
    if (*seen == value || (committed && RestoreValue(path, target, value))) {
        return true;
    }
    return Write(path, target, value);
}

bool VReferenceStore::Remove(const Names& path, bool restorable)
{
    if (!Exists(path)) {
        return false;
    }
    VRecord& record = MakeRecord(path);
    record.Proposed.reset();
    record.Verified.reset();
    record.Flags.reset();
    record.Removed = true;
    record.Restorable = restorable;
    return true;
}

void VReferenceStore::SetFlags(const Names& path, std::uint32_t flags)
{
    const bool committed = Item(path) != nullptr;
    const std::optional<std::uint32_t> seen = VisibleFlags(path);
    if (seen && (*seen == flags || (committed && RestoreFlags(path, flags)))) {
        return;
    }
    VRecord& record = MakeRecord(path);
    const VItem* item = Item(path);
    MoveForFlags(record.Flags.value_or(item != nullptr ? item->Flags : 0), flags, record.Proposed,
                 record.Verified);
    record.Flags = flags;
    record.Removed = false;
    if (!seen && committed) {
        RestoreFlags(path, flags);
    }
}

} // namespace StoreTest
