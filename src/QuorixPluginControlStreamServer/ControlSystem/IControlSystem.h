#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/ICommandInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/ICommandProvider.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IEventInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IEventProvider.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IParameters.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IResult.h"
#include "notification/IMultiCallback.h"

#include <boost/function.hpp>

#include <memory>
#include <string>
#include <vector>

/// The host's dispatcher, in which the wire server and the providers meet.
///
/// Supplied by the host, which keeps it alive for as long as the plug-in lives.
/// Threads: every operation may be called on any thread.
class IControlSystem
{
public:
    /// Called on the thread that publishes an event, with its name and content.
    using EventNotification =
        KVR::IMultiCallback<void(const std::wstring&, const ControlSystem::IParameters&)>;

    virtual void AddCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) = 0;
    virtual void
    RemoveCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) = 0;

    /// Returns the names of all registered commands.
    ///
    /// @param reserved  the host's own; the server always passes 0
    virtual std::vector<std::wstring> GetCommandList(int reserved) = 0;

    /// Returns the record of `name`, or a fresh one ("Command not found.") where no provider has
    /// it.
    virtual ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) = 0;

    /// Runs a command and calls exactly one of the two functions, on any thread, now or later.
    virtual void ExecuteCommand(const std::wstring& name, const ControlSystem::IParameters& input,
                                boost::function<void(const ControlSystem::IParameters&)> success,
                                boost::function<void(ControlSystem::IResult)> failure) = 0;

    virtual void AddEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) = 0;
    virtual void RemoveEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) = 0;

    /// Returns the names of all events of the registered providers.
    ///
    /// @param reserved  the host's own; the server always passes 0
    virtual std::vector<std::wstring> GetEventList(int reserved) = 0;

    virtual ControlSystem::IEventInformation GetEventInformation(const std::wstring& name) = 0;

    /// Returns the list on which the server registers for every event.
    virtual EventNotification& GetEventNotification() = 0;

    /// Publishes an event to everybody registered on the event notification.
    virtual ControlSystem::IResult FireEvent(const std::wstring& name,
                                             const ControlSystem::IParameters& parameters) = 0;

    virtual ~IControlSystem() = default;
};
