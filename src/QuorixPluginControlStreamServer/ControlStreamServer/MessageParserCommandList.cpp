#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandList.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"

#include <string_view>
#include <utility>
#include <vector>

namespace ControlStreamServer {

using namespace std::string_view_literals; // their lengths are known before they are needed

namespace {

std::wstring BuildReply(const std::wstring& correlation, const std::vector<std::wstring>& names)
{
    VReplyDocument reply;
    // Deliberate: Correlation stands beside Commands, so this reply alone has two top-level
    // elements. Devices look for it there; do not move it inside to match the other replies.
    reply.AddElement(reply.Top(), L"Correlation"sv, correlation);
    VReplyDocument::VElement& commands = reply.AddElement(reply.Top(), L"Commands"sv);
    for (const std::wstring& name : names) {
        reply.AddElement(commands, L"Command"sv, name);
    }
    return reply.Print();
}

} // namespace

VMessageParserCommandList::VMessageParserCommandList(std::shared_ptr<IControlSystem> controlSystem)
    : VMessageParser(L"Commands"sv), controlSystem(std::move(controlSystem))
{
}

bool VMessageParserCommandList::Answer(const std::shared_ptr<IClientConnection>& connection,
                                       const VElement& root)
{
    const std::wstring correlation = ChildValue(root, L"Correlation"sv);
    if (correlation.empty()) {
        return false;
    }
    connection->Send(BuildReply(correlation, controlSystem->GetCommandList(0)));
    return true;
}

} // namespace ControlStreamServer
