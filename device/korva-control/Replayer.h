#pragma once

#include "ControlStreamClient/Connection.h"
#include "FakeHost/Recording.h"

#include <chrono>
#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

/// A reply that differs from the recorded one.
struct VReplayDifference
{
    unsigned Connection = 1;
    double Seconds = 0; ///< when it was recorded
    std::string Recorded;
    std::string Received;
};

struct VReplayOptions
{
    std::string Host; ///< to connect to
    std::uint16_t Port = 0;
    std::chrono::milliseconds TimeLimit{}; ///< for each connection, and for each reply
    double Speed = 1;                      ///< 0 leaves out the pauses
};

/// Plays the devices of a recording against a host.
///
/// A device's frame goes out at its time, but not before the replies that it had got by then;
/// events are passed over. Threads: one. Failure: VError.
class VReplayer
{
public:
    using OnDifference = std::function<void(const VReplayDifference&)>;

    VReplayer(const VReplayOptions& replayOptions, OnDifference differenceFunction);

    /// @return how many frames were sent
    std::size_t Play(const std::vector<FakeHost::VRecordedMoment>& moments);

    std::size_t Replies() const { return replies; }

private:
    struct VPlayed
    {
        std::unique_ptr<ControlStream::VConnection> Connection;
        std::deque<std::string> Replies; // that came and are not compared yet
    };

    void Pause(double seconds);
    VPlayed& Find(unsigned number);
    void Send(const FakeHost::VRecordedMoment& moment);
    void Compare(const FakeHost::VRecordedMoment& moment);
    static bool Receive(VPlayed& played, const ControlStream::VDeadline& deadline);

    const VReplayOptions options;
    const OnDifference onDifference;
    std::chrono::steady_clock::time_point start;
    std::map<unsigned, VPlayed> connections;
    std::size_t replies = 0;
};
