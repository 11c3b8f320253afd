#pragma once

#include <cstddef>
#include <deque>
#include <functional>
#include <limits>
#include <mutex>

/// What other threads want the main thread to do.
///
/// Owns: the functions, and a descriptor that is readable while there are any. Threads: Post and
/// PostEvent [any], the rest the main thread.
class VShellInbox
{
public:
    VShellInbox();
    ~VShellInbox();
    VShellInbox(const VShellInbox&) = delete;
    VShellInbox& operator=(const VShellInbox&) = delete;

    using OnLeftOut = std::function<void(std::size_t)>;

    void Post(std::function<void()> function);

    /// The same for what may be left out where too much waits.
    void PostEvent(std::function<void()> function);

    /// Bounds what waits: once so many functions do, events are left out until all have run.
    ///
    /// @param onLeftOut  called then, with their number
    void LimitEvents(std::size_t limit, OnLeftOut onLeftOut);

    int Descriptor() const { return wake; }

    /// Runs what was posted, in order, or as much of it as need not keep a typing user waiting.
    void RunSome();

private:
    void Add(std::function<void()> function);

    const int wake;
    OnLeftOut tellLeftOut;
    std::mutex mutex; // guards all below, and that the descriptor tells of the functions
    std::deque<std::function<void()>> posted;
    std::size_t eventLimit = std::numeric_limits<std::size_t>::max();
    std::size_t leftOut = 0; // since the limit was met
};
