#pragma once

#include <string>

namespace ControlSystem {

/// Describes one parameter of a command or an event, for people.
struct IParameterInformation
{
    std::wstring Name;        ///< as it stands in IParameters
    std::wstring Description; ///< a text for people
};

} // namespace ControlSystem
