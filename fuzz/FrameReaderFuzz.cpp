// Feeds a byte stream to a connection, cut into segments of any size, and compares what it delivers
// with the frames that the stream holds. The input's first byte is the size of the segments.

#include "QuorixPluginControlStreamServer/ControlStreamServer/ClientConnectionASIO.h"
#include "utils/WideText.h"

#include <boost/asio/io_service.hpp>

#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

using boost::asio::ip::tcp;
using ControlStreamServer::IClientConnection;
using ControlStreamServer::VClientConnectionASIO;

void Require(bool condition)
{
    if (!condition) {
        std::abort();
    }
}

/// The texts of all whole frames, taken one after the other from the front.
std::vector<std::wstring> FramesOf(std::string stream)
{
    std::vector<std::wstring> frames;
    while (stream.size() >= 4) {
        std::uint64_t length = 0;
        for (int i = 3; i >= 0; --i) {
            length = length * 256 + static_cast<unsigned char>(stream[i]);
        }
        if (stream.size() - 4 < length) {
            break;
        }
        frames.push_back(KVR::Utf8ToWide(stream.substr(4, length)));
        stream.erase(0, 4 + length);
    }
    return frames;
}

/// Makes the two ends of a stream: a socket for the connection, a descriptor for the device.
std::shared_ptr<tcp::socket> MakePair(boost::asio::io_service& ioService, int& device)
{
    int ends[2];
    Require(::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) == 0);
    device = ends[1];
    auto socket = std::make_shared<tcp::socket>(ioService);
    socket->assign(tcp::v4(), ends[0]);
    return socket;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0) {
        return 0;
    }
    const std::size_t segment = data[0] + std::size_t{1};
    const std::string stream(reinterpret_cast<const char*>(data) + 1, size - 1);

    boost::asio::io_service ioService;
    int device = -1;
    std::vector<std::wstring> delivered;
    {
        const std::shared_ptr<VClientConnectionASIO> connection =
            VClientConnectionASIO::Create(MakePair(ioService, device));
        connection->GetMessageCallback().SetDirect(
            [&](const std::shared_ptr<IClientConnection>& sender, const std::wstring& message) {
                delivered.push_back(message);
                sender->Send(L"."); // a frame of five bytes
            });
    }
    std::size_t replied = 0;
    for (std::size_t sent = 0; sent < stream.size(); sent += segment) {
        const std::size_t count = std::min(segment, stream.size() - sent);
        Require(::send(device, stream.data() + sent, count, MSG_NOSIGNAL) ==
                static_cast<ssize_t>(count));
        ioService.poll();
        // Drained as it comes: a reply that nobody takes would block the connection.
        char bytes[4096];
        for (ssize_t got; (got = ::recv(device, bytes, sizeof bytes, MSG_DONTWAIT)) > 0;) {
            replied += static_cast<std::size_t>(got);
        }
    }
    ::shutdown(device, SHUT_WR);
    ioService.run(); // ends, since the end of the stream ends the connection

    Require(delivered == FramesOf(stream));
    Require(replied == 5 * delivered.size());
    char byte = 0;
    Require(::recv(device, &byte, 1, 0) == 0); // closed at the other end
    ::close(device);
    return 0;
}
