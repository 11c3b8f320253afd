#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace ControlStreamBenchmark {

/// The named figures of one sample, in the order in which they are printed.
using VFigures = std::vector<std::pair<std::string, double>>;

/// @return the monotonic clock's time
std::int64_t NowNanoseconds();

/// Adds p50_us, p99_us and p999_us of `nanoseconds`, which is reordered. Adds nothing if it is
/// empty.
void AddPercentiles(VFigures& figures, std::vector<std::uint32_t>& nanoseconds);

/// @param values  must not be empty; is reordered
double Median(std::vector<double>& values);

} // namespace ControlStreamBenchmark
