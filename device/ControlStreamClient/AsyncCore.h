#pragma once

#include "ControlStreamClient/AsyncOptions.h"
#include "ControlStreamClient/Attendance.h"
#include "ControlStreamClient/BackOff.h"
#include "ControlStreamClient/Connection.h"
#include "ControlStreamClient/EventHandlers.h"
#include "ControlStreamClient/Pipeline.h"

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace ControlStream {

/// What an asynchronous client does on its thread. The thread shares in owning it, so that a
/// function of the user's may destroy the client.
///
/// Threads: as marked; all else on the thread that runs Run. Failure: a connection that fails is
/// made anew; requests get their errors by their functions.
class VAsyncCore
{
public:
    using MakeText = std::function<std::string(const std::string& correlation)>;
    using Finish = std::function<void(VOutcome<VMessage>)>;

    explicit VAsyncCore(const VAsyncOptions& asyncOptions);

    /// Connects and serves until Stop.
    void Run();

    /// Ends Run. [any]
    void Stop();

    /// Whether this is the thread that runs Run. [any]
    bool IsOwnThread() const { return ownThread.load() == std::this_thread::get_id(); }

    /// Hands over a request. What `makeText` throws passes through, with nothing handed over. After
    /// Stop the request fails on this thread. [any]
    void Post(EMessageKind kind, const std::string& name, const MakeText& makeText, Finish finish);

    /// Has the host asked for the authorization again. [any]
    void Ask();

    VAsyncStatus GetStatus() const; // [any]
    bool WaitFor(const std::function<bool(const VAsyncStatus&)>& wanted,
                 std::chrono::milliseconds limit) const; // [any]

    VEventHandlers Handlers; // [any]

private:
    using Clock = VPipeline::Clock;

    bool IsStopping() const { return stopping; }
    void ThrowIfStopping() const;
    bool TryToConnect();
    void AwaitFirstAnswer(const VDeadline& deadline);
    void ServeConnection();
    void Turn();
    void WaitBeforeNextAttempt();
    void SayFarewell();
    std::chrono::milliseconds DoWhatIsDue();
    void TakePosted();
    bool HandleFrames(bool untilServerInformation);
    void OnMessage(VMessage&& message);
    void Probe();
    void Lose(const VError& error);
    void SetState(EConnectionState state, const std::string& reason);
    void PublishStatus(const VAsyncStatus& status);
    template <typename TFunction>
    void Guard(const TFunction& function) const;

    const VAsyncOptions options;
    std::atomic<bool> stopping{false};
    std::atomic<std::thread::id> ownThread{std::thread::id()};

    mutable std::mutex mutex;
    std::vector<VPendingRequest> posted; // guarded by mutex
    std::uint64_t lastNumber = 0;        // guarded by mutex
    bool asked = false;                  // guarded by mutex
    bool ended = false;                  // guarded by mutex: nothing posted is taken any more
    VAsyncStatus status;                 // guarded by mutex
    mutable std::condition_variable statusChanged;

    VConnection connection; // its Interrupt [any]
    VSendQueue queue;
    VPipeline pipeline;
    VBackOff backOff;
    VAttendance attendance;
    bool probing = false;
    std::optional<VError> lost; // why the connection has to go
};

} // namespace ControlStream
