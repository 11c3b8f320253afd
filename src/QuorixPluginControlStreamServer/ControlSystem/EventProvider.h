#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IEventProvider.h"

#include <string>

/// What every event provider of the plug-in has in common.
///
/// Holds the dispatcher by a plain pointer, since the host keeps it alive for as long as the
/// plug-in lives; it may be null, and then nothing is published.
class VEventProvider : public ControlSystem::IEventProvider
{
public:
    explicit VEventProvider(IControlSystem* dispatcher) : controlSystem(dispatcher) {}

    // Deliberate: the record is empty for every event, also for one that exists, and that is what a
    // device receives. What the events hold is told to device makers, not to devices.
    ControlSystem::IEventInformation GetEventInformation() override { return {}; }

    ControlSystem::IResult CheckEvent() override { return {1}; }

protected:
    /// Publishes an event on the calling thread; whether anybody listens is not asked.
    void Publish(const std::wstring& name, const ControlSystem::IParameters& parameters) const
    {
        PublishOn(controlSystem, name, parameters);
    }

    /// The same for a function that may outlive its provider, with a dispatcher that may be null.
    static void PublishOn(IControlSystem* dispatcher, const std::wstring& name,
                          const ControlSystem::IParameters& parameters)
    {
        if (dispatcher != nullptr) {
            (void)dispatcher->FireEvent(name, parameters); // nobody could act on the result
        }
    }

private:
    IControlSystem* const controlSystem;
};
