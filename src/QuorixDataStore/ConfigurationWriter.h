#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixDataStore/DataToken.h"
#include "UtilsRapidXml/WriterNode.h"
#include "io/DataValue.h"

#include <string>
#include <unordered_map>
#include <vector>

class IDataVerifyReader;

/// One writing of a store into a configuration file. See `DataStoreFileIO`.
///
/// Owns: the nodes of the writing; document and view are the caller's. Threads: the view's.
/// Failure: what cannot be written becomes a message and is left out, and writing goes on.
class VConfigurationWriter
{
public:
    VConfigurationWriter(const IDataVerifyReader& reader, rapidxml::xml_document<char>& document,
                         const UtilsRapidXml::IVersion& version);

    /// Writes the whole store, once, and appends all messages.
    void Write(std::vector<std::string>& errors);

private:
    using VWriterNode = UtilsRapidXml::VWriterNode;
    using VAttribute = DataStoreFileFormat::VAttributeDescription;

    void WriteRoot(VWriterNode& node);
    void WriteChildren(VWriterNode& parent);
    void WriteNode(VWriterNode& node);
    void WriteItem(VWriterNode& node);
    void WriteValues(VWriterNode& node, const KVR::IO::ISchema& schema);
    void WriteValue(VWriterNode& node, const VAttribute& attribute, const VDataValue& value,
                    const KVR::IO::ISchema& schema);
    void WriteText(VWriterNode& node, const VAttribute& attribute, const std::string& text);
    void ReportUnwritten(VWriterNode& node, const VAttribute& attribute);
    const std::string& FormatOf(const KVR::IO::ISchema& schema);

    const IDataVerifyReader& reader;
    const UtilsRapidXml::IVersion version;
    VWriterNode root;
    VDataPath path;   // of the node or item that is being written
    VDataToken token; // of the item that is being written
    std::unordered_map<const KVR::IO::ISchema*, std::string> formats; // written before
    std::string text;                                                 // keeps its room
};
