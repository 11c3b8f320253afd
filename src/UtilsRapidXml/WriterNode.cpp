#include "UtilsRapidXml/WriterNode.h"

#include <utility>

namespace UtilsRapidXml {

namespace {

/// Copies a text into the document's memory; a text of no length is a valid one there too.
char* Copy(rapidxml::xml_document<char>& document, std::string_view text)
{
    char* copy = document.allocate_string(nullptr, text.size() + 1);
    text.copy(copy, text.size());
    copy[text.size()] = 0;
    return copy;
}

} // namespace

VWriterNode::VWriterNode(rapidxml::xml_document<char>& document, const IVersion& version)
    : element(document), document(document), global(std::make_shared<VGlobalInfo>())
{
    global->Version = version;

    rapidxml::xml_node<char>* declaration = document.allocate_node(rapidxml::node_declaration);
    AppendAttribute(*declaration, "version", "1.0");
    AppendAttribute(*declaration, "encoding", "UTF-8");
    AppendAttribute(*declaration, "standalone", "no");
    document.append_node(declaration);
}

VWriterNode::VWriterNode(rapidxml::xml_node<char>& element, rapidxml::xml_document<char>& document,
                         std::shared_ptr<VGlobalInfo> global)
    : element(element), document(document), global(std::move(global))
{
}

bool VWriterNode::WriteAttribute(std::string_view name, std::string_view value,
                                 const IVersion& first, const IVersion& last)
{
    if (!IsSupported(global->Version, first, last)) {
        return false;
    }
    AppendAttribute(element, name, value);
    return true;
}

void VWriterNode::AppendAttribute(rapidxml::xml_node<char>& to, std::string_view name,
                                  std::string_view value)
{
    to.append_attribute(document.allocate_attribute(Copy(document, name), Copy(document, value),
                                                    name.size(), value.size()));
}

void VWriterNode::AddChildElement(std::string_view name, const ChildCallback& callback)
{
    rapidxml::xml_node<char>* child =
        document.allocate_node(rapidxml::node_element, Copy(document, name), nullptr, name.size());
    element.append_node(child);
    VWriterNode node(*child, document, global);
    callback(node);
}

void VWriterNode::AddError(const std::string& text)
{
    global->Errors.push_back(text);
}

void VWriterNode::GetErrors(std::vector<std::string>& errors) const
{
    errors.insert(errors.end(), global->Errors.begin(), global->Errors.end());
}

} // namespace UtilsRapidXml
