#pragma once

#include "Items.h"
#include "MapStore.h"

#include "QuorixDataStore/DataStore.h"

#include <nlohmann/json.hpp>

/// Measures one reader thread beside one writer thread that never rests, on the clock.
///
/// @param perScope  how many items the writer changes at a time
/// @param seconds   how long each side runs, in turn with the other, three times each
nlohmann::json CompareBesideBusyWriter(VItems& items, VDataStore& store, VMapStore& map,
                                       std::size_t perScope, double seconds);
