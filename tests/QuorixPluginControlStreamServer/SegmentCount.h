#pragma once

#include <cstdint>

/// Returns how many segments with data a TCP socket has received.
std::uint32_t DataSegmentsReceived(int descriptor);
