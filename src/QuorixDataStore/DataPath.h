#pragma once

#include <atomic>
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// The address of an item: an ordered list of text components, any of which may be the wildcard.
///
/// A component that is "*" and nothing else is the wildcard. Components are bytes: they are never
/// compared by locale or regardless of case. Beware of braces: VDataPath("A.B") splits its text,
/// VDataPath{"A.B"} is a list of one component that holds a dot.
///
/// Owns: nothing alone. Copies share one immutable block of text, which the first change of a copy
/// duplicates, so that copying a path or a token costs one counter and no memory.
/// Threads: a plain value; different objects may be used on different threads, also where they
/// share their text. Failure: an index out of range is a fault of the caller (`assert`).
class VDataPath
{
public:
    VDataPath() = default;

    /// Splits a text at every "."; see the assignment from a text.
    explicit VDataPath(std::string_view text);

    /// Takes the components as they are, also those that are empty or hold a ".".
    VDataPath(std::initializer_list<std::string_view> components);
    explicit VDataPath(const std::vector<std::string>& components);

    /// Appends one component to a parent's path.
    VDataPath(const VDataPath& parent, std::string_view component);

    VDataPath(const VDataPath& other) noexcept : block(other.block)
    {
        if (block != nullptr) {
            block->References.fetch_add(1, std::memory_order_relaxed);
        }
    }

    VDataPath(VDataPath&& other) noexcept : block(std::exchange(other.block, nullptr)) {}

    VDataPath& operator=(const VDataPath& other) noexcept
    {
        VDataPath copy(other);
        std::swap(block, copy.block);
        return *this;
    }

    VDataPath& operator=(VDataPath&& other) noexcept
    {
        VDataPath moved(std::move(other));
        std::swap(block, moved.block);
        return *this;
    }

    ~VDataPath()
    {
        if (block != nullptr && block->References.fetch_sub(1, std::memory_order_acq_rel) == 1) {
            Destroy(block);
        }
    }

    /// Splits a text at every "." and drops empty pieces: "A..B", ".A.B" and "A.B." are all the
    /// path of "A" and "B". There is no escape, so no piece can hold a ".".
    VDataPath& operator=(std::string_view text);

    void Append(std::string_view component);
    void Append(const VDataPath& other);
    void RemoveLast();
    void Replace(std::size_t index, std::string_view component);

    /// Cuts the list, or extends it by empty components.
    void Resize(std::size_t count);

    bool Empty() const { return block == nullptr; }
    std::size_t Count() const { return block == nullptr ? 0 : block->Count; }

    /// Returns a component, whose text stays valid as long as this path is neither changed nor
    /// destroyed.
    std::string_view Component(std::size_t index) const
    {
        assert(index < Count());
        return index < Count() ? block->Component(index) : std::string_view();
    }

    /// Returns the last component, or an empty text for an empty path.
    std::string_view Last() const;

    bool HasWildcard() const { return block != nullptr && block->Wildcard; }

    /// Returns the components joined by ".". A component that holds a "." itself is not escaped, so
    /// the text of such a path reads back as another path.
    std::string Text() const;

    /// Compares with wildcards: "*" stands for one component, and at the end of the shorter path
    /// for one or more. An empty path matches nothing, not even another empty one.
    bool Matches(const VDataPath& other) const;

    /// True if the components of `prefix` are the first ones of this path. A "*" means nothing
    /// here.
    bool StartsWith(const VDataPath& prefix) const;

    /// Returns a copy without its "*" components.
    VDataPath WithoutWildcards() const;

    /// Returns the leading components that both paths share.
    VDataPath CommonPrefix(const VDataPath& other) const;

    /// Returns the first `count` components, or the empty path if there are fewer.
    VDataPath Left(std::size_t count) const;

    /// Returns the components from `begin` up to but not including `end`, or the empty path where
    /// that is no range of this path.
    VDataPath SubRange(std::size_t begin, std::size_t end) const;

    /// Returns the hash for unordered containers; equal paths have equal ones.
    std::uint64_t Hash() const;

    /// Returns another hash, of the text, for tables that need no particular one: it takes a
    /// fraction of the time, and may differ between two builds.
    std::size_t QuickHash() const;

    /// True if both share one block of text: a quick proof of equality, while false proves nothing.
    bool SharesText(const VDataPath& other) const { return block == other.block; }

    /// Gives up the room that appending has reserved, for a path that is kept.
    void ShrinkToFit();

    /// Equality by components, in which "*" is a component like any other.
    friend bool operator==(const VDataPath& left, const VDataPath& right);
    friend bool operator!=(const VDataPath& left, const VDataPath& right)
    {
        return !(left == right);
    }

    /// Orders by the first components that differ, compared by bytes; a prefix is the lesser.
    friend bool operator<(const VDataPath& left, const VDataPath& right);

private:
    /// The shared text of equal paths: this header, then the end of each component in the text,
    /// then the text with its separators, all in one piece of memory.
    struct VBlock
    {
        std::atomic<std::uint32_t> References{1};
        std::uint32_t Count = 0;
        std::uint32_t ComponentCapacity = 0;
        std::uint32_t TextCapacity = 0;
        bool Wildcard = false;

        std::uint32_t* Ends() { return reinterpret_cast<std::uint32_t*>(this + 1); }
        char* Text() { return reinterpret_cast<char*>(Ends() + ComponentCapacity); }
        std::size_t TextSize() { return Count == 0 ? 0 : Ends()[Count - 1]; }
        std::size_t Begin(std::size_t index) { return index == 0 ? 0 : Ends()[index - 1] + 1; }

        std::string_view Component(std::size_t index)
        {
            const std::size_t begin = Begin(index);
            return std::string_view(Text() + begin, Ends()[index] - begin);
        }
    };

    static VBlock* Make(std::size_t components, std::size_t textSize);
    static void Destroy(VBlock* block);
    std::size_t TextSize() const;
    void Reserve(std::size_t components, std::size_t textSize);
    void AppendReserved(std::string_view component);
    void AppendRange(const VDataPath& other, std::size_t begin, std::size_t end);

    VBlock* block = nullptr; // null if and only if there are no components
};

namespace std {

template <>
struct hash<VDataPath>
{
    std::size_t operator()(const VDataPath& path) const
    {
        return static_cast<std::size_t>(path.Hash());
    }
};

} // namespace std

/// The quick hash, for tables of paths.
struct VDataPathQuickHash
{
    std::size_t operator()(const VDataPath& path) const { return path.QuickHash(); }
};
