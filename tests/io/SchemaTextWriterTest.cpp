#include "io/SchemaText.h"

#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

using namespace KVR::IO;

namespace {

std::string TextOf(const ISchema& schema, SchemaTextMode mode)
{
    std::string text;
    EXPECT_TRUE(WriteSchemaText(text, schema, mode));
    return text;
}

/// A schema in which every member differs from its default.
ISchema FullSchema()
{
    ISchema schema = NamedTupleOf({{"a", Plain(EType::Bool)}, {"b", Plain(EType::String)}});
    schema.Role = ERole::InputOutput;
    schema.Detail = 65535;
    schema.Count = 4294967295;
    schema.TypeName = "KVR::Name";
    schema.EnumValues = {{"One", 1}, {"Least", -2147483647 - 1}};
    schema.Docs = {"whole", ""};
    return schema;
}

} // namespace

TEST(SchemaTextWriter, DefaultSchemaInEveryMode)
{
    EXPECT_EQ(R"(["Void","Value",0,0,"",[],[],[]])", TextOf(ISchema(), SchemaTextModePositional));
    EXPECT_EQ(R"({"Type":"Void","Role":"Value","Detail":0,"Count":0,"TypeName":"",)"
              R"("EnumValues":[],"SubSchemas":[],"Docs":[]})",
              TextOf(ISchema(), SchemaTextModeNamed));
    EXPECT_EQ("{}", TextOf(ISchema(), SchemaTextModeBrief));
    EXPECT_EQ(R"(["Void","Value",0,0,"",[0],[0],[0]])", TextOf(ISchema(), SchemaTextModeRow));
    EXPECT_EQ(R"(["Void","Value",0,0,"",[],[],[]])", TextOf(ISchema(), SchemaTextModeQuotedRow));
}

TEST(SchemaTextWriter, FullSchemaInEveryMode)
{
    const std::string positional =
        R"(["NamedTuple","InputOutput",65535,4294967295,"KVR::Name",)"
        R"([["One",1],["Least",-2147483648]],)"
        R"([["a",["Bool","Value",0,0,"",[],[],[]]],["b",["String","Value",0,0,"",[],[],[]]]],)"
        R"(["whole",""]])";

    EXPECT_EQ(positional, TextOf(FullSchema(), SchemaTextModePositional));
    EXPECT_EQ(
        R"({"Type":"NamedTuple","Role":"InputOutput","Detail":65535,"Count":4294967295,)"
        R"("TypeName":"KVR::Name","EnumValues":[["One",1],["Least",-2147483648]],)"
        R"("SubSchemas":[["a",{"Type":"Bool","Role":"Value","Detail":0,"Count":0,"TypeName":"",)"
        R"("EnumValues":[],"SubSchemas":[],"Docs":[]}],)"
        R"(["b",{"Type":"String","Role":"Value","Detail":0,"Count":0,"TypeName":"",)"
        R"("EnumValues":[],"SubSchemas":[],"Docs":[]}]],"Docs":["whole",""]})",
        TextOf(FullSchema(), SchemaTextModeNamed));
    EXPECT_EQ(R"({"Type":"NamedTuple","Role":"InputOutput","Detail":65535,"Count":4294967295,)"
              R"("TypeName":"KVR::Name","EnumValues":[["One",1],["Least",-2147483648]],)"
              R"("SubSchemas":[["a",{"Type":"Bool"}],["b",{"Type":"String"}]],)"
              R"("Docs":["whole",""]})",
              TextOf(FullSchema(), SchemaTextModeBrief));
    EXPECT_EQ(positional, TextOf(FullSchema(), SchemaTextModeQuotedRow));
}

TEST(SchemaTextWriter, DeliberateRowModeWritesListsAsCountsOnly)
{
    EXPECT_EQ(R"(["NamedTuple","InputOutput",65535,4294967295,"KVR::Name",[2],[2],[2]])",
              TextOf(FullSchema(), SchemaTextModeRow));
}

TEST(SchemaTextWriter, BriefModeLeavesOutExactlyTheDefaultMembers)
{
    // clang-format off
    ISchema schema;
    schema.Type = EType::Int8;
    EXPECT_EQ(R"({"Type":"Int8"})", TextOf(schema, SchemaTextModeBrief));
    schema = ISchema();
    schema.Role = ERole::Result;
    EXPECT_EQ(R"({"Role":"Result"})", TextOf(schema, SchemaTextModeBrief));
    schema = ISchema();
    schema.Detail = 1;
    EXPECT_EQ(R"({"Detail":1})", TextOf(schema, SchemaTextModeBrief));
    schema = ISchema();
    schema.Count = 1;
    EXPECT_EQ(R"({"Count":1})", TextOf(schema, SchemaTextModeBrief));
    schema = ISchema();
    schema.TypeName = "N";
    EXPECT_EQ(R"({"TypeName":"N"})", TextOf(schema, SchemaTextModeBrief));
    schema = ISchema();
    schema.EnumValues = {{"", 0}};
    EXPECT_EQ(R"({"EnumValues":[["",0]]})", TextOf(schema, SchemaTextModeBrief));
    schema = ISchema();
    schema.SubSchemas = {{"", ISchema()}};
    EXPECT_EQ(R"({"SubSchemas":[["",{}]]})", TextOf(schema, SchemaTextModeBrief));
    schema = ISchema();
    schema.Docs = {""};
    EXPECT_EQ(R"({"Docs":[""]})", TextOf(schema, SchemaTextModeBrief));
    // clang-format on
}

TEST(SchemaTextWriter, AppendsToWhatIsThere)
{
    std::string text = "format=";

    EXPECT_TRUE(WriteSchemaText(text, ISchema(), SchemaTextModeBrief));

    EXPECT_EQ("format={}", text);
}

TEST(SchemaTextWriter, EmptyListBehindACommaKeepsTheComma)
{
    std::string text = ",";

    WriteSchemaText(text, ISchema(), SchemaTextModeBrief);

    EXPECT_EQ(",{}", text);
}

TEST(SchemaTextWriter, UnknownTypeAndRoleAreUnspecified)
{
    ISchema schema = Plain(static_cast<EType>(21));
    schema.Role = static_cast<ERole>(8);

    EXPECT_EQ(R"({"Type":"Unspecified","Role":"Unspecified"})",
              TextOf(schema, SchemaTextModeBrief));
}

TEST(SchemaTextWriter, EveryTypeAndRoleHasItsName)
{
    const char* const types[] = {"Void",   "Bool",   "Int8",   "Int16",  "Int32",      "Int64",
                                 "UInt8",  "UInt16", "UInt32", "UInt64", "Float32",    "Float64",
                                 "String", "Array",  "List",   "Tuple",  "NamedTuple", "Enum8",
                                 "Enum16", "Enum32", "Ref"};
    const char* const roles[] = {"Value",       "Function", "Callback", "Input",
                                 "InputOutput", "Output",   "Return",   "Result"};
    const std::string rest = R"(,0,0,"",[0],[0],[0]])";

    for (unsigned i = 0; i < 21; ++i) {
        EXPECT_EQ(std::string(R"([")") + types[i] + R"(","Value")" + rest,
                  TextOf(Plain(static_cast<EType>(i)), SchemaTextModeRow));
    }
    for (unsigned i = 0; i < 8; ++i) {
        ISchema schema;
        schema.Role = static_cast<ERole>(i);
        EXPECT_EQ(std::string(R"(["Void",")") + roles[i] + '"' + rest,
                  TextOf(schema, SchemaTextModeRow));
    }
}

TEST(SchemaTextWriter, EscapesFiveCharactersAndNoOther)
{
    ISchema schema;
    schema.TypeName = "\t\n\r\"\\/\b\f\v\x01\xC3\xA9'";

    EXPECT_EQ("{\"TypeName\":\"\\t\\n\\r\\\"\\\\/\b\f\v\x01\xC3\xA9'\"}",
              TextOf(schema, SchemaTextModeBrief));
}

TEST(SchemaTextWriter, EscapesNamesOfEntriesAndMembersAndDocs)
{
    ISchema schema = NamedTupleOf({{"a\tb", ISchema()}});
    schema.EnumValues = {{"c\"d", 1}};
    schema.Docs = {"e\nf"};

    EXPECT_EQ(R"({"Type":"NamedTuple","EnumValues":[["c\"d",1]],"SubSchemas":[["a\tb",{}]],)"
              R"("Docs":["e\nf"]})",
              TextOf(schema, SchemaTextModeBrief));
}
