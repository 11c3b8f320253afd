#pragma once

#include "Arrivals.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ClientConnectionASIO.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"

#include "support/RawClient.h"

#include <boost/function.hpp>
#include <gtest/gtest.h>

#include <cstddef>
#include <memory>
#include <string>

/// Returns the descriptor of this process's other end of a connection.
inline int OtherEndOf(const TestSupport::VRawClient& client)
{
    sockaddr_in own{};
    socklen_t size = sizeof own;
    EXPECT_EQ(0, ::getsockname(client.Descriptor(), reinterpret_cast<sockaddr*>(&own), &size));
    for (int descriptor = 3; descriptor < 1024; ++descriptor) {
        sockaddr_in peer{};
        size = sizeof peer;
        if (::getpeername(descriptor, reinterpret_cast<sockaddr*>(&peer), &size) == 0 &&
            peer.sin_family == AF_INET && peer.sin_port == own.sin_port) {
            return descriptor;
        }
    }
    return -1;
}

/// Accepts connections and collects their messages; nobody answers.
class VConnectionFixture : public testing::Test
{
protected:
    VConnectionFixture()
    {
        socket->SetConnectionHandler(
            [this](const std::shared_ptr<ControlStreamServer::IClientConnection>& connection) {
                if (listening) {
                    connection->GetMessageCallback().SetDirect(
                        [this](
                            const std::shared_ptr<ControlStreamServer::IClientConnection>& sender,
                            const std::wstring& message) {
                            if (onMessage) {
                                onMessage(sender);
                            }
                            messages.Add(message);
                        });
                }
                connections.Add(connection);
            });
    }

    ~VConnectionFixture() override { Stop(); }

    void Stop()
    {
        for (const auto& connection : connections.All()) {
            if (const auto open = connection.lock()) {
                open->Close();
            }
        }
        socket.reset();
    }

    /// Returns the server's end of the connection that was made last, alone held by its reading.
    std::weak_ptr<ControlStreamServer::IClientConnection> ConnectionOf(std::size_t index)
    {
        return connections.Wait(index + 1)[index];
    }

    std::shared_ptr<ControlStreamServer::VSocketASIO> socket =
        std::make_shared<ControlStreamServer::VSocketASIO>(0);
    bool listening = true;
    boost::function<void(const std::shared_ptr<ControlStreamServer::IClientConnection>&)> onMessage;
    VArrivals<std::weak_ptr<ControlStreamServer::IClientConnection>> connections;
    VArrivals<std::wstring> messages;
};
