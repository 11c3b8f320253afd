#include "io/SchemaText.h"

#include "Variant/Interning.h"
#include "io/DataValue.h"
#include "io/SchemaEquality.h"
#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <string>

using namespace KVR::IO;

namespace {

/// Reads a text that must be good and returns its schema.
ISchema Read(const std::string& text)
{
    ISchema schema;
    const char* cursor = text.c_str();
    EXPECT_TRUE(ReadSchemaText(schema, cursor)) << text;
    EXPECT_EQ(text.c_str() + text.size(), cursor) << text;
    return schema;
}

bool Fails(const std::string& text)
{
    ISchema schema;
    const char* cursor = text.c_str();
    return !ReadSchemaText(schema, cursor);
}

/// The type name that a quoted string in the text gives.
std::string ReadName(const std::string& quoted)
{
    return Read("{\"TypeName\":" + quoted + "}").TypeName;
}

std::uint32_t ReadCount(const std::string& number)
{
    return Read("{\"Count\":" + number + "}").Count;
}

std::int32_t ReadEntry(const std::string& number)
{
    const ISchema schema = Read("{\"EnumValues\":[[\"a\"," + number + "]]}");
    return schema.EnumValues.empty() ? 0 : schema.EnumValues[0].second;
}

std::string Repeated(const std::string& text, std::size_t count)
{
    std::string result;
    for (std::size_t i = 0; i < count; ++i) {
        result += text;
    }
    return result;
}

std::string NamedLevels(std::size_t count)
{
    return Repeated(R"({"SubSchemas":[["",)", count - 1) + "{}" + Repeated("]]}", count - 1);
}

std::string PositionalLevels(std::size_t count)
{
    return Repeated(R"(["Tuple","Value",0,0,"",[],[["",)", count - 1) +
           R"(["Void","Value",0,0,"",[],[],[]])" + Repeated("]],[]]", count - 1);
}

} // namespace

TEST(ParseSchemaText, EmptyObjectIsTheDefaultSchema)
{
    VDataValue value;

    EXPECT_TRUE(ParseSchemaText(value, "{}"));
    EXPECT_EQ(&GetUniquePodSchema(EType::Void), value.Schema);
    EXPECT_TRUE(ParseSchemaText(value, " {\t} "));
    EXPECT_EQ(&GetUniquePodSchema(EType::Void), value.Schema);
}

TEST(ParseSchemaText, StoresTheInternedSchemaAndEmptiesTheBytes)
{
    VDataValue value;
    value.Bytes = {1, 2, 3};

    EXPECT_TRUE(ParseSchemaText(value, R"({"Type":"Int32","TypeName":"N"})"));

    ISchema expected = Plain(EType::Int32);
    expected.TypeName = "N";
    EXPECT_EQ(&GetUniqueSchema(expected), value.Schema);
    EXPECT_TRUE(value.Bytes.empty());
}

TEST(ParseSchemaText, FailureKeepsTheSchemaAndEmptiesTheBytes)
{
    VDataValue value;
    value.Schema = &GetUniquePodSchema(EType::Bool);
    value.Bytes = {1};

    EXPECT_FALSE(ParseSchemaText(value, R"({"Type":"Int33"})"));

    EXPECT_EQ(&GetUniquePodSchema(EType::Bool), value.Schema);
    EXPECT_TRUE(value.Bytes.empty());
}

TEST(ParseSchemaText, AcceptsTextBehindTheSchema)
{
    VDataValue value;

    EXPECT_TRUE(ParseSchemaText(value, R"({"Type":"Bool"} and more)"));
    EXPECT_EQ(&GetUniquePodSchema(EType::Bool), value.Schema);
    EXPECT_TRUE(ParseSchemaText(value, R"(["Int8","Value",0,0,"",[],[],[]]])"));
    EXPECT_EQ(&GetUniquePodSchema(EType::Int8), value.Schema);
}

TEST(SchemaTextReader, PositionalFormReadsAllEightMembers)
{
    const ISchema schema = Read(R"(["NamedTuple","Return",65535,3,"N",[["A",-1],["B",2]],)"
                                R"([["a",["Bool","Value",0,0,"",[],[],[]]],["b",{}]],["d","e"]])");

    EXPECT_EQ(EType::NamedTuple, schema.Type);
    EXPECT_EQ(ERole::Return, schema.Role);
    EXPECT_EQ(65535u, schema.Detail);
    EXPECT_EQ(3u, schema.Count);
    EXPECT_EQ("N", schema.TypeName);
    EXPECT_EQ((std::vector<ISchema::EnumValue>{{"A", -1}, {"B", 2}}), schema.EnumValues);
    ASSERT_EQ(2u, schema.SubSchemas.size());
    EXPECT_EQ("a", schema.SubSchemas[0].first);
    EXPECT_EQ(EType::Bool, schema.SubSchemas[0].second.Type);
    EXPECT_EQ("b", schema.SubSchemas[1].first);
    EXPECT_EQ(EType::Void, schema.SubSchemas[1].second.Type);
    EXPECT_EQ((std::vector<std::string>{"d", "e"}), schema.Docs);
}

TEST(SchemaTextReader, ObjectFormReadsAllEightMembersInAnyOrder)
{
    const ISchema schema = Read(R"({"Docs":["d"],"SubSchemas":[["",{"Type":"Int8"}]],)"
                                R"("EnumValues":[["A",1]],"TypeName":"N","Count":3,"Detail":7,)"
                                R"("Role":"Output","Type":"Array"})");

    EXPECT_EQ(EType::Array, schema.Type);
    EXPECT_EQ(ERole::Output, schema.Role);
    EXPECT_EQ(7u, schema.Detail);
    EXPECT_EQ(3u, schema.Count);
    EXPECT_EQ("N", schema.TypeName);
    EXPECT_EQ((std::vector<ISchema::EnumValue>{{"A", 1}}), schema.EnumValues);
    ASSERT_EQ(1u, schema.SubSchemas.size());
    EXPECT_EQ(EType::Int8, schema.SubSchemas[0].second.Type);
    EXPECT_EQ((std::vector<std::string>{"d"}), schema.Docs);
}

TEST(SchemaTextReader, AbsentNamesKeepTheirDefaults)
{
    const ISchema schema = Read(R"({"Count":2})");

    ISchema expected;
    expected.Count = 2;
    EXPECT_TRUE(StrictlyEqual(expected, schema));
    EXPECT_EQ(0u, schema.Detail);
    EXPECT_TRUE(schema.Docs.empty());
}

TEST(SchemaTextReader, FourBlanksMayStandAroundEverything)
{
    // clang-format off
    EXPECT_EQ(EType::Bool, Read("\t\n\r { \"Type\" \t : \n \"Bool\" \r , \"Count\" : 3 }").Type);
    EXPECT_EQ(3u, Read(" [ \"Bool\" ,\t\"Value\"\n, 0 , 3 , \"\" , [ ] , [ [ \"\" , { } ] ] , [ \"d\" , \"e\" ] ]").Count);
    EXPECT_EQ(-4, Read(" { \"EnumValues\" : [ [ \"a\" , -4 ] , [ \"b\" , 5 ] ] }").EnumValues[0].second);
    // clang-format on
}

TEST(SchemaTextReader, OtherBlanksOfTheRuntimeLibraryAreNone)
{
    EXPECT_TRUE(Fails("\v{}"));
    EXPECT_TRUE(Fails("{\f}"));
    EXPECT_TRUE(Fails("{\"Count\":\v3}"));
    EXPECT_TRUE(Fails("{\"EnumValues\":[[\"a\",\f3]]}"));
}

TEST(SchemaTextReader, TextThatEndsTooEarlyFails)
{
    const std::string texts[] = {
        R"({"Type":"NamedTuple","EnumValues":[["a",1]],"SubSchemas":[["b\n",{}]],"Docs":["c"]})",
        R"(["Array","Value",0,3,"x",[["a",-1]],[["",["Void","Value",0,0,"",[],[],[]]]],["d"]])"};

    for (const std::string& text : texts) {
        ISchema schema;
        const char* cursor = text.c_str();
        ASSERT_TRUE(ReadSchemaText(schema, cursor));
        for (std::size_t length = 0; length < text.size(); ++length) {
            EXPECT_TRUE(Fails(text.substr(0, length))) << text.substr(0, length);
        }
    }
}

TEST(SchemaTextReader, PositionalFormNeedsExactlyEightMembers)
{
    // clang-format off
    EXPECT_TRUE(Fails("[]"));
    EXPECT_TRUE(Fails(R"(["Void","Value",0,0,"",[],[]])"));
    EXPECT_TRUE(Fails(R"(["Void","Value",0,0,"",[],[],[],])"));
    EXPECT_TRUE(Fails(R"(["Void","Value",0,0,"",[],[],[],[]])"));
    EXPECT_TRUE(Fails(R"(["Void" "Value",0,0,"",[],[],[]])"));
    EXPECT_TRUE(Fails(R"(["Void","Value",0,0,"",[],[],[]})"));
    EXPECT_TRUE(Fails(R"(["Void",,"Value",0,0,"",[],[],[]])"));
    EXPECT_TRUE(Fails(R"(["Value","Void",0,0,"",[],[],[]])"));
    EXPECT_TRUE(Fails(R"(["Void","Value",[],[],"",0,0,[]])"));
    // clang-format on
}

TEST(SchemaTextReader, MemberThatFailsFailsTheWholeThoughOthersAreGood)
{
    EXPECT_TRUE(Fails(R"(["Vod","Value",0,0,"",[],[],[]])"));
    EXPECT_TRUE(Fails(R"(["Void","Value",65536,0,"",[],[],[]])"));
    EXPECT_TRUE(Fails(R"(["Void","Value",0,0,"",[],[],["d",]])"));
}

TEST(SchemaTextReader, MembersBehindOneThatFailsAreStillRead)
{
    ISchema schema;
    const std::string text = R"(["Vod","Return",65536,3,"N",[],[],["d"]] rest)";
    const char* cursor = text.c_str();

    EXPECT_FALSE(ReadSchemaText(schema, cursor));

    EXPECT_STREQ(" rest", cursor);
    EXPECT_EQ(ERole::Return, schema.Role);
    EXPECT_EQ(3u, schema.Count);
    EXPECT_EQ("N", schema.TypeName);
    EXPECT_EQ((std::vector<std::string>{"d"}), schema.Docs);
}

TEST(SchemaTextReader, ObjectSyntaxErrorsFail)
{
    // clang-format off
    EXPECT_TRUE(Fails(""));
    EXPECT_TRUE(Fails("x"));
    EXPECT_TRUE(Fails("null"));
    EXPECT_TRUE(Fails("\"Void\""));
    EXPECT_TRUE(Fails("{,}"));
    EXPECT_TRUE(Fails("{\"Type\"}"));
    EXPECT_TRUE(Fails("{\"Type\" \"Void\"}"));
    EXPECT_TRUE(Fails("{Type:\"Void\"}"));
    EXPECT_TRUE(Fails("{\"Type\":\"Void\",}"));
    EXPECT_TRUE(Fails("{\"Type\":\"Void\"]"));
    EXPECT_TRUE(Fails("{\"Type\":\"Void\" \"Role\":\"Value\"}"));
    EXPECT_TRUE(Fails("{\"Type\":}"));
    EXPECT_TRUE(Fails("{\"Count\":]}"));
    // clang-format on
}

TEST(SchemaTextReader, ValueMustEndWhereItsMemberEnds)
{
    EXPECT_TRUE(Fails(R"({"Count":3x})"));
    EXPECT_TRUE(Fails(R"({"Count":3"4"})"));
    EXPECT_TRUE(Fails(R"({"Count":3 4})"));
    EXPECT_TRUE(Fails(R"({"Type":x"Bool"})"));
    EXPECT_TRUE(Fails(R"({"Docs":["a"}})"));
    EXPECT_EQ(3u, Read(R"({"Count":3   })").Count);
}

TEST(SchemaTextReader, UnknownKeysAreSkippedWhateverTheirNesting)
{
    // clang-format off
    EXPECT_EQ(EType::Bool, Read(R"({"x":{"y":[1,{"z":"]}"}]},"Type":"Bool"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"x":[[[]],{}],"Type":"Bool"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"x":"a,}]\"","Type":"Bool","type":"Int8"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"x":true false ,"Type":"Bool"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"x":{"Type":"Int8"},"Type":"Bool"})").Type);
    // clang-format on
}

TEST(SchemaTextReader, SkipperLooksAtNothingButDepthAndStrings)
{
    // No value at all is one of no characters, and any bracket closes any other.
    EXPECT_EQ(EType::Bool, Read(R"({"x":,"Type":"Bool"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"Type":"Bool","x":})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"x":[1}, "Type":"Bool"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"x":12[3], "Type":"Bool"})").Type);
}

TEST(SchemaTextReader, SkippedValueEndsWithItsFirstStringOrBracket)
{
    EXPECT_TRUE(Fails(R"({"x":"a" b,"Type":"Bool"})"));
    EXPECT_TRUE(Fails(R"({"x":[1]2,"Type":"Bool"})"));
    EXPECT_TRUE(Fails(R"({"x":"a)"));
    EXPECT_TRUE(Fails(R"({"x":["a])"));
    EXPECT_TRUE(Fails(R"({"x":"a\)"));
    EXPECT_TRUE(Fails(R"({"x":"a\")"));
    EXPECT_TRUE(Fails(R"({"x":"a\","Type":"Bool"})"));
    EXPECT_EQ(EType::Bool, Read(R"({"x":"a\\","Type":"Bool"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"x":["\\\"]",","],"Type":"Bool"})").Type);
}

TEST(SchemaTextReader, FirstOfDuplicatedKeysCounts)
{
    EXPECT_EQ(EType::Bool, Read(R"({"Type":"Bool","Type":"Int8"})").Type);
    EXPECT_EQ(EType::Bool, Read(R"({"Type":"Bool","Type":"no type"})").Type);
    EXPECT_TRUE(Fails(R"({"Type":"no type","Type":"Bool"})"));
}

TEST(SchemaTextReader, KeysAreComparedExactly)
{
    EXPECT_EQ(0u, Read(R"({"count":3,"Count ":4,"Coun":5})").Count);
    EXPECT_EQ(3u, Read(R"({"Co\unt":3})").Count);
}

TEST(SchemaTextReader, TypeAndRoleAreNamesOfTheirDescriptions)
{
    // clang-format off
    EXPECT_EQ(EType::Ref, Read(R"({"Type":"Ref"})").Type);
    EXPECT_EQ(ERole::Result, Read(R"({"Role":"Result"})").Role);
    EXPECT_TRUE(Fails(R"({"Type":"bool"})"));
    EXPECT_TRUE(Fails(R"({"Type":""})"));
    EXPECT_TRUE(Fails(R"({"Type":1})"));
    EXPECT_TRUE(Fails(R"({"Type":"Unspecified"})"));
    EXPECT_TRUE(Fails(R"({"Role":"Unspecified"})"));
    EXPECT_TRUE(Fails(R"({"Role":"Bool"})"));
    // clang-format on
}

TEST(SchemaTextReader, DetailAbove65535Fails)
{
    EXPECT_EQ(65535u, Read(R"({"Detail":65535})").Detail);
    EXPECT_TRUE(Fails(R"({"Detail":65536})"));
    EXPECT_EQ(65535u, Read(R"(["Void","Value",65535,0,"",[],[],[]])").Detail);
    EXPECT_TRUE(Fails(R"(["Void","Value",65536,0,"",[],[],[]])"));
}

TEST(SchemaTextReader, DetailIsClampedBeforeItIsChecked)
{
    EXPECT_TRUE(Fails(R"({"Detail":-1})"));
    EXPECT_TRUE(Fails(R"({"Detail":4294967297})"));
    EXPECT_TRUE(Fails(R"({"Detail":18446744073709551617})"));
}

TEST(SchemaTextReader, CountIsClampedAndANegativeOneWraps)
{
    EXPECT_EQ(4294967295u, ReadCount("4294967295"));
    EXPECT_EQ(4294967295u, ReadCount("4294967296"));
    EXPECT_EQ(4294967295u, ReadCount("99999999999999999999999"));
    EXPECT_EQ(4294967295u, ReadCount("-1"));
    EXPECT_EQ(4294967293u, ReadCount("-3"));
    EXPECT_EQ(1u, ReadCount("-4294967295"));
    EXPECT_EQ(4294967295u, ReadCount("-4294967296"));
    EXPECT_EQ(4294967295u, ReadCount("-99999999999999999999999"));
    EXPECT_EQ(7u, ReadCount("+007"));
    EXPECT_EQ(0u, ReadCount("-0"));
}

TEST(SchemaTextReader, EntryNumbersAreClampedToSigned32Bits)
{
    EXPECT_EQ(2147483647, ReadEntry("2147483647"));
    EXPECT_EQ(2147483647, ReadEntry("2147483648"));
    EXPECT_EQ(2147483647, ReadEntry("99999999999999999999999"));
    EXPECT_EQ(-2147483647 - 1, ReadEntry("-2147483648"));
    EXPECT_EQ(-2147483647 - 1, ReadEntry("-2147483649"));
    EXPECT_EQ(-2147483647 - 1, ReadEntry("-99999999999999999999999"));
    EXPECT_EQ(5, ReadEntry("+5"));
}

TEST(SchemaTextReader, NumberWithoutDigitsFails)
{
    // clang-format off
    EXPECT_TRUE(Fails(R"({"Count":-})"));
    EXPECT_TRUE(Fails(R"({"Count":x})"));
    EXPECT_TRUE(Fails(R"({"Count":- 3})"));
    EXPECT_TRUE(Fails(R"({"Count":+-3})"));
    EXPECT_TRUE(Fails(R"({"Count":"3"})"));
    EXPECT_TRUE(Fails(R"({"Count":0x10})"));
    EXPECT_TRUE(Fails(R"({"EnumValues":[["a",]]})"));
    EXPECT_TRUE(Fails(R"({"EnumValues":[["a",-]]})"));
    // clang-format on
}

TEST(SchemaTextReader, ListsMayBeEmptyButNotEndInAComma)
{
    // clang-format off
    EXPECT_TRUE(Read(R"({"EnumValues":[],"SubSchemas":[ ],"Docs":[]})").Docs.empty());
    EXPECT_TRUE(Fails(R"({"EnumValues":[["a",1],]})"));
    EXPECT_TRUE(Fails(R"({"SubSchemas":[["",{}],]})"));
    EXPECT_TRUE(Fails(R"({"Docs":["a",]})"));
    EXPECT_TRUE(Fails(R"({"Docs":[,]})"));
    EXPECT_TRUE(Fails(R"({"Docs":["a" "b"]})"));
    EXPECT_TRUE(Fails(R"({"Docs":"a"})"));
    EXPECT_TRUE(Fails(R"({"Docs":{}})"));
    // clang-format on
}

TEST(SchemaTextReader, ItemsOfTheListsAreBracketedPairs)
{
    // clang-format off
    EXPECT_TRUE(Fails(R"({"EnumValues":["a",1]})"));
    EXPECT_TRUE(Fails(R"({"EnumValues":[["a"]]})"));
    EXPECT_TRUE(Fails(R"({"EnumValues":[["a",1,2]]})"));
    EXPECT_TRUE(Fails(R"({"EnumValues":[[1,"a"]]})"));
    EXPECT_TRUE(Fails(R"({"EnumValues":[{"a":1}]})"));
    EXPECT_TRUE(Fails(R"({"SubSchemas":[{}]})"));
    EXPECT_TRUE(Fails(R"({"SubSchemas":[["a"]]})"));
    EXPECT_TRUE(Fails(R"({"SubSchemas":[["a",1]]})"));
    EXPECT_TRUE(Fails(R"({"SubSchemas":[["a",{},{}]]})"));
    // clang-format on
}

TEST(SchemaTextReader, QuotedStringsTakeTheCharacterBehindABackslash)
{
    EXPECT_EQ("a\nb", ReadName(R"("a\nb")"));
    EXPECT_EQ("a\rb", ReadName(R"("a\rb")"));
    EXPECT_EQ("a\"b\\c/d", ReadName(R"("a\"b\\c\/d")"));
    EXPECT_EQ("bfvu0041", ReadName(R"("\b\f\v\u0041")"));
    EXPECT_EQ("raw \n\t", ReadName("\"raw \n\t\""));
    EXPECT_EQ("", ReadName(R"("")"));
    EXPECT_TRUE(Fails(R"({"TypeName":"a\)"));
    EXPECT_TRUE(Fails(R"({"TypeName":"a)"));
}

TEST(SchemaTextReader, DeliberateEscapedTabIsKeptAsATabAndTheLetterT)
{
    EXPECT_EQ("a\ttb", ReadName(R"("a\tb")"));
}

TEST(SchemaTextReader, DeliberateTabDoesNotSurviveAWriteAndARead)
{
    ISchema schema;
    schema.TypeName = "a\tb";
    std::string text;
    WriteSchemaText(text, schema, SchemaTextModeNamed);

    EXPECT_EQ("a\ttb", Read(text).TypeName);
}

TEST(SchemaTextReader, ZeroByteInANameDoesNotReadBack)
{
    ISchema schema;
    schema.TypeName = std::string("a\0b", 3);
    std::string text;
    WriteSchemaText(text, schema, SchemaTextModeNamed);

    EXPECT_TRUE(Fails(text));
}

TEST(SchemaTextReader, SummaryOfCountsDoesNotReadBack)
{
    std::string text;
    WriteSchemaText(text, ISchema(), SchemaTextModeRow);

    EXPECT_EQ(R"(["Void","Value",0,0,"",[0],[0],[0]])", text);
    EXPECT_TRUE(Fails(text));
}

TEST(SchemaTextReader, BothFormsMayContainEachOther)
{
    const ISchema schema = Read(R"({"Type":"Tuple","SubSchemas":[["",["List","Value",0,0,"",[],)"
                                R"([["",{"Type":"Bool"}]],[]]]]})");

    EXPECT_TRUE(StrictlyEqual(TupleOf({ListOf(Plain(EType::Bool))}), schema));
}

TEST(SchemaTextReader, Takes256LevelsAndNoMore)
{
    EXPECT_FALSE(Fails(NamedLevels(256)));
    EXPECT_TRUE(Fails(NamedLevels(257)));
    EXPECT_FALSE(Fails(PositionalLevels(256)));
    EXPECT_TRUE(Fails(PositionalLevels(257)));
}

TEST(SchemaTextReader, LevelsAreThoseOfSchemasWithinEachOther)
{
    // Many side by side, and brackets in a value that nobody reads, are no levels.
    EXPECT_EQ(
        1000u,
        Read(R"({"SubSchemas":[["",{}])" + Repeated(R"(,["",{}])", 999) + "]}").SubSchemas.size());
    EXPECT_EQ(
        EType::Bool,
        Read(R"({"x":)" + Repeated("[", 1000) + Repeated("]", 1000) + R"(,"Type":"Bool"})").Type);
}
