#include "ControlStreamClient/Requests.h"

#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/Utf8.h"

#include <algorithm>
#include <cstdio>

namespace ControlStream {

namespace {

constexpr const char* WhiteSpace = " \t\n\r";

[[noreturn]] void Refuse(const std::string& what, const std::string& reason)
{
    throw VError(EErrorKind::Usage, what + " " + reason);
}

bool IsControl(char character)
{
    const auto byte = static_cast<unsigned char>(character);
    return byte < 0x20 || byte == 0x7F;
}

bool IsWhiteSpaceAlone(const std::string& text)
{
    return !text.empty() && text.find_first_not_of(WhiteSpace) == std::string::npos;
}

[[noreturn]] void RefuseControl(const std::string& what, char control)
{
    char code[8];
    std::snprintf(code, sizeof code, "U+%04X", static_cast<unsigned>(control));
    Refuse(what, std::string("holds the control character ") + code);
}

void CheckUtf8(const std::string& text, const std::string& what)
{
    if (!IsUtf8(text)) {
        Refuse(what, "is not valid UTF-8");
    }
}

/// Checks a text that the host takes as it stands, and cannot do without.
void CheckVerbatim(const std::string& text, const std::string& what)
{
    if (text.empty()) {
        Refuse(what, "is empty, and the host answers nothing to that");
    }
    if (IsWhiteSpaceAlone(text)) {
        Refuse(what, "is white space alone, which the host takes for empty and does not answer");
    }
    if (text.find('<') != std::string::npos) {
        Refuse(what, "holds \"<\", which the host can read in the value of a parameter only");
    }
    const auto control = std::find_if(text.begin(), text.end(), IsControl);
    if (control != text.end()) {
        RefuseControl(what, *control);
    }
    CheckUtf8(text, what);
}

void CheckValue(const std::string& value, const std::string& what)
{
    if (IsWhiteSpaceAlone(value)) {
        Refuse(what, "is white space alone, which would reach the host as an empty one");
    }
    for (const char character : value) {
        // Tab and line ends pass through the host's parser as they are.
        if (IsControl(character) && character != '\t' && character != '\n' && character != '\r') {
            RefuseControl(what, character);
        }
    }
    CheckUtf8(value, what);
}

std::string Element(const char* name, const std::string& content)
{
    std::string text;
    text.append("<").append(name).append(">").append(content);
    return text.append("</").append(name).append(">");
}

/// The host replaces "&amp;" last, each entity in one pass, so that this order of one pass over the
/// text is undone exactly. Quotes need no entity in the text of an element.
std::string EncodeValue(const std::string& value)
{
    std::string encoded;
    encoded.reserve(value.size());
    for (const char character : value) {
        switch (character) {
        case '&':
            encoded += "&amp;";
            break;
        case '<':
            encoded += "&lt;";
            break;
        case '>':
            encoded += "&gt;";
            break;
        default:
            encoded += character;
        }
    }
    return encoded;
}

std::string CorrelationElement(const std::string& correlation)
{
    CheckVerbatim(correlation, "the correlation");
    return Element("Correlation", correlation);
}

std::string NameElement(const std::string& name, const std::string& what)
{
    CheckVerbatim(name, what);
    return Element("Name", name);
}

std::string ParameterElement(const VParameter& parameter)
{
    const std::string name = NameElement(parameter.Name, "the name of a parameter");
    CheckValue(parameter.Value, "the value of the parameter \"" + parameter.Name + "\"");
    return Element("Parameter", name + Element("Value", EncodeValue(parameter.Value)));
}

} // namespace

std::string MakeServerInformationRequest()
{
    return "<ServerInformation/>";
}

std::string MakeCommandsRequest(const std::string& correlation)
{
    return Element("Commands", CorrelationElement(correlation));
}

std::string MakeCommandInformationRequest(const std::string& correlation, const std::string& name)
{
    return Element("CommandInformation",
                   CorrelationElement(correlation) + NameElement(name, "the name of the command"));
}

std::string MakeEventsRequest()
{
    return "<Events/>";
}

std::string MakeEventInformationRequest(const std::string& name)
{
    CheckVerbatim(name, "the name of the event");
    return Element("EventInformation", name);
}

std::string MakeExecuteCommandRequest(const std::string& correlation, const std::string& name,
                                      const VParameters& parameters)
{
    std::string content = NameElement(name, "the name of the command");
    content += CorrelationElement(correlation);
    if (!parameters.empty()) {
        std::string list;
        for (const VParameter& parameter : parameters) {
            list += ParameterElement(parameter);
        }
        content += Element("Parameters", list);
    }
    return Element("ExecuteCommand", content);
}

} // namespace ControlStream
