#pragma once

#include "ControlStreamClient/EventHandlers.h"
#include "ControlStreamClient/Outcome.h"
#include "ControlStreamClient/Records.h"

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace ControlStream {

class VConnection;
class VDeadline;
class VPipeline;
enum class EMessageKind;
struct VMessage;

/// A time limit that never runs out.
constexpr std::chrono::milliseconds NoLimit = std::chrono::milliseconds::max();

/// What can be chosen about a client.
struct VClientOptions
{
    /// How long each request may take from its sending to its reply.
    std::chrono::milliseconds TimeLimit{5000};

    /// The longest frame that is accepted from the host, in bytes. Memory is taken as bytes arrive,
    /// not when they are announced.
    std::uint32_t FrameLimit = 64U << 20U;

    /// How many bytes of events are kept for a caller who does not take them; beyond that the
    /// oldest are dropped. 0 keeps none, for a device that does not care for events.
    std::size_t KeptEventBytes = 16U << 20U;

    /// Acknowledges what arrives at once, one system call more for each arrival. For measurements:
    /// a host that writes a reply in one piece does not need it.
    bool QuickAcknowledgement = false;
};

/// One device's connection to a host: requests with their replies, and the host's events.
///
/// Everything happens on the caller's thread, inside the call: there is no thread behind the client
/// and nothing arrives between two calls. Each request returns its reply. Events that arrive
/// meanwhile are kept, and handed out in their order by WaitForEvent or DeliverEvents.
///
/// Requests are checked before they are sent, since the host answers a faulty message with silence.
/// Names and correlations travel as they stand and so cannot hold "<"; values may hold any text
/// but control characters other than tab and line ends, and must not be white space alone.
///
/// Owns: the socket. Threads: one at a time, as for any plain object; only Interrupt may come from
/// anywhere. Failure: VError; after TimedOut and Usage the connection is as good as before (except
/// where the time ran out in the middle of sending, which closes it), after Closed it is gone, and
/// after Protocol it is gone if the framing itself was broken, see IsConnected.
class VClient
{
public:
    using EventHandler = ControlStream::EventHandler;

    explicit VClient(const VClientOptions& clientOptions = VClientOptions());
    ~VClient();
    VClient(const VClient&) = delete;
    VClient& operator=(const VClient&) = delete;

    /// Connects to a host, dropping an earlier connection and the events kept from it.
    ///
    /// @param host   a name or an IPv4 address in dotted form: hosts listen on IPv4 alone
    /// @param limit  for finding the address and connecting together
    void Connect(const std::string& host, std::uint16_t port = DefaultPort,
                 std::chrono::milliseconds limit = std::chrono::milliseconds(5000));

    bool IsConnected() const;

    /// Closes at once. What the host has not read yet may be lost. Kept events stay.
    void Close();

    /// Tells the host that nothing more will come, and waits until it has handled everything that
    /// was sent and has closed; what it sends meanwhile is dropped. Closes in any case.
    ///
    /// @return false where the limit ran out first
    bool Finish(std::chrono::milliseconds limit);

    /// Changes the time limit of the requests that follow.
    void SetTimeLimit(std::chrono::milliseconds limit);

    VServerInformation GetServerInformation();

    /// Returns the names of all commands in the host's order.
    std::vector<std::string> GetCommands();

    /// An unknown name is no failure, see VCommandInformation.
    VCommandInformation GetCommandInformation(const std::string& name);

    /// Returns the names of all events in the host's order.
    std::vector<std::string> GetEvents();

    /// An unknown name is no failure, see VEventInformation.
    VEventInformation GetEventInformation(const std::string& name);

    /// Runs a command and waits for its outcome. A failure that the host reports is a reply like
    /// any other: look at its `Ok`.
    ///
    /// After TimedOut the command may run yet, or have run.
    ///
    /// @param parameters  of two with one name the host takes the later
    VCommandReply ExecuteCommand(const std::string& name, const VParameters& parameters = {});

    /// Runs many commands with several under way at once, and returns what came of each, in the
    /// order of the calls.
    ///
    /// At most 64 KiB of requests are on their way without a reply, and replies are read while
    /// requests are written, so that neither side can come to a stand. Each request has the time
    /// limit by itself, counted from its sending. Where the host answers nothing any more, the
    /// rest is given up unsent; where the connection ends, every call without a reply bears that
    /// error, and those that were sent may have run.
    ///
    /// @throws VError  of the kind Usage where one call cannot be sent, with nothing sent of any;
    ///                 of the kind NoConnection without a connection
    std::vector<VOutcome<VCommandReply>> ExecuteBatch(const std::vector<VCall>& calls);

    /// Returns the next event, waiting for it if none is kept; empty where the limit ran out, or
    /// after Interrupt.
    std::optional<VEvent> WaitForEvent(std::chrono::milliseconds limit);

    /// Sets the function that DeliverEvents calls. It is never called inside a request, and may
    /// itself make requests. An empty one drops the events that are delivered.
    void SetEventHandler(EventHandler handler);

    /// The same for the events of one name; each event goes to this one, then to that of
    /// SetEventHandler. An empty function takes back the one that is there.
    void SetEventHandler(const std::string& name, EventHandler handler);

    /// Waits for an event as WaitForEvent does, and passes it to its handlers with every event that
    /// is kept, in order.
    ///
    /// An exception of the handler passes through; the events behind the one that met it stay kept.
    ///
    /// @return the number of events delivered
    std::size_t DeliverEvents(std::chrono::milliseconds limit);

    /// How many events were dropped since nobody took them, see VClientOptions::KeptEventBytes.
    std::uint64_t GetDroppedEventCount() const;

    /// Makes the WaitForEvent or DeliverEvents that is waiting, or else the next one that has to
    /// wait, return at once. May be called on any thread and in a signal handler. [any]
    void Interrupt() noexcept;

    /// Sends the bytes as one frame, unchecked, and returns the first frame after it that is not an
    /// event, as it arrived.
    ///
    /// The host answers nothing to what it does not understand, so TimedOut is a common outcome.
    std::string ExchangeRaw(const std::string& text);

    /// Sends the bytes as one frame, unchecked, and does not wait. A reply to it, should one come,
    /// is passed over by the requests that follow.
    void SendRaw(const std::string& text);

private:
    std::string NextCorrelation();
    void RequireConnection() const;
    void SendRaw(const std::string& text, const VDeadline& deadline);
    VMessage Request(EMessageKind kind, const std::string& text, const std::string& correlation,
                     const std::string& what);
    void GetInStep(const VDeadline& deadline);
    VMessage Await(EMessageKind kind, const std::string& correlation, const VDeadline& deadline,
                   const std::string& what);
    void RunBatch(VPipeline& pipeline);
    void TakeBatchReplies(VPipeline& pipeline);
    void TakeLastReplies(VPipeline& pipeline);
    void CallHandlers(const VEvent& event) const;
    bool KeepIfEvent(const std::string& text);
    void Keep(VEvent event, std::size_t size);
    VEvent TakeKept();

    struct VKeptEvent
    {
        VEvent Event;
        std::size_t Size; // bytes of its frame
    };

    VClientOptions options;
    std::unique_ptr<VConnection> connection;
    EventHandler eventHandler;
    std::map<std::string, EventHandler> namedHandlers;
    std::deque<VKeptEvent> keptEvents;
    std::size_t keptBytes = 0;
    std::uint64_t droppedEvents = 0;
    std::uint64_t correlations = 0;
    bool outOfStep = false; // a reply without a correlation may still be on its way
};

} // namespace ControlStream
