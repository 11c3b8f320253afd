#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParser.h"

class IControlSystem;

namespace ControlStreamServer {

/// Answers Commands with the names of all commands. The request holds Correlation.
class VMessageParserCommandList : public VMessageParser
{
public:
    explicit VMessageParserCommandList(std::shared_ptr<IControlSystem> controlSystem);

private:
    bool Answer(const std::shared_ptr<IClientConnection>& connection,
                const VElement& root) override;

    const std::shared_ptr<IControlSystem> controlSystem;
};

} // namespace ControlStreamServer
