#include "io/SchemaComparison.h"

#include "io/EnumDescription.h"
#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <set>

using namespace KVR::IO;

namespace {

using Lines = std::vector<std::string>;
using Types = std::set<EType>;

struct VDifference
{
    Lines warnings;
    Lines errors;
};

VDifference DifferenceOf(const ISchema& stored, const ISchema& current,
                         const std::string& path = std::string())
{
    VDifference difference;
    CompareSchemas(stored, current, difference.warnings, difference.errors, path);
    return difference;
}

void ExpectDifference(const ISchema& stored, const ISchema& current, const Lines& warnings,
                      const Lines& errors)
{
    const VDifference difference = DifferenceOf(stored, current);
    EXPECT_EQ(warnings, difference.warnings);
    EXPECT_EQ(errors, difference.errors);
}

ISchema Named(const std::string& name, ISchema schema)
{
    schema.TypeName = name;
    return schema;
}

const std::map<EType, Types>& ReadableTypes()
{
    using T = EType;
    // clang-format off
    static const std::map<EType, Types> types = {
        {T::Bool, {T::Bool}},
        {T::Int8, {T::Int8, T::Bool}},
        {T::Int16, {T::Int16, T::Int8, T::UInt8, T::Bool}},
        {T::Int32, {T::Int32, T::Int16, T::UInt16, T::Int8, T::UInt8, T::Bool}},
        {T::Int64, {T::Int64, T::Int32, T::UInt32, T::Int16, T::UInt16, T::Int8, T::UInt8, T::Bool}},
        {T::UInt8, {T::UInt8, T::Bool}},
        {T::UInt16, {T::UInt16, T::UInt8, T::Bool}},
        {T::UInt32, {T::UInt32, T::UInt16, T::UInt8, T::Bool}},
        {T::UInt64, {T::UInt64, T::UInt32, T::UInt16, T::UInt8, T::Bool}},
        {T::Float32, {T::Float32, T::Float64}},
        {T::Float64, {T::Float64, T::Float32}},
        {T::String, {T::String}},
        {T::Array, {T::Array}},
        {T::List, {T::List}},
        {T::Tuple, {T::Tuple}},
        {T::NamedTuple, {T::NamedTuple}},
        {T::Enum8, {T::Enum8, T::Enum16, T::Enum32}},
        {T::Enum16, {T::Enum8, T::Enum16, T::Enum32}},
        {T::Enum32, {T::Enum8, T::Enum16, T::Enum32}},
    };
    // clang-format on
    return types;
}

std::string NameOf(EType type)
{
    return DescribeEType().NameOf(static_cast<std::int32_t>(type));
}

} // namespace

TEST(ReadableTypes, AreThoseOfTheListAndNoOthers)
{
    std::size_t readable = 0;
    for (int current = 0; current <= 23; ++current) {
        for (int stored = 0; stored <= 23; ++stored) {
            const auto row = ReadableTypes().find(EType(current));
            const bool expected =
                row != ReadableTypes().end() && row->second.count(EType(stored)) != 0;

            EXPECT_EQ(expected, IsReadableAs(EType(stored), EType(current)))
                << NameOf(EType(stored)) << " as " << NameOf(EType(current));
            readable += expected ? 1 : 0;
        }
    }
    EXPECT_EQ(53u, readable);
}

TEST(SchemaComparison, TellsOfEveryChangeOfAPlainTypeInBothDirections)
{
    for (int current = 0; current <= 20; ++current) {
        for (int stored = 0; stored <= 20; ++stored) {
            const EType storedType = EType(stored);
            const EType currentType = EType(current);
            const std::string line =
                ": Type changed from " + NameOf(storedType) + " to " + NameOf(currentType) + ".";
            const bool readable = IsReadableAs(storedType, currentType);
            const bool same =
                storedType == currentType || (IsEnumType(storedType) && IsEnumType(currentType));

            ExpectDifference(Plain(storedType), Plain(currentType),
                             readable && !same ? Lines{line} : Lines{},
                             readable ? Lines{} : Lines{line});
        }
    }
}

TEST(SchemaComparison, WarnsOfAWiderNumber)
{
    ExpectDifference(Plain(EType::Int16), Plain(EType::Int32),
                     {": Type changed from Int16 to Int32."}, {});
    ExpectDifference(Plain(EType::Float64), Plain(EType::Float32),
                     {": Type changed from Float64 to Float32."}, {});
}

TEST(SchemaComparison, RefusesANarrowerNumber)
{
    ExpectDifference(Plain(EType::Int32), Plain(EType::Int16), {},
                     {": Type changed from Int32 to Int16."});
    ExpectDifference(Plain(EType::UInt32), Plain(EType::Int32), {},
                     {": Type changed from UInt32 to Int32."});
}

TEST(SchemaComparison, RefusesVoidAndRefAsThemselvesWhichIsKept)
{
    ExpectDifference(Plain(EType::Void), Plain(EType::Void), {},
                     {": Type changed from Void to Void."});
    ExpectDifference(Plain(EType::Ref), Plain(EType::Ref), {}, {": Type changed from Ref to Ref."});
    ExpectDifference(NamedTupleOf({{"A", Plain(EType::Void)}}),
                     NamedTupleOf({{"A", Plain(EType::Void)}}), {},
                     {".A: Type changed from Void to Void."});
}

TEST(SchemaComparison, NamesAnUnknownTypeUnspecified)
{
    ExpectDifference(Plain(EType(99)), Plain(EType::Bool), {},
                     {": Type changed from Unspecified to Bool."});
}

TEST(SchemaComparison, SaysNothingOfEqualSchemas)
{
    const ISchema schema = NamedTupleOf(
        {{"A", ListOf(TupleOf({Plain(EType::Int8)}))}, {"B", ArrayOf(Plain(EType::String), 3)}});

    ExpectDifference(schema, schema, {}, {});
}

TEST(SchemaComparison, PutsThePathAndTheStoredTypeNameInFront)
{
    const VDifference difference =
        DifferenceOf(Named("Old", Plain(EType::Int8)), Named("New", Plain(EType::Int16)), "Top");

    EXPECT_EQ((Lines{"Top<Old>: Type changed from Int8 to Int16."}), difference.warnings);
}

TEST(SchemaComparison, LeavesTheLinesThatWereThere)
{
    Lines warnings{"w"};
    Lines errors{"e"};

    CompareSchemas(Plain(EType::Int8), Plain(EType::Int16), warnings, errors);
    CompareSchemas(Plain(EType::Int16), Plain(EType::Int8), warnings, errors);

    EXPECT_EQ((Lines{"w", ": Type changed from Int8 to Int16."}), warnings);
    EXPECT_EQ((Lines{"e", ": Type changed from Int16 to Int8."}), errors);
}

TEST(SchemaComparison, WarnsOfARenumberedEnum)
{
    ExpectDifference(EnumOf(EType::Enum32, {{"A", 1}}), EnumOf(EType::Enum32, {{"A", 2}}),
                     {": Enum was modified"}, {});
}

TEST(SchemaComparison, WarnsOfAnExtendedEnum)
{
    ExpectDifference(EnumOf(EType::Enum32, {{"A", 1}}), EnumOf(EType::Enum32, {{"A", 1}, {"B", 2}}),
                     {": Enum was modified"}, {});
}

TEST(SchemaComparison, WarnsOfReorderedAndOfLegacyEntries)
{
    ExpectDifference(EnumOf(EType::Enum32, {{"A", 1}, {"B", 2}}),
                     EnumOf(EType::Enum32, {{"B", 2}, {"A", 1}}), {": Enum was modified"}, {});
    ExpectDifference(EnumOf(EType::Enum32, {{"A", 1}}), EnumOf(EType::Enum32, {{"LEGACY_A", 1}}),
                     {": Enum was modified"}, {});
}

TEST(SchemaComparison, SaysNothingOfAnEnumsWidthWhichIsKept)
{
    ExpectDifference(EnumOf(EType::Enum8, {{"A", 1}}), EnumOf(EType::Enum32, {{"A", 1}}), {}, {});
    ExpectDifference(EnumOf(EType::Enum32, {{"A", 1}}), EnumOf(EType::Enum16, {{"A", 1}}), {}, {});
}

TEST(SchemaComparison, PutsThePathInFrontOfEveryLineOfAnEnum)
{
    ExpectDifference(
        NamedTupleOf({{"Mode", Named("EMode", EnumOf(EType::Enum32, {{"A", 300}, {"B", 1}}))}}),
        NamedTupleOf({{"Mode", EnumOf(EType::Enum8, {{"A", 1}})}}), {},
        {".Mode<EMode>: Enum value A too large for enum storage type",
         ".Mode<EMode>: Enum value B could not be mapped"});
}

TEST(SchemaComparison, TellsOfAModifiedEnumAlsoBehindLinesOfOthers)
{
    // Lines that others left must not make the enum look unreadable.
    Lines warnings;
    Lines errors{"of another part"};

    CompareSchemas(EnumOf(EType::Enum32, {{"A", 1}}), EnumOf(EType::Enum32, {{"A", 2}}), warnings,
                   errors);

    EXPECT_EQ((Lines{": Enum was modified"}), warnings);
    EXPECT_EQ((Lines{"of another part"}), errors);
}

TEST(SchemaComparison, RefusesATupleOfAnotherSizeAndLooksNoFurther)
{
    ExpectDifference(TupleOf({Plain(EType::Bool), Plain(EType::String)}),
                     TupleOf({Plain(EType::String)}), {}, {": Tuple size changed from 2 to 1."});
}

TEST(SchemaComparison, ComparesTheMembersOfATupleByIndex)
{
    ExpectDifference(TupleOf({Plain(EType::Int8), Plain(EType::Bool), Plain(EType::String)}),
                     TupleOf({Plain(EType::Int16), Plain(EType::Bool), Plain(EType::Bool)}),
                     {"[0]: Type changed from Int8 to Int16."},
                     {"[2]: Type changed from String to Bool."});
}

TEST(SchemaComparison, RefusesAnArrayOfAnotherLengthAndLooksNoFurther)
{
    ExpectDifference(ArrayOf(Plain(EType::Int8), 3), ArrayOf(Plain(EType::String), 4000000000u), {},
                     {": Array length changed from 3 to 4000000000."});
}

TEST(SchemaComparison, ComparesTheElementOfAnArrayAndOfAList)
{
    ExpectDifference(ArrayOf(Plain(EType::Int8), 3), ArrayOf(Plain(EType::Int16), 3),
                     {"[0]: Type changed from Int8 to Int16."}, {});
    ExpectDifference(ListOf(ListOf(Plain(EType::Int8))), ListOf(ListOf(Plain(EType::Bool))), {},
                     {"[0][0]: Type changed from Int8 to Bool."});
}

TEST(SchemaComparison, IgnoresACountThatIsNoArrays)
{
    ISchema counted = ListOf(Plain(EType::Int8));
    counted.Count = 5;

    ExpectDifference(counted, ListOf(Plain(EType::Int8)), {}, {});
}

TEST(SchemaComparison, GoesToTheSmallerNumberOfParts)
{
    const ISchema two =
        WithParts(EType::List, {{"", Plain(EType::Int8)}, {"", Plain(EType::Int8)}});

    ExpectDifference(two, ListOf(Plain(EType::Bool)), {}, {"[0]: Type changed from Int8 to Bool."});
    ExpectDifference(ListOf(Plain(EType::Bool)), two, {"[0]: Type changed from Bool to Int8."}, {});
    ExpectDifference(two, Plain(EType::List), {}, {});
}

TEST(SchemaComparison, WarnsOfRemovedMembersInStoredOrder)
{
    ExpectDifference(
        NamedTupleOf(
            {{"Z", Plain(EType::Bool)}, {"A", Plain(EType::Bool)}, {"Y", Plain(EType::Void)}}),
        NamedTupleOf({{"A", Plain(EType::Bool)}}),
        {".Z member was removed.", ".Y member was removed."}, {});
}

TEST(SchemaComparison, WarnsOfAddedMembersInCurrentOrder)
{
    ExpectDifference(
        NamedTupleOf({{"A", Plain(EType::Bool)}}),
        NamedTupleOf(
            {{"Z", Plain(EType::Void)}, {"A", Plain(EType::Bool)}, {"Y", Plain(EType::Bool)}}),
        {".Z member was added.", ".Y member was added."}, {});
}

TEST(SchemaComparison, WarnsOnceOfSwappedMembers)
{
    const ISchema::SubSchema a{"A", Plain(EType::Bool)};
    const ISchema::SubSchema b{"B", Plain(EType::Bool)};
    const ISchema::SubSchema c{"C", Plain(EType::Bool)};
    const ISchema::SubSchema d{"D", Plain(EType::Bool)};

    ExpectDifference(NamedTupleOf({a, b}), NamedTupleOf({b, a}), {": members were re-ordered"}, {});
    ExpectDifference(NamedTupleOf({a, b, c, d}), NamedTupleOf({d, c, b, a}),
                     {": members were re-ordered"}, {});
    ExpectDifference(NamedTupleOf({a, b, c, d}), NamedTupleOf({a, c, d}),
                     {".B member was removed."}, {});
}

TEST(SchemaComparison, TellsOfTheOrderWhereItIsFirstSeen)
{
    ExpectDifference(NamedTupleOf({{"A", Plain(EType::Bool)}, {"B", Plain(EType::Bool)}}),
                     NamedTupleOf({{"X", Plain(EType::Bool)},
                                   {"B", Plain(EType::Bool)},
                                   {"A", Plain(EType::Bool)},
                                   {"Y", Plain(EType::Bool)}}),
                     {".X member was added.", ": members were re-ordered", ".Y member was added."},
                     {});
}

TEST(SchemaComparison, TellsOfMembersBeforeItGoesIntoThemInCurrentOrder)
{
    ExpectDifference(
        NamedTupleOf({{"A", Plain(EType::Int8)}, {"B", Plain(EType::Int8)}}),
        NamedTupleOf(
            {{"B", Plain(EType::Int16)}, {"New", Plain(EType::Bool)}, {"A", Plain(EType::Int32)}}),
        {".New member was added.", ": members were re-ordered",
         ".B: Type changed from Int8 to Int16.", ".A: Type changed from Int8 to Int32."},
        {});
}

TEST(SchemaComparison, PutsNamesOfMembersAndTypesInThePath)
{
    const ISchema stored = Named(
        "Rig",
        NamedTupleOf(
            {{"Cameras", ListOf(Named("Camera", NamedTupleOf({{"Gone", Plain(EType::Bool)},
                                                              {"Id", Plain(EType::Int8)}})))}}));
    const ISchema current =
        NamedTupleOf({{"Cameras", ListOf(NamedTupleOf({{"Id", Plain(EType::Bool)}}))}});

    ExpectDifference(stored, current, {"<Rig>.Cameras[0]<Camera>.Gone member was removed."},
                     {"<Rig>.Cameras[0]<Camera>.Id: Type changed from Int8 to Bool."});
}

TEST(SchemaComparison, KeepsThePathAtAMemberWithoutName)
{
    ExpectDifference(NamedTupleOf({{"", Plain(EType::Int8)}}),
                     NamedTupleOf({{"", Plain(EType::Int16)}}),
                     {": Type changed from Int8 to Int16."}, {});
    ExpectDifference(NamedTupleOf({{"", Plain(EType::Int8)}}), NamedTupleOf({}),
                     {". member was removed."}, {});
}

TEST(SchemaComparison, ComparesMemberNamesWithCase)
{
    ExpectDifference(NamedTupleOf({{"a", Plain(EType::Bool)}}),
                     NamedTupleOf({{"A", Plain(EType::Bool)}}),
                     {".a member was removed.", ".A member was added."}, {});
}

TEST(SchemaComparison, DoesNotLookAtRoleTypeNameDetailAndDocs)
{
    ISchema current = Plain(EType::Int8);
    current.Role = ERole::Output;
    current.TypeName = "Renamed";
    current.Detail = 7;
    current.Docs = {"changed"};

    ExpectDifference(Plain(EType::Int8), current, {}, {});
}

/// Looked for one by one, so many members would not end within the test's time.
TEST(SchemaComparison, FindsTheMembersOfAGreatTuple)
{
    ISchema stored = NamedTupleOf({});
    for (std::size_t i = 0; i < 200000; ++i) {
        stored.SubSchemas.emplace_back("m" + std::to_string(i), Plain(EType::Int8));
    }
    ISchema current = stored;
    std::reverse(current.SubSchemas.begin(), current.SubSchemas.end());
    current.SubSchemas.front().first = "new";
    // Of equal names the first counts.
    current.SubSchemas.emplace_back("m7", Plain(EType::Bool));
    stored.SubSchemas.emplace_back("m8", Plain(EType::Bool));

    ExpectDifference(
        stored, current,
        {".m199999 member was removed.", ".new member was added.", ": members were re-ordered"},
        {".m7: Type changed from Int8 to Bool."});
}
