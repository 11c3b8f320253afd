#include "ControlStreamClient/BackOff.h"

#include <algorithm>
#include <random>
#include <utility>

namespace ControlStream {

VBackOff::VBackOff(const VBackOffOptions& backOffOptions, Chance backOffChance)
    : options(backOffOptions), chance(std::move(backOffChance)), step(options.First)
{
}

std::chrono::milliseconds VBackOff::Next()
{
    const std::chrono::milliseconds whole =
        std::clamp(step, std::chrono::milliseconds(1),
                   std::max(options.Longest, std::chrono::milliseconds(1)));
    step = std::min(whole * 2, options.Longest);
    const double kept = 1.0 - std::clamp(options.Spread, 0.0, 1.0) * chance();
    return std::chrono::milliseconds(std::max<std::chrono::milliseconds::rep>(
        1, static_cast<std::chrono::milliseconds::rep>(static_cast<double>(whole.count()) * kept)));
}

double VBackOff::RandomChance()
{
    thread_local std::minstd_rand engine{std::random_device{}()};
    return std::uniform_real_distribution<double>(0.0, 1.0)(engine);
}

} // namespace ControlStream
