#include "ControlStreamClient/AsyncCore.h"

#include "ControlStreamClient/Client.h"
#include "ControlStreamClient/Requests.h"

#include <algorithm>
#include <exception>
#include <utility>

namespace ControlStream {

namespace {

// How long the last words to a host may take to leave.
constexpr std::chrono::milliseconds FarewellLimit{200};

VError StoppedError()
{
    return VError(EErrorKind::NoConnection, "the client was stopped");
}

std::chrono::milliseconds Until(VPipeline::Clock::time_point moment)
{
    if (moment == VPipeline::Clock::time_point::max()) {
        return NoLimit;
    }
    const auto now = VPipeline::Clock::now();
    return moment <= now ? std::chrono::milliseconds::zero()
                         : std::chrono::ceil<std::chrono::milliseconds>(moment - now);
}

} // namespace

VAsyncCore::VAsyncCore(const VAsyncOptions& asyncOptions)
    : options(asyncOptions),
      connection(options.FrameLimit, false),
      backOff(options.BackOff),
      attendance(
          options,
          [this](VCall call, const std::function<void(VOutcome<VCommandReply>)>& finish) {
              Post(
                  EMessageKind::CommandReply, call.Name,
                  [&call](const std::string& correlation) {
                      return MakeExecuteCommandRequest(correlation, call.Name, call.Parameters);
                  },
                  [finish](const VOutcome<VMessage>& outcome) {
                      const VError* const error = outcome.Error();
                      finish(error != nullptr ? VOutcome<VCommandReply>(*error)
                                              : std::get<VCommandReply>(outcome.Get().Content));
                  });
          },
          [this] {
              VAsyncStatus next = GetStatus();
              next.Permission = attendance.Permission();
              PublishStatus(next);
          })
{
    if (options.Host.empty() || options.Host.find('\0') != std::string::npos || options.Port == 0) {
        throw VError(EErrorKind::Usage, "a connection needs the name of a host and a port");
    }
    if (options.Device) {
        // Refused here rather than on each connection, where nobody would hear of it.
        MakeExecuteCommandRequest(
            "1", "System.Authorize",
            {{"DeviceId", options.Device->Id}, {"DeviceName", options.Device->Name}});
    }
}

void VAsyncCore::Run()
{
    ownThread = std::this_thread::get_id();
    while (!IsStopping()) {
        if (TryToConnect()) {
            ServeConnection();
        }
        if (!IsStopping()) {
            WaitBeforeNextAttempt();
        }
    }
    SayFarewell();
    {
        const std::lock_guard<std::mutex> lock(mutex);
        ended = true;
    }
    TakePosted();
    pipeline.FailAll(StoppedError());
    SetState(EConnectionState::Stopped, "the client was stopped");
}

void VAsyncCore::Stop()
{
    stopping = true;
    connection.Interrupt();
}

void VAsyncCore::Post(EMessageKind kind, const std::string& name, const MakeText& makeText,
                      Finish finish)
{
    bool taken = false;
    bool wakes = false;
    {
        const std::lock_guard<std::mutex> lock(mutex);
        VPendingRequest request;
        request.Number = ++lastNumber;
        request.Text = makeText(std::to_string(request.Number));
        if (!ended) {
            request.Kind = kind;
            request.Name = name;
            request.TimeLimit = options.TimeLimit;
            request.Finish = [this, finish](VOutcome<VMessage> outcome) {
                Guard([&] { finish(std::move(outcome)); });
            };
            wakes = posted.empty(); // else whoever came first does
            posted.push_back(std::move(request));
            taken = true;
        }
    }
    if (wakes) {
        connection.Interrupt();
    }
    if (!taken) {
        finish(StoppedError());
    }
}

void VAsyncCore::Ask()
{
    {
        const std::lock_guard<std::mutex> lock(mutex);
        asked = true;
    }
    connection.Interrupt();
}

VAsyncStatus VAsyncCore::GetStatus() const
{
    const std::lock_guard<std::mutex> lock(mutex);
    return status;
}

bool VAsyncCore::WaitFor(const std::function<bool(const VAsyncStatus&)>& wanted,
                         std::chrono::milliseconds limit) const
{
    const VDeadline deadline(limit);
    std::unique_lock<std::mutex> lock(mutex);
    while (!wanted(status)) {
        const int milliseconds = deadline.PollMilliseconds();
        if (milliseconds == 0 || status.State == EConnectionState::Stopped) {
            return false;
        }
        if (milliseconds < 0) {
            statusChanged.wait(lock);
        } else {
            statusChanged.wait_for(lock, std::chrono::milliseconds(milliseconds));
        }
    }
    return true;
}

void VAsyncCore::ThrowIfStopping() const
{
    if (IsStopping()) {
        throw StoppedError();
    }
}

bool VAsyncCore::TryToConnect()
{
    SetState(EConnectionState::Connecting, GetStatus().Reason);
    try {
        const VDeadline deadline(options.ConnectLimit);
        connection.Open(options.Host, options.Port, deadline, &LookUpAddresses, [this] {
            ThrowIfStopping();
            return DoWhatIsDue();
        });
        AwaitFirstAnswer(deadline);
        return true;
    } catch (const VError& error) {
        Lose(error);
        return false;
    }
}

/// A host that answers has entered this connection among those that hear events, so that none is
/// missed from here on; one that only accepts is as good as none.
void VAsyncCore::AwaitFirstAnswer(const VDeadline& deadline)
{
    queue.Add(MakeServerInformationRequest());
    while (!HandleFrames(true)) {
        ThrowIfStopping();
        if (deadline.IsOver()) {
            throw VError(EErrorKind::TimedOut, "timed out after " + deadline.LimitText() +
                                                   ", waiting for the host's first answer");
        }
        connection.Turn(queue, deadline.Sooner(DoWhatIsDue()), true);
    }
}

void VAsyncCore::ServeConnection()
{
    backOff.Reset();
    probing = false;
    lost.reset();
    SetState(EConnectionState::Connected, std::string());
    attendance.OnConnected();
    try {
        HandleFrames(false);
        while (!IsStopping()) {
            Turn();
        }
    } catch (const VError& error) {
        Lose(error);
    }
}

void VAsyncCore::Turn()
{
    attendance.Act();
    const std::chrono::milliseconds longest = std::min(DoWhatIsDue(), Until(attendance.NextAct()));
    if (pipeline.IsSilent() && !probing) {
        Probe(); // which interrupts the wait below
    }
    if (!lost) {
        lost = attendance.Failure();
    }
    if (lost) {
        throw VError(*lost);
    }
    pipeline.Send(queue, Clock::now());
    connection.Turn(queue, VDeadline(longest), true);
    HandleFrames(false);
}

void VAsyncCore::WaitBeforeNextAttempt()
{
    SetState(EConnectionState::Waiting, GetStatus().Reason);
    const VDeadline deadline(backOff.Next());
    while (!IsStopping() && !deadline.IsOver()) {
        connection.WaitForInterrupt(deadline.Sooner(DoWhatIsDue()));
    }
}

void VAsyncCore::SayFarewell()
{
    if (!connection.IsOpen()) {
        return;
    }
    try {
        attendance.GiveUp();
        TakePosted();
        pipeline.Send(queue, Clock::now());
        const VDeadline deadline(FarewellLimit);
        connection.Flush(queue, deadline);
        // A plain close could take back what the host has not read yet.
        connection.Finish(deadline);
    } catch (const VError&) {
        return; // whoever goes need not know that the host has gone too
    }
}

/// Does what does not need a connection. @return how long it may be left alone then
std::chrono::milliseconds VAsyncCore::DoWhatIsDue()
{
    TakePosted();
    pipeline.Expire(Clock::now(), GetStatus().State == EConnectionState::Connected);
    return Until(pipeline.NextExpiry());
}

void VAsyncCore::TakePosted()
{
    std::vector<VPendingRequest> taken;
    bool asks = false;
    {
        const std::lock_guard<std::mutex> lock(mutex);
        taken.swap(posted);
        asks = std::exchange(asked, false);
    }
    const Clock::time_point now = Clock::now();
    for (VPendingRequest& request : taken) {
        pipeline.Add(std::move(request), now);
    }
    if (asks) {
        attendance.Ask();
    }
}

/// Handles what has arrived whole. @return whether the server information was waited for and came
bool VAsyncCore::HandleFrames(bool untilServerInformation)
{
    std::string text;
    while (!IsStopping() && connection.TakeArrived(text)) {
        VMessage message = ParseMessage(std::move(text));
        if (untilServerInformation && message.Kind == EMessageKind::ServerInformation) {
            return true;
        }
        OnMessage(std::move(message));
    }
    return false;
}

void VAsyncCore::OnMessage(VMessage&& message)
{
    if (message.Kind == EMessageKind::Event) {
        const VEvent& event = std::get<VEvent>(message.Content);
        attendance.OnEvent(event);
        Guard([&] { Handlers.Call(event); });
    } else {
        pipeline.Accept(std::move(message), Clock::now());
    }
}

/// Finds out whether a host that left a request unanswered answers anything at all.
void VAsyncCore::Probe()
{
    probing = true;
    Post(
        EMessageKind::ServerInformation, std::string(),
        [](const std::string&) { return MakeServerInformationRequest(); },
        [this](const VOutcome<VMessage>& outcome) {
            probing = false;
            if (outcome.Error() != nullptr && outcome.Error()->Kind() == EErrorKind::TimedOut) {
                lost = *outcome.Error();
            }
        });
}

void VAsyncCore::Lose(const VError& error)
{
    connection.Close();
    queue.Clear();
    pipeline.FailSent(error);
    if (!IsStopping()) {
        SetState(EConnectionState::Waiting, error.what());
    }
    attendance.OnLost();
}

void VAsyncCore::SetState(EConnectionState state, const std::string& reason)
{
    VAsyncStatus next = GetStatus();
    if (next.State == state && next.Reason == reason) {
        return;
    }
    next.State = state;
    next.Reason = reason;
    PublishStatus(next);
}

/// Only the client's thread changes the status.
void VAsyncCore::PublishStatus(const VAsyncStatus& next)
{
    {
        const std::lock_guard<std::mutex> lock(mutex);
        status = next;
    }
    statusChanged.notify_all();
    if (options.OnStatus) {
        Guard([&] { options.OnStatus(next); });
    }
}

/// Nothing that the user's function throws may end the thread.
template <typename TFunction>
void VAsyncCore::Guard(const TFunction& function) const
{
    std::string failure;
    try {
        function();
        return;
    } catch (const std::exception& error) {
        failure = error.what();
    } catch (...) {
        failure = "an exception of an unknown type";
    }
    if (options.OnFunctionFailed) {
        options.OnFunctionFailed(failure);
    }
}

} // namespace ControlStream
