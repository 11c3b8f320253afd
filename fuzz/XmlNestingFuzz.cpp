// Compares the nesting scan with the tree that the parser makes of a text, narrow and wide. The
// input's first byte chooses between the two.

#include "UtilsRapidXml/ParseXml.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string>

namespace {

/// What is edited is parsed so. A declaration that is kept ends elsewhere than one that is skipped.
constexpr int keepEverything = rapidxml::parse_declaration_node | rapidxml::parse_comment_nodes |
                               rapidxml::parse_doctype_node | rapidxml::parse_pi_nodes;

void Require(bool condition)
{
    if (!condition) {
        std::abort();
    }
}

template <typename Ch>
std::size_t DepthOf(const rapidxml::xml_node<Ch>& node)
{
    std::size_t deepest = 0;
    for (const auto* child = node.first_node(); child != nullptr; child = child->next_sibling()) {
        if (child->type() == rapidxml::node_element) {
            deepest = std::max(deepest, 1 + DepthOf(*child));
        }
    }
    return deepest;
}

template <int Flags, typename Ch>
void Compare(std::basic_string<Ch> text)
{
    const std::basic_string<Ch> original = text;
    rapidxml::xml_document<Ch> document;
    if (!UtilsRapidXml::ParseXml<Flags>(document, text.data())) {
        Require(document.first_node() == nullptr);
        return;
    }
    const std::size_t depth = DepthOf(document);
    Require(depth <= UtilsRapidXml::MaximumNesting);
    constexpr bool readsDeclaration = (Flags & rapidxml::parse_declaration_node) != 0;
    const auto isWithin = [&](std::size_t levels) {
        return UtilsRapidXml::IsNestedWithin(original.c_str(), levels, readsDeclaration);
    };
    Require(isWithin(depth));
    Require(depth == 0 || !isWithin(depth - 1));
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0) {
        return 0;
    }
    if ((data[0] & 1) == 0) {
        const std::string text(data + 1, data + size);
        Compare<rapidxml::parse_default>(text);
        Compare<rapidxml::parse_non_destructive>(text);
        Compare<keepEverything>(text);
    } else {
        // Every byte from 0x80 on becomes a unit above 0xFF whose low byte means something to XML.
        std::wstring text;
        for (std::size_t i = 1; i < size; ++i) {
            text += data[i] < 0x80 ? wchar_t(data[i]) : wchar_t(0x0400 + (data[i] & 0x7F));
        }
        Compare<rapidxml::parse_default>(text);
        Compare<rapidxml::parse_non_destructive>(text);
        Compare<keepEverything>(text);
    }
    return 0;
}
