#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventList.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"

#include <string_view>
#include <utility>
#include <vector>

namespace ControlStreamServer {

using namespace std::string_view_literals; // their lengths are known before they are needed

namespace {

std::wstring BuildReply(const std::vector<std::wstring>& names)
{
    VReplyDocument reply;
    VReplyDocument::VElement& events = reply.AddElement(reply.Top(), L"Events"sv);
    for (const std::wstring& name : names) {
        reply.AddElement(events, L"Event"sv, name);
    }
    return reply.Print();
}

} // namespace

VMessageParserEventList::VMessageParserEventList(std::shared_ptr<IControlSystem> controlSystem)
    : VMessageParser(L"Events"sv), controlSystem(std::move(controlSystem))
{
}

bool VMessageParserEventList::Answer(const std::shared_ptr<IClientConnection>& connection,
                                     const VElement& /*root*/)
{
    connection->Send(BuildReply(controlSystem->GetEventList(0)));
    return true;
}

} // namespace ControlStreamServer
