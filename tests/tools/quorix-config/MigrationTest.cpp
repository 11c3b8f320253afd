#include "Migration.h"

#include "ItemsDocument.h"
#include "Variant/Interning.h"
#include "io/SchemaSamples.h"
#include "io/Values.h"

#include <gtest/gtest.h>

using namespace KVR::IO;
using namespace QuorixConfig;

namespace {

using Lines = std::vector<std::string>;

VDataValue ValueOf(const ISchema& schema, const std::vector<unsigned char>& bytes)
{
    return VDataValue{&GetUniqueSchema(schema), bytes};
}

VItem Verified(const VDataValue& value)
{
    VItem item;
    item.Schema = value.Schema;
    item.Verified = value;
    return item;
}

VItem Both(const VDataValue& proposed, const VDataValue& verified)
{
    VItem item = Verified(verified);
    item.Proposed = proposed;
    return item;
}

/// An item that has a schema and any value.
VItem Current(const ISchema& schema)
{
    return Verified(ValueOf(schema, Bytes("\x00")));
}

Lines LinesOf(const VMigration& migration)
{
    Lines lines;
    for (const VMigrationLine& line : migration.Lines) {
        lines.push_back((line.IsError ? "error " : "warning ") + line.Text);
    }
    return lines;
}

const VDataPath pathA{"Group", "A"};
const VDataPath pathB{"Group", "B"};

} // namespace

TEST(Migration, CarriesAnUnchangedItemOverInSilence)
{
    const VItem item = Verified(MakeStringValue("text"));

    const VMigration migration =
        Migrate({{pathA, item}}, {{pathA, Verified(MakeStringValue("other"))}});

    EXPECT_EQ((ItemMap{{pathA, item}}), migration.Items);
    EXPECT_EQ(Lines(), LinesOf(migration));
    EXPECT_EQ(0u, migration.LeftOut);
}

TEST(Migration, CarriesBothValuesIntoTheCurrentSchema)
{
    const ISchema int8 = Plain(EType::Int8);
    const ISchema int32 = Plain(EType::Int32);
    const VItem old = Both(ValueOf(int8, Bytes("\xFF")), ValueOf(int8, Bytes("\x02")));

    const VMigration migration = Migrate({{pathA, old}}, {{pathA, Current(int32)}});

    const VItem expected =
        Both(ValueOf(int32, Bytes("\xFF\xFF\xFF\xFF")), ValueOf(int32, Bytes("\x02\x00\x00\x00")));
    EXPECT_EQ((ItemMap{{pathA, expected}}), migration.Items);
    EXPECT_EQ((Lines{"warning Group.A: Type changed from Int8 to Int32."}), LinesOf(migration));
}

TEST(Migration, KeepsAnItemThatHasOnlyAProposedValue)
{
    VItem old = Both(MakeBoolValue(true), VDataValue());
    old.Schema = old.Proposed.Schema;

    const VMigration migration = Migrate({{pathA, old}}, {{pathA, Current(Plain(EType::Bool))}});

    EXPECT_EQ((ItemMap{{pathA, old}}), migration.Items);
}

TEST(Migration, LeavesOutAndTellsWhatCannotBeRead)
{
    const ISchema stored = NamedTupleOf({{"X", Plain(EType::Int32)}});
    const ISchema current = NamedTupleOf({{"X", Plain(EType::Int16)}, {"Y", Plain(EType::Bool)}});

    const VMigration migration =
        Migrate({{pathA, Verified(ValueOf(stored, Bytes("\x01\x00\x00\x00")))},
                 {pathB, Verified(MakeBoolValue(true))}},
                {{pathA, Current(current)}, {pathB, Current(Plain(EType::Bool))}});

    EXPECT_EQ((Lines{"warning Group.A.Y member was added.",
                     "error Group.A.X: Type changed from Int32 to Int16."}),
              LinesOf(migration));
    EXPECT_EQ(1u, migration.LeftOut);
    EXPECT_EQ(1u, migration.Items.size());
    EXPECT_EQ(1u, migration.Items.count(pathB));
}

TEST(Migration, LeavesOutAnItemWithoutACurrentSchema)
{
    const VMigration migration = Migrate({{pathA, Verified(MakeBoolValue(true))}}, {});

    EXPECT_EQ((Lines{"error Group.A: There is no current schema."}), LinesOf(migration));
    EXPECT_EQ(1u, migration.LeftOut);
}

TEST(Migration, AddsNoItemThatOnlyTheCurrentFileHas)
{
    const VMigration migration = Migrate({}, {{pathA, Current(Plain(EType::Bool))}});

    EXPECT_TRUE(migration.Items.empty());
    EXPECT_EQ(0u, migration.LeftOut);
}

TEST(Migration, CarriesRenumberedEnumsOfEveryWidth)
{
    const ISchema stored = EnumOf(EType::Enum8, {{"A", 1}});
    const ISchema current = EnumOf(EType::Enum8, {{"New", 1}, {"LEGACY_A", 2}});

    const VMigration migration =
        Migrate({{pathA, Verified(ValueOf(stored, Bytes("\x01")))}}, {{pathA, Current(current)}});

    EXPECT_EQ((ItemMap{{pathA, Verified(ValueOf(current, Bytes("\x02")))}}), migration.Items);
    EXPECT_EQ((Lines{"warning Group.A: Enum was modified"}), LinesOf(migration));
}

TEST(Migration, LeavesOutAValueThatItsSchemaDoesNotExplain)
{
    const ISchema stored = EnumOf(EType::Enum32, {{"A", 1}});
    const ISchema current = EnumOf(EType::Enum32, {{"A", 2}});
    const ISchema lost = NamedTupleOf({{"Gone", Plain(EType::Bool)}});

    const VMigration migration =
        Migrate({{pathA, Verified(ValueOf(stored, Bytes("\x07\x00\x00\x00")))},
                 {pathB, Both(ValueOf(lost, Bytes("\x01")), ValueOf(lost, Bytes("\x01")))}},
                {{pathA, Current(current)}, {pathB, Current(NamedTupleOf({}))}});

    EXPECT_EQ((Lines{"warning Group.A: Enum was modified",
                     "error Group.A: The verified value cannot be carried over.",
                     "warning Group.B.Gone member was removed.",
                     "error Group.B: Nothing is left of the proposed value."}),
              LinesOf(migration));
    EXPECT_EQ(2u, migration.LeftOut);
}

TEST(Migration, LeavesOutAValueThatHasNoText)
{
    // A number above 127 in 8 bits reads back as a negative one, for which there is no entry.
    const ISchema stored = EnumOf(EType::Enum32, {{"A", 200}});
    const ISchema current = EnumOf(EType::Enum8, {{"A", 200}});

    const VMigration migration =
        Migrate({{pathA, Verified(ValueOf(stored, Bytes("\xC8\x00\x00\x00")))}},
                {{pathA, Current(current)}});

    EXPECT_EQ((Lines{"error Group.A: The verified value cannot be written as text."}),
              LinesOf(migration));
    EXPECT_TRUE(migration.Items.empty());
}

TEST(ItemsDocument, LoadsAsTheItemsThatItHolds)
{
    const ItemMap items{
        {pathA, Verified(MakeStringValue("a\tb<&\">"))},
        {VDataPath{"Group", "A", "Below"}, Verified(MakeBoolValue(true))},
        {VDataPath{"Dots.in.it", "\"quoted'"}, Both(MakeDoubleValue(0.1), MakeDoubleValue(-1.5))}};

    const std::optional<std::string> text = PrintItems(items);

    ASSERT_TRUE(text.has_value());
    EXPECT_EQ(items, LoadText(*text).Items);
}

TEST(ItemsDocument, IsNotMadeOfItemsThatAFileCannotKeep)
{
    VItem tabbed = Verified(ValueOf(EnumOf(EType::Enum8, {{"a\tb", 1}}), Bytes("\x01")));
    VItem cutOff = Verified(ValueOf(Plain(EType::Int32), Bytes("\x01")));

    EXPECT_FALSE(PrintItems({{pathA, tabbed}}).has_value());
    EXPECT_FALSE(PrintItems({{pathA, cutOff}}).has_value());
    EXPECT_FALSE(PrintItems({}).has_value());
    EXPECT_FALSE(PrintItems({{VDataPath{"Alone"}, Verified(MakeBoolValue(true))}}).has_value());
}
