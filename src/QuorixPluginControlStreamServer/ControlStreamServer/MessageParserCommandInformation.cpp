#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandInformation.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"

#include <string_view>
#include <utility>
#include <vector>

namespace ControlStreamServer {

using namespace std::string_view_literals; // their lengths are known before they are needed

namespace {

void AddDescriptions(VReplyDocument& reply, VReplyDocument::VElement& parent,
                     std::wstring_view listName,
                     const std::vector<ControlSystem::IParameterInformation>& parameters)
{
    VReplyDocument::VElement& list = reply.AddElement(parent, listName);
    for (const ControlSystem::IParameterInformation& parameter : parameters) {
        // Deliberate: what stands under Value is the description, a text for people. Devices know
        // it by that name here, and by its own in the information of an event.
        reply.AddParameter(list, parameter.Name, L"Value"sv, parameter.Description);
    }
}

std::wstring BuildReply(const std::wstring& correlation,
                        const ControlSystem::ICommandInformation& information)
{
    VReplyDocument reply;
    VReplyDocument::VElement& root = reply.AddElement(reply.Top(), L"CommandInformation"sv);
    reply.AddElement(root, L"Correlation"sv, correlation);
    reply.AddElement(root, L"Name"sv, information.Name);
    reply.AddElement(root, L"Description"sv, information.Description);
    AddDescriptions(reply, root, L"InputParameters"sv, information.InputParameters);
    AddDescriptions(reply, root, L"ReplyParameters"sv, information.ReplyParameters);
    return reply.Print();
}

} // namespace

VMessageParserCommandInformation::VMessageParserCommandInformation(
    std::shared_ptr<IControlSystem> controlSystem)
    : VMessageParser(L"CommandInformation"sv), controlSystem(std::move(controlSystem))
{
}

bool VMessageParserCommandInformation::Answer(const std::shared_ptr<IClientConnection>& connection,
                                              const VElement& root)
{
    const std::wstring correlation = ChildValue(root, L"Correlation"sv);
    if (correlation.empty()) {
        return false;
    }
    const std::wstring name = ChildValue(root, L"Name"sv);
    if (name.empty()) {
        return false;
    }
    connection->Send(BuildReply(correlation, controlSystem->GetCommandInformation(name)));
    return true;
}

} // namespace ControlStreamServer
