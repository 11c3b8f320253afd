#pragma once

#include <string>

namespace ControlSystem {
class IParameters;
}

namespace ControlStreamServer {

/// Returns the message by which every device hears of an event. [any]
std::wstring BuildEventMessage(const std::wstring& name,
                               const ControlSystem::IParameters& parameters);

} // namespace ControlStreamServer
