#pragma once

#include "ControlStreamClient/AsyncOptions.h"
#include "ControlStreamClient/Outcome.h"

#include <chrono>
#include <functional>
#include <optional>

namespace ControlStream {

/// Keeps a device's place at a host: asks for the authorization on each new connection, and beats.
///
/// A host that says that the place is taken is asked again after a while. A refusal is final until
/// Ask, also over a new connection: each request opens a dialog before the operator.
///
/// Owns: only what it knows of the place. Threads: a plain object. Failure: a heartbeat that is not
/// answered in time is kept for Failure, since nothing else tells a dead host from a quiet one.
class VAttendance
{
public:
    using Clock = std::chrono::steady_clock;
    using Now = std::function<Clock::time_point()>;

    /// Runs a command; the function gets what came of it.
    using Run = std::function<void(VCall, std::function<void(VOutcome<VCommandReply>)>)>;

    /// @param changed  called after each change of Permission
    VAttendance(const VAsyncOptions& asyncOptions, Run runCommand, std::function<void()> changed,
                Now clock = &Clock::now);

    void OnConnected();
    void OnLost();
    void OnEvent(const VEvent& event);

    /// Asks for the authorization at the next Act, whatever was answered before.
    void Ask();

    /// Takes back a request that the operator has not answered yet; the device goes away.
    void GiveUp();

    /// Does what is due.
    void Act();

    /// When Act has something to do next; the last moment of all where nothing is to come.
    Clock::time_point NextAct() const;

    EPermission Permission() const { return permission; }

    /// Why the connection is of no use any more; empty while it is.
    const std::optional<VError>& Failure() const { return failure; }

private:
    bool Beats() const;
    void SendRequest();
    void SendBeat();
    void OnAnswer(const VOutcome<VCommandReply>& outcome);
    void OnBeat(const VOutcome<VCommandReply>& outcome);
    void Settle(EPermission answer);
    void Change(EPermission next);

    const VAsyncOptions options;
    const Run run;
    const std::function<void()> notifyChanged;
    const Now now;
    EPermission permission = EPermission::Unasked;
    bool connected = false;
    bool asking = false;                   // a request is under way
    bool beating = false;                  // a heartbeat is
    std::optional<EPermission> overtaking; // an outcome that came before the answer did
    std::uint64_t beats = 0;
    Clock::time_point nextAsk = Clock::time_point::max();
    Clock::time_point nextBeat = Clock::time_point::max();
    std::optional<VError> failure;
};

} // namespace ControlStream
