#include "Measurements.h"

#include "Comparison.h"
#include "DeviceConnection.h"
#include "Usage.h"

#include <sys/epoll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <system_error>

namespace ControlStreamBenchmark {

namespace {

constexpr std::size_t deviceCount = 64;
constexpr std::int64_t silenceNanoseconds = 30'000'000'000;

/// Devices of one thread in a closed loop: each has one request under way.
class VClosedLoop
{
public:
    VClosedLoop(const IServer& server, std::size_t devices, const std::string& expectedReply)
        : process(server.Process()),
          request(ExecuteCommandFrame()),
          reply(expectedReply),
          queue(epoll_create1(EPOLL_CLOEXEC))
    {
        for (std::size_t index = 0; index < devices; ++index) {
            loops.emplace_back(server.Port());
            epoll_event event{};
            event.events = EPOLLIN;
            event.data.u64 = index;
            epoll_ctl(queue, EPOLL_CTL_ADD, loops.back().Device.Socket(), &event);
        }
    }

    VClosedLoop(const VClosedLoop&) = delete;
    VClosedLoop& operator=(const VClosedLoop&) = delete;

    ~VClosedLoop() { close(queue); }

    /// Runs for `seconds`, and until every request is answered.
    ///
    /// @param spin  whether this thread has a core of its own, and asks again without sleeping
    VFigures Sample(double seconds, bool spin)
    {
        nanoseconds.clear();
        const VUsage usage(process);
        end = NowNanoseconds() + static_cast<std::int64_t>(seconds * 1e9);
        for (VLoop& loop : loops) {
            Send(loop, NowNanoseconds());
        }
        while (underWay > 0) {
            TakeReplies(spin);
        }

        const std::size_t requests = nanoseconds.size();
        VFigures figures = usage.Figures(requests, "request");
        figures.emplace_back("requests_per_second",
                             static_cast<double>(requests) / usage.Seconds());
        AddPercentiles(figures, nanoseconds);
        return figures;
    }

private:
    struct VLoop
    {
        explicit VLoop(std::uint16_t port) : Device(port) {}

        VDeviceConnection Device;
        std::int64_t SentAt = 0;
        std::size_t Received = 0;
    };

    void Send(VLoop& loop, std::int64_t now)
    {
        loop.SentAt = now;
        loop.Received = 0;
        ++underWay;
        // One small frame always fits the buffer of a socket whose last frame was answered.
        if (send(loop.Device.Socket(), request.data(), request.size(), MSG_NOSIGNAL) !=
            static_cast<ssize_t>(request.size())) {
            throw std::system_error(errno, std::generic_category(), "send");
        }
    }

    void TakeReplies(bool spin)
    {
        std::array<epoll_event, deviceCount> events; // not filled: the kernel does
        const int milliseconds = static_cast<int>(silenceNanoseconds / 1'000'000);
        const int count = epoll_wait(queue, events.data(), events.size(), spin ? 0 : milliseconds);
        const std::int64_t now = NowNanoseconds();
        for (int index = 0; index < count; ++index) {
            TakeReply(loops[events[static_cast<std::size_t>(index)].data.u64], now);
        }
        if (now - end > silenceNanoseconds || (!spin && count == 0)) {
            throw std::runtime_error("the server has stopped answering");
        }
    }

    void TakeReply(VLoop& loop, std::int64_t now)
    {
        std::array<char, 4096> buffer; // not filled: it would be work beside the request
        const std::size_t missing = reply.size() - loop.Received;
        const ssize_t size =
            recv(loop.Device.Socket(), buffer.data(), std::min(missing, buffer.size()), 0);
        if (size <= 0) {
            throw std::runtime_error("the server has ended a connection");
        }
        if (std::memcmp(buffer.data(), reply.data() + loop.Received,
                        static_cast<std::size_t>(size)) != 0) {
            throw std::runtime_error("the server gave another reply than before");
        }
        loop.Received += static_cast<std::size_t>(size);
        if (loop.Received == reply.size()) {
            nanoseconds.push_back(static_cast<std::uint32_t>(now - loop.SentAt));
            --underWay;
            if (now < end) {
                Send(loop, now);
            }
        }
    }

    pid_t process;
    std::string request;
    std::string reply;
    int queue;
    std::vector<VLoop> loops;
    std::vector<std::uint32_t> nanoseconds;
    std::int64_t end = 0;
    std::size_t underWay = 0;
};

} // namespace

nlohmann::ordered_json MeasureConnections(const VSettings& settings, const IServer& host,
                                          const IServer& limit, const std::string& reply)
{
    VClosedLoop hostLoop(host, deviceCount, reply);
    VClosedLoop limitLoop(limit, deviceCount, reply);
    nlohmann::ordered_json result;
    for (const VPlacement& placement : RatePlacements(settings)) {
        PinThisThread(placement.ClientCore);
        PinProcess(host.Process(), placement.ServerCore);
        PinProcess(limit.Process(), placement.ServerCore);
        const bool spin = !placement.IsShared();
        result[placement.Name()] = Compare(
            settings.Rounds, {{"requests_per_second", 0.6, false}},
            [&] { return hostLoop.Sample(settings.Seconds, spin); },
            [&] { return limitLoop.Sample(settings.Seconds, spin); });
    }
    return result;
}

} // namespace ControlStreamBenchmark
