#include "QuorixDataStore/DataStoreFileIO.h"

#include "FileFixture.h"
#include "StoreFixture.h"
#include "io/Values.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

using namespace StoreTest;
using testing::ElementsAre;
using testing::IsEmpty;
using TestSupport::VLogCapture;

namespace {

/// A document with everything that reading it reports.
struct VMessageCase
{
    const char* Name;
    std::string Document;
    Texts Errors;
    Texts Warnings;
};

const std::string boolFormat = R"(format='{"Type":"Bool"}')";

// clang-format off
const VMessageCase messageCases[] = {
    {"NoVersion", R"(<Configuration><Node name="A"/></Configuration>)",
     {"Cannot load Quorix configuration file with version 1.0, minimum supported version is 2.0"},
     {"Ignoring unrecognised element type: /Configuration/Node"}},
    {"VersionTooLow", R"(<Configuration version="1.9"/>)",
     {"Cannot load Quorix configuration file with version 1.9, minimum supported version is 2.0"}, {}},
    {"MinorVersionTooHigh", R"(<Configuration version="2.1"><Node name="A"/></Configuration>)",
     {"Cannot load Quorix configuration file with version 2.1, maximum supported version is 2.0"},
     {"Ignoring unrecognised element type: /Configuration/Node"}},
    {"MajorVersionTooHigh", R"(<Configuration version="10.0"/>)",
     {"Cannot load Quorix configuration file with version 10.0, maximum supported version is 2.0"}, {}},
    {"VersionThatIsNone", R"(<Configuration version="2.0 beta"/>)",
     {"Cannot load Quorix configuration file with version 1.0, minimum supported version is 2.0"}, {}},
    {"NoNode", R"(<Configuration version="2.0"/>)",
     {"/Configuration element must have a minimum of 1 Node child elements"}, {}},
    {"ItemUnderTheRoot", Configuration(R"(<Node name="A"/><Item name="B"/>)"),
     {}, {"Ignoring unrecognised element type: /Configuration/Item"}},
    {"NodeWithoutName", Configuration("<Node><Node name='B'/><Item name='C'/></Node>"),
     {"Node element missing required attribute name",
      R"(Encountered 'Node' with invalid 'name' attribute. (Parent XPath="/Configuration"))"},
     {"Ignoring unrecognised element type: /Configuration/Node/Node",
      "Ignoring unrecognised element type: /Configuration/Node/Item"}},
    {"NodeWithEmptyName", Configuration("<Node name='A'><Node name=''/></Node>"),
     {R"(Encountered 'Node' with empty 'name' attribute. (Parent XPath="/Configuration/Node[@name='A']"))"}, {}},
    {"NodeNamedAsAWildcard", Configuration("<Node name='*'><Node name='B'/></Node>"),
     {R"(Encountered 'Node' with illegal value for attribute. 'Node' (Parent XPath="/Configuration"))"},
     {"Ignoring unrecognised element type: /Configuration/Node/Node"}},
    {"ItemWithoutName", ItemInA(boolFormat + " value-verified='true'"),
     {"Item element missing required attribute name",
      R"(Encountered 'Item' with invalid 'name' attribute. (Parent XPath="/Configuration/Node[@name='A']"))"},
     {"Ignoring unrecognised attribute: /Configuration/Node/Item/format",
      "Ignoring unrecognised attribute: /Configuration/Node/Item/value-verified"}},
    {"ItemWithEmptyName", ItemInA("name=''"),
     {R"(Encountered 'Item' with empty 'name' attribute. (Parent XPath="/Configuration/Node[@name='A']"))"}, {}},
    {"ItemNamedAsAWildcard", ItemInA("name='*'"),
     {R"(Encountered 'Item' with illegal value for attribute. 'Item' (Parent XPath="/Configuration/Node[@name='A']"))"}, {}},
    {"ItemWithoutFormat", ItemInA("name='B' value-verified='true'"),
     {"Item element missing required attribute format",
      R"(Encountered 'Item' with invalid 'format' attribute. (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))",
      R"(Encountered 'Item' with invalid 'value-verified' attribute value 'true', (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"ItemWithBadFormat", ItemInA("name='B' format='Bool' value-proposed='1' value-verified='2'"),
     {R"(Encountered 'Item' with invalid 'format' attribute value 'Bool'. (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))",
      R"(Encountered 'Item' with invalid 'value-proposed' attribute value '1', (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"ItemWithoutValues", ItemInA("name='B' " + boolFormat),
     {R"(Encountered 'Item' with no 'value-proposed' attribute and no 'value-verified' attribute, at least one must be provided. (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"ItemWithoutFormatAndValues", ItemInA("name='B'"),
     {"Item element missing required attribute format",
      R"(Encountered 'Item' with invalid 'format' attribute. (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))",
      R"(Encountered 'Item' with no 'value-proposed' attribute and no 'value-verified' attribute, at least one must be provided. (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"BadProposedValue", ItemInA("name='B' " + boolFormat + " value-proposed='yes' value-verified='no'"),
     {R"(Encountered 'Item' with invalid 'value-proposed' attribute value 'yes', (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"BadVerifiedValue", ItemInA("name='B' " + boolFormat + " value-proposed='true' value-verified='no'"),
     {R"(Encountered 'Item' with invalid 'value-verified' attribute value 'no', (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"VoidValue", ItemInA("name='B' format='{}' value-verified=''"),
     {R"(Encountered 'Item' with invalid 'value-verified' attribute value '', (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"ValueWithoutBytes", ItemInA("name='B' format='{\"Type\":\"Tuple\"}' value-verified='[]'"),
     {R"(Encountered 'Item' with invalid 'value-verified' attribute value '[]', (Element XPath="/Configuration/Node[@name='A']/Node[@name='B']"))"}, {}},
    {"UnknownElementsAndAttributes",
     "<Configuration version='2.0' a='1'><Node name='A' b='1'><Item name='B' " + boolFormat +
         " value-verified='true' c='1'><D/></Item><E/></Node><F/></Configuration>",
     {},
     {"Ignoring unrecognised element type: /Configuration/Node/Item/D",
      "Ignoring unrecognised attribute: /Configuration/Node/Item/c",
      "Ignoring unrecognised element type: /Configuration/Node/E",
      "Ignoring unrecognised attribute: /Configuration/Node/b",
      "Ignoring unrecognised element type: /Configuration/F",
      "Ignoring unrecognised attribute: /Configuration/a"}},
    {"ForeignRootIsReportedByNobody", "<Settings version='1.0'/>", {}, {}},
    {"NoRoot", "", {}, {}},
    {"EveryRootIsRead", Configuration("") + Configuration("<Node/>"),
     {"/Configuration element must have a minimum of 1 Node child elements",
      "Node element missing required attribute name",
      R"(Encountered 'Node' with invalid 'name' attribute. (Parent XPath="/Configuration"))"}, {}},
};
// clang-format on

class ConfigurationMessages : public testing::TestWithParam<VMessageCase>
{
};

TEST_P(ConfigurationMessages, AreAllReportedByOneLoad)
{
    VDataStore store;

    const std::optional<VReadFile> file = ReadInto(store, GetParam().Document);

    ASSERT_TRUE(file);
    EXPECT_EQ(file->Errors, GetParam().Errors);
    EXPECT_EQ(file->Warnings, GetParam().Warnings);
}

INSTANTIATE_TEST_SUITE_P(Documents, ConfigurationMessages, testing::ValuesIn(messageCases),
                         [](const auto& named) { return std::string(named.param.Name); });

TEST(ReadConfiguration, LogsWarningsAndThenErrors)
{
    std::string text = Configuration("<Node/><Other/><Node name='A' b=''/>");
    rapidxml::xml_document<char> document;
    ASSERT_TRUE(UtilsRapidXml::ParseXml<0>(document, text.data()));
    VDataStore store;
    const VLogCapture log;

    {
        VDataVerifyWriter writer(store);
        EXPECT_FALSE(DataStoreFileIO::ReadConfiguration(document, writer));
    }

    Texts lines;
    for (const TestSupport::VLoggedMessage& message : log.Messages()) {
        lines.push_back(message.Category + " " + std::to_string(message.Level) + " " +
                        message.Text);
    }
    EXPECT_THAT(lines,
                ElementsAre("DataStore 3 Ignoring unrecognised attribute: /Configuration/Node/b",
                            "DataStore 3 Ignoring unrecognised element type: /Configuration/Other",
                            "DataStore 2 Node element missing required attribute name",
                            "DataStore 2 Encountered 'Node' with invalid 'name' attribute. (Parent "
                            "XPath=\"/Configuration\")"));
}

TEST(ReadConfiguration, AWarningIsNoFailure)
{
    std::string text = Configuration("<Node name='A' b=''/>");
    rapidxml::xml_document<char> document;
    ASSERT_TRUE(UtilsRapidXml::ParseXml<0>(document, text.data()));
    VDataStore store;
    const VLogCapture log;
    VDataVerifyWriter writer(store);

    EXPECT_TRUE(DataStoreFileIO::ReadConfiguration(document, writer));

    EXPECT_EQ(log.Texts("DataStore").size(), 1U);
}

TEST(ReadConfiguration, AVerifiedValueAloneLeavesTheFlagsAsTheyAre)
{
    VDataStore store;

    ReadInto(store, ItemInA("name='B' format='{\"Type\":\"UInt8\"}' value-verified='7'"));

    const VDataVerifyReader reader(store);
    EXPECT_EQ(Flags(reader, "A.B"), 0);
    EXPECT_EQ(Verified(reader, "A.B"), 7);
}

TEST(ReadConfiguration, AVerifiedValueAloneLandsInVerifiedOfAnItemWithTheFlag)
{
    VDataStore store;
    {
        VDataVerifyWriter writer(store);
        writer.SetFlags(Token("A.B"), EDataValueFlags::VerifyRequired);
        writer.SetProposedValue(Token("A.B"), Byte(1));
    }

    ReadInto(store, ItemInA("name='B' format='{\"Type\":\"UInt8\"}' value-verified='7'"));

    const VDataVerifyReader reader(store);
    EXPECT_EQ(Flags(reader, "A.B"), 2);
    EXPECT_EQ(Verified(reader, "A.B"), 7);
    EXPECT_EQ(Proposed(reader, "A.B"), 1);
}

TEST(ReadConfiguration, BothValuesLandAndSetTheFlag)
{
    VDataStore store;
    {
        VDataVerifyWriter writer(store);
        writer.SetFlags(Token("A.B"), EDataValueFlags::ReadOnly);
        writer.SetValue(Token("A.B"), Byte(1));
    }

    ReadInto(store, ItemInA("name='B' format='{\"Type\":\"UInt8\"}' value-proposed='8' "
                            "value-verified='7'"));

    const VDataVerifyReader reader(store);
    EXPECT_EQ(Flags(reader, "A.B"), 3);
    EXPECT_EQ(Verified(reader, "A.B"), 7);
    EXPECT_EQ(Proposed(reader, "A.B"), 8);
}

TEST(ReadConfiguration, ABadProposedValueLeavesTheItemAlone)
{
    VDataStore store;

    ReadInto(store, ItemInA("name='B' format='{\"Type\":\"UInt8\"}' value-proposed='x' "
                            "value-verified='7'"));

    const VDataVerifyReader reader(store);
    EXPECT_EQ(Flags(reader, "A.B"), -1);
}

TEST(ReadConfiguration, ABadVerifiedValueLeavesTheProposedOne)
{
    VDataStore store;

    ReadInto(store, ItemInA("name='B' format='{\"Type\":\"UInt8\"}' value-proposed='7' "
                            "value-verified='256'"));

    const VDataVerifyReader reader(store);
    EXPECT_EQ(Proposed(reader, "A.B"), 7);
    EXPECT_EQ(Verified(reader, "A.B"), -1);
}

TEST(ReadConfiguration, ABadFormatStoresNothing)
{
    VDataStore store;

    ReadInto(store, ItemInA("name='B' format='UInt8' value-proposed='7' value-verified='7'"));

    const VDataVerifyReader reader(store);
    EXPECT_EQ(Flags(reader, "A.B"), -1);
    EXPECT_THAT(Find(reader, "*"), IsEmpty());
}

TEST(ReadConfiguration, WhatIsReadBeforeAnErrorStays)
{
    VDataStore store;

    const std::optional<VReadFile> file = ReadInto(
        store, Configuration("<Node name='A'><Item name='B' format='{\"Type\":\"UInt8\"}' "
                             "value-verified='7'/></Node><Node/><Node name='C'><Item name='D' "
                             "format='{\"Type\":\"UInt8\"}' value-verified='8'/></Node>"));

    const VDataVerifyReader reader(store);
    EXPECT_FALSE(file->Good);
    EXPECT_THAT(Find(reader, "*"), ElementsAre("A.B", "C.D"));
}

TEST(ReadConfiguration, ARefusedVersionStoresNothing)
{
    VDataStore store;

    ReadInto(store, "<Configuration version='2.1'><Node name='A'><Item name='B' "
                    "format='{\"Type\":\"UInt8\"}' value-verified='7'/></Node></Configuration>");

    const VDataVerifyReader reader(store);
    EXPECT_THAT(Find(reader, "*"), IsEmpty());
}

TEST(ReadConfiguration, ALoadIsOneCommit)
{
    VDataStore store;

    ReadInto(store, Configuration("<Node name='A'><Item name='B' format='{\"Type\":\"UInt8\"}' "
                                  "value-verified='7'/><Item name='C' "
                                  "format='{\"Type\":\"UInt8\"}' value-verified='8'/></Node>"));

    EXPECT_EQ(VDataVerifyReader(store).GetCurrentChangeId(), 1U);
}

TEST(ReadConfiguration, AnItemBesideANodeOfItsName)
{
    VDataStore store;
    const std::string item = " format='{\"Type\":\"UInt8\"}' value-verified='7'/>";

    const std::optional<VReadFile> file =
        ReadInto(store, Configuration("<Node name='A'><Item name='B'" + item +
                                      "<Node name='B'><Item name='C'" + item + "</Node></Node>"));

    const VDataVerifyReader reader(store);
    EXPECT_TRUE(file->Good);
    EXPECT_THAT(Find(reader, "*"), ElementsAre("A.B", "A.B.C"));
}

TEST(ReadConfiguration, NamesAreSingleComponents)
{
    VDataStore store;

    ReadInto(store, ItemInA("name='B.C' format='{\"Type\":\"UInt8\"}' value-verified='7'"));

    const VDataVerifyReader reader(store);
    EXPECT_TRUE(reader.HasValue(VDataToken(VDataPath{"A", "B.C"})));
    EXPECT_FALSE(reader.HasValue(Token("A.B.C")));
}

TEST(ReadConfiguration, TextBehindAValueIsAccepted)
{
    VDataStore store;

    const std::optional<VReadFile> file =
        ReadInto(store, ItemInA("name='B' format='{\"Type\":\"UInt8\"} and more' "
                                "value-verified=' 7 of them'"));

    const VDataVerifyReader reader(store);
    EXPECT_TRUE(file->Good);
    EXPECT_EQ(Verified(reader, "A.B"), 7);
}

TEST(ReadConfiguration, AValueOfAnotherTypeIsLeftOutWithoutAMessageIsKept)
{
    VDataStore store;
    {
        VDataVerifyWriter(store).SetValue(Token("A.B"), Word(1));
    }

    const std::optional<VReadFile> file =
        ReadInto(store, ItemInA("name='B' format='{\"Type\":\"UInt8\"}' value-verified='7'"));

    EXPECT_TRUE(file->Good);
    EXPECT_EQ(VDataVerifyReader(store).GetValue(Token("A.B")), Word(1));
}

TEST(ReadConfiguration, TheDataPathsOfOneFileHaveAGreatestSizeTogether)
{
    constexpr std::size_t size = std::size_t(16) << 20; // of the text of each path
    constexpr std::size_t most = DataStoreFileFormat::GreatestPathText / size;
    const std::string item = "<Item name='x' format='{\"Type\":\"UInt8\"}' value-verified='7'/>";
    std::string nodes[2];
    for (std::size_t each = 0; each < most; ++each) {
        nodes[each % 2] += item;
    }
    std::string content;
    for (const std::string& items : nodes) {
        content += "<Node name='" + std::string(size - 2, 'n') + "'>" + items + "</Node>";
    }
    VDataStore store;

    const std::optional<VReadFile> good = ReadInto(store, Configuration(content));
    const std::optional<VReadFile> cut =
        ReadInto(store, Configuration(content + "<Node name='A'>" + item + "</Node>"));

    EXPECT_THAT(good->Errors, IsEmpty());
    EXPECT_THAT(cut->Errors, ElementsAre("Encountered 'Item' beyond the greatest size of all data "
                                         "paths together."));
}

TEST(ReadConfiguration, FurtherComponentsOfALongPathCountAsMoreText)
{
    constexpr std::size_t size = std::size_t(16) << 20; // of the text of each path
    constexpr std::size_t most = DataStoreFileFormat::GreatestPathText / size;
    const std::string item = "<Item name='x' format='{\"Type\":\"UInt8\"}' value-verified='7'/>";
    const auto read = [&](std::size_t components) {
        std::string content = "<Node name='" + std::string(size - 2 * components, 'n') + "'>";
        for (std::size_t each = 1; each < components; ++each) {
            content += "<Node name='n'>";
        }
        for (std::size_t each = 0; each < most; ++each) {
            content += item;
        }
        for (std::size_t each = 0; each < components; ++each) {
            content += "</Node>";
        }
        VDataStore store;
        return ReadInto(store, Configuration(content))->Errors;
    };

    EXPECT_THAT(read(DataStoreFileFormat::ManyComponents), IsEmpty());
    EXPECT_EQ(read(DataStoreFileFormat::ManyComponents + 1).size(), 1U);
}

TEST(ReadConfiguration, LooseXmlIsTaken)
{
    VDataStore store;

    const std::optional<VReadFile> file =
        ReadInto(store, "\xEF\xBB\xBF<?xml version='1.0'?><!DOCTYPE x><!-- c -->" +
                            ItemInA("name='B' format='{\"Type\":\"String\"}' "
                                    "value-verified='\"&lt;&#x41;&quot;'"));

    EXPECT_TRUE(file->Good);
    EXPECT_EQ(ReadString(VDataVerifyReader(store).GetValue(Token("A.B"))), "<A");
}

TEST(FileFormat, HasItsDescriptions)
{
    using namespace DataStoreFileFormat;

    EXPECT_STREQ(DataStoreFileFormat::Configuration.Documentation,
                 "The root node of a Quorix configuration file.");
    EXPECT_STREQ(Node.Documentation, "A component of a data path. This can own one or more child "
                                     "Nodes or a single child Item.");
    EXPECT_STREQ(Item.Documentation,
                 "A data item with a value. This represents a value in the configuration.");
    EXPECT_STREQ(Version.Documentation, "The format version of the file");
    EXPECT_STREQ(NodeName.Documentation, "The name of the data path component");
    EXPECT_STREQ(ItemName.Documentation, "The name of the data item.");
    EXPECT_STREQ(Format.Documentation, "The format of the value held by the data item");
    EXPECT_STREQ(DataStoreFileFormat::Proposed.Documentation,
                 "The data items proposed value. If 'value-verified' was missing, this is the "
                 "value used to update the current configuration when loading.");
    EXPECT_STREQ(DataStoreFileFormat::Verified.Documentation,
                 "The data items proposed value. If present, this is the value used to update the "
                 "current configuration when loading.");
    EXPECT_STREQ(Version.TypeName, "xsd:string");
    for (const VAttributeDescription* attribute :
         {&NodeName, &ItemName, &Format, &DataStoreFileFormat::Proposed,
          &DataStoreFileFormat::Verified}) {
        EXPECT_STREQ(attribute->TypeName, "xsd::string");
    }
}

} // namespace
