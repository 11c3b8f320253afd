#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

namespace StoreTest {

using Names = std::vector<std::string>; ///< a path, by its components

/// Joins components for display; the ones used here hold no dots.
std::string Join(const Names& names);

/// A value by what matters to the store: which schema, and which content.
struct VReferenceValue
{
    int Schema = 0; ///< 0 and 2 differ only in their type's name
    int Number = 0;

    bool operator==(const VReferenceValue& other) const
    {
        return Schema == other.Schema && Number == other.Number;
    }
};

using MaybeValue = std::optional<VReferenceValue>;

/// One step on a store.
struct VStoreStep
{
    enum EKind {
        FindTokens,
        GetChildCount,
        HasChild,
        GetChildren,
        HasValue,
        GetValue,
        GetSchema,
        GetFlags,
        GetPathChangeId,
        GetItemChangeId,
        GetCurrentChangeId,
        FirstWrite,
        SetValue = FirstWrite,
        SetValues,
        Remove,
        RemoveRestorable,
        RemoveAll,
        RemoveAllRestorable,
        SetFlags,
        KindCount
    };

    /// Which token the step uses.
    enum EToken {
        New,
        Kept,  ///< one that this thread used before
        Shared ///< one that all threads use
    };

    EKind Kind = GetCurrentChangeId;
    Names Path;
    std::string Name;
    VReferenceValue Value;
    std::uint32_t Target = 3;
    std::uint32_t Flags = 0;
    EToken Token = New;
    bool Elsewhere = false; ///< the token is used on another store first

    std::string Text() const;
};

/// What a store must do, told in the plainest way: a map of items, a map of pending records, and
/// every rule as one reads it. It knows nothing of threads: the caller says who the writer is.
class VReferenceStore
{
public:
    explicit VReferenceStore(std::vector<Names> listenerPaths)
        : listenerPaths(std::move(listenerPaths))
    {
    }

    /// Performs a step. @return its result as text, with everything that it gives out
    std::string Perform(const VStoreStep& step, bool isWriter);

    /// Commits. @return what fires, as "<kind> <listener path>" lines: kinds in their order, within
    /// a kind sorted
    std::vector<std::string> Commit();

    std::uint64_t ChangeId() const { return changeId; }

private:
    struct VItem
    {
        MaybeValue Proposed;
        MaybeValue Verified;
        std::uint32_t Flags = 0;
    };

    struct VRecord
    {
        bool OfItem = false; ///< an item was committed when the record was made
        MaybeValue Proposed;
        MaybeValue Verified;
        bool Removed = false;
        bool Restorable = false;
        std::optional<std::uint32_t> Flags;
    };

    struct VReading
    {
        bool Done = false;
        MaybeValue Value;
    };

    /// Which paths of listeners fire, kind by kind.
    struct VFiring
    {
        std::set<std::string> Removed;
        std::set<std::string> Pending;
        std::set<std::string> Verified;
        std::set<std::string> Flags;
    };

    static VReading Choose(std::uint32_t target, std::uint32_t flags, const MaybeValue& proposed,
                           const MaybeValue& verified);
    static void MoveForFlags(std::uint32_t from, std::uint32_t to, MaybeValue& proposed,
                             MaybeValue& verified);

    const VItem* Item(const Names& path) const;
    const VRecord* Record(const Names& path) const;
    bool Exists(const Names& path) const;
    MaybeValue Visible(const Names& path, std::uint32_t target) const;
    std::optional<std::uint32_t> VisibleFlags(const Names& path) const;
    std::optional<int> Schema(const Names& path) const;
    std::vector<Names> Find(const Names& pattern) const;
    std::optional<std::uint64_t> PathChangeId(Names path) const;

    VRecord& MakeRecord(const Names& path);
    bool Write(const Names& path, std::uint32_t target, const VReferenceValue& value);
    bool RestoreValue(const Names& path, std::uint32_t target, const VReferenceValue& value);
    bool RestoreFlags(const Names& path, std::uint32_t flags);
    bool SetValue(const Names& path, std::uint32_t target, const VReferenceValue& value);
    bool Remove(const Names& path, bool restorable);
    void SetFlags(const Names& path, std::uint32_t flags);
    void EraseIfEmpty(const Names& path);

    std::string Read(const VStoreStep& step) const;

    void CommitRemoval(const Names& path);
    void CommitChange(const Names& path, const VRecord& record);
    void Touch(Names path);
    static std::vector<std::string> Lines(const VFiring& firing);
    void Listening(const Names& path, std::set<std::string>& names) const;

    const std::vector<Names> listenerPaths;
    std::map<Names, VItem> items;
    std::map<Names, std::uint64_t> nodes{{Names(), 0}}; ///< change ids of all nodes
    std::map<Names, VRecord> records;                   ///< what is pending
    std::set<Names> pendingPaths;
    std::uint64_t changeId = 0;

    bool seesRecords = false; ///< whether the present step is the writer's
};

} // namespace StoreTest
