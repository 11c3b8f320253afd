#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParser.h"

class IControlSystem;

namespace ControlSystem {
class IParameters;
}

namespace ControlStreamServer {

/// Runs the command of an ExecuteCommand and answers with a CommandReply. The request holds Name,
/// Correlation and, where there are any, Parameters.
///
/// The dispatcher may answer later, on any thread, and after this parser has died: the functions
/// that it is given hold all that a reply needs. A command that is never answered gets no reply.
class VMessageParserExecuteCommand : public VMessageParser
{
public:
    explicit VMessageParserExecuteCommand(std::shared_ptr<IControlSystem> controlSystem);

private:
    bool Answer(const std::shared_ptr<IClientConnection>& connection,
                const VElement& root) override;

    static bool ReadParameters(const VElement& root, ControlSystem::IParameters& parameters);

    const std::shared_ptr<IControlSystem> controlSystem;
};

} // namespace ControlStreamServer
