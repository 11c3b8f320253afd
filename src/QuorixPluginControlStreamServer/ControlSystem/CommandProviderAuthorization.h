#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/ICommandProvider.h"

#include <boost/function.hpp>

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

class IControlAuthorization;

/// The commands by which a device asks to be let in and keeps its place.
///
/// Decides nothing but who may start a request at all: while the last beat is fresh, only the
/// device that holds the connection. Whose beat it was is not looked at.
///
/// Owns: a shared reference to the authorization, never null.
/// Threads: as ICommandProvider tells; the time of the last beat is an atomic number, which the
/// function that this class leaves with the authorization shares with it.
class VCommandProviderAuthorization : public ControlSystem::ICommandProvider
{
public:
    using Clock = boost::function<std::int64_t()>; ///< milliseconds since the epoch

    /// @param clock  for tests; empty means the process's
    explicit VCommandProviderAuthorization(
        std::shared_ptr<IControlAuthorization> controlAuthorization, Clock clock = Clock());

    void GetCommandNames(std::vector<std::wstring>& names) override;
    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override;
    ControlSystem::IResult ExecuteCommand(const std::wstring& name,
                                          const ControlSystem::IParameters& input,
                                          ControlSystem::IParameters& reply) override;

private:
    void Authorize(const ControlSystem::IParameters& input, ControlSystem::IParameters& reply);
    std::wstring ServerName(const ControlSystem::IParameters& input) const;
    bool IsConnectionTaken(const std::string& deviceId) const;
    std::wstring AskForAuthorization(const std::string& deviceId, const std::string& deviceName);
    void Heartbeat(const ControlSystem::IParameters& input, ControlSystem::IParameters& reply);

    const std::shared_ptr<IControlAuthorization> authorization;
    const Clock clock;
    // Behind a pointer, since the authorization outlives this object and so does the function that
    // writes it. Never moves back.
    const std::shared_ptr<std::atomic<std::int64_t>> lastBeat;
};
