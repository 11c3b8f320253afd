#pragma once

#include "QuorixDataStore/DataPath.h"
#include "UtilsRapidXml/RapidXml.h"

#include <optional>
#include <string>

namespace QuorixConfig {

/// A file's text with one attribute changed and all else kept: comments, unknown elements, and the
/// last digits of numbers, which would not survive a load and a save.
///
/// Owns: the text and its document. Threads: one.
class VDocumentEdit
{
public:
    /// @param text  of a file that loads without an error
    explicit VDocumentEdit(std::string text);

    VDocumentEdit(const VDocumentEdit&) = delete;
    VDocumentEdit& operator=(const VDocumentEdit&) = delete;

    /// Sets an attribute of the item whose path has this text: of the last one, where a file has
    /// it twice, since that is the one that counts on loading.
    ///
    /// @return false if there is no such item
    bool SetAttribute(const std::string& pathText, const std::string& name,
                      const std::string& value);

    /// Appends an item with the nodes of its path that are not there yet.
    void AppendItem(const VDataPath& path, const std::string& format, const std::string& value);

    /// Returns the text of the file.
    std::string Print() const;

private:
    char* Copy(const std::string& value);
    void Append(rapidxml::xml_node<char>& element, const std::string& name,
                const std::string& value);
    rapidxml::xml_node<char>& MakeNode(rapidxml::xml_node<char>& parent, const std::string& name);

    std::string content;
    rapidxml::xml_document<char> document; // goes before the text
};

} // namespace QuorixConfig
