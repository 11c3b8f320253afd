#include "Document.h"

#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixDataStore/DataStoreFileIO.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "QuorixPreferences/ConfigurationDocument.h"
#include "UtilsRapidXml/ParseXml.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"
#include "io/Values.h"

#include <cstdio>
#include <cstring>
#include <stdexcept>

namespace {

void Require(bool condition, const char* what)
{
    if (!condition) {
        throw std::runtime_error(std::string("wrong result: ") + what);
    }
}

std::string ItemName(std::size_t index)
{
    char name[32];
    std::snprintf(name, sizeof name, "Setting%02zu", index % itemsPerDevice);
    return name;
}

VDataValue ItemValue(std::size_t index)
{
    switch (index % 4) {
    case 0:
        return MakeDoubleValue(static_cast<double>(index % 10000) / 8);
    case 1:
        return MakeUInt32Value(static_cast<std::uint32_t>(index));
    case 2:
        return MakeBoolValue(index % 8 == 2);
    default:
        return MakeStringValue("value " + std::to_string(index));
    }
}

char* Copy(rapidxml::xml_document<char>& document, const std::string& text)
{
    char* copy = document.allocate_string(nullptr, text.size() + 1);
    std::memcpy(copy, text.c_str(), text.size() + 1);
    return copy;
}

void Append(rapidxml::xml_document<char>& document, rapidxml::xml_node<char>& node,
            const char* name, const std::string& value)
{
    node.append_attribute(
        document.allocate_attribute(name, Copy(document, value), 0, value.size()));
}

rapidxml::xml_node<char>& AppendNode(rapidxml::xml_document<char>& document,
                                     rapidxml::xml_node<char>& parent, const char* element,
                                     const std::string& name)
{
    rapidxml::xml_node<char>* node = document.allocate_node(rapidxml::node_element, element);
    parent.append_node(node);
    Append(document, *node, "name", name);
    return *node;
}

std::size_t Walk(const rapidxml::xml_node<char>& node)
{
    std::size_t size = node.name_size();
    for (const auto* attribute = node.first_attribute(); attribute != nullptr;
         attribute = attribute->next_attribute()) {
        size += attribute->name_size() + attribute->value_size();
    }
    for (const auto* child = node.first_node(); child != nullptr; child = child->next_sibling()) {
        size += Walk(*child);
    }
    return size;
}

std::string Print(const IDataVerifyReader& reader)
{
    rapidxml::xml_document<char> document;
    std::vector<std::string> errors;
    Require(DataStoreFileIO::WriteConfiguration(reader, document,
                                                DataStoreFileFormat::CurrentVersion, errors),
            "save");
    return PrintDocument(document);
}

} // namespace

std::string DeviceName(std::size_t index)
{
    char name[32];
    std::snprintf(name, sizeof name, "qx:%08zu", index);
    return name;
}

void FillStore(VDataStore& store, std::size_t count)
{
    VDataVerifyWriter writer(store);
    for (std::size_t index = 0; index < count; ++index) {
        const VDataToken token(
            VDataPath{"Device", DeviceName(index / itemsPerDevice), ItemName(index)});
        Require(writer.SetVerifiedValue(token, ItemValue(index)), "fill");
    }
}

std::vector<VItemTexts> MakeTexts(std::size_t count)
{
    std::vector<VItemTexts> texts(count);
    for (std::size_t index = 0; index < count; ++index) {
        VItemTexts& item = texts[index];
        const VDataValue value = ItemValue(index);
        item.Name = ItemName(index);
        Require(KVR::IO::WriteSchemaText(item.Format, *value.EffectiveSchema(),
                                         KVR::IO::SchemaTextModeBrief) &&
                    KVR::IO::BinaryToText(value.Bytes, *value.EffectiveSchema(), item.Value),
                "texts");
    }
    return texts;
}

std::string BuildAndPrint(const std::vector<VItemTexts>& texts)
{
    rapidxml::xml_document<char> document;
    rapidxml::xml_node<char>* declaration = document.allocate_node(rapidxml::node_declaration);
    document.append_node(declaration);
    Append(document, *declaration, "version", "1.0");
    Append(document, *declaration, "encoding", "UTF-8");
    Append(document, *declaration, "standalone", "no");
    rapidxml::xml_node<char>* root =
        document.allocate_node(rapidxml::node_element, "Configuration");
    document.append_node(root);
    Append(document, *root, "version", "2.0");
    rapidxml::xml_node<char>& devices = AppendNode(document, *root, "Node", "Device");
    rapidxml::xml_node<char>* device = nullptr;
    for (std::size_t index = 0; index < texts.size(); ++index) {
        if (index % itemsPerDevice == 0) {
            device = &AppendNode(document, devices, "Node", DeviceName(index / itemsPerDevice));
        }
        rapidxml::xml_node<char>& item = AppendNode(document, *device, "Item", texts[index].Name);
        Append(document, item, "format", texts[index].Format);
        Append(document, item, "value-verified", texts[index].Value);
    }
    std::string text;
    rapidxml::print(std::back_inserter(text), document);
    return text;
}

std::size_t ParseAndWalk(std::string text)
{
    rapidxml::xml_document<char> document;
    document.parse<0>(text.data());
    return Walk(document);
}

std::string SaveStore(VDataStore& store, bool withPendingChange)
{
    if (!withPendingChange) {
        return Print(VDataVerifyReader(store));
    }
    VDataVerifyWriter writer(store);
    const VDataToken token(VDataPath{"Device", DeviceName(0), ItemName(0)});
    const VDataValue before = writer.GetValue(token);
    Require(writer.SetVerifiedValue(token, MakeDoubleValue(-1)), "pending change");
    std::string text = Print(writer);
    Require(writer.SetVerifiedValue(token, before), "pending change taken back");
    return text;
}

std::unique_ptr<VDataStore> LoadStore(std::string text)
{
    auto store = std::make_unique<VDataStore>();
    rapidxml::xml_document<char> document;
    Require(UtilsRapidXml::ParseXml<0>(document, text.data()), "parse");
    std::vector<std::string> errors;
    std::vector<std::string> warnings;
    VDataVerifyWriter writer(*store);
    Require(DataStoreFileIO::ReadConfiguration(document, writer, errors, warnings), "load");
    return store;
}
