#include "QuorixDataStore/ConfigurationReader.h"

#include "QuorixDataStore/ElementPath.h"
#include "QuorixDataStore/IDataVerifyWriter.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"
#include "utils/FormatMessage.h"

#include <boost/bind/bind.hpp>

using namespace DataStoreFileFormat;
using UtilsRapidXml::IVersion;

namespace {

const IVersion anyVersion;
constexpr std::int32_t noMaximum = 0;

bool ReadAttribute(UtilsRapidXml::INode& node, const VAttributeDescription& attribute,
                   std::string& value)
{
    return node.ReadAttribute(attribute.Name, value, attribute.TypeName, attribute.Required,
                              anyVersion, anyVersion);
}

void DeclareChild(UtilsRapidXml::INode& node, const VElementDescription& element,
                  std::int32_t minimum)
{
    node.AddChildElement(element.Name, element.Name, minimum, noMaximum, anyVersion, anyVersion);
}

} // namespace

VConfigurationReader::VConfigurationReader(const rapidxml::xml_document<char>& document,
                                           IDataVerifyWriter& writer)
    : root(document, false), writer(writer)
{
}

void VConfigurationReader::Read(std::vector<std::string>& errors,
                                std::vector<std::string>& warnings)
{
    DeclareChild(root, Configuration, 0);
    root.ProcessChildren(
        boost::bind(&VConfigurationReader::ReadRoot, this, boost::placeholders::_1), false);
    root.GetWarnings(warnings);
    root.GetErrors(errors);
}

void VConfigurationReader::ReadRoot(INode& node)
{
    IVersion version = UnnamedVersion;
    std::string text;
    if (ReadAttribute(node, Version, text)) {
        version = UtilsRapidXml::ParseVersion(text).value_or(version);
        node.SetVersion(version);
    }
    if (version < CurrentVersion) {
        Error(node,
              "Cannot load Quorix configuration file with version %1%, minimum supported version "
              "is %2%",
              version, CurrentVersion);
        return;
    }
    if (CurrentVersion < version) {
        Error(node,
              "Cannot load Quorix configuration file with version %1%, maximum supported version "
              "is %2%",
              version, CurrentVersion);
        return;
    }
    DeclareChild(node, Node, 1);
    node.ProcessChildren(
        boost::bind(&VConfigurationReader::ReadNode, this, boost::placeholders::_1), false);
}

void VConfigurationReader::ReadNode(INode& node)
{
    std::string name;
    if (!ReadName(node, NodeName, name)) {
        return;
    }
    const std::size_t size =
        name.size() + 1 + (path.Count() < ManyComponents ? 0 : FurtherComponentSize);
    path.Append(name);
    pathSize += size;
    DeclareChild(node, Node, 0);
    node.ProcessChildren(
        boost::bind(&VConfigurationReader::ReadNode, this, boost::placeholders::_1), false);
    DeclareChild(node, Item, 0);
    node.ProcessChildren(
        boost::bind(&VConfigurationReader::ReadItem, this, boost::placeholders::_1), false);
    pathSize -= size;
    path.RemoveLast();
}

void VConfigurationReader::ReadItem(INode& node)
{
    std::string name;
    if (!ReadName(node, ItemName, name) || !CountPath(node, name)) {
        return;
    }
    const VDataPath itemPath(path, name);
    VDataValue value;
    ReadFormat(node, itemPath, value);

    std::string proposed;
    std::string verified;
    const bool hasProposed = ReadAttribute(node, Proposed, proposed);
    const bool hasVerified = ReadAttribute(node, Verified, verified);
    if (!hasProposed && !hasVerified) {
        Error(node,
              "Encountered '%1%' with no '%2%' attribute and no '%3%' attribute, at least one must "
              "be provided. (Element XPath=\"%4%\")",
              Item.Name, Proposed.Name, Verified.Name, VElementPath(itemPath));
    }

    // Deliberate: what the store refuses, which is a value of another type than the item has, is
    // left out without a message. Older preference files hold a text where the item is a bool by
    // now, and whoever loads them reads that text afterwards.
    const VDataToken token(itemPath);
    if (hasProposed) {
        if (!ConvertValue(node, itemPath, Proposed, proposed, value)) {
            return;
        }
        std::uint32_t flags = 0;
        if (!writer.GetFlags(token, flags)) {
            flags = 0;
        }
        static_cast<void>(writer.SetFlags(token, flags | EDataValueFlags::VerifyRequired));
        static_cast<void>(writer.SetProposedValue(token, value));
    }
    if (hasVerified && ConvertValue(node, itemPath, Verified, verified, value)) {
        static_cast<void>(writer.SetVerifiedValue(token, value));
    }
}

bool VConfigurationReader::ReadName(INode& node, const VAttribute& attribute, std::string& name)
{
    if (!ReadAttribute(node, attribute, name)) {
        Error(node, "Encountered '%1%' with invalid '%2%' attribute. (Parent XPath=\"%3%\")",
              node.GetName(), attribute.Name, VElementPath(path));
        return false;
    }
    if (name.empty()) {
        Error(node, "Encountered '%1%' with empty '%2%' attribute. (Parent XPath=\"%3%\")",
              node.GetName(), attribute.Name, VElementPath(path));
        return false;
    }
    if (name == "*") {
        // Deliberate: the element stands in both places, the attribute in none.
        Error(node,
              "Encountered '%1%' with illegal value for attribute. '%1%' (Parent XPath=\"%3%\")",
              node.GetName(), attribute.Name, VElementPath(path));
        return false;
    }
    return true;
}

bool VConfigurationReader::CountPath(INode& node, const std::string& name)
{
    const std::size_t size = pathSize + name.size();
    if (size > GreatestPathText - allPathsSize) {
        Error(node, "Encountered '%1%' beyond the greatest size of all data paths together.",
              Item.Name);
        return false;
    }
    allPathsSize += size;
    return true;
}

void VConfigurationReader::ReadFormat(INode& node, const VDataPath& itemPath, VDataValue& value)
{
    std::string text;
    if (!ReadAttribute(node, Format, text)) {
        Error(node, "Encountered '%1%' with invalid '%2%' attribute. (Element XPath=\"%3%\")",
              Item.Name, Format.Name, VElementPath(itemPath));
    } else if (!ParseFormat(text, value)) {
        Error(node,
              "Encountered '%1%' with invalid '%2%' attribute value '%3%'. (Element XPath=\"%4%\")",
              Item.Name, Format.Name, text, VElementPath(itemPath));
    }
}

bool VConfigurationReader::ParseFormat(const std::string& text, VDataValue& value)
{
    // Thousands of items commonly share a handful of formats.
    constexpr std::size_t mostFormats = 1000;
    const auto known = formats.find(text);
    if (known != formats.end()) {
        value.Schema = known->second;
        return true;
    }
    if (!KVR::IO::ParseSchemaText(value, text.c_str())) {
        return false;
    }
    if (formats.size() < mostFormats) {
        formats.emplace(text, value.Schema);
    }
    return true;
}

/// Converts a value's text under the schema that `value` has. @return whether there is a value
bool VConfigurationReader::ConvertValue(INode& node, const VDataPath& itemPath,
                                        const VAttribute& attribute, const std::string& text,
                                        VDataValue& value)
{
    const char* begin = text.data();
    const bool converted =
        KVR::IO::TextToBinary(begin, begin + text.size(), *value.EffectiveSchema(), value.Bytes,
                              KVR::IO::SchemaTextModeNamed);
    if (converted && !value.Empty()) {
        return true;
    }
    // Deliberate: a comma where the message on a format has a full stop.
    Error(node,
          "Encountered '%1%' with invalid '%2%' attribute value '%3%', (Element XPath=\"%4%\")",
          Item.Name, attribute.Name, text, VElementPath(itemPath));
    return false;
}

template <typename... Args>
void VConfigurationReader::Error(INode& node, const char* format, const Args&... args)
{
    // One that would not be kept is only counted, since a path may make any message a long one.
    node.AddError(root.HasRoomForErrors() ? KVR::FormatMessage(format, args...) : std::string());
}
