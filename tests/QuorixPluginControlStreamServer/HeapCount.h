#pragma once

#include <cstddef>

// What operator new has given out in this process: a test binary that links HeapCount.cpp counts.

/// Bytes that are allocated now, on all threads.
std::size_t LiveHeapBytes();

/// How often the calling thread has allocated so far.
std::size_t AllocationsOfThisThread();
