#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ISocket.h"
#include "notification/CallbackPostal.h"

#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

/// A connection without a socket: it keeps what is sent, and a test plays the device.
class VFakeConnection : public ControlStreamServer::IClientConnection,
                        public std::enable_shared_from_this<VFakeConnection>
{
public:
    /// The device sends a message. @return what the connection's callback returned
    bool Receive(const std::wstring& message)
    {
        return messageCallback(shared_from_this(), message);
    }

    void Close() override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        ++closed;
    }

    void Send(const std::wstring& message) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        sent.push_back(message);
    }

    MessageCallback& GetMessageCallback() override { return messageCallback; }

    std::vector<std::wstring> Sent() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return sent;
    }

    int Closed() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return closed;
    }

private:
    mutable std::mutex mutex;
    std::vector<std::wstring> sent;
    int closed = 0;
    NotificationSystem::VCallbackPostal<void(std::shared_ptr<IClientConnection>, std::wstring)>
        messageCallback;
};

/// A listening end on which a test makes the connections.
class VFakeSocket : public ControlStreamServer::ISocket
{
public:
    void SetConnectionHandler(ConnectionHandler newHandler) override
    {
        handler = std::move(newHandler);
    }

    void Connect(const std::shared_ptr<ControlStreamServer::IClientConnection>& connection) const
    {
        handler(connection);
    }

private:
    ConnectionHandler handler;
};
