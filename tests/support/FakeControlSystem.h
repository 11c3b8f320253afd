#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "notification/MultiCallback.h"

#include <map>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace TestSupport {

/// A dispatcher for tests: its lists and records are what the test puts there, and each command is
/// a function of the test.
///
/// Threads: the public fields are set before the dispatcher is used; operations [any].
class VFakeControlSystem : public IControlSystem
{
public:
    using Success = boost::function<void(const ControlSystem::IParameters&)>;
    using Failure = boost::function<void(ControlSystem::IResult)>;
    using Command = boost::function<void(const ControlSystem::IParameters&, Success, Failure)>;

    /// A command as it arrived.
    struct VExecuted
    {
        std::wstring Name;
        std::vector<std::pair<std::wstring, std::wstring>> Parameters;

        bool operator==(const VExecuted& other) const
        {
            return Name == other.Name && Parameters == other.Parameters;
        }
    };

    std::vector<std::wstring> CommandNames;
    std::vector<std::wstring> EventNames;
    std::map<std::wstring, ControlSystem::ICommandInformation> CommandInformation;
    std::map<std::wstring, ControlSystem::IEventInformation> EventInformation;
    std::map<std::wstring, Command> Commands; ///< an unknown name fails with code 2

    /// A command that answers with its own input.
    static void Echo(const ControlSystem::IParameters& input, const Success& success,
                     const Failure& /*failure*/)
    {
        success(input);
    }

    /// Returns a command that fails with `code`.
    static Command FailWith(std::int32_t code)
    {
        return [code](const ControlSystem::IParameters&, const Success&, const Failure& failure) {
            ControlSystem::IResult result;
            result.Code = code;
            failure(result);
        };
    }

    /// Returns every command that was run, in order.
    std::vector<VExecuted> Executed() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return executed;
    }

    /// Returns the further arguments of the list operations, in order of the calls.
    std::vector<int> ListArguments() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return listArguments;
    }

    void AddCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        commandProviders.push_back(std::move(provider));
    }

    void RemoveCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        Remove(commandProviders, provider);
    }

    std::vector<std::wstring> GetCommandList(int reserved) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        listArguments.push_back(reserved);
        return CommandNames;
    }

    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override
    {
        const auto found = CommandInformation.find(name);
        return found != CommandInformation.end() ? found->second
                                                 : ControlSystem::ICommandInformation();
    }

    void ExecuteCommand(const std::wstring& name, const ControlSystem::IParameters& input,
                        Success success, Failure failure) override
    {
        {
            const std::lock_guard<std::mutex> lock(mutex);
            executed.push_back({name, {input.begin(), input.end()}});
        }
        const auto found = Commands.find(name);
        if (found != Commands.end()) {
            found->second(input, std::move(success), std::move(failure));
        } else {
            ControlSystem::IResult unknown;
            unknown.Code = 2;
            failure(unknown);
        }
    }

    void AddEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        eventProviders.push_back(std::move(provider));
    }

    void RemoveEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        Remove(eventProviders, provider);
    }

    std::vector<std::wstring> GetEventList(int reserved) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        listArguments.push_back(reserved);
        return EventNames;
    }

    ControlSystem::IEventInformation GetEventInformation(const std::wstring& name) override
    {
        const auto found = EventInformation.find(name);
        return found != EventInformation.end() ? found->second : ControlSystem::IEventInformation();
    }

    EventNotification& GetEventNotification() override { return notification; }

    ControlSystem::IResult FireEvent(const std::wstring& name,
                                     const ControlSystem::IParameters& parameters) override
    {
        notification(name, parameters);
        ControlSystem::IResult done;
        done.Code = 1;
        return done;
    }

    /// The providers that are registered now, in order.
    std::vector<std::shared_ptr<ControlSystem::ICommandProvider>> CommandProviders() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return commandProviders;
    }

    std::vector<std::shared_ptr<ControlSystem::IEventProvider>> EventProviders() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return eventProviders;
    }

private:
    template <typename Provider>
    static void Remove(std::vector<std::shared_ptr<Provider>>& providers,
                       const std::shared_ptr<Provider>& removed)
    {
        for (auto provider = providers.begin(); provider != providers.end(); ++provider) {
            if (*provider == removed) {
                providers.erase(provider);
                return;
            }
        }
    }

    mutable std::mutex mutex; // guards the fields below
    std::vector<VExecuted> executed;
    std::vector<int> listArguments;
    std::vector<std::shared_ptr<ControlSystem::ICommandProvider>> commandProviders;
    std::vector<std::shared_ptr<ControlSystem::IEventProvider>> eventProviders;

    NotificationSystem::VMultiCallback<void(const std::wstring&, const ControlSystem::IParameters&)>
        notification;
};

} // namespace TestSupport
