#include "QuorixPluginControlStreamServer/ControlStreamServer/ClientConnectionASIO.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/LastBytes.h"
#include "utils/WideText.h"

#include <boost/asio/buffer.hpp>
#include <boost/asio/read.hpp>
#include <boost/asio/write.hpp>
#include <boost/endian/conversion.hpp>

#include <algorithm>
#include <array>
#include <utility>

#include <sys/socket.h>

namespace ControlStreamServer {

using boost::asio::ip::tcp;

namespace {

/// What a length alone may cost. A device can claim four gigabytes with four bytes; more room than
/// this is only made for bytes that have come.
constexpr std::size_t RoomForAClaim = std::size_t{64} * 1024;

} // namespace

VClientConnectionASIO::VStream::VStream(VClientConnectionASIO& connection, executor_type executor)
    : connection(connection), executor(std::move(executor))
{
}

template <typename Buffers, typename Handler>
void VClientConnectionASIO::VStream::async_read_some(const Buffers& buffers, Handler&& handler)
{
    KVR::VMutexLock lock(connection.socketMutex);
    if (!connection.closing) {
        connection.socket->async_read_some(buffers, std::forward<Handler>(handler));
    }
    // A closed connection reads no more: the handler goes uncalled, and with it the reading's
    // reference to the connection.
}

std::shared_ptr<VClientConnectionASIO>
VClientConnectionASIO::Create(std::shared_ptr<tcp::socket> socket)
{
    std::shared_ptr<VClientConnectionASIO> connection(new VClientConnectionASIO(std::move(socket)));
    connection->ReadHeader();
    return connection;
}

VClientConnectionASIO::VClientConnectionASIO(std::shared_ptr<tcp::socket> accepted)
    : socket(std::move(accepted)), stream(*this, socket->get_executor())
{
}

void VClientConnectionASIO::ReadHeader()
{
    boost::asio::async_read(
        stream, boost::asio::buffer(&incomingLength, sizeof incomingLength),
        [self = shared_from_this()](const boost::system::error_code& error, std::size_t) {
            if (!error) {
                self->OnHeader();
            }
        });
}

void VClientConnectionASIO::OnHeader()
{
    boost::endian::little_to_native_inplace(incomingLength);
    const std::size_t room = std::max(incomingBody.capacity(), RoomForAClaim);
    incomingBody.clear(); // nothing to keep: making room allocates exactly what is asked for
    incomingBody.resize(std::min<std::size_t>(incomingLength, room));
    ReadBody(0);
}

void VClientConnectionASIO::ReadBody(std::size_t received)
{
    boost::asio::async_read(
        stream, boost::asio::buffer(incomingBody.data() + received, incomingBody.size() - received),
        [self = shared_from_this()](const boost::system::error_code& error, std::size_t) {
            if (!error) {
                self->OnBody();
            }
        });
}

void VClientConnectionASIO::OnBody()
{
    const std::size_t received = incomingBody.size();
    if (received == incomingLength) {
        Deliver();
        return;
    }
    incomingBody.resize(std::min<std::size_t>(incomingLength, 2 * received));
    ReadBody(received);
}

void VClientConnectionASIO::Deliver()
{
    {
        KVR::VMutexLock lock(socketMutex);
        if (closing) {
            return; // and the wait for the last bytes may have taken some of these
        }
    }
    // To its end, replies included, before another byte is read.
    messageCallback(shared_from_this(), KVR::Utf8ToWide(incomingBody.data(), incomingBody.size()));
    ReadHeader();
}

void VClientConnectionASIO::Send(const std::wstring& message)
{
    const std::string text = KVR::WideToUtf8(message);
    const std::uint32_t length =
        boost::endian::native_to_little(static_cast<std::uint32_t>(text.size()));
    // One write: header and text in two would wait for each other, Nagle's algorithm here and the
    // delayed acknowledgement there.
    const std::array<boost::asio::const_buffer, 2> frame = {
        boost::asio::buffer(&length, sizeof length), boost::asio::buffer(text)};

    KVR::VMutexLock lock(mutex);
    std::shared_ptr<tcp::socket> open;
    {
        KVR::VMutexLock socketLock(socketMutex);
        open = socket;
    }
    if (open) {
        boost::system::error_code ignored; // a device that is gone ends the reading as well
        boost::asio::write(*open, frame, ignored);
    }
}

void VClientConnectionASIO::Close()
{
    const std::shared_ptr<tcp::socket> closed = BeginClosing();
    if (!closed) {
        return;
    }
    KVR::VMutexLock lock(mutex); // no writer is inside of the socket any more
    AwaitLastBytes(closed->native_handle(), lastBytesLimit);
    KVR::VMutexLock socketLock(socketMutex);
    socket.reset();
    closed->close();
}

std::shared_ptr<tcp::socket> VClientConnectionASIO::BeginClosing()
{
    KVR::VMutexLock lock(socketMutex);
    if (closing) {
        return nullptr;
    }
    closing = true;
    // Closing alone would leave a writer blocked, and the caller with it. An error says that the
    // device has gone already. Not SHUT_RDWR: at the next bytes that come the system would reset
    // the connection, and forget what it has still to send.
    static_cast<void>(::shutdown(socket->native_handle(), SHUT_WR));
    return socket;
}

VClientConnectionASIO::~VClientConnectionASIO() noexcept(false)
{
    if (socket) {
        socket->close();
    }
}

} // namespace ControlStreamServer
