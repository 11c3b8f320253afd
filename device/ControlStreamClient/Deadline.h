#pragma once

#include <chrono>
#include <cstddef>
#include <string>

namespace ControlStream {

/// The moment at which a time limit runs out, on the clock that nobody sets.
///
/// Threads: a plain value.
class VDeadline
{
public:
    using Clock = std::chrono::steady_clock;

    /// @param timeLimit  from now on; negative counts as 0, NoLimit never runs out
    explicit VDeadline(std::chrono::milliseconds timeLimit);

    bool IsOver() const;

    /// What is left, rounded up so that a waiter does not spin through the last millisecond, as
    /// `poll` takes it: 0 when over, -1 for ever.
    int PollMilliseconds() const;

    /// A deadline after an equal part of what is left, which never lies behind this one.
    VDeadline Part(std::size_t parts) const;

    /// This deadline, or the one after `longest` from now where that comes sooner.
    VDeadline Sooner(std::chrono::milliseconds longest) const;

    /// The whole limit for people, as "2.5 s".
    std::string LimitText() const;

private:
    std::chrono::milliseconds Left() const;

    std::chrono::milliseconds limit;
    Clock::time_point end;
};

} // namespace ControlStream
