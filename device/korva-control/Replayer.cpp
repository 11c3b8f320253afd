#include "korva-control/Replayer.h"

#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/Message.h"

#include <algorithm>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VDeadline;
using ControlStream::VError;
using FakeHost::ERecorded;
using FakeHost::VRecordedMoment;

constexpr std::uint32_t FrameLimit = 64U << 20U;

// With several connections each is looked at so often during a pause.
constexpr std::chrono::milliseconds LookAtEach{20};

bool IsEvent(const std::string& text)
{
    try {
        return ControlStream::ParseMessage(text).Kind == ControlStream::EMessageKind::Event;
    } catch (const VError&) {
        return false; // whatever it is, it has to be compared
    }
}

} // namespace

VReplayer::VReplayer(const VReplayOptions& replayOptions, OnDifference differenceFunction)
    : options(replayOptions), onDifference(std::move(differenceFunction))
{
}

std::size_t VReplayer::Play(const std::vector<VRecordedMoment>& moments)
{
    std::size_t sent = 0;
    start = std::chrono::steady_clock::now();
    for (const VRecordedMoment& moment : moments) {
        switch (moment.Kind) {
        case ERecorded::Connected:
            Pause(moment.Seconds);
            connections.erase(moment.Connection);
            Find(moment.Connection);
            break;
        case ERecorded::Device:
            Pause(moment.Seconds);
            Send(moment);
            ++sent;
            break;
        case ERecorded::Host:
            Compare(moment);
            break;
        case ERecorded::Closed:
            Pause(moment.Seconds);
            connections.erase(moment.Connection);
            break;
        }
    }
    return sent;
}

/// Waits for a moment of the recording, reading meanwhile: a host stands still when nobody reads.
void VReplayer::Pause(double seconds)
{
    if (options.Speed <= 0) {
        return;
    }
    const auto due =
        start + std::chrono::duration_cast<std::chrono::steady_clock::duration>(
                    std::chrono::duration<double>(std::min(seconds / options.Speed, 1e8)));
    const auto left = [due] {
        return std::chrono::ceil<std::chrono::milliseconds>(due - std::chrono::steady_clock::now());
    };
    ControlStream::VConnection idle(FrameLimit, false); // waits where nothing is connected
    while (left().count() > 0) {
        if (connections.empty()) {
            idle.WaitForInterrupt(VDeadline(left()));
        }
        for (auto& [number, played] : connections) {
            Receive(played, connections.size() == 1 ? VDeadline(left())
                                                    : VDeadline(std::min(left(), LookAtEach)));
        }
    }
}

/// A recording that began in the middle of a connection has no moment at which it was made.
VReplayer::VPlayed& VReplayer::Find(unsigned number)
{
    VPlayed& played = connections[number];
    if (!played.Connection) {
        played.Connection = std::make_unique<ControlStream::VConnection>(FrameLimit, false);
        played.Connection->Open(options.Host, options.Port, VDeadline(options.TimeLimit));
    }
    return played;
}

void VReplayer::Send(const VRecordedMoment& moment)
{
    Find(moment.Connection)
        .Connection->Send(moment.Text, VDeadline(options.TimeLimit), "a recorded frame");
}

void VReplayer::Compare(const VRecordedMoment& moment)
{
    if (IsEvent(moment.Text)) {
        return;
    }
    VPlayed& played = Find(moment.Connection);
    const VDeadline deadline(options.TimeLimit);
    while (played.Replies.empty()) {
        if (!Receive(played, deadline) || deadline.IsOver()) {
            throw VError(EErrorKind::TimedOut, "timed out after " + deadline.LimitText() +
                                                   ", waiting for the reply that was recorded as " +
                                                   moment.Text);
        }
    }
    const std::string received = std::move(played.Replies.front());
    played.Replies.pop_front();
    ++replies;
    if (received != moment.Text) {
        onDifference({moment.Connection, moment.Seconds, moment.Text, received});
    }
}

/// @return whether a frame came in time
bool VReplayer::Receive(VPlayed& played, const VDeadline& deadline)
{
    std::string text;
    if (played.Connection->Receive(text, deadline) != ControlStream::EWaited::Ready) {
        return false;
    }
    if (!IsEvent(text)) {
        played.Replies.push_back(std::move(text));
    }
    return true;
}
