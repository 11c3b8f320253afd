#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <thread>

#include <netinet/in.h>

namespace FakeHost {

/// What becomes of bytes on their way through a proxy.
struct VPassed
{
    std::string Bytes;                ///< to be passed on
    std::chrono::milliseconds Wait{}; ///< before that; order is kept
    bool Close = false;               ///< closes the connection behind them, on both sides
};

/// What a proxy does to the bytes of one connection.
///
/// Threads: the proxy's. Failure: must not throw.
class IByteFilter
{
public:
    /// Whether anything is read from the device at all; asked once.
    virtual bool ReadsDevice() = 0;

    virtual VPassed FromDevice(const std::string& bytes) = 0;
    virtual VPassed FromHost(const std::string& bytes) = 0;

    /// Neither side has anything more to say.
    virtual ~IByteFilter() = default;
};

/// Stands between devices and a host, and lets a filter do to each connection's bytes what it
/// likes.
///
/// Owns: the listening socket, all connections, and the thread on which everything happens.
/// Threads: made and destroyed by one. Failure: std::system_error where it cannot listen; a host
/// that takes no connection is shown to the device by a connection that is closed at once.
class VByteProxy
{
public:
    using MakeFilter = std::function<std::unique_ptr<IByteFilter>(unsigned connection)>;

    /// Listens; devices that connect wait until Start.
    ///
    /// @param port  to listen on, on all IPv4 interfaces; 0 takes any free one
    /// @param host  where the host listens
    VByteProxy(std::uint16_t port, const sockaddr_in& host);

    /// Listens and starts.
    VByteProxy(std::uint16_t port, const sockaddr_in& host, MakeFilter makeFilter);

    /// Closes everything.
    ~VByteProxy();

    VByteProxy(const VByteProxy&) = delete;
    VByteProxy& operator=(const VByteProxy&) = delete;

    /// Begins to serve the devices; to be called once.
    ///
    /// @param makeFilter  called on the proxy's thread, with 1 for the first connection
    void Start(MakeFilter makeFilter);

    std::uint16_t Port() const { return listeningPort; }

private:
    class VLoop;

    int stop = -1; // becomes readable to end the thread
    std::uint16_t listeningPort = 0;
    std::shared_ptr<VLoop> loop;
    std::thread thread; // runs the loop
};

/// Returns the address of a port of this machine's loopback interface.
sockaddr_in LoopbackAddress(std::uint16_t port);

} // namespace FakeHost
