#include "QuorixPluginControlStreamServer/ControlStreamServer/ReplyDocument.h"

#include "QuorixPluginControlStreamServer/ControlSystem/IParameters.h"

#include <array>
#include <cstddef>
#include <string>
#include <string_view>
#include <utility>

namespace ControlStreamServer {

using namespace std::string_view_literals; // their lengths are known before they are needed

namespace {

/// Collects printed characters in a room on the stack, and moves them on when it is full: a string
/// that grows by single characters would cost as much as all the rest of a reply.
class VTextCollector
{
public:
    void Put(wchar_t character)
    {
        if (used == room.size()) {
            MoveOn();
        }
        room[used++] = character;
    }

    /// Returns the whole text. Called once, at the end.
    std::wstring Take()
    {
        MoveOn();
        return std::move(text);
    }

private:
    void MoveOn()
    {
        text.append(room.data(), used);
        used = 0;
    }

    std::array<wchar_t, 1024> room; // not cleared: only what was put there is read
    std::size_t used = 0;
    std::wstring text;
};

/// The form in which RapidXml wants to write: every assignment puts one character.
class VTextWriter
{
public:
    explicit VTextWriter(VTextCollector& collector) : collector(&collector) {}

    VTextWriter& operator*() { return *this; }
    VTextWriter& operator++() { return *this; }
    VTextWriter operator++(int) { return *this; }
    VTextWriter& operator=(wchar_t character)
    {
        collector->Put(character);
        return *this;
    }

private:
    VTextCollector* collector;
};

} // namespace

VReplyDocument::VReplyDocument()
{
    VElement* declaration = document.allocate_node(rapidxml::node_declaration);
    document.append_node(declaration);
    AddAttribute(*declaration, L"version"sv, L"1.0"sv);
    // Deliberate: the text goes out as UTF-8, and says UTF-16 all the same. Devices know it so.
    AddAttribute(*declaration, L"encoding"sv, L"UTF-16"sv);
    AddAttribute(*declaration, L"standalone"sv, L"no"sv);
}

VReplyDocument::VElement& VReplyDocument::AddElement(VElement& parent, std::wstring_view name,
                                                     std::wstring_view value)
{
    VElement* element = document.allocate_node(rapidxml::node_element);
    element->name(name.data(), name.size());
    element->value(value.data(), value.size());
    parent.append_node(element);
    return *element;
}

void VReplyDocument::AddParameter(VElement& parent, std::wstring_view name,
                                  std::wstring_view secondName, std::wstring_view secondValue)
{
    VElement& parameter = AddElement(parent, L"Parameter"sv);
    AddElement(parameter, L"Name"sv, name);
    AddElement(parameter, secondName, secondValue);
}

void VReplyDocument::AddParameters(VElement& parent, const ControlSystem::IParameters& parameters)
{
    VElement& list = AddElement(parent, L"Parameters"sv);
    for (const auto& [name, value] : parameters) {
        AddParameter(list, name, L"Value"sv, value);
    }
}

std::wstring VReplyDocument::Print() const
{
    VTextCollector collector;
    rapidxml::print(VTextWriter(collector), document, rapidxml::print_no_indenting);
    return collector.Take();
}

void VReplyDocument::AddAttribute(VElement& element, std::wstring_view name,
                                  std::wstring_view value)
{
    rapidxml::xml_attribute<wchar_t>* attribute = document.allocate_attribute();
    attribute->name(name.data(), name.size());
    attribute->value(value.data(), value.size());
    element.append_attribute(attribute);
}

} // namespace ControlStreamServer
