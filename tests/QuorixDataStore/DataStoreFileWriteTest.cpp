#include "QuorixDataStore/DataStoreFileIO.h"

#include "FileFixture.h"
#include "StoreFixture.h"
#include "io/Values.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

using namespace StoreTest;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using TestSupport::VLogCapture;

namespace {

const std::string head = "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"no\"?>\n";

/// A view that tells of an item what its store could not hold.
class VInconsistentReader : public VDataVerifyReader
{
public:
    using VDataVerifyReader::VDataVerifyReader;

    bool GetSchema(const VDataToken& token, const KVR::IO::ISchema*& schema) const override
    {
        return !withoutSchema && VDataVerifyReader::GetSchema(token, schema);
    }
    bool GetVerifiedValue(const VDataToken& token, VDataValue& value) const override
    {
        value = VDataValue();
        return !withoutValues && VDataVerifyReader::GetVerifiedValue(token, value);
    }

    bool withoutSchema = false;
    bool withoutValues = false;
};

void Put(IDataStore& store, const VDataPath& path, const VDataValue& value)
{
    VDataVerifyWriter writer(store);
    EXPECT_TRUE(writer.SetVerifiedValue(VDataToken(path), value));
}

TEST(WriteConfiguration, AnEmptyStoreGivesAFileThatIsRefused)
{
    VDataStore store;

    const std::string text = PrintStore(store);

    EXPECT_EQ(text, head + "<Configuration version=\"2.0\"/>\n\n");
    EXPECT_THAT(ReadInto(store, text)->Errors,
                ElementsAre("/Configuration element must have a minimum of 1 Node child elements"));
}

TEST(WriteConfiguration, WritesNodesAndItemsInOrder)
{
    VDataStore store;
    Put(store, VDataPath("B.A"), Byte(1));
    Put(store, VDataPath("A.B"), MakeStringValue("x"));
    Put(store, VDataPath("A.B.C"), MakeBoolValue(true));

    EXPECT_EQ(PrintStore(store),
              head + "<Configuration version=\"2.0\">\n"
                     "\t<Node name=\"A\">\n"
                     "\t\t<Node name=\"B\">\n"
                     "\t\t\t<Item name=\"C\" format='{\"Type\":\"Bool\"}' "
                     "value-verified=\"true\"/>\n"
                     "\t\t</Node>\n"
                     "\t\t<Item name=\"B\" format='{\"Type\":\"String\"}' "
                     "value-verified='\"x\"'/>\n"
                     "\t</Node>\n"
                     "\t<Node name=\"B\">\n"
                     "\t\t<Item name=\"A\" format='{\"Type\":\"UInt8\"}' value-verified=\"1\"/>\n"
                     "\t</Node>\n"
                     "</Configuration>\n\n");
}

TEST(WriteConfiguration, WritesWhatIsPendingInTheView)
{
    VDataStore store;
    Put(store, VDataPath("A.B"), Byte(1));
    Put(store, VDataPath("A.C"), Byte(1));
    VDataVerifyWriter writer(store);
    writer.SetVerifiedValue(Token("A.B"), Byte(2));
    writer.SetVerifiedValue(Token("D.E.F"), Byte(3));
    writer.Remove(Token("A.C"));

    EXPECT_EQ(PrintConfiguration(writer),
              head + "<Configuration version=\"2.0\">\n"
                     "\t<Node name=\"A\">\n"
                     "\t\t<Item name=\"B\" format='{\"Type\":\"UInt8\"}' value-verified=\"2\"/>\n"
                     "\t</Node>\n"
                     "\t<Node name=\"D\">\n"
                     "\t\t<Node name=\"E\">\n"
                     "\t\t\t<Item name=\"F\" format='{\"Type\":\"UInt8\"}' value-verified=\"3\"/>\n"
                     "\t\t</Node>\n"
                     "\t</Node>\n"
                     "</Configuration>\n\n");
}

TEST(WriteConfiguration, WritesTheValuesThatAreThere)
{
    VDataStore store;
    {
        VDataVerifyWriter writer(store);
        writer.SetFlags(Token("A.Both"), EDataValueFlags::VerifyRequired);
        writer.SetProposedValue(Token("A.Both"), Byte(1));
        writer.SetVerifiedValue(Token("A.Both"), Byte(2));
        writer.SetFlags(Token("A.Proposed"), EDataValueFlags::VerifyRequired);
        writer.SetProposedValue(Token("A.Proposed"), Byte(3));
        writer.SetFlags(Token("A.Verified"), EDataValueFlags::VerifyRequired);
        writer.SetVerifiedValue(Token("A.Verified"), Byte(4));
    }

    const std::string text = PrintStore(store);

    EXPECT_THAT(text, HasSubstr("<Item name=\"Both\" format='{\"Type\":\"UInt8\"}' "
                                "value-proposed=\"1\" value-verified=\"2\"/>"));
    EXPECT_THAT(text, HasSubstr("<Item name=\"Proposed\" format='{\"Type\":\"UInt8\"}' "
                                "value-proposed=\"3\"/>"));
    EXPECT_THAT(text, HasSubstr("<Item name=\"Verified\" format='{\"Type\":\"UInt8\"}' "
                                "value-verified=\"4\"/>"));
}

TEST(WriteConfiguration, AnItemOfFlagsAloneIsANodeWithoutContent)
{
    VDataStore store;
    Put(store, VDataPath("A.B"), Byte(1));
    {
        VDataVerifyWriter(store).SetFlags(Token("A.C"), EDataValueFlags::ReadOnly);
    }

    EXPECT_THAT(PrintStore(store), testing::Not(HasSubstr("\"C\"")));
}

TEST(WriteConfiguration, NotSerializedItemsAreWritten)
{
    VDataStore store;
    Put(store, VDataPath("A.B"), Byte(1));
    {
        VDataVerifyWriter(store).SetFlags(Token("A.B"), EDataValueFlags::NotSerialized);
    }

    EXPECT_THAT(PrintStore(store), HasSubstr("<Item name=\"B\""));
}

TEST(WriteConfiguration, AVersionWithoutATextIsAMessage)
{
    const VDataStore store;
    const VDataVerifyReader reader(store);
    rapidxml::xml_document<char> document;
    Texts errors;

    EXPECT_FALSE(DataStoreFileIO::WriteConfiguration(reader, document, {}, errors));

    EXPECT_THAT(errors, ElementsAre("Could not stringify Configuration node's version attribute "
                                    "value."));
    EXPECT_EQ(document.last_node()->first_attribute(), nullptr);
}

TEST(WriteConfiguration, AnItemWithoutASchemaKeepsItsNameAlone)
{
    VDataStore store;
    Put(store, VDataPath("A.B"), Byte(1));
    VInconsistentReader reader(store);
    reader.withoutSchema = true;
    Texts errors;

    const std::string text = PrintConfiguration(reader, &errors);

    EXPECT_THAT(text, HasSubstr("<Item name=\"B\"/>"));
    EXPECT_THAT(errors,
                ElementsAre("Failed trying to write 'format' attribute for data path 'A.B'"));
}

TEST(WriteConfiguration, AnItemWithoutValuesGetsTheLineOfItsMisfittingMessage)
{
    VDataStore store;
    Put(store, VDataPath("A.B"), Byte(1));
    VInconsistentReader reader(store);
    reader.withoutValues = true;
    Texts errors;

    const std::string text = PrintConfiguration(reader, &errors);

    EXPECT_THAT(text, HasSubstr("<Item name=\"B\" format='{\"Type\":\"UInt8\"}'/>"));
    EXPECT_THAT(errors,
                ElementsAre("Cannot Format Log Message \"Failed trying to write values for data "
                            "path '%2%', data path has no values set,\""));
}

TEST(WriteConfiguration, AVoidItemKeepsItsNameAlone)
{
    VDataStore store;
    Put(store, VDataPath("A.B"), VDataValue{nullptr, {1}});
    Texts errors;

    EXPECT_THAT(PrintStore(store, &errors), HasSubstr("<Item name=\"B\"/>"));
    EXPECT_THAT(errors, IsEmpty());
}

TEST(WriteConfiguration, ValuesThatHaveNoTextAreLeftOutAndTheRestWritten)
{
    VDataStore store;
    VDataValue cut = Word(1);
    cut.Bytes.resize(1);
    VDataValue string = MakeStringValue("text");
    string.Bytes.resize(5);
    Put(store, VDataPath("A.Cut"), cut);
    Put(store, VDataPath("A.String"), string);
    Put(store, VDataPath("A.Whole"), Byte(1));
    Texts errors;

    const std::string text = PrintStore(store, &errors);

    EXPECT_THAT(errors,
                ElementsAre("Failed trying to write 'value-verified' attribute for data path "
                            "'A.Cut'",
                            "Failed trying to write 'value-verified' attribute for data path "
                            "'A.String'"));
    EXPECT_THAT(text, HasSubstr("<Item name=\"Cut\" format='{\"Type\":\"UInt16\"}'/>"));
    EXPECT_THAT(text, HasSubstr("<Item name=\"Whole\""));
}

TEST(WriteConfiguration, TextsThatHoldAZeroAreLeftOutAndTheRestWritten)
{
    const std::string zero("a\0b", 3);
    VDataStore store;
    KVR::IO::ISchema schema;
    schema.Type = KVR::IO::EType::UInt8;
    schema.TypeName = zero;
    Put(store, VDataPath{"A", "Value"}, MakeStringValue(zero));
    Put(store, VDataPath{"A", "Format"}, {&KVR::IO::GetUniqueSchema(schema), {1}});
    Put(store, VDataPath{"A", zero}, Byte(1));
    Put(store, VDataPath{zero, "B"}, Byte(1));
    Texts errors;

    const std::string text = PrintStore(store, &errors);

    const std::string failed = "Failed trying to write '";
    EXPECT_THAT(errors, ElementsAre(failed + "format' attribute for data path 'A.Format'",
                                    failed + "value-verified' attribute for data path 'A.Value'",
                                    failed + "name' attribute for data path 'A." + zero + "'",
                                    failed + "name' attribute for data path '" + zero + "'"));
    EXPECT_EQ(text.find('\0'), std::string::npos);
    EXPECT_THAT(text, HasSubstr("<Item name=\"Format\" value-verified=\"1\"/>"));
    EXPECT_THAT(text, HasSubstr("<Node>\n\t\t<Item name=\"B\" "));
}

TEST(WriteConfiguration, WhatWouldNestTooDeepIsLeftOut)
{
    VDataStore store;
    const VDataPath deepest(std::vector<std::string>(999, "n"));
    Put(store, deepest, Byte(1));
    Texts errors;

    const std::string good = PrintStore(store, &errors);
    EXPECT_THAT(errors, IsEmpty());
    Put(store, VDataPath(deepest, "n"), Byte(2));
    const std::string cut = PrintStore(store, &errors);

    ASSERT_EQ(errors.size(), 1U);
    EXPECT_EQ(errors[0].find("Failed trying to write 'name' attribute for data path 'n.n."), 0U);
    VDataStore first, second;
    EXPECT_TRUE(ReadInto(first, good)->Good);
    EXPECT_TRUE(ReadInto(second, cut)->Good);
    EXPECT_TRUE(VDataVerifyReader(first).HasValue(VDataToken(deepest)));
    EXPECT_TRUE(VDataVerifyReader(second).HasValue(VDataToken(deepest)));
}

TEST(WriteConfiguration, LogsItsMessages)
{
    VDataStore store;
    Put(store, VDataPath("A.B"), MakeStringValue(std::string(1, '\0')));
    const VLogCapture log;
    const VDataVerifyReader reader(store);
    rapidxml::xml_document<char> document;

    EXPECT_FALSE(DataStoreFileIO::WriteConfiguration(reader, document));

    EXPECT_THAT(log.Texts("DataStore"),
                ElementsAre("Failed trying to write 'value-verified' attribute for data path "
                            "'A.B'"));
    EXPECT_EQ(log.Messages()[0].Level, 2);
}

} // namespace
