#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserExecuteCommand.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ResultText.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"

#include <boost/algorithm/string/replace.hpp>

#include <string_view>
#include <utility>

namespace ControlStreamServer {

using namespace std::string_view_literals; // their lengths are known before they are needed

namespace {

constexpr std::int32_t Success = 1;

/// What a reply needs, shared by the two functions of which the dispatcher calls one.
struct VRequest
{
    std::shared_ptr<IClientConnection> Connection;
    std::wstring Name;
    std::wstring Correlation;
};

std::wstring BuildReply(const VRequest& request, std::int32_t code,
                        const ControlSystem::IParameters& parameters)
{
    VReplyDocument reply;
    VReplyDocument::VElement& root = reply.AddElement(reply.Top(), L"CommandReply"sv);
    reply.AddElement(root, L"Name"sv, request.Name);
    reply.AddElement(root, L"Correlation"sv, request.Correlation);
    reply.AddElement(root, L"Result"sv, ResultText(code));
    reply.AddParameters(root, parameters);
    return reply.Print();
}

/// Answers a command that succeeded.
struct VSendSuccess
{
    std::shared_ptr<const VRequest> Request;

    void operator()(const ControlSystem::IParameters& parameters) const
    {
        Request->Connection->Send(BuildReply(*Request, Success, parameters));
    }
};

/// Answers a command that failed.
struct VSendFailure
{
    std::shared_ptr<const VRequest> Request;

    void operator()(ControlSystem::IResult result) const
    {
        Request->Connection->Send(BuildReply(*Request, result.Code, ControlSystem::IParameters()));
    }
};

/// Decodes the five entities. The ampersand comes last, so that "&amp;lt;" ends up as "&lt;".
void DecodeEntities(std::wstring& value)
{
    if (value.find(L'&') == std::wstring::npos) {
        return;
    }
    boost::algorithm::replace_all(value, L"&quot;", L"\"");
    boost::algorithm::replace_all(value, L"&apos;", L"'");
    boost::algorithm::replace_all(value, L"&lt;", L"<");
    boost::algorithm::replace_all(value, L"&gt;", L">");
    boost::algorithm::replace_all(value, L"&amp;", L"&");
}

} // namespace

VMessageParserExecuteCommand::VMessageParserExecuteCommand(
    std::shared_ptr<IControlSystem> controlSystem)
    : VMessageParser(L"ExecuteCommand"sv), controlSystem(std::move(controlSystem))
{
}

bool VMessageParserExecuteCommand::Answer(const std::shared_ptr<IClientConnection>& connection,
                                          const VElement& root)
{
    const auto request = std::make_shared<VRequest>();
    request->Connection = connection;
    request->Name = ChildValue(root, L"Name"sv);
    if (request->Name.empty()) {
        return false;
    }
    request->Correlation = ChildValue(root, L"Correlation"sv);
    if (request->Correlation.empty()) {
        return false;
    }
    ControlSystem::IParameters parameters;
    if (!ReadParameters(root, parameters)) {
        return false;
    }

    controlSystem->ExecuteCommand(request->Name, parameters, VSendSuccess{request},
                                  VSendFailure{request});
    return true;
}

bool VMessageParserExecuteCommand::ReadParameters(const VElement& root,
                                                  ControlSystem::IParameters& parameters)
{
    const VElement* list = FindChild(root, L"Parameters"sv);
    const VElement* parameter = list != nullptr ? FindChild(*list, L"Parameter"sv) : nullptr;
    // Deliberate: only the first is looked for by its name. From there on every sibling counts as a
    // parameter, whatever it is, and one without a name spoils the whole message.
    for (; parameter != nullptr; parameter = parameter->next_sibling()) {
        std::wstring name = ChildValue(*parameter, L"Name"sv);
        if (name.empty()) {
            return false;
        }
        std::wstring value = ChildValue(*parameter, L"Value"sv);
        // Deliberate: the value alone is decoded, also where the XML parser has decoded it before.
        DecodeEntities(value);
        parameters.Set(std::move(name), std::move(value));
    }
    return true;
}

} // namespace ControlStreamServer
