#include "ItemsDocument.h"

#include "ItemText.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixDataStore/DataStoreFileIO.h"
#include "QuorixDataStore/DataValueFlags.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "UtilsRapidXml/RapidXml.h"

#include <algorithm>
#include <iterator>
#include <vector>

namespace QuorixConfig {

namespace {

bool StoreItem(IDataVerifyWriter& writer, const VDataPath& path, const VItem& item)
{
    const VDataToken token(path);
    return (item.Proposed.Empty() || (writer.SetFlags(token, EDataValueFlags::VerifyRequired) &&
                                      writer.SetProposedValue(token, item.Proposed))) &&
           (item.Verified.Empty() || writer.SetVerifiedValue(token, item.Verified));
}

bool StoreItems(IDataStore& store, const std::map<VDataPath, VItem>& items)
{
    VDataVerifyWriter writer(store);
    return std::all_of(items.begin(), items.end(), [&writer](const auto& entry) {
        return StoreItem(writer, entry.first, entry.second);
    });
}

bool IsSameText(const VItem& left, const VItem& right)
{
    return left.Schema == right.Schema && ValueText(left.Proposed) == ValueText(right.Proposed) &&
           ValueText(left.Verified) == ValueText(right.Verified);
}

/// True if the text loads as the items. They are compared by their texts: that is all a file keeps.
bool LoadsAs(const std::string& text, const std::map<VDataPath, VItem>& items)
{
    const VConfigurationFile file = LoadText(text);
    return file.Errors.empty() && file.Items.size() == items.size() &&
           std::equal(items.begin(), items.end(), file.Items.begin(),
                      [](const auto& left, const auto& right) {
                          return left.first == right.first && IsSameText(left.second, right.second);
                      });
}

} // namespace

std::optional<std::string> PrintItems(const std::map<VDataPath, VItem>& items)
{
    VDataStore store;
    if (!StoreItems(store, items)) {
        return std::nullopt;
    }
    rapidxml::xml_document<char> document;
    std::vector<std::string> errors;
    if (!DataStoreFileIO::WriteConfiguration(VDataVerifyReader(store), document,
                                             DataStoreFileFormat::CurrentVersion, errors)) {
        return std::nullopt;
    }
    std::string text;
    rapidxml::print(std::back_inserter(text), document);
    if (!LoadsAs(text, items)) {
        return std::nullopt;
    }
    return text;
}

} // namespace QuorixConfig
