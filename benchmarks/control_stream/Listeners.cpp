#include "Listeners.h"

#include "Statistics.h"

#include <sys/epoll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>

namespace ControlStreamBenchmark {

namespace {

constexpr std::int64_t silenceNanoseconds = 30'000'000'000;
constexpr std::size_t bufferBytes = 65536;

} // namespace

VListeners::VListeners(std::uint16_t port, std::size_t count, const std::string& expectedEvent)
    : event(expectedEvent), queue(epoll_create1(EPOLL_CLOEXEC)), buffer(bufferBytes)
{
    for (std::size_t index = 0; index < count; ++index) {
        listeners.emplace_back(port);
        epoll_event watched{};
        watched.events = EPOLLIN;
        watched.data.u64 = index;
        epoll_ctl(queue, EPOLL_CTL_ADD, listeners.back().Device.Socket(), &watched);
    }
}

VListeners::~VListeners()
{
    close(queue);
}

void VListeners::Introduce()
{
    for (VListener& listener : listeners) {
        listener.Device.Ask(ServerInformationFrame());
    }
}

VReception VListeners::Receive(std::size_t events, bool spin)
{
    const std::size_t expected = events * event.size();
    const int milliseconds = static_cast<int>(silenceNanoseconds / 1'000'000);
    VReception reception;
    std::int64_t lastSeen = NowNanoseconds();
    std::size_t complete = 0;
    while (complete < listeners.size()) {
        std::array<epoll_event, 256> ready; // not filled: the kernel does
        const int count = epoll_wait(queue, ready.data(), ready.size(), spin ? 0 : milliseconds);
        if (count <= 0) {
            if (NowNanoseconds() - lastSeen > silenceNanoseconds) {
                throw std::runtime_error("events have stopped coming");
            }
            continue;
        }
        lastSeen = NowNanoseconds();
        if (reception.First == 0) {
            reception.First = lastSeen;
        }
        for (int index = 0; index < count; ++index) {
            VListener& listener = listeners[ready[static_cast<std::size_t>(index)].data.u64];
            Take(listener, expected);
            complete += listener.Received == expected ? 1 : 0;
        }
    }
    reception.Last = NowNanoseconds();
    for (VListener& listener : listeners) {
        listener.Received = 0;
    }
    return reception;
}

void VListeners::Take(VListener& listener, std::size_t expected)
{
    const ssize_t size = recv(listener.Device.Socket(), buffer.data(), buffer.size(), MSG_DONTWAIT);
    if (size < 0 && errno == EAGAIN) {
        return;
    }
    if (size <= 0 || listener.Received + static_cast<std::size_t>(size) > expected) {
        throw std::runtime_error("a listener's connection has ended, or it got too much");
    }
    const char* bytes = buffer.data();
    for (auto left = static_cast<std::size_t>(size); left > 0;) {
        const std::size_t offset = listener.Received % event.size();
        const std::size_t part = std::min(left, event.size() - offset);
        if (std::memcmp(bytes, event.data() + offset, part) != 0) {
            throw std::runtime_error("a listener got another event than was fired");
        }
        bytes += part;
        left -= part;
        listener.Received += part;
    }
}

} // namespace ControlStreamBenchmark
