#include "ControlStreamClient/Lint.h"

#include "ControlStreamClient/Utf8.h"
#include "UtilsRapidXml/ParseXml.h"

#include <cstring>
#include <set>

namespace ControlStream {

namespace {

using VNode = rapidxml::xml_node<char>;
using Document = rapidxml::xml_document<char>;

/// One look at a text. The findings of a root that is passed over are dropped with it.
class VLinter
{
public:
    explicit VLinter(const Document& lintedDocument) : document(lintedDocument) {}

    VLintReport Lint()
    {
        std::string refusals;
        for (const VRoot& root : Roots) {
            const VNode* const element = Child(document, root.Name);
            if (element == nullptr) {
                continue;
            }
            warnings.clear();
            const std::string refusal = (this->*root.Check)(*element);
            if (refusal.empty()) {
                WarnOfAttributes(*element);
                return {std::string(), warnings};
            }
            refusals += (refusals.empty() ? "" : "; ") + (root.Name + (" " + refusal));
        }
        if (refusals.empty()) {
            refusals = "none of the elements that a host knows is there: ExecuteCommand, "
                       "ServerInformation, Commands, CommandInformation, EventInformation, Events";
        }
        return {refusals, {}};
    }

private:
    struct VRoot
    {
        const char* Name;
        std::string (VLinter::*Check)(const VNode& element);
    };
    static const VRoot Roots[6]; // in the order in which a host tries them

    static const VNode* Child(const VNode& parent, const char* name)
    {
        return parent.first_node(name, std::strlen(name));
    }

    /// The value of an element as a host takes it: its first text, entities and all.
    static std::string ValueOf(const VNode& element)
    {
        return std::string(element.value(), element.value_size());
    }

    static std::string ChildValue(const VNode& parent, const char* name)
    {
        const VNode* const child = Child(parent, name);
        return child == nullptr ? std::string() : ValueOf(*child);
    }

    static std::string Missing(const VNode& parent, const char* name)
    {
        if (Child(parent, name) == nullptr) {
            return std::string("has no ") + name;
        }
        return std::string("has an empty ") + name +
               " (white space alone and CDATA count as empty)";
    }

    std::string CheckExecuteCommand(const VNode& element)
    {
        if (ChildValue(element, "Name").empty()) {
            return Missing(element, "Name");
        }
        if (ChildValue(element, "Correlation").empty()) {
            return Missing(element, "Correlation");
        }
        WarnOfEntities(element, "Name");
        WarnOfEntities(element, "Correlation");
        const VNode* const list = Child(element, "Parameters");
        if (list == nullptr) {
            if (Child(element, "Parameter") != nullptr) {
                Warn("a Parameter outside of Parameters is not looked at");
            }
            return std::string();
        }
        return CheckParameters(*list);
    }

    std::string CheckParameters(const VNode& list)
    {
        const VNode* parameter = Child(list, "Parameter");
        if (parameter == nullptr && list.first_node() != nullptr) {
            Warn("Parameters holds no Parameter, and so the command runs without any");
        }
        std::set<std::string> names;
        // From the first Parameter on the host takes everything for a parameter.
        for (int index = 1; parameter != nullptr; parameter = parameter->next_sibling(), ++index) {
            if (parameter->type() != rapidxml::node_element) {
                return "has text between its parameters, which the host takes for a "
                       "parameter without a name (entry " +
                       std::to_string(index) + ")";
            }
            const std::string name = ChildValue(*parameter, "Name");
            if (name.empty()) {
                return "has a parameter that " + Missing(*parameter, "Name") + " (entry " +
                       std::to_string(index) + ")";
            }
            WarnOfParameter(*parameter, name, names);
        }
        return std::string();
    }

    void WarnOfParameter(const VNode& parameter, const std::string& name,
                         std::set<std::string>& names)
    {
        if (std::strncmp(parameter.name(), "Parameter", parameter.name_size()) != 0 ||
            parameter.name_size() != std::strlen("Parameter")) {
            Warn("the element " + std::string(parameter.name(), parameter.name_size()) +
                 " counts as a parameter, as everything behind the first Parameter does");
        }
        if (!names.insert(name).second) {
            Warn("the parameter " + name + " is given twice, and the later value counts");
        }
        WarnOfEntities(parameter, "Name");
        const VNode* const value = Child(parameter, "Value");
        if (value != nullptr && value->value_size() == 0 && value->first_node() != nullptr) {
            Warn("the value of the parameter " + name +
                 " is read as empty: CDATA and elements are no value");
        }
    }

    std::string CheckServerInformation(const VNode& /*element*/) { return std::string(); }

    std::string CheckCommands(const VNode& element)
    {
        if (ChildValue(element, "Correlation").empty()) {
            return Missing(element, "Correlation");
        }
        WarnOfEntities(element, "Correlation");
        return std::string();
    }

    std::string CheckCommandInformation(const VNode& element)
    {
        std::string refusal = CheckCommands(element);
        if (!refusal.empty()) {
            return refusal;
        }
        if (ChildValue(element, "Name").empty()) {
            return Missing(element, "Name");
        }
        WarnOfEntities(element, "Name");
        return std::string();
    }

    std::string CheckEventInformation(const VNode& element)
    {
        if (element.value_size() > 0) {
            WarnOfEntities(element);
            return std::string();
        }
        return Child(element, "Name") != nullptr
                   ? "has a Name, but the event's name must be its own text"
                   : "has no text: the event's name";
    }

    std::string CheckEvents(const VNode& /*element*/) { return std::string(); }

    void Warn(const std::string& text) { warnings.push_back(text); }

    void WarnOfEntities(const VNode& parent, const char* name)
    {
        const VNode* const child = Child(parent, name);
        if (child != nullptr) {
            WarnOfEntities(*child);
        }
    }

    void WarnOfEntities(const VNode& element)
    {
        const std::string value = ValueOf(element);
        if (value.find('&') != std::string::npos && value.find(';') != std::string::npos) {
            Warn("\"" + value +
                 "\" is taken as it stands: entities are decoded in the Value of a parameter only");
        }
    }

    void WarnOfAttributes(const VNode& element)
    {
        if (element.first_attribute() != nullptr) {
            Warn("attributes are not looked at");
        }
    }

    const Document& document;
    std::vector<std::string> warnings;
};

const VLinter::VRoot VLinter::Roots[6] = {
    {"ExecuteCommand", &VLinter::CheckExecuteCommand},
    {"ServerInformation", &VLinter::CheckServerInformation},
    {"Commands", &VLinter::CheckCommands},
    {"CommandInformation", &VLinter::CheckCommandInformation},
    {"EventInformation", &VLinter::CheckEventInformation},
    {"Events", &VLinter::CheckEvents},
};

} // namespace

VLintReport LintRequest(const std::string& text)
{
    VLintReport unreadable;
    if (text.compare(0, 3, "\xEF\xBB\xBF") == 0) {
        unreadable.Refusal = "it begins with a byte-order mark, which a host takes for text";
        return unreadable;
    }
    std::string readable = text.substr(0, text.find('\0')); // where the host's parser stops
    const bool cut = readable.size() < text.size();
    const bool isUtf8 = IsUtf8(readable);
    MakeReadable(readable);
    if (!UtilsRapidXml::IsNestedWithin(readable.c_str(), UtilsRapidXml::MaximumNesting)) {
        unreadable.Refusal =
            "its elements lie more than " + std::to_string(UtilsRapidXml::MaximumNesting) + " deep";
        return unreadable;
    }
    Document document;
    if (!UtilsRapidXml::ParseXml<rapidxml::parse_non_destructive>(document, readable.data())) {
        unreadable.Refusal = "it is no XML that the host can read";
        return unreadable;
    }
    VLintReport report = VLinter(document).Lint();
    if (report.Refusal.empty() && cut) {
        report.Warnings.push_back("what stands behind the first zero is not looked at");
    }
    if (report.Refusal.empty() && !isUtf8) {
        report.Warnings.push_back("bytes that are not UTF-8 arrive as U+FFFD");
    }
    return report;
}

} // namespace ControlStream
