#include "UtilsRapidXml/ReaderNode.h"

#include "utils/FormatMessage.h"

#include <algorithm>
#include <utility>

namespace UtilsRapidXml {

namespace {

using VElement = rapidxml::xml_node<char>;

std::string_view NameOf(const rapidxml::xml_base<char>& node)
{
    return std::string_view(node.name(), node.name_size());
}

/// Returns the first element from this node on: text lies among the elements as nodes of its own.
const VElement* ElementFrom(const VElement* node)
{
    while (node != nullptr && node->type() != rapidxml::node_element) {
        node = node->next_sibling();
    }
    return node;
}

const VElement* FirstElement(const VElement& parent)
{
    return ElementFrom(parent.first_node());
}

const VElement* NextElement(const VElement& element)
{
    return ElementFrom(element.next_sibling());
}

/// Adds a name to those that are known. @return false if it was there already
bool Learn(std::set<std::string, std::less<>>& known, std::string_view name)
{
    if (known.find(name) != known.end()) {
        return false;
    }
    known.emplace(name);
    return true;
}

} // namespace

VReaderNode::VReaderNode(const VElement& element, bool strictSequence)
    : element(element),
      global(std::make_shared<VGlobalInfo>()),
      path(element.type() == rapidxml::node_document ? "" : "/" + std::string(NameOf(element)))
{
    global->StrictSequence = strictSequence;
}

VReaderNode::VReaderNode(const VElement& element, std::shared_ptr<VGlobalInfo> global,
                         const std::string& parentPath)
    : element(element), global(std::move(global)), path(parentPath)
{
    path += '/';
    path += NameOf(element);
}

VReaderNode::~VReaderNode()
{
    try {
        ReportUnknown();
    } catch (...) {
        // No memory for a warning: what is known of the file stands without it.
    }
}

std::string VReaderNode::GetName() const
{
    return std::string(NameOf(element));
}

void VReaderNode::SetVersion(const IVersion& version)
{
    global->Version = version;
}

IVersion VReaderNode::GetVersion() const
{
    return global->Version;
}

void VReaderNode::WriterHook() {}

void VReaderNode::AddChildElement(const std::string& name, const std::string& typeName,
                                  std::int32_t minimum, std::int32_t maximum, const IVersion& first,
                                  const IVersion& last)
{
    childRules.push_back({name, typeName, minimum, maximum, first, last});
}

/// One pass over the children of a node: each rule looks through all of them.
class VReaderNode::VChildCheck
{
public:
    VChildCheck(VReaderNode& parent, bool choice) : node(parent), isChoice(choice) {}

    void Apply(const VChildRule& rule)
    {
        Learn(node.knownElements, rule.Name);
        count = 0;
        std::uint64_t index = 0;
        for (const VElement* child = FirstElement(node.element); child != nullptr;
             child = NextElement(*child), ++index) {
            if (NameOf(*child) == rule.Name && Accept(rule, index)) {
                accepted.push_back({index, child});
            }
        }
        if (!isChoice && count < rule.Minimum) {
            node.Error("%1% element must have a minimum of %2% %3% child elements", node.path,
                       rule.Minimum, rule.Name);
        }
    }

    /// Ends the pass. @return the children to visit, in the order of the document
    std::vector<VAcceptedChild> Finish()
    {
        if (isChoice && chosen == nullptr) {
            ReportNoChoice();
        }
        std::stable_sort(accepted.begin(), accepted.end(),
                         [](const VAcceptedChild& left, const VAcceptedChild& right) {
                             return left.Index < right.Index;
                         });
        return std::move(accepted);
    }

private:
    bool Accept(const VChildRule& rule, std::uint64_t index)
    {
        if (!IsSupported(node.global->Version, rule.First, rule.Last)) {
            node.Warn("Ignoring %1% element. Not supported in files with version %2%",
                      node.PathOf(rule.Name), node.global->Version);
            return false;
        }
        if (node.global->StrictSequence && index < node.lastChildIndex) {
            node.Error("%1% element did not appear in correct element sequence",
                       node.PathOf(rule.Name));
            return false;
        }
        node.lastChildIndex = index;
        return isChoice ? Choose(rule) : Count(rule);
    }

    bool Choose(const VChildRule& rule)
    {
        if (chosen != nullptr && *chosen != rule.Name) {
            node.Error("%1% element cannot have both a %2% and a %3% child element", node.path,
                       *chosen, rule.Name);
            return false;
        }
        chosen = &rule.Name;
        return true;
    }

    bool Count(const VChildRule& rule)
    {
        ++count;
        if (rule.Maximum >= 1 && count > rule.Maximum) {
            node.Error("%1% element must have a maximum of %2% %3% child elements", node.path,
                       rule.Maximum, rule.Name);
            return false;
        }
        return true;
    }

    void ReportNoChoice()
    {
        std::string names;
        for (const VChildRule& rule : node.childRules) {
            names += ' ';
            names += rule.Name;
        }
        node.Error("%1% element must have a one of the following child elements:%2%", node.path,
                   names);
    }

    VReaderNode& node;
    const bool isChoice;
    const std::string* chosen = nullptr; // the name of a rule
    std::int64_t count = 0;              // of the rule's children
    std::vector<VAcceptedChild> accepted;
};

void VReaderNode::ProcessChildren(ChildCallback callback, bool choice)
{
    if (childRules.empty()) {
        return;
    }
    VChildCheck check(*this, choice);
    for (const VChildRule& rule : childRules) {
        check.Apply(rule);
    }
    for (const VAcceptedChild& child : check.Finish()) {
        // Gone when its callback has returned: what it has to report comes before the next one.
        VReaderNode node(*child.Element, global, path);
        callback(node);
    }
    childRules.clear();
}

bool VReaderNode::ReadAttribute(const std::string& name, std::string& value,
                                const std::string& typeName, bool required, const IVersion& first,
                                const IVersion& last)
{
    Learn(knownAttributes, name);
    const rapidxml::xml_attribute<char>* attribute =
        element.first_attribute(name.data(), name.size());
    if (!IsSupported(global->Version, first, last)) {
        if (attribute != nullptr) {
            Warn("Ignoring %1% attribute in %2% element. Not supported in files with version %3%",
                 name, NameOf(element), global->Version);
        }
        return false;
    }
    if (attribute == nullptr) {
        if (required) {
            Error("%1% element missing required attribute %2%", NameOf(element), name);
        }
        return false;
    }
    value.assign(attribute->value(), attribute->value_size());
    CheckIdentifier(value, typeName);
    return true;
}

void VReaderNode::CheckIdentifier(const std::string& value, const std::string& typeName)
{
    // Deliberate: a reference is held against the identifiers read so far, so that one that comes
    // before its identifier is reported. Both messages end with a blank.
    if (typeName == "xsd:ID") {
        if (!global->IDs.insert(value).second) {
            Warn("File contains duplicate ID : %1% ", value);
        }
    } else if (typeName == "xsd:IDREF") {
        if (global->IDs.find(value) == global->IDs.end()) {
            Warn("File contains unknown IDREF : %1% ", value);
        }
    }
}

void VReaderNode::AddError(const std::string& text)
{
    global->Errors.Add(text);
}

void VReaderNode::AddWarning(const std::string& text)
{
    global->Warnings.Add(text);
}

std::size_t VReaderNode::GetErrorCount() const
{
    return global->Errors.Count();
}

void VReaderNode::GetErrors(std::vector<std::string>& errors) const
{
    global->Errors.AppendTo(errors);
}

void VReaderNode::GetWarnings(std::vector<std::string>& warnings) const
{
    global->Warnings.AppendTo(warnings);
}

bool VReaderNode::HasRoomForErrors() const
{
    return global->Errors.HasRoom();
}

template <typename... Args>
void VReaderNode::Error(const char* format, const Args&... args)
{
    VReaderNode::AddError(HasRoomForErrors() ? KVR::FormatMessage(format, args...) : std::string());
}

template <typename... Args>
void VReaderNode::Warn(const char* format, const Args&... args)
{
    VReaderNode::AddWarning(global->Warnings.HasRoom() ? KVR::FormatMessage(format, args...)
                                                       : std::string());
}

std::string VReaderNode::PathOf(std::string_view child) const
{
    std::string text = path;
    text += '/';
    text += child;
    return text;
}

void VReaderNode::ReportUnknown()
{
    for (const VElement* child = FirstElement(element); child != nullptr;
         child = NextElement(*child)) {
        if (Learn(knownElements, NameOf(*child))) {
            Warn("Ignoring unrecognised element type: %1%", PathOf(NameOf(*child)));
        }
    }
    for (const rapidxml::xml_attribute<char>* attribute = element.first_attribute();
         attribute != nullptr; attribute = attribute->next_attribute()) {
        if (Learn(knownAttributes, NameOf(*attribute))) {
            Warn("Ignoring unrecognised attribute: %1%", PathOf(NameOf(*attribute)));
        }
    }
}

} // namespace UtilsRapidXml
