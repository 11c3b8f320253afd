#include "Statistics.h"

#include <algorithm>
#include <cmath>
#include <ctime>

namespace ControlStreamBenchmark {

namespace {

double PercentileMicroseconds(std::vector<std::uint32_t>& nanoseconds, double fraction)
{
    const auto last = static_cast<double>(nanoseconds.size() - 1);
    const auto rank = nanoseconds.begin() + std::lround(fraction * last);
    std::nth_element(nanoseconds.begin(), rank, nanoseconds.end());
    return *rank / 1000.0;
}

} // namespace

std::int64_t NowNanoseconds()
{
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return std::int64_t{now.tv_sec} * 1'000'000'000 + now.tv_nsec;
}

void AddPercentiles(VFigures& figures, std::vector<std::uint32_t>& nanoseconds)
{
    if (nanoseconds.empty()) {
        return;
    }
    figures.emplace_back("p50_us", PercentileMicroseconds(nanoseconds, 0.5));
    figures.emplace_back("p99_us", PercentileMicroseconds(nanoseconds, 0.99));
    figures.emplace_back("p999_us", PercentileMicroseconds(nanoseconds, 0.999));
}

double Median(std::vector<double>& values)
{
    std::sort(values.begin(), values.end());
    const std::size_t middle = values.size() / 2;
    return values.size() % 2 == 1 ? values[middle] : (values[middle - 1] + values[middle]) / 2;
}

} // namespace ControlStreamBenchmark
