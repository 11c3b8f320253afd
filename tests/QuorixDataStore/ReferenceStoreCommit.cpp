#include "ReferencePaths.h"
#include "ReferenceStore.h"

#include <algorithm>

namespace StoreTest {

std::vector<std::string> VReferenceStore::Commit()
{
    ++changeId;
    if (records.empty()) {
        return {};
    }
    VFiring firing;
    for (const auto& [path, record] : records) {
        if (record.Removed) {
            Listening(path, firing.Removed);
        } else if (record.Verified) {
            Listening(path, firing.Verified);
        }
        if (!record.Removed && record.Flags) {
            Listening(path, firing.Flags);
        }
    }
    for (const auto& [path, record] : records) {
        if (record.Removed) {
            CommitRemoval(path);
        } else {
            CommitChange(path, record);
        }
    }
    records.clear();
    for (const Names& path : pendingPaths) {
        Listening(path, firing.Pending);
    }
    return Lines(firing);
}

void VReferenceStore::CommitRemoval(const Names& path)
{
    pendingPaths.erase(path);
    if (items.erase(path) == 0) {
        return;
    }
    const auto used = [&](const Names& prefix) {
        return std::any_of(items.begin(), items.end(),
                           [&](const auto& item) { return StartsWith(item.first, prefix); });
    };
    Names touched = path;
    while (!touched.empty() && !used(touched)) {
        nodes.erase(touched);
        touched.pop_back();
    }
    Touch(touched);
}

void VReferenceStore::CommitChange(const Names& path, const VRecord& record)
{
    VItem& item = items[path];
    if (record.Flags) {
        MoveForFlags(item.Flags, *record.Flags, item.Proposed, item.Verified);
        item.Flags = *record.Flags;
    }
    if (record.Proposed) {
        item.Proposed = record.Proposed;
    }
    if (record.Verified) {
        item.Verified = record.Verified;
    }
    if (item.Proposed && item.Proposed == item.Verified) {
        pendingPaths.erase(path);
    } else if (item.Proposed) {
        pendingPaths.insert(path);
    }
    Touch(path);
}

void VReferenceStore::Touch(Names path)
{
    for (;; path.pop_back()) {
        nodes[path] = changeId;
        if (path.empty()) {
            return;
        }
    }
}

std::vector<std::string> VReferenceStore::Lines(const VFiring& firing)
{
    std::vector<std::string> lines;
    std::set<std::string> any;
    const auto add = [&](const std::string& kind, const std::set<std::string>& names) {
        for (const std::string& name : names) {
            lines.push_back(kind + " " + name);
        }
        any.insert(names.begin(), names.end());
    };
    add("removed", firing.Removed);
    add("pending", firing.Pending);
    add("verified", firing.Verified);
    add("flags", firing.Flags);
    add("any", std::set<std::string>(any));
    return lines;
}

void VReferenceStore::Listening(const Names& path, std::set<std::string>& names) const
{
    for (const Names& pattern : listenerPaths) {
        if (NamesPath(pattern, path)) {
            names.insert(Join(pattern));
        }
    }
}

} // namespace StoreTest
