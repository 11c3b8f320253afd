#include "QuorixPreferences/ConfigurationDocument.h"

#include "UtilsFileSystem/ReadFile.h"
#include "UtilsRapidXml/ParseXml.h"

#include <optional>
#include <utility>

bool VConfigurationDocument::Read(const boost::filesystem::path& path, std::size_t limit)
{
    std::optional<std::string> content = UtilsFileSystem::ReadFile(path, limit);
    if (!content) {
        return false;
    }
    text = std::move(*content);
    return UtilsRapidXml::ParseXml<0>(document, text.data());
}

std::string PrintDocument(const rapidxml::xml_document<char>& document)
{
    std::string text;
    rapidxml::print(std::back_inserter(text), document);
    return text;
}
