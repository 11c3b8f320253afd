#pragma once

#include "ProviderList.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "notification/MultiCallback.h"
#include "notification/MultiCallbackPostal.h"

#include <memory>
#include <string>
#include <vector>

namespace QuorixHost {

/// The dispatcher: hands a command to the first provider that lists it, and an event to all who
/// listen.
///
/// Owns: references to the registered providers, and the event notification.
/// Threads: every operation [any]. Providers and listeners run on the caller's thread with no lock
/// held. Failure: an exception of a provider is logged and becomes code 0 for a command and an
/// empty answer for a question; an exception of a listener leaves FireEvent.
class VControlSystem : public IControlSystem
{
public:
    /// Registers a provider behind those that are there; an empty pointer is ignored. It is asked
    /// for its names here and never again, since a provider's list is fixed.
    void AddCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) override;

    /// Takes back one registration; an unknown provider is ignored. A command that it is running
    /// goes on to its end.
    void RemoveCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) override;

    std::vector<std::wstring> GetCommandList(int reserved) override;
    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override;

    /// Runs the command to its end, then calls one of the two functions, all on this thread. What
    /// they throw passes through.
    void ExecuteCommand(const std::wstring& name, const ControlSystem::IParameters& input,
                        boost::function<void(const ControlSystem::IParameters&)> success,
                        boost::function<void(ControlSystem::IResult)> failure) override;

    void AddEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) override;
    void RemoveEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) override;
    std::vector<std::wstring> GetEventList(int reserved) override;

    /// Returns the record of the provider that lists the event, a fresh one where none does.
    ControlSystem::IEventInformation GetEventInformation(const std::wstring& name) override;

    EventNotification& GetEventNotification() override;

    /// Calls every listener before it returns. @return always code 1
    ControlSystem::IResult FireEvent(const std::wstring& name,
                                     const ControlSystem::IParameters& parameters) override;

    /// Fires with a command's name after it has run, on its thread and before its reply is known.
    /// What a function throws is logged.
    KVR::IMultiCallback<void(const std::wstring&)>& GetCommandNotification();

private:
    ControlSystem::IResult RunCommand(const std::wstring& name,
                                      const ControlSystem::IParameters& input,
                                      ControlSystem::IParameters& reply);

    VProviderList<ControlSystem::ICommandProvider> commandProviders;
    VProviderList<ControlSystem::IEventProvider> eventProviders;
    NotificationSystem::VMultiCallback<void(const std::wstring&)> commandNotification;
    NotificationSystem::VMultiCallbackPostal<void(const std::wstring&,
                                                  const ControlSystem::IParameters&)>
        eventNotification; // no default service: listeners run on the thread that fires
};

} // namespace QuorixHost
