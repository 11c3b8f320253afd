#include "ControlStreamClient/Deadline.h"

#include "ControlStreamClient/Client.h"

#include <algorithm>
#include <limits>

namespace ControlStream {

namespace {

// A limit of years would overflow the clock's nanoseconds, and nobody can tell it from none.
constexpr std::chrono::milliseconds LongestLimit = std::chrono::hours(24 * 365 * 100);

} // namespace

VDeadline::VDeadline(std::chrono::milliseconds timeLimit)
    : limit(std::max(timeLimit, std::chrono::milliseconds::zero())),
      end(limit > LongestLimit ? Clock::time_point::max() : Clock::now() + limit)
{
}

bool VDeadline::IsOver() const
{
    return end != Clock::time_point::max() && Clock::now() >= end;
}

int VDeadline::PollMilliseconds() const
{
    if (end == Clock::time_point::max()) {
        return -1;
    }
    const std::chrono::milliseconds longestPoll(std::numeric_limits<int>::max());
    return static_cast<int>(std::min(Left(), longestPoll).count());
}

VDeadline VDeadline::Part(std::size_t parts) const
{
    if (end == Clock::time_point::max()) {
        return *this;
    }
    return VDeadline(Left() / std::max<std::size_t>(parts, 1));
}

VDeadline VDeadline::Sooner(std::chrono::milliseconds longest) const
{
    const VDeadline sooner(longest);
    return sooner.end < end ? sooner : *this;
}

std::string VDeadline::LimitText() const
{
    const auto count = limit.count();
    std::string text = std::to_string(count / 1000);
    if (count % 1000 != 0) {
        const std::string thousandths = std::to_string(1000 + count % 1000).substr(1);
        text += "." + thousandths.substr(0, thousandths.find_last_not_of('0') + 1);
    }
    return text + " s";
}

std::chrono::milliseconds VDeadline::Left() const
{
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - Clock::now());
    return std::max(left, std::chrono::milliseconds::zero());
}

} // namespace ControlStream
