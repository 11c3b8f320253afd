#include "ClosedLoop.h"

#include "Usage.h"

#include <sys/epoll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace ControlStreamBenchmark {

namespace {

constexpr std::size_t repliesAtOnce = 64;
constexpr std::int64_t silenceNanoseconds = 30'000'000'000;

} // namespace

VClosedLoop::VClosedLoop(const IServer& server, std::size_t devices, std::string request,
                         std::string reply)
    : process(server.Process()),
      request(std::move(request)),
      reply(std::move(reply)),
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

VClosedLoop::~VClosedLoop()
{
    close(queue);
}

VFigures VClosedLoop::Sample(double seconds, bool spin)
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
    figures.emplace_back("requests_per_second", static_cast<double>(requests) / usage.Seconds());
    AddPercentiles(figures, nanoseconds);
    return figures;
}

void VClosedLoop::Send(VLoop& loop, std::int64_t now)
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

void VClosedLoop::TakeReplies(bool spin)
{
    std::array<epoll_event, repliesAtOnce> events; // not filled: the kernel does
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

void VClosedLoop::TakeReply(VLoop& loop, std::int64_t now)
{
    std::array<char, 4096> buffer; // not filled: it would be work beside the request
    const std::size_t missing = reply.size() - loop.Received;
    const ssize_t size =
        recv(loop.Device.Socket(), buffer.data(), std::min(missing, buffer.size()), 0);
    if (size <= 0) {
        throw std::runtime_error("the server has ended a connection");
    }
    if (std::memcmp(buffer.data(), reply.data() + loop.Received, static_cast<std::size_t>(size)) !=
        0) {
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

} // namespace ControlStreamBenchmark
