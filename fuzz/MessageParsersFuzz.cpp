// Offers a message to each of the six parsers. The input's first byte says whether entities are
// translated. Whatever is answered has to be XML, and what is not taken has to be without effect.

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandInformation.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandList.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventInformation.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventList.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserExecuteCommand.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserServerInformation.h"
#include "QuorixPluginControlStreamServer/FakeConnection.h"
#include "UtilsRapidXml/ParseXml.h"
#include "support/FakeControlSystem.h"
#include "utils/WideText.h"

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

namespace {

using namespace ControlStreamServer;
using TestSupport::VFakeControlSystem;

void Require(bool condition)
{
    if (!condition) {
        std::abort();
    }
}

std::shared_ptr<VFakeControlSystem> MakeDispatcher()
{
    auto dispatcher = std::make_shared<VFakeControlSystem>();
    dispatcher->CommandNames = {L"Echo", L"<&>"};
    dispatcher->EventNames = {L"Event", L"<&>"};
    dispatcher->Commands[L"Echo"] = &VFakeControlSystem::Echo;
    ControlSystem::ICommandInformation command;
    command.Name = L"Echo";
    command.InputParameters = {{L"In", L"&"}};
    dispatcher->CommandInformation[L"Echo"] = command;
    return dispatcher;
}

/// Returns how many elements stand at the top of a reply, which has to be proper XML.
int TopLevelElements(std::wstring reply)
{
    const std::wstring declaration =
        L"<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?><";
    Require(reply.compare(0, declaration.size(), declaration) == 0);
    rapidxml::xml_document<wchar_t> document;
    Require(UtilsRapidXml::ParseXml<rapidxml::parse_validate_closing_tags>(document, reply.data()));
    int count = 0;
    for (auto* node = document.first_node(); node != nullptr; node = node->next_sibling()) {
        ++count;
    }
    return count;
}

/// Where a reply holds a zero it cannot be read by anybody: entities are translated to one only on
/// request.
bool HoldsZero(const std::wstring& text)
{
    return text.find(L'\0') != std::wstring::npos;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0) {
        return 0;
    }
    const bool translateEntities = (data[0] & 1) != 0;
    const std::wstring message = KVR::Utf8ToWide(reinterpret_cast<const char*>(data) + 1, size - 1);
    const std::shared_ptr<VFakeControlSystem> dispatcher = MakeDispatcher();
    VMessageParserExecuteCommand executeCommand(dispatcher);
    VMessageParserServerInformation serverInformation;
    VMessageParserCommandList commandList(dispatcher);
    VMessageParserCommandInformation commandInformation(dispatcher);
    VMessageParserEventInformation eventInformation(dispatcher);
    VMessageParserEventList eventList(dispatcher);
    IMessageParser* const parsers[] = {&executeCommand,     &serverInformation, &commandList,
                                       &commandInformation, &eventInformation,  &eventList};

    for (IMessageParser* parser : parsers) {
        const auto connection = std::make_shared<VFakeConnection>();
        const std::size_t executed = dispatcher->Executed().size();
        const bool taken = parser->Parse(connection, message, translateEntities);
        const std::vector<std::wstring> replies = connection->Sent();
        Require(replies.size() == (taken ? 1U : 0U));
        Require(dispatcher->Executed().size() - executed ==
                (taken && parser == &executeCommand ? 1U : 0U));
        if (taken && !HoldsZero(replies[0])) {
            Require(TopLevelElements(replies[0]) == (parser == &commandList ? 2 : 1));
        }
        Require(translateEntities || replies.empty() || !HoldsZero(replies[0]));
    }
    return 0;
}
