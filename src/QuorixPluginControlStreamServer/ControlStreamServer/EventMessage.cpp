#include "QuorixPluginControlStreamServer/ControlStreamServer/EventMessage.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"

namespace ControlStreamServer {

std::wstring BuildEventMessage(const std::wstring& name,
                               const ControlSystem::IParameters& parameters)
{
    VReplyDocument message;
    VReplyDocument::VElement& event = message.AddElement(message.Top(), L"Event");
    message.AddElement(event, L"Name", name);
    message.AddParameters(event, parameters);
    return message.Print();
}

} // namespace ControlStreamServer
