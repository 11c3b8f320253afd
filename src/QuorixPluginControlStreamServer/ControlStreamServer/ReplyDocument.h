#pragma once

#include "UtilsRapidXml/RapidXml.h"

#include <string>
#include <string_view>

namespace ControlSystem {
class IParameters;
}

namespace ControlStreamServer {

/// A message to a device while it is being built. It opens with the declaration.
///
/// Names and values are pointed at, not copied: they have to outlive the document, which is short.
/// About 64 KiB on the stack, of which only what is used is touched. Threads: one.
class VReplyDocument
{
public:
    using VElement = rapidxml::xml_node<wchar_t>;

    VReplyDocument();

    /// The place of top-level elements.
    VElement& Top() { return document; }

    /// Adds an element, which prints in its short form while it is empty.
    VElement& AddElement(VElement& parent, std::wstring_view name, std::wstring_view value = {});
    VElement& AddElement(VElement& parent, std::wstring_view name, std::wstring&& value) = delete;

    /// Adds an element Parameter that holds the element Name and a second one.
    void AddParameter(VElement& parent, std::wstring_view name, std::wstring_view secondName,
                      std::wstring_view secondValue);

    /// Adds an element Parameters that holds Name and Value of each parameter, in their order.
    void AddParameters(VElement& parent, const ControlSystem::IParameters& parameters);

    /// Returns the text, with nothing between the elements and the five special characters of a
    /// value as entities.
    std::wstring Print() const;

private:
    void AddAttribute(VElement& element, std::wstring_view name, std::wstring_view value);

    rapidxml::xml_document<wchar_t> document;
};

} // namespace ControlStreamServer
