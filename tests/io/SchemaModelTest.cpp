#include "io/EnumDescription.h"
#include "io/ISchema.h"
#include "io/SchemaMembers.h"

#include <gtest/gtest.h>

#include <string>
#include <thread>
#include <utility>
#include <vector>

using namespace KVR::IO;

namespace {

struct VDescribedEntry
{
    std::string name;
    std::int32_t value;
    std::string docs;
};

bool operator==(const VDescribedEntry& left, const VDescribedEntry& right)
{
    return left.name == right.name && left.value == right.value && left.docs == right.docs;
}

std::ostream& operator<<(std::ostream& output, const VDescribedEntry& entry)
{
    return output << entry.name << '=' << entry.value << ": " << entry.docs;
}

std::vector<VDescribedEntry> EntriesOf(const EnumDescription& description)
{
    std::vector<VDescribedEntry> entries;
    for (const EnumDescription::Entry& entry : description.GetEntries()) {
        entries.push_back({entry.Name, entry.Value, entry.Docs});
    }
    return entries;
}

} // namespace

TEST(Schema, StartsAsAnEmptyVoidValue)
{
    const ISchema schema;

    EXPECT_EQ(EType::Void, schema.Type);
    EXPECT_EQ(ERole::Value, schema.Role);
    EXPECT_EQ(0u, schema.Detail);
    EXPECT_EQ(0u, schema.Count);
    EXPECT_EQ("", schema.TypeName);
    EXPECT_TRUE(schema.EnumValues.empty());
    EXPECT_TRUE(schema.SubSchemas.empty());
    EXPECT_TRUE(schema.Docs.empty());
}

TEST(Schema, MembersHaveTheirWidths)
{
    const ISchema schema;

    EXPECT_EQ(1u, sizeof(schema.Type));
    EXPECT_EQ(1u, sizeof(schema.Role));
    EXPECT_EQ(2u, sizeof(schema.Detail));
    EXPECT_EQ(4u, sizeof(schema.Count));
    EXPECT_EQ(4u, sizeof(ISchema::EnumValue::second));
}

TEST(Schema, CopyOwnsItsWholeSubtree)
{
    ISchema schema;
    schema.SubSchemas.emplace_back("member", ISchema());
    const ISchema copy = schema;

    schema.SubSchemas[0].second.Type = EType::String;

    EXPECT_EQ(EType::Void, copy.SubSchemas[0].second.Type);
}

TEST(SchemaMembers, DescribeThemselvesInTheOrderOfTheRecord)
{
    // clang-format off
    const std::vector<std::pair<std::string, std::string>> expected = {
        {"Type", "Type represented by this ISchema"},
        {"Role", "Role of the type represented by this schema"},
        {"Detail", "For future use. May store extra info useful for code generation or interpretation. Not used in equality tests."},
        {"Count", "Repetition of sub schema if type is a fixed size array"},
        {"TypeName", "Qualified name of the Class, Enum or Function (if applicable) - not currently used in schema comparison or equality tests."},
        {"EnumValues", "legal enum values if type is an enum."},
        {"SubSchemas", "Schemas for any sub types. (e.g. type in list, types in tuple etc.)"},
        {"Docs", "Documentation strings associated with the schema. First entry is the type documentation. Remaining entries are the enum value or named tuple member docs in the order they appear in m_EnumValues or m_SubSchemas."},
    };
    // clang-format on

    std::vector<std::pair<std::string, std::string>> members;
    for (const SchemaMember& member : DescribeSchemaMembers()) {
        members.emplace_back(member.Name, member.Description);
    }

    EXPECT_EQ(expected, members);
}

TEST(EnumDescription, OfTypesListsEveryTypeByName)
{
    // clang-format off
    const std::vector<VDescribedEntry> expected = {
        {"Void", 0, ""}, {"Bool", 1, ""}, {"Int8", 2, ""}, {"Int16", 3, ""}, {"Int32", 4, ""},
        {"Int64", 5, ""}, {"UInt8", 6, ""}, {"UInt16", 7, ""}, {"UInt32", 8, ""}, {"UInt64", 9, ""},
        {"Float32", 10, ""}, {"Float64", 11, ""}, {"String", 12, ""}, {"Array", 13, ""},
        {"List", 14, ""}, {"Tuple", 15, ""}, {"NamedTuple", 16, ""}, {"Enum8", 17, ""},
        {"Enum16", 18, ""}, {"Enum32", 19, ""}, {"Ref", 20, ""},
    };
    // clang-format on

    EXPECT_EQ("Schema.EType", DescribeEType().GetName());
    EXPECT_EQ("Supported types.", DescribeEType().GetDocs());
    EXPECT_EQ(expected, EntriesOf(DescribeEType()));
}

TEST(EnumDescription, OfRolesListsEveryRoleWithItsText)
{
    // clang-format off
    const std::vector<VDescribedEntry> expected = {
        {"Value", 0, "An object or value"},
        {"Function", 1, "A function specification"},
        {"Callback", 2, "A callback specification"},
        {"Input", 3, "An input parameter within a function"},
        {"InputOutput", 4, "An input and output parameter within a function"},
        {"Output", 5, "An output parameter within a function"},
        {"Return", 6, "A return value from function"},
        {"Result", 7, "A return value from a function that is a result code (may be used by API generation)"},
    };
    // clang-format on

    EXPECT_EQ("Schema.ERole", DescribeERole().GetName());
    EXPECT_EQ("The role of the type represented by the schema.", DescribeERole().GetDocs());
    EXPECT_EQ(expected, EntriesOf(DescribeERole()));
}

TEST(EnumDescription, NumbersOfTheDescriptionsAreThoseOfTheEnumerations)
{
    EXPECT_EQ(static_cast<int>(EType::NamedTuple), DescribeEType().FindName("NamedTuple")->Value);
    EXPECT_EQ(static_cast<int>(EType::Ref), DescribeEType().FindName("Ref")->Value);
    EXPECT_EQ(static_cast<int>(ERole::Result), DescribeERole().FindName("Result")->Value);
}

TEST(EnumDescription, AddingAPresentNameDoesNothing)
{
    EnumDescription description("Name", "Docs");
    description.Add("A", 1, "first");

    description.Add("A", 2, "second");

    EXPECT_EQ((std::vector<VDescribedEntry>{{"A", 1, "first"}}), EntriesOf(description));
}

TEST(EnumDescription, FirstEntryOfANumberWins)
{
    EnumDescription description("Name", "Docs");
    description.Add("A", 1);
    description.Add("B", 1);

    EXPECT_EQ("A", description.FindValue(1)->Name);
    EXPECT_EQ("A", description.NameOf(1));
    EXPECT_EQ(1, description.FindName("B")->Value);
}

TEST(EnumDescription, UnknownNamesAndNumbersAreNotFound)
{
    EXPECT_EQ(nullptr, DescribeEType().FindName("int32"));
    EXPECT_EQ(nullptr, DescribeEType().FindName(""));
    EXPECT_EQ(nullptr, DescribeEType().FindValue(21));
    EXPECT_EQ("Unspecified", DescribeEType().NameOf(21));
    EXPECT_EQ("Unspecified", DescribeERole().NameOf(-1));
}

TEST(EnumDescription, IsOneInstanceForAllThreads)
{
    const EnumDescription* seen[2] = {nullptr, nullptr};
    std::thread other([&] { seen[0] = &DescribeERole(); });
    seen[1] = &DescribeERole();
    other.join();

    EXPECT_EQ(seen[0], seen[1]);
}
