#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "UtilsRapidXml/ReaderNode.h"
#include "io/DataValue.h"

#include <string>
#include <unordered_map>
#include <vector>

class IDataVerifyWriter;

/// One reading of a configuration file into a store. See `DataStoreFileIO`.
///
/// Owns: the nodes of the reading; document and view are the caller's. Threads: the view's.
/// Failure: what is wrong becomes a message of the nodes, and reading goes on.
class VConfigurationReader
{
public:
    VConfigurationReader(const rapidxml::xml_document<char>& document, IDataVerifyWriter& writer);

    /// Reads the whole document, once, and appends all messages.
    void Read(std::vector<std::string>& errors, std::vector<std::string>& warnings);

private:
    using INode = UtilsRapidXml::INode;
    using VAttribute = DataStoreFileFormat::VAttributeDescription;

    void ReadRoot(INode& node);
    void ReadNode(INode& node);
    void ReadItem(INode& node);
    bool ReadName(INode& node, const VAttribute& attribute, std::string& name);
    void ReadFormat(INode& node, const VDataPath& itemPath, VDataValue& value);
    bool ParseFormat(const std::string& text, VDataValue& value);
    bool ConvertValue(INode& node, const VDataPath& itemPath, const VAttribute& attribute,
                      const std::string& text, VDataValue& value);
    bool CountPath(INode& node, const std::string& name);

    template <typename... Args>
    void Error(INode& node, const char* format, const Args&... args);

    UtilsRapidXml::VReaderNode root;
    IDataVerifyWriter& writer;
    VDataPath path;               // of the node that is being read
    std::size_t pathSize = 0;     // of its text, with what further components count
    std::size_t allPathsSize = 0; // of the items read so far
    std::unordered_map<std::string, const KVR::IO::ISchema*> formats; // read before, by their text
};
