#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/IEventInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IResult.h"

#include <string>
#include <vector>

namespace ControlSystem {

/// A set of named events that a provider publishes through IControlSystem::FireEvent.
///
/// Threads: every operation may be called on any thread.
class IEventProvider
{
public:
    /// Appends the provider's event names in its fixed order, without clearing the list.
    virtual void GetEventNames(std::vector<std::wstring>& names) = 0;

    /// Returns the information record of the provider's events; every provider of the plug-in
    /// returns the empty record, which is what a device then receives.
    virtual IEventInformation GetEventInformation() = 0;

    /// Returns code 1 and has no other effect in every provider of the plug-in; a host may call it.
    virtual IResult CheckEvent() = 0;

    virtual ~IEventProvider() = default;
};

} // namespace ControlSystem
