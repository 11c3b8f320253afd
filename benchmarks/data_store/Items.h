#pragma once

#include "QuorixDataStore/DataToken.h"
#include "io/DataValue.h"

#include <cstddef>
#include <string>
#include <vector>

constexpr std::size_t itemsPerDevice = 50;

/// The items that every store of a run holds: devices with 50 values each, at paths such as
/// Device.qx:17.Settings.StrobeIntensity.
struct VItems
{
    explicit VItems(std::size_t count);

    std::vector<std::string> Texts;  ///< the paths, device by device
    std::vector<VDataToken> Tokens;  ///< the same
    std::vector<std::size_t> Random; ///< positions in an order that no cache knows

    /// Returns the next position of the random order, again and again.
    std::size_t Next();

private:
    std::size_t next = 0;
};

/// Returns a real number as a value: 8 bytes under one interned schema.
VDataValue MakeNumber(double number);
