#include "ConsoleCommands.h"

#include "Console.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "utils/WideText.h"

#include <string>
#include <utility>

namespace QuorixHost {

void AddEventCommands(VConsole& console, const std::shared_ptr<IControlSystem>& controlSystem)
{
    console.AddCommand("fire", [controlSystem](VConsoleLine& line) {
        const std::wstring name = KVR::Utf8ToWide(line.TakeWord("the event's name"));
        if (name.empty()) {
            throw VConsoleError("the event's name is empty");
        }
        ControlSystem::IParameters parameters;
        while (const auto assignment = line.TakeAssignment()) {
            parameters.Set(KVR::Utf8ToWide(assignment->first), KVR::Utf8ToWide(assignment->second));
        }
        controlSystem->FireEvent(name, parameters);
        return std::string();
    });
}

void AddStopCommand(VConsole& console, boost::function<void()> requestStop)
{
    console.AddCommand("quit", [requestStop = std::move(requestStop)](VConsoleLine& line) {
        line.ExpectEnd();
        requestStop();
        return std::string();
    });
}

} // namespace QuorixHost
