#include "QuorixDataStore/ConfigurationWriter.h"

#include "QuorixDataStore/IDataVerifyReader.h"
#include "UtilsRapidXml/ParseXml.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"
#include "utils/FormatMessage.h"

#include <boost/bind/bind.hpp>
#include <boost/ref.hpp>

#include <algorithm>
#include <stdexcept>

using namespace DataStoreFileFormat;

namespace {

const UtilsRapidXml::IVersion anyVersion;

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
    const VTokens items = FindItems();
    WriteChildren(node, {items.begin(), items.end(), 0});
}

/// Returns the items in the order of a file: each before those below it, and names by their bytes.
///
/// The names of children, path by path, would come to the same, but each question for them walks
/// down from the root, and over all that is below the path where the view has pending changes.
VConfigurationWriter::VTokens VConfigurationWriter::FindItems() const
{
    VTokens items;
    static_cast<void>(reader.FindTokens(VDataPath("*"), items)); // without items: no children
    // Committed items come in order, and items that are new in this view in order behind them.
    const auto newItems = std::is_sorted_until(items.begin(), items.end());
    if (!std::is_sorted(newItems, items.end())) {
        std::sort(newItems, items.end());
    }
    std::inplace_merge(items.begin(), newItems, items.end());
    return items;
}

void VConfigurationWriter::WriteChildren(VWriterNode& parent, const VRange& items)
{
    for (auto begin = items.Begin; begin != items.End;) {
        const std::string_view name = begin->GetPath().Component(items.Level);
        const auto end = std::find_if(begin, items.End, [&](const VDataToken& item) {
            return item.GetPath().Component(items.Level) != name;
        });
        token = &*begin;
        level = items.Level + 1;
        if (level < UtilsRapidXml::MaximumNesting) {
            WriteChild(parent, {begin, end, level});
        } else {
            // Deeper elements would make the whole file unreadable.
            ReportUnwritten(parent, NodeName);
        }
        begin = end;
    }
}

/// Writes what has one path: the items below it, and the one that lies there itself.
void VConfigurationWriter::WriteChild(VWriterNode& parent, const VRange& items)
{
    const auto below = items.Begin + (items.Begin->GetPath().Count() == items.Level ? 1 : 0);
    if (below != items.End) {
        const VRange children{below, items.End, items.Level};
        parent.AddChildElement(Node.Name,
                               boost::bind(&VConfigurationWriter::WriteNode, this,
                                           boost::placeholders::_1, boost::cref(children)));
    }
    if (below != items.Begin && reader.HasValue(*items.Begin)) {
        token = &*items.Begin;
        level = items.Level;
        parent.AddChildElement(Item.Name, boost::bind(&VConfigurationWriter::WriteItem, this,
                                                      boost::placeholders::_1));
    }
}

void VConfigurationWriter::WriteNode(VWriterNode& node, const VRange& items)
{
    WriteText(node, NodeName, token->GetPath().Component(items.Level - 1));
    WriteChildren(node, items);
}

void VConfigurationWriter::WriteItem(VWriterNode& node)
{
    WriteText(node, ItemName, token->GetPath().Last());
    const KVR::IO::ISchema* schema = nullptr;
    if (!reader.GetSchema(*token, schema)) {
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
    proposed.Bytes.clear();
    verified.Bytes.clear();
    if (reader.GetFlags(*token, flags) && (flags & EDataValueFlags::VerifyRequired) != 0) {
        static_cast<void>(reader.GetProposedValue(*token, proposed)); // empty where there is none
    }
    static_cast<void>(reader.GetVerifiedValue(*token, verified)); // empty where there is none
    if (proposed.Empty() && verified.Empty()) {
        // Deliberate: the text asks for a second argument and gets none, so that what is collected
        // is the line that tells of a format that does not fit. No consistent store gets here.
        node.AddError(KVR::FormatMessage("Failed trying to write values for data path '%2%', data "
                                         "path has no values set,",
                                         token->GetPath().Left(level).Text()));
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
                                     std::string_view value)
{
    if (value.find('\0') != std::string_view::npos) {
        // Printed, it would end the next parse, and everything behind it would be lost.
        ReportUnwritten(node, attribute);
        return;
    }
    node.WriteAttribute(attribute.Name, value, anyVersion, anyVersion);
}

void VConfigurationWriter::ReportUnwritten(VWriterNode& node, const VAttribute& attribute)
{
    node.AddError(KVR::FormatMessage("Failed trying to write '%1%' attribute for data path '%2%'",
                                     attribute.Name, token->GetPath().Left(level).Text()));
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
