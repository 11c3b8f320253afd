#include "ControlStreamClient/Client.h"

#include "ControlStreamClient/Connection.h"
#include "ControlStreamClient/Deadline.h"
#include "ControlStreamClient/Message.h"
#include "ControlStreamClient/Requests.h"

#include <utility>

namespace ControlStream {

namespace {

std::string Quoted(const std::string& name)
{
    return "\"" + name + "\"";
}

[[noreturn]] void ThrowTimedOut(const VDeadline& deadline, const std::string& what,
                                std::size_t others)
{
    std::string text = "timed out after " + deadline.LimitText() + ", waiting for " + what;
    if (others > 0) {
        text += "; " + std::to_string(others) + " other message" + (others > 1 ? "s" : "") +
                " came meanwhile";
    }
    throw VError(EErrorKind::TimedOut, text);
}

} // namespace

VClient::VClient(const VClientOptions& clientOptions)
    : options(clientOptions),
      connection(std::make_unique<VConnection>(options.FrameLimit, options.QuickAcknowledgement))
{
}

VClient::~VClient() = default;

void VClient::Connect(const std::string& host, std::uint16_t port, std::chrono::milliseconds limit)
{
    if (host.empty() || host.find('\0') != std::string::npos || port == 0) {
        throw VError(EErrorKind::Usage, "a connection needs the name of a host and a port");
    }
    keptEvents.clear();
    keptBytes = 0;
    outOfStep = false;
    connection->Open(host, port, VDeadline(limit));
}

bool VClient::IsConnected() const
{
    return connection->IsOpen();
}

void VClient::Close()
{
    connection->Close();
}

bool VClient::Finish(std::chrono::milliseconds limit)
{
    return !connection->IsOpen() || connection->Finish(VDeadline(limit));
}

void VClient::SetTimeLimit(std::chrono::milliseconds limit)
{
    options.TimeLimit = limit;
}

VServerInformation VClient::GetServerInformation()
{
    VMessage reply = Request(EMessageKind::ServerInformation, MakeServerInformationRequest(),
                             std::string(), "the server information");
    return std::get<VServerInformation>(reply.Content);
}

std::vector<std::string> VClient::GetCommands()
{
    const std::string correlation = NextCorrelation();
    VMessage reply = Request(EMessageKind::Commands, MakeCommandsRequest(correlation), correlation,
                             "the list of commands");
    return std::get<std::vector<std::string>>(std::move(reply.Content));
}

VCommandInformation VClient::GetCommandInformation(const std::string& name)
{
    const std::string correlation = NextCorrelation();
    VMessage reply =
        Request(EMessageKind::CommandInformation, MakeCommandInformationRequest(correlation, name),
                correlation, "the description of the command " + Quoted(name));
    return std::get<VCommandInformation>(std::move(reply.Content));
}

std::vector<std::string> VClient::GetEvents()
{
    VMessage reply =
        Request(EMessageKind::Events, MakeEventsRequest(), std::string(), "the list of events");
    return std::get<std::vector<std::string>>(std::move(reply.Content));
}

VEventInformation VClient::GetEventInformation(const std::string& name)
{
    VMessage reply = Request(EMessageKind::EventInformation, MakeEventInformationRequest(name),
                             std::string(), "the description of the event " + Quoted(name));
    return std::get<VEventInformation>(std::move(reply.Content));
}

VCommandReply VClient::ExecuteCommand(const std::string& name, const VParameters& parameters)
{
    const std::string correlation = NextCorrelation();
    VMessage reply = Request(EMessageKind::CommandReply,
                             MakeExecuteCommandRequest(correlation, name, parameters), correlation,
                             "the reply to the command " + Quoted(name));
    return std::get<VCommandReply>(std::move(reply.Content));
}

std::optional<VEvent> VClient::WaitForEvent(std::chrono::milliseconds limit)
{
    if (!keptEvents.empty()) {
        return TakeKept();
    }
    const VDeadline deadline(limit);
    std::string text;
    while (connection->ReceiveInterruptibly(text, deadline) == EWaited::Ready) {
        VMessage message = ParseMessage(std::move(text));
        if (message.Kind == EMessageKind::Event) {
            return std::get<VEvent>(std::move(message.Content));
        }
        if (deadline.IsOver()) {
            break; // replies that nobody waits for any more must not hold up the caller
        }
    }
    return std::nullopt;
}

void VClient::SetEventHandler(EventHandler handler)
{
    eventHandler = std::move(handler);
}

void VClient::SetEventHandler(const std::string& name, EventHandler handler)
{
    namedHandlers[name] = std::move(handler);
}

std::size_t VClient::DeliverEvents(std::chrono::milliseconds limit)
{
    std::optional<VEvent> event = WaitForEvent(limit);
    // Those that come while the handler makes requests wait for the next call, so that this ends.
    std::size_t others = keptEvents.size();
    std::size_t delivered = 0;
    while (event) {
        ++delivered;
        CallHandlers(*event);
        event.reset();
        if (others > 0 && !keptEvents.empty()) {
            --others;
            event = TakeKept();
        }
    }
    return delivered;
}

void VClient::CallHandlers(const VEvent& event) const
{
    const auto named = namedHandlers.find(event.Name);
    // Copies, since a handler may set others.
    const EventHandler first = named == namedHandlers.end() ? EventHandler() : named->second;
    if (first) {
        first(event);
    }
    const EventHandler second = eventHandler;
    if (second) {
        second(event);
    }
}

std::uint64_t VClient::GetDroppedEventCount() const
{
    return droppedEvents;
}

void VClient::Interrupt() noexcept
{
    connection->Interrupt();
}

std::string VClient::ExchangeRaw(const std::string& text)
{
    const VDeadline deadline(options.TimeLimit);
    SendRaw(text, deadline);
    std::string reply;
    while (connection->Receive(reply, deadline) == EWaited::Ready) {
        if (!KeepIfEvent(reply)) {
            outOfStep = false;
            return reply;
        }
        if (deadline.IsOver()) {
            break;
        }
    }
    ThrowTimedOut(deadline,
                  "a reply to the raw frame; a host answers nothing to what it does not understand",
                  0);
}

void VClient::SendRaw(const std::string& text)
{
    SendRaw(text, VDeadline(options.TimeLimit));
}

std::string VClient::NextCorrelation()
{
    return std::to_string(++correlations);
}

void VClient::RequireConnection() const
{
    if (!connection->IsOpen()) {
        throw VError(EErrorKind::NoConnection, "there is no connection to a host");
    }
}

void VClient::SendRaw(const std::string& text, const VDeadline& deadline)
{
    RequireConnection();
    outOfStep = true; // nobody knows what it asks for
    connection->Send(text, deadline, "the raw frame");
}

VMessage VClient::Request(EMessageKind kind, const std::string& text,
                          const std::string& correlation, const std::string& what)
{
    RequireConnection();
    const VDeadline deadline(options.TimeLimit);
    if (!correlation.empty()) {
        connection->Send(text, deadline, "the request for " + what);
        return Await(kind, correlation, deadline, what);
    }
    if (outOfStep) {
        GetInStep(deadline);
    }
    outOfStep = true;
    connection->Send(text, deadline, "the request for " + what);
    VMessage reply = Await(kind, correlation, deadline, what);
    outOfStep = false;
    return reply;
}

/// Passes over the replies that an earlier time-out has left behind. Those that bear no correlation
/// could be taken for the reply to the next request of their kind; the host answers in order, so
/// that all of them are here before the reply to a request that does bear one.
void VClient::GetInStep(const VDeadline& deadline)
{
    const std::string correlation = NextCorrelation();
    const std::string what = "the list of commands, which tells that late replies have passed";
    connection->Send(MakeCommandsRequest(correlation), deadline, "the request for " + what);
    Await(EMessageKind::Commands, correlation, deadline, what);
    outOfStep = false;
}

VMessage VClient::Await(EMessageKind kind, const std::string& correlation,
                        const VDeadline& deadline, const std::string& what)
{
    std::size_t others = 0;
    std::string text;
    while (connection->Receive(text, deadline) == EWaited::Ready) {
        const std::size_t size = text.size();
        VMessage message = ParseMessage(std::move(text));
        if (message.Kind == kind && message.Correlation == correlation) {
            return message;
        }
        if (message.Kind == EMessageKind::Event) {
            Keep(std::get<VEvent>(std::move(message.Content)), size);
        } else {
            ++others;
        }
        if (deadline.IsOver()) {
            break; // a host that floods must not hold up the caller
        }
    }
    ThrowTimedOut(deadline, what, others);
}

/// Returns false for any other message, and for what cannot be read.
bool VClient::KeepIfEvent(const std::string& text)
{
    try {
        VMessage message = ParseMessage(text);
        if (message.Kind == EMessageKind::Event) {
            Keep(std::get<VEvent>(std::move(message.Content)), text.size());
            return true;
        }
    } catch (const VError&) {
        return false; // the caller asked for whatever comes, and judges it
    }
    return false;
}

void VClient::Keep(VEvent event, std::size_t size)
{
    keptEvents.push_back({std::move(event), size});
    keptBytes += size;
    while (keptBytes > options.KeptEventBytes) {
        TakeKept();
        ++droppedEvents;
    }
}

VEvent VClient::TakeKept()
{
    VEvent event = std::move(keptEvents.front().Event);
    keptBytes -= keptEvents.front().Size;
    keptEvents.pop_front();
    return event;
}

} // namespace ControlStream
