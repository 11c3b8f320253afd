#pragma once

#include "ControlStreamClient/Deadline.h"
#include "ControlStreamClient/FrameBuffer.h"
#include "ControlStreamClient/HostAddress.h"
#include "ControlStreamClient/SendQueue.h"

#include <cstdint>
#include <string>

#include <netinet/in.h>

namespace ControlStream {

/// How a wait ended.
enum class EWaited { Ready, TimedOut, Interrupted };

/// One TCP connection that carries frames. It knows nothing of what they mean.
///
/// The socket never blocks: waiting is done by `poll` on the caller's thread, within a deadline.
/// Owns: the socket, what has arrived, and the descriptor behind Interrupt. Threads: one at a time,
/// but Interrupt [any]. Failure: VError; where the stream cannot go on, the socket is closed first.
class VConnection
{
public:
    VConnection(std::uint32_t frameLimit, bool acknowledgeAtOnce);
    ~VConnection();
    VConnection(const VConnection&) = delete;
    VConnection& operator=(const VConnection&) = delete;

    /// Connects to the first of the host's addresses that accepts, closing an earlier connection.
    ///
    /// @param lookUp  how the addresses of a name are found
    /// @param onWait  asked before each part of the wait, see VWaitPart; may be empty
    void Open(const std::string& host, std::uint16_t port, const VDeadline& deadline,
              const LookUp& lookUp = &LookUpAddresses, const VWaitPart& onWait = VWaitPart());

    bool IsOpen() const { return socket >= 0; }

    /// Whole frames that have arrived can still be taken, until the next Open.
    void Close();

    /// Writes one frame, header and text together, in one system call if the kernel has the room.
    ///
    /// It reads while it writes: the host may be busy writing events to this side, and takes
    /// nothing until it has got rid of them.
    ///
    /// @param what  what is being sent, for the text of a time-out
    void Send(const std::string& text, const VDeadline& deadline, const std::string& what);

    /// Waits for a whole frame and moves its text into `text`. Does not heed Interrupt.
    EWaited Receive(std::string& text, const VDeadline& deadline);

    /// The same, ended also by Interrupt.
    EWaited ReceiveInterruptibly(std::string& text, const VDeadline& deadline);

    /// Sends what the kernel takes of the queue, then waits until there is something to read, which
    /// it reads, or room to send the rest. It reads while it sends, as Send does.
    ///
    /// @param interruptible  whether Interrupt ends it too
    EWaited Turn(VSendQueue& queue, const VDeadline& deadline, bool interruptible);

    /// Sends the whole queue, reading meanwhile as Send does.
    ///
    /// @return false where the deadline came first
    bool Flush(VSendQueue& queue, const VDeadline& deadline);

    /// Waits for nothing but Interrupt, connected or not.
    EWaited WaitForInterrupt(const VDeadline& deadline);

    /// Takes a frame that has arrived whole already; false where there is none. Reads nothing.
    bool TakeArrived(std::string& text);

    /// Ends the sending side, and drops what arrives until the other side has closed too; closes.
    ///
    /// @return false where the deadline came first
    bool Finish(const VDeadline& deadline);

    /// Wakes a ReceiveInterruptibly that waits, or the next one that has to. [any, signal handlers]
    void Interrupt() noexcept;

private:
    bool ConnectTo(const in_addr& address, std::uint16_t port, const VDeadline& deadline,
                   const VWaitPart& onWait);
    bool WaitForConnection(const VDeadline& deadline, const VWaitPart& onWait);
    void SetOptions();
    bool SendSome(const unsigned char (&header)[FrameHeaderSize], const std::string& text,
                  std::size_t& sent);
    void SendQueued(VSendQueue& queue);
    [[noreturn]] void FailSending(int code);
    void SaveWhatArrived();
    bool WaitWhileSending(const VDeadline& deadline);
    EWaited ReceiveFrame(std::string& text, const VDeadline& deadline, bool interruptible);
    EWaited WaitForBytes(const VDeadline& deadline, bool interruptible);
    void TakeInterrupt();
    bool ReadSome();
    void AcknowledgeAtOnce();
    void SetQuickAcknowledgement();
    [[noreturn]] void FailClosed(const std::string& reason);

    const bool quickAcknowledgement;
    int socket = -1;
    int wake = -1; // becomes readable by Interrupt
    VFrameBuffer arrived;
};

} // namespace ControlStream
