#include "ControlSystem.h"

#include "utils/LogStatement.h"
#include "utils/WideText.h"

#include <exception>

namespace QuorixHost {
namespace {

constexpr std::int32_t resultSystemError = 0;
constexpr std::int32_t resultOk = 1;
constexpr std::int32_t resultUnknownCommand = 2;

/// Calls a provider, and logs an exception of it instead of passing it on: the caller is a thread
/// that serves others too.
///
/// @return false when it threw
template <typename TCall>
bool CallGuarded(const char* what, TCall&& call)
{
    try {
        call();
        return true;
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 2, "A provider failed on %1%: %2%", what, exception.what());
    } catch (...) {
        KVR_LOG("Host", 2, "A provider failed on %1% with an unknown exception", what);
    }
    return false;
}

} // namespace

void VControlSystem::AddCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider)
{
    if (!provider) {
        return;
    }
    std::vector<std::wstring> names;
    CallGuarded("its command names", [&] { provider->GetCommandNames(names); });
    commandProviders.Add(std::move(provider), std::move(names));
}

void VControlSystem::RemoveCommandProvider(
    std::shared_ptr<ControlSystem::ICommandProvider> provider)
{
    commandProviders.Remove(provider);
}

std::vector<std::wstring> VControlSystem::GetCommandList(int /*reserved*/)
{
    return commandProviders.Names();
}

ControlSystem::ICommandInformation VControlSystem::GetCommandInformation(const std::wstring& name)
{
    ControlSystem::ICommandInformation information;
    if (const auto provider = commandProviders.Find(name)) {
        CallGuarded("a command's information",
                    [&] { information = provider->GetCommandInformation(name); });
    }
    return information;
}

void VControlSystem::ExecuteCommand(
    const std::wstring& name, const ControlSystem::IParameters& input,
    boost::function<void(const ControlSystem::IParameters&)> success,
    boost::function<void(ControlSystem::IResult)> failure)
{
    ControlSystem::IParameters reply;
    const ControlSystem::IResult result = RunCommand(name, input, reply);
    CallGuarded("the notification of commands", [&] { commandNotification(name); });
    if (result.Code == resultOk) {
        success(reply);
    } else {
        failure(result);
    }
}

ControlSystem::IResult VControlSystem::RunCommand(const std::wstring& name,
                                                  const ControlSystem::IParameters& input,
                                                  ControlSystem::IParameters& reply)
{
    ControlSystem::IResult result;
    const auto provider = commandProviders.Find(name);
    if (!provider) {
        result.Code = resultUnknownCommand;
        return result;
    }
    if (!CallGuarded("a command", [&] { result = provider->ExecuteCommand(name, input, reply); })) {
        result.Code = resultSystemError;
    }
    return result;
}

KVR::IMultiCallback<void(const std::wstring&)>& VControlSystem::GetCommandNotification()
{
    return commandNotification;
}

void VControlSystem::AddEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider)
{
    if (!provider) {
        return;
    }
    std::vector<std::wstring> names;
    CallGuarded("its event names", [&] { provider->GetEventNames(names); });
    eventProviders.Add(std::move(provider), std::move(names));
}

void VControlSystem::RemoveEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider)
{
    eventProviders.Remove(provider);
}

std::vector<std::wstring> VControlSystem::GetEventList(int /*reserved*/)
{
    return eventProviders.Names();
}

ControlSystem::IEventInformation VControlSystem::GetEventInformation(const std::wstring& name)
{
    ControlSystem::IEventInformation information;
    if (const auto provider = eventProviders.Find(name)) {
        CallGuarded("an event's information",
                    [&] { information = provider->GetEventInformation(); });
    }
    return information;
}

IControlSystem::EventNotification& VControlSystem::GetEventNotification()
{
    return eventNotification;
}

ControlSystem::IResult VControlSystem::FireEvent(const std::wstring& name,
                                                 const ControlSystem::IParameters& parameters)
{
    eventNotification(name, parameters);

    ControlSystem::IResult result;
    result.Code = resultOk;
    return result;
}

} // namespace QuorixHost
