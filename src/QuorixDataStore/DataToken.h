#pragma once

#include "QuorixDataStore/DataPath.h"

#include <atomic>
#include <cstdint>
#include <functional>

/// The two numbers by which a store finds a token's item without walking its tree.
struct VDataTokenNumbers
{
    std::uint64_t StoreIdentifier = 0; ///< 0 until resolved
    std::uint64_t ItemIdentifier = 0;  ///< 0 until resolved
    bool OfPath = false;               ///< a store has found that item by this token's own path

    bool operator==(const VDataTokenNumbers& other) const
    {
        return StoreIdentifier == other.StoreIdentifier && ItemIdentifier == other.ItemIdentifier &&
               OfPath == other.OfPath;
    }
};

/// The address of one item, with what a store remembers of finding it.
///
/// A token may be kept and used against any store: one that it was not resolved against goes by the
/// path. An empty token finds nothing, and every write that is handed one returns false.
/// Threads: [any], as long as nobody assigns to it meanwhile: two readers may share a token, and
/// the numbers are read and written as one, since half of each pair would name a wrong item.
class VDataToken
{
public:
    VDataToken() = default;

    /// A path that is empty or holds a wildcard gives the empty token.
    explicit VDataToken(VDataPath tokenPath);

    /// As above, with the numbers that the path is taken to have: a store that recognises its own
    /// identifier goes by the item's and does not compare the path.
    VDataToken(VDataPath tokenPath, std::uint64_t store, std::uint64_t item);

    /// As above, for the store itself, which knows that numbers and path belong together.
    VDataToken(const VDataPath& tokenPath, const VDataTokenNumbers& numbers) : path(tokenPath)
    {
        Begin(numbers);
    }

    VDataToken(const VDataToken& other) : path(other.path) { Begin(other.GetNumbers()); }

    VDataToken(VDataToken&& other) noexcept : path(std::move(other.path))
    {
        Begin(other.GetNumbers()); // those that stay behind mean nothing without a path
    }

    VDataToken& operator=(const VDataToken& other);
    VDataToken& operator=(VDataToken&& other) noexcept;
    ~VDataToken() = default;

    const VDataPath& GetPath() const { return path; }
    bool IsValid() const { return !path.Empty(); }

    /// Returns the numbers, which are 0 until a store has resolved the token.
    VDataTokenNumbers GetNumbers() const
    {
        for (;;) {
            const std::uint32_t before = sequence.load(std::memory_order_acquire);
            VDataTokenNumbers numbers;
            numbers.StoreIdentifier = storeIdentifier.load(std::memory_order_acquire);
            numbers.ItemIdentifier = itemIdentifier.load(std::memory_order_acquire);
            numbers.OfPath = ofPath.load(std::memory_order_acquire);
            if ((before & 1) == 0 && sequence.load(std::memory_order_relaxed) == before) {
                return numbers;
            }
        }
    }

    /// Remembers what a store has found; `const`, since it changes nothing that a user can tell.
    void SetNumbers(const VDataTokenNumbers& numbers) const;

    /// Equality and order are the path's.
    friend bool operator==(const VDataToken& left, const VDataToken& right)
    {
        return left.path == right.path;
    }
    friend bool operator!=(const VDataToken& left, const VDataToken& right)
    {
        return left.path != right.path;
    }
    friend bool operator<(const VDataToken& left, const VDataToken& right)
    {
        return left.path < right.path;
    }

private:
    /// Puts the numbers into a token that no other thread knows yet; none if it turns out empty.
    void Begin(const VDataTokenNumbers& numbers)
    {
        if (path.Empty()) {
            return;
        }
        if (path.HasWildcard()) {
            path = VDataPath();
            return;
        }
        storeIdentifier.store(numbers.StoreIdentifier, std::memory_order_relaxed);
        itemIdentifier.store(numbers.ItemIdentifier, std::memory_order_relaxed);
        ofPath.store(numbers.OfPath, std::memory_order_relaxed);
    }

    VDataPath path;
    // Odd while a thread changes the numbers, and another one after each change: a reader that
    // meets either reads again, so that reading writes nothing to memory that threads share.
    mutable std::atomic<std::uint32_t> sequence{0};
    mutable std::atomic<bool> ofPath{false};
    mutable std::atomic<std::uint64_t> storeIdentifier{0};
    mutable std::atomic<std::uint64_t> itemIdentifier{0};
};

namespace std {

template <>
struct hash<VDataToken>
{
    std::size_t operator()(const VDataToken& token) const
    {
        return std::hash<VDataPath>()(token.GetPath());
    }
};

} // namespace std
