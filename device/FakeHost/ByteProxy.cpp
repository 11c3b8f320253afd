#include "FakeHost/ByteProxy.h"

#include "FakeHost/ProxyChannel.h"

#include <algorithm>
#include <cerrno>
#include <list>
#include <system_error>
#include <utility>
#include <vector>

#include <netinet/tcp.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

namespace FakeHost {

namespace {

using Clock = VProxyChannel::Clock;

// How long nobody is accepted after no descriptor was free.
constexpr std::chrono::milliseconds acceptPause{100};

[[noreturn]] void Fail(const char* what)
{
    throw std::system_error(errno, std::generic_category(), what);
}

int OpenListener(std::uint16_t port, std::uint16_t& chosen)
{
    const int listener = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    const int on = 1;
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    socklen_t size = sizeof address;
    if (listener < 0 || setsockopt(listener, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on) != 0 ||
        bind(listener, reinterpret_cast<const sockaddr*>(&address), size) != 0 ||
        listen(listener, SOMAXCONN) != 0 ||
        getsockname(listener, reinterpret_cast<sockaddr*>(&address), &size) != 0) {
        const int error = errno;
        if (listener >= 0) {
            close(listener);
        }
        errno = error;
        Fail("the port cannot be taken");
    }
    chosen = ntohs(address.sin_port);
    return listener;
}

/// Waits for a connection that is being made. @return false where it failed, or `stop` became
/// readable first
bool WaitUntilConnected(int connecting, int stop)
{
    // All other connections wait as long, and a host that is there takes a moment.
    constexpr int limitMilliseconds = 5000;
    pollfd descriptors[] = {{stop, POLLIN, 0}, {connecting, POLLOUT, 0}};
    int error = 0;
    socklen_t size = sizeof error;
    return poll(descriptors, 2, limitMilliseconds) > 0 && descriptors[0].revents == 0 &&
           getsockopt(connecting, SOL_SOCKET, SO_ERROR, &error, &size) == 0 && error == 0;
}

/// @return -1 where the host takes no connection
int ConnectTo(const sockaddr_in& host, int stop)
{
    const int connected = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (connected < 0 ||
        connect(connected, reinterpret_cast<const sockaddr*>(&host), sizeof host) == 0 ||
        (errno == EINPROGRESS && WaitUntilConnected(connected, stop))) {
        return connected;
    }
    close(connected);
    return -1;
}

void SendAtOnce(int socket)
{
    const int on = 1;
    setsockopt(socket, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
}

/// A device's connection with the one to the host behind it.
class VPair
{
public:
    VPair(int deviceSocket, int hostSocket, std::unique_ptr<IByteFilter> byteFilter)
        : device(deviceSocket),
          host(hostSocket),
          filter(std::move(byteFilter)),
          readsDevice(filter->ReadsDevice())
    {
        SendAtOnce(device);
        SendAtOnce(host);
    }

    ~VPair()
    {
        close(device);
        if (!ended) {
            close(host);
        }
    }

    VPair(const VPair&) = delete;
    VPair& operator=(const VPair&) = delete;

    void AddTo(std::vector<pollfd>& descriptors, Clock::time_point now) const
    {
        if (ended) {
            descriptors.push_back({device, POLLIN, 0});
            descriptors.push_back({-1, 0, 0});
            return;
        }
        descriptors.push_back(
            {device, Wanted(readsDevice && toHost.WantsBytes(), toDevice, now), 0});
        descriptors.push_back({host, Wanted(toDevice.WantsBytes(), toHost, now), 0});
    }

    Clock::time_point NextDue(Clock::time_point now) const
    {
        // What is due already waits for its socket, not for the time.
        const Clock::time_point never = Clock::time_point::max();
        if (ended) {
            return never;
        }
        return std::min(toDevice.HasDue(now) ? never : toDevice.NextDue(),
                        toHost.HasDue(now) ? never : toHost.NextDue());
    }

    /// @return false where the pair has ended and the device knows
    bool Serve(short deviceEvents, short hostEvents, Clock::time_point now)
    {
        if (ended) {
            return DeviceIsThere();
        }
        if ((deviceEvents & (POLLERR | POLLNVAL)) != 0 ||
            (!readsDevice && (deviceEvents & POLLHUP) != 0)) {
            return false;
        }
        if (readsDevice && toHost.WantsBytes() && (deviceEvents & (POLLIN | POLLHUP)) != 0) {
            Read(device, toHost, &IByteFilter::FromDevice, now);
        }
        if (toDevice.WantsBytes() && (hostEvents & (POLLIN | POLLHUP | POLLERR)) != 0) {
            Read(host, toDevice, &IByteFilter::FromHost, now);
        }
        if (!toHost.Write(host, now) || !toDevice.Write(device, now) || toDevice.IsDone()) {
            End();
            return DeviceIsThere();
        }
        if (toHost.IsDone() && !std::exchange(toldHost, true)) {
            shutdown(host, SHUT_WR); // the host may have something to say yet
        }
        return true;
    }

private:
    /// Ends the connection to the host, and of the other one what goes to the device. It is closed
    /// only after the device has: with something unread it would be reset, and the last bytes on
    /// their way lost.
    void End()
    {
        ended = true;
        shutdown(device, SHUT_WR);
        close(host);
        filter.reset();
    }

    /// Throws away what the device sends. @return false where it has ended its side
    bool DeviceIsThere() const
    {
        char bytes[16384];
        const ssize_t count = recv(device, bytes, sizeof bytes, MSG_DONTWAIT);
        return count > 0 || (count < 0 && (errno == EAGAIN || errno == EINTR));
    }

    static short Wanted(bool reads, const VProxyChannel& writes, Clock::time_point now)
    {
        return static_cast<short>((reads ? POLLIN : 0) | (writes.HasDue(now) ? POLLOUT : 0));
    }

    void Read(int from, VProxyChannel& channel, VPassed (IByteFilter::*pass)(const std::string&),
              Clock::time_point now)
    {
        char bytes[16384];
        const ssize_t count = recv(from, bytes, sizeof bytes, MSG_DONTWAIT);
        if (count > 0) {
            channel.Put((filter.get()->*pass)(std::string(bytes, static_cast<std::size_t>(count))),
                        now);
        } else if (count == 0 || (errno != EAGAIN && errno != EINTR)) {
            channel.End();
        }
    }

    const int device;
    const int host;
    std::unique_ptr<IByteFilter> filter; // gone with the connection to the host
    const bool readsDevice;
    bool ended = false;
    bool toldHost = false;
    VProxyChannel toHost;
    VProxyChannel toDevice;
};

} // namespace

/// What the proxy's thread does.
class VByteProxy::VLoop
{
public:
    VLoop(int listeningSocket, int stopDescriptor, const sockaddr_in& hostAddress)
        : listener(listeningSocket), stop(stopDescriptor), host(hostAddress)
    {
    }

    ~VLoop() { close(listener); }

    VLoop(const VLoop&) = delete;
    VLoop& operator=(const VLoop&) = delete;

    void Run(const MakeFilter& makeFilter)
    {
        std::vector<pollfd> descriptors;
        for (;;) {
            const Clock::time_point before = Clock::now();
            const bool accepts = before >= acceptAgain;
            descriptors = {{stop, POLLIN, 0}, {accepts ? listener : -1, POLLIN, 0}};
            Clock::time_point due = accepts ? Clock::time_point::max() : acceptAgain;
            for (const VPair& pair : pairs) {
                pair.AddTo(descriptors, before);
                due = std::min(due, pair.NextDue(before));
            }
            poll(descriptors.data(), descriptors.size(), Milliseconds(due, before));
            if (descriptors[0].revents != 0) {
                pairs.clear();
                return;
            }
            ServePairs(descriptors);
            if (descriptors[1].revents != 0) {
                Accept(makeFilter);
            }
        }
    }

private:
    static int Milliseconds(Clock::time_point due, Clock::time_point now)
    {
        if (due == Clock::time_point::max()) {
            return -1;
        }
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(due - now).count();
        return static_cast<int>(std::clamp<std::int64_t>(left, 0, 3600000));
    }

    void ServePairs(const std::vector<pollfd>& descriptors)
    {
        const Clock::time_point now = Clock::now();
        std::size_t index = 2;
        for (auto pair = pairs.begin(); pair != pairs.end(); index += 2) {
            const bool goesOn =
                pair->Serve(descriptors[index].revents, descriptors[index + 1].revents, now);
            pair = goesOn ? std::next(pair) : pairs.erase(pair);
        }
    }

    void Accept(const MakeFilter& makeFilter)
    {
        const int device = accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
        if (device < 0) {
            // Gone again, or the system has no room. The device then stays where it is, and the
            // listener readable, so that without a pause each turn would try in vain.
            if (errno == EMFILE || errno == ENFILE || errno == ENOBUFS || errno == ENOMEM) {
                acceptAgain = Clock::now() + acceptPause;
            }
            return;
        }
        const int connected = ConnectTo(host, stop);
        if (connected < 0) {
            close(device);
            return;
        }
        pairs.emplace_back(device, connected, makeFilter(++accepted));
    }

    const int listener;
    const int stop;
    const sockaddr_in host;
    unsigned accepted = 0;
    Clock::time_point acceptAgain = Clock::time_point::min();
    std::list<VPair> pairs;
};

VByteProxy::VByteProxy(std::uint16_t port, const sockaddr_in& host) : stop(eventfd(0, EFD_CLOEXEC))
{
    if (stop < 0) {
        Fail("no descriptor is free");
    }
    try {
        const int listener = OpenListener(port, listeningPort);
        loop = std::make_shared<VLoop>(listener, stop, host);
    } catch (...) {
        close(stop);
        throw;
    }
}

VByteProxy::VByteProxy(std::uint16_t port, const sockaddr_in& host, MakeFilter makeFilter)
    : VByteProxy(port, host)
{
    Start(std::move(makeFilter));
}

VByteProxy::~VByteProxy()
{
    eventfd_write(stop, 1);
    if (thread.joinable()) {
        thread.join();
    }
    close(stop);
}

void VByteProxy::Start(MakeFilter makeFilter)
{
    thread =
        std::thread([running = loop, filters = std::move(makeFilter)] { running->Run(filters); });
}

sockaddr_in LoopbackAddress(std::uint16_t port)
{
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    return address;
}

} // namespace FakeHost
