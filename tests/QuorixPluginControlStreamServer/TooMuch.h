#pragma once

#include <cstddef>

/// More than the buffers of both ends of a connection can hold.
constexpr std::size_t TooMuch = 12 * 1024 * 1024;

/// What a device that is to stall its server takes for its own buffer.
constexpr int SmallBuffer = 4096;
