#include "comparison/Comparison.h"

#include <algorithm>
#include <chrono>
#include <ctime>

namespace {

double ThreadSeconds()
{
    timespec time{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) * 1e-9;
}

} // namespace

double SecondsOf(const std::function<void()>& work)
{
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

double ProcessorSecondsOf(const std::function<void()>& work)
{
    const double start = ThreadSeconds();
    work();
    return ThreadSeconds() - start;
}

double MedianOf(std::vector<double> numbers)
{
    const auto middle = numbers.begin() + static_cast<std::ptrdiff_t>(numbers.size() / 2);
    std::nth_element(numbers.begin(), middle, numbers.end());
    return *middle;
}

nlohmann::json RangeOf(const std::vector<double>& ratios)
{
    const auto [least, greatest] = std::minmax_element(ratios.begin(), ratios.end());
    return {*least, *greatest};
}

nlohmann::json Compare(unsigned rounds, double operations, const std::function<void()>& own,
                       const std::function<void()>& limit, std::optional<double> aim)
{
    own(); // the first of each finds cold caches and grows its buffers
    limit();

    std::vector<double> ownTimes;
    std::vector<double> limitTimes;
    std::vector<double> ratios;
    for (unsigned round = 0; round < rounds; ++round) {
        // Who goes first changes, or the second would always find what the first has warmed.
        const bool ownFirst = round % 2 == 0;
        const double first = ProcessorSecondsOf(ownFirst ? own : limit);
        const double second = ProcessorSecondsOf(ownFirst ? limit : own);
        ownTimes.push_back(ownFirst ? first : second);
        limitTimes.push_back(ownFirst ? second : first);
        ratios.push_back(ownTimes.back() / limitTimes.back());
    }

    nlohmann::json result = {
        {"own_ns", MedianOf(ownTimes) * 1e9 / operations},
        {"limit_ns", MedianOf(limitTimes) * 1e9 / operations},
        {"ratio", MedianOf(ratios)},
        {"ratio_range", RangeOf(ratios)},
    };
    if (aim) {
        result["aim"] = *aim;
        result["aim_met"] = result["ratio"].get<double>() <= *aim;
    }
    return result;
}
