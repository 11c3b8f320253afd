#pragma once

#include <cstdint>

/// Which of an item's two values an operation means. Other numbers may be passed: what each
/// operation does with them is told there.
enum class EDataValueTarget : std::uint32_t {
    Proposed = 1, ///< what was asked for, where the item has VerifyRequired
    Verified = 2, ///< what was confirmed
    Current = 3,  ///< proposed where the item has VerifyRequired, else verified
};
