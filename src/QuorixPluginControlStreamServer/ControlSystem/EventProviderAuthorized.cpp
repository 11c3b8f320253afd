#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderAuthorized.h"

#include "QuorixPluginControlStreamServer/Authorization/IControlAuthorization.h"
#include "utils/WideText.h"

#include <boost/bind/bind.hpp>

#include <utility>

namespace {

constexpr wchar_t authorizeEvent[] = L"Event.Authorize";
constexpr wchar_t disconnectEvent[] = L"Event.Disconnect";

} // namespace

VEventProviderAuthorized::VEventProviderAuthorized(
    IControlSystem* dispatcher, std::shared_ptr<IControlAuthorization> controlAuthorization)
    : VEventProvider(dispatcher), authorization(std::move(controlAuthorization))
{
    // Weakly, as a strong reference in its own list would keep the authorization for ever.
    const std::weak_ptr<IControlAuthorization> target = authorization;
    authorization->GetAuthorizedCallback().Add(boost::bind(
        &VEventProviderAuthorized::PublishOutcome, dispatcher, target, boost::placeholders::_1));
    authorization->GetDisconnectedCallback().Add(
        boost::bind(&VEventProviderAuthorized::PublishDisconnect, dispatcher));
}

void VEventProviderAuthorized::GetEventNames(std::vector<std::wstring>& names)
{
    names.emplace_back(authorizeEvent);
    names.emplace_back(disconnectEvent);
}

void VEventProviderAuthorized::PublishOutcome(IControlSystem* dispatcher,
                                              const std::weak_ptr<IControlAuthorization>& target,
                                              bool authorized)
{
    // Deliberate: nothing tells which device is meant. The one that waits knows by its waiting.
    ControlSystem::IParameters parameters;
    parameters.Set(L"Status", authorized ? L"Authorized" : L"Failed");
    const std::shared_ptr<IControlAuthorization> present = target.lock();
    parameters.Set(L"ServerName",
                   present ? KVR::Utf8ToWide(present->GetServerName()) : std::wstring());
    PublishOn(dispatcher, authorizeEvent, parameters);
}

void VEventProviderAuthorized::PublishDisconnect(IControlSystem* dispatcher)
{
    // The authorization is half gone by now, and is not asked for anything.
    PublishOn(dispatcher, disconnectEvent, {});
}
