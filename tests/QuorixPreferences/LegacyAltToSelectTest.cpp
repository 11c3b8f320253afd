#include "QuorixPreferences/LegacyAltToSelect.h"

#include "UtilsRapidXml/ParseXml.h"

#include <gtest/gtest.h>

namespace {

struct VLegacyCase
{
    const char* Name;
    std::string Document;
    std::optional<bool> Result;
};

std::string Wrap(const std::string& item)
{
    return "<Configuration version='2.0'><Node name='Preferences'><Node name='User'>" + item +
           "</Node></Node></Configuration>";
}

std::string Item(const std::string& attributes)
{
    return Wrap("<Item name='AltToSelect' " + attributes + "/>");
}

const std::string text = R"(format='{"Type":"String"}' )";

// clang-format off
const VLegacyCase legacyCases[] = {
    {"False",                 Item(text + "value-verified='\"false\"'"),  false},
    {"True",                  Item(text + "value-verified='\"true\"'"),   true},
    {"Empty",                 Item(text + "value-verified='\"\"'"),       true},
    {"CaseCounts",            Item(text + "value-verified='\"False\"'"),  true},
    {"BlanksCount",           Item(text + "value-verified='\"false \"'"), true},
    {"Bool",                  Item("format='{\"Type\":\"Bool\"}' value-verified='false'"), std::nullopt},
    {"StringWithATypeName",   Item("format='{\"Type\":\"String\",\"TypeName\":\"x\"}' value-verified='\"false\"'"), std::nullopt},
    {"StringWithDocs",        Item("format='{\"Type\":\"String\",\"Docs\":[\"x\"]}' value-verified='\"false\"'"), false},
    {"PositionalFormat",      Item("format='[\"String\",\"Value\",0,0,\"\",[],[],[]]' value-verified='\"false\"'"), false},
    {"BadFormat",             Item("format='String' value-verified='\"false\"'"), std::nullopt},
    {"BadValue",              Item(text + "value-verified='false'"), std::nullopt},
    {"NoFormat",              Item("value-verified='\"false\"'"), std::nullopt},
    {"NoVerifiedValue",       Item(text + "value-proposed='\"false\"'"), std::nullopt},
    {"NoItem",                Wrap(""), std::nullopt},
    {"AnotherItem",           Wrap("<Item name='Other' " + text + "value-verified='\"false\"'/>"), std::nullopt},
    {"ItemWithoutNameBefore", Wrap("<Item/><Item name='AltToSelect' " + text + "value-verified='\"false\"'/>"), false},
    {"TheFirstItemCounts",    Wrap("<Item name='AltToSelect'/><Item name='AltToSelect' " + text + "value-verified='\"false\"'/>"), std::nullopt},
    {"NoUserNode",            "<Configuration><Node name='Preferences'/></Configuration>", std::nullopt},
    {"TheFirstNodeCounts",    "<Configuration><Node name='Preferences'/><Node name='Preferences'><Node name='User'><Item name='AltToSelect' " + text + "value-verified='\"false\"'/></Node></Node></Configuration>", std::nullopt},
    {"TheVersionDoesNot",     "<Configuration><Node name='Preferences'><Node name='User'><Item name='AltToSelect' " + text + "value-verified='\"false\"'/></Node></Node></Configuration>", false},
    {"ForeignRoot",           "<Settings/>", std::nullopt},
    {"NoRoot",                "", std::nullopt},
};
// clang-format on

class LegacyAltToSelect : public testing::TestWithParam<VLegacyCase>
{
};

TEST_P(LegacyAltToSelect, IsFoundOnlyAsAString)
{
    std::string content = GetParam().Document;
    rapidxml::xml_document<char> document;
    ASSERT_TRUE(UtilsRapidXml::ParseXml<0>(document, content.data()));

    EXPECT_EQ(FindLegacyAltToSelect(document), GetParam().Result);
}

INSTANTIATE_TEST_SUITE_P(Documents, LegacyAltToSelect, testing::ValuesIn(legacyCases),
                         [](const auto& named) { return std::string(named.param.Name); });

} // namespace
