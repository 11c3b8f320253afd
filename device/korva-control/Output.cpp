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

} // namespace

void VOutput::PrintLine(const std::string& line)
{
    Write(line);
}

void VOutput::PrintJson(const VJson& object)
{
    Write(object.dump(-1, ' ', false, VJson::error_handler_t::replace));
}

void VOutput::PrintRaw(const std::string& bytes)
{
    Write(isatty(STDOUT_FILENO) != 0 ? LinesForTerminal(bytes) : bytes);
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
