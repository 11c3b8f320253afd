#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserServerInformation.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"

namespace ControlStreamServer {

VMessageParserServerInformation::VMessageParserServerInformation()
    : VMessageParser(L"ServerInformation")
{
}

bool VMessageParserServerInformation::Answer(const std::shared_ptr<IClientConnection>& connection,
                                             const VElement& /*root*/)
{
    // The only version of the protocol, and the only attributes on the wire beside those of the
    // declaration.
    connection->Send(L"<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
                     L"<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/>"
                     L"</ServerInformation>");
    return true;
}

} // namespace ControlStreamServer
