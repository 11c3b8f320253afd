#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/IParameterInformation.h"

#include <string>
#include <vector>

namespace ControlSystem {

/// Describes one command. A fresh record is the answer for a name that nobody knows.
struct ICommandInformation
{
    std::wstring Name;
    // Deliberate: an unknown command is answered with this text in a well-formed reply and no
    // error. Devices look for it there.
    std::wstring Description = L"Command not found.";
    std::vector<IParameterInformation> InputParameters;
    std::vector<IParameterInformation> ReplyParameters;
};

} // namespace ControlSystem
