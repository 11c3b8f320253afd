#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace TestSupport {

/// Returns the place of a virtual operation in its table. A pointer to such an operation holds one
/// more than the operation's offset there.
template <typename Operation>
std::size_t SlotOf(Operation operation)
{
    std::uintptr_t representation = 0;
    static_assert(sizeof operation >= sizeof representation, "of the common C++ ABI");
    std::memcpy(&representation, &operation, sizeof representation);
    return (representation - 1) / sizeof(void*);
}

/// The two table entries of a virtual destructor.
constexpr std::size_t destructorSlots = 2;

} // namespace TestSupport
