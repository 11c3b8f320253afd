#pragma once

#include <atomic>
#include <cstdint>

namespace ControlStreamBenchmark {

/// The environment variable that names the descriptor of the shared counts to the counter library.
constexpr const char* allocationCountsVariable = "QUORIX_ALLOCATION_COUNTS_FD";

/// What a counted process has asked of its heap since it began. One page that the counted process
/// writes and the benchmark reads.
struct VAllocationCounts
{
    std::atomic<std::int64_t> Allocations;
    std::atomic<std::int64_t> AllocatedBytes;
    std::atomic<std::int64_t> LiveBytes; // with the rounding of the heap's blocks
};

} // namespace ControlStreamBenchmark
