#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/ISocket.h"
#include "notification/AsioPostalService.h"

#include <chrono>
#include <cstdint>
#include <memory>

namespace ControlStreamServer {

/// The TCP listening end of the control stream, on all IPv4 interfaces.
///
/// Owns: the one thread, "VSocketASIO0", on which every accept, read, parser and command of the
/// server runs. Connections come in one at a time, the next after the handler has returned.
/// Threads: made by one thread, destroyed on any, its own included. The destructor waits for the
/// thread, so whoever hands out the connections closes them first.
/// Failure: a port that cannot be taken leaves an object that never accepts, and an accept that
/// fails ends accepting for good; neither is told to anybody. A connection that meets no handler
/// raises boost::bad_function_call on the thread.
class VSocketASIO : public ISocket
{
public:
    /// Starts to listen.
    ///
    /// Throws boost::system::system_error with the location "open" or "set_option".
    ///
    /// @param port  0 takes any free one, which serves tests
    explicit VSocketASIO(std::uint16_t port);

    VSocketASIO(const VSocketASIO&) = delete;
    VSocketASIO& operator=(const VSocketASIO&) = delete;

    void SetConnectionHandler(ConnectionHandler handler) override;

    /// Returns the port that it listens on, or 0 where it could not take it. [any]
    std::uint16_t Port() const { return listeningPort; }

    /// Waits until the thread has left what it is inside of, but no longer than the limit. Not for
    /// that thread. @return false at the limit
    bool AwaitThread(std::chrono::milliseconds limit);

    /// Ends accepting and waits for the thread.
    ///
    /// Throws boost::system::system_error with the location "close" where the system refuses.
    ~VSocketASIO() noexcept(false) override;

private:
    class VAcceptor;
    struct VState;

    static bool TakePort(VAcceptor& acceptor, std::uint16_t port);
    static void ArmAccept(const std::shared_ptr<VState>& state);

    // Released in reverse order: the acceptor, the thread, and last the state, with the handler,
    // which the thread's completions use.
    const std::shared_ptr<VState> state;
    NotificationSystem::VAsioPostalService postalService;
    std::shared_ptr<VAcceptor> acceptor;
    std::uint16_t listeningPort = 0;
};

} // namespace ControlStreamServer
