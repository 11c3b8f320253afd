#include "Console.h"

#include "utils/WideText.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <exception>
#include <utility>

namespace QuorixHost {
namespace {

/// Decoding replaces what is ill-formed, so only well-formed text survives the way there and back.
bool IsUtf8(const std::string& text)
{
    return KVR::WideToUtf8(KVR::Utf8ToWide(text)) == text;
}

bool IsControl(unsigned char c)
{
    constexpr unsigned char firstPrintable = 0x20;
    return c < firstPrintable && c != '\t';
}

/// Makes one line of a reason that may quote anything.
std::string OneLine(std::string text)
{
    std::replace_if(text.begin(), text.end(), &IsControl, ' ');
    return text;
}

} // namespace

VConsole::VConsole()
{
    AddCommand("state", [this](VConsoleLine& line) {
        line.ExpectEnd();
        return DescribeState();
    });
}

void VConsole::AddCommand(const std::string& name, Command command)
{
    commands[name] = std::move(command);
}

void VConsole::AddStatePart(StatePart part)
{
    stateParts.push_back(std::move(part));
}

std::string VConsole::Answer(const std::string& line)
{
    try {
        const std::string json = Run(line);
        return json.empty() ? "ok" : "ok " + json;
    } catch (const std::exception& exception) {
        return "error: " + OneLine(exception.what());
    } catch (...) {
        return "error: the command failed for an unknown reason";
    }
}

std::string VConsole::Run(const std::string& line)
{
    if (std::any_of(line.begin(), line.end(), &IsControl)) {
        throw VConsoleError("the line holds a control character");
    }
    if (!IsUtf8(line)) {
        throw VConsoleError("the line is not valid UTF-8");
    }

    VConsoleLine words(line);
    const std::string name = words.TakeWord("a command");
    const auto found = commands.find(name);
    if (found == commands.end()) {
        throw VConsoleError("unknown command '" + name + "'");
    }
    return found->second(words);
}

std::string VConsole::DescribeState() const
{
    nlohmann::json state = nlohmann::json::object();
    for (const StatePart& part : stateParts) {
        part(state);
    }
    // Names come from devices: what is no valid text is replaced rather than thrown upon.
    return state.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
}

} // namespace QuorixHost
