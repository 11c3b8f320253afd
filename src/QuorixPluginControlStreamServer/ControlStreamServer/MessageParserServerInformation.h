#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParser.h"

namespace ControlStreamServer {

/// Answers ServerInformation, whatever it holds, with the version of the protocol.
class VMessageParserServerInformation : public VMessageParser
{
public:
    VMessageParserServerInformation();

private:
    bool Answer(const std::shared_ptr<IClientConnection>& connection,
                const VElement& root) override;
};

} // namespace ControlStreamServer
