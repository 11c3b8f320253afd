#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParser.h"

class IControlSystem;

namespace ControlStreamServer {

/// Answers EventInformation with the description of an event. The request's own text is the name.
class VMessageParserEventInformation : public VMessageParser
{
public:
    explicit VMessageParserEventInformation(std::shared_ptr<IControlSystem> controlSystem);

private:
    bool Answer(const std::shared_ptr<IClientConnection>& connection,
                const VElement& root) override;

    const std::shared_ptr<IControlSystem> controlSystem;
};

} // namespace ControlStreamServer
