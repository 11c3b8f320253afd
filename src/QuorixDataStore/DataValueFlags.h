#pragma once

#include <cstdint>

/// The flags of an item: a bit set of 32 bits, in which any combination may be stored.
namespace EDataValueFlags {

constexpr std::uint32_t ReadOnly = 1; ///< not copied over by what asks to respect it

/// A write by an ordinary user lands in the proposed value, and something on the hardware's side
/// must confirm it by writing the verified one.
constexpr std::uint32_t VerifyRequired = 2;

constexpr std::uint32_t NotSerialized = 4; ///< left out of copies and files that ask to respect it

} // namespace EDataValueFlags
