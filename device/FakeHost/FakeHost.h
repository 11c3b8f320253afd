#pragma once

#include "FakeHost/IFakeContent.h"

#include <cstdint>
#include <memory>

namespace ControlStreamServer {
class IServer;
class VSocketASIO;
} // namespace ControlStreamServer

namespace FakeHost {

/// A host for makers of devices: the real server, on any port, over whatever content.
///
/// Owns: the content, the server, and its thread. Threads: made and destroyed by one.
/// Failure: std::runtime_error where the port cannot be taken.
class VFakeHost
{
public:
    /// @param port  0 takes any free one
    VFakeHost(std::unique_ptr<IFakeContent> fakeContent, std::uint16_t port);

    /// Closes every connection and lets go of the port. Waits two seconds at most for a command
    /// that is running.
    ~VFakeHost();

    VFakeHost(const VFakeHost&) = delete;
    VFakeHost& operator=(const VFakeHost&) = delete;

    std::uint16_t Port() const { return port; }

private:
    // The server goes first and closes the connections; then the socket waits for its thread. The
    // content goes last, here and nowhere else: it waits for threads of its own.
    const std::unique_ptr<IFakeContent> content;
    std::uint16_t port = 0;
    std::shared_ptr<ControlStreamServer::VSocketASIO> listening;
    std::shared_ptr<ControlStreamServer::IServer> server;
};

} // namespace FakeHost
