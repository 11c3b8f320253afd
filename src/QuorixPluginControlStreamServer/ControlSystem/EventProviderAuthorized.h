#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/EventProvider.h"

#include <memory>
#include <string>
#include <vector>

class IControlAuthorization;

/// Tells all devices how a request ended, and that the host goes away.
///
/// The functions that it leaves with the authorization are never removed and outlive it: the
/// authorization is the last to go, and tells of that. They hold both weakly, as either may be gone
/// by then.
///
/// Owns: a shared reference to the authorization, never null.
/// Threads: events are published on the thread that delivers an outcome.
class VEventProviderAuthorized : public VEventProvider
{
public:
    VEventProviderAuthorized(const std::shared_ptr<IControlSystem>& dispatcher,
                             std::shared_ptr<IControlAuthorization> controlAuthorization);

    void GetEventNames(std::vector<std::wstring>& names) override;

private:
    static void PublishOutcome(const std::weak_ptr<IControlSystem>& dispatcher,
                               const std::weak_ptr<IControlAuthorization>& target, bool authorized);
    static void PublishDisconnect(const std::weak_ptr<IControlSystem>& dispatcher);

    const std::shared_ptr<IControlAuthorization> authorization;
};
