#pragma once

#include "ControlStreamClient/Message.h"
#include "ControlStreamClient/Outcome.h"
#include "ControlStreamClient/SendQueue.h"

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <functional>
#include <string>

namespace ControlStream {

/// How many bytes of requests may be on their way without a reply. A host reads nothing while it
/// cannot write a reply, so that a device which only sends would come to a stand in the end.
constexpr std::size_t UnansweredLimit = 64U << 10U;

/// A request with what a pipeline needs to know of it.
struct VPendingRequest
{
    std::uint64_t Number = 0; ///< its correlation, in decimal, where it has one; rises
    std::string Text;
    EMessageKind Kind = EMessageKind::Unknown; ///< of the reply
    std::string Name;                          ///< what it is about, for the text of a time-out
    std::chrono::milliseconds TimeLimit{};
    std::function<void(VOutcome<VMessage>)> Finish; ///< called once, whatever happens
};

/// Requests on one connection, several under way at once, and what becomes of each.
///
/// Replies are matched by their correlations. Those that have none come in the order of their
/// requests; a late one is known by the requests behind it that are answered already.
///
/// Threads: a plain object. Finish is called inside the operations below, and may add requests but
/// nothing else.
class VPipeline
{
public:
    using Clock = std::chrono::steady_clock;

    /// Puts a request behind those that wait to be sent. Its number is above all others.
    void Add(VPendingRequest request, Clock::time_point now);

    /// Moves requests into the queue, as many as the limit of unanswered bytes admits; one that is
    /// longer by itself goes alone. More than half of the limit must be free to begin with, so that
    /// they leave in few pieces.
    void Send(VSendQueue& queue, Clock::time_point now);

    /// Takes the reply to a request. @return false where nobody waits for it
    bool Accept(VMessage&& message, Clock::time_point now);

    /// Gives up the requests whose time limit has run out. One that waits to be sent has its limit
    /// counted from Add, and is given up only where the connection is down or answers nothing.
    void Expire(Clock::time_point now, bool connected);

    /// When Expire may next have something to do; the last moment of all where there is nothing.
    Clock::time_point NextExpiry() const { return nextExpiry; }

    /// Gives up the requests that have been sent, since their replies cannot come any more. The
    /// host may have handled them. They must be out of the queue too.
    void FailSent(const VError& error);

    /// Gives up all requests.
    void FailAll(const VError& error);

    /// Whether no request waits for anything.
    bool IsIdle() const { return waiting.empty() && openCount == 0; }

    /// Whether the host has answered nothing since it was sent what it left without a reply in
    /// time.
    bool IsSilent() const { return lastReply < lastGivenUp; }

private:
    enum class EState { Open, Abandoned, Done };

    struct VEntry
    {
        VPendingRequest Request; // its text is empty once it is sent
        std::size_t Size = 0;
        Clock::time_point Sent;   // or added, while it waits
        Clock::time_point Expiry; // counted from there
        EState State = EState::Open;
    };

    VEntry* Find(const VMessage& message);
    void Close(VEntry& entry, EState state);
    void DropAbandonedBefore(std::uint64_t number);
    void DropDone();
    void NoteExpiry(const VEntry& entry);
    void ExpireSent(Clock::time_point now);
    void ExpireWaiting(Clock::time_point now, bool connected);

    std::deque<VEntry> waiting; // to be sent
    std::deque<VEntry> sent;    // in the order of their numbers
    std::size_t openCount = 0;  // of those sent
    std::size_t abandonedCount = 0;
    std::size_t unansweredBytes = 0; // of those open
    Clock::time_point lastReply;
    Clock::time_point lastGivenUp; // when the newest request was sent that got no reply in time
    Clock::time_point nextExpiry = Clock::time_point::max();
};

} // namespace ControlStream
