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
    const std::shared_ptr<IControlSystem>& dispatcher,
    std::shared_ptr<IControlAuthorization> controlAuthorization)
    : VEventProvider(dispatcher.get()), authorization(std::move(controlAuthorization))
{
    // Weakly, as a strong reference in its own list would keep the authorization for ever. The
    // dispatcher holds the providers, and so does the same to it; but a step that is still running
    // may keep the authorization for longer than the host keeps the dispatcher.
    const std::weak_ptr<IControlAuthorization> target = authorization;
    const std::weak_ptr<IControlSystem> publisher = dispatcher;
    authorization->GetAuthorizedCallback().Add(boost::bind(
        &VEventProviderAuthorized::PublishOutcome, publisher, target, boost::placeholders::_1));
    authorization->GetDisconnectedCallback().Add(
        boost::bind(&VEventProviderAuthorized::PublishDisconnect, publisher));
}

void VEventProviderAuthorized::GetEventNames(std::vector<std::wstring>& names)
{
    names.emplace_back(authorizeEvent);
    names.emplace_back(disconnectEvent);
}

void VEventProviderAuthorized::PublishOutcome(const std::weak_ptr<IControlSystem>& dispatcher,
                                              const std::weak_ptr<IControlAuthorization>& target,
                                              bool authorized)
{
    // Deliberate: nothing tells which device is meant. The one that waits knows by its waiting.
    ControlSystem::IParameters parameters;
    parameters.Set(L"Status", authorized ? L"Authorized" : L"Failed");
    const std::shared_ptr<IControlAuthorization> present = target.lock();
    parameters.Set(L"ServerName",
                   present ? KVR::Utf8ToWide(present->GetServerName()) : std::wstring());
    PublishOn(dispatcher.lock().get(), authorizeEvent, parameters);
}

void VEventProviderAuthorized::PublishDisconnect(const std::weak_ptr<IControlSystem>& dispatcher)
{
    // The authorization is half gone by now, and is not asked for anything.
    PublishOn(dispatcher.lock().get(), disconnectEvent, {});
}
