#include "EchoServers.h"

#include <boost/asio.hpp>

#include <poll.h>
#include <sys/epoll.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <memory>
#include <system_error>
#include <utility>
#include <vector>

namespace ControlStreamBenchmark {

namespace {

using boost::asio::ip::tcp;

constexpr std::size_t headerBytes = 4;

/// One connection of the Asio server, owned by its pending read.
class VAsioConnection : public std::enable_shared_from_this<VAsioConnection>
{
public:
    VAsioConnection(tcp::socket newSocket, const std::string& newReply)
        : socket(std::move(newSocket)), reply(newReply)
    {
    }

    void ReadHeader()
    {
        boost::asio::async_read(
            socket, boost::asio::buffer(&length, headerBytes),
            [self = shared_from_this()](const boost::system::error_code& error, std::size_t) {
                if (!error) {
                    self->ReadText();
                }
            });
    }

private:
    void ReadText()
    {
        text.resize(length);
        boost::asio::async_read(
            socket, boost::asio::buffer(text),
            [self = shared_from_this()](const boost::system::error_code& error, std::size_t) {
                if (!error) {
                    self->Reply();
                    self->ReadHeader();
                }
            });
    }

    void Reply()
    {
        const std::array<boost::asio::const_buffer, 2> buffers{
            boost::asio::buffer(reply.data(), headerBytes),
            boost::asio::buffer(reply.data() + headerBytes, reply.size() - headerBytes)};
        boost::system::error_code ignored; // a dead peer ends the next read
        boost::asio::write(socket, buffers, ignored);
    }

    tcp::socket socket;
    const std::string& reply;
    std::uint32_t length = 0;
    std::vector<char> text;
};

void Accept(tcp::acceptor& acceptor, const std::string& reply)
{
    acceptor.async_accept(
        [&acceptor, &reply](const boost::system::error_code& error, tcp::socket socket) {
            if (error) {
                return;
            }
            std::make_shared<VAsioConnection>(std::move(socket), reply)->ReadHeader();
            Accept(acceptor, reply);
        });
}

/// Reads exactly `size` bytes of a frame that has begun to arrive. @return false at the stream's
/// end
bool ReadExactly(int socket, char* target, std::size_t size)
{
    while (size > 0) {
        const ssize_t got = recv(socket, target, size, 0);
        if (got == 0 || (got < 0 && errno != EINTR)) {
            return false;
        }
        if (got > 0) {
            target += got;
            size -= static_cast<std::size_t>(got);
        }
    }
    return true;
}

bool AnswerFrame(int socket, std::vector<char>& text, const std::string& reply)
{
    std::uint32_t length = 0;
    if (!ReadExactly(socket, reinterpret_cast<char*>(&length), sizeof length)) {
        return false;
    }
    text.resize(length);
    if (!ReadExactly(socket, text.data(), text.size())) {
        return false;
    }
    WriteFrame(socket, reply);
    return true;
}

void Watch(int queue, int socket)
{
    epoll_event event{};
    event.events = EPOLLIN;
    event.data.fd = socket;
    if (epoll_ctl(queue, EPOLL_CTL_ADD, socket, &event) != 0) {
        throw std::system_error(errno, std::generic_category(), "epoll_ctl");
    }
}

} // namespace

void WriteFrame(int socket, const std::string& frame)
{
    char* bytes = const_cast<char*>(frame.data());
    std::array<iovec, 2> parts{
        {{bytes, headerBytes}, {bytes + headerBytes, frame.size() - headerBytes}}};
    msghdr message{};
    message.msg_iov = parts.data();
    message.msg_iovlen = parts.size();
    for (std::size_t left = frame.size(); left > 0;) {
        const ssize_t sent = sendmsg(socket, &message, MSG_NOSIGNAL);
        if (sent < 0 && errno == EAGAIN) {
            pollfd wait{socket, POLLOUT, 0};
            poll(&wait, 1, -1);
        } else if (sent < 0 && errno != EINTR) {
            return;
        } else if (sent > 0) {
            left -= static_cast<std::size_t>(sent);
            // After a partial write the rest lies in one piece, since header and text are adjacent.
            parts[0] = {bytes + frame.size() - left, left};
            message.msg_iovlen = 1;
        }
    }
}

void ServeWithAsio(int listener, const std::string& reply)
{
    boost::asio::io_context context(1);
    tcp::acceptor acceptor(context);
    acceptor.assign(tcp::v4(), listener);
    Accept(acceptor, reply);
    context.run();
}

void ServeWithEpoll(int listener, const std::string& reply)
{
    const int queue = epoll_create1(EPOLL_CLOEXEC);
    std::vector<char> text;
    std::array<epoll_event, 128> events{};
    Watch(queue, listener);
    for (;;) {
        const int count = epoll_wait(queue, events.data(), events.size(), -1);
        for (int index = 0; index < count; ++index) {
            const int socket = events[static_cast<std::size_t>(index)].data.fd;
            if (socket == listener) {
                Watch(queue, accept4(listener, nullptr, nullptr, SOCK_CLOEXEC));
            } else if (!AnswerFrame(socket, text, reply)) {
                close(socket);
            }
        }
    }
}

} // namespace ControlStreamBenchmark
