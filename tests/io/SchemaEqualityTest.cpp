#include "io/SchemaEquality.h"

#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <functional>

using namespace KVR::IO;

namespace {

/// A schema in which every member has a value of its own.
ISchema FullSchema()
{
    ISchema schema = NamedTupleOf({{"a", Plain(EType::Int32)}, {"b", Plain(EType::String)}});
    schema.Role = ERole::Function;
    schema.Detail = 7;
    schema.Count = 3;
    schema.TypeName = "Name";
    schema.EnumValues = {{"One", 1}, {"Two", 2}};
    schema.Docs = {"docs"};
    return schema;
}

struct VDifference
{
    const char* name;
    std::function<void(ISchema&)> apply;
};

void PrintTo(const VDifference& difference, std::ostream* output)
{
    *output << difference.name;
}

class SchemaDifference : public testing::TestWithParam<VDifference>
{
protected:
    ISchema Changed() const
    {
        ISchema schema = FullSchema();
        GetParam().apply(schema);
        return schema;
    }
};

std::string NameOfCase(const testing::TestParamInfo<VDifference>& info)
{
    return info.param.name;
}

// clang-format off
const VDifference countingDifferences[] = {
    {"Type", [](ISchema& schema) { schema.Type = EType::Tuple; }},
    {"Role", [](ISchema& schema) { schema.Role = ERole::Callback; }},
    {"Count", [](ISchema& schema) { schema.Count = 4; }},
    {"TypeNameOfAFunction", [](ISchema& schema) { schema.TypeName = "name"; }},
    {"EnumName", [](ISchema& schema) { schema.EnumValues[0].first = "Uno"; }},
    {"EnumNumber", [](ISchema& schema) { schema.EnumValues[0].second = 9; }},
    {"EnumOrder", [](ISchema& schema) { std::swap(schema.EnumValues[0], schema.EnumValues[1]); }},
    {"FewerEnumValues", [](ISchema& schema) { schema.EnumValues.pop_back(); }},
    {"MemberName", [](ISchema& schema) { schema.SubSchemas[0].first = "c"; }},
    {"MemberType", [](ISchema& schema) { schema.SubSchemas[1].second.Type = EType::Bool; }},
    {"MemberOrder", [](ISchema& schema) { std::swap(schema.SubSchemas[0], schema.SubSchemas[1]); }},
    {"FewerMembers", [](ISchema& schema) { schema.SubSchemas.pop_back(); }},
};

const VDifference ignoredDifferences[] = {
    {"Detail", [](ISchema& schema) { schema.Detail = 8; }},
    {"Docs", [](ISchema& schema) { schema.Docs = {"other", "texts"}; }},
    {"DetailOfAMember", [](ISchema& schema) { schema.SubSchemas[0].second.Detail = 8; }},
    {"DocsOfAMember", [](ISchema& schema) { schema.SubSchemas[0].second.Docs = {"x"}; }},
};
// clang-format on

class SchemaDifferenceThatCounts : public SchemaDifference
{
};

class SchemaDifferenceThatIsIgnored : public SchemaDifference
{
};

} // namespace

INSTANTIATE_TEST_SUITE_P(Members, SchemaDifferenceThatCounts,
                         testing::ValuesIn(countingDifferences), NameOfCase);
INSTANTIATE_TEST_SUITE_P(Members, SchemaDifferenceThatIsIgnored,
                         testing::ValuesIn(ignoredDifferences), NameOfCase);

TEST_P(SchemaDifferenceThatCounts, MakesUnequalUnderBothEqualities)
{
    EXPECT_FALSE(StrictlyEqual(FullSchema(), Changed()));
    EXPECT_FALSE(StrictlyEqual(Changed(), FullSchema()));
    EXPECT_FALSE(RoleAwareEqual(FullSchema(), Changed()));
    EXPECT_FALSE(RoleAwareEqual(Changed(), FullSchema()));
}

TEST_P(SchemaDifferenceThatCounts, ChangesTheHash)
{
    EXPECT_NE(StrictHash(FullSchema()), StrictHash(Changed()));
}

TEST_P(SchemaDifferenceThatIsIgnored, LeavesEqualUnderBothEqualities)
{
    EXPECT_TRUE(StrictlyEqual(FullSchema(), Changed()));
    EXPECT_TRUE(RoleAwareEqual(FullSchema(), Changed()));
}

TEST_P(SchemaDifferenceThatIsIgnored, LeavesTheHash)
{
    EXPECT_EQ(StrictHash(FullSchema()), StrictHash(Changed()));
}

TEST(SchemaEquality, HoldsForCopies)
{
    EXPECT_TRUE(StrictlyEqual(FullSchema(), FullSchema()));
    EXPECT_TRUE(RoleAwareEqual(FullSchema(), FullSchema()));
    EXPECT_TRUE(StrictlyEqual(ISchema(), ISchema()));
}

TEST(SchemaEquality, DeliberateTypeNameCountsUnlessTheRoleIsValue)
{
    ISchema left = Plain(EType::Int32);
    ISchema right = left;
    left.TypeName = "A";
    right.TypeName = "B";

    EXPECT_FALSE(StrictlyEqual(left, right));
    EXPECT_TRUE(RoleAwareEqual(left, right));

    left.Role = right.Role = ERole::Function;

    EXPECT_FALSE(RoleAwareEqual(left, right));
}

TEST(SchemaEquality, EachPartGoesByItsOwnRole)
{
    ISchema left = TupleOf({Plain(EType::Int32)});
    ISchema right = left;
    left.SubSchemas[0].second.TypeName = "A";
    right.SubSchemas[0].second.TypeName = "B";

    EXPECT_FALSE(StrictlyEqual(left, right));
    EXPECT_TRUE(RoleAwareEqual(left, right));

    // The role of the whole does not make the names of its parts count.
    left.Role = right.Role = ERole::Function;
    EXPECT_TRUE(RoleAwareEqual(left, right));

    left.SubSchemas[0].second.Role = right.SubSchemas[0].second.Role = ERole::Input;
    EXPECT_FALSE(RoleAwareEqual(left, right));
}

TEST(SchemaHash, TellsAPartFromWhatLiesDeeper)
{
    const ISchema flat = TupleOf({TupleOf({}), TupleOf({})});
    const ISchema deep = TupleOf({TupleOf({TupleOf({})})});

    EXPECT_NE(StrictHash(flat), StrictHash(deep));
}
