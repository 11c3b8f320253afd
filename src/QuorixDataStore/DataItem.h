#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataValueFlags.h"
#include "QuorixDataStore/DataValueTarget.h"
#include "io/DataValue.h"

#include <cstdint>

struct VDataNode;

/// One item of the committed tree. Threads: read under a lock of the store, changed by its commit.
struct VDataItem
{
    VDataPath Path;      ///< never with a wildcard
    VDataValue Proposed; ///< empty unless VerifyRequired is or was set
    VDataValue Verified; ///< the only value used where VerifyRequired is clear
    std::uint32_t Flags = 0;
    VDataNode* Node = nullptr;        ///< the tree node that owns this item
    std::uint64_t ItemIdentifier = 0; ///< from 1 upward, never reused within its store
};
