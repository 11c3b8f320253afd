#pragma once

#include "ControlStreamClient/AsyncOptions.h"
#include "ControlStreamClient/EventHandlers.h"
#include "ControlStreamClient/Outcome.h"
#include "ControlStreamClient/Records.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <future>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace ControlStream {

class VAsyncCore;

/// One device's lasting tie to a host: it connects by itself, and again whenever the connection is
/// lost, asks for the authorization each time, beats, and carries any number of requests at once.
///
/// A request that is made while there is no connection waits for one, within its time limit. One
/// that is on its way when the connection is lost fails with Closed and is never sent again: the
/// host may have run it.
///
/// Owns: the connection, and the thread on which every function of the user's is called, one at a
/// time. Threads: every operation [any]; a function that is called may use the client, and destroy
/// it, but must not wait for a future of it. Failure: VError, in the outcome or the future; of the
/// kind Usage thrown at once, for what the host would drop in silence.
class VAsyncClient
{
public:
    template <typename TResult>
    using Handler = std::function<void(const VOutcome<TResult>&)>;

    /// Begins to connect.
    explicit VAsyncClient(const VAsyncOptions& options);

    /// Stops.
    ~VAsyncClient();

    VAsyncClient(const VAsyncClient&) = delete;
    VAsyncClient& operator=(const VAsyncClient&) = delete;

    /// Closes the connection for good; requests that are under way fail with NoConnection. A
    /// request for authorization that the operator has not answered yet is taken back. Waits for
    /// the function that is running just now, except inside of one. A second call does nothing.
    void Stop();

    VAsyncStatus GetStatus() const;

    /// Waits until the status is as wanted.
    ///
    /// @return false where the limit ran out first, or the client was stopped
    bool WaitFor(const std::function<bool(const VAsyncStatus&)>& wanted,
                 std::chrono::milliseconds limit) const;

    /// The same, for a connection.
    bool WaitUntilConnected(std::chrono::milliseconds limit) const;

    /// Asks for the authorization again, after a refusal.
    void Authorize();

    /// Adds a function for the events of one name, or of all with an empty one; events that come
    /// when nobody listens are gone.
    ///
    /// @return what RemoveEventHandler takes
    std::uint64_t AddEventHandler(const std::string& name, EventHandler handler);
    void RemoveEventHandler(std::uint64_t id);

    /// Runs a command. A failure that the host reports is a reply like any other.
    ///
    /// After TimedOut and Closed the command may run yet, or have run.
    void ExecuteCommand(const std::string& name, const VParameters& parameters,
                        Handler<VCommandReply> handler);
    std::future<VCommandReply> ExecuteCommand(const std::string& name,
                                              const VParameters& parameters = {});

    void GetServerInformation(Handler<VServerInformation> handler);
    std::future<VServerInformation> GetServerInformation();

    void GetCommands(Handler<std::vector<std::string>> handler);
    std::future<std::vector<std::string>> GetCommands();

    void GetCommandInformation(const std::string& name, Handler<VCommandInformation> handler);
    std::future<VCommandInformation> GetCommandInformation(const std::string& name);

    void GetEvents(Handler<std::vector<std::string>> handler);
    std::future<std::vector<std::string>> GetEvents();

    void GetEventInformation(const std::string& name, Handler<VEventInformation> handler);
    std::future<VEventInformation> GetEventInformation(const std::string& name);

private:
    const std::shared_ptr<VAsyncCore> core;
    std::mutex joining;
    std::thread thread;
};

} // namespace ControlStream
