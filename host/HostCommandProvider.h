#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/ICommandProvider.h"

#include <boost/function.hpp>

#include <cstdint>
#include <string>
#include <vector>

namespace QuorixHost {

/// The host's own commands: Host.Information and Host.Echo.
///
/// Threads: every operation [any]; nothing changes after construction.
class VHostCommandProvider : public ControlSystem::ICommandProvider
{
public:
    /// @param cameraNumbers  gives the numbers of the cameras that exist, in order; called on the
    /// thread of each Host.Information
    explicit VHostCommandProvider(boost::function<std::vector<std::uint32_t>()> cameraNumbers);

    void GetCommandNames(std::vector<std::wstring>& names) override;
    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override;
    ControlSystem::IResult ExecuteCommand(const std::wstring& name,
                                          const ControlSystem::IParameters& input,
                                          ControlSystem::IParameters& reply) override;

private:
    void Inform(ControlSystem::IParameters& reply) const;

    boost::function<std::vector<std::uint32_t>()> cameraNumbers;
};

} // namespace QuorixHost
