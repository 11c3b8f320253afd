#include "ControlStreamClient/Message.h"

#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/Utf8.h"
#include "UtilsRapidXml/ParseXml.h"

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <cstring>
#include <utility>

namespace ControlStream {

namespace {

using VNode = rapidxml::xml_node<char>;

struct VEntity
{
    const char* Text;
    std::size_t Size;
    char Character;
};

// The parser's tree takes up to 24 times the room of the text. A longer list than half a million
// commands is no list of commands.
constexpr std::ptrdiff_t MarkupLimit = 1 << 20;

// The only entities that a host writes.
constexpr VEntity Entities[] = {
    {"&lt;", 4, '<'}, {"&gt;", 4, '>'}, {"&apos;", 6, '\''}, {"&quot;", 6, '"'}, {"&amp;", 5, '&'},
};

std::string DecodeEntities(const char* text, std::size_t size)
{
    std::string decoded;
    decoded.reserve(size);
    const char* const end = text + size;
    while (text != end) {
        const VEntity* match = nullptr;
        if (*text == '&') {
            for (const VEntity& entity : Entities) {
                if (entity.Size <= static_cast<std::size_t>(end - text) &&
                    std::memcmp(text, entity.Text, entity.Size) == 0) {
                    match = &entity;
                }
            }
        }
        decoded += match != nullptr ? match->Character : *text;
        text += match != nullptr ? match->Size : 1;
    }
    return decoded;
}

bool IsWhiteSpace(char character)
{
    return character == ' ' || character == '\t' || character == '\n' || character == '\r';
}

const char* SkipWhiteSpace(const char* position)
{
    while (IsWhiteSpace(*position)) {
        ++position;
    }
    return position;
}

/// Returns the content of an element that holds white space and nothing else. The parser passes it
/// over, but a camera may well be named " ".
std::string WhiteSpaceOf(const VNode& element)
{
    const rapidxml::xml_attribute<char>* attribute = element.last_attribute();
    const char* tagEnd = SkipWhiteSpace(
        attribute != nullptr ? attribute->value() + attribute->value_size() + 1 // its quote
                             : element.name() + element.name_size());
    if (*tagEnd != '>') {
        return std::string(); // the short form
    }
    return std::string(tagEnd + 1, SkipWhiteSpace(tagEnd + 1));
}

std::string TextOf(const VNode& element)
{
    if (element.value_size() > 0) {
        return DecodeEntities(element.value(), element.value_size());
    }
    return element.first_node() == nullptr ? WhiteSpaceOf(element) : std::string();
}

const VNode* Child(const VNode& parent, const char* name)
{
    return parent.first_node(name, std::strlen(name));
}

/// An absent element reads as an empty one.
std::string ChildText(const VNode& parent, const char* name)
{
    const VNode* child = Child(parent, name);
    return child == nullptr ? std::string() : TextOf(*child);
}

/// Calls the function with each element `name` in the element `list` of the parent.
template <typename Function>
void ForEachListed(const VNode& parent, const char* list, const char* name, Function function)
{
    const VNode* const elements = Child(parent, list);
    if (elements == nullptr) {
        return;
    }
    for (const VNode* element = Child(*elements, name); element != nullptr;
         element = element->next_sibling(name, std::strlen(name))) {
        function(*element);
    }
}

std::vector<std::string> ReadNames(const VNode& list, const char* name)
{
    std::vector<std::string> names;
    for (const VNode* element = Child(list, name); element != nullptr;
         element = element->next_sibling(name, std::strlen(name))) {
        names.push_back(TextOf(*element));
    }
    return names;
}

VParameters ReadParameters(const VNode& message)
{
    VParameters parameters;
    ForEachListed(message, "Parameters", "Parameter", [&parameters](const VNode& parameter) {
        parameters.push_back({ChildText(parameter, "Name"), ChildText(parameter, "Value")});
    });
    return parameters;
}

std::vector<VParameterInformation> ReadDescriptions(const VNode& message, const char* list,
                                                    const char* description)
{
    std::vector<VParameterInformation> parameters;
    ForEachListed(message, list, "Parameter", [&](const VNode& parameter) {
        parameters.push_back({ChildText(parameter, "Name"), ChildText(parameter, description)});
    });
    return parameters;
}

int ReadVersionNumber(const VNode& version, const char* name)
{
    int number = -1;
    const rapidxml::xml_attribute<char>* attribute =
        version.first_attribute(name, std::strlen(name));
    if (attribute != nullptr) {
        const char* const end = attribute->value() + attribute->value_size();
        const auto read = std::from_chars(attribute->value(), end, number);
        if (read.ec != std::errc() || read.ptr != end) {
            number = -1;
        }
    }
    if (number < 0) {
        throw VError(EErrorKind::Protocol,
                     "the host's server information bears no version of the stream");
    }
    return number;
}

void ReadServerInformation(const VNode& element, VMessage& message)
{
    const VNode* const version = Child(element, "StreamVersion");
    if (version == nullptr) {
        throw VError(EErrorKind::Protocol,
                     "the host's server information bears no version of the stream");
    }
    message.Content = VServerInformation{ReadVersionNumber(*version, "major"),
                                         ReadVersionNumber(*version, "minor")};
}

void ReadCommands(const VNode& element, VMessage& message)
{
    // Deliberate: Correlation stands beside Commands, not in it as everywhere else. That is how
    // every host writes it.
    message.Correlation = ChildText(*element.document(), "Correlation");
    message.Content = ReadNames(element, "Command");
}

void ReadCommandInformation(const VNode& element, VMessage& message)
{
    message.Correlation = ChildText(element, "Correlation");
    // Deliberate: the descriptions of a command's parameters bear the name Value, though those of
    // an event's parameters are called what they are. That is how every host writes them.
    message.Content =
        VCommandInformation{ChildText(element, "Name"), ChildText(element, "Description"),
                            ReadDescriptions(element, "InputParameters", "Value"),
                            ReadDescriptions(element, "ReplyParameters", "Value")};
}

void ReadEvents(const VNode& element, VMessage& message)
{
    message.Content = ReadNames(element, "Event");
}

void ReadEventInformation(const VNode& element, VMessage& message)
{
    message.Content =
        VEventInformation{ChildText(element, "Name"), ChildText(element, "Description"),
                          ReadDescriptions(element, "Parameters", "Description")};
}

void ReadCommandReply(const VNode& element, VMessage& message)
{
    message.Correlation = ChildText(element, "Correlation");
    VCommandReply reply;
    reply.Result = ChildText(element, "Result");
    reply.Ok = reply.Result == "OK";
    reply.Parameters = ReadParameters(element);
    if (reply.Result.empty()) {
        throw VError(EErrorKind::Protocol, "the host's reply to a command bears no result");
    }
    message.Content = std::move(reply);
}

void ReadEvent(const VNode& element, VMessage& message)
{
    message.Content = VEvent{ChildText(element, "Name"), ReadParameters(element)};
}

/// Whether the tree of the text stays within bounds. Every node begins with "<", or follows one,
/// and every attribute has its "=".
bool IsTreeBounded(const std::string& text)
{
    return text.size() <= MarkupLimit ||
           (std::count(text.begin(), text.end(), '<') <= MarkupLimit &&
            std::count(text.begin(), text.end(), '=') <= MarkupLimit);
}

struct VMessageReader
{
    const char* Element;
    EMessageKind Kind;
    void (*Read)(const VNode& element, VMessage& message);
};

constexpr VMessageReader Readers[] = {
    {"CommandReply", EMessageKind::CommandReply, &ReadCommandReply},
    {"Event", EMessageKind::Event, &ReadEvent},
    {"Commands", EMessageKind::Commands, &ReadCommands},
    {"CommandInformation", EMessageKind::CommandInformation, &ReadCommandInformation},
    {"Events", EMessageKind::Events, &ReadEvents},
    {"EventInformation", EMessageKind::EventInformation, &ReadEventInformation},
    {"ServerInformation", EMessageKind::ServerInformation, &ReadServerInformation},
};

} // namespace

VMessage ParseMessage(std::string text)
{
    MakeReadable(text);
    if (!IsTreeBounded(text)) {
        throw VError(EErrorKind::Protocol, "the host sent a frame of too many elements");
    }
    rapidxml::xml_document<char> document;
    // The parser's own decoding would turn a reference to any number into bytes that need not be
    // UTF-8; so entities are decoded here.
    if (!UtilsRapidXml::ParseXml<rapidxml::parse_non_destructive>(document, text.data())) {
        throw VError(EErrorKind::Protocol, "the host sent a frame that cannot be read as XML");
    }
    VMessage message;
    for (const VMessageReader& reader : Readers) {
        const VNode* const element = Child(document, reader.Element);
        if (element != nullptr) {
            message.Kind = reader.Kind;
            reader.Read(*element, message);
            break;
        }
    }
    return message;
}

} // namespace ControlStream
