#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventInformation.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"

#include <string_view>
#include <utility>

namespace ControlStreamServer {

using namespace std::string_view_literals; // their lengths are known before they are needed

namespace {

std::wstring BuildReply(const ControlSystem::IEventInformation& information)
{
    VReplyDocument reply;
    VReplyDocument::VElement& root = reply.AddElement(reply.Top(), L"EventInformation"sv);
    reply.AddElement(root, L"Name"sv, information.Name);
    reply.AddElement(root, L"Description"sv, information.Description);
    VReplyDocument::VElement& parameters = reply.AddElement(root, L"Parameters"sv);
    for (const ControlSystem::IParameterInformation& parameter : information.Parameters) {
        reply.AddParameter(parameters, parameter.Name, L"Description"sv, parameter.Description);
    }
    return reply.Print();
}

} // namespace

VMessageParserEventInformation::VMessageParserEventInformation(
    std::shared_ptr<IControlSystem> controlSystem)
    : VMessageParser(L"EventInformation"sv), controlSystem(std::move(controlSystem))
{
}

bool VMessageParserEventInformation::Answer(const std::shared_ptr<IClientConnection>& connection,
                                            const VElement& root)
{
    const std::wstring name = ValueOf(root);
    if (name.empty()) {
        return false;
    }
    connection->Send(BuildReply(controlSystem->GetEventInformation(name)));
    return true;
}

} // namespace ControlStreamServer
