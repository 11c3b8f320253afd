#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/IParameterInformation.h"

#include <string>
#include <vector>

namespace ControlSystem {

/// Describes one event. A fresh record is wholly empty.
struct IEventInformation
{
    std::wstring Name;
    std::wstring Description;
    std::vector<IParameterInformation> Parameters;
};

} // namespace ControlSystem
