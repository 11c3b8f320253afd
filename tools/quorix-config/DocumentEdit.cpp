#include "DocumentEdit.h"

#include "QuorixDataStore/DataStoreFileFormat.h"
#include "UtilsRapidXml/ParseXml.h"

#include <cstring>
#include <stdexcept>
#include <utility>

namespace QuorixConfig {

namespace {

using namespace DataStoreFileFormat;
using VElement = rapidxml::xml_node<char>;

constexpr int keepEverything = rapidxml::parse_declaration_node | rapidxml::parse_comment_nodes |
                               rapidxml::parse_doctype_node | rapidxml::parse_pi_nodes;

std::string NameOf(const VElement& element)
{
    const rapidxml::xml_attribute<char>* name = element.first_attribute(ItemName.Name);
    return name == nullptr ? std::string() : std::string(name->value(), name->value_size());
}

/// Looks for the item in the order in which a load goes: a node's nodes, then its items.
void FindLast(VElement& parent, const std::string& prefix, const std::string& pathText,
              VElement*& found)
{
    for (VElement* node = parent.first_node(Node.Name); node != nullptr;
         node = node->next_sibling(Node.Name)) {
        const std::string text = prefix + NameOf(*node);
        if (pathText.compare(0, text.size() + 1, text + ".") == 0) {
            FindLast(*node, text + ".", pathText, found);
        }
    }
    for (VElement* item = parent.first_node(Item.Name); item != nullptr;
         item = item->next_sibling(Item.Name)) {
        if (prefix + NameOf(*item) == pathText) {
            found = item;
        }
    }
}

} // namespace

VDocumentEdit::VDocumentEdit(std::string text) : content(std::move(text))
{
    if (!UtilsRapidXml::ParseXml<keepEverything>(document, content.data())) {
        throw std::runtime_error("the file cannot be parsed with all that it holds");
    }
}

bool VDocumentEdit::SetAttribute(const std::string& pathText, const std::string& name,
                                 const std::string& value)
{
    VElement* found = nullptr;
    for (VElement* root = document.first_node(Configuration.Name); root != nullptr;
         root = root->next_sibling(Configuration.Name)) {
        FindLast(*root, "", pathText, found);
    }
    if (found == nullptr) {
        return false;
    }
    rapidxml::xml_attribute<char>* attribute = found->first_attribute(name.c_str());
    if (attribute == nullptr) {
        Append(*found, name, value);
    } else {
        attribute->value(Copy(value), value.size());
    }
    return true;
}

void VDocumentEdit::AppendItem(const VDataPath& path, const std::string& format,
                               const std::string& value)
{
    VElement* parent = document.first_node(Configuration.Name);
    for (std::size_t index = 0; index + 1 < path.Count(); ++index) {
        parent = &MakeNode(*parent, std::string(path.Component(index)));
    }
    VElement* item = document.allocate_node(rapidxml::node_element, Item.Name);
    parent->append_node(item);
    Append(*item, ItemName.Name, std::string(path.Last()));
    Append(*item, Format.Name, format);
    Append(*item, Verified.Name, value);
}

std::string VDocumentEdit::Print() const
{
    std::string text;
    rapidxml::print(std::back_inserter(text), document);
    return text;
}

char* VDocumentEdit::Copy(const std::string& value)
{
    char* copy = document.allocate_string(nullptr, value.size() + 1);
    std::memcpy(copy, value.c_str(), value.size() + 1);
    return copy;
}

void VDocumentEdit::Append(VElement& element, const std::string& name, const std::string& value)
{
    element.append_attribute(
        document.allocate_attribute(Copy(name), Copy(value), name.size(), value.size()));
}

VElement& VDocumentEdit::MakeNode(VElement& parent, const std::string& name)
{
    VElement* node = parent.first_node(Node.Name);
    while (node != nullptr && NameOf(*node) != name) {
        node = node->next_sibling(Node.Name);
    }
    if (node == nullptr) {
        node = document.allocate_node(rapidxml::node_element, Node.Name);
        Append(*node, NodeName.Name, name);
        parent.append_node(node);
    }
    return *node;
}

} // namespace QuorixConfig
