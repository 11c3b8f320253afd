#include "ControlStreamClient/Attendance.h"

#include <algorithm>
#include <utility>

namespace ControlStream {

namespace {

EPermission OutcomeOf(const VEvent& event)
{
    const bool authorized = GetValue(event.Parameters, "Status") == "Authorized";
    return authorized ? EPermission::Authorized : EPermission::Refused;
}

} // namespace

VAttendance::VAttendance(const VAsyncOptions& asyncOptions, Run runCommand,
                         std::function<void()> changed, Now clock)
    : options(asyncOptions),
      run(std::move(runCommand)),
      notifyChanged(std::move(changed)),
      now(std::move(clock))
{
}

void VAttendance::OnConnected()
{
    connected = true;
    failure.reset();
    nextBeat = now();
    if (options.Device && permission != EPermission::Refused) {
        nextAsk = now();
    }
}

void VAttendance::OnLost()
{
    connected = false;
    asking = false;
    beating = false;
    nextAsk = Clock::time_point::max();
    if (permission != EPermission::Refused) {
        Change(EPermission::Unasked);
    }
}

void VAttendance::OnEvent(const VEvent& event)
{
    if (event.Name == "Event.Disconnect") {
        Change(EPermission::Unasked); // the host ends; a later one is asked anew
    } else if (event.Name == "Event.Authorize" && permission == EPermission::Pending) {
        // The event names no device. Who has a request open is the one that is meant.
        Settle(OutcomeOf(event));
    } else if (event.Name == "Event.Authorize" && asking) {
        overtaking = OutcomeOf(event); // counts where the answer says that a request was open
    } else if (event.Name == "Event.Authorize" && permission == EPermission::Taken) {
        nextAsk = now(); // a decision was made, perhaps on a request from before a reconnection
    }
}

void VAttendance::Ask()
{
    if (options.Device) {
        nextAsk = now();
    }
}

void VAttendance::GiveUp()
{
    if (connected && permission == EPermission::Pending) {
        // Deliberate: the reply is not looked at. Hosts answer this command with a failure,
        // although they do as it says.
        run({"System.Authorize.Cancel", {{"DeviceId", options.Device->Id}}},
            [](const VOutcome<VCommandReply>&) {});
        permission = EPermission::Unasked;
    }
}

void VAttendance::Act()
{
    if (!connected) {
        return;
    }
    if (!asking && now() >= nextAsk) {
        SendRequest();
    }
    if (Beats() && !beating && now() >= nextBeat) {
        SendBeat();
    }
}

VAttendance::Clock::time_point VAttendance::NextAct() const
{
    if (!connected) {
        return Clock::time_point::max();
    }
    const Clock::time_point ask = asking ? Clock::time_point::max() : nextAsk;
    const Clock::time_point beat = Beats() && !beating ? nextBeat : Clock::time_point::max();
    return std::min(ask, beat);
}

bool VAttendance::Beats() const
{
    return options.BeatsAlways || permission == EPermission::Authorized;
}

void VAttendance::SendRequest()
{
    asking = true;
    overtaking.reset();
    nextAsk = Clock::time_point::max();
    run({"System.Authorize",
         {{"DeviceId", options.Device->Id}, {"DeviceName", options.Device->Name}}},
        [this](const VOutcome<VCommandReply>& outcome) { OnAnswer(outcome); });
}

void VAttendance::SendBeat()
{
    beating = true;
    nextBeat = now() + options.BeatInterval;
    run({"System.Heartbeat", {{"BeatId", std::to_string(++beats)}}},
        [this](const VOutcome<VCommandReply>& outcome) { OnBeat(outcome); });
}

void VAttendance::OnAnswer(const VOutcome<VCommandReply>& outcome)
{
    asking = false;
    const std::string status =
        outcome && outcome.Get().Ok ? GetValue(outcome.Get().Parameters, "Status") : std::string();
    if (status == "Authorized") {
        Settle(EPermission::Authorized);
    } else if (status == "Pending") {
        Settle(overtaking.value_or(EPermission::Pending));
    } else if (status == "Failed") {
        Settle(EPermission::Refused);
    } else {
        // "Connected", a failure, or no answer in time: it may go better later.
        if (options.AskAgain > std::chrono::milliseconds::zero()) {
            nextAsk = now() + options.AskAgain;
        }
        Change(status == "Connected" ? EPermission::Taken : EPermission::Unasked);
    }
}

void VAttendance::OnBeat(const VOutcome<VCommandReply>& outcome)
{
    beating = false;
    const VError* const error = outcome.Error();
    if (error != nullptr && error->Kind() == EErrorKind::TimedOut) {
        failure = *error;
    }
}

void VAttendance::Settle(EPermission answer)
{
    if (answer == EPermission::Authorized) {
        nextBeat = now();
    }
    Change(answer);
}

void VAttendance::Change(EPermission next)
{
    if (std::exchange(permission, next) != next) {
        notifyChanged();
    }
}

} // namespace ControlStream
