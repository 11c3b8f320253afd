#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParser.h"

class IControlSystem;

namespace ControlStreamServer {

/// Answers CommandInformation with the description of a command. The request holds Correlation and
/// Name. An unknown command is described too, by the defaults of the record.
class VMessageParserCommandInformation : public VMessageParser
{
public:
    explicit VMessageParserCommandInformation(std::shared_ptr<IControlSystem> controlSystem);

private:
    bool Answer(const std::shared_ptr<IClientConnection>& connection,
                const VElement& root) override;

    const std::shared_ptr<IControlSystem> controlSystem;
};

} // namespace ControlStreamServer
