#pragma once

#include "support/RawClient.h"

#include <functional>
#include <string>
#include <thread>
#include <utility>

#include <netinet/in.h>
#include <sys/eventfd.h>
#include <sys/socket.h>

/// What every reply opens with.
constexpr const char* Declaration = R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)";

/// The one side of a connection that a script drives.
using VPeer = TestSupport::VRawClient;

/// A host that does what a test's script says with each connection, one after the other, on a
/// thread of its own. Nothing of it understands the protocol.
///
/// A script that meets the end of its connection too early, or waits too long, ends with an
/// exception; its text is kept for the test. The destructor waits for the script that runs.
class VScriptedHost
{
public:
    using Script = std::function<void(VPeer& peer)>;

    /// @param hostScript  called for each connection, which is closed when it returns
    explicit VScriptedHost(Script hostScript) : script(std::move(hostScript))
    {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        socklen_t size = sizeof address;
        if (listener < 0 || stop < 0 ||
            ::bind(listener, reinterpret_cast<sockaddr*>(&address), size) != 0 ||
            ::listen(listener, 16) != 0 ||
            ::getsockname(listener, reinterpret_cast<sockaddr*>(&address), &size) != 0) {
            throw std::runtime_error("no scripted host");
        }
        port = ntohs(address.sin_port);
        thread = std::thread([this] { Serve(); });
    }

    ~VScriptedHost()
    {
        if (thread.joinable()) {
            Finish();
        }
        ::close(listener);
        ::close(stop);
    }

    VScriptedHost(const VScriptedHost&) = delete;
    VScriptedHost& operator=(const VScriptedHost&) = delete;

    std::uint16_t Port() const { return port; }

    /// Waits for the running script and takes no more connections.
    ///
    /// @return what went wrong in the scripts, empty where nothing did
    std::string Finish()
    {
        ::eventfd_write(stop, 1);
        thread.join();
        return failure;
    }

private:
    void Serve()
    {
        for (;;) {
            pollfd descriptors[] = {{listener, POLLIN, 0}, {stop, POLLIN, 0}};
            ::poll(descriptors, 2, -1);
            if ((descriptors[0].revents & POLLIN) == 0) {
                return; // nobody is waiting, and nobody will come
            }
            VPeer peer(::accept4(listener, nullptr, nullptr, SOCK_CLOEXEC), nullptr);
            try {
                script(peer);
            } catch (const std::exception& error) {
                failure += error.what();
            }
        }
    }

    const Script script;
    const int listener = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const int stop = ::eventfd(0, EFD_CLOEXEC);
    std::uint16_t port = 0;
    std::string failure; // read once the thread has ended
    std::thread thread;
};
