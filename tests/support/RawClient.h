#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <system_error>
#include <utility>

namespace TestSupport {

/// Returns the bytes of a frame with this text. Tests of the frame itself write them literally.
inline std::string Frame(const std::string& text)
{
    std::string frame;
    for (int shift = 0; shift < 32; shift += 8) {
        frame += static_cast<char>(static_cast<std::uint32_t>(text.size()) >> shift);
    }
    return frame + text;
}

/// A device that is nothing but a TCP socket, for tests of what goes over the wire.
///
/// Every wait is bounded; what does not come throws std::runtime_error, which fails the test.
/// Threads: one at a time, but one may send while another receives.
class VRawClient
{
public:
    /// How long a test waits for what has to come. It is only spent where the test fails.
    static constexpr std::chrono::seconds Limit{60};

    /// Connects over the loopback interface.
    ///
    /// @param receiveBuffer  size to ask the system for, before connecting; 0 leaves its own
    explicit VRawClient(std::uint16_t port, int receiveBuffer = 0)
        : descriptor(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0))
    {
        Require(descriptor >= 0, "socket");
        if (receiveBuffer > 0) {
            Require(::setsockopt(descriptor, SOL_SOCKET, SO_RCVBUF, &receiveBuffer,
                                 sizeof receiveBuffer) == 0,
                    "SO_RCVBUF");
        }
        // Several small writes of a test are to arrive as such.
        SetOption(TCP_NODELAY);
        Connect(port);
        SetOption(TCP_QUICKACK);
    }

    /// Takes over a connected socket.
    explicit VRawClient(int connected, std::nullptr_t) : descriptor(connected) {}

    VRawClient(VRawClient&& other) noexcept
        : descriptor(std::exchange(other.descriptor, -1)), buffered(std::move(other.buffered))
    {
    }
    VRawClient& operator=(VRawClient&&) = delete;
    VRawClient(const VRawClient&) = delete;
    VRawClient& operator=(const VRawClient&) = delete;

    ~VRawClient() { Close(); }

    int Descriptor() const { return descriptor; }

    /// Sends all bytes. @return false where the peer has gone
    bool Send(const std::string& bytes)
    {
        std::size_t sent = 0;
        while (sent < bytes.size()) {
            Await(POLLOUT, Deadline());
            const ssize_t count = ::send(descriptor, bytes.data() + sent, bytes.size() - sent,
                                         MSG_NOSIGNAL | MSG_DONTWAIT);
            if (count < 0 && (errno == EPIPE || errno == ECONNRESET)) {
                return false;
            }
            Require(count >= 0 || errno == EAGAIN, "send");
            sent += count > 0 ? static_cast<std::size_t>(count) : 0;
        }
        return true;
    }

    bool SendFrame(const std::string& text) { return Send(Frame(text)); }

    /// Returns the text of the next frame. Throws where the peer ends the stream first.
    std::string ReadFrame()
    {
        std::optional<std::string> text = ReadFrameOrEnd();
        if (!text) {
            throw std::runtime_error("the peer closed the connection");
        }
        return *text;
    }

    /// Returns the text of the next frame, or nothing where the stream ends before it begins.
    std::optional<std::string> ReadFrameOrEnd()
    {
        const auto deadline = Deadline();
        if (!Receive(4, deadline)) {
            if (!buffered.empty()) {
                throw std::runtime_error("the stream ends within a header");
            }
            return std::nullopt;
        }
        std::uint32_t length = 0;
        for (int i = 3; i >= 0; --i) {
            length = length << 8 | static_cast<unsigned char>(buffered[i]);
        }
        if (!Receive(4 + std::size_t{length}, deadline)) {
            throw std::runtime_error("the stream ends within a text");
        }
        std::string text = buffered.substr(4, length);
        buffered.erase(0, 4 + std::size_t{length});
        return text;
    }

    /// Sends a request and returns the next frame.
    std::string Request(const std::string& text)
    {
        if (!SendFrame(text)) {
            throw std::runtime_error("the peer is gone");
        }
        return ReadFrame();
    }

    /// Returns exactly so many bytes of the stream, without looking at frames.
    std::string ReadBytes(std::size_t count)
    {
        if (!Receive(count, Deadline())) {
            throw std::runtime_error("the stream ends too early");
        }
        std::string bytes = buffered.substr(0, count);
        buffered.erase(0, count);
        return bytes;
    }

    /// Returns everything up to the end of the stream; a reset is an end too.
    std::string ReadToEnd()
    {
        const auto deadline = Deadline();
        while (ReceiveSome(deadline)) {
        }
        return std::exchange(buffered, {});
    }

    /// Returns whether bytes or the end of the stream are there to be read, without waiting.
    bool IsReadable() const
    {
        pollfd poller{descriptor, POLLIN, 0};
        return !buffered.empty() || ::poll(&poller, 1, 0) > 0;
    }

    /// Waits until bytes or the end of the stream are there to be read. @return false at the limit
    bool AwaitReadable() const
    {
        pollfd poller{descriptor, POLLIN, 0};
        const auto limit = std::chrono::duration_cast<std::chrono::milliseconds>(Limit);
        return !buffered.empty() || ::poll(&poller, 1, static_cast<int>(limit.count())) > 0;
    }

    /// Ends the sending direction; the peer reads the end of the stream.
    void ShutdownWrite() { ::shutdown(descriptor, SHUT_WR); }

    void Close()
    {
        if (descriptor >= 0) {
            ::close(std::exchange(descriptor, -1));
        }
    }

    /// Closes with a reset, as when the device's process is killed with data unread.
    void Reset()
    {
        const linger hard{1, 0};
        ::setsockopt(descriptor, SOL_SOCKET, SO_LINGER, &hard, sizeof hard);
        Close();
    }

private:
    using TimePoint = std::chrono::steady_clock::time_point;

    static TimePoint Deadline() { return std::chrono::steady_clock::now() + Limit; }

    static void Require(bool condition, const char* what)
    {
        if (!condition) {
            throw std::system_error(errno, std::generic_category(), what);
        }
    }

    void SetOption(int name) const
    {
        const int on = 1;
        // A test may hand over a socket that is no TCP socket.
        static_cast<void>(::setsockopt(descriptor, IPPROTO_TCP, name, &on, sizeof on));
    }

    void Connect(std::uint16_t port)
    {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_port = htons(port);
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        int error = 0;
        if (::connect(descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address) !=
            0) {
            error = errno;
        } else if (IsConnectedToItself()) {
            error = ECONNREFUSED; // nobody listens: the system gave this end the very same port
        }
        if (error != 0) {
            Close(); // a constructor that throws runs no destructor
            throw std::system_error(error, std::generic_category(), "connect");
        }
    }

    bool IsConnectedToItself() const
    {
        sockaddr_in own{};
        sockaddr_in peer{};
        socklen_t size = sizeof own;
        ::getsockname(descriptor, reinterpret_cast<sockaddr*>(&own), &size);
        size = sizeof peer;
        ::getpeername(descriptor, reinterpret_cast<sockaddr*>(&peer), &size);
        return own.sin_port == peer.sin_port && own.sin_addr.s_addr == peer.sin_addr.s_addr;
    }

    void Await(short events, TimePoint deadline) const
    {
        for (;;) {
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
                deadline - std::chrono::steady_clock::now());
            if (left.count() <= 0) {
                throw std::runtime_error("nothing came within the time limit");
            }
            pollfd poller{descriptor, events, 0};
            if (::poll(&poller, 1, static_cast<int>(left.count())) > 0) {
                return;
            }
        }
    }

    /// @return false at the end of the stream
    bool ReceiveSome(TimePoint deadline)
    {
        Await(POLLIN, deadline);
        char bytes[16384];
        const ssize_t count = ::recv(descriptor, bytes, sizeof bytes, MSG_DONTWAIT);
        if (count > 0) {
            buffered.append(bytes, static_cast<std::size_t>(count));
            // The peer may hold its next small write back until this one is acknowledged. The
            // system forgets the option from time to time.
            SetOption(TCP_QUICKACK);
        }
        Require(count >= 0 || errno == EAGAIN || errno == EINTR || errno == ECONNRESET, "recv");
        return count > 0 || (count < 0 && errno != ECONNRESET);
    }

    bool Receive(std::size_t count, TimePoint deadline)
    {
        while (buffered.size() < count) {
            if (!ReceiveSome(deadline)) {
                return false;
            }
        }
        return true;
    }

    int descriptor;
    std::string buffered;
};

} // namespace TestSupport
