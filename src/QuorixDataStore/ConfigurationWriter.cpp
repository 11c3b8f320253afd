#include "QuorixDataStore/ConfigurationWriter.h"

#include "QuorixDataStore/IDataVerifyReader.h"
#include "UtilsRapidXml/ParseXml.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"
#include "utils/FormatMessage.h"

#include <boost/bind/bind.hpp>

#include <stdexcept>

using namespace DataStoreFileFormat;

namespace {

const UtilsRapidXml::IVersion anyVersion;

// As strings, so that none is made for each of a file's elements.
const std::string nodeElement = Node.Name;
const std::string itemElement = Item.Name;

/// @return false, with anything in `text`, for a value that has no text
bool ToText(const VDataValue& value, const KVR::IO::ISchema& schema, std::string& text)
{
    try {
        return KVR::IO::BinaryToText(value.Bytes, schema, text);
    } catch (const std::runtime_error&) {
        return false; // the bytes end too early: the caller tells where
    }
}

} // namespace

VConfigurationWriter::VConfigurationWriter(const IDataVerifyReader& reader,
                                           rapidxml::xml_document<char>& document,
                                           const UtilsRapidXml::IVersion& version)
    : reader(reader), version(version), root(document, version)
{
}

void VConfigurationWriter::Write(std::vector<std::string>& errors)
{
    root.AddChildElement(Configuration.Name, boost::bind(&VConfigurationWriter::WriteRoot, this,
                                                         boost::placeholders::_1));
    root.GetErrors(errors);
}

void VConfigurationWriter::WriteRoot(VWriterNode& node)
{
    const std::string versionText = UtilsRapidXml::VersionText(version);
    if (versionText.empty()) {
        node.AddError(KVR::FormatMessage("Could not stringify %1% node's %2% attribute value.",
                                         Configuration.Name, Version.Name));
    } else {
        node.WriteAttribute(Version.Name, versionText, anyVersion, anyVersion);
    }
    if (reader.GetChildCount(path) != 0) {
        WriteChildren(node);
    }
}

void VConfigurationWriter::WriteChildren(VWriterNode& parent)
{
    std::vector<std::string> names;
    static_cast<void>(reader.GetChildren(path, names)); // no names: nothing to write
    for (const std::string& name : names) {
        path.Append(name);
        if (path.Count() >= UtilsRapidXml::MaximumNesting) {
            // Deeper elements would make the whole file unreadable.
            ReportUnwritten(parent, NodeName);
            path.RemoveLast();
            continue;
        }
        if (reader.GetChildCount(path) != 0) {
            parent.AddChildElement(nodeElement, boost::bind(&VConfigurationWriter::WriteNode, this,
                                                            boost::placeholders::_1));
        }
        token = VDataToken(path);
        if (reader.HasValue(token)) {
            parent.AddChildElement(itemElement, boost::bind(&VConfigurationWriter::WriteItem, this,
                                                            boost::placeholders::_1));
        }
        token = VDataToken(); // gives up its share of the path, which is changed in place then
        path.RemoveLast();
    }
}

void VConfigurationWriter::WriteNode(VWriterNode& node)
{
    WriteText(node, NodeName, std::string(path.Last()));
    WriteChildren(node);
}

void VConfigurationWriter::WriteItem(VWriterNode& node)
{
    WriteText(node, ItemName, std::string(path.Last()));
    const KVR::IO::ISchema* schema = nullptr;
    if (!reader.GetSchema(token, schema)) {
        ReportUnwritten(node, Format);
        return;
    }
    if (schema->Type == KVR::IO::EType::Void) {
        return;
    }
    WriteText(node, Format, FormatOf(*schema));
    WriteValues(node, *schema);
}

void VConfigurationWriter::WriteValues(VWriterNode& node, const KVR::IO::ISchema& schema)
{
    std::uint32_t flags = 0;
    VDataValue proposed;
    VDataValue verified;
    if (reader.GetFlags(token, flags) && (flags & EDataValueFlags::VerifyRequired) != 0) {
        static_cast<void>(reader.GetProposedValue(token, proposed)); // empty where there is none
    }
    static_cast<void>(reader.GetVerifiedValue(token, verified)); // empty where there is none
    if (proposed.Empty() && verified.Empty()) {
        // Deliberate: the text asks for a second argument and gets none, so that what is collected
        // is the line that tells of a format that does not fit. No consistent store gets here.
        node.AddError(KVR::FormatMessage("Failed trying to write values for data path '%2%', data "
                                         "path has no values set,",
                                         path.Text()));
    }
    WriteValue(node, Proposed, proposed, schema);
    WriteValue(node, Verified, verified, schema);
}

void VConfigurationWriter::WriteValue(VWriterNode& node, const VAttribute& attribute,
                                      const VDataValue& value, const KVR::IO::ISchema& schema)
{
    if (value.Empty()) {
        return;
    }
    if (!ToText(value, schema, text)) {
        ReportUnwritten(node, attribute);
        return;
    }
    WriteText(node, attribute, text);
}

void VConfigurationWriter::WriteText(VWriterNode& node, const VAttribute& attribute,
                                     const std::string& value)
{
    if (value.find('\0') != std::string::npos) {
        // Printed, it would end the next parse, and everything behind it would be lost.
        ReportUnwritten(node, attribute);
        return;
    }
    node.WriteAttribute(attribute.Name, value, anyVersion, anyVersion);
}

void VConfigurationWriter::ReportUnwritten(VWriterNode& node, const VAttribute& attribute)
{
    node.AddError(KVR::FormatMessage("Failed trying to write '%1%' attribute for data path '%2%'",
                                     attribute.Name, path.Text()));
}

const std::string& VConfigurationWriter::FormatOf(const KVR::IO::ISchema& schema)
{
    std::string& format = formats[&schema];
    if (format.empty()) {
        // It cannot fail: every schema in memory has a text.
        static_cast<void>(KVR::IO::WriteSchemaText(format, schema, KVR::IO::SchemaTextModeBrief));
    }
    return format;
}
