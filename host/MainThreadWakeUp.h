#pragma once

#include <boost/function.hpp>

#include <memory>

class QSocketNotifier;

namespace QuorixHost {

/// Lets any thread have a function called on the main thread's event loop.
///
/// Several wakes before the loop turns make one call. A wake before the loop runs is kept until it
/// does. Owns: an event descriptor, watched by the loop. Threads: made and destroyed [gui].
class VMainThreadWakeUp
{
public:
    /// @param function  called on the event loop, with no lock held
    /// Throws std::system_error where the system has no descriptor left.
    explicit VMainThreadWakeUp(boost::function<void()> function);
    ~VMainThreadWakeUp();

    VMainThreadWakeUp(const VMainThreadWakeUp&) = delete;
    VMainThreadWakeUp& operator=(const VMainThreadWakeUp&) = delete;

    /// Has the function called, soon. [any]
    void Wake();

private:
    void OnReadable();

    boost::function<void()> function;
    int descriptor;
    std::unique_ptr<QSocketNotifier> notifier; // goes before the descriptor is closed
};

} // namespace QuorixHost
