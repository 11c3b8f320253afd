#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParser.h"

#include "UtilsRapidXml/ParseXml.h"

namespace ControlStreamServer {

namespace {

bool ParseMessage(rapidxml::xml_document<wchar_t>& document, std::wstring& message,
                  bool translateEntities)
{
    using UtilsRapidXml::ParseXml;
    return translateEntities ? ParseXml<rapidxml::parse_default>(document, message.data())
                             : ParseXml<rapidxml::parse_non_destructive>(document, message.data());
}

} // namespace

bool VMessageParser::Parse(std::shared_ptr<IClientConnection> connection, std::wstring message,
                           bool translateEntities)
{
    rapidxml::xml_document<wchar_t> document; // its first 64 KiB of nodes lie on the stack
    if (!ParseMessage(document, message, translateEntities)) {
        return false;
    }
    const VElement* root = FindChild(document, rootName);
    return root != nullptr && Answer(connection, *root);
}

const VMessageParser::VElement* VMessageParser::FindChild(const VElement& parent,
                                                          std::wstring_view name)
{
    return parent.first_node(name.data(), name.size());
}

std::wstring VMessageParser::ValueOf(const VElement& element)
{
    return std::wstring(element.value(), element.value_size()); // it need not end in a zero
}

std::wstring VMessageParser::ChildValue(const VElement& parent, std::wstring_view name)
{
    const VElement* child = FindChild(parent, name);
    return child != nullptr ? ValueOf(*child) : std::wstring();
}

} // namespace ControlStreamServer
