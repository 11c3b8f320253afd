#include "QuorixPluginControlStreamServer/ControlStreamServer/EventMessage.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"

#include <string_view>

namespace ControlStreamServer {

using namespace std::string_view_literals; // their lengths are known before they are needed

std::wstring BuildEventMessage(const std::wstring& name,
                               const ControlSystem::IParameters& parameters)
{
    VReplyDocument message;
    VReplyDocument::VElement& event = message.AddElement(message.Top(), L"Event"sv);
    message.AddElement(event, L"Name"sv, name);
    message.AddParameters(event, parameters);
    return message.Print();
}

} // namespace ControlStreamServer
