#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "notification/CallbackPostal.h"
#include "utils/Mutex.h"

#include <boost/asio/ip/tcp.hpp>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace ControlStreamServer {

/// One device's TCP connection. A frame is four bytes, little-endian, that count the bytes of the
/// text behind them, which is UTF-8.
///
/// Owns: the socket. The pending read owns the connection: once reading has failed it lives only as
/// long as somebody else holds it.
/// Threads: reading and the callback on the thread of the socket's I/O service, one message after
/// the other; Send and Close [any]. A connection that may outlive the I/O service is closed before.
/// Failure: a read that fails ends the reading, silently; a write that fails is dropped. There is
/// no limit on time or length: a device that stops in mid-frame holds its connection, and memory in
/// proportion to what it has sent.
class VClientConnectionASIO : public IClientConnection,
                              public std::enable_shared_from_this<VClientConnectionASIO>
{
public:
    /// Makes the connection of an accepted socket and starts to read. [any]
    static std::shared_ptr<VClientConnectionASIO>
    Create(std::shared_ptr<boost::asio::ip::tcp::socket> socket);

    VClientConnectionASIO(const VClientConnectionASIO&) = delete;
    VClientConnectionASIO& operator=(const VClientConnectionASIO&) = delete;

    /// Ends the reading and the stream, and closes the socket. Waits a moment for a device that
    /// still takes what was sent, and a second at most.
    void Close() override;
    void Send(const std::wstring& message) override;
    MessageCallback& GetMessageCallback() override { return messageCallback; }

    /// Throws boost::system::system_error with the location "close" where the system refuses.
    ~VClientConnectionASIO() noexcept(false) override;

private:
    /// What boost::asio::async_read reads from: the socket, until it closes.
    class VStream
    {
    public:
        using executor_type = boost::asio::ip::tcp::socket::executor_type;

        VStream(VClientConnectionASIO& connection, executor_type executor);

        executor_type get_executor() const { return executor; }

        template <typename Buffers, typename Handler>
        void async_read_some(const Buffers& buffers, Handler&& handler);

    private:
        VClientConnectionASIO& connection; // which holds this stream
        const executor_type executor;
    };

    explicit VClientConnectionASIO(std::shared_ptr<boost::asio::ip::tcp::socket> socket);

    void ReadHeader();
    void ReadBody(std::size_t received);
    void OnHeader();
    void OnBody();
    void Deliver();

    /// Ends the reading and the stream. @return the socket, for whoever called first to close
    std::shared_ptr<boost::asio::ip::tcp::socket> BeginClosing();

    KVR::VMutex mutex; // serialises Send; lock order: this one, then socketMutex
    // Guards the socket's handle and the start of every read, which a close beside it would race
    // with. Nothing blocks under it.
    KVR::VMutex socketMutex;
    // Gone once closed; goes and is closed only under both mutexes, so that either keeps it.
    std::shared_ptr<boost::asio::ip::tcp::socket> socket KVR_GUARDED_BY(socketMutex);
    bool closing KVR_GUARDED_BY(socketMutex) = false; // nothing is read or delivered any more
    std::uint32_t incomingLength = 0;
    std::vector<char> incomingBody; // kept from frame to frame
    NotificationSystem::VCallbackPostal<void(std::shared_ptr<IClientConnection>, std::wstring)>
        messageCallback;
    VStream stream;
};

} // namespace ControlStreamServer
