#include "ConsoleCommands.h"

#include "Console.h"
#include "DebugServices/Clock.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "utils/WideText.h"

#include <charconv>
#include <cstdint>
#include <string>
#include <utility>

namespace QuorixHost {
namespace {

std::uint32_t TakeAdvance(VConsoleLine& line)
{
    const std::string word = line.TakeWord("a time such as +3500");
    std::uint32_t milliseconds = 0;
    const char* const end = word.data() + word.size();
    if (word.size() < 2 || word[0] != '+') {
        throw VConsoleError("'" + word + "' is no time such as +3500");
    }
    const auto result = std::from_chars(word.data() + 1, end, milliseconds);
    if (result.ec != std::errc() || result.ptr != end) {
        throw VConsoleError("'" + word + "' is no number of milliseconds of 32 bits");
    }
    return milliseconds;
}

} // namespace

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

void AddClockCommand(VConsole& console)
{
    console.AddCommand("clock", [](VConsoleLine& line) {
        const std::uint32_t milliseconds = TakeAdvance(line);
        line.ExpectEnd();
        DebugServices::AdvanceClock(milliseconds);
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
