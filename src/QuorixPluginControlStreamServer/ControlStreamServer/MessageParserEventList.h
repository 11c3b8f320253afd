#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParser.h"

class IControlSystem;

namespace ControlStreamServer {

/// Answers Events, whatever it holds, with the names of all events.
class VMessageParserEventList : public VMessageParser
{
public:
    explicit VMessageParserEventList(std::shared_ptr<IControlSystem> controlSystem);

private:
    bool Answer(const std::shared_ptr<IClientConnection>& connection,
                const VElement& root) override;

    const std::shared_ptr<IControlSystem> controlSystem;
};

} // namespace ControlStreamServer
