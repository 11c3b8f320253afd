#include "ControlStreamClient/AsyncClient.h"

#include "ControlStreamClient/AsyncCore.h"
#include "ControlStreamClient/Requests.h"

#include <exception>
#include <utility>

namespace ControlStream {

namespace {

/// Hands a reply's record of this type on.
template <typename TResult>
VAsyncCore::Finish ForResult(VAsyncClient::Handler<TResult> handler)
{
    return [handler = std::move(handler)](VOutcome<VMessage> outcome) {
        if (!handler) {
            return;
        }
        if (const VError* error = outcome.Error()) {
            handler(*error);
        } else {
            handler(std::get<TResult>(std::move(std::move(outcome).Get().Content)));
        }
    };
}

/// Calls a function that takes a handler with one that fulfils the future.
template <typename TResult, typename TStart>
std::future<TResult> AsFuture(const TStart& start)
{
    const auto promise = std::make_shared<std::promise<TResult>>();
    std::future<TResult> future = promise->get_future();
    start(VAsyncClient::Handler<TResult>([promise](const VOutcome<TResult>& outcome) {
        if (const VError* error = outcome.Error()) {
            promise->set_exception(std::make_exception_ptr(*error));
        } else {
            promise->set_value(outcome.Get());
        }
    }));
    return future;
}

using Names = std::vector<std::string>;

} // namespace

VAsyncClient::VAsyncClient(const VAsyncOptions& options)
    : core(std::make_shared<VAsyncCore>(options)), thread([ownCore = core] { ownCore->Run(); })
{
}

VAsyncClient::~VAsyncClient()
{
    Stop();
    if (thread.joinable()) {
        thread.detach(); // a function of the user's destroys the client; its thread ends by itself
    }
}

void VAsyncClient::Stop()
{
    core->Stop();
    if (core->IsOwnThread()) {
        return;
    }
    const std::lock_guard<std::mutex> lock(joining);
    if (thread.joinable()) {
        thread.join();
    }
}

VAsyncStatus VAsyncClient::GetStatus() const
{
    return core->GetStatus();
}

bool VAsyncClient::WaitFor(const std::function<bool(const VAsyncStatus&)>& wanted,
                           std::chrono::milliseconds limit) const
{
    return core->WaitFor(wanted, limit);
}

bool VAsyncClient::WaitUntilConnected(std::chrono::milliseconds limit) const
{
    return WaitFor(
        [](const VAsyncStatus& status) { return status.State == EConnectionState::Connected; },
        limit);
}

void VAsyncClient::Authorize()
{
    core->Ask();
}

std::uint64_t VAsyncClient::AddEventHandler(const std::string& name, EventHandler handler)
{
    return core->Handlers.Add(name, std::move(handler));
}

void VAsyncClient::RemoveEventHandler(std::uint64_t id)
{
    core->Handlers.Remove(id);
}

void VAsyncClient::ExecuteCommand(const std::string& name, const VParameters& parameters,
                                  Handler<VCommandReply> handler)
{
    core->Post(
        EMessageKind::CommandReply, name,
        [&](const std::string& correlation) {
            return MakeExecuteCommandRequest(correlation, name, parameters);
        },
        ForResult<VCommandReply>(std::move(handler)));
}

std::future<VCommandReply> VAsyncClient::ExecuteCommand(const std::string& name,
                                                        const VParameters& parameters)
{
    return AsFuture<VCommandReply>([&](Handler<VCommandReply> handler) {
        ExecuteCommand(name, parameters, std::move(handler));
    });
}

void VAsyncClient::GetServerInformation(Handler<VServerInformation> handler)
{
    core->Post(
        EMessageKind::ServerInformation, std::string(),
        [](const std::string&) { return MakeServerInformationRequest(); },
        ForResult<VServerInformation>(std::move(handler)));
}

std::future<VServerInformation> VAsyncClient::GetServerInformation()
{
    return AsFuture<VServerInformation>(
        [&](Handler<VServerInformation> handler) { GetServerInformation(std::move(handler)); });
}

void VAsyncClient::GetCommands(Handler<Names> handler)
{
    core->Post(EMessageKind::Commands, std::string(), &MakeCommandsRequest,
               ForResult<Names>(std::move(handler)));
}

std::future<Names> VAsyncClient::GetCommands()
{
    return AsFuture<Names>([&](Handler<Names> handler) { GetCommands(std::move(handler)); });
}

void VAsyncClient::GetCommandInformation(const std::string& name,
                                         Handler<VCommandInformation> handler)
{
    core->Post(
        EMessageKind::CommandInformation, name,
        [&](const std::string& correlation) {
            return MakeCommandInformationRequest(correlation, name);
        },
        ForResult<VCommandInformation>(std::move(handler)));
}

std::future<VCommandInformation> VAsyncClient::GetCommandInformation(const std::string& name)
{
    return AsFuture<VCommandInformation>([&](Handler<VCommandInformation> handler) {
        GetCommandInformation(name, std::move(handler));
    });
}

void VAsyncClient::GetEvents(Handler<Names> handler)
{
    core->Post(
        EMessageKind::Events, std::string(), [](const std::string&) { return MakeEventsRequest(); },
        ForResult<Names>(std::move(handler)));
}

std::future<Names> VAsyncClient::GetEvents()
{
    return AsFuture<Names>([&](Handler<Names> handler) { GetEvents(std::move(handler)); });
}

void VAsyncClient::GetEventInformation(const std::string& name, Handler<VEventInformation> handler)
{
    core->Post(
        EMessageKind::EventInformation, name,
        [&](const std::string&) { return MakeEventInformationRequest(name); },
        ForResult<VEventInformation>(std::move(handler)));
}

std::future<VEventInformation> VAsyncClient::GetEventInformation(const std::string& name)
{
    return AsFuture<VEventInformation>(
        [&](Handler<VEventInformation> handler) { GetEventInformation(name, std::move(handler)); });
}

} // namespace ControlStream
