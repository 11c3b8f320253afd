#include "ControlStreamClient/Pipeline.h"

#include "ControlStreamClient/Deadline.h"

#include <algorithm>
#include <charconv>
#include <utility>

namespace ControlStream {

namespace {

/// What a time-out says was waited for.
std::string Describe(const VPendingRequest& request)
{
    const std::string quoted = "\"" + request.Name + "\"";
    switch (request.Kind) {
    case EMessageKind::ServerInformation:
        return "the server information";
    case EMessageKind::Commands:
        return "the list of commands";
    case EMessageKind::CommandInformation:
        return "the description of the command " + quoted;
    case EMessageKind::Events:
        return "the list of events";
    case EMessageKind::EventInformation:
        return "the description of the event " + quoted;
    case EMessageKind::CommandReply:
        return "the reply to the command " + quoted;
    case EMessageKind::Unknown:
    case EMessageKind::Event:
        break;
    }
    return "a reply";
}

VError TimedOut(const VPendingRequest& request, const std::string& reason)
{
    return VError(EErrorKind::TimedOut,
                  "timed out after " + VDeadline(request.TimeLimit).LimitText() + ", " + reason);
}

VPipeline::Clock::time_point After(VPipeline::Clock::time_point now,
                                   std::chrono::milliseconds limit)
{
    // Any limit beyond a year is as good as none, and must not overflow the clock.
    return limit > std::chrono::hours(24 * 365) ? VPipeline::Clock::time_point::max() : now + limit;
}

bool HasCorrelation(EMessageKind kind)
{
    return kind == EMessageKind::Commands || kind == EMessageKind::CommandInformation ||
           kind == EMessageKind::CommandReply;
}

} // namespace

void VPipeline::Add(VPendingRequest request, Clock::time_point now)
{
    VEntry entry;
    entry.Size = request.Text.size();
    entry.Sent = now;
    entry.Expiry = After(now, request.TimeLimit);
    entry.Request = std::move(request);
    NoteExpiry(entry);
    waiting.push_back(std::move(entry));
}

void VPipeline::Send(VSendQueue& queue, Clock::time_point now)
{
    if (unansweredBytes > UnansweredLimit / 2) {
        return;
    }
    while (!waiting.empty() &&
           (unansweredBytes == 0 || unansweredBytes + waiting.front().Size <= UnansweredLimit)) {
        VEntry entry = std::move(waiting.front());
        waiting.pop_front();
        queue.Add(entry.Request.Text);
        entry.Request.Text = std::string();
        entry.Sent = now;
        entry.Expiry = After(now, entry.Request.TimeLimit);
        NoteExpiry(entry);
        unansweredBytes += entry.Size;
        ++openCount;
        sent.push_back(std::move(entry));
    }
}

bool VPipeline::Accept(VMessage&& message, Clock::time_point now)
{
    VEntry* const entry = Find(message);
    if (entry == nullptr) {
        return false;
    }
    lastReply = now;
    DropAbandonedBefore(entry->Request.Number);
    if (entry->State == EState::Abandoned) {
        entry->State = EState::Done; // late; nobody waits any more
        --abandonedCount;
        DropDone();
        return true;
    }
    const auto finish = std::move(entry->Request.Finish);
    Close(*entry, EState::Done);
    DropDone();
    finish(std::move(message));
    return true;
}

void VPipeline::Expire(Clock::time_point now, bool connected)
{
    if (now < nextExpiry) {
        return;
    }
    nextExpiry = Clock::time_point::max();
    ExpireSent(now);
    ExpireWaiting(now, connected);
}

void VPipeline::FailSent(const VError& error)
{
    std::deque<VEntry> failed = std::exchange(sent, {});
    openCount = 0;
    abandonedCount = 0;
    unansweredBytes = 0;
    lastReply = Clock::time_point(); // the next connection begins with a clean record
    lastGivenUp = Clock::time_point();
    nextExpiry = Clock::time_point::min(); // of those that wait, some may be overdue
    for (VEntry& entry : failed) {
        if (entry.State == EState::Open) {
            entry.Request.Finish(error);
        }
    }
}

void VPipeline::FailAll(const VError& error)
{
    FailSent(error);
    std::deque<VEntry> failed = std::exchange(waiting, {});
    for (VEntry& entry : failed) {
        entry.Request.Finish(error);
    }
}

/// Returns the request that a message answers, null where there is none.
VPipeline::VEntry* VPipeline::Find(const VMessage& message)
{
    if (!HasCorrelation(message.Kind)) {
        const auto found = std::find_if(sent.begin(), sent.end(), [&message](const VEntry& entry) {
            return entry.State != EState::Done && entry.Request.Kind == message.Kind;
        });
        return found == sent.end() ? nullptr : &*found;
    }
    std::uint64_t number = 0;
    const char* const end = message.Correlation.data() + message.Correlation.size();
    const auto read = std::from_chars(message.Correlation.data(), end, number);
    if (read.ec != std::errc() || read.ptr != end) {
        return nullptr;
    }
    const auto found = std::lower_bound(
        sent.begin(), sent.end(), number,
        [](const VEntry& entry, std::uint64_t wanted) { return entry.Request.Number < wanted; });
    const bool matches = found != sent.end() && found->Request.Number == number &&
                         found->State == EState::Open && found->Request.Kind == message.Kind;
    return matches ? &*found : nullptr;
}

void VPipeline::Close(VEntry& entry, EState state)
{
    entry.State = state;
    unansweredBytes -= entry.Size;
    --openCount;
}

/// The host answers in order what bears no correlation, and reads one message after the other. A
/// reply to a later request tells that an earlier one of this sort never gets any.
void VPipeline::DropAbandonedBefore(std::uint64_t number)
{
    for (auto entry = sent.begin();
         abandonedCount > 0 && entry != sent.end() && entry->Request.Number < number; ++entry) {
        if (entry->State == EState::Abandoned) {
            entry->State = EState::Done;
            --abandonedCount;
        }
    }
}

void VPipeline::DropDone()
{
    while (!sent.empty() && sent.front().State == EState::Done) {
        sent.pop_front();
    }
}

void VPipeline::NoteExpiry(const VEntry& entry)
{
    nextExpiry = std::min(nextExpiry, entry.Expiry);
}

void VPipeline::ExpireSent(Clock::time_point now)
{
    std::deque<VPendingRequest> expired;
    for (VEntry& entry : sent) {
        if (entry.State != EState::Open) {
            continue;
        }
        if (now < entry.Expiry) {
            NoteExpiry(entry);
            continue;
        }
        lastGivenUp = std::max(lastGivenUp, entry.Sent);
        // One without a correlation stays on the list, so that its late reply is not taken for that
        // to the next request of its kind.
        const bool isMatchable = HasCorrelation(entry.Request.Kind);
        Close(entry, isMatchable ? EState::Done : EState::Abandoned);
        abandonedCount += isMatchable ? 0 : 1;
        expired.push_back(entry.Request); // whose kind and number an abandoned one needs yet
        entry.Request.Finish = nullptr;
    }
    DropDone();
    for (VPendingRequest& request : expired) {
        request.Finish(TimedOut(request, "waiting for " + Describe(request)));
    }
}

void VPipeline::ExpireWaiting(Clock::time_point now, bool connected)
{
    const bool givesUp = !connected || IsSilent();
    std::deque<VPendingRequest> expired;
    std::deque<VEntry> kept;
    for (VEntry& entry : waiting) {
        if (now < entry.Expiry) {
            NoteExpiry(entry);
        }
        if (now < entry.Expiry || !givesUp) {
            kept.push_back(std::move(entry));
        } else {
            expired.push_back(std::move(entry.Request));
        }
    }
    waiting = std::move(kept);
    const std::string reason = connected ? "waiting for replies to what was sent before"
                                         : "waiting for a connection to the host";
    for (VPendingRequest& request : expired) {
        request.Finish(TimedOut(request, reason + "; nothing was sent for " + Describe(request)));
    }
}

} // namespace ControlStream
