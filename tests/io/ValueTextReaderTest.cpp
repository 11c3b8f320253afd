#include "ValueTextReading.h"

#include <gtest/gtest.h>

using namespace ValueTextReading;

TEST(ValueTextReader, ReplacesTheBytes)
{
    EXPECT_EQ(Good({1}), Read(boolean, "true"));
    EXPECT_EQ((VReading{false, {}, "x"}), Read(boolean, "x"));
    EXPECT_EQ((VReading{false, {}, ""}), Read(Plain(EType::Array), ""));
}

TEST(ValueTextReader, BoolIsABareWordInAllModesButTheQuotedRow)
{
    for (const SchemaTextMode mode : allModes) {
        const bool bare = mode != SchemaTextModeQuotedRow;
        EXPECT_EQ(bare, Read(boolean, "true", mode) == Good({1}));
        EXPECT_EQ(bare, Read(boolean, "false", mode) == Good({0}));
        EXPECT_EQ(!bare, Read(boolean, "\"true\"", mode) == Good({1}));
        EXPECT_EQ(!bare, Read(boolean, "\"false\"", mode) == Good({0}));
    }
}

TEST(ValueTextReader, OnlyTheExactWordsAreBools)
{
    EXPECT_TRUE(Fails(boolean, "True"));
    EXPECT_TRUE(Fails(boolean, "TRUE"));
    EXPECT_TRUE(Fails(boolean, "1"));
    EXPECT_TRUE(Fails(boolean, "tru"));
    EXPECT_TRUE(Fails(boolean, ""));
    EXPECT_TRUE(Fails(boolean, "\"true", SchemaTextModeQuotedRow));
    EXPECT_TRUE(Fails(boolean, "\" true\"", SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, WhatFollowsTheValueIsLeftToTheCaller)
{
    EXPECT_EQ(Good({1}, "x"), Read(boolean, "truex"));
    EXPECT_EQ(Good({5}, ",6"), Read(byte, "5 ,6"));
    EXPECT_EQ(Good({1, 2}, "]"), Read(pair, "[1,2] ]"));
}

TEST(ValueTextReader, SixBlanksAreSkippedBeforeAndAfterEveryValue)
{
    const std::string blanks = " \t\n\v\f\r";

    EXPECT_EQ(Good({1}), Read(boolean, blanks + "true" + blanks));
    EXPECT_EQ(Good({5}), Read(byte, blanks + "5" + blanks));
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "a")),
              Read(word, blanks + "\"a\"" + blanks));
    EXPECT_EQ(Good({1, 2}), Read(pair, blanks + "[" + blanks + "1" + blanks + "," + blanks + "2" +
                                           blanks + "]" + blanks));
    EXPECT_EQ(Good({1, 2}),
              Read(pair, blanks + "{" + blanks + "\"a\"" + blanks + ":" + blanks + "1" + blanks +
                             "," + blanks + "\"b\"" + blanks + ":" + blanks + "2" + blanks + "}"));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x01\x02")),
              Read(ListOf(byte), "[" + blanks + "1" + blanks + "," + blanks + "2" + blanks + "]"));
}

TEST(ValueTextReader, OtherBytesAreNoBlanks)
{
    EXPECT_TRUE(Fails(byte, "\xA0"
                            "5"));
    EXPECT_TRUE(Fails(byte, std::string("\0", 1) + "5"));
    EXPECT_TRUE(Fails(byte, "\x08"
                            "5"));
    EXPECT_TRUE(Fails(byte, "\x0E"
                            "5"));
}

TEST(ValueTextReader, StringsAreQuotedInAllModes)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_EQ(Good(Bytes("\x03\x00\x00\x00"
                             "a,]")),
                  Read(word, "\"a,]\"", mode));
        EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(word, "\"\"", mode));
    }
}

TEST(ValueTextReader, BackslashIntroducesOneOfSevenCharacters)
{
    EXPECT_EQ(Good(Bytes("\x07\x00\x00\x00"
                         "\t\r\n\f\b\"\\")),
              Read(word, R"("\t\r\n\f\b\"\\")"));
    EXPECT_TRUE(Fails(word, R"("\a")"));
    EXPECT_TRUE(Fails(word, R"("\/")"));
    EXPECT_TRUE(Fails(word, R"("\u0041")"));
    EXPECT_TRUE(Fails(word, std::string("\"\\\0\"", 4)));
}

TEST(ValueTextReader, OtherBytesOfAStringStandForThemselves)
{
    EXPECT_EQ(Good(Bytes("\x04\x00\x00\x00"
                         "\n\0\xC3\x01")),
              Read(word, std::string("\"\n\0\xC3\x01\"", 6)));
}

TEST(ValueTextReader, UnterminatedStringFails)
{
    EXPECT_TRUE(Fails(word, "\"a"));
    EXPECT_TRUE(Fails(word, "\""));
    EXPECT_TRUE(Fails(word, "\"a\\"));
    EXPECT_TRUE(Fails(word, "\"a\\\""));
    EXPECT_TRUE(Fails(word, ""));
    EXPECT_TRUE(Fails(word, "a"));
    EXPECT_TRUE(Fails(word, "a", SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, RowTakesABareRunUpToTheCommaOrTheEnd)
{
    EXPECT_EQ(Good(Bytes("\x03\x00\x00\x00"
                         "a b")),
              Read(word, "a b", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "a"),
                   ",b"),
              Read(word, "a,b", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x03\x00\x00\x00"
                         "\\t]")),
              Read(word, "\\t]", SchemaTextModeRow));
}

TEST(ValueTextReader, LeadingBlanksOfABareRunAreSkippedAndTheLastBelongToIt)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "a ")),
              Read(word, "  a ", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x02\x00\x00\x00"
                         "a "
                         "\x01\x00\x00\x00"
                         "b")),
              Read(ListOf(word), "a , b", SchemaTextModeRow));
}

TEST(ValueTextReader, BareRunOfNoCharactersIsAString)
{
    EXPECT_EQ(Good(Bytes("\x00\x00\x00\x00")), Read(word, "", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\x00\x00\x00\x00"
                         "\x00\x00\x00\x00")),
              Read(ListOf(word), ",", SchemaTextModeRow));
}

TEST(ValueTextReader, QuoteThatIsNeverClosedBeginsABareRunInARow)
{
    EXPECT_EQ(Good(Bytes("\x02\x00\x00\x00"
                         "\"a"),
                   ",b"),
              Read(word, "\"a,b", SchemaTextModeRow));
}

TEST(ValueTextReader, DeliberateBareRunKnowsNoBrackets)
{
    // A row of rows of bare words therefore does not read back.
    EXPECT_TRUE(Fails(ListOf(ListOf(word)), "[a,b]", SchemaTextModeRow));
    EXPECT_EQ(Good(Bytes("\x01\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "\x01\x00\x00\x00"
                         "a")),
              Read(ListOf(ListOf(word)), "[\"a\"]", SchemaTextModeRow));
}

TEST(ValueTextReader, EnumIsTheNumberOfTheFirstEntryOfThatName)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_EQ(Good({5}), Read(colour, "\"Red\"", mode));
        EXPECT_EQ(Good({0xFF}), Read(colour, "\"Dark red\"", mode));
        EXPECT_EQ(mode == SchemaTextModeRow, Read(colour, "Dark red", mode) == Good({0xFF}));
    }
    EXPECT_EQ(Good({7}), Read(colour, "", SchemaTextModeRow));
}

TEST(ValueTextReader, EnumTakesTheWidthOfItsType)
{
    EXPECT_EQ(Good(Bytes("\xFE\xFF")), Read(EnumOf(EType::Enum16, {{"a", -2}}), "\"a\""));
    EXPECT_EQ(Good(Bytes("\x02\x01\x00\x00")), Read(EnumOf(EType::Enum32, {{"a", 258}}), "\"a\""));
    EXPECT_EQ(Good(Bytes("\x02")), Read(EnumOf(EType::Enum8, {{"a", 258}}), "\"a\""));
}

TEST(ValueTextReader, UnknownNameFails)
{
    EXPECT_TRUE(Fails(colour, "\"red\""));
    EXPECT_TRUE(Fails(colour, "\"Red \""));
    EXPECT_TRUE(Fails(colour, "5"));
    EXPECT_TRUE(Fails(colour, "Red ", SchemaTextModeRow));
}

TEST(ValueTextReader, QuotedBoolsOfARowFailInTheOrdinaryForm)
{
    std::string text;
    ASSERT_TRUE(BinaryToText({1}, boolean, text, SchemaTextModeQuotedRow));

    EXPECT_EQ("\"true\"", text);
    EXPECT_TRUE(Fails(boolean, text, SchemaTextModeNamed));
    EXPECT_EQ(Good({1}), Read(boolean, text, SchemaTextModeQuotedRow));
}

TEST(ValueTextReader, StringWithATabSurvivesAWriteAndARead)
{
    const ByteVector bytes = Bytes("\x03\x00\x00\x00"
                                   "a\tb");
    std::string text;
    ASSERT_TRUE(BinaryToText(bytes, word, text));

    EXPECT_EQ(R"("a\tb")", text);
    EXPECT_EQ(Good(bytes), Read(word, text));
}

TEST(ValueTextReader, VoidAndRefHaveNoText)
{
    for (const SchemaTextMode mode : allModes) {
        EXPECT_TRUE(Fails(Plain(EType::Void), "", mode));
        EXPECT_TRUE(Fails(Plain(EType::Ref), "", mode));
        EXPECT_TRUE(Fails(Plain(static_cast<EType>(21)), "", mode));
        EXPECT_TRUE(Fails(ListOf(Plain(EType::Void)), "[,]", mode));
    }
}
