#pragma once

#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixDataStore/DataStoreFileIO.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "UtilsRapidXml/ParseXml.h"

#include <gtest/gtest.h>

#include <iterator>
#include <optional>
#include <string>
#include <vector>

namespace StoreTest {

/// What reading a document has found.
struct VReadFile
{
    bool Good = false;
    std::vector<std::string> Errors;
    std::vector<std::string> Warnings;
};

/// Reads a document into a store. @return empty if it cannot be parsed
inline std::optional<VReadFile> ReadInto(IDataStore& store, std::string text)
{
    rapidxml::xml_document<char> document;
    if (!UtilsRapidXml::ParseXml<0>(document, text.data())) {
        return std::nullopt;
    }
    VReadFile file;
    VDataVerifyWriter writer(store);
    file.Good = DataStoreFileIO::ReadConfiguration(document, writer, file.Errors, file.Warnings);
    EXPECT_EQ(file.Good, file.Errors.empty());
    return file;
}

/// Prints the document that a view's store gives, as it stands in a file.
inline std::string PrintConfiguration(const IDataVerifyReader& reader,
                                      std::vector<std::string>* errors = nullptr)
{
    rapidxml::xml_document<char> document;
    std::vector<std::string> found;
    const bool good = DataStoreFileIO::WriteConfiguration(
        reader, document, DataStoreFileFormat::CurrentVersion, found);
    EXPECT_EQ(good, found.empty());
    if (errors != nullptr) {
        *errors = found;
    }
    std::string text;
    rapidxml::print(std::back_inserter(text), document);
    return text;
}

inline std::string PrintStore(const IDataStore& store, std::vector<std::string>* errors = nullptr)
{
    const VDataVerifyReader reader(store);
    return PrintConfiguration(reader, errors);
}

/// Puts nodes and items into a configuration of the version that is accepted.
inline std::string Configuration(const std::string& content)
{
    return "<Configuration version=\"2.0\">" + content + "</Configuration>";
}

/// Puts an item with these attributes into the node A.
inline std::string ItemInA(const std::string& attributes)
{
    return Configuration("<Node name=\"A\"><Item " + attributes + "/></Node>");
}

} // namespace StoreTest
