#pragma once

#include "device/ChildProgram.h"
#include "device/ScriptedHost.h"

#include <string>
#include <vector>

/// Puts the options that lead to a scripted host before a command.
inline std::vector<std::string> At(const VScriptedHost& host,
                                   const std::vector<std::string>& command)
{
    std::vector<std::string> arguments{"--port", std::to_string(host.Port()), "--timeout", "60"};
    arguments.insert(arguments.end(), command.begin(), command.end());
    return arguments;
}
