#include "ConfigurationFile.h"

#include "ItemText.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixDataStore/DataStoreFileIO.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "UtilsFileSystem/FileSystem.h"
#include "UtilsFileSystem/ReadFile.h"
#include "UtilsRapidXml/ParseXml.h"

#include <optional>
#include <ostream>
#include <utility>

namespace QuorixConfig {

namespace {

std::map<VDataPath, VItem> ItemsOf(const IDataVerifyReader& reader)
{
    std::vector<VDataToken> tokens;
    static_cast<void>(reader.FindTokens(VDataPath("*"), tokens)); // without tokens no items
    std::map<VDataPath, VItem> items;
    for (const VDataToken& token : tokens) {
        VItem item;
        std::uint32_t flags = 0;
        if (!reader.HasValue(token) || !reader.GetSchema(token, item.Schema)) {
            continue; // the flags alone are no item
        }
        if (reader.GetFlags(token, flags) && (flags & EDataValueFlags::VerifyRequired) != 0) {
            static_cast<void>(reader.GetProposedValue(token, item.Proposed)); // may be empty
        }
        static_cast<void>(reader.GetVerifiedValue(token, item.Verified)); // may be empty
        items.emplace(token.GetPath(), std::move(item));
    }
    return items;
}

VConfigurationFile Unreadable(const std::string& reason)
{
    VConfigurationFile file;
    file.Errors.push_back(reason);
    return file;
}

} // namespace

bool operator==(const VItem& left, const VItem& right)
{
    return left.Schema == right.Schema && left.Proposed == right.Proposed &&
           left.Verified == right.Verified;
}

const VItem* VConfigurationFile::Find(const std::string& pathText) const
{
    for (const auto& [path, item] : Items) {
        if (path.Text() == pathText) {
            return &item;
        }
    }
    return nullptr;
}

VConfigurationFile LoadFile(const std::string& path)
{
    if (UtilsFileSystem::FolderExists(path)) {
        return Unreadable("The file is a folder");
    }
    if (!UtilsFileSystem::FileExists(path)) {
        return Unreadable("There is no such file");
    }
    std::optional<std::string> text = UtilsFileSystem::ReadFile(path, greatestFile);
    if (!text) {
        return Unreadable("The file cannot be read, is no regular file or is too great");
    }
    return LoadText(std::move(*text));
}

VConfigurationFile LoadText(std::string text)
{
    rapidxml::xml_document<char> document;
    if (!UtilsRapidXml::ParseXml<0>(document, text.data())) {
        return Unreadable("The file is no XML, or its elements nest too deep");
    }
    if (document.first_node(DataStoreFileFormat::Configuration.Name) == nullptr) {
        return Unreadable("The file has no Configuration element");
    }
    VConfigurationFile file;
    VDataStore store;
    {
        VDataVerifyWriter writer(store);
        // Whether it was good is told by the list.
        static_cast<void>(
            DataStoreFileIO::ReadConfiguration(document, writer, file.Errors, file.Warnings));
    }
    file.Items = ItemsOf(VDataVerifyReader(store));
    return file;
}

bool LoadForUse(const std::string& path, VConfigurationFile& file, std::ostream& errors)
{
    file = LoadFile(path);
    for (const std::string& warning : file.Warnings) {
        errors << path << ": warning: " << Printable(warning) << '\n';
    }
    for (const std::string& error : file.Errors) {
        errors << path << ": error: " << Printable(error) << '\n';
    }
    return file.Errors.empty();
}

} // namespace QuorixConfig
