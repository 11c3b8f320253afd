#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderAuthorization.h"

#include "DebugServices/Clock.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlBeat.h"
#include "QuorixPluginControlStreamServer/Authorization/IControlAuthorization.h"
#include "utils/WideText.h"

#include <boost/bind/bind.hpp>

#include <utility>

namespace {

constexpr wchar_t authorizeCommand[] = L"System.Authorize";
constexpr wchar_t cancelCommand[] = L"System.Authorize.Cancel";
constexpr wchar_t heartbeatCommand[] = L"System.Heartbeat";

// The version of this protocol, which nothing else stands for.
constexpr wchar_t serverVersion[] = L"300";

constexpr std::int32_t success = 1;
constexpr std::int32_t unknownCommand = 2;

void NoteBeat(const std::shared_ptr<std::atomic<std::int64_t>>& lastBeat,
              const VCommandProviderAuthorization::Clock& clock, bool authorized)
{
    if (authorized) {
        *lastBeat = clock();
    }
}

} // namespace

VCommandProviderAuthorization::VCommandProviderAuthorization(
    std::shared_ptr<IControlAuthorization> controlAuthorization, Clock time)
    : authorization(std::move(controlAuthorization)),
      clock(time.empty() ? Clock(&DebugServices::SystemMilliseconds) : std::move(time)),
      lastBeat(std::make_shared<std::atomic<std::int64_t>>(0))
{
    // By value: it is never removed, and may run after this object has gone.
    authorization->GetAuthorizedCallback().Add(
        boost::bind(&NoteBeat, lastBeat, clock, boost::placeholders::_1));
}

void VCommandProviderAuthorization::GetCommandNames(std::vector<std::wstring>& names)
{
    names.emplace_back(authorizeCommand);
    names.emplace_back(cancelCommand);
    names.emplace_back(heartbeatCommand);
}

ControlSystem::ICommandInformation
VCommandProviderAuthorization::GetCommandInformation(const std::wstring& /*name*/)
{
    // Deliberate: "Command not found." for the three commands too. Devices know them from the
    // protocol, and expect this answer.
    return {};
}

ControlSystem::IResult
VCommandProviderAuthorization::ExecuteCommand(const std::wstring& name,
                                              const ControlSystem::IParameters& input,
                                              ControlSystem::IParameters& reply)
{
    if (name == authorizeCommand) {
        Authorize(input, reply);
        return {success};
    }
    if (name == cancelCommand) {
        // Deliberate: what was done is answered as an unknown command, below. Devices take that
        // answer for granted.
        authorization->CancelAuthorize(KVR::WideToUtf8(input.Get(L"DeviceId")));
    }
    if (name == heartbeatCommand) {
        Heartbeat(input, reply);
        return {success};
    }
    reply.Set(L"Status", L"Unknown Command");
    return {unknownCommand};
}

void VCommandProviderAuthorization::Authorize(const ControlSystem::IParameters& input,
                                              ControlSystem::IParameters& reply)
{
    const std::string deviceId = KVR::WideToUtf8(input.Get(L"DeviceId"));
    const std::string deviceName = KVR::WideToUtf8(input.Get(L"DeviceName"));
    const std::wstring serverName = ServerName(input);

    reply.Set(L"Status", IsConnectionTaken(deviceId) ? L"Connected"
                                                     : AskForAuthorization(deviceId, deviceName));
    reply.Set(L"ServerName", serverName);
    reply.Set(L"ServerVersion", serverVersion);
}

std::wstring
VCommandProviderAuthorization::ServerName(const ControlSystem::IParameters& input) const
{
    // Deliberate: a name that the device gives comes back as it is, whatever this host is called.
    const std::wstring given = input.Get(L"ServerName");
    return given.empty() ? KVR::Utf8ToWide(authorization->GetServerName()) : given;
}

bool VCommandProviderAuthorization::IsConnectionTaken(const std::string& deviceId) const
{
    if (ControlBeat::IsFresh(clock(), *lastBeat) &&
        authorization->GetCurrentDeviceId() != deviceId) {
        return true;
    }
    return authorization->IsRequestPending();
}

std::wstring VCommandProviderAuthorization::AskForAuthorization(const std::string& deviceId,
                                                                const std::string& deviceName)
{
    switch (authorization->Authorize(deviceId, deviceName)) {
    case EAuthorizeAnswer::Allowed:
        *lastBeat = clock();
        return L"Authorized";
    case EAuthorizeAnswer::Refused:
        return L"Failed";
    case EAuthorizeAnswer::Pending:
        break;
    }
    return L"Pending";
}

void VCommandProviderAuthorization::Heartbeat(const ControlSystem::IParameters& input,
                                              ControlSystem::IParameters& reply)
{
    reply.Set(L"BeatId", input.Get(L"BeatId"));
    *lastBeat = clock();
    authorization->Heartbeat();
}
