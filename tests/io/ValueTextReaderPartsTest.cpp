#include "ValueTextReading.h"

#include "io/TextCursor.h"

#include <gtest/gtest.h>

using namespace ValueTextReading;

TEST(ValueTextReader, TupleReadsByPositionOrByNameInAllModesButAtTheTopOfARow)
{
    for (const SchemaTextMode mode : allModes) {
        const bool row = mode > SchemaTextModeBrief;
        EXPECT_EQ(!row, Read(pair, "[1,2]", mode) == Good({1, 2}));
        EXPECT_EQ(!row, Read(pair, R"({"a":1,"b":2})", mode) == Good({1, 2}));
        EXPECT_EQ(row, Read(pair, "1,2", mode) == Good({1, 2}));
        EXPECT_EQ(Good({1, 2}), Read(TupleOf({pair}), row ? "[1,2]" : "[[1,2]]", mode));
        EXPECT_EQ(Good({1, 2}),
                  Read(TupleOf({pair}), row ? R"({"a":1,"b":2})" : R"([{"a":1,"b":2}])", mode));
    }
}

TEST(ValueTextReader, MembersMustStandInSchemaOrder)
{
    EXPECT_TRUE(Fails(pair, R"({"b":2,"a":1})"));
    EXPECT_TRUE(Fails(pair, R"({"a":1})"));
    EXPECT_TRUE(Fails(pair, R"({"b":2})"));
    EXPECT_TRUE(Fails(pair, R"({"a":1,"a":1})"));
    EXPECT_TRUE(Fails(pair, R"({"a":1,"b":2,"c":3})"));
    EXPECT_TRUE(Fails(pair, "{}"));
}

TEST(ValueTextReader, KeysMustEqualTheNamesExactly)
{
    EXPECT_TRUE(Fails(pair, R"({"A":1,"b":2})"));
    EXPECT_TRUE(Fails(pair, R"({"a ":1,"b":2})"));
    EXPECT_TRUE(Fails(pair, R"({a:1,b:2})"));
    EXPECT_TRUE(Fails(pair, R"({"a" 1,"b":2})"));
    EXPECT_EQ(Good({1}), Read(NamedTupleOf({{"a\t\"", byte}}), R"({"a\t\"":1})"));
    EXPECT_EQ(Good({1}), Read(TupleOf({byte}), R"({"":1})"));
    EXPECT_TRUE(Fails(TupleOf({byte}), R"({"a":1})"));
}

TEST(ValueTextReader, TupleNeedsExactlyItsMembers)
{
    EXPECT_TRUE(Fails(pair, "[1]"));
    EXPECT_TRUE(Fails(pair, "[1,2,3]"));
    EXPECT_TRUE(Fails(pair, "[1,2,]"));
    EXPECT_TRUE(Fails(pair, "[1,2}"));
    EXPECT_TRUE(Fails(pair, R"({"a":1,"b":2])"));
    EXPECT_TRUE(Fails(pair, "[1,2"));
    EXPECT_TRUE(Fails(pair, "[1 2]"));
    EXPECT_TRUE(Fails(pair, "[]"));
    EXPECT_TRUE(Fails(pair, ""));
    EXPECT_TRUE(Fails(pair, "(1,2)"));
    EXPECT_TRUE(Fails(pair, "1", SchemaTextModeRow));
    EXPECT_EQ(Good({1, 2}, ",3"), Read(pair, "1,2,3", SchemaTextModeRow));
}

TEST(ValueTextReader, TupleWithoutMembersTakesEmptyBrackets)
{
    EXPECT_EQ(Good({}), Read(TupleOf({}), "[]"));
    EXPECT_EQ(Good({}), Read(TupleOf({}), " [ \t] "));
    EXPECT_EQ(Good({}), Read(TupleOf({}), "{ }"));
    EXPECT_EQ(Good({}), Read(ArrayOf(byte, 0), "[]"));
    EXPECT_EQ(Good({}), Read(ArrayOf(byte, 0), "{}"));
    EXPECT_TRUE(Fails(TupleOf({}), "[}"));
    EXPECT_TRUE(Fails(TupleOf({}), "[{}"));
    EXPECT_TRUE(Fails(TupleOf({}), "[ {}"));
    EXPECT_TRUE(Fails(ArrayOf(byte, 0), "[{}]"));
    EXPECT_TRUE(Fails(TupleOf({}), "[1]"));
    EXPECT_TRUE(Fails(TupleOf({}), ""));
    EXPECT_EQ(Good({}), Read(TupleOf({TupleOf({})}), "{}", SchemaTextModeRow));
}

TEST(ValueTextReader, TupleWithoutMembersAtTheTopOfARowIsNothing)
{
    EXPECT_EQ(Good({}), Read(TupleOf({}), "", SchemaTextModeRow));
    EXPECT_EQ(Good({}, "[]"), Read(TupleOf({}), "[]", SchemaTextModeRow));
    EXPECT_EQ(Good({}), Read(ArrayOf(byte, 0), " ", SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, RowOfAnIntegerAndAWord)
{
    const ISchema row = TupleOf({Plain(EType::Int32), word});

    EXPECT_EQ(Good(Bytes("\x07\x00\x00\x00"
                         "\x03\x00\x00\x00"
                         "abc")),
              Read(row, "7,abc", SchemaTextModeRow));
}

TEST(ValueTextReader, ArrayTakesExactlyItsCount)
{
    const ISchema numbers = ArrayOf(byte, 3);
    const ISchema bools = ArrayOf(boolean, 3);

    EXPECT_EQ(Good({1, 2, 3}), Read(numbers, "[1,2,3]"));
    EXPECT_TRUE(Fails(numbers, "[1,2]"));
    EXPECT_TRUE(Fails(numbers, "[1,2,3,4]"));
    EXPECT_TRUE(Fails(numbers, "[1,2,]"));
    EXPECT_TRUE(Fails(numbers, "[]"));
    EXPECT_EQ(Good({1, 2, 3}), Read(numbers, "1,2,3", SchemaTextModeRow));
    EXPECT_EQ(Good({1, 2, 3}, ",4"), Read(numbers, "1,2,3,4", SchemaTextModeRow));
    EXPECT_TRUE(Fails(numbers, "1,2", SchemaTextModeRow));

    EXPECT_EQ(Good({1, 0, 1}), Read(bools, "[true,false,true]"));
    EXPECT_TRUE(Fails(bools, "[true,false]"));
    EXPECT_TRUE(Fails(bools, "[true,false,true,true]"));
}

TEST(ValueTextReader, ArrayReadsPairsWithTheNameOfItsPart)
{
    EXPECT_EQ(Good({1, 2}), Read(ArrayOf(byte, 2), R"({"":1,"":2})"));
    EXPECT_TRUE(Fails(ArrayOf(byte, 2), R"({"":1})"));
    EXPECT_TRUE(Fails(ArrayOf(byte, 2), R"({"a":1,"b":2})"));
}

TEST(ValueTextReader, ListReadsItemsInBrackets)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02")),
              Read(ListOf(byte), "[1,2]"));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x00")),
              Read(ListOf(boolean), "[true,false]"));
    EXPECT_TRUE(Fails(ListOf(byte), "[1,2"));
    EXPECT_TRUE(Fails(ListOf(byte), "[1,]"));
    EXPECT_TRUE(Fails(ListOf(byte), "[,1]"));
    EXPECT_TRUE(Fails(ListOf(byte), "[1 2]"));
    EXPECT_TRUE(Fails(ListOf(byte), "1,2"));
    EXPECT_TRUE(Fails(ListOf(byte), "{}"));
    EXPECT_TRUE(Fails(ListOf(byte), ""));
}

TEST(ValueTextReader, EmptyListIsFourZeroBytes)
{
    for (const SchemaTextMode mode :
         {SchemaTextModePositional, SchemaTextModeNamed, SchemaTextModeBrief}) {
        EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(ListOf(byte), "[]", mode));
        EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(ListOf(byte), "[ \n ]", mode));
    }
}

TEST(ValueTextReader, ListAtTheTopOfARowReadsUntilNoCommaFollows)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02")),
              Read(ListOf(byte), "1,2", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02"),
                   "]"),
              Read(ListOf(byte), "1,2]", SchemaTextModeQuotedRow));
    EXPECT_TRUE(Fails(ListOf(byte), "1,", SchemaTextModeRow));
    EXPECT_TRUE(Fails(ListOf(byte), "[1,2]", SchemaTextModeRow));
}

TEST(ValueTextReader, EmptyListAtTheTopOfARowDoesNotReadBack)
{
    EXPECT_TRUE(Fails(ListOf(byte), "", SchemaTextModeRow));
    EXPECT_TRUE(Fails(ListOf(byte), "", SchemaTextModeQuotedRow));
    // Of words it becomes a list of one empty word.
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "\x00\x00\x00\x00")),
              Read(ListOf(word), "", SchemaTextModeRow));
}

TEST(ValueTextReader, DeliberateCountOfAListIsWrittenAlsoAfterAFailedItem)
{
    EXPECT_EQ((VReading{false, Bytes("\x02\x00\x00\x00\x01\x02"), "x]"}),
              Read(ListOf(byte), "[1,2,x]"));
    EXPECT_EQ((VReading{false, Bytes("\x01\x00\x00\x00\x01"), "x]"}),
              Read(ListOf(boolean), "[true,x]"));
    EXPECT_EQ((VReading{false, Bytes("\x01\x00\x00\x00\x01"), "x"}),
              Read(ListOf(byte), "1,x", SchemaTextModeRow));
    EXPECT_EQ((VReading{false, Bytes("\x00\x00\x00\x00"), "x"}), Read(ListOf(byte), "x"));
}

TEST(ValueTextReader, CountThatWrapsAroundStopsTheItems)
{
    const std::string text = ",,,,";
    Detail::VTextCursor cursor{text.data(), text.data() + text.size()};
    std::uint32_t count = 0xFFFFFFFE;

    EXPECT_TRUE(Detail::ReadSeparated(cursor, 0, count, [] { return true; }));
    EXPECT_EQ(0u, count);
    EXPECT_EQ(text.data() + 1, cursor.Position);
}

TEST(ValueTextReader, NestedListsReadTheirBrackets)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "\x05"
                         "\x00\x00\x00\x00")),
              Read(ListOf(ListOf(byte)), "[[5],[]]"));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "\x05"
                         "\x00\x00\x00\x00")),
              Read(ListOf(ListOf(byte)), "[5],[]", SchemaTextModeRow));
}

TEST(ValueTextReader, CountsOfTheBriefModeDoNotReadBack)
{
    std::string text;
    ASSERT_TRUE(
        BinaryToText(Bytes("\x02\x00\x00\x00\x07\x08"), ListOf(byte), text, SchemaTextModeBrief));

    EXPECT_EQ("[2]", text);
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00\x02")), Read(ListOf(byte), text, SchemaTextModeBrief));
    EXPECT_TRUE(Fails(ArrayOf(byte, 2), text, SchemaTextModeBrief));
}

TEST(ValueTextReader, ArrayOrListWithoutExactlyOnePartFails)
{
    const ISchema noPart = Plain(EType::List);
    const ISchema twoParts = WithParts(EType::Array, {{"", byte}, {"", byte}});

    EXPECT_TRUE(Fails(noPart, "[]"));
    EXPECT_TRUE(Fails(twoParts, "[]"));
    EXPECT_TRUE(Fails(ListOf(noPart), "[]"));
    EXPECT_TRUE(Fails(TupleOf({byte, twoParts}), "[1,[]]"));
}
