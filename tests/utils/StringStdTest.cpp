#include "utils/StringStd.h"

#include "utils/BooleanWords.h"

#include <gtest/gtest.h>

#include <memory>

TEST(StringStd, IsAssignedAText)
{
    VStringStd text("before");
    IString& string = text;

    string.Assign("after");
    EXPECT_EQ("after", text);
    string.Assign("");
    EXPECT_EQ("", text);
}

TEST(StringStd, TakesNullAsEmpty)
{
    VStringStd text("before");
    text.Assign(nullptr);

    EXPECT_EQ("", text);
}

TEST(StringStd, IsAssignedAPartOfItself)
{
    VStringStd text("a text that is longer than what fits into a string object itself");
    text.Assign(text.CStr() + 2);
    EXPECT_EQ("text that is longer than what fits into a string object itself", text);

    text.Assign(text.CStr());
    EXPECT_EQ("text that is longer than what fits into a string object itself", text);

    VStringStd brief("brief");
    brief.Assign(brief.CStr() + 3);
    EXPECT_EQ("ef", brief);
    brief.Assign(brief.CStr() + 2);
    EXPECT_EQ("", brief);
}

TEST(StringStd, IsCopiedIntoAnother)
{
    const VStringStd source("from another library");
    VStringStd target("before");

    source.CopyTo(target);

    EXPECT_EQ("from another library", target);
}

TEST(StringStd, IsCopiedIntoItself)
{
    VStringStd text("the same");
    text.CopyTo(text);

    EXPECT_EQ("the same", text);
}

TEST(StringStd, IsCopiedUpToItsFirstZero)
{
    const VStringStd source(std::string("a\0b", 3));
    VStringStd target;

    source.CopyTo(target);

    EXPECT_EQ("a", target);
}

TEST(StringStd, GivesItsTextInPlace)
{
    const VStringStd text("in place");
    const IStringDirect& direct = text;

    EXPECT_STREQ("in place", direct.CStr());
    EXPECT_EQ(text.data(), direct.CStr());
    EXPECT_STREQ("", VStringStd().CStr());
}

TEST(StringStd, IsDestroyedThroughItsInterface)
{
    const std::unique_ptr<IString> string =
        std::make_unique<VStringStd>("long enough to need memory of its own, which is to be freed");
    VStringStd target;
    string->CopyTo(target);

    EXPECT_EQ('l', target[0]);
}

TEST(BooleanWords, AreLowerCase)
{
    EXPECT_STREQ("true", KVR::TrueWord);
    EXPECT_STREQ("false", KVR::FalseWord);
    EXPECT_STREQ("Unspecified", KVR::UnspecifiedWord);
}
