#include "QuorixDataStore/DataToken.h"

#include <utility>

VDataToken::VDataToken(VDataPath tokenPath) : path(std::move(tokenPath))
{
    Begin(VDataTokenNumbers());
}

VDataToken::VDataToken(VDataPath tokenPath, std::uint64_t store, std::uint64_t item)
    : path(std::move(tokenPath))
{
    Begin(VDataTokenNumbers{store, item, false});
}

VDataToken& VDataToken::operator=(const VDataToken& other)
{
    path = other.path;
    SetNumbers(other.GetNumbers());
    return *this;
}

VDataToken& VDataToken::operator=(VDataToken&& other) noexcept
{
    path = std::move(other.path);
    SetNumbers(other.GetNumbers());
    return *this;
}

void VDataToken::SetNumbers(const VDataTokenNumbers& numbers) const
{
    std::uint32_t even = sequence.load(std::memory_order_relaxed) & ~1u;
    while (!sequence.compare_exchange_weak(even, even + 1, std::memory_order_acquire,
                                           std::memory_order_relaxed)) {
        even &= ~1u; // another thread is at it, for a few instructions
    }
    // Released one by one: whoever sees a new number also sees the odd sequence before it.
    storeIdentifier.store(numbers.StoreIdentifier, std::memory_order_release);
    itemIdentifier.store(numbers.ItemIdentifier, std::memory_order_release);
    ofPath.store(numbers.OfPath, std::memory_order_release);
    sequence.store(even + 2, std::memory_order_release);
}
