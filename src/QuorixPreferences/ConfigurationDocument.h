#pragma once

#include "UtilsRapidXml/RapidXml.h"

#include <boost/filesystem/path.hpp>

#include <cstddef>
#include <string>

class IDataVerifyReader;

/// A configuration file in memory.
///
/// Owns: the file's text and the document, whose nodes point into it. Threads: one at a time.
class VConfigurationDocument
{
public:
    VConfigurationDocument() = default;

    VConfigurationDocument(const VConfigurationDocument&) = delete;
    VConfigurationDocument& operator=(const VConfigurationDocument&) = delete;

    /// Reads and parses a whole file, once.
    ///
    /// @param limit  the greatest size that is taken; the document needs up to some 30 times of it
    /// @return false, with an empty document, where it cannot be read, is greater, or is no XML
    bool Read(const boost::filesystem::path& path, std::size_t limit);

    const rapidxml::xml_document<char>& Get() const { return document; }

private:
    std::string text;
    rapidxml::xml_document<char> document; // goes before the text
};

/// Returns the text of a document as it stands in a file, indented.
std::string PrintDocument(const rapidxml::xml_document<char>& document);
