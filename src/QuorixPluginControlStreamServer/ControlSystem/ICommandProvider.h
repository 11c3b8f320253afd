#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/ICommandInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IParameters.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IResult.h"

#include <string>
#include <vector>

namespace ControlSystem {

/// A set of named commands that a device can run. Names are compared exactly, with case.
///
/// Threads: every operation may be called on any thread, also on several at once. Failure: bad
/// input is answered by a result code, never by an exception.
class ICommandProvider
{
public:
    /// Appends the provider's command names in its fixed order, without clearing the list.
    virtual void GetCommandNames(std::vector<std::wstring>& names) = 0;

    /// Returns the description of `name`, or a fresh record where the provider does not know it.
    virtual ICommandInformation GetCommandInformation(const std::wstring& name) = 0;

    /// Runs a command to its end and fills `reply`, which a device sees only if the code is 1.
    ///
    /// @return code 2, with nothing changed, for a name that the provider does not list
    virtual IResult ExecuteCommand(const std::wstring& name, const IParameters& input,
                                   IParameters& reply) = 0;

    virtual ~ICommandProvider() = default;
};

} // namespace ControlSystem
