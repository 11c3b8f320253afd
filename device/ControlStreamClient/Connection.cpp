#include "ControlStreamClient/Connection.h"

#include "ControlStreamClient/Error.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <system_error>
#include <vector>

#include <netinet/tcp.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

namespace ControlStream {

namespace {

std::string ErrorText(int code)
{
    return std::generic_category().message(code);
}

/// Polls within the deadline. Returns false when it is over.
template <std::size_t Count>
bool Poll(std::array<pollfd, Count>& descriptors, const VDeadline& deadline)
{
    for (;;) {
        const int ready = poll(descriptors.data(), Count, deadline.PollMilliseconds());
        if (ready > 0) {
            return true;
        }
        if (ready == 0 && deadline.IsOver()) {
            return false;
        }
        if (ready < 0 && errno != EINTR) {
            throw VError(EErrorKind::NoConnection, "waiting failed: " + ErrorText(errno));
        }
    }
}

} // namespace

VConnection::VConnection(std::uint32_t frameLimit, bool acknowledgeAtOnce)
    : quickAcknowledgement(acknowledgeAtOnce),
      wake(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)),
      arrived(frameLimit)
{
    if (wake < 0) {
        throw VError(EErrorKind::NoConnection, "no descriptor is free: " + ErrorText(errno));
    }
}

VConnection::~VConnection()
{
    Close();
    close(wake);
}

void VConnection::Open(const std::string& host, std::uint16_t port, const VDeadline& deadline,
                       const LookUp& lookUp, const VWaitPart& onWait)
{
    Close();
    arrived.Clear();
    const std::vector<in_addr> addresses = FindAddresses(host, deadline, lookUp, onWait);
    const std::string peer = host + ":" + std::to_string(port);
    std::string reason;
    for (std::size_t i = 0; i < addresses.size(); ++i) {
        try {
            // An address that never answers must leave time for those behind it.
            if (ConnectTo(addresses[i], port, deadline.Part(addresses.size() - i), onWait)) {
                SetOptions();
                return;
            }
            reason.clear();
        } catch (const std::system_error& error) {
            reason = error.code().message();
        } catch (...) {
            Close();
            throw;
        }
        Close();
    }
    if (reason.empty()) {
        throw VError(EErrorKind::TimedOut, "timed out after " + deadline.LimitText() +
                                               ", waiting for a connection to " + peer);
    }
    throw VError(EErrorKind::NoConnection, "no connection to " + peer + ": " + reason);
}

void VConnection::Close()
{
    if (socket >= 0) {
        close(socket);
        socket = -1;
    }
}

void VConnection::Send(const std::string& text, const VDeadline& deadline, const std::string& what)
{
    if (text.size() > UINT32_MAX) {
        throw VError(EErrorKind::Usage, what + " is longer than a frame can be");
    }
    unsigned char header[FrameHeaderSize];
    WriteFrameHeader(static_cast<std::uint32_t>(text.size()), header);

    std::size_t sent = 0;
    while (sent < FrameHeaderSize + text.size()) {
        if (SendSome(header, text, sent) || WaitWhileSending(deadline)) {
            continue;
        }
        if (sent > 0) {
            Close(); // the rest of the frame can never follow in step
        }
        throw VError(EErrorKind::TimedOut,
                     "timed out after " + deadline.LimitText() + ", sending " + what);
    }
}

EWaited VConnection::Receive(std::string& text, const VDeadline& deadline)
{
    return ReceiveFrame(text, deadline, false);
}

EWaited VConnection::ReceiveInterruptibly(std::string& text, const VDeadline& deadline)
{
    return ReceiveFrame(text, deadline, true);
}

EWaited VConnection::Turn(VSendQueue& queue, const VDeadline& deadline, bool interruptible)
{
    if (!IsOpen()) {
        throw VError(EErrorKind::NoConnection, "there is no connection to a host");
    }
    SendQueued(queue);
    const short reading = arrived.IsFull() ? 0 : POLLIN;
    const short writing = queue.IsEmpty() ? 0 : POLLOUT;
    std::array<pollfd, 2> descriptors{{{socket, static_cast<short>(reading | writing), 0},
                                       {interruptible ? wake : -1, POLLIN, 0}}};
    if (!Poll(descriptors, deadline)) {
        return EWaited::TimedOut;
    }
    // A socket that has failed says so by reading.
    if ((descriptors[0].revents & ~POLLOUT) != 0 && ReadSome()) {
        // A host holds back its next replies until the last are acknowledged, which the kernel
        // would put off for 40 ms while nothing is to be sent.
        SetQuickAcknowledgement();
    }
    if (descriptors[1].revents != 0) {
        TakeInterrupt();
        return EWaited::Interrupted;
    }
    return EWaited::Ready;
}

bool VConnection::Flush(VSendQueue& queue, const VDeadline& deadline)
{
    SendQueued(queue);
    while (!queue.IsEmpty() && WaitWhileSending(deadline)) {
        SendQueued(queue);
    }
    return queue.IsEmpty();
}

EWaited VConnection::WaitForInterrupt(const VDeadline& deadline)
{
    std::array<pollfd, 1> descriptors{{{wake, POLLIN, 0}}};
    if (!Poll(descriptors, deadline)) {
        return EWaited::TimedOut;
    }
    TakeInterrupt();
    return EWaited::Interrupted;
}

bool VConnection::TakeArrived(std::string& text)
{
    try {
        return arrived.Take(text);
    } catch (const VError&) {
        Close();
        arrived.Clear(); // nobody knows where the next frame begins
        throw;
    }
}

bool VConnection::Finish(const VDeadline& deadline)
{
    bool finished = false;
    try {
        shutdown(socket, SHUT_WR);
        while (WaitForBytes(deadline, false) == EWaited::Ready && !deadline.IsOver()) {
            arrived.Clear();
            ReadSome();
        }
    } catch (const VError&) {
        finished = true; // that the other side closes is what was waited for
    }
    Close();
    return finished;
}

void VConnection::Interrupt() noexcept
{
    const int savedError = errno; // a signal handler must leave it alone
    const eventfd_t one = 1;
    // It fails only when an overflow is near, and then the descriptor is readable already.
    [[maybe_unused]] const ssize_t ignored = write(wake, &one, sizeof one);
    errno = savedError;
}

/// Returns false when the deadline is over.
bool VConnection::ConnectTo(const in_addr& address, std::uint16_t port, const VDeadline& deadline,
                            const VWaitPart& onWait)
{
    socket = ::socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    if (socket < 0) {
        throw std::system_error(errno, std::generic_category());
    }
    sockaddr_in peer{};
    peer.sin_family = AF_INET;
    peer.sin_port = htons(port);
    peer.sin_addr = address;
    if (connect(socket, reinterpret_cast<const sockaddr*>(&peer), sizeof peer) == 0) {
        return true;
    }
    if (errno != EINPROGRESS && errno != EINTR) {
        throw std::system_error(errno, std::generic_category());
    }
    if (!WaitForConnection(deadline, onWait)) {
        return false;
    }
    int code = 0;
    socklen_t size = sizeof code;
    getsockopt(socket, SOL_SOCKET, SO_ERROR, &code, &size);
    if (code != 0) {
        throw std::system_error(code, std::generic_category());
    }
    return true;
}

/// Returns false when the deadline is over.
bool VConnection::WaitForConnection(const VDeadline& deadline, const VWaitPart& onWait)
{
    for (;;) {
        const VDeadline part = onWait ? deadline.Sooner(onWait()) : deadline;
        std::array<pollfd, 2> descriptors{{{socket, POLLOUT, 0}, {onWait ? wake : -1, POLLIN, 0}}};
        const bool ready = Poll(descriptors, part);
        if (ready && descriptors[0].revents != 0) {
            return true;
        }
        if (ready) {
            TakeInterrupt();
        } else if (deadline.IsOver()) {
            return false;
        }
    }
}

/// Options are a matter of speed: where one is refused, the connection serves all the same.
void VConnection::SetOptions()
{
    const int on = 1;
    // Each frame is one write, so that waiting for more to send with it would only delay it.
    setsockopt(socket, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
    AcknowledgeAtOnce();
}

/// Returns false when the kernel has no room at the moment.
bool VConnection::SendSome(const unsigned char (&header)[FrameHeaderSize], const std::string& text,
                           std::size_t& sent)
{
    const std::size_t sentHeader = std::min(sent, FrameHeaderSize);
    const std::size_t sentText = sent - sentHeader;
    std::array<iovec, 2> parts{
        {{const_cast<unsigned char*>(header) + sentHeader, FrameHeaderSize - sentHeader},
         {const_cast<char*>(text.data()) + sentText, text.size() - sentText}}};
    msghdr message{};
    message.msg_iov = parts.data();
    message.msg_iovlen = parts.size();

    const ssize_t count = sendmsg(socket, &message, MSG_NOSIGNAL);
    if (count >= 0) {
        sent += static_cast<std::size_t>(count);
        return true;
    }
    if (errno == EAGAIN) {
        return false;
    }
    if (errno != EINTR) {
        FailSending(errno);
    }
    return true;
}

void VConnection::SendQueued(VSendQueue& queue)
{
    while (!queue.IsEmpty()) {
        const ssize_t count = send(socket, queue.Data(), queue.Size(), MSG_NOSIGNAL);
        if (count >= 0) {
            queue.Advance(static_cast<std::size_t>(count));
        } else if (errno == EAGAIN) {
            break;
        } else if (errno != EINTR) {
            FailSending(errno);
        }
    }
}

void VConnection::FailSending(int code)
{
    SaveWhatArrived();
    FailClosed(ErrorText(code));
}

/// The host's last words, which say why it goes, may lie unread when a write finds it gone.
void VConnection::SaveWhatArrived()
{
    try {
        while (!arrived.IsFull() && ReadSome()) {
        }
    } catch (const VError&) {
        return; // read to the end
    }
}

/// Returns false when the deadline is over.
bool VConnection::WaitWhileSending(const VDeadline& deadline)
{
    if (deadline.IsOver()) {
        return false;
    }
    const short reading = arrived.IsFull() ? 0 : POLLIN;
    std::array<pollfd, 1> descriptors{{{socket, static_cast<short>(POLLOUT | reading), 0}}};
    if (!Poll(descriptors, deadline)) {
        return false;
    }
    if ((descriptors[0].revents & POLLIN) != 0) {
        ReadSome();
    }
    return true;
}

EWaited VConnection::ReceiveFrame(std::string& text, const VDeadline& deadline, bool interruptible)
{
    bool over = false;
    while (!TakeArrived(text)) {
        if (over) {
            return EWaited::TimedOut; // bytes keep coming, but the frame does not end
        }
        if (!IsOpen()) {
            throw VError(EErrorKind::NoConnection, "there is no connection to a host");
        }
        const EWaited waited = WaitForBytes(deadline, interruptible);
        if (waited != EWaited::Ready) {
            return waited;
        }
        ReadSome();
        over = deadline.IsOver();
    }
    return EWaited::Ready;
}

EWaited VConnection::WaitForBytes(const VDeadline& deadline, bool interruptible)
{
    // A negative descriptor is passed over by the system.
    std::array<pollfd, 2> descriptors{
        {{socket, POLLIN, 0}, {interruptible ? wake : -1, POLLIN, 0}}};
    if (!Poll(descriptors, deadline)) {
        return EWaited::TimedOut;
    }
    if (descriptors[1].revents != 0) {
        TakeInterrupt();
        return EWaited::Interrupted;
    }
    return EWaited::Ready;
}

void VConnection::TakeInterrupt()
{
    eventfd_t ignored = 0;
    eventfd_read(wake, &ignored);
}

/// Reads what is there. Returns false where nothing is, after all.
bool VConnection::ReadSome()
{
    const VFrameBuffer::VSpace space = arrived.GetSpace();
    const ssize_t count = recv(socket, space.Data, space.Size, 0);
    if (count > 0) {
        arrived.Commit(static_cast<std::size_t>(count));
        AcknowledgeAtOnce();
        return true;
    }
    if (count == 0) {
        FailClosed(std::string());
    }
    if (errno != EAGAIN && errno != EINTR) {
        FailClosed(ErrorText(errno));
    }
    return false;
}

void VConnection::AcknowledgeAtOnce()
{
    if (quickAcknowledgement) {
        SetQuickAcknowledgement();
    }
}

void VConnection::SetQuickAcknowledgement()
{
    const int on = 1; // the kernel takes it back by itself, so it is set anew each time
    setsockopt(socket, IPPROTO_TCP, TCP_QUICKACK, &on, sizeof on);
}

void VConnection::FailClosed(const std::string& reason)
{
    std::string text = "the host closed the connection";
    const std::string rest = arrived.DescribeRest();
    if (!rest.empty()) {
        text += " in the middle of a frame, after " + rest;
    }
    if (!reason.empty()) {
        text += ": " + reason;
    }
    Close();
    throw VError(EErrorKind::Closed, text);
}

} // namespace ControlStream
