#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixDataStore/DataToken.h"
#include "UtilsRapidXml/WriterNode.h"
#include "io/DataValue.h"

#include <string>
#include <string_view>
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

    using VTokens = std::vector<VDataToken>;

    /// Items that lie next to each other in the order of a file, at or below one path.
    struct VRange
    {
        VTokens::const_iterator Begin;
        VTokens::const_iterator End;
        std::size_t Level; ///< the number of components that their paths share
    };

    VTokens FindItems() const;
    void WriteRoot(VWriterNode& node);
    void WriteChildren(VWriterNode& parent, const VRange& items);
    void WriteChild(VWriterNode& parent, const VRange& items);
    void WriteNode(VWriterNode& node, const VRange& items);
    void WriteItem(VWriterNode& node);
    void WriteValues(VWriterNode& node, const KVR::IO::ISchema& schema);
    void WriteValue(VWriterNode& node, const VAttribute& attribute, const VDataValue& value,
                    const KVR::IO::ISchema& schema);
    void WriteText(VWriterNode& node, const VAttribute& attribute, std::string_view value);
    void ReportUnwritten(VWriterNode& node, const VAttribute& attribute);
    const std::string& FormatOf(const KVR::IO::ISchema& schema);

    const IDataVerifyReader& reader;
    const UtilsRapidXml::IVersion version;
    VWriterNode root;
    const VDataToken* token = nullptr; // of an item at or below what is being written
    std::size_t level = 0;             // of its components, how many name what is being written
    std::unordered_map<const KVR::IO::ISchema*, std::string> formats; // written before

    // Of the item that is being written; kept for the room that they have.
    VDataValue proposed;
    VDataValue verified;
    std::string text;
};
