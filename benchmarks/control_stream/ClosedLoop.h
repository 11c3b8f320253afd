#pragma once

#include "DeviceConnection.h"
#include "Servers.h"
#include "Statistics.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace ControlStreamBenchmark {

/// Devices of one thread in a closed loop: each has one request under way.
///
/// Threads: one at a time.
class VClosedLoop
{
public:
    /// @param request  the frame that each device sends
    /// @param reply    the frame that must answer it, every time
    VClosedLoop(const IServer& server, std::size_t devices, std::string request, std::string reply);

    VClosedLoop(const VClosedLoop&) = delete;
    VClosedLoop& operator=(const VClosedLoop&) = delete;
    ~VClosedLoop();

    /// Runs for `seconds`, and until every request is answered. Throws std::runtime_error where
    /// another byte comes, a connection ends, or nothing comes for long.
    ///
    /// @param spin  whether this thread has a core of its own, and asks again without sleeping
    VFigures Sample(double seconds, bool spin);

private:
    struct VLoop
    {
        explicit VLoop(std::uint16_t port) : Device(port) {}

        VDeviceConnection Device;
        std::int64_t SentAt = 0;
        std::size_t Received = 0;
    };

    void Send(VLoop& loop, std::int64_t now);
    void TakeReplies(bool spin);
    void TakeReply(VLoop& loop, std::int64_t now);

    pid_t process;
    std::string request;
    std::string reply;
    int queue;
    std::vector<VLoop> loops;
    std::vector<std::uint32_t> nanoseconds;
    std::int64_t end = 0;
    std::size_t underWay = 0;
};

} // namespace ControlStreamBenchmark
