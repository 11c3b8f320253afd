#include "QuorixPreferences/LegacyAltToSelect.h"

#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixPreferences/Preferences.h"
#include "Variant/Interning.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"
#include "io/Values.h"

#include <string>

namespace {

using namespace DataStoreFileFormat;

std::optional<std::string> AttributeOf(const rapidxml::xml_node<char>& element,
                                       const VAttributeDescription& attribute)
{
    const rapidxml::xml_attribute<char>* found = element.first_attribute(attribute.Name);
    if (found == nullptr) {
        return std::nullopt;
    }
    return std::string(found->value(), found->value_size());
}

/// Returns the first child of this kind and name, null if there is none or no parent.
const rapidxml::xml_node<char>* FindChild(const rapidxml::xml_node<char>* parent,
                                          const char* element, const char* name)
{
    const rapidxml::xml_node<char>* child =
        parent == nullptr ? nullptr : parent->first_node(element);
    while (child != nullptr && AttributeOf(*child, ItemName) != name) {
        child = child->next_sibling(element);
    }
    return child;
}

} // namespace

std::optional<bool> FindLegacyAltToSelect(const rapidxml::xml_document<char>& document)
{
    const rapidxml::xml_node<char>* element = document.first_node(Configuration.Name);
    element = FindChild(element, Node.Name, "Preferences");
    element = FindChild(element, Node.Name, "User");
    element = FindChild(element, Item.Name, PreferenceKey::AltToSelect);
    if (element == nullptr) {
        return std::nullopt;
    }
    const std::optional<std::string> format = AttributeOf(*element, Format);
    const std::optional<std::string> text = AttributeOf(*element, Verified);
    VDataValue value;
    if (!format || !text || !KVR::IO::ParseSchemaText(value, format->c_str())) {
        return std::nullopt;
    }
    const char* begin = text->data();
    if (!KVR::IO::TextToBinary(begin, begin + text->size(), *value.EffectiveSchema(), value.Bytes,
                               KVR::IO::SchemaTextModeNamed) ||
        value.Schema != &KVR::IO::GetUniquePodSchema(KVR::IO::EType::String)) {
        return std::nullopt;
    }
    return ReadString(value) != "false";
}
