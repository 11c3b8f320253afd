#pragma once

#include <boost/function.hpp>

#include <chrono>
#include <string>
#include <thread>

namespace QuorixHost {

/// Receives the wish to stop, by SIGINT, SIGTERM or Request, and stays awake while the main thread
/// stops, which a device that reads nothing can hold up without bound.
///
/// The first wish is handed to the main thread. If the stop is not done within the patience, the
/// log says what holds it up. A second signal ends the process at once, whatever any thread waits
/// for; once the log has said so, the next one does, also where the first wish was a request. Owns:
/// a thread, the only one that the two signals interrupt. One object in a process at a time.
/// Threads: made and destroyed on the main thread, before any other thread is made and as the last
/// thing of all.
class VOrderlyStop
{
public:
    /// @param requestStop    called once [stop], to have the main thread stop
    /// @param describeHolds  called once [stop] when the patience is over; returns what holds it up
    /// Throws std::system_error where the system has no descriptor or thread left.
    VOrderlyStop(boost::function<void()> requestStop, boost::function<std::string()> describeHolds,
                 std::chrono::milliseconds patience);

    /// Says that the stop is done. A signal that comes after it is ignored.
    ~VOrderlyStop();

    VOrderlyStop(const VOrderlyStop&) = delete;
    VOrderlyStop& operator=(const VOrderlyStop&) = delete;

    /// Stops as a first signal does; further calls do nothing. [any]
    void Request();

    /// The exit code of a process that a second signal ended.
    static constexpr int forcedExitCode = 130;

private:
    void Run();
    void WatchStop();

    boost::function<void()> requestStop;
    boost::function<std::string()> describeHolds;
    std::chrono::milliseconds patience;
    int requested; // event descriptors: each becomes readable once
    int done;
    std::thread thread;
};

} // namespace QuorixHost
