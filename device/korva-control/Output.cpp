#include "korva-control/Output.h"

#include "korva-control/TerminalText.h"

#include <cstdio>
#include <stdexcept>

#include <unistd.h>

namespace {

void Write(const std::string& line)
{
    if (std::fwrite(line.data(), 1, line.size(), stdout) != line.size() ||
        std::fputc('\n', stdout) == EOF || std::fflush(stdout) != 0) {
        throw std::runtime_error("standard output cannot be written");
    }
}

std::string JsonText(const VJson& object)
{
    return object.dump(-1, ' ', false, VJson::error_handler_t::replace);
}

void WriteError(const std::string& line)
{
    std::fputs((line + "\n").c_str(), stderr);
}

std::string OwnLine(const std::string& text)
{
    return "korva-control: " + ForTerminal(text);
}

} // namespace

void VOutput::PrintLine(const std::string& line)
{
    Write(line);
}

void VOutput::PrintJson(const VJson& object)
{
    Write(JsonText(object));
}

void VOutput::PrintRaw(const std::string& bytes)
{
    Write(isatty(STDOUT_FILENO) != 0 ? LinesForTerminal(bytes) : bytes);
}

void VOutput::PrintNotice(const std::string& text) const
{
    WriteError(json ? JsonText({{"notice", text}}) : OwnLine(text));
}

void VOutput::PrintWarning(const std::string& text) const
{
    WriteError(json ? JsonText({{"warning", text}}) : OwnLine("warning: " + text));
}

void VOutput::PrintFailure(const std::string& text, std::optional<EExitCode> exitCode) const
{
    if (!json) {
        WriteError(OwnLine(text));
        return;
    }
    VJson object = {{"error", text}};
    if (exitCode) {
        object["exitCode"] = static_cast<int>(*exitCode);
    }
    WriteError(JsonText(object));
}

VJson ToJson(const ControlStream::VParameters& parameters)
{
    VJson object = VJson::object();
    for (const ControlStream::VParameter& parameter : parameters) {
        object[parameter.Name] = parameter.Value;
    }
    return object;
}

VJson ToJson(const std::vector<ControlStream::VParameterInformation>& parameters)
{
    VJson list = VJson::array();
    for (const ControlStream::VParameterInformation& parameter : parameters) {
        list.push_back({{"name", parameter.Name}, {"description", parameter.Description}});
    }
    return list;
}
