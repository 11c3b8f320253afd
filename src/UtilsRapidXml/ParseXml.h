#pragma once

#include "UtilsRapidXml/RapidXml.h"

#include <cstddef>

namespace UtilsRapidXml {

/// The deepest nesting of elements that is parsed. RapidXml calls itself for every level, so that a
/// text of a few hundred kilobytes that only opens elements would overflow the stack of a thread.
constexpr std::size_t MaximumNesting = 1000;

/// Returns whether the elements of a text lie at most `levels` deep, so far as RapidXml would read
/// it: up to the first zero, or to the first place that it refuses.
///
/// Linear in the text, and needs no memory. Defined for char and wchar_t. [any]
///
/// @param readsDeclaration  whether the text is parsed with the flag parse_declaration_node: the
///                          XML declaration then has attributes, whose values may hold its end
template <typename Ch>
bool IsNestedWithin(const Ch* text, std::size_t levels, bool readsDeclaration = false);

/// Parses the text up to its first zero into `document`. This is the only way in which anything
/// is parsed.
///
/// The nodes point into `text`, which has to outlive them; without the flag
/// parse_no_string_terminators the text is changed. [any]
///
/// @tparam Flags  those of RapidXml; closing tags are compared only where they ask for it
/// @return false, with an empty document, where RapidXml refuses the text or where its elements lie
///         more than MaximumNesting deep
template <int Flags, typename Ch>
bool ParseXml(rapidxml::xml_document<Ch>& document, Ch* text)
{
    constexpr bool readsDeclaration = (Flags & rapidxml::parse_declaration_node) != 0;
    if (!IsNestedWithin(text, MaximumNesting, readsDeclaration)) {
        document.clear();
        return false;
    }
    try {
        document.template parse<Flags>(text);
        return true;
    } catch (const rapidxml::parse_error&) {
        document.clear(); // what was read before the fault is no document
        return false;
    }
}

} // namespace UtilsRapidXml
