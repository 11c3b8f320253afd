#pragma once

namespace ControlStreamServer {

/// What the plug-in holds of its server: it is wholly driven by its socket and the dispatcher.
class IServer
{
public:
    virtual ~IServer() = default;
};

} // namespace ControlStreamServer
